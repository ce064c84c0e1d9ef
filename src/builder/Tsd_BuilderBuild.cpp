// The build: processing the stored properties, resolving what stayed
// pending, and handing out the design when no error was counted.
#include "tsd/Tsd_Builder.h"

#include "internal/Tsd_GroupCircles.h"
#include "internal/Tsd_LinkGraph.h"
#include "internal/Tsd_NameIndex.h"
#include "internal/Tsd_Report.h"
#include "internal/Tsd_StoredProps.h"
#include "tsd/Tsd_Parsers.h"

#include <cstring>
#include <string>
#include <unordered_map>
#include <vector>

namespace {

// The holders of several clock groups, as getGroupHolders lists them (the
// offsets whose clock pad it is, then the port timings whose secondary group
// it is, each in list order), gathered in one pass over the lists. Each
// holder is kept as its getUserString, copied at once: that text lives in a
// buffer that the next call overwrites.
class ClockHolders {
public:
    ClockHolders(Tsd_Design& design, const std::vector<Tsd_ClkGroup*>& clocks) {
        for (Tsd_ClkGroup* clock : clocks)
            m_holders.emplace(clock, std::vector<std::string>());
        Tsd_BaseObjListIter offsets(design.getOffsetSpecList());
        while (Tsd_BaseObj* obj = offsets.next())
            if (Tsd_Offset* offset = obj->getOffset())
                add(offset->getClockPad(), obj);
        Tsd_BaseObjListIter ports(design.getPortTimingList());
        while (Tsd_BaseObj* obj = ports.next())
            if (Tsd_PortTiming* port = obj->getPortTiming())
                add(port->getSecondaryGroup(), obj);
    }

    const std::vector<std::string>& of(const Tsd_ClkGroup* clock) const {
        return m_holders.at(clock);
    }

private:
    void add(const Tsd_Group* group, Tsd_BaseObj* holder) {
        auto it = m_holders.find(group);
        if (it != m_holders.end())
            it->second.emplace_back(holder->getUserString());
    }

    std::unordered_map<const Tsd_Group*, std::vector<std::string>> m_holders;
};

// What checkLink(true) reports for each spec of a list, with the walks of
// the chains shared: every spec's outcome on arrival (the chain ends at a
// delay, at an ignored spec, at a missing link, or runs into a circle) and
// its first zero divisor are worked out once, so a chain of n specs costs n,
// not n^2. A walk that ends in a fatal message or a circle listing is done
// as checkLink does it: the listing is as long as the walk.
class LinkChecker {
public:
    explicit LinkChecker(const Tsd_BaseObjList& specs)
        : m_graph(specs), m_end(static_cast<std::size_t>(m_graph.size()), DELAY),
          m_endAt(static_cast<std::size_t>(m_graph.size()), -1),
          m_firstZero(static_cast<std::size_t>(m_graph.size()), -1),
          m_divides(static_cast<std::size_t>(m_graph.size()), 0) {
        std::vector<char> ignored(m_divides.size(), 0);
        for (int id : m_graph.order()) {
            m_divides[static_cast<std::size_t>(id)] = tsd_detail::dividesByZero(m_graph.spec(id));
            ignored[static_cast<std::size_t>(id)] = m_graph.spec(id)->isIgnored();
        }
        // On a cycle the walk goes round until an ignored spec, if any.
        for (int c = 0; c < m_graph.cycleCount(); ++c) {
            const std::vector<int> cycle = m_graph.cycleNodes(c);
            const std::size_t length = cycle.size();
            const std::vector<int> toIgnored = tsd_detail::LinkGraph::distanceTo(cycle, ignored);
            const std::vector<int> toZero = tsd_detail::LinkGraph::distanceTo(cycle, m_divides);
            for (std::size_t k = 0; k < length; ++k) {
                const auto node = static_cast<std::size_t>(cycle[k]);
                const int di = toIgnored[k], dz = toZero[k];
                if (di < 0) {
                    m_end[node] = CIRCLE;
                    continue;
                }
                m_end[node] = IGNORED;
                m_endAt[node] = cycle[(k + static_cast<std::size_t>(di)) % length];
                if (dz >= 0 && dz < di)
                    m_firstZero[node] = cycle[(k + static_cast<std::size_t>(dz)) % length];
            }
        }
        for (int id : m_graph.order()) {
            const auto i = static_cast<std::size_t>(id);
            const Tsd_EndpointSpec* spec = m_graph.spec(id);
            const int next = m_graph.next(id);
            if (m_graph.cycleOf(id) >= 0)
                continue;
            if (spec->hasDelayValue()) {
                m_end[i] = DELAY;
            } else if (spec->isIgnored()) {
                m_end[i] = IGNORED;
                m_endAt[i] = id;
            } else if (next < 0) {
                m_end[i] = MISSING;
            } else {
                const auto j = static_cast<std::size_t>(next);
                m_end[i] = m_end[j];
                m_endAt[i] = m_endAt[j];
                m_firstZero[i] = m_divides[i] ? id : m_firstZero[j];
            }
        }
    }

