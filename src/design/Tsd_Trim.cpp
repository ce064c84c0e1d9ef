// Trimming: moving what lost its meaning to trash, in cascade, unlinking the
// survivors from the trash, and listing the holders of a group.
#include "tsd/Tsd_Design.h"

#include "internal/Tsd_GroupCircles.h"
#include "internal/Tsd_LinkGraph.h"
#include "internal/Tsd_Report.h"

#include <algorithm>
#include <cstdint>
#include <functional>
#include <queue>
#include <utility>
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

// The members that a walk of one member list meets and that are in `trash`,
// sorted by address, each once.
std::vector<const Tsd_PredefGroup*> trashedMembers(const Tsd_UserGroup* group, bool exclude,
                                                   const Tsd_BaseObjList& trash) {
    std::vector<const Tsd_PredefGroup*> found;
    Tsd_UserGroupIter members(group, exclude);
    Tsd_UserGroup::Edge edge;
    while (Tsd_PredefGroup* member = members.next(edge))
        if (trash.contains(member))
            found.push_back(member);
    std::sort(found.begin(), found.end(), std::less<const Tsd_PredefGroup*>());
    found.erase(std::unique(found.begin(), found.end()), found.end());
    return found;
}

// Freezes, spec by spec in list order, the delay of every spec whose link
// chain passes through the trash, as a walk of each chain would:
//
//   a spec whose link check fails is passed over (a debug trace says so);
//   a linked spec whose chain meets a trashed spec and can be computed gets
//   its computed delay as its own, which cuts its link.
//
// A frozen spec ends the chains that pass through it from then on, so the
// outcome depends on the order of the list. Chains that end at a delay form
// a forest rooted at those delays; a spec's chain now ends at its nearest
// frozen ancestor, found through an Euler tour of the forest and a segment
// tree of the marks that freezing adds. What a walk would meet on the way,
// zero divisors, ignored specs and trashed specs, comes from counts summed
// along the forest. Chains that end at an unresolved link or run into a
// cycle never meet a frozen spec, so their outcome is fixed and memoised.
class LinkFreezer {
public:
    LinkFreezer(const Tsd_BaseObjList& specs, const Tsd_BaseObjList& trash) : m_graph(specs) {
        const auto n = static_cast<std::size_t>(m_graph.size());
        m_root.assign(n, -1);
        m_zero.assign(n, 0);
        m_ignored.assign(n, 0);
        m_trashed.assign(n, 0);
        m_haveValue.assign(n, 0);
        m_fatalAhead.assign(n, 0);
        m_trashAhead.assign(n, 0);
        m_firstZero.assign(n, -1);
        m_divides.assign(n, 0);
        std::vector<char> trashed(n);
        for (int id : m_graph.order()) {
            m_divides[static_cast<std::size_t>(id)] = tsd_detail::dividesByZero(m_graph.spec(id));
            trashed[static_cast<std::size_t>(id)] = trash.contains(m_graph.spec(id));
        }
        const std::vector<char>& zero = m_divides;
        examineCycles(zero, trashed);
        for (int id : m_graph.order()) {
            const auto i = static_cast<std::size_t>(id);
            const Tsd_EndpointSpec* spec = m_graph.spec(id);
            const int next = m_graph.next(id);
            const bool ignored = spec->isIgnored();
            if (m_graph.cycleOf(id) >= 0)
                continue;
            const auto j = static_cast<std::size_t>(next >= 0 ? next : 0);
            // Arriving at this spec, a walk of checkLink ends in a fatal
            // message: no delay, not ignored, and no link to follow.
            m_fatalAhead[i] = !spec->hasDelayValue() && !ignored &&
                              (next < 0 || (m_graph.cycleOf(next) < 0 && m_fatalAhead[j] != 0));
            // Arriving here, the walk of the chain meets a trashed spec
            // before it stops at a zero divisor, an unresolved link or the
            // end of the chain.
            m_trashAhead[i] = trashed[i] || (next >= 0 && !zero[i] && m_trashAhead[j] != 0);
            if (spec->hasDelayValue()) {
                m_root[i] = id;
                m_ignored[i] = ignored;
                m_trashed[i] = trashed[i];
            } else if (next >= 0 && m_root[j] >= 0) {
                m_root[i] = m_root[j];
                m_zero[i] = zero[i] + m_zero[j];
                m_ignored[i] = ignored + m_ignored[j];
                m_trashed[i] = trashed[i] + m_trashed[j];
                m_firstZero[i] = zero[i] ? id : m_firstZero[j];
            }
        }
        buildTour();
    }

