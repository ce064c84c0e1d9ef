// The adaptor over the net-level constraint parser: values of TS_PERIOD,
// TS_MAXDELAY, TS_MAXSKEW, TS_OFFSET and TS_FEEDBACK become net timings, net
// offsets and port timings.
#include "tsd/Tsd_Parsers.h"

#include "tsd/Tsd_Builder.h"

#include <cstring>

namespace {

Tsd_TimeValue picoseconds(double ps) {
    return Tsd_TimeValue(ps, Tsd_TimeValue::UNITS_PS);
}

} // namespace

Tsd_NetParser::Tsd_NetParser(Tsd_Builder* builder)
    : m_builder(builder), m_bonusParser(std::make_unique<Tsd_OffsetBonusParser>()) {}

Tsd_NetParser::~Tsd_NetParser() = default;

bool Tsd_NetParser::parse2(const char* text) {
    if (!Tsd_OffsetBonusParser::isDisabled() && m_bonusParser->reduceOffset(text))
        return parse(m_bonusParser->getReducedText());
    return parse(text);
}

void Tsd_NetParser::store(std::unique_ptr<Tsd_Spec> spec) {
    m_newSpec = spec.release();
}

bool Tsd_NetParser::cb_error(int /*code*/, const char* token) {
    m_badToken.set(token);
    return true;
}

bool Tsd_NetParser::cb_period(double periodPs, bool dutyLow, double dutyTimePs, double dutyPercent,
                              const double* inputJitterPs) {
    auto net = std::make_unique<Tsd_NetTiming>();
    net->setPeriodValue(picoseconds(periodPs));
    // Unlike a TIMESPEC period, the percent is tested first here.
    if (dutyPercent != 0.0)
        net->setDutyCyclePercent(dutyPercent, !dutyLow);
    else if (dutyTimePs != 0.0)
        net->setDutyCycleValue(picoseconds(dutyTimePs), !dutyLow);
    if (inputJitterPs != nullptr)
        net->setInputJitter(picoseconds(*inputJitterPs));
    store(std::move(net));
    return true;
}

bool Tsd_NetParser::cb_maxdelay(double delayPs) {
    auto net = std::make_unique<Tsd_NetTiming>();
    net->setMaxDelayValue(picoseconds(delayPs));
    store(std::move(net));
    return true;
}

bool Tsd_NetParser::cb_maxskew(double skewPs) {
    auto net = std::make_unique<Tsd_NetTiming>();
    net->setMaxSkewValue(picoseconds(skewPs));
    store(std::move(net));
    return true;
}

bool Tsd_NetParser::cb_offset(bool in, double offsetPs, const double* validPs, bool before,
                              const char* clock, const char* regGroup, const char* highLow) {
    auto offset = std::make_unique<Tsd_NetOffset>();
    bool ok = Tsd_SpecGroupParser::addBaseOffset(offset.get(), in, offsetPs, validPs, before, clock,
                                                 highLow, m_builder, m_bonusParser.get());
    // A register group not defined yet stays pending; the builder resolves it.
    if (regGroup != nullptr)
        offset->setRegGroup(m_builder->getTermGroupForNetOffset(regGroup));
    if (ok)
        store(std::move(offset));
    return true;
}

bool Tsd_NetParser::cb_portpair(const char* constraintName, double valuePs, const char* kind,
                                const char* group) {
    if (kind == nullptr || std::strcmp(kind, "NET") != 0) {
        cb_error(0, kind);
        return false;
    }
    auto port = std::make_unique<Tsd_PortTiming>(constraintName);
    port->setConstraintValue(picoseconds(valuePs));
    Tsd_ClkGroup* secondary = m_builder->getClkGroupForSpec(group);
    if (secondary != nullptr) {
        port->setSecondaryGroup(secondary);
        store(std::move(port));
    }
    return true;
}