    // What checkLink(true) returns and reports for the spec at `slot`.
    int check(Tsd_EndpointSpec* spec, int slot) const {
        if (spec->hasDelayValue() || spec->isIgnored())
            return 0;
        // Only linked specs are in the graph.
        const int id = m_graph.idAt(slot, spec);
        const int next = id >= 0 ? m_graph.next(id) : -1;
        const End end = next >= 0 ? m_end[static_cast<std::size_t>(next)] : MISSING;
        if (end == MISSING || end == CIRCLE)
            return spec->checkLink(true);
        int count = 0;
        if (m_divides[static_cast<std::size_t>(id)]) {
            tsd_detail::reportZeroDivisor(spec);
            ++count;
        }
        for (int z = m_firstZero[static_cast<std::size_t>(next)]; z >= 0;
             z = m_firstZero[static_cast<std::size_t>(m_graph.next(z))]) {
            tsd_detail::reportZeroDivisor(m_graph.spec(z));
            ++count;
        }
        if (end == IGNORED) {
            tsd_detail::reportIgnoredLink(spec,
                                          m_graph.spec(m_endAt[static_cast<std::size_t>(next)]));
            ++count;
        }
        return count;
    }

private:
    enum End : char { DELAY, IGNORED, MISSING, CIRCLE };

    tsd_detail::LinkGraph m_graph;
    std::vector<End> m_end;
    std::vector<int> m_endAt;     // the ignored spec that ends the walk
    std::vector<int> m_firstZero; // the first zero divisor before the end
    std::vector<char> m_divides;
};

} // namespace

Tsd_Design* Tsd_Builder::buildTSDesign() {
    // A builder serves one build; a second call would hand the same design
    // out twice.
    if (m_built)
        TSD_MSG().fatal(2, "buildTSDesign() called more than once on one Tsd_Builder.\n");
    m_built = true;
    design();

    // 1. Group properties, in the order added.
    processStoredProps(m_groupProps,
                       "Processing TIMEGRP definition \"%s=%s\": ", &Tsd_Builder::processGroupProp);

    // 2. Groups that were named but never defined.
    Tsd_BaseObjListIter unresolved(&m_unresolvedGroups);
    while (Tsd_BaseObj* obj = unresolved.next()) {
        TSD_MSG().error("A group named \"%s\" was referenced in one or more TIMEGRP definitions, "
                        "but was never defined by a TIMEGRP or TNM property.\n",
                        obj->getUserGroup()->getName());
        countError();
    }

    // 3. Circular group definitions.
    validateUserGroups();

    // 4. Spec properties, in the order added.
    processStoredProps(m_specProps,
                       "Processing TIMESPEC definition \"%s=%s\": ", &Tsd_Builder::processSpecProp);

    // 5 to 7. What stayed pending.
    resolvePendingOffsets();
    resolvePendingLinks();
    installTIGs();

    if (m_numError != 0)
        return nullptr;
    // From here on the caller owns the design.
    m_ownedDesign.release();
    return m_design;
}

