// Random small designs for tests that compare the library's worklists with
// the walks and passes they replace.
#pragma once

#include "TsdTestSupport.h"

#include <algorithm>
#include <random>
#include <string>
#include <vector>

namespace tsd_test {

// TNM groups with and without references and user groups that include and
// exclude them and each other (themselves too), listed in random order; some
// trashed beforehand, and now and then one listed twice or listed and
// trashed at once.
inline void fillGroups(unsigned seed, Tsd_Design& design) {
    std::mt19937 rng(seed);
    std::vector<Tsd_PredefGroup*> all;
    std::vector<Tsd_UserGroup*> users;
    const int tnms = 1 + static_cast<int>(rng() % 5);
    const int userCount = 1 + static_cast<int>(rng() % 12);
    for (int i = 0; i < tnms; ++i) {
        auto* tnm = new Tsd_TNMGroup(("t" + std::to_string(i)).c_str());
        if (rng() % 3 != 0)
            attachRef(tnm);
        all.push_back(tnm);
    }
    for (int i = 0; i < userCount; ++i) {
        users.push_back(new Tsd_UserGroup(("u" + std::to_string(i)).c_str()));
        all.push_back(users.back());
    }
    for (Tsd_UserGroup* user : users)
        for (unsigned k = rng() % 4; k > 0; --k)
            user->addGroup(all[rng() % all.size()], Tsd_UserGroup::EDGE_ANY, rng() % 4 == 0);
    std::vector<Tsd_PredefGroup*> order = all;
    std::shuffle(order.begin(), order.end(), rng);
    for (Tsd_PredefGroup* group : order)
        design.addGroup(group);
    for (Tsd_PredefGroup* group : order)
        if (rng() % 10 == 0)
            design.moveGroupToTrash(group);
    if (rng() % 5 == 0)
        design.getGroupList()->addObj(users[rng() % users.size()]);
    if (rng() % 5 == 0)
        design.getGroupTrash()->addObj(users[rng() % users.size()]);
}

// Delay paths (some ignored) and periods (some with a phase), each with a
// delay, a link to any of them (cycles and zero divisors included) or,
// rarely, neither or an unresolved link; listed in random order, some
// trashed, now and then one listed twice.
inline void fillSpecs(unsigned seed, Tsd_Design& design) {
    std::mt19937 rng(seed);
    const int count = 1 + static_cast<int>(rng() % (seed % 4 == 0 ? 40 : 10));
    std::vector<Tsd_EndpointSpec*> specs;
    for (int i = 0; i < count; ++i) {
        const std::string tsid = "TS" + std::to_string(i);
        if (rng() % 3 == 0) {
            auto* period = new Tsd_Period(tsid.c_str());
            if (rng() % 2 == 0)
                period->setPhase(Tsd_TimeValue(1, Tsd_TimeValue::UNITS_NS), true);
            specs.push_back(period);
        } else {
            auto* path = new Tsd_DelayPath(tsid.c_str());
            if (rng() % 3 == 0)
                path->setIgnored();
            specs.push_back(path);
        }
    }
    const double factors[] = {2, 0.5, 3, 7, 0.1};
    for (std::size_t i = 0; i < specs.size(); ++i) {
        Tsd_EndpointSpec* spec = specs[i];
        // Links to near neighbours make long chains and long cycles.
        Tsd_EndpointSpec* target = rng() % 2 == 0 ? specs[rng() % specs.size()]
                                                  : specs[(i + 1 + rng() % 2) % specs.size()];
        const unsigned kind = rng() % 20;
        const bool multiply = rng() % 2 == 0;
        double factor = factors[rng() % 5];
        if (!multiply && rng() % 4 == 0)
            factor = 0.0;
        if (kind < 5)
            spec->setDelayValue(Tsd_TimeValue(1 + rng() % 9, kind == 0 ? Tsd_TimeValue::UNITS_MHZ
                                                                       : Tsd_TimeValue::UNITS_NS));
        else if (kind < 19 || seed % 16 != 0)
            spec->setLinkData(target, multiply, factor);
        else if (rng() % 2 == 0)
            spec->setLinkData(nullptr, multiply, factor);
    }
    std::vector<Tsd_EndpointSpec*> order = specs;
    std::shuffle(order.begin(), order.end(), rng);
    for (Tsd_EndpointSpec* spec : order)
        design.addEndpointSpec(spec);
    for (Tsd_EndpointSpec* spec : order)
        if (rng() % 5 == 0)
            design.moveEndpointSpecToTrash(spec);
    // By hand: a spec listed twice, or listed while trashed.
    if (rng() % 4 == 0)
        design.getEndpointSpecList()->addObj(order[rng() % order.size()]);
}

} // namespace tsd_test
