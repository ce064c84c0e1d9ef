#include "DesignTestSupport.h"
#include "RandomDesigns.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <random>
#include <string>

using tsd_test::attachRef;
using tsd_test::fatalText;
using tsd_test::fillGroups;
using tsd_test::fillSpecs;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;
using tsd_test::RecordingDesign;
using Reason = Tsd_Design::TrimReason;
using Trashed = std::vector<std::pair<Tsd_BaseObj*, Reason>>;

namespace {

Tsd_TimeValue ns(double v) {
    return Tsd_TimeValue(v, Tsd_TimeValue::UNITS_NS);
}

struct Cascade {
    RecordingDesign design;
    Tsd_TNMGroup* tnm = nullptr;
    NamedRef* tnmRef = nullptr;
    Tsd_UserGroup* first = nullptr;  // includes tnm
    Tsd_UserGroup* second = nullptr; // includes first
    Tsd_DelayPath* path = nullptr;   // FROM second TO sink
    Tsd_TIGGroup* tig = nullptr;     // ignores the path

    explicit Cascade(bool secondBeforeFirst) {
        tnm = new Tsd_TNMGroup("leaf");
        tnmRef = attachRef(tnm);
        auto* sink = new Tsd_TNMGroup("sink");
        attachRef(sink);
        first = new Tsd_UserGroup("first");
        first->addGroup(tnm, Tsd_UserGroup::EDGE_ANY, false);
        second = new Tsd_UserGroup("second");
        second->addGroup(first, Tsd_UserGroup::EDGE_RISING, false);
        design.addGroup(tnm);
        design.addGroup(sink);
        design.addGroup(secondBeforeFirst ? second : first);
        design.addGroup(secondBeforeFirst ? first : second);
        path = new Tsd_DelayPath("TS01");
        path->setStart(second);
        path->setEnd(sink);
        path->setDelayValue(ns(10));
        design.addEndpointSpec(path);
        tig = new Tsd_TIGGroup("TS01");
        attachRef(tig);
        design.addTIGGroup(tig);
        path->setIgnoreGroup(tig);
    }
};

} // namespace

TEST(Trim, AnUnchangedDesignHasNothingToTrim) {
    Cascade c(false);
    EXPECT_FALSE(c.design.trim());
    EXPECT_TRUE(c.design.trashed.empty());
    RecordingDesign empty;
    EXPECT_FALSE(empty.trim());
}

TEST(Trim, LosingTheLastReferenceCascadesInOrder) {
    for (bool secondBeforeFirst : {false, true}) {
        SCOPED_TRACE(secondBeforeFirst ? "second user group listed first" : "in definition order");
        Cascade c(secondBeforeFirst);
        c.tnmRef->trim();
        EXPECT_TRUE(c.design.trim());
        EXPECT_EQ(c.design.trashed, (Trashed{{c.tnm, Tsd_Design::TRIM_NO_REFERENCES},
                                             {c.first, Tsd_Design::TRIM_EMPTY_USER_GROUP},
                                             {c.second, Tsd_Design::TRIM_EMPTY_USER_GROUP},
                                             {c.path, Tsd_Design::TRIM_PATH_ENDPOINT},
                                             {c.tig, Tsd_Design::TRIM_TIG_OF_TRASHED_SPEC}}));
        EXPECT_TRUE(c.design.isGroupTrashed(c.second));
        EXPECT_TRUE(c.design.isEndpointSpecTrashed(c.path));
        EXPECT_TRUE(c.design.isTIGGroupTrashed(c.tig));
        // Trashed objects stay valid and reachable.
        EXPECT_EQ(c.design.findEndpointSpecByTSid("TS01", true), c.path);
        EXPECT_EQ(c.path->getStart(), c.second);
        // A second trim finds nothing new.
        c.design.trashed.clear();
        EXPECT_FALSE(c.design.trim());
        EXPECT_TRUE(c.design.trashed.empty());
    }
}