template <class Result>
void Tsd_Builder::processStoredProps(std::unique_ptr<tsd_detail::StoredProps>& props,
                                     const char* context,
                                     Result (Tsd_Builder::*process)(const char*, const char*)) {
    if (props == nullptr)
        return;
    // Each message names the definition it comes from through the context.
    // The count is read anew: a hook may store more properties.
    for (std::size_t i = 0; i < props->size(); ++i) {
        const tsd_detail::StoredProps::Prop prop = props->at(i);
        // The context is made when a message first asks for it.
        m_contextFormat = context;
        m_contextName = prop.name;
        m_contextValue = prop.value;
        (this->*process)(prop.name, prop.value);
        m_contextFormat = nullptr;
        props->releaseBefore(i + 1);
    }
    props.reset();
    setContext(nullptr);
}

void Tsd_Builder::validateUserGroups() {
    // What one group's check learns about groups free of circles saves the
    // checks of the others from walking them again.
    tsd_detail::CircleSearchState state;
    Tsd_BaseObjListIter iter(design().getGroupList());
    while (Tsd_BaseObj* obj = iter.next())
        if (Tsd_UserGroup* group = obj->getUserGroup())
            addErrorCount(tsd_detail::countCircles(group, true, state));
}

void Tsd_Builder::resolvePendingOffsets() {
    Tsd_Design& d = design();
    const bool referenceMode =
        d.getRefType() != nullptr && std::strcmp(d.getRefType(), "MM_TSREF") == 0;
    for (Tsd_Pend& pend : m_pendingRegGroups) {
        if (pend.spec == nullptr)
            continue;
        const char* name = pend.name.get();
        Tsd_Offset* offset = pend.spec->getOffset();
        Tsd_Group* found = d.findGroupByUserName(name, false);
        if (found != nullptr) {
            if (Tsd_TermGroup* term = found->getTermGroup()) {
                offset->setRegGroup(term);
                pend = Tsd_Pend();
            } else {
                TSD_MSG().error("Group \"%s\" is used as the register group in one or more OFFSET "
                                "specifications. This group is %z, which is not the correct type: "
                                "a TNM, TPSYNC or user group name is required here.\n",
                                name, getObjUserId(found));
                countError();
            }
        } else if (referenceMode) {
            // The tool's references define the group: make it, silently.
            auto* tnm = new Tsd_TNMGroup(name);
            d.addGroup(tnm);
            offset->setRegGroup(tnm);
        } else {
            TSD_MSG().error("Group \"%s\" is used as the register group in one or more OFFSET "
                            "specifications. This group is not defined by a TIMEGRP, TNM or "
                            "TPSYNC property.\n",
                            name);
            countError();
        }
    }
    if (referenceMode)
        return;

    // Clock groups that a spec named but no TS_CLKGRP property defined, each
    // reported with the objects that hold it.
    std::vector<Tsd_ClkGroup*> unreferenced;
    Tsd_BaseObjListIter clocks(d.getClockGroupList());
    while (Tsd_BaseObj* obj = clocks.next()) {
        Tsd_ClkGroup* clock = obj->getClkGroup();
        if (clock != nullptr && clock->getRefList()->isEmpty())
            unreferenced.push_back(clock);
    }
    if (unreferenced.empty())
        return;
    const ClockHolders holders(d, unreferenced);
    for (Tsd_ClkGroup* clock : unreferenced) {
        Message msg = TSD_MSG();
        msg.error("The following spec(s) referenced the Tsd_ClkGroup \"%s\", but no such TS_CLKGRP "
                  "reference property was added to the builder:\n",
                  clock->getName());
        for (const std::string& holder : holders.of(clock))
            msg.status("   %s\n", holder.c_str());
        countError();
    }
}

