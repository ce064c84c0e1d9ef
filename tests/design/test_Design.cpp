// The design container: lists and trash, finds, ownership and the dump; and
// the worklists of trim() and of the finds against the walks and passes
// they replace, on random designs. Trim cascades of built designs are in
// the builder's scenarios.
#include "RandomDesigns.h"
#include "internal/Tsd_GroupCircles.h"
#include "internal/Tsd_LinkGraph.h"

#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>

using namespace tsd_test;
using Reason = Tsd_Design::TrimReason;

TEST(Design, ListsTrashAndFinds) {
    Tsd_Design design;
    auto* first = new Tsd_TNMGroup("clk");
    auto* second = new Tsd_UserGroup("clk");
    auto* unnamed = new Tsd_UserGroup(nullptr);
    auto* gone = new Tsd_TNMGroup("gone");
    for (Tsd_Group* g : {static_cast<Tsd_Group*>(unnamed), static_cast<Tsd_Group*>(first),
                         static_cast<Tsd_Group*>(second), static_cast<Tsd_Group*>(gone)})
        design.addGroup(g);
    design.addGroup(nullptr); // ignored
    EXPECT_TRUE(design.moveGroupToTrash(gone));
    EXPECT_FALSE(design.moveGroupToTrash(gone));    // already trashed: nothing changes
    EXPECT_FALSE(design.moveGroupToTrash(nullptr)); // never removes a hole
    EXPECT_TRUE(design.isGroupTrashed(gone));
    EXPECT_FALSE(design.isGroupTrashed(first) || design.isGroupTrashed(nullptr));
    EXPECT_EQ(objects(design.getGroupTrash()), (std::vector<Tsd_BaseObj*>{gone}));
    EXPECT_EQ(design.getGroupList()->getCount(), 4); // the hole stays

    EXPECT_EQ(design.findGroupByUserName("clk", false), first); // the first added wins
    EXPECT_EQ(design.findGroupByUserName("CLK", false), nullptr);
    EXPECT_EQ(design.findGroupByUserName("gone", false), nullptr);
    EXPECT_EQ(design.findGroupByUserName("gone", true), gone);
    EXPECT_EQ(design.findGroupByUserName("", true), nullptr);

    auto* clock = new Tsd_ClkGroup("clk_net");
    design.addClockGroup(clock);
    EXPECT_EQ(design.findClockGroupByNetName("clk_net", false), clock);
    EXPECT_EQ(design.findClockGroupByNetName("clk", false), nullptr);
    EXPECT_TRUE(design.moveClockGroupToTrash(clock));
    EXPECT_EQ(design.findClockGroupByNetName("clk_net", true), clock);

    auto* global = new Tsd_TIGGroup(nullptr);
    auto* tig = new Tsd_TIGGroup("TS01");
    auto* upper = new Tsd_TIGGroup("GLOBAL");
    for (Tsd_TIGGroup* g : {upper, tig, global})
        design.addTIGGroup(g);
    EXPECT_EQ(design.findTIGByTSid(nullptr, false), global);
    EXPECT_EQ(design.findTIGByTSid("", false), global);
    EXPECT_EQ(design.findTIGByTSid("TS01", false), tig);
    EXPECT_EQ(design.findTIGByTSid("GLOBAL", false), upper);

    auto* path = new Tsd_DelayPath("TS01");
    auto* trashedSpec = new Tsd_Period("TS02");
    design.addEndpointSpec(path);
    design.addEndpointSpec(trashedSpec);
    EXPECT_TRUE(design.moveEndpointSpecToTrash(trashedSpec));
    EXPECT_TRUE(design.isEndpointSpecTrashed(trashedSpec));
    EXPECT_EQ(design.findEndpointSpecByTSid("TS01", false), path);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", false), nullptr);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", true), trashedSpec);
    EXPECT_EQ(design.findEndpointSpecByTSid("ts01", true), nullptr);

    auto* control = new Tsd_PathControl("d1", true);
    design.addPathControl(control);
    EXPECT_FALSE(design.isPathControlTrashed(control));
    EXPECT_TRUE(design.movePathControlToTrash(control));
    EXPECT_TRUE(design.isPathControlTrashed(control));
}