TEST(Trim, PeriodLinkedToATrashedPeriodKeepsItsComputedValue) {
    RecordingDesign design;
    auto* g1 = new Tsd_TNMGroup("g1");
    NamedRef* g1Ref = attachRef(g1);
    auto* g2 = new Tsd_TNMGroup("g2");
    attachRef(g2);
    design.addGroup(g1);
    design.addGroup(g2);
    auto* base = new Tsd_Period("TS01");
    base->setPeriodGroup(g1);
    base->setDelayValue(ns(10));
    // The chain's last link is listed first, so it is frozen before the
    // spec it links to.
    auto* quarter = new Tsd_Period("TS03");
    quarter->setPeriodGroup(g2);
    auto* twice = new Tsd_Period("TS02");
    twice->setPeriodGroup(g2);
    twice->setLinkData(base, true, 2);
    twice->setPhase(ns(2.5), true);
    quarter->setLinkData(twice, false, 4);
    design.addEndpointSpec(quarter);
    design.addEndpointSpec(base);
    design.addEndpointSpec(twice);

    g1Ref->trim();
    EXPECT_TRUE(design.trim());
    EXPECT_EQ(design.trashed, (Trashed{{g1, Tsd_Design::TRIM_NO_REFERENCES},
                                       {base, Tsd_Design::TRIM_PERIOD_GROUP}}));
    EXPECT_FALSE(twice->isLinked());
    EXPECT_EQ(twice->getLinkedSpec(), nullptr);
    EXPECT_EQ(twice->getDelayValue().units, Tsd_TimeValue::UNITS_NS);
    EXPECT_DOUBLE_EQ(twice->getDelayValue().value, 20);
    EXPECT_FALSE(twice->hasPhase());
    EXPECT_FALSE(quarter->isLinked());
    EXPECT_DOUBLE_EQ(quarter->getDelayValue().value, 5);
    const char* name = nullptr;
    const char* value = nullptr;
    ASSERT_TRUE(twice->getProp(name, value));
    EXPECT_STREQ(value, "PERIOD:g2:20:nS");
}

TEST(Trim, TrashedMembersLeaveSurvivingUserGroups) {
    RecordingDesign design;
    auto* keep = new Tsd_TNMGroup("keep");
    attachRef(keep);
    auto* drop = new Tsd_TNMGroup("drop");
    NamedRef* dropRef = attachRef(drop);
    auto* group = new Tsd_UserGroup("grp");
    group->addGroup(keep, Tsd_UserGroup::EDGE_ANY, false);
    group->addGroup(drop, Tsd_UserGroup::EDGE_RISING, false);
    group->addGroup(drop, Tsd_UserGroup::EDGE_ANY, true);
    design.addGroup(keep);
    design.addGroup(drop);
    design.addGroup(group);

    dropRef->trim();
    EXPECT_TRUE(design.trim());
    EXPECT_EQ(design.trashed, (Trashed{{drop, Tsd_Design::TRIM_NO_REFERENCES}}));
    EXPECT_FALSE(design.isGroupTrashed(group));
    const char* name = nullptr;
    const char* value = nullptr;
    group->getProp(name, value);
    EXPECT_STREQ(value, "keep");
}

TEST(Trim, UserGroupWithoutIncludedMembersIsTrashed) {
    RecordingDesign design;
    auto* other = new Tsd_TNMGroup("other");
    attachRef(other);
    auto* onlyExcludes = new Tsd_UserGroup("except_only");
    onlyExcludes->addGroup(other, Tsd_UserGroup::EDGE_ANY, true);
    design.addGroup(other);
    design.addGroup(onlyExcludes);
    EXPECT_TRUE(design.trim());
    EXPECT_EQ(design.trashed, (Trashed{{onlyExcludes, Tsd_Design::TRIM_EMPTY_USER_GROUP}}));
}

TEST(Trim, TIGGroupsWithoutReferencesAreUnlinked) {
    RecordingDesign design;
    auto* spec = new Tsd_DelayPath("TS01");
    spec->setDelayValue(ns(5));
    design.addEndpointSpec(spec);
    auto* tig = new Tsd_TIGGroup("TS01");
    NamedRef* tigRef = attachRef(tig);
    auto* global = new Tsd_TIGGroup(nullptr);
    NamedRef* globalRef = attachRef(global);
    design.addTIGGroup(tig);
    design.addTIGGroup(global);
    design.setGlobalTIG(global);
    spec->setIgnoreGroup(tig);

    tigRef->trim();
    globalRef->trimNoReport();
    EXPECT_TRUE(design.trim());
    EXPECT_EQ(design.trashed, (Trashed{{tig, Tsd_Design::TRIM_NO_REFERENCES},
                                       {global, Tsd_Design::TRIM_NO_REFERENCES}}));
    EXPECT_FALSE(design.isEndpointSpecTrashed(spec));
    EXPECT_EQ(spec->getIgnoreGroup(), nullptr);
    EXPECT_EQ(design.getGlobalTIG(), nullptr);
}

