#include "DesignTestSupport.h"

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <random>

using tsd_test::attachRef;
using tsd_test::fatalText;
using tsd_test::MessageCapture;

namespace {

std::vector<Tsd_BaseObj*> items(const Tsd_BaseObjList* list) {
    std::vector<Tsd_BaseObj*> out;
    Tsd_BaseObjListIter iter(list);
    while (Tsd_BaseObj* obj = iter.next())
        out.push_back(obj);
    return out;
}

} // namespace

TEST(Design, AddMoveAndTrashQueries) {
    Tsd_Design design;
    auto* a = new Tsd_TNMGroup("a");
    auto* b = new Tsd_UserGroup("b");
    design.addGroup(a);
    design.addGroup(b);
    design.addGroup(nullptr); // ignored
    EXPECT_EQ(items(design.getGroupList()), (std::vector<Tsd_BaseObj*>{a, b}));

    EXPECT_TRUE(design.moveGroupToTrash(a));
    EXPECT_TRUE(design.isGroupTrashed(a));
    EXPECT_FALSE(design.isGroupTrashed(b));
    EXPECT_FALSE(design.isGroupTrashed(nullptr));
    // Already trashed: nothing changes.
    EXPECT_FALSE(design.moveGroupToTrash(a));
    EXPECT_EQ(items(design.getGroupTrash()), (std::vector<Tsd_BaseObj*>{a}));
    EXPECT_EQ(items(design.getGroupList()), (std::vector<Tsd_BaseObj*>{b}));
    EXPECT_EQ(design.getGroupList()->getCount(), 2); // the hole stays
    // A null argument never removes a hole.
    EXPECT_FALSE(design.moveGroupToTrash(nullptr));
    EXPECT_EQ(design.getGroupTrash()->getCount(), 1);

    auto* spec = new Tsd_Period("TS01");
    design.addEndpointSpec(spec);
    EXPECT_TRUE(design.moveEndpointSpecToTrash(spec));
    EXPECT_TRUE(design.isEndpointSpecTrashed(spec));
    auto* control = new Tsd_PathControl("d1", true);
    design.addPathControl(control);
    EXPECT_FALSE(design.isPathControlTrashed(control));
    EXPECT_TRUE(design.movePathControlToTrash(control));
    EXPECT_TRUE(design.isPathControlTrashed(control));
}

TEST(Design, FindsCompareExactlyAndSearchTrashOnlyWhenAsked) {
    Tsd_Design design;
    auto* first = new Tsd_TNMGroup("clk");
    auto* second = new Tsd_UserGroup("clk");
    auto* unnamed = new Tsd_UserGroup(nullptr);
    auto* gone = new Tsd_TNMGroup("gone");
    design.addGroup(unnamed);
    design.addGroup(first);
    design.addGroup(second);
    design.addGroup(gone);
    design.moveGroupToTrash(gone);

    EXPECT_EQ(design.findGroupByUserName("clk", false), first); // the first added wins
    EXPECT_EQ(design.findGroupByUserName("CLK", false), nullptr);
    EXPECT_EQ(design.findGroupByUserName("gone", false), nullptr);
    EXPECT_EQ(design.findGroupByUserName("gone", true), gone);
    EXPECT_EQ(design.findGroupByUserName("", true), nullptr);

    auto* clock = new Tsd_ClkGroup("clk_net");
    design.addClockGroup(clock);
    EXPECT_EQ(design.findClockGroupByNetName("clk_net", false), clock);
    EXPECT_EQ(design.findClockGroupByNetName("clk", false), nullptr);

    auto* global = new Tsd_TIGGroup(nullptr);
    auto* tig = new Tsd_TIGGroup("TS01");
    auto* upper = new Tsd_TIGGroup("GLOBAL");
    design.addTIGGroup(upper);
    design.addTIGGroup(tig);
    design.addTIGGroup(global);
    EXPECT_EQ(design.findTIGByTSid(nullptr, false), global);
    EXPECT_EQ(design.findTIGByTSid("", false), global);
    EXPECT_EQ(design.findTIGByTSid("TS01", false), tig);
    EXPECT_EQ(design.findTIGByTSid("GLOBAL", false), upper);

    auto* path = new Tsd_DelayPath("TS01");
    auto* trashedSpec = new Tsd_Period("TS02");
    design.addEndpointSpec(path);
    design.addEndpointSpec(trashedSpec);
    design.moveEndpointSpecToTrash(trashedSpec);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS01", false), path);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", false), nullptr);
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", true), trashedSpec);
    EXPECT_EQ(design.findEndpointSpecByTSid("ts01", true), nullptr);
}