    // Steps a and b for the spec at `slot` of the list; false when its link
    // check fails, which also skips the rest of the spec's unlinking.
    bool visit(Tsd_EndpointSpec* spec, int slot) {
        if (spec->hasDelayValue())
            return true;
        // Only linked specs are in the graph.
        const int id = m_graph.idAt(slot, spec);
        const int next = id >= 0 ? m_graph.next(id) : -1;
        if (next < 0) {
            // Nothing to follow: fine for an ignored spec, else the link
            // check ends in its fatal message.
            if (!spec->isIgnored())
                spec->checkLink(false);
            return true;
        }
        const auto i = static_cast<std::size_t>(id);
        const auto j = static_cast<std::size_t>(next);
        if (m_root[i] < 0) {
            // The chain never reaches a delay, and nothing on it is frozen.
            if (spec->isIgnored()) {
                bool onCycle = m_graph.cycleOf(id) >= 0;
                if (!m_divides[i] && (onCycle ? m_trashAfter[i] != 0 : m_trashAhead[j] != 0))
                    traceFailure(spec);
                return true;
            }
            if (m_graph.cycleOf(next) < 0 && m_fatalAhead[j])
                spec->checkLink(false);
            traceFailure(spec);
            return false;
        }
        const int end = chainEnd(id);
        const auto e = static_cast<std::size_t>(end);
        const int zeros = m_zero[i] - m_zero[e];
        const bool touchesTrash = m_trashed[j] - m_trashed[e] + trashedAt(end) > 0;
        if (!spec->isIgnored()) {
            if (zeros > 0 || m_ignored[j] - m_ignored[e] > 0) {
                traceFailure(spec);
                return false;
            }
            if (touchesTrash)
                freeze(id);
            return true;
        }
        // An ignored spec passes the link check whatever its chain holds; its
        // delay is only frozen when the chain can be computed.
        if (zeros == 0) {
            if (touchesTrash)
                freeze(id);
        } else {
            // The walk stops at the first zero divisor (this spec's own
            // counts nothing, as the sums cancel).
            const int zero = m_firstZero[i];
            const auto z = static_cast<std::size_t>(zero);
            if (m_trashed[j] - m_trashed[z] + trashedAt(zero) > 0)
                traceFailure(spec);
        }
        return true;
    }

private:
    static void traceFailure(const Tsd_EndpointSpec* spec) {
        MessageManager::debugTrace("checkLink() failed for spec %s.\n", spec->getTSid());
    }

    int trashedAt(int id) const {
        const auto i = static_cast<std::size_t>(id);
        const int next = m_graph.next(id);
        return m_trashed[i] -
               (next >= 0 && m_root[i] != id ? m_trashed[static_cast<std::size_t>(next)] : 0);
    }

