// Trimming: moving what lost its meaning to trash, in cascade, unlinking the
// survivors from the trash, and listing the holders of a group.
#include "tsd/Tsd_Design.h"

#include "internal/Tsd_Report.h"

#include <vector>

namespace {

bool allIncludesIn(const Tsd_UserGroup* group, const Tsd_BaseObjList& trash) {
    Tsd_UserGroupIter iter(group, false);
    Tsd_UserGroup::Edge edge;
    while (Tsd_PredefGroup* member = iter.next(edge))
        if (!trash.contains(member))
            return false;
    return true;
}

bool hasMember(const Tsd_UserGroup* user, const Tsd_Group* group) {
    for (bool exclude : {false, true}) {
        Tsd_UserGroupIter members(user, exclude);
        Tsd_UserGroup::Edge edge;
        while (Tsd_PredefGroup* member = members.next(edge))
            if (member == group)
                return true;
    }
    return false;
}

// Whether `spec`'s delay can be computed through its link chain, and whether
// a spec on that chain is trashed. A chain that ends without a delay, meets a
// zero divisor or runs into a cycle cannot be computed.
struct ChainState {
    bool computable = false;
    bool touchesTrash = false;
};

ChainState examineChain(const Tsd_EndpointSpec* spec, const Tsd_BaseObjList& trash) {
    ChainState state;
    std::vector<const Tsd_EndpointSpec*> visited{spec};
    const Tsd_EndpointSpec* current = spec;
    while (current->isLinked()) {
        const Tsd_EndpointSpec::LinkData* link = current->getLinkData();
        if (!link->multiply && link->factor == 0.0)
            return state;
        const Tsd_EndpointSpec* next = link->spec;
        if (next == nullptr)
            return state;
        for (const Tsd_EndpointSpec* seen : visited)
            if (seen == next)
                return state;
        visited.push_back(next);
        if (trash.contains(next))
            state.touchesTrash = true;
        current = next;
    }
    state.computable = current->hasDelayValue();
    return state;
}

} // namespace

int Tsd_Design::trimRefObjs(ListPair& pair) {
    int count = 0;
    Tsd_BaseObjListIter iter(&pair.active);
    while (Tsd_BaseObj* obj = iter.next()) {
        Tsd_RefList* refs = obj->getRefList();
        if (refs != nullptr && refs->isEmpty() && moveToTrash(pair, obj)) {
            reportObjTrashed(obj, TRIM_NO_REFERENCES);
            ++count;
        }
    }
    return count;
}

int Tsd_Design::trimUserGroups() {
    int count = 0;
    Tsd_BaseObjListIter iter(&m_groups.active);
    while (Tsd_BaseObj* obj = iter.next()) {
        Tsd_UserGroup* group = obj->getUserGroup();
        if (group != nullptr && allIncludesIn(group, m_groups.trash) &&
            moveToTrash(m_groups, group)) {
            reportObjTrashed(group, TRIM_EMPTY_USER_GROUP);
            ++count;
        }
    }
    return count;
}

