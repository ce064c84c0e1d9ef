// TIMEGRP user groups: member entries, the canonical TIMEGRP value and the
// search for circular definitions.
#include "tsd/Tsd_Groups.h"

#include "internal/Tsd_GroupCircles.h"
#include "internal/Tsd_ObjText.h"
#include "internal/Tsd_PropBuffers.h"
#include "internal/Tsd_Report.h"
#include "tsd/Tsd_StaticBuf.h"

#include <algorithm>
#include <functional>
#include <string>
#include <vector>

using tsd_detail::dumpLine;
using tsd_detail::orEmpty;

namespace {

const char* edgePrefix(Tsd_UserGroup::Edge edge) {
    switch (edge) {
    case Tsd_UserGroup::EDGE_RISING:
        return "RISING:";
    case Tsd_UserGroup::EDGE_FALLING:
        return "FALLING:";
    case Tsd_UserGroup::EDGE_TRANSHI:
        return "TRANSHI:";
    case Tsd_UserGroup::EDGE_TRANSLO:
        return "TRANSLO:";
    default:
        return "";
    }
}

const char* edgeDumpText(Tsd_UserGroup::Edge edge) {
    switch (edge) {
    case Tsd_UserGroup::EDGE_RISING:
        return "Rising Edge";
    case Tsd_UserGroup::EDGE_FALLING:
        return "Falling Edge";
    case Tsd_UserGroup::EDGE_TRANSHI:
        return "Transparent High";
    case Tsd_UserGroup::EDGE_TRANSLO:
        return "Transparent Low";
    case Tsd_UserGroup::EDGE_ANY:
        return "Any edge";
    default:
        return "";
    }
}

void copyEntries(const Tsd_UserGroup& from, bool excludes, Tsd_UserGroup& to) {
    Tsd_UserGroupIter iter(&from, excludes);
    Tsd_UserGroup::Edge edge = Tsd_UserGroup::EDGE_ANY;
    while (Tsd_PredefGroup* member = iter.next(edge))
        to.addGroup(member, edge, excludes);
}

} // namespace

Tsd_UserGroup::Tsd_UserGroup(const char* name) : Tsd_PredefGroup(name) {}

Tsd_UserGroup::Tsd_UserGroup(const Tsd_UserGroup& other) : Tsd_PredefGroup(other) {
    copyEntries(other, false, *this);
    copyEntries(other, true, *this);
}

Tsd_UserGroup::~Tsd_UserGroup() = default;

void Tsd_UserGroup::MemberList::append(const Member& member) {
    if (m_count == m_capacity) {
        const std::int32_t capacity = m_capacity < 4 ? 4 : 2 * m_capacity;
        auto grown = std::make_unique<Member[]>(static_cast<std::size_t>(capacity));
        std::copy(data(), data() + m_count, grown.get());
        m_heap = std::move(grown);
        m_capacity = capacity;
    }
    data()[m_count++] = member;
}

void Tsd_UserGroup::MemberList::clear() {
    m_heap.reset();
    m_capacity = 1;
    m_count = 0;
}

void Tsd_UserGroup::addGroup(Tsd_PredefGroup* group, Edge edge, bool exclude) {
    // A null member marks a removed entry.
    if (group == nullptr)
        return;
    if (exclude && m_excludes == nullptr)
        m_excludes = std::make_unique<MemberList>();
    (exclude ? *m_excludes : m_includes).append(Member{group, edge});
}

bool Tsd_UserGroup::removeGroup(Tsd_PredefGroup* group, bool exclude) {
    MemberList* list = exclude ? m_excludes.get() : &m_includes;
    if (group == nullptr || list == nullptr)
        return false;
    bool removed = false;
    for (std::int32_t i = 0; i < list->count(); ++i) {
        if (list->at(i).group == group) {
            list->at(i).group = nullptr;
            removed = true;
        }
    }
    return removed;
}

void Tsd_UserGroup::removeMembers(const std::vector<const Tsd_PredefGroup*>& members,
                                  bool exclude) {
    MemberList* list = exclude ? m_excludes.get() : &m_includes;
    for (std::int32_t i = 0; list != nullptr && i < list->count(); ++i) {
        Member& entry = list->at(i);
        if (entry.group != nullptr &&
            std::binary_search(members.begin(), members.end(), entry.group,
                               std::less<const Tsd_PredefGroup*>()))
            entry.group = nullptr;
    }
}

void Tsd_UserGroup::clearDef() {
    m_includes.clear();
    m_excludes.reset();
}

bool Tsd_UserGroup::getProp(const char*& name, const char*& value) const {
    std::string text;
    Edge edge = EDGE_ANY;
    Tsd_UserGroupIter includes(this, false);
    bool first = true;
    while (Tsd_PredefGroup* member = includes.next(edge)) {
        if (!first)
            text += ':';
        first = false;
        text += edgePrefix(edge);
        text += Tsd_Util::getAnnoName(member->getName());
    }
    Tsd_UserGroupIter excludes(this, true);
    first = true;
    while (Tsd_PredefGroup* member = excludes.next(edge)) {
        text += first ? ":EXCEPT:" : ":";
        first = false;
        text += edgePrefix(edge);
        text += Tsd_Util::getAnnoName(member->getName());
    }
    tsd_detail::PropBuffers& buffers = tsd_detail::groupPropBuffers();
    buffers.name.copy(getName());
    buffers.value.copy(text.c_str());
    return buffers.handOut(name, value);
}