void Tsd_Builder::resolvePendingLinks() {
    Tsd_Design& d = design();
    bool failed = false;
    for (Tsd_Pend& pend : m_pendingLinks) {
        if (pend.spec == nullptr)
            continue;
        Tsd_EndpointSpec* waiting = pend.spec->getEndpointSpec();
        Tsd_EndpointSpec* found = d.findEndpointSpecByTSid(pend.name.get(), true);
        if (found != nullptr) {
            waiting->setLinkData(found, waiting->isLinkMultiplied(), waiting->getLinkFactor());
            pend = Tsd_Pend();
        } else {
            TSD_MSG().error("Specification \"%s\" is defined in terms of a specification with "
                            "TSid \"%s\", which does not exist.\n",
                            waiting->getTSid(), pend.name.get());
            countError();
            failed = true;
        }
    }
    if (failed)
        return;
    const Tsd_BaseObjList& specs = *d.getEndpointSpecList();
    LinkChecker checker(specs);
    for (int slot = 0; slot < specs.getCount(); ++slot) {
        Tsd_BaseObj* obj = specs.getAt(slot);
        if (Tsd_EndpointSpec* spec = obj != nullptr ? obj->getEndpointSpec() : nullptr)
            addErrorCount(checker.check(spec, slot));
    }
}

void Tsd_Builder::installTIGs() {
    Tsd_Design& d = design();
    Tsd_BaseObjListIter iter(d.getTIGGroupList());
    while (Tsd_BaseObj* obj = iter.next()) {
        Tsd_TIGGroup* tig = obj->getTIGGroup();
        if (tig == nullptr)
            TSD_MSG().fatal(2, "Non-TIG group in list.\n");
        const char* tsid = tig->getTIGid();
        if (tsid == nullptr) {
            d.setGlobalTIG(tig);
        } else if (Tsd_EndpointSpec* spec = d.findEndpointSpecByTSid(tsid, false)) {
            spec->setIgnoreGroup(tig);
        } else {
            TSD_MSG().error("One or more TIG directives were specified for a specification with "
                            "TSid \"%s\", which does not exist.\n",
                            tsid);
            countError();
        }
    }
}

Tsd_Builder::~Tsd_Builder() {
    // 1. A design the builder still owns goes first, with its objects.
    m_ownedDesign.reset();
    // 2. The parsers.
    m_specGroupParser.reset();
    m_netParser.reset();
    // 3 to 6: the context, descriptions, stored properties and pending
    // records go with their owners.
    // 7. Placeholder groups that were never defined.
    Tsd_BaseObjListIter iter(&m_unresolvedGroups);
    while (Tsd_BaseObj* obj = iter.next())
        delete obj;
    m_unresolvedGroups.emptyList();
}

void Tsd_Builder::dump(DumpStream& stream, short indent) const {
    const char* pad = tsd_detail::indent(indent);
    stream << pad << "Tsd_Builder" << DumpStream::endl;
    stream << pad << "   unresolved groups remaining:" << DumpStream::endl;
    Tsd_BaseObjListIter unresolved(&m_unresolvedGroups);
    while (Tsd_BaseObj* obj = unresolved.next())
        obj->dump(stream, static_cast<short>(indent + 2));
    stream << pad << "   pending links remaining:" << DumpStream::endl;
    for (const Tsd_Pend& pend : m_pendingLinks)
        if (pend.spec != nullptr)
            stream << pad << "      " << pend.name.get() << DumpStream::endl;
    stream << pad << "   pending reg groups remaining:" << DumpStream::endl;
    for (const Tsd_Pend& pend : m_pendingRegGroups)
        if (pend.spec != nullptr)
            stream << pad << "      " << pend.name.get() << DumpStream::endl;
    if (m_ownedDesign != nullptr)
        m_ownedDesign->dump(stream, static_cast<short>(indent + 1));
    stream << pad << "   builder error count: " << static_cast<std::int32_t>(m_numError)
           << DumpStream::endl;
    stream << pad << "   builder warning count: " << static_cast<std::int32_t>(m_numWarning)
           << DumpStream::endl;
}