bool Tsd_Design::trim() {
    int count = 0;

    // 1. Reference owners without references.
    for (ListPair* pair :
         {&m_groups, &m_clockGroups, &m_tigGroups, &m_offsetSpecs, &m_netSpecs, &m_portSpecs})
        count += trimRefObjs(*pair);

    // 2. User groups, until a pass finds nothing: one trashed in a pass can
    // empty another that was walked before it.
    for (int n = trimUserGroups(); n != 0; n = trimUserGroups())
        count += n;

    // 3. Endpoint specs whose groups are gone.
    Tsd_BaseObjListIter specs(&m_endpointSpecs.active);
    while (Tsd_BaseObj* obj = specs.next()) {
        TrimReason reason = TRIM_NONE;
        if (Tsd_DelayPath* path = obj->getDelayPath()) {
            if (path->getStart() != nullptr && isGroupTrashed(path->getStart()))
                reason = TRIM_PATH_ENDPOINT;
            else if (path->getEnd() != nullptr && isGroupTrashed(path->getEnd()))
                reason = TRIM_PATH_ENDPOINT;
            else {
                Tsd_PathThruIter thru(path);
                while (Tsd_ThruGroup* group = thru.next()) {
                    if (isGroupTrashed(group)) {
                        reason = TRIM_PATH_THRU;
                        break;
                    }
                }
            }
        } else if (Tsd_Period* period = obj->getPeriod()) {
            if (period->getPeriodGroup() != nullptr && isGroupTrashed(period->getPeriodGroup()))
                reason = TRIM_PERIOD_GROUP;
        }
        if (reason != TRIM_NONE && moveToTrash(m_endpointSpecs, obj)) {
            reportObjTrashed(obj, reason);
            ++count;
        }
    }

    // 4. The TIG groups of every trashed endpoint spec.
    Tsd_BaseObjListIter trashed(&m_endpointSpecs.trash);
    while (Tsd_BaseObj* obj = trashed.next()) {
        Tsd_EndpointSpec* spec = obj->getEndpointSpec();
        if (spec == nullptr)
            TSD_MSG().fatal(2, "Wrong object type.\n");
        Tsd_TIGGroup* tig = spec->getIgnoreGroup();
        if (tig != nullptr && moveToTrash(m_tigGroups, tig)) {
            reportObjTrashed(tig, TRIM_TIG_OF_TRASHED_SPEC);
            ++count;
        }
    }

    // 5. Offsets whose clock, reference pin, register or pad group is gone.
    Tsd_BaseObjListIter offsets(&m_offsetSpecs.active);
    while (Tsd_BaseObj* obj = offsets.next()) {
        Tsd_Offset* offset = obj->getOffset();
        if (offset == nullptr)
            TSD_MSG().fatal(2, "Wrong object type.\n");
        Tsd_GroupOffset* groupOffset = obj->getGroupOffset();
        TrimReason reason = TRIM_NONE;
        if (offset->getClockPad() != nullptr && isClockGroupTrashed(offset->getClockPad()))
            reason = TRIM_CLOCK_GROUP;
        else if (offset->getReferencePin() != nullptr &&
                 isClockGroupTrashed(offset->getReferencePin()))
            reason = TRIM_CLOCK_GROUP;
        else if (offset->getRegGroup() != nullptr && isGroupTrashed(offset->getRegGroup()))
            reason = TRIM_REG_GROUP;
        else if (groupOffset != nullptr && groupOffset->getPadGroup() != nullptr &&
                 isGroupTrashed(groupOffset->getPadGroup()))
            reason = TRIM_PAD_GROUP;
        if (reason != TRIM_NONE && moveToTrash(m_offsetSpecs, obj)) {
            reportObjTrashed(obj, reason);
            ++count;
        }
    }

    // 6. Port timings whose secondary group is gone.
    Tsd_BaseObjListIter ports(&m_portSpecs.active);
    while (Tsd_BaseObj* obj = ports.next()) {
        Tsd_PortTiming* port = obj->getPortTiming();
        if (port == nullptr)
            TSD_MSG().fatal(2, "Wrong object type.\n");
        if (port->getSecondaryGroup() != nullptr &&
            isClockGroupTrashed(port->getSecondaryGroup()) && moveToTrash(m_portSpecs, obj)) {
            reportObjTrashed(obj, TRIM_CLOCK_GROUP);
            ++count;
        }
    }

    unlinkTrash();
    return count != 0;
}