TEST(Design, WrongObjectsInTypedListsAreFatal) {
    MessageCapture capture;
    Tsd_Design design;
    design.getGroupList()->addObj(new Tsd_Period("TS01"));
    design.getClockGroupList()->addObj(new Tsd_TNMGroup("t"));
    design.getTIGGroupList()->addObj(new Tsd_ClkGroup("c"));
    design.getEndpointSpecList()->addObj(new Tsd_Offset());
    Tsd_Design trash;
    trash.getEndpointSpecTrash()->addObj(new Tsd_UserGroup("not_a_spec"));
    Tsd_TNMGroup g("g");
    const struct {
        std::function<void()> misuse;
        const char* message;
    } cases[] = {
        {[&] { design.findGroupByUserName("x", false); }, "Non-group object.\n"},
        {[&] { design.findClockGroupByNetName("x", false); }, "Non-clock group object.\n"},
        {[&] { design.findTIGByTSid("x", false); }, "Non-TIG object.\n"},
        {[&] { design.findEndpointSpecByTSid("x", false); }, "Non-endpoint spec object.\n"},
        {[&] { trash.trim(); }, "Wrong object type.\n"},
        {[&] { trash.getGroupHolders(&g, nullptr); }, "NULL list passed to getGroupHolders().\n"},
    };
    for (const auto& c : cases) {
        int code = 0;
        EXPECT_EQ(fatalText(c.misuse, &code), c.message);
        EXPECT_EQ(code, 2);
    }
    // Holders are appended to what the list holds; a null group has none.
    Tsd_BaseObjList list;
    list.addObj(&g);
    design.getGroupHolders(nullptr, &list);
    EXPECT_EQ(objects(&list), (std::vector<Tsd_BaseObj*>{&g}));
}

TEST(Design, DestructionDeletesActiveAndTrashedObjectsOnce) {
    int destroyed = 0;
    {
        Tsd_Design design;
        auto* active = new Tsd_TNMGroup("a");
        auto* trashed = new Tsd_ClkGroup("c");
        auto* twice = new Tsd_ThruGroup("t");
        attachRef(active, "a", &destroyed);
        attachRef(trashed, "c", &destroyed);
        attachRef(twice, "t", &destroyed);
        design.addGroup(active);
        design.addClockGroup(trashed);
        design.moveClockGroupToTrash(trashed);
        // A caller that adds an object twice must not cause a double delete.
        design.addGroup(twice);
        design.addGroup(twice);
        auto* global = new Tsd_TIGGroup("global");
        design.addTIGGroup(global);
        design.setGlobalTIG(global); // not deleted separately
    }
    EXPECT_EQ(destroyed, 3);
}

TEST(Design, ReferenceTypeGlobalTIGAndDumps) {
    EXPECT_EQ(Tsd_Design().getRefType(), nullptr);
    struct Typed : Tsd_Design { // a derived design may set the type
        Typed() { setRefType("MY_REF"); }
    } derived;
    EXPECT_STREQ(derived.getRefType(), "MY_REF");

    Tsd_Design design("MM_TSREF");
    std::string text = dumpText(design, 1);
    auto* clk = new Tsd_TNMGroup("clk");
    auto* old = new Tsd_TNMGroup("old");
    design.addGroup(clk);
    design.addGroup(old);
    design.moveGroupToTrash(old);
    auto* global = new Tsd_TIGGroup(nullptr);
    design.addTIGGroup(global);
    EXPECT_EQ(design.getGlobalTIG(), nullptr);
    design.setGlobalTIG(global);
    EXPECT_EQ(design.getGlobalTIG(), global);
    design.addEndpointSpec(new Tsd_DelayPath("TS01"));
    design.addPortTiming(new Tsd_PortTiming("FEEDBACK"));
    expectGolden("design/design.golden", text + dumpText(design, 1));
}

