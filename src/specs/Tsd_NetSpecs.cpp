// Net-level timings, path controls and port timings.
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

Tsd_TimeValue valueOrZero(const std::unique_ptr<Tsd_TimeValue>& value) {
    return value != nullptr ? *value : Tsd_TimeValue();
}

void dumpTimeLine(DumpStream& stream, short indent, const char* label,
                  const std::unique_ptr<Tsd_TimeValue>& value) {
    if (value != nullptr)
        dumpLine(stream, indent, std::string("   ") + label + ": " + dumpTime(*value));
    else
        dumpLine(stream, indent, std::string("   ") + label + " unset");
}

bool handOutSpecProp(const std::string& propName, const std::string& text, const char*& name,
                     const char*& value) {
    return tsd_detail::specPropBuffers().set(propName.c_str(), text.c_str(), name, value);
}

} // namespace

// --- Tsd_NetTiming ---------------------------------------------------------

Tsd_NetTiming::Tsd_NetTiming() : Tsd_Spec(nullptr) {}

Tsd_NetTiming::~Tsd_NetTiming() {
    m_refs.deleteAllRefs();
}

Tsd_TimeValue Tsd_NetTiming::getPeriodValue() const {
    return valueOrZero(m_period);
}

Tsd_TimeValue Tsd_NetTiming::getMaxDelayValue() const {
    return valueOrZero(m_maxDelay);
}

Tsd_TimeValue Tsd_NetTiming::getMaxSkewValue() const {
    return valueOrZero(m_maxSkew);
}

Tsd_TimeValue Tsd_NetTiming::getInputJitterValue() const {
    return valueOrZero(m_inputJitter);
}

Tsd_TimeValue Tsd_NetTiming::getDutyCycleValue() const {
    if (m_dutyCycleValue != nullptr)
        return *m_dutyCycleValue;
    if (m_period == nullptr)
        TSD_MSG().fatal(2, "No duty cycle without period.\n");
    return tsd_detail::percentOfPeriod(m_dutyCyclePercent, *m_period);
}

