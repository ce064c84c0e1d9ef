// The adaptor over the logical constraint parser: TIMEGRP, TIMESPEC, OFFSET,
// ENABLE and DISABLE texts become user groups and specifications.
#include "tsd/Tsd_Parsers.h"

#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_Builder.h"

#include <cstring>

namespace {

Tsd_TimeValue picoseconds(double ps) {
    return Tsd_TimeValue(ps, Tsd_TimeValue::UNITS_PS);
}

} // namespace

Tsd_SpecGroupParser::Tsd_SpecGroupParser(Tsd_Builder* builder)
    : m_builder(builder), m_bonusParser(std::make_unique<Tsd_OffsetBonusParser>()) {}

Tsd_SpecGroupParser::~Tsd_SpecGroupParser() = default;

bool Tsd_SpecGroupParser::parse2(const char* text) {
    if (!Tsd_OffsetBonusParser::isDisabled() && m_bonusParser->reduceOffset(text))
        return parse(m_bonusParser->getReducedText());
    return parse(text);
}

void Tsd_SpecGroupParser::clearError() {
    m_badToken.set(nullptr);
    m_badOffset = -1;
}

void Tsd_SpecGroupParser::store(std::unique_ptr<Tsd_Spec> spec) {
    m_newSpec = spec.release();
}

Tsd_PredefGroup* Tsd_SpecGroupParser::findMember(Tsd_UserGroup* group, const char* name,
                                                 Tsd_Builder* builder) {
    // A definition that names its own group includes itself; validation of
    // the user groups reports the cycle later.
    const char* own = group->getName();
    if (own != nullptr && name != nullptr && std::strcmp(own, name) == 0) {
        MessageManager::debugTrace("Direct circular definition in user group \"%s\".\n", own);
        return group;
    }
    return builder->getPredefGroupForGroup(name);
}

Tsd_UserGroup::Edge Tsd_SpecGroupParser::convertPrefEdge(ParserEdge edge) {
    switch (static_cast<int>(edge)) {
    case 0:
        return Tsd_UserGroup::EDGE_RISING;
    case 1:
        return Tsd_UserGroup::EDGE_FALLING;
    case 2:
        return Tsd_UserGroup::EDGE_TRANSHI;
    case 3:
        return Tsd_UserGroup::EDGE_TRANSLO;
    default:
        return Tsd_UserGroup::EDGE_ANY;
    }
}

bool Tsd_SpecGroupParser::addInclude(
    Tsd_UserGroup* group, const std::vector<std::pair<const char*, ParserEdge>>& includes,
    Tsd_Builder* builder) {
    bool ok = true;
    for (const auto& include : includes) {
        Tsd_PredefGroup* member = findMember(group, include.first, builder);
        if (member != nullptr)
            group->addGroup(member, convertPrefEdge(include.second), false);
        else
            ok = false;
    }
    return ok;
}

bool Tsd_SpecGroupParser::addExclude(Tsd_UserGroup* group, const std::vector<const char*>& names,
                                     Tsd_Builder* builder) {
    bool ok = true;
    for (const char* name : names) {
        Tsd_PredefGroup* member = findMember(group, name, builder);
        if (member != nullptr)
            group->addGroup(member, Tsd_UserGroup::EDGE_ANY, true);
        else
            ok = false;
    }
    return ok;
}

bool Tsd_SpecGroupParser::addFromToThru(Tsd_DelayPath* path, bool hasFrom, bool hasTo,
                                        const std::vector<const char*>& names,
                                        Tsd_Builder* builder) {
    bool ok = true;
    const size_t last = names.empty() ? 0 : names.size() - 1;
    for (size_t i = 0; i < names.size(); ++i) {
        if (i == 0 && hasFrom) {
            Tsd_TermGroup* start = builder->getTermGroupForSpec(names[i]);
            path->setStart(start);
            ok = ok && start != nullptr;
        } else if (i == last && hasTo) {
            Tsd_TermGroup* end = builder->getTermGroupForSpec(names[i]);
            path->setEnd(end);
            ok = ok && end != nullptr;
        } else {
            Tsd_ThruGroup* thru = builder->getThruGroupForSpec(names[i]);
            path->addThru(thru);
            ok = ok && thru != nullptr;
        }
    }
    return ok;
}