// The finds answer from indexes; they must agree with a walk of the lists
// through every way the lists and the names change, foreign objects included.
TEST(Design, FindsAgreeWithAWalkThroughEveryChange) {
    MessageCapture capture;
    const char* const names[] = {"a", "b", "c", "d", nullptr};
    auto name = [&](unsigned r) { return names[r % 5]; };
    std::mt19937 rng(11);
    for (int round = 0; round < 20; ++round) {
        Tsd_Design design;
        std::vector<std::unique_ptr<Tsd_BaseObj>> pool; // the test owns every object
        std::vector<Tsd_Group*> groups;
        std::vector<Tsd_EndpointSpec*> specs;
        Tsd_BaseObjList* lists[] = {design.getGroupList(), design.getGroupTrash(),
                                    design.getEndpointSpecList(), design.getEndpointSpecTrash()};
        // The first match of a walk of active then trash; null for a fatal.
        auto walk = [&](bool ofSpecs, const char* key, bool trash, bool& fatal) -> Tsd_BaseObj* {
            fatal = false;
            for (int l = 0; l < (trash ? 2 : 1); ++l) {
                const Tsd_BaseObjList* list = lists[(ofSpecs ? 2 : 0) + l];
                for (int i = 0; i < list->getCount(); ++i) {
                    Tsd_BaseObj* obj = list->getAt(i);
                    if (obj == nullptr)
                        continue;
                    Tsd_Group* g = ofSpecs ? nullptr : obj->getGroup();
                    Tsd_EndpointSpec* s = ofSpecs ? obj->getEndpointSpec() : nullptr;
                    if (g == nullptr && s == nullptr) {
                        fatal = true;
                        return nullptr;
                    }
                    const char* k = g != nullptr ? g->getName() : s->getTSid();
                    if (k != nullptr && std::strcmp(k, key) == 0)
                        return obj;
                }
            }
            return nullptr;
        };
        for (int step = 0; step < 300; ++step) {
            const unsigned op = rng() % 100;
            Tsd_BaseObjList* list = lists[rng() % 4];
            const bool ofSpecs = list == lists[2] || list == lists[3];
            if (op < 35 || groups.empty()) {
                auto* g = new Tsd_TNMGroup(name(rng()));
                auto* s = new Tsd_DelayPath("TS");
                s->setTSid(name(rng()));
                pool.emplace_back(g);
                pool.emplace_back(s);
                groups.push_back(g);
                specs.push_back(s);
                design.getGroupList()->addObj(g);
                design.getEndpointSpecList()->addObj(s);
            } else if (op < 50) {
                design.moveGroupToTrash(groups[rng() % groups.size()]);
                design.moveEndpointSpecToTrash(specs[rng() % specs.size()]);
            } else if (op < 60) {
                list->removeObj(ofSpecs ? static_cast<Tsd_BaseObj*>(specs[rng() % specs.size()])
                                        : groups[rng() % groups.size()]);
            } else if (op < 70 && list->getCount() > 0) {
                Tsd_BaseObj* obj = rng() % 2 ? nullptr
                                   : ofSpecs
                                       ? static_cast<Tsd_BaseObj*>(specs[rng() % specs.size()])
                                       : groups[rng() % groups.size()];
                list->setAt(static_cast<int>(rng() % list->getCount()), obj);
            } else if (op < 85) {
                groups[rng() % groups.size()]->setName(name(rng()));
                specs[rng() % specs.size()]->setTSid(name(rng()));
            } else if (op < 87) {
                // An object of the wrong class in a typed list.
                auto* foreign = new Tsd_Offset();
                pool.emplace_back(foreign);
                list->addObj(foreign);
            } else if (op < 89) {
                list->removeAt(static_cast<int>(rng() % (list->getCount() + 1)));
            }
            for (bool specsToo : {false, true}) {
                for (const char* key : {"a", "b", "e"}) {
                    const bool trash = rng() % 2 != 0;
                    bool fatal = false;
                    Tsd_BaseObj* expected = walk(specsToo, key, trash, fatal);
                    Tsd_BaseObj* found = nullptr;
                    std::string text = fatalText([&] {
                        found = specsToo ? static_cast<Tsd_BaseObj*>(
                                               design.findEndpointSpecByTSid(key, trash))
                                         : design.findGroupByUserName(key, trash);
                    });
                    ASSERT_EQ(text != "<no fatal message>", fatal) << round << " " << step;
                    if (!fatal) {
                        ASSERT_EQ(found, expected) << round << " " << step << " " << key;
                    }
                }
            }
        }
        for (Tsd_BaseObjList* l : lists)
            l->emptyList();
    }
}