    // For a spec on a cycle, whether the walk from it meets a trashed spec
    // before a zero divisor or its way back.
    void examineCycles(const std::vector<char>& zero, const std::vector<char>& trashed) {
        m_trashAfter.assign(static_cast<std::size_t>(m_graph.size()), 0);
        for (int c = 0; c < m_graph.cycleCount(); ++c) {
            const std::vector<int> cycle = m_graph.cycleNodes(c);
            const int length = static_cast<int>(cycle.size());
            const std::vector<int> toZero = tsd_detail::LinkGraph::distanceTo(cycle, zero);
            std::vector<int> trashBefore(2 * cycle.size() + 1, 0);
            for (int k = 0; k < 2 * length; ++k)
                trashBefore[static_cast<std::size_t>(k) + 1] =
                    trashBefore[static_cast<std::size_t>(k)] +
                    trashed[static_cast<std::size_t>(cycle[static_cast<std::size_t>(k % length)])];
            for (int k = 0; k < length; ++k) {
                const auto node = static_cast<std::size_t>(cycle[static_cast<std::size_t>(k)]);
                const int d = toZero[static_cast<std::size_t>(k)];
                const int last = k + (d >= 0 ? d : length - 1);
                const int after = trashBefore[static_cast<std::size_t>(last) + 1] -
                                  trashBefore[static_cast<std::size_t>(k) + 1];
                m_trashAfter[node] = after > 0;
                m_trashAhead[node] = trashed[node] || after > 0;
            }
        }
    }

    // The Euler tour of the forest of chains that end at a delay: a subtree
    // takes the positions from its root's on, as many as it has nodes, so
    // sizes summed from the leaves up place every node, parents first.
    void buildTour() {
        const auto n = static_cast<std::size_t>(m_graph.size());
        const std::vector<int>& order = m_graph.order();
        auto inForest = [&](int id) { return m_root[static_cast<std::size_t>(id)] >= 0; };
        auto isRoot = [&](int id) { return m_root[static_cast<std::size_t>(id)] == id; };
        std::vector<int> size(n, 1);
        for (auto it = order.rbegin(); it != order.rend(); ++it)
            if (inForest(*it) && !isRoot(*it))
                size[static_cast<std::size_t>(m_graph.next(*it))] +=
                    size[static_cast<std::size_t>(*it)];
        m_enter.assign(n, 0);
        m_depth.assign(n, 0);
        std::vector<int> nextFree(n, 0); // the next position for a child
        int time = 0;
        for (int id : order) {
            const auto i = static_cast<std::size_t>(id);
            if (!inForest(id))
                continue;
            if (isRoot(id)) {
                m_enter[i] = time;
                time += size[i];
            } else {
                const auto parent = static_cast<std::size_t>(m_graph.next(id));
                m_enter[i] = nextFree[parent];
                nextFree[parent] += size[i];
                m_depth[i] = m_depth[parent] + 1;
            }
            nextFree[i] = m_enter[i] + 1;
        }
        for (std::size_t i = 0; i < n; ++i)
            size[i] += m_enter[i];
        m_leave = std::move(size);
        m_tourSize = time;
        m_marks.assign(2 * static_cast<std::size_t>(time), -1);
    }

    // Where the chain of `id` now ends: its nearest frozen ancestor, else its
    // root.
    int chainEnd(int id) const {
        int best = -1;
        for (auto p = static_cast<std::size_t>(m_enter[static_cast<std::size_t>(id)] + m_tourSize);
             p >= 1; p >>= 1) {
            int mark = m_marks[p];
            if (mark >= 0 && (best < 0 || m_depth[static_cast<std::size_t>(mark)] >
                                              m_depth[static_cast<std::size_t>(best)]))
                best = mark;
        }
        return best >= 0 ? best : m_root[static_cast<std::size_t>(id)];
    }

    void mark(int id) {
        std::size_t lo =
            static_cast<std::size_t>(m_enter[static_cast<std::size_t>(id)] + m_tourSize);
        std::size_t hi =
            static_cast<std::size_t>(m_leave[static_cast<std::size_t>(id)] + m_tourSize);
        const int depth = m_depth[static_cast<std::size_t>(id)];
        auto put = [&](std::size_t p) {
            if (m_marks[p] < 0 || m_depth[static_cast<std::size_t>(m_marks[p])] < depth)
                m_marks[p] = id;
        };
        for (; lo < hi; lo >>= 1, hi >>= 1) {
            if (lo & 1)
                put(lo++);
            if (hi & 1)
                put(--hi);
        }
    }

