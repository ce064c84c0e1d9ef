#include "../design/RandomDesigns.h"
#include "BuilderTestSupport.h"

#include <gtest/gtest.h>

using tsd_test::build;
using tsd_test::Built;
using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;
using tsd_test::OpenBuilder;
using tsd_test::PropSet;
using tsd_test::RefProp;

namespace {

// Groups and clocks the specs below name.
std::vector<RefProp> baseRefs() {
    return {{"f1", "TS_TNM", "ffs"},
            {"r1", "TS_TNM", "ram"},
            {"t", "TS_TPTHRU", "t1"},
            {"c", "TS_CLKGRP", "clk"},
            {"s", "TS_TPSYNC", "sync"}};
}

PropSet withSpecs(std::vector<std::pair<std::string, std::string>> specs) {
    PropSet set;
    set.refs = baseRefs();
    set.specs = std::move(specs);
    return set;
}

PropSet withGroups(std::vector<std::pair<std::string, std::string>> groups) {
    PropSet set;
    set.refs = baseRefs();
    set.groups = std::move(groups);
    return set;
}

} // namespace

TEST(BuilderBuild, AnEmptyBuilderHandsOutAnEmptyDesign) {
    MessageCapture capture;
    auto* builder = new Tsd_Builder();
    Tsd_Design* design = builder->buildTSDesign();
    ASSERT_NE(design, nullptr);
    delete builder; // the design now belongs to the caller
    EXPECT_EQ(design->getGroupList()->getCount(), 0);
    delete design;
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(BuilderBuild, LookupErrorsNameTheDefinitionBeingProcessed) {
    struct Case {
        const char* tsid;
        const char* value;
        const char* message;
    };
    const Case cases[] = {
        {"TS01", "FROM:nope:TO:ffs:1:nS",
         "Processing TIMESPEC definition \"TS01=FROM:nope:TO:ffs:1:nS\": No TNM, TPSYNC or user "
         "group named \"nope\" is defined.\n"},
        {"TS02", "FROM:t1:TO:ffs:1:nS",
         "Processing TIMESPEC definition \"TS02=FROM:t1:TO:ffs:1:nS\": Group \"t1\" is a TPTHRU "
         "group, which is not the correct type: a TNM, TPSYNC, user group or predefined group name "
         "(such as FFS or RAMS) is required here.\n"},
        {"TS03", "FROM:ffs:THRU:nope:TO:ram:1:nS",
         "Processing TIMESPEC definition \"TS03=FROM:ffs:THRU:nope:TO:ram:1:nS\": No TPTHRU group "
         "named \"nope\" is defined.\n"},
        {"TS04", "FROM:ffs:THRU:ram:TO:ram:1:nS",
         "Processing TIMESPEC definition \"TS04=FROM:ffs:THRU:ram:TO:ram:1:nS\": Group \"ram\" is "
         "a TNM group, which is not the correct type: a TPTHRU group is required here.\n"},
        {"TS05", "PERIOD:nope:10:nS",
         "Processing TIMESPEC definition \"TS05=PERIOD:nope:10:nS\": No TNM, TPSYNC or user group "
         "named \"nope\" is defined.\n"},
    };
    for (const Case& c : cases) {
        MessageCapture capture;
        Built built = build(withSpecs({{c.tsid, c.value}}));
        EXPECT_EQ(built.design, nullptr);
        EXPECT_EQ(capture.sink.errors(), std::vector<std::string>{c.message});
        EXPECT_EQ(built.errors, 1);
    }
}

TEST(BuilderBuild, TimegrpMembersOfTheWrongKindAndIdentifierClashes) {
    MessageCapture capture;
    Built built = build(withGroups({{"g", "ffs:t1"}, {"ffs", "ram"}}));
    EXPECT_EQ(built.design, nullptr);
    EXPECT_EQ(capture.sink.errors(),
              (std::vector<std::string>{
                  "Processing TIMEGRP definition \"g=ffs:t1\": Group \"t1\" is a TPTHRU group, "
                  "which is not the correct type: a TNM, user group or predefined group name (such "
                  "as FFS or RAMS) is required here.\n",
                  "The identifier \"ffs\" is used for both a user group and a TNM group. Group "
                  "identifiers must be unique.\n"}));
}

TEST(BuilderBuild, ARefusedSecondDefinitionTakesItsPendingLinkAlong) {
    // The second TS01 waits for TS09 when it is refused and deleted: its
    // pending record must not outlive it.
    MessageCapture capture;
    Built built = build(withSpecs({{"TS01", "PERIOD:ffs:TS09*2"},
                                   {"TS01", "PERIOD:ffs:TS09*3"},
                                   {"TS09", "PERIOD:ram:4:nS"}}));
    EXPECT_EQ(built.design, nullptr);
    EXPECT_EQ(built.errors, 1); // the second definition only
    EXPECT_EQ(capture.sink.errors().size(), 1u);
}

TEST(BuilderBuild, SecondDefinitionsAreRefusedByDefault) {
    MessageCapture capture;
    PropSet set = withGroups({{"g", "ffs"}, {"g", "ram"}});
    set.specs = {{"TS01", "FROM:ffs:TO:ram:1:nS"}, {"TS01", "FROM:ram:TO:ffs:2:nS"}};
    Tsd_Builder builder;
    Built built = build(set, builder);
    EXPECT_EQ(built.design, nullptr);
    EXPECT_EQ(capture.sink.errors(),
              (std::vector<std::string>{
                  "Second group definition found for group \"g\":\noriginal definition: g=ffs\nnew "
                  "definition: g=ram\n",
                  "Second spec definition found for TSid \"TS01\":\noriginal definition: TS01=FROM "
                  "ffs TO ram 1000 pS\nnew definition: TS01=FROM:ram:TO:ffs:2:nS\n"}));
}

TEST(BuilderBuild, ForwardReferencesBetweenGroupDefinitions) {
    MessageCapture capture;
    Tsd_Builder builder;
    Built built = build(withGroups({{"a", "b:ffs"}, {"b", "ram"}}), builder);
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
    auto* a = built.design->findGroupByUserName("a", false)->getUserGroup();
    auto* b = built.design->findGroupByUserName("b", false)->getUserGroup();
    ASSERT_NE(a, nullptr);
    ASSERT_NE(b, nullptr);
    Tsd_UserGroupIter members(a, false);
    Tsd_UserGroup::Edge edge;
    EXPECT_EQ(members.next(edge), b); // the placeholder became the defined group
}

TEST(BuilderBuild, GroupsNeverDefinedAreReportedAndDumped) {
    MessageCapture capture;
    Tsd_Builder builder;
    builder.addUserGroupProp("a", "missing:ffs");
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
    // Every name a TIMEGRP definition uses stands for a group defined later;
    // those that never are get reported once the groups are processed.
    EXPECT_EQ(capture.sink.errors(),
              (std::vector<std::string>{"A group named \"missing\" was referenced in one or more "
                                        "TIMEGRP definitions, but was never defined by a TIMEGRP "
                                        "or TNM property.\n",
                                        "A group named \"ffs\" was referenced in one or more "
                                        "TIMEGRP definitions, but was never defined by a TIMEGRP "
                                        "or TNM property.\n"}));
    std::string dump = tsd_test::dumpText(builder);
    EXPECT_EQ(dump.rfind("Tsd_Builder\n"
                         "   unresolved groups remaining:\n"
                         "      Tsd_UserGroup\n"
                         "         name = missing\n",
                         0),
              0u)
        << dump;
    EXPECT_NE(dump.find("   builder error count: 2\n   builder warning count: 0\n"),
              std::string::npos);
}

TEST(BuilderBuild, CircularGroupDefinitions) {
    MessageCapture capture;
    Built built = build(withGroups({{"p", "q"}, {"q", "ffs:EXCEPT:p"}}));
    EXPECT_EQ(built.design, nullptr);
    EXPECT_EQ(built.errors, 2);
    EXPECT_EQ(capture.sink.errors(),
              (std::vector<std::string>{
                  "Circular group definition encountered from user group \"p\", as follows:\n",
                  "Circular group definition encountered from user group \"q\", as follows:\n"}));
    EXPECT_EQ(capture.sink.statuses(),
              (std::vector<std::string>{"   p=q\n", "   q=ffs:EXCEPT:p\n", "   q=ffs:EXCEPT:p\n",
                                        "   p=q\n"}));
}

TEST(BuilderBuild, LinksResolveFromLaterSpecsAndReportWhatIsMissing) {
    {
        MessageCapture capture;
        Built built = build(
            withSpecs({{"TS01", "FROM:ffs:TO:ram:TS02*2"}, {"TS02", "FROM:ram:TO:ffs:3:nS"}}));
        ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
        Tsd_EndpointSpec* ts01 = built.design->findEndpointSpecByTSid("TS01", false);
        EXPECT_DOUBLE_EQ(ts01->getDelayValue().getPicoSeconds(), 6000);
    }
    {
        MessageCapture capture;
        Built built = build(
            withSpecs({{"TS01", "FROM:ffs:TO:ram:TS77*2"}, {"TS02", "FROM:ffs:TO:ram:TS02*2"}}));
        EXPECT_EQ(built.design, nullptr);
        // A missing TSid stops the link check: the self-link goes unreported.
        EXPECT_EQ(capture.sink.errors(),
                  (std::vector<std::string>{"Specification \"TS01\" is defined in terms of a "
                                            "specification with TSid \"TS77\", which does not "
                                            "exist.\n"}));
    }
    {
        MessageCapture capture;
        Built built =
            build(withSpecs({{"TS01", "PERIOD:ffs:TS02*2"}, {"TS02", "PERIOD:ram:TS01/4"}}));
        EXPECT_EQ(built.design, nullptr);
        EXPECT_EQ(built.errors, 2);
        std::vector<std::string> errors = capture.sink.errors();
        ASSERT_EQ(errors.size(), 2u);
        EXPECT_EQ(errors[0], "Specification \"TS01\" is defined in terms of a circular TSid link, "
                             "as follows:\n");
        EXPECT_EQ(capture.sink.statuses()[0], "   TS01 is defined as TS02 * 2\n");
        EXPECT_EQ(capture.sink.statuses()[1], "   TS02 is defined as TS01 / 4\n");
    }
}

TEST(BuilderBuild, TIGInstallationAndTheGlobalTIG) {
    MessageCapture capture;
    PropSet set = withSpecs({{"TS01", "FROM:ffs:TO:ram:TIG"}, {"TS02", "FROM:ram:TO:ffs:1:nS"}});
    set.refs.push_back({"x", "TS_TIG", "TS02"});
    set.refs.push_back({"y", "TS_TIG", "global"});
    Built built = build(set);
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
    Tsd_TIGGroup* global = built.design->getGlobalTIG();
    ASSERT_NE(global, nullptr);
    EXPECT_STREQ(global->getName(), "global");
    EXPECT_EQ(built.design->findEndpointSpecByTSid("TS02", false)->getIgnoreGroup(),
              built.design->findTIGByTSid("TS02", false));

    MessageCapture missing;
    PropSet bad = withSpecs({});
    bad.refs.push_back({"x", "TS_TIG", "TS42"});
    Built failed = build(bad);
    EXPECT_EQ(failed.design, nullptr);
    EXPECT_EQ(missing.sink.errors(),
              (std::vector<std::string>{"One or more TIG directives were specified for a "
                                        "specification with TSid \"TS42\", which does not "
                                        "exist.\n"}));
}

TEST(BuilderBuild, ClockNetsWithoutTheirPropertyAreReportedWithTheirHolders) {
    MessageCapture capture;
    PropSet set;
    set.refs = {{"f", "TS_TNM", "pads"}, {"p", "TS_FEEDBACK", "1 ns NET sysclk"}};
    set.specs = {{"OFFSET", "IN 2 ns BEFORE sysclk"},
                 {"OFFSET", "IN 3 ns BEFORE altclk"},
                 {"TS_GROUP_BASED_OFFSET", "TIMEGRP pads OFFSET = OUT 1 ns AFTER sysclk"}};
    Built built = build(set);
    EXPECT_EQ(built.design, nullptr);
    EXPECT_EQ(built.errors, 2);
    // Per clock group: the offsets that name it, then the port timings.
    EXPECT_EQ(capture.sink.transcript(),
              "error: The following spec(s) referenced the Tsd_ClkGroup \"sysclk\", but no such "
              "TS_CLKGRP reference property was added to the builder:\n"
              "status:    OFFSET=IN 2000 pS BEFORE sysclk\n"
              "status:    TIMEGRP pads OFFSET=OUT 1000 pS AFTER sysclk\n"
              "status:    FEEDBACK=1000 pS NET sysclk\n"
              "error: The following spec(s) referenced the Tsd_ClkGroup \"altclk\", but no such "
              "TS_CLKGRP reference property was added to the builder:\n"
              "status:    OFFSET=IN 3000 pS BEFORE altclk\n");
}

namespace {

// A user builder that brings its own design.
class DesignBuilder : public Tsd_Builder {
public:
    explicit DesignBuilder(Tsd_Design* design) : Tsd_Builder(false) { initBaseBuilder(design); }
};

} // namespace

TEST(BuilderBuild, PendingRegisterGroupsInBothModes) {
    {
        MessageCapture capture;
        Tsd_Builder builder;
        auto* ref = new NamedRef("d");
        ASSERT_TRUE(builder.addRefProp(new NamedRef("c"), "TS_CLKGRP", "clk"));
        ASSERT_TRUE(builder.addRefProp(ref, "TS_OFFSET", "IN 2 ns BEFORE clk TIMEGRP regs"));
        ASSERT_TRUE(builder.addRefProp(new NamedRef("t"), "TS_TPTHRU", "thru"));
        ASSERT_TRUE(
            builder.addRefProp(new NamedRef("e"), "TS_OFFSET", "IN 2 ns BEFORE clk TIMEGRP thru"));
        EXPECT_EQ(builder.buildTSDesign(), nullptr);
        EXPECT_EQ(capture.sink.errors(),
                  (std::vector<std::string>{
                      "Group \"regs\" is used as the register group in one or more OFFSET "
                      "specifications. This group is not defined by a TIMEGRP, TNM or TPSYNC "
                      "property.\n",
                      "Group \"thru\" is used as the register group in one or more OFFSET "
                      "specifications. This group is a TPTHRU group, which is not the correct "
                      "type: a TNM, TPSYNC or user group name is required here.\n"}));
        std::string dump = tsd_test::dumpText(builder);
        EXPECT_NE(dump.find("   pending reg groups remaining:\n      regs\n      thru\n"),
                  std::string::npos)
            << dump;
    }
    {
        // In reference mode the group is made silently, and no clock check runs.
        MessageCapture capture;
        Tsd_Design design("MM_TSREF");
        DesignBuilder builder(&design);
        auto* ref = new NamedRef("d");
        ASSERT_TRUE(builder.addRefProp(ref, "TS_OFFSET", "IN 2 ns BEFORE clk TIMEGRP regs"));
        ASSERT_TRUE(
            builder.addRefProp(new NamedRef("e"), "TS_OFFSET", "OUT 2 ns AFTER clk TIMEGRP regs"));
        EXPECT_EQ(builder.buildTSDesign(), &design);
        EXPECT_TRUE(capture.sink.records.empty()) << capture.sink.transcript();
        Tsd_Group* regs = design.findGroupByUserName("regs", false);
        ASSERT_NE(regs, nullptr);
        EXPECT_NE(regs->getTNMGroup(), nullptr);
        EXPECT_EQ(ref->getOwner()->getOffset()->getRegGroup(), regs);
        EXPECT_EQ(design.getGroupList()->getCount(),
                  1); // the second record found the first's group
        // The record that made the group stays; the one that found it is resolved.
        EXPECT_NE(
            tsd_test::dumpText(builder).find("remaining:\n      regs\n   builder error count: 0\n"),
            std::string::npos)
            << tsd_test::dumpText(builder);
    }
}

TEST(BuilderBuild, ALinkToASpecThatExistsOnlyInTheTrashResolves) {
    MessageCapture capture;
    Tsd_Design design;
    auto* g = new Tsd_TNMGroup("g");
    design.addGroup(g);
    auto* old = new Tsd_Period("TS01");
    old->setPeriodGroup(g);
    old->setDelayValue(Tsd_TimeValue(10, Tsd_TimeValue::UNITS_NS));
    design.addEndpointSpec(old);
    design.moveEndpointSpecToTrash(old);
    DesignBuilder builder(&design);
    builder.addSpecProp("TS02", "PERIOD:g:TS01*2");
    ASSERT_EQ(builder.buildTSDesign(), &design) << capture.sink.transcript();
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", false)->getLinkedSpec(), old);
}

TEST(BuilderBuild, IntakeErrorsFailTheBuildAlthoughEveryPhasePasses) {
    MessageCapture capture;
    Tsd_Builder builder;
    NamedRef bad("n");
    EXPECT_FALSE(builder.addRefProp(&bad, "TS_PERIOD", "%%%"));
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
    EXPECT_EQ(builder.getNumError(), 1);
}

TEST(BuilderBuild, DropSpecAndASecondBuildAreFatal) {
    MessageCapture capture;
    {
        Tsd_Builder builder;
        builder.addSpecProp("TS05", "DROP_SPEC");
        EXPECT_EQ(fatalText([&] { builder.buildTSDesign(); }),
                  "DROP_SPEC property TS05 passed to base Tsd_Builder: must be handled by user "
                  "builder.\n");
    }
    Tsd_Builder builder;
    std::unique_ptr<Tsd_Design> design(builder.buildTSDesign());
    EXPECT_EQ(fatalText([&] { builder.buildTSDesign(); }),
              "buildTSDesign() called more than once on one Tsd_Builder.\n");
}

namespace {

// A user builder that lets later definitions replace earlier ones.
class OverridingBuilder : public Tsd_Builder {
protected:
    bool allowUserGroupOverride(Tsd_UserGroup*, const char*) override { return true; }
    bool allowEndpointSpecOverride(Tsd_EndpointSpec*, const char*) override { return true; }
};

} // namespace

TEST(BuilderBuild, OverriddenDefinitionsReplaceEarlierOnesWithoutLeaking) {
    MessageCapture capture;
    PropSet set = withGroups({{"g", "ffs"}, {"g", "ram"}});
    // The first TS01 waits for TS09, which never comes: its pending link goes
    // with it when the second TS01 displaces it.
    set.specs = {{"TS01", "FROM:g:TO:ram:TS09*2"}, {"TS01", "FROM:ram:TO:g:2:nS"}};
    OverridingBuilder builder;
    Built built = build(set, builder);
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
    PropSet written = built.writeBack();
    EXPECT_EQ(written.groups, (std::vector<std::pair<std::string, std::string>>{{"g", "ram"}}));
    EXPECT_EQ(written.specs, (std::vector<std::pair<std::string, std::string>>{
                                 {"TS01", "FROM:ram:TO:g:2000:pS"}}));
    // The displaced spec waits in the trash, where the design deletes it.
    EXPECT_EQ(built.design->getEndpointSpecTrash()->getCount(), 1);
}

TEST(BuilderBuild, ParseErrorsEchoTheDefinitionWithACaretUnderTheBadToken) {
    MessageCapture capture;
    Tsd_Builder builder;
    builder.addUserGroupProp("h", "a::b");
    builder.addSpecProp("TS01", "BOGUS:a:10:nS");
    builder.addSpecProp("OFFSET", "IN 2 ns BEFORE clk junk");
    // A TS property holding an OFFSET is parsed without the "TIMESPEC name="
    // prefix; the caret still stands under the token in the echoed line.
    builder.addSpecProp("TS_X", "TIMEGRP pads OFFSET = IN 2 ns BEFORE clk junk");
    // A TIMEGRP met where a spec was expected has no group to fill.
    builder.addSpecProp("TS_Y", "TIMEGRP:a=b:OFFSET:x");
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
    EXPECT_EQ(capture.sink.errors(),
              (std::vector<std::string>{
                  "Processing TIMEGRP definition \"h=a::b\": Encountered bad token \":\" in "
                  "TIMEGRP:\nh=a::b\n    ^\n",
                  "Processing TIMESPEC definition \"TS01=BOGUS:a:10:nS\": Encountered bad token "
                  "\"BOGUS\" in TIMESPEC:\nTS01=BOGUS:a:10:nS\n     ^\n",
                  "Processing TIMESPEC definition \"OFFSET=IN 2 ns BEFORE clk junk\": Encountered "
                  "bad token \"junk\" in TIMESPEC:\nOFFSET=IN 2 ns BEFORE clk junk\n"
                  "                          ^\n",
                  "Processing TIMESPEC definition \"TS_X=TIMEGRP pads OFFSET = IN 2 ns BEFORE clk "
                  "junk\": Encountered bad token \"junk\" in TIMESPEC:\nTS_X=TIMEGRP pads OFFSET = "
                  "IN 2 ns BEFORE clk junk\n"
                  "                                              ^\n",
                  "Processing TIMESPEC definition \"TS_Y=TIMEGRP:a=b:OFFSET:x\": Unable to parse "
                  "TIMESPEC definition.\n"}));
    EXPECT_EQ(builder.getNumError(), 5);
}

TEST(BuilderBuild, AnObjectOfAnotherClassInTheTIGListIsFatal) {
    MessageCapture capture;
    Tsd_Design design;
    design.getTIGGroupList()->addObj(new Tsd_ClkGroup("not_a_tig"));
    DesignBuilder builder(&design);
    EXPECT_EQ(fatalText([&] { builder.buildTSDesign(); }), "Non-TIG group in list.\n");
}

TEST(BuilderBuild, NamesThatNeedQuotesCanBeDefined) {
    // A TNM property can make a group whose name holds a blank; a TIMEGRP
    // or TIMESPEC of such a name must read back as one name.
    MessageCapture capture;
    PropSet set;
    set.refs = {{"e", "TS_TNM", "two words"}};
    set.groups = {{"a b", "\"two words\""}, {"it's", "\"a b\""}};
    set.specs = {{"TS 1", "PERIOD:\"a b\":1:nS"}};
    Built built = build(set);
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript();
    EXPECT_NE(built.design->findGroupByUserName("a b", false)->getUserGroup(), nullptr);
    EXPECT_NE(built.design->findEndpointSpecByTSid("TS 1", false), nullptr);

    // The caret still stands under the bad token of the echoed definition.
    MessageCapture errors;
    Tsd_Builder builder;
    builder.addUserGroupProp("x y", "a::b");
    builder.addUserGroupProp("a\"b'c", "x::y"); // written as "a""b'c"
    builder.addSpecProp("TS 2", "BOGUS:a");
    EXPECT_EQ(builder.buildTSDesign(), nullptr);
    EXPECT_EQ(
        errors.sink.errors(),
        (std::vector<std::string>{
            "Processing TIMEGRP definition \"x y=a::b\": Encountered bad token \":\" in "
            "TIMEGRP:\nx y=a::b\n      ^\n",
            "Processing TIMEGRP definition \"a\"b'c=x::y\": Encountered bad token \":\" in "
            "TIMEGRP:\na\"b'c=x::y\n        ^\n",
            "Processing TIMESPEC definition \"TS 2=BOGUS:a\": Encountered bad token \"BOGUS\" "
            "in TIMESPEC:\nTS 2=BOGUS:a\n     ^\n"}));
}

// The builder checks every user group and every spec with shared walks; the
// messages and counts must be those of checking each one alone.
TEST(BuilderBuild, WholeDesignChecksMatchCheckingEachGroupAndSpecAlone) {
    for (unsigned seed = 0; seed < 1500; ++seed) {
        SCOPED_TRACE(seed);
        Tsd_Design shared, alone;
        tsd_test::fillGroups(seed, shared);
        tsd_test::fillGroups(seed, alone);
        tsd_test::fillSpecs(seed, shared);
        tsd_test::fillSpecs(seed, alone);
        std::string sharedText, aloneText;
        short sharedCount = 0;
        int aloneCount = 0;
        {
            MessageCapture capture;
            OpenBuilder builder(false);
            builder.initBaseBuilder(&shared);
            sharedText = fatalText([&] {
                builder.validateUserGroups();
                builder.resolvePendingLinks();
            });
            sharedText += capture.sink.transcript();
            sharedCount = builder.getNumError();
        }
        {
            MessageCapture capture;
            aloneText = fatalText([&] {
                for (Tsd_BaseObjList* list : {alone.getGroupList(), alone.getEndpointSpecList()}) {
                    Tsd_BaseObjListIter iter(list);
                    while (Tsd_BaseObj* obj = iter.next()) {
                        if (Tsd_UserGroup* group = obj->getUserGroup())
                            aloneCount += group->checkInExcludes(true);
                        else if (Tsd_EndpointSpec* spec = obj->getEndpointSpec())
                            aloneCount += spec->checkLink(true);
                    }
                }
            });
            aloneText += capture.sink.transcript();
        }
        ASSERT_EQ(sharedText, aloneText);
        ASSERT_EQ(sharedCount, aloneCount);
    }
}

namespace {

// Counts what a dump writes without keeping it.
class CountingBuffer : public std::streambuf {
public:
    std::size_t count = 0;

protected:
    int_type overflow(int_type c) override {
        ++count;
        return c;
    }
    std::streamsize xsputn(const char*, std::streamsize n) override {
        count += static_cast<std::size_t>(n);
        return n;
    }
};

struct Shape {
    const char* name;
    PropSet set;
    std::size_t trashed; // objects trim() reports once `base` is withdrawn
};

} // namespace

// Chains as deep as a large design can make them: a chain of definitions
// each naming the next, a chain of linked TSids, one group of very many
// members. Building, trimming after the base is withdrawn and dumping must
// neither exhaust the stack nor take long (measured by the benchmarks).
TEST(BuilderBuild, DeepChainsAndWideGroupsBuildTrimAndDump) {
    const int n = 200000;
    std::vector<Shape> shapes(3);
    shapes[0] = {"group chain", {}, std::size_t(n) + 2};
    shapes[0].set.refs = {{"base", "TS_TNM", "leaf"}};
    for (int i = 0; i < n; ++i)
        shapes[0].set.groups.emplace_back("g" + std::to_string(i),
                                          i + 1 < n ? "g" + std::to_string(i + 1) : "leaf");
    shapes[0].set.specs = {{"TS0", "PERIOD g0 10 ns"}};
    shapes[1] = {"linked TSids", {}, 2};
    shapes[1].set.refs = {{"base", "TS_TNM", "clk"}, {"d", "TS_TNM", "data"}};
    for (int i = n - 1; i > 0; --i)
        shapes[1].set.specs.emplace_back("TS" + std::to_string(i),
                                         "PERIOD data TS" + std::to_string(i - 1) + " * 1");
    shapes[1].set.specs.emplace_back("TS0", "PERIOD clk 10 ns");
    shapes[2] = {"wide group", {}, std::size_t(n) + 2};
    std::string members;
    for (int i = 0; i < n; ++i) {
        shapes[2].set.refs.push_back({"base", "TS_TNM", "m" + std::to_string(i)});
        members += (i != 0 ? ":m" : "m") + std::to_string(i);
    }
    shapes[2].set.groups = {{"wide", members}};
    shapes[2].set.specs = {{"TS0", "PERIOD wide 10 ns"}};

    for (Shape& shape : shapes) {
        SCOPED_TRACE(shape.name);
        MessageCapture capture;
        auto* design = new tsd_test::RecordingDesign;
        OpenBuilder builder(false);
        builder.initBaseBuilder(design);
        Built built = build(shape.set, builder);
        if (built.design == nullptr)
            built.design.reset(design); // a failed build leaves it with us
        ASSERT_EQ(built.errors, 0) << capture.sink.transcript().substr(0, 2000);
        for (auto& ref : built.refs)
            if (ref.first == "base")
                ref.second->trim();
        EXPECT_TRUE(design->trim());
        EXPECT_EQ(design->trashed.size(), shape.trashed);
        CountingBuffer counter;
        std::ostream out(&counter);
        DumpStream stream(out);
        design->dump(stream, 0);
        EXPECT_GT(counter.count, std::size_t(n));
    }
}