// trim() computes its cascades with worklists; these tests run the passes and
// walks as literally described on a twin of each random design and compare
// everything that can be seen: what is reported, in order, the messages, the
// dumps and the exact delay values.
namespace {

std::vector<std::string> reported(const RecordingDesign& design) {
    std::vector<std::string> out;
    for (const auto& entry : design.trashed) {
        Tsd_Group* group = entry.first->getGroup();
        const char* name = group != nullptr ? group->getName() : entry.first->getSpec()->getTSid();
        out.push_back((name != nullptr ? name : "<null>") + std::string(" ") +
                      std::to_string(entry.second));
    }
    return out;
}

// The group steps of trim as literally described: reference owners, then
// user-group passes until one trashes nothing, then the unlinking of
// trashed members one member at a time.
bool literalGroupTrim(RecordingDesign& design) {
    auto trashIf = [&](Tsd_Group* group, Reason reason) {
        if (!design.moveGroupToTrash(group))
            return false;
        design.trashed.emplace_back(group, reason);
        return true;
    };
    bool any = false;
    for (Tsd_BaseObj* obj : objects(design.getGroupList()))
        if (obj->getRefList() != nullptr && obj->getRefList()->isEmpty())
            any |= trashIf(obj->getGroup(), Tsd_Design::TRIM_NO_REFERENCES);
    for (bool again = true; again;) {
        again = false;
        Tsd_BaseObjListIter pass(design.getGroupList());
        while (Tsd_BaseObj* obj = pass.next()) {
            Tsd_UserGroup* user = obj->getUserGroup();
            if (user == nullptr)
                continue;
            bool empty = true;
            Tsd_UserGroupIter members(user, false);
            Tsd_UserGroup::Edge edge;
            while (Tsd_PredefGroup* member = members.next(edge))
                empty = empty && design.isGroupTrashed(member);
            if (empty && trashIf(user, Tsd_Design::TRIM_EMPTY_USER_GROUP))
                again = any = true;
        }
    }
    for (Tsd_BaseObj* obj : objects(design.getGroupList())) {
        if (Tsd_UserGroup* user = obj->getUserGroup()) {
            for (bool exclude : {false, true}) {
                Tsd_UserGroupIter members(user, exclude);
                Tsd_UserGroup::Edge edge;
                while (Tsd_PredefGroup* member = members.next(edge))
                    if (design.isGroupTrashed(member))
                        user->removeGroup(member, exclude);
            }
        }
    }
    return any;
}

// The unlinking of specs as literally described: the link check, then a walk
// of the chain, spec by spec in list order.
void literalFreeze(Tsd_Design& design) {
    for (Tsd_BaseObj* obj : objects(design.getEndpointSpecList())) {
        Tsd_EndpointSpec* spec = obj->getEndpointSpec();
        if (spec->checkLink(false) != 0) {
            MessageManager::debugTrace("checkLink() failed for spec %s.\n", spec->getTSid());
            continue;
        }
        if (!spec->isLinked())
            continue;
        bool computable = false, touchesTrash = false;
        std::vector<const Tsd_EndpointSpec*> visited{spec};
        const Tsd_EndpointSpec* current = spec;
        for (;;) {
            if (!current->isLinked()) {
                computable = current->hasDelayValue();
                break;
            }
            const Tsd_EndpointSpec* next = current->getLinkedSpec();
            if ((!current->isLinkMultiplied() && current->getLinkFactor() == 0.0) ||
                next == nullptr || std::find(visited.begin(), visited.end(), next) != visited.end())
                break;
            visited.push_back(next);
            touchesTrash = touchesTrash || design.isEndpointSpecTrashed(next);
            current = next;
        }
        if (touchesTrash && computable) {
            spec->setDelayValue(spec->getDelayValue());
            Tsd_Period* period = spec->getPeriod();
            if (period != nullptr && period->hasPhase())
                period->setPhase(Tsd_TimeValue(), true);
        } else if (touchesTrash) {
            MessageManager::debugTrace("checkLink() failed for spec %s.\n", spec->getTSid());
        }
    }
}

// Every spec's delay, bit for bit, and its link target.
std::vector<std::string> delays(Tsd_Design& design) {
    std::vector<std::string> out;
    for (Tsd_BaseObjList* list : {design.getEndpointSpecList(), design.getEndpointSpecTrash()}) {
        for (int i = 0; i < list->getCount(); ++i) {
            Tsd_EndpointSpec* spec = list->getAt(i) ? list->getAt(i)->getEndpointSpec() : nullptr;
            if (spec == nullptr || !spec->hasDelayValue()) {
                out.push_back(spec && spec->getLinkedSpec() ? spec->getLinkedSpec()->getTSid()
                                                            : "-");
                continue;
            }
            Tsd_TimeValue value = spec->getDelayValue();
            std::uint64_t bits;
            std::memcpy(&bits, &value.value, sizeof bits);
            out.push_back(std::to_string(bits) + " " + std::to_string(value.units));
        }
    }
    return out;
}

} // namespace