void Tsd_UserGroup::dump(DumpStream& stream, short indent) const {
    dumpLine(stream, indent, "Tsd_UserGroup");
    dumpLine(stream, indent + 1, tsd_detail::nameLine(getName()));
    for (bool excludes : {false, true}) {
        dumpLine(stream, indent, excludes ? "   excluded groups:" : "   included groups:");
        Tsd_UserGroupIter iter(this, excludes);
        Edge edge = EDGE_ANY;
        while (Tsd_PredefGroup* member = iter.next(edge))
            dumpLine(stream, indent,
                     std::string("      ") + orEmpty(member->getName()) + " - " +
                         edgeDumpText(edge));
    }
}

namespace {

// One user group on the current route of the circular-definition walk, and
// how far its members have been walked, included members first, then
// excluded ones: sixteen bytes, for routes a million groups deep.
struct Frame {
    Tsd_UserGroup* group;
    std::int32_t position;
    std::int32_t countOnEntry;
};

void reportCircle(const std::vector<Frame>& route) {
    Message msg = TSD_MSG();
    msg.error("Circular group definition encountered from user group \"%s\", as follows:\n",
              orEmpty(route.front().group->getName()));
    for (const Frame& frame : route) {
        const char* name = nullptr;
        const char* value = nullptr;
        frame.group->getProp(name, value);
        msg.status("   %s=%s\n", name, value);
    }
}

} // namespace

namespace {

std::uint64_t g_lastTag = 0;
bool g_marksTaken = false;

} // namespace

tsd_detail::UserGroupMarks::UserGroupMarks() {
    if (!g_marksTaken) {
        g_marksTaken = true;
        m_tag = ++g_lastTag;
    }
}

tsd_detail::UserGroupMarks::~UserGroupMarks() {
    if (m_tag != 0)
        g_marksTaken = false;
}

Tsd_PredefGroup* tsd_detail::UserGroupMarks::nextMember(const Tsd_UserGroup* group,
                                                        std::int32_t& position) {
    const Tsd_UserGroup::MemberList& includes = group->m_includes;
    for (; position < includes.count(); ++position)
        if (Tsd_PredefGroup* member = includes.at(position).group) {
            ++position;
            return member;
        }
    const Tsd_UserGroup::MemberList* excludes = group->m_excludes.get();
    for (; excludes != nullptr && position - includes.count() < excludes->count(); ++position)
        if (Tsd_PredefGroup* member = excludes->at(position - includes.count()).group) {
            ++position;
            return member;
        }
    return nullptr;
}

int tsd_detail::CircleSearchState::state(const Tsd_UserGroup* group) const {
    if (!m_marks.held()) {
        const int slot = m_table.first(group);
        return slot < 0 ? kUnknown : slot;
    }
    const std::int64_t mark = m_marks.get(group);
    return mark < 0 ? kUnknown : static_cast<int>(mark);
}

void tsd_detail::CircleSearchState::set(const Tsd_UserGroup* group, int state) {
    if (m_marks.held()) {
        m_marks.set(group, static_cast<std::uint32_t>(state));
        return;
    }
    // A group enters the route from the unknown state only.
    if (state == kOnRoute)
        m_table.add(group, kOnRoute);
    else if (state == kFree)
        m_table.setFirst(group, kFree);
    else
        m_table.remove(group, kOnRoute);
}

int tsd_detail::countCircles(Tsd_UserGroup* start, bool report, CircleSearchState& state) {
    // A depth-first walk over every route from the group, with an explicit
    // stack so that a long chain of definitions cannot exhaust the call
    // stack. Each route that comes back to a group already on it is one
    // circle. A group whose walk found no circle reaches no circle at all,
    // whatever the route to it, so later routes (and later searches) skip
    // it: that keeps sound definitions linear and changes no count.
    if (state.isFree(start))
        return 0;
    int count = 0;
    std::vector<Frame> route;
    route.push_back(Frame{start, 0, count});
    state.enterRoute(start);
    while (!route.empty()) {
        Tsd_PredefGroup* member =
            UserGroupMarks::nextMember(route.back().group, route.back().position);
        if (member == nullptr) {
            state.leaveRoute(route.back().group, count == route.back().countOnEntry);
            route.pop_back();
            continue;
        }
        Tsd_UserGroup* user = member->getUserGroup();
        if (user == nullptr || state.isFree(user))
            continue;
        if (state.isOnRoute(user)) {
            ++count;
            if (report)
                reportCircle(route);
            continue;
        }
        route.push_back(Frame{user, 0, count});
        state.enterRoute(user);
    }
    return count;
}

int Tsd_UserGroup::checkInExcludes(bool report) {
    tsd_detail::CircleSearchState state;
    return tsd_detail::countCircles(this, report, state);
}

// --- Tsd_UserGroupIter -----------------------------------------------------

Tsd_UserGroupIter::Tsd_UserGroupIter(const Tsd_UserGroup* group, bool excludes)
    : m_list(group == nullptr ? nullptr
             : excludes       ? group->m_excludes.get()
                              : &group->m_includes) {}

Tsd_PredefGroup* Tsd_UserGroupIter::next(Tsd_UserGroup::Edge& edge) {
    if (m_list == nullptr)
        return nullptr;
    // The count is read anew on every call: entries appended during a walk
    // are visited, and removed ones are skipped.
    while (m_index < m_list->count()) {
        const Tsd_UserGroup::Member& entry = m_list->at(m_index++);
        if (entry.group != nullptr) {
            edge = entry.edge;
            return entry.group;
        }
    }
    return nullptr;
}