TEST(Trim, SpecsTrashedByTheCallerLoseTheirTIGGroupsWithoutBeingReported) {
    RecordingDesign design;
    auto* spec = new Tsd_DelayPath("TS01");
    spec->setIgnored();
    design.addEndpointSpec(spec);
    auto* tig = new Tsd_TIGGroup("TS01");
    attachRef(tig);
    design.addTIGGroup(tig);
    spec->setIgnoreGroup(tig);
    design.moveEndpointSpecToTrash(spec);
    EXPECT_TRUE(design.trim());
    EXPECT_EQ(design.trashed, (Trashed{{tig, Tsd_Design::TRIM_TIG_OF_TRASHED_SPEC}}));
}

TEST(Trim, PathsLosingATHRUPointAndOffsetsAndPortsLosingGroups) {
    RecordingDesign design;
    auto* ends = new Tsd_TNMGroup("ends");
    attachRef(ends);
    auto* thru = new Tsd_ThruGroup("t1");
    NamedRef* thruRef = attachRef(thru);
    auto* regs = new Tsd_TNMGroup("regs");
    NamedRef* regsRef = attachRef(regs);
    auto* pads = new Tsd_SyncGroup("pads");
    NamedRef* padsRef = attachRef(pads);
    auto* clk = new Tsd_ClkGroup("clk");
    attachRef(clk);
    auto* pin = new Tsd_ClkGroup("pin");
    NamedRef* pinRef = attachRef(pin);
    for (Tsd_Group* g : std::vector<Tsd_Group*>{ends, thru, regs, pads})
        design.addGroup(g);
    design.addClockGroup(clk);
    design.addClockGroup(pin);

    auto* path = new Tsd_DelayPath("TS01");
    path->setStart(ends);
    path->addThru(thru);
    path->setEnd(ends);
    path->setDelayValue(ns(3));
    design.addEndpointSpec(path);

    auto* byPin = new Tsd_Offset();
    byPin->setClockPad(clk);
    byPin->setReferencePin(pin);
    auto* byReg = new Tsd_Offset();
    byReg->setClockPad(clk);
    byReg->setRegGroup(regs);
    auto* byPad = new Tsd_GroupOffset();
    byPad->setClockPad(clk);
    byPad->setPadGroup(pads);
    auto* netOffset = new Tsd_NetOffset(); // no references at all
    netOffset->setClockPad(clk);
    auto* steady = new Tsd_GroupOffset(); // never trashed for lack of references
    steady->setClockPad(clk);
    steady->setPadGroup(ends);
    for (Tsd_Offset* o : std::vector<Tsd_Offset*>{byPin, byReg, byPad, netOffset, steady})
        design.addOffsetSpec(o);

    auto* port = new Tsd_PortTiming("FEEDBACK");
    port->setConstraintValue(ns(1));
    port->setSecondaryGroup(pin);
    attachRef(port);
    design.addPortTiming(port);

    thruRef->trim();
    regsRef->trim();
    padsRef->trim();
    pinRef->trim();
    EXPECT_TRUE(design.trim());
    EXPECT_EQ(design.trashed, (Trashed{{thru, Tsd_Design::TRIM_NO_REFERENCES},
                                       {regs, Tsd_Design::TRIM_NO_REFERENCES},
                                       {pads, Tsd_Design::TRIM_NO_REFERENCES},
                                       {pin, Tsd_Design::TRIM_NO_REFERENCES},
                                       {netOffset, Tsd_Design::TRIM_NO_REFERENCES},
                                       {path, Tsd_Design::TRIM_PATH_THRU},
                                       {byPin, Tsd_Design::TRIM_CLOCK_GROUP},
                                       {byReg, Tsd_Design::TRIM_REG_GROUP},
                                       {byPad, Tsd_Design::TRIM_PAD_GROUP},
                                       {port, Tsd_Design::TRIM_CLOCK_GROUP}}));
    EXPECT_FALSE(design.isOffsetSpecTrashed(steady));
}