bool Tsd_SpecGroupParser::addBaseOffset(Tsd_Offset* offset, bool in, double value,
                                        const double* dataValid, bool before, const char* clockName,
                                        const char* highLow, Tsd_Builder* builder,
                                        const Tsd_OffsetBonusParser* bonus) {
    bool ok = true;
    offset->setIn(in);
    offset->setBefore(before);
    // An OFFSET written without a value keeps none: the reduced text's 0 is
    // only there for the parser.
    if (bonus == nullptr || bonus->hasValue())
        offset->setOffsetValue(picoseconds(value));
    if (dataValid != nullptr)
        offset->setDataValid(picoseconds(*dataValid));
    if (highLow != nullptr) {
        if (tsd_detail::equalsNoCase(highLow, "HIGH"))
            offset->setRefClockEdge(Tsd_UserGroup::EDGE_RISING);
        else if (tsd_detail::equalsNoCase(highLow, "LOW"))
            offset->setRefClockEdge(Tsd_UserGroup::EDGE_FALLING);
        else
            TSD_MSG().fatal(2, "Unexpected high_low value \"%s\".\n", highLow);
    }
    if (bonus != nullptr) {
        if (!bonus->getRefPin().empty()) {
            Tsd_ClkGroup* pin = builder->getClkGroupForSpec(bonus->getRefPin().c_str());
            if (pin != nullptr)
                offset->setReferencePin(pin);
            else
                ok = false;
        }
        if (bonus->getRegEdge() != Tsd_UserGroup::EDGE_ANY)
            offset->setRegGroupEdge(bonus->getRegEdge());
    }
    Tsd_ClkGroup* clock = builder->getClkGroupForSpec(clockName);
    if (clock != nullptr)
        offset->setClockPad(clock);
    else
        ok = false;
    return ok;
}

bool Tsd_SpecGroupParser::cb_error(int /*code*/, int column, const char* token) {
    clearError();
    if (column != 0) {
        m_badToken.set(token != nullptr ? token : "");
        m_badOffset = column;
    }
    return true;
}

bool Tsd_SpecGroupParser::cb_enable(bool enable, const char* delayName,
                                    const ConstraintHandle* /*handle*/) {
    store(std::make_unique<Tsd_PathControl>(delayName, enable));
    return true;
}

void Tsd_SpecGroupParser::setDelayOrLink(Tsd_EndpointSpec* spec, const char* linkTsid,
                                         bool multiply, double valueOrFactor, bool isTime) const {
    if (linkTsid != nullptr) {
        // A link written without a factor (or with a zero divisor) multiplies by 1.
        if (!multiply && valueOrFactor == 0.0) {
            multiply = true;
            valueOrFactor = 1.0;
        }
        spec->setLinkData(m_builder->getEndpointSpecForLink(linkTsid), multiply, valueOrFactor);
        return;
    }
    Tsd_TimeValue value = picoseconds(valueOrFactor);
    if (!isTime)
        value.changeUnits(Tsd_TimeValue::UNITS_MHZ); // a frequency stays a frequency
    spec->setDelayValue(value);
}

bool Tsd_SpecGroupParser::cb_tspec_period(const char* tsid, const char* group, const char* linkTsid,
                                          bool multiply, double valueOrFactor, bool isTime,
                                          bool phasePositive, double phasePs, bool dutyLow,
                                          double dutyTimePs, double dutyPercent,
                                          const double* inputJitterPs, int priority,
                                          const ConstraintHandle* /*handle*/) {
    auto period = std::make_unique<Tsd_Period>(tsid);
    Tsd_TermGroup* periodGroup = m_builder->getTermGroupForSpec(group);
    period->setPeriodGroup(periodGroup);
    setDelayOrLink(period.get(), linkTsid, multiply, valueOrFactor, isTime);
    if (linkTsid != nullptr && phasePs != 0.0)
        period->setPhase(picoseconds(phasePs), phasePositive);
    if (dutyTimePs != 0.0)
        period->setDutyCycleValue(picoseconds(dutyTimePs), !dutyLow);
    else if (dutyPercent != 0.0)
        period->setDutyCyclePercent(dutyPercent, !dutyLow);
    if (inputJitterPs != nullptr)
        period->setInputJitter(picoseconds(*inputJitterPs));
    if (priority != kNoPriority)
        period->setWrittenPriority(priority);
    if (periodGroup != nullptr)
        store(std::move(period));
    return true;
}

bool Tsd_SpecGroupParser::cb_tspec_maxdelay(const char* tsid, bool hasFrom, bool hasTo,
                                            const std::vector<const char*>& groups,
                                            const char* linkTsid, bool multiply,
                                            double valueOrFactor, bool isTime, int priority,
                                            bool dataPathOnly, const ConstraintHandle* /*handle*/) {
    auto path = std::make_unique<Tsd_DelayPath>(tsid);
    bool found = addFromToThru(path.get(), hasFrom, hasTo, groups, m_builder);
    setDelayOrLink(path.get(), linkTsid, multiply, valueOrFactor, isTime);
    if (priority != kNoPriority)
        path->setWrittenPriority(priority);
    if (dataPathOnly)
        path->setDataPathOnly();
    if (found)
        store(std::move(path));
    return true;
}

