// The search for circular group definitions, shared by a user group's own
// check and the builder's check of every user group.
#pragma once

#include "tsd/Tsd_Groups.h"

namespace tsd_detail {

// What searches over unchanged definitions know about user groups: which are
// on the route of the current search, and which reach no circular definition
// at all. The latter depends only on the definitions, not on where a search
// began, so one record serves every search of a validation.
class CircleSearchState {
public:
    bool isFree(const Tsd_UserGroup* group) const { return m_state.first(group) == kFree; }
    bool isOnRoute(const Tsd_UserGroup* group) const { return m_state.first(group) == kOnRoute; }
    void enterRoute(const Tsd_UserGroup* group) { m_state.add(group, kOnRoute); }
    // Leaving the route, the group is recorded as free of circles or forgotten.
    void leaveRoute(const Tsd_UserGroup* group, bool free) {
        if (free)
            m_state.setFirst(group, kFree);
        else
            m_state.remove(group, kOnRoute);
    }

private:
    static constexpr int kOnRoute = 0;
    static constexpr int kFree = 1;
    Tsd_SlotIndex m_state; // each group's state stands where a slot would
};

// What checkInExcludes(report) counts and reports for `start`, skipping the
// groups known to be free of circles and recording those it finds.
int countCircles(Tsd_UserGroup* start, bool report, CircleSearchState& state);

} // namespace tsd_detail