TEST(Trim, AnIgnoredSpecWithACircularLinkDoesNotHangTrim) {
    RecordingDesign design;
    auto* g = new Tsd_TNMGroup("g");
    NamedRef* ref = attachRef(g);
    design.addGroup(g);
    auto* a = new Tsd_DelayPath("TS01");
    auto* b = new Tsd_DelayPath("TS02");
    auto* dead = new Tsd_Period("TS03");
    dead->setPeriodGroup(g);
    dead->setDelayValue(ns(1));
    a->setIgnored();
    a->setLinkData(b, true, 1);
    b->setLinkData(a, true, 1);
    auto* c = new Tsd_DelayPath("TS04"); // ignored, linked into the trash, no delay at the end
    c->setIgnored();
    c->setLinkData(dead, false, 0);
    design.addEndpointSpec(a);
    design.addEndpointSpec(b);
    design.addEndpointSpec(dead);
    design.addEndpointSpec(c);
    ref->trim();
    EXPECT_TRUE(design.trim());
    EXPECT_TRUE(a->isLinked());
    EXPECT_TRUE(c->isLinked()); // a zero divisor cannot be computed: left as it is
}

TEST(Trim, AWrongObjectInTheEndpointTrashIsFatal) {
    MessageCapture capture;
    Tsd_Design design;
    design.getEndpointSpecTrash()->addObj(new Tsd_UserGroup("not_a_spec"));
    EXPECT_EQ(fatalText([&] { design.trim(); }), "Wrong object type.\n");
}

namespace {

struct Holders {
    Tsd_Design design;
    Tsd_TNMGroup* tnm = new Tsd_TNMGroup("g");
    Tsd_ThruGroup* thru = new Tsd_ThruGroup("t");
    Tsd_ClkGroup* clk = new Tsd_ClkGroup("clk");
    Tsd_TIGGroup* tig = new Tsd_TIGGroup("TS02");
    Tsd_TIGGroup* global = new Tsd_TIGGroup(nullptr);
    Tsd_UserGroup* includer = new Tsd_UserGroup("inc");
    Tsd_UserGroup* excluder = new Tsd_UserGroup("exc");
    Tsd_UserGroup* unrelated = new Tsd_UserGroup("none");
    Tsd_Period* period = new Tsd_Period("TS01");
    Tsd_DelayPath* path = new Tsd_DelayPath("TS02");
    Tsd_DelayPath* viaThru = new Tsd_DelayPath("TS03");
    Tsd_DelayPath* trashedPath = new Tsd_DelayPath("TS04");
    Tsd_GroupOffset* padOffset = new Tsd_GroupOffset();
    Tsd_Offset* regOffset = new Tsd_Offset();
    Tsd_Offset* pinOffset = new Tsd_Offset();
    Tsd_PortTiming* port = new Tsd_PortTiming("FEEDBACK");

    Holders() {
        includer->addGroup(tnm, Tsd_UserGroup::EDGE_RISING, false);
        includer->addGroup(tnm, Tsd_UserGroup::EDGE_FALLING, false); // listed once
        excluder->addGroup(unrelated, Tsd_UserGroup::EDGE_ANY, false);
        excluder->addGroup(tnm, Tsd_UserGroup::EDGE_ANY, true);
        for (Tsd_Group* g : std::vector<Tsd_Group*>{tnm, thru, includer, unrelated, excluder})
            design.addGroup(g);
        design.addClockGroup(clk);
        design.addTIGGroup(tig);
        design.addTIGGroup(global);
        period->setPeriodGroup(tnm);
        path->setStart(tnm);
        path->setEnd(tnm);
        viaThru->addThru(thru);
        viaThru->addThru(thru);
        trashedPath->setStart(tnm);
        for (Tsd_EndpointSpec* s :
             std::vector<Tsd_EndpointSpec*>{period, path, viaThru, trashedPath})
            design.addEndpointSpec(s);
        design.moveEndpointSpecToTrash(trashedPath);
        padOffset->setPadGroup(tnm);
        padOffset->setClockPad(clk);
        regOffset->setRegGroup(tnm);
        regOffset->setClockPad(clk);
        pinOffset->setReferencePin(clk);
        design.addOffsetSpec(padOffset);
        design.addOffsetSpec(regOffset);
        design.addOffsetSpec(pinOffset);
        port->setSecondaryGroup(clk);
        design.addPortTiming(port);
    }