bool Tsd_SpecGroupParser::cb_tspec_tig(const char* tsid, bool hasFrom, bool hasTo,
                                       const std::vector<const char*>& groups, int priority,
                                       const ConstraintHandle* /*handle*/) {
    auto path = std::make_unique<Tsd_DelayPath>(tsid);
    bool found = addFromToThru(path.get(), hasFrom, hasTo, groups, m_builder);
    path->setIgnored();
    if (priority != kNoPriority)
        path->setWrittenPriority(priority);
    if (found)
        store(std::move(path));
    return true;
}

bool Tsd_SpecGroupParser::cb_tspec_drop_spec(const char* tsid, const ConstraintHandle* /*handle*/) {
    TSD_MSG().fatal(2,
                    "DROP_SPEC property %s passed to base Tsd_Builder: must be handled by user "
                    "builder.\n",
                    tsid);
}

bool Tsd_SpecGroupParser::cb_timegrp(
    const char* /*name*/, const std::vector<std::pair<const char*, ParserEdge>>& includes,
    const std::vector<const char*>& excludes, const ConstraintHandle* /*handle*/) {
    // Only a TIMEGRP definition that the builder prepared may fill a group;
    // one met in any other text has nothing to define and fails the parse.
    if (m_newGroup == nullptr)
        return false;
    bool included = addInclude(m_newGroup, includes, m_builder);
    bool excluded = addExclude(m_newGroup, excludes, m_builder);
    if (!included || !excluded)
        m_newGroup = nullptr;
    return true;
}

bool Tsd_SpecGroupParser::makeOffset(std::unique_ptr<Tsd_Offset> offset, const char* padGroup,
                                     const char* regGroup, bool in, double offsetPs,
                                     const double* validPs, bool before, const char* clock,
                                     const char* highLow) {
    bool ok = addBaseOffset(offset.get(), in, offsetPs, validPs, before, clock, highLow, m_builder,
                            m_bonusParser.get());
    // Both groups are always looked up, so that each missing one is reported.
    if (padGroup != nullptr) {
        Tsd_TermGroup* pads = m_builder->getTermGroupForSpec(padGroup);
        if (pads != nullptr)
            offset->getGroupOffset()->setPadGroup(pads);
        ok = ok && pads != nullptr;
    }
    if (regGroup != nullptr) {
        Tsd_TermGroup* regs = m_builder->getTermGroupForSpec(regGroup);
        if (regs != nullptr)
            offset->setRegGroup(regs);
        ok = ok && regs != nullptr;
    }
    if (ok)
        store(std::move(offset));
    return true;
}

bool Tsd_SpecGroupParser::cb_offset(bool in, double offsetPs, const double* validPs, bool before,
                                    const char* clock, const char* highLow,
                                    const ConstraintHandle* /*handle*/) {
    return makeOffset(std::make_unique<Tsd_Offset>(), nullptr, nullptr, in, offsetPs, validPs,
                      before, clock, highLow);
}

bool Tsd_SpecGroupParser::cb_roffset(bool in, double offsetPs, const double* validPs, bool before,
                                     const char* clock, const char* regGroup, const char* highLow,
                                     const ConstraintHandle* /*handle*/) {
    return makeOffset(std::make_unique<Tsd_Offset>(), nullptr, regGroup, in, offsetPs, validPs,
                      before, clock, highLow);
}

bool Tsd_SpecGroupParser::cb_toffset(const char* padGroup, bool in, double offsetPs,
                                     const double* validPs, bool before, const char* clock,
                                     const char* highLow, const ConstraintHandle* /*handle*/) {
    return makeOffset(std::make_unique<Tsd_GroupOffset>(), padGroup, nullptr, in, offsetPs, validPs,
                      before, clock, highLow);
}

bool Tsd_SpecGroupParser::cb_troffset(const char* padGroup, bool in, double offsetPs,
                                      const double* validPs, bool before, const char* clock,
                                      const char* regGroup, const char* highLow,
                                      const ConstraintHandle* /*handle*/) {
    return makeOffset(std::make_unique<Tsd_GroupOffset>(), padGroup, regGroup, in, offsetPs,
                      validPs, before, clock, highLow);
}
