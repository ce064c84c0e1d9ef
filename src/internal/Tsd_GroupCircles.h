// The search for circular group definitions, shared by a user group's own
// check and the builder's check of every user group.
#pragma once

#include "internal/Tsd_PointerSet.h"
#include "tsd/Tsd_Groups.h"

namespace tsd_detail {

// User groups known to reach no circular definition. Whether a group does
// depends only on the definitions, not on where a search began, so one set
// serves every search over unchanged definitions.
using CircleFreeGroups = PointerSet;

// What checkInExcludes(report) counts and reports for `start`, skipping (and
// adding to) the groups of `circleFree`.
int countCircles(Tsd_UserGroup* start, bool report, CircleFreeGroups& circleFree);

} // namespace tsd_detail