    std::vector<Tsd_BaseObj*> of(Tsd_Group* group) {
        Tsd_BaseObjList list;
        design.getGroupHolders(group, &list);
        std::vector<Tsd_BaseObj*> out;
        Tsd_BaseObjListIter iter(&list);
        while (Tsd_BaseObj* obj = iter.next())
            out.push_back(obj);
        return out;
    }
};

} // namespace

TEST(GroupHolders, EachKindOfGroup) {
    Holders h;
    EXPECT_EQ(h.of(h.tnm), (std::vector<Tsd_BaseObj*>{h.includer, h.excluder, h.period, h.path,
                                                      h.padOffset, h.regOffset}));
    EXPECT_EQ(h.of(h.thru), (std::vector<Tsd_BaseObj*>{h.viaThru}));
    // The reference pin is not examined: pinOffset is not listed.
    EXPECT_EQ(h.of(h.clk), (std::vector<Tsd_BaseObj*>{h.padOffset, h.regOffset, h.port}));
    EXPECT_EQ(h.of(h.tig), (std::vector<Tsd_BaseObj*>{h.path}));
    EXPECT_TRUE(h.of(h.global).empty());
    EXPECT_EQ(h.of(h.unrelated), (std::vector<Tsd_BaseObj*>{h.excluder}));
    EXPECT_EQ(h.of(h.includer), (std::vector<Tsd_BaseObj*>{}));
    EXPECT_TRUE(h.of(nullptr).empty());
}

TEST(GroupHolders, TheListIsAppendedToAndANullListIsFatal) {
    Holders h;
    Tsd_BaseObjList list;
    list.addObj(h.port);
    h.design.getGroupHolders(h.thru, &list);
    EXPECT_EQ(list.getAt(0), h.port);
    EXPECT_EQ(list.getAt(1), h.viaThru);
    EXPECT_EQ(list.getCount(), 2);
    MessageCapture capture;
    EXPECT_EQ(fatalText([&] { h.design.getGroupHolders(h.tnm, nullptr); }),
              "NULL list passed to getGroupHolders().\n");
}

// trim() computes its cascades with worklists; these tests run the passes and
// walks as literally described on a twin of each random design and compare
// everything that can be seen: what is reported, in order, the messages, the
// dumps and the exact delay values.
namespace {

std::string nameOf(Tsd_BaseObj* obj) {
    Tsd_Group* group = obj->getGroup();
    const char* name = group != nullptr ? group->getName() : obj->getSpec()->getTSid();
    return name != nullptr ? name : "<null>";
}

std::vector<std::string> reported(const RecordingDesign& design) {
    std::vector<std::string> out;
    for (const auto& entry : design.trashed)
        out.push_back(nameOf(entry.first) + " " + std::to_string(entry.second));
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
    Tsd_BaseObjListIter refs(design.getGroupList());
    while (Tsd_BaseObj* obj = refs.next())
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
    Tsd_BaseObjListIter survivors(design.getGroupList());
    while (Tsd_BaseObj* obj = survivors.next()) {
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
    Tsd_BaseObjListIter specs(design.getEndpointSpecList());
    while (Tsd_BaseObj* obj = specs.next()) {
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
        EXPECT_EQ(fast.trim(), literalGroupTrim(literal));
        ASSERT_EQ(reported(fast), reported(literal));
        ASSERT_EQ(tsd_test::dumpText(fast), tsd_test::dumpText(literal));
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
            MessageCapture capture;
            fastText = fatalText([&] { fast.trim(); });
            fastText += capture.sink.transcript();
        }
        {
            MessageCapture capture;
            literalText = fatalText([&] { literalFreeze(literal); });
            literalText += capture.sink.transcript();
        }
        ASSERT_EQ(fastText, literalText);
        ASSERT_EQ(delays(fast), delays(literal));
        ASSERT_EQ(tsd_test::dumpText(fast), tsd_test::dumpText(literal));
    }
    MessageManager::setDebugTrace(false);
}