    // The delay that getDelayValue() gives: the same operations in the same
    // order, each link applied to the value of the spec it links to.
    Tsd_TimeValue value(int id) {
        if (m_values.empty())
            m_values.resize(static_cast<std::size_t>(m_graph.size()));
        std::vector<int> pending;
        int x = id;
        while (!m_haveValue[static_cast<std::size_t>(x)] && !m_graph.spec(x)->hasDelayValue()) {
            pending.push_back(x);
            x = m_graph.next(x);
        }
        if (!m_haveValue[static_cast<std::size_t>(x)]) {
            m_values[static_cast<std::size_t>(x)] = m_graph.spec(x)->getDelayValue();
            m_haveValue[static_cast<std::size_t>(x)] = 1;
        }
        for (auto it = pending.rbegin(); it != pending.rend(); ++it) {
            const Tsd_EndpointSpec::LinkData& link = *m_graph.spec(*it)->getLinkData();
            Tsd_TimeValue v = m_values[static_cast<std::size_t>(m_graph.next(*it))];
            if (link.multiply)
                v.value *= link.factor;
            else
                v.value /= link.factor;
            m_values[static_cast<std::size_t>(*it)] = v;
            m_haveValue[static_cast<std::size_t>(*it)] = 1;
        }
        return m_values[static_cast<std::size_t>(id)];
    }

    void freeze(int id) {
        Tsd_EndpointSpec* spec = m_graph.spec(id);
        spec->setDelayValue(value(id));
        Tsd_Period* period = spec->getPeriod();
        if (period != nullptr && period->hasPhase())
            period->setPhase(Tsd_TimeValue(), true);
        mark(id);
    }

    tsd_detail::LinkGraph m_graph;
    // Per spec of a chain that ends at a delay: that delay's spec, and the
    // zero divisors, ignored specs and trashed specs from it to there.
    std::vector<int> m_root;
    std::vector<int> m_zero;
    std::vector<int> m_ignored;
    std::vector<int> m_trashed;
    std::vector<int> m_firstZero;
    // Per spec: whether its link divides by zero; for the specs of other
    // chains, the outcomes described where they are set.
    std::vector<char> m_divides;
    std::vector<char> m_fatalAhead;
    std::vector<char> m_trashAhead;
    std::vector<char> m_trashAfter;
    // The tour: entry and exit times, depths, and the segment tree whose
    // nodes hold the deepest frozen spec whose subtree covers them.
    std::vector<int> m_enter;
    std::vector<int> m_leave;
    std::vector<int> m_depth;
    int m_tourSize = 0;
    std::vector<int> m_marks;
    std::vector<Tsd_TimeValue> m_values;
    std::vector<char> m_haveValue;
};

} // namespace