TEST(Trim, UserGroupCascadeMatchesRepeatedPasses) {
    for (unsigned seed = 0; seed < 1500; ++seed) {
        SCOPED_TRACE(seed);
        RecordingDesign fast, literal;
        fillGroups(seed, fast);
        fillGroups(seed, literal);
        // Every other design is trimmed while another holder has the
        // groups' marks: trim then keeps its own tables.
        std::unique_ptr<tsd_detail::UserGroupMarks> taken;
        if (seed % 2 != 0)
            taken = std::make_unique<tsd_detail::UserGroupMarks>();
        EXPECT_EQ(fast.trim(), literalGroupTrim(literal));
        ASSERT_EQ(reported(fast), reported(literal));
        ASSERT_EQ(dumpText(fast), dumpText(literal));
    }
}

TEST(Trim, FreezingLinksMatchesWalkingEachChain) {
    MessageManager::setDebugTrace(true);
    for (unsigned seed = 0; seed < 1500; ++seed) {
        SCOPED_TRACE(seed);
        RecordingDesign fast, literal;
        fillSpecs(seed, fast);
        fillSpecs(seed, literal);
        std::string fastText, literalText;
        {
            // Every other design is frozen while another link graph has the
            // specs' marks: the freezing then keeps its own index.
            Tsd_BaseObjList none;
            std::unique_ptr<tsd_detail::LinkGraph> taken;
            if (seed % 2 != 0)
                taken = std::make_unique<tsd_detail::LinkGraph>(none);
            MessageCapture capture;
            fastText = fatalText([&] { fast.trim(); }) + capture.sink.transcript();
        }
        {
            MessageCapture capture;
            literalText = fatalText([&] { literalFreeze(literal); }) + capture.sink.transcript();
        }
        ASSERT_EQ(fastText, literalText);
        ASSERT_EQ(delays(fast), delays(literal));
        ASSERT_EQ(dumpText(fast), dumpText(literal));
    }
    MessageManager::setDebugTrace(false);
}