TEST(Design, AnObjectOfTheWrongClassInATypedListIsFatal) {
    MessageCapture capture;
    Tsd_Design design;
    design.getGroupList()->addObj(new Tsd_Period("TS01"));
    design.getClockGroupList()->addObj(new Tsd_TNMGroup("t"));
    design.getTIGGroupList()->addObj(new Tsd_ClkGroup("c"));
    design.getEndpointSpecList()->addObj(new Tsd_Offset());
    int code = 0;
    EXPECT_EQ(fatalText([&] { design.findGroupByUserName("x", false); }, &code),
              "Non-group object.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { design.findClockGroupByNetName("x", false); }),
              "Non-clock group object.\n");
    EXPECT_EQ(fatalText([&] { design.findTIGByTSid("x", false); }), "Non-TIG object.\n");
    EXPECT_EQ(fatalText([&] { design.findEndpointSpecByTSid("x", false); }),
              "Non-endpoint spec object.\n");
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

TEST(Design, ReferenceTypeAndGlobalTIG) {
    Tsd_Design plain;
    EXPECT_EQ(plain.getRefType(), nullptr);
    Tsd_Design typed("MM_TSREF");
    EXPECT_STREQ(typed.getRefType(), "MM_TSREF");
    EXPECT_EQ(typed.getGlobalTIG(), nullptr);
    auto* tig = new Tsd_TIGGroup(nullptr);
    typed.addTIGGroup(tig);
    typed.setGlobalTIG(tig);
    EXPECT_EQ(typed.getGlobalTIG(), tig);

    // A derived design may set the type.
    struct Typed : Tsd_Design {
        Typed() { setRefType("MY_REF"); }
    } derived;
    EXPECT_STREQ(derived.getRefType(), "MY_REF");
}

TEST(Design, DumpOfAnEmptyDesign) {
    Tsd_Design design;
    std::string expected = "Tsd_Design\n";
    for (const char* list : {"m_groups", "m_clockGroups", "m_tigGroups", "m_endpointSpecs",
                             "m_offsetSpecs", "m_netSpecs", "m_pathControls", "m_portSpecs"}) {
        expected += std::string("   ") + list + ":\n";
        expected += "      active objects:\n      trashed objects:\n";
    }
    expected += "   global TIG is not installed\n";
    EXPECT_EQ(tsd_test::dumpText(design), expected);
}

TEST(Design, DumpNestsObjectsAndNamesTheReferenceType) {
    Tsd_Design design("MM_TSREF");
    auto* clk = new Tsd_TNMGroup("clk");
    auto* old = new Tsd_TNMGroup("old");
    design.addGroup(clk);
    design.addGroup(old);
    design.moveGroupToTrash(old);
    auto* global = new Tsd_TIGGroup(nullptr);
    design.addTIGGroup(global);
    design.setGlobalTIG(global);
    std::string text = tsd_test::dumpText(design, 1);
    std::string expected = "   Tsd_Design\n"
                           "      design refType \"MM_TSREF\"\n"
                           "      m_groups:\n"
                           "         active objects:\n"
                           "            Tsd_TNMGroup\n"
                           "               name = clk\n"
                           "               references:\n"
                           "         trashed objects:\n"
                           "            Tsd_TNMGroup\n"
                           "               name = old\n"
                           "               references:\n"
                           "      m_clockGroups:\n"
                           "         active objects:\n"
                           "         trashed objects:\n"
                           "      m_tigGroups:\n"
                           "         active objects:\n"
                           "            Tsd_TIGGroup\n"
                           "               name = global\n"
                           "               references:\n"
                           "         trashed objects:\n";
    EXPECT_EQ(text.substr(0, expected.size()), expected);
    EXPECT_NE(text.find("      global TIG is installed\n"), std::string::npos);
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
