// PERIOD specifications: the period with its duty cycle, phase and jitter.
#include "tsd/Tsd_Specs.h"

#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_PropBuffers.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <string>

using tsd_detail::dumpLine;
using tsd_detail::dumpTime;
using tsd_detail::orEmpty;
using tsd_detail::propTime;

namespace {

std::unique_ptr<Tsd_TimeValue> copyOf(const std::unique_ptr<Tsd_TimeValue>& value) {
    return value != nullptr ? std::make_unique<Tsd_TimeValue>(*value) : nullptr;
}

} // namespace

Tsd_Period::Tsd_Period(const char* tsid) : Tsd_EndpointSpec(tsid) {}

Tsd_Period::Tsd_Period(const Tsd_Period& other)
    : Tsd_EndpointSpec(other), m_periodGroup(other.m_periodGroup),
      m_dutyCycleValue(copyOf(other.m_dutyCycleValue)),
      m_dutyCyclePercent(other.m_dutyCyclePercent), m_phase(copyOf(other.m_phase)),
      m_inputJitter(copyOf(other.m_inputJitter)), m_dutyCycleHigh(other.m_dutyCycleHigh),
      m_phasePositive(other.m_phasePositive) {}

Tsd_Period::~Tsd_Period() = default;

Tsd_TimeValue Tsd_Period::getDutyCycleValue() const {
    if (m_dutyCycleValue != nullptr)
        return *m_dutyCycleValue;
    if (checkLink(false) != 0)
        TSD_MSG().fatal(2, "Bad link on %s getting duty cycle.\n", getTSid());
    return tsd_detail::percentOfPeriod(m_dutyCyclePercent, getDelayValue());
}

void Tsd_Period::setDutyCycleValue(const Tsd_TimeValue& value, bool high) {
    m_dutyCycleValue = std::make_unique<Tsd_TimeValue>(value);
    m_dutyCycleHigh = high;
    m_dutyCyclePercent = 0.0;
}

void Tsd_Period::setDutyCyclePercent(double percent, bool high) {
    m_dutyCyclePercent = percent;
    m_dutyCycleHigh = high;
    m_dutyCycleValue.reset();
}

Tsd_TimeValue Tsd_Period::getPhaseValue() const {
    return m_phase != nullptr ? *m_phase : Tsd_TimeValue();
}

void Tsd_Period::setPhase(const Tsd_TimeValue& value, bool positive) {
    m_phase.reset();
    if (value.value != 0.0)
        m_phase = std::make_unique<Tsd_TimeValue>(value);
    m_phasePositive = positive;
}

Tsd_TimeValue Tsd_Period::getInputJitterValue() const {
    return m_inputJitter != nullptr ? *m_inputJitter : Tsd_TimeValue();
}

void Tsd_Period::setInputJitter(const Tsd_TimeValue& value) {
    m_inputJitter = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_Period::clearInputJitter() {
    m_inputJitter.reset();
}

bool Tsd_Period::getProp(const char*& name, const char*& value) const {
    if (m_periodGroup == nullptr)
        TSD_MSG().fatal(2, "Group missing from period %s.\n", getTSid());
    std::string text = "PERIOD:";
    text += Tsd_Util::getAnnoName(m_periodGroup->getName());
    text += ':';
    const char* delay = getDelayPropString();
    if (delay == nullptr)
        TSD_MSG().fatal(2, "Spec %s has no delay data.\n", getTSid());
    text += delay;
    if (m_phase != nullptr) {
        text += m_phasePositive ? ":PHASE:+:" : ":PHASE:-:";
        text += propTime(*m_phase);
    }
    tsd_detail::appendDutyAndJitter(text, m_dutyCycleValue.get(), m_dutyCyclePercent,
                                    m_dutyCycleHigh, m_inputJitter.get());
    if (hasWrittenPriority())
        text += formatString(":PRIORITY:%ld", static_cast<long>(getPriority()));
    return tsd_detail::specPropBuffers().set(getTSid(), text.c_str(), name, value);
}

void Tsd_Period::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, std::string("Tsd_Period ") + orEmpty(getTSid()));
    if (m_periodGroup != nullptr)
        dumpLine(stream, indent,
                 std::string("   period group: ") + orEmpty(m_periodGroup->getName()));
    else
        dumpLine(stream, indent, "   period group unset");
    tsd_detail::dumpDutyCycle(stream, indent, m_dutyCycleValue.get(), m_dutyCyclePercent,
                              m_dutyCycleHigh);
    if (m_phase != nullptr)
        dumpLine(stream, indent,
                 "   phase: " + dumpTime(*m_phase) + (m_phasePositive ? " +" : " -"));
    else
        dumpLine(stream, indent, "   phase unset");
    if (m_inputJitter != nullptr)
        dumpLine(stream, indent, "   input jitter: " + dumpTime(*m_inputJitter));
    else
        dumpLine(stream, indent, "   input jitter unset");
    Tsd_EndpointSpec::dump(stream, static_cast<short>(indent + 1));
}
