// The search for circular group definitions, shared by a user group's own
// check and the builder's check of every user group.
#pragma once

#include "tsd/Tsd_Groups.h"

#include <cstdint>

namespace tsd_detail {

// A number kept on each user group for a pass over many groups, so the pass
// needs no table keyed by group. One holder at a time owns the marks: a
// pass that finds them taken (held() false) must keep its own table.
class UserGroupMarks {
public:
    UserGroupMarks();
    ~UserGroupMarks();
    UserGroupMarks(const UserGroupMarks&) = delete;
    UserGroupMarks& operator=(const UserGroupMarks&) = delete;

    bool held() const { return m_tag != 0; }
    // What this holder set on `group`, or -1; only while held.
    std::int64_t get(const Tsd_UserGroup* group) const {
        return group->m_markTag == m_tag ? static_cast<std::int64_t>(group->m_markValue) : -1;
    }
    void set(const Tsd_UserGroup* group, std::uint32_t value) const {
        group->m_markTag = m_tag;
        group->m_markValue = value;
    }

    // The member at or after `position` of the group's included members,
    // then of its excluded ones, counted as one sequence; `position` moves
    // past it. Null at the end. A walk kept in one number per group.
    static Tsd_PredefGroup* nextMember(const Tsd_UserGroup* group, std::int32_t& position);

private:
    std::uint64_t m_tag = 0; // tells this holder's marks from older ones
};

// What searches over unchanged definitions know about user groups: which are
// on the route of the current search, and which reach no circular definition
// at all. The latter depends only on the definitions, not on where a search
// began, so one record serves every search of a validation.
//
// The state lives in the groups' marks, so a search a million groups deep
// needs no table; only a search that finds the marks taken keeps a table.
class CircleSearchState {
public:
    bool isFree(const Tsd_UserGroup* group) const { return state(group) == kFree; }
    bool isOnRoute(const Tsd_UserGroup* group) const { return state(group) == kOnRoute; }
    void enterRoute(const Tsd_UserGroup* group) { set(group, kOnRoute); }
    // Leaving the route, the group is recorded as free of circles or forgotten.
    void leaveRoute(const Tsd_UserGroup* group, bool free) { set(group, free ? kFree : kUnknown); }

private:
    static constexpr int kUnknown = 0;
    static constexpr int kOnRoute = 1;
    static constexpr int kFree = 2;

    int state(const Tsd_UserGroup* group) const;
    void set(const Tsd_UserGroup* group, int state);

    UserGroupMarks m_marks;
    Tsd_SlotIndex m_table; // without the marks: each group's state stands where a slot would
};

// What checkInExcludes(report) counts and reports for `start`, skipping the
// groups known to be free of circles and recording those it finds.
int countCircles(Tsd_UserGroup* start, bool report, CircleSearchState& state);

} // namespace tsd_detail