void Tsd_NetTiming::setPeriodValue(const Tsd_TimeValue& value) {
    m_maxDelay.reset();
    m_maxSkew.reset();
    m_period = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_NetTiming::setMaxDelayValue(const Tsd_TimeValue& value) {
    if (m_period != nullptr) {
        m_period.reset();
        m_dutyCycleValue.reset();
        m_inputJitter.reset();
        m_dutyCyclePercent = 0.0;
    }
    m_maxSkew.reset();
    m_maxDelay = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_NetTiming::setMaxSkewValue(const Tsd_TimeValue& value) {
    if (m_period != nullptr) {
        m_period.reset();
        m_dutyCycleValue.reset();
        m_inputJitter.reset();
        m_dutyCyclePercent = 0.0;
    }
    m_maxDelay.reset();
    m_maxSkew = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_NetTiming::setDutyCycleValue(const Tsd_TimeValue& value, bool high) {
    m_dutyCycleValue = std::make_unique<Tsd_TimeValue>(value);
    m_dutyCycleHigh = high;
    m_dutyCyclePercent = 0.0;
}

void Tsd_NetTiming::setDutyCyclePercent(double percent, bool high) {
    m_dutyCyclePercent = percent;
    m_dutyCycleHigh = high;
    m_dutyCycleValue.reset();
}

void Tsd_NetTiming::setInputJitter(const Tsd_TimeValue& value) {
    m_inputJitter = std::make_unique<Tsd_TimeValue>(value);
}

void Tsd_NetTiming::clearInputJitter() {
    m_inputJitter.reset();
}

bool Tsd_NetTiming::getProp(const char*& name, const char*& value) const {
    if (m_period != nullptr) {
        std::string text = propTime(*m_period);
        tsd_detail::appendDutyAndJitter(text, m_dutyCycleValue.get(), m_dutyCyclePercent,
                                        m_dutyCycleHigh, m_inputJitter.get());
        return handOutSpecProp("TS_PERIOD", text, name, value);
    }
    if (m_maxDelay != nullptr)
        return handOutSpecProp("TS_MAXDELAY", propTime(*m_maxDelay), name, value);
    if (m_maxSkew != nullptr)
        return handOutSpecProp("TS_MAXSKEW", propTime(*m_maxSkew), name, value);
    TSD_MSG().fatal(2, "No delays in net spec.\n");
}

void Tsd_NetTiming::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_NetTiming");
    dumpTimeLine(stream, indent, "period value", m_period);
    tsd_detail::dumpDutyCycle(stream, indent, m_dutyCycleValue.get(), m_dutyCyclePercent,
                              m_dutyCycleHigh);
    dumpTimeLine(stream, indent, "input jitter", m_inputJitter);
    dumpTimeLine(stream, indent, "max-delay value", m_maxDelay);
    dumpTimeLine(stream, indent, "max-skew value", m_maxSkew);
    tsd_detail::dumpScope(stream, indent, getScope());
    tsd_detail::dumpRefs(stream, indent, m_refs);
}

// --- Tsd_PathControl -------------------------------------------------------

Tsd_PathControl::Tsd_PathControl(const char* delayName, bool enabled)
    : Tsd_Spec(nullptr), m_delayName(delayName), m_enabled(enabled) {}

Tsd_PathControl::Tsd_PathControl(const Tsd_PathControl& other)
    : Tsd_Spec(other), m_delayName(other.m_delayName), m_enabled(other.m_enabled) {}

Tsd_PathControl::~Tsd_PathControl() = default;

bool Tsd_PathControl::getProp(const char*& name, const char*& value) const {
    // The delay name is a name in constraint text like any other; none is
    // written as nothing.
    const char* delay = getDelayName();
    return handOutSpecProp(m_enabled ? "ENABLE" : "DISABLE",
                           delay != nullptr && *delay != 0 ? Tsd_Util::getAnnoName(delay) : "",
                           name, value);
}

void Tsd_PathControl::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_PathControl");
    dumpLine(stream, indent, m_enabled ? "   ENABLE" : "   DISABLE");
    if (getDelayName() != nullptr)
        dumpLine(stream, indent, std::string("   delay name: ") + getDelayName());
    else
        dumpLine(stream, indent, "   delay name NULL");
    tsd_detail::dumpScope(stream, indent, getScope());
}

// --- Tsd_PortTiming --------------------------------------------------------

struct Tsd_PortTiming::Data {
    Tsd_String constraintName;
    std::unique_ptr<Tsd_TimeValue> constraintValue;
    Tsd_RefList refs{10};
    Tsd_ClkGroup* secondaryGroup = nullptr;

    explicit Data(const char* name) : constraintName(name) {}
    ~Data() { refs.deleteAllRefs(); }
    Data(const Data&) = delete;
    Data& operator=(const Data&) = delete;
};

Tsd_PortTiming::Tsd_PortTiming(const char* constraintName)
    : Tsd_Spec(nullptr), m_data(std::make_unique<Data>(constraintName)) {}

Tsd_PortTiming::~Tsd_PortTiming() = default;

Tsd_RefList* Tsd_PortTiming::getRefList() {
    return &m_data->refs;
}

const char* Tsd_PortTiming::getConstraintName() const {
    return m_data->constraintName.get();
}

Tsd_TimeValue Tsd_PortTiming::getConstraintValue() const {
    return valueOrZero(m_data->constraintValue);
}

void Tsd_PortTiming::setConstraintValue(const Tsd_TimeValue& value) {
    m_data->constraintValue = std::make_unique<Tsd_TimeValue>(value);
}

Tsd_ClkGroup* Tsd_PortTiming::getSecondaryGroup() const {
    return m_data->secondaryGroup;
}

void Tsd_PortTiming::setSecondaryGroup(Tsd_ClkGroup* group) {
    m_data->secondaryGroup = group;
}

bool Tsd_PortTiming::getProp(const char*& name, const char*& value) const {
    if (m_data->constraintValue == nullptr)
        TSD_MSG().fatal(2, "%s constraint has no value.\n", getConstraintName());
    std::string text = propTime(*m_data->constraintValue);
    if (m_data->secondaryGroup != nullptr) {
        text += ":NET:";
        text += Tsd_Util::getAnnoName(m_data->secondaryGroup->getName());
    }
    return handOutSpecProp(std::string("TS_") + orEmpty(getConstraintName()), text, name, value);
}

void Tsd_PortTiming::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_PortTiming");
    if (getConstraintName() != nullptr)
        dumpLine(stream, indent, std::string("   name: ") + getConstraintName());
    else
        dumpLine(stream, indent, "   name unset");
    dumpTimeLine(stream, indent, "value", m_data->constraintValue);
    if (m_data->secondaryGroup != nullptr)
        dumpLine(stream, indent,
                 std::string("   secondary group: ") + orEmpty(m_data->secondaryGroup->getName()));
    else
        dumpLine(stream, indent, "   secondary group unset");
    tsd_detail::dumpScope(stream, indent, getScope());
    tsd_detail::dumpRefs(stream, indent, m_data->refs);
}
