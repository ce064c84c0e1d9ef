// The search for circular group definitions, shared by a user group's own
// check and the builder's check of every user group.
#pragma once

#include "tsd/Tsd_Groups.h"

#include <cstdint>

namespace tsd_detail {

// What searches over unchanged definitions know about user groups: which are
// on the route of the current search, and which reach no circular definition
// at all. The latter depends only on the definitions, not on where a search
// began, so one record serves every search of a validation.
//
// The state lives in the groups themselves, tagged with the search it belongs
// to, so a search a million groups deep needs no table. A search started
// while another one holds the groups' marks keeps its state in a table.
class CircleSearchState {
public:
    CircleSearchState();
    ~CircleSearchState();
    CircleSearchState(const CircleSearchState&) = delete;
    CircleSearchState& operator=(const CircleSearchState&) = delete;

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

    std::uint64_t m_search = 0; // this search's tag, or 0 when it uses the table
    Tsd_SlotIndex m_table;      // each group's state stands where a slot would
};

// What checkInExcludes(report) counts and reports for `start`, skipping the
// groups known to be free of circles and recording those it finds.
int countCircles(Tsd_UserGroup* start, bool report, CircleSearchState& state);

} // namespace tsd_detail