int Tsd_Design::trimRefObjs(ListPair& pair) {
    // Walking in list order, an object that goes has gone from every earlier
    // slot too (the test gave the same answer there), so the slot it is met
    // at is its first: it leaves from there without a search of the list.
    int count = 0;
    for (int slot = 0; slot < pair.active.getCount(); ++slot) {
        Tsd_BaseObj* obj = pair.active.getAt(slot);
        Tsd_RefList* refs = obj != nullptr ? obj->getRefList() : nullptr;
        if (refs != nullptr && refs->isEmpty()) {
            moveToTrashAt(pair, obj, slot);
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

int Tsd_Design::trimUserGroupsToTheEnd() {
    // Pass after pass, a user group goes at its own place in the list as
    // soon as its last included member has gone: in the same pass when that
    // member stands before it, else in the next. So the time of every event,
    // (pass, slot), follows from the times of the members, and processing
    // events in time order gives the same groups in the same order as the
    // passes would, with work for each group and member only once.
    const Tsd_BaseObjList& active = m_groups.active;
    const Tsd_BaseObjList& trash = m_groups.trash;
    struct Node {
        Tsd_UserGroup* group;
        int slot;
        int waitingFor; // members not yet trashed; -1: one never will be
    };
    std::vector<Node> nodes;
    for (int slot = 0; slot < active.getCount(); ++slot) {
        Tsd_BaseObj* obj = active.getAt(slot);
        if (Tsd_UserGroup* group = obj != nullptr ? obj->getUserGroup() : nullptr)
            nodes.push_back({group, slot, 0});
    }
    // Each listed user group's node, found from the group: through the
    // groups' marks, or else by address in a sorted table.
    tsd_detail::UserGroupMarks marks;
    std::vector<std::pair<const Tsd_BaseObj*, int>> byAddress;
    // A group listed twice is met by the passes at two places: such a design
    // is trimmed pass by pass.
    bool plain = true;
    if (marks.held()) {
        for (std::size_t k = 0; k < nodes.size() && plain; ++k) {
            plain = marks.get(nodes[k].group) < 0;
            marks.set(nodes[k].group, static_cast<std::uint32_t>(k));
        }
    } else {
        byAddress.reserve(nodes.size());
        for (std::size_t k = 0; k < nodes.size(); ++k)
            byAddress.emplace_back(nodes[k].group, static_cast<int>(k));
        std::sort(byAddress.begin(), byAddress.end(),
                  [](const auto& a, const auto& b) { return std::less<>()(a.first, b.first); });
        for (std::size_t k = 1; k < byAddress.size() && plain; ++k)
            plain = byAddress[k].first != byAddress[k - 1].first;
    }
    if (!plain) {
        int count = 0;
        for (int n = trimUserGroups(); n != 0; n = trimUserGroups())
            count += n;
        return count;
    }

    auto nodeOf = [&](Tsd_PredefGroup* member) -> int {
        if (marks.held()) {
            const Tsd_UserGroup* user = member->getUserGroup();
            return user != nullptr ? static_cast<int>(marks.get(user)) : -1;
        }
        const Tsd_BaseObj* obj = member;
        auto it = std::lower_bound(
            byAddress.begin(), byAddress.end(), obj,
            [](const auto& entry, const Tsd_BaseObj* p) { return std::less<>()(entry.first, p); });
        return it != byAddress.end() && it->first == obj ? it->second : -1;
    };
    // Who waits for whom: for each listed user group, the groups that
    // include it, once per entry.
    std::vector<std::pair<int, int>> waits; // (member, includer)
    for (std::size_t k = 0; k < nodes.size(); ++k) {
        Tsd_UserGroupIter members(nodes[k].group, false);
        Tsd_UserGroup::Edge edge;
        while (Tsd_PredefGroup* member = members.next(edge)) {
            if (trash.contains(member))
                continue;
            int m = nodeOf(member);
            if (m < 0) {
                nodes[k].waitingFor = -1;
                break;
            }
            ++nodes[k].waitingFor;
            waits.emplace_back(m, static_cast<int>(k));
        }
    }
    std::vector<int> firstWaiter(nodes.size() + 1, 0);
    for (const auto& w : waits)
        ++firstWaiter[static_cast<std::size_t>(w.first) + 1];
    for (std::size_t k = 1; k < firstWaiter.size(); ++k)
        firstWaiter[k] += firstWaiter[k - 1];
    std::vector<int> waiters(waits.size());
    {
        std::vector<int> fill(firstWaiter.begin(), firstWaiter.end() - 1);
        for (const auto& w : waits)
            waiters[static_cast<std::size_t>(fill[static_cast<std::size_t>(w.first)]++)] = w.second;
    }
    waits.clear();
    waits.shrink_to_fit();

    // Events by (pass, slot), earliest first.
    using Event = std::pair<std::uint64_t, int>;
    auto at = [](std::uint64_t pass, int slot) {
        return (pass << 32) | static_cast<std::uint32_t>(slot);
    };
    std::priority_queue<Event, std::vector<Event>, std::greater<Event>> events;
    for (std::size_t k = 0; k < nodes.size(); ++k)
        if (nodes[k].waitingFor == 0)
            events.emplace(at(1, nodes[k].slot), static_cast<int>(k));
    int count = 0;
    while (!events.empty()) {
        const std::uint64_t pass = events.top().first >> 32;
        const Node& node = nodes[static_cast<std::size_t>(events.top().second)];
        const int k = events.top().second;
        events.pop();
        // Listed once, a group still at its slot stands first there.
        if (active.getAt(node.slot) == node.group)
            moveToTrashAt(m_groups, node.group, node.slot);
        else if (!moveToTrash(m_groups, node.group))
            continue;
        reportObjTrashed(node.group, TRIM_EMPTY_USER_GROUP);
        ++count;
        for (int w = firstWaiter[static_cast<std::size_t>(k)];
             w < firstWaiter[static_cast<std::size_t>(k) + 1]; ++w) {
            Node& waiter = nodes[static_cast<std::size_t>(waiters[static_cast<std::size_t>(w)])];
            if (waiter.waitingFor > 0 && --waiter.waitingFor == 0)
                events.emplace(at(waiter.slot > node.slot ? pass : pass + 1, waiter.slot),
                               waiters[static_cast<std::size_t>(w)]);
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
    count += trimUserGroupsToTheEnd();

    // 3. Endpoint specs whose groups are gone. Here and in steps 5 and 6 a
    // spec that goes stands first at the slot it is met at, as in
    // trimRefObjs.
    for (int slot = 0; slot < m_endpointSpecs.active.getCount(); ++slot) {
        Tsd_BaseObj* obj = m_endpointSpecs.active.getAt(slot);
        if (obj == nullptr)
            continue;
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
        if (reason != TRIM_NONE) {
            moveToTrashAt(m_endpointSpecs, obj, slot);
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
    for (int slot = 0; slot < m_offsetSpecs.active.getCount(); ++slot) {
        Tsd_BaseObj* obj = m_offsetSpecs.active.getAt(slot);
        if (obj == nullptr)
            continue;
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
        if (reason != TRIM_NONE) {
            moveToTrashAt(m_offsetSpecs, obj, slot);
            reportObjTrashed(obj, reason);
            ++count;
        }
    }

    // 6. Port timings whose secondary group is gone.
    for (int slot = 0; slot < m_portSpecs.active.getCount(); ++slot) {
        Tsd_BaseObj* obj = m_portSpecs.active.getAt(slot);
        if (obj == nullptr)
            continue;
        Tsd_PortTiming* port = obj->getPortTiming();
        if (port == nullptr)
            TSD_MSG().fatal(2, "Wrong object type.\n");
        if (port->getSecondaryGroup() != nullptr &&
            isClockGroupTrashed(port->getSecondaryGroup())) {
            moveToTrashAt(m_portSpecs, obj, slot);
            reportObjTrashed(obj, TRIM_CLOCK_GROUP);
            ++count;
        }
    }

    unlinkTrash();
    return count != 0;
}

void Tsd_Design::unlinkTrash() {
    // 1. Trashed members leave the user groups that survive, every entry of
    // each at once.
    Tsd_BaseObjListIter groups(&m_groups.active);
    while (Tsd_BaseObj* obj = groups.next()) {
        Tsd_UserGroup* group = obj->getUserGroup();
        if (group == nullptr)
            continue;
        for (bool exclude : {false, true}) {
            std::vector<const Tsd_PredefGroup*> gone =
                trashedMembers(group, exclude, m_groups.trash);
            if (!gone.empty())
                group->removeMembers(gone, exclude);
        }
    }

    // 2. Endpoint specs linked into the trash keep their computed delay.
    LinkFreezer freezer(m_endpointSpecs.active, m_endpointSpecs.trash);
    for (int slot = 0; slot < m_endpointSpecs.active.getCount(); ++slot) {
        Tsd_BaseObj* obj = m_endpointSpecs.active.getAt(slot);
        if (obj == nullptr)
            continue;
        Tsd_EndpointSpec* spec = obj->getEndpointSpec();
        if (spec == nullptr)
            TSD_MSG().fatal(2, "Wrong object type.\n");
        if (!freezer.visit(spec, slot))
            continue;
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