void Tsd_Design::unlinkTrash() {
    // 1. Trashed members leave the user groups that survive.
    Tsd_BaseObjListIter groups(&m_groups.active);
    while (Tsd_BaseObj* obj = groups.next()) {
        Tsd_UserGroup* group = obj->getUserGroup();
        if (group == nullptr)
            continue;
        for (bool exclude : {false, true}) {
            Tsd_UserGroupIter members(group, exclude);
            Tsd_UserGroup::Edge edge;
            while (Tsd_PredefGroup* member = members.next(edge))
                if (isGroupTrashed(member))
                    group->removeGroup(member, exclude);
        }
    }

    // 2. Endpoint specs linked into the trash keep their computed delay.
    Tsd_BaseObjListIter specs(&m_endpointSpecs.active);
    while (Tsd_BaseObj* obj = specs.next()) {
        Tsd_EndpointSpec* spec = obj->getEndpointSpec();
        if (spec == nullptr)
            TSD_MSG().fatal(2, "Wrong object type.\n");
        if (spec->checkLink(false) != 0) {
            MessageManager::debugTrace("checkLink() failed for spec %s.\n", spec->getTSid());
            continue;
        }
        if (spec->isLinked()) {
            ChainState chain = examineChain(spec, m_endpointSpecs.trash);
            // An ignored spec passes checkLink whatever its chain holds; its
            // delay is only frozen when the chain can be computed.
            if (chain.touchesTrash && chain.computable) {
                spec->setDelayValue(spec->getDelayValue());
                Tsd_Period* period = spec->getPeriod();
                if (period != nullptr && period->hasPhase())
                    period->setPhase(Tsd_TimeValue(), true);
            } else if (chain.touchesTrash) {
                MessageManager::debugTrace("checkLink() failed for spec %s.\n", spec->getTSid());
            }
        }
        if (spec->getIgnoreGroup() != nullptr && isTIGGroupTrashed(spec->getIgnoreGroup()))
            spec->setIgnoreGroup(nullptr);
    }

    // 3. The global TIG.
    if (m_globalTIG != nullptr && isTIGGroupTrashed(m_globalTIG))
        m_globalTIG = nullptr;
}

void Tsd_Design::getGroupHolders(Tsd_Group* group, Tsd_BaseObjList* list) {
    if (list == nullptr)
        TSD_MSG().fatal(2, "NULL list passed to getGroupHolders().\n");
    if (group == nullptr)
        return;

    // User groups that name it as a member.
    if (group->getPredefGroup() != nullptr) {
        Tsd_BaseObjListIter groups(&m_groups.active);
        while (Tsd_BaseObj* obj = groups.next()) {
            Tsd_UserGroup* user = obj->getUserGroup();
            if (user == nullptr)
                continue;
            if (hasMember(user, group))
                list->addObj(user);
        }
    }

    Tsd_TermGroup* term = group->getTermGroup();
    Tsd_ThruGroup* thru = group->getThruGroup();
    Tsd_ClkGroup* clock = group->getClkGroup();

    // Endpoint specs: periods and path ends for a term group, THRU points
    // for a THRU group.
    if (term != nullptr || thru != nullptr) {
        Tsd_BaseObjListIter specs(&m_endpointSpecs.active);
        while (Tsd_BaseObj* obj = specs.next()) {
            Tsd_DelayPath* path = obj->getDelayPath();
            if (path == nullptr) {
                Tsd_Period* period = obj->getPeriod();
                if (period != nullptr && term != nullptr && period->getPeriodGroup() == group)
                    list->addObj(obj);
            } else if (term != nullptr) {
                if (path->getStart() == group || path->getEnd() == group)
                    list->addObj(obj);
            } else {
                Tsd_PathThruIter iter(path);
                while (Tsd_ThruGroup* point = iter.next()) {
                    if (point == group) {
                        list->addObj(obj);
                        break;
                    }
                }
            }
        }
    }

    // A TIG group is held by the delay path or period whose TSid it names.
    if (term == nullptr && clock == nullptr) {
        Tsd_TIGGroup* tig = group->getTIGGroup();
        const char* tsid = tig != nullptr ? tig->getTIGid() : nullptr;
        if (tsid != nullptr) {
            if (Tsd_EndpointSpec* spec = findEndpointSpecByTSid(tsid, false))
                list->addObj(spec);
        }
        return;
    }

    Tsd_BaseObjListIter offsets(&m_offsetSpecs.active);
    while (Tsd_BaseObj* obj = offsets.next()) {
        Tsd_Offset* offset = obj->getOffset();
        if (offset == nullptr)
            continue;
        if (term != nullptr) {
            Tsd_GroupOffset* groupOffset = obj->getGroupOffset();
            if (offset->getRegGroup() == group)
                list->addObj(obj);
            else if (groupOffset != nullptr && groupOffset->getPadGroup() == group)
                list->addObj(obj);
        } else if (offset->getClockPad() == group) {
            list->addObj(obj);
        }
    }

    if (clock != nullptr) {
        Tsd_BaseObjListIter ports(&m_portSpecs.active);
        while (Tsd_BaseObj* obj = ports.next()) {
            Tsd_PortTiming* port = obj->getPortTiming();
            if (port != nullptr && port->getSecondaryGroup() == group)
                list->addObj(obj);
        }
    }
}
