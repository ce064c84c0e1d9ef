// What scenarios cannot show: the builder's answers at intake, its counters
// and context, misuses, the whole-design checks against checking each group
// and spec alone, and chains as deep as a large design makes them.
#include "BuilderTestSupport.h"
#include "RandomDesigns.h"

#include <functional>

using namespace tsd_test;

TEST(Builder, IntakeAnswers) {
    MessageCapture capture;
    Tsd_Builder builder;
    for (const char* name : {"ts01", "TS", "disable", "ENABLE", "Offset", "TIMEGRP", "timegrp_x"})
        EXPECT_TRUE(builder.addSpecProp(name, "x")) << name;
    for (const char* name : {"PERIOD", "T", "", "TIMEGR"})
        EXPECT_FALSE(builder.addSpecProp(name, "x")) << name;
    EXPECT_FALSE(builder.addSpecProp(nullptr, "x"));
    EXPECT_TRUE(builder.addUserGroupProp("anything", nullptr));
    EXPECT_FALSE(builder.addUserGroupProp(nullptr, "x"));
    for (const char* name : {"ts_tnm", "Ts_FeedBack", "TS_TPTHRU", "TS_TPSYNC", "TS_TIG",
                             "TS_CLKGRP", "TS_OFFSET", "TS_PERIOD", "TS_MAXDELAY", "TS_MAXSKEW"})
        EXPECT_TRUE(Tsd_Builder::isRefProp(name)) << name;
    for (const char* name : {"TS_FOO", "TSTNM", "", "TS_", "TS_TNMX", "XTS_TNM", (const char*)0})
        EXPECT_FALSE(Tsd_Builder::isRefProp(name)) << (name ? name : "null");

    // References with one value share one group; unknown names and null
    // references are refused without a word.
    auto* a = new NamedRef("a");
    auto* b = new NamedRef("b");
    ASSERT_TRUE(builder.addRefProp(a, "TS_TNM", "clk_ffs"));
    ASSERT_TRUE(builder.addRefProp(b, "ts_tnm", "clk_ffs"));
    EXPECT_EQ(a->getOwner(), b->getOwner());
    NamedRef ref("r");
    EXPECT_FALSE(builder.addRefProp(&ref, "TS_NOTHING", "x"));
    EXPECT_FALSE(builder.addRefProp(&ref, "PERIOD", "x"));
    EXPECT_FALSE(builder.addRefProp(nullptr, "TS_TNM", "x"));
    EXPECT_EQ(ref.getOwner(), nullptr);
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(Builder, ContextCountersAndAnEmptyBuild) {
    OpenBuilder builder;
    EXPECT_EQ(std::u16string(builder.getContext()), u"");
    builder.setContext(translateMessage("TSDatabase", "Reading %s: ", "a.props"));
    EXPECT_EQ(std::u16string(builder.getContext()), u"Reading a.props: ");
    builder.setContext(static_cast<const char16_t*>(nullptr));
    EXPECT_EQ(std::u16string(builder.getContext()), u"");
    // The 16-bit counters stop at their largest value instead of wrapping
    // round to a count that would let a failed build pass.
    builder.addError(30000);
    builder.addError(30000);
    EXPECT_EQ(builder.getNumError(), 32767);
    builder.addWarning(2);
    EXPECT_EQ(builder.getNumWarning(), 2);
    EXPECT_EQ(builder.buildTSDesign(), nullptr);

    MessageCapture capture;
    auto* empty = new Tsd_Builder();
    Tsd_Design* design = empty->buildTSDesign();
    ASSERT_NE(design, nullptr);
    delete empty; // the design now belongs to the caller
    EXPECT_EQ(design->getGroupList()->getCount(), 0);
    delete design;
    EXPECT_TRUE(capture.sink.records.empty());
}

TEST(Builder, MisusesAreFatal) {
    MessageCapture capture;
    Tsd_Design own;
    OpenBuilder given(false), creating, twice, noDesign(false);
    given.initBaseBuilder(&own);
    Tsd_Builder owner, dropper;
    auto* owned = new NamedRef("r");
    ASSERT_TRUE(owner.addRefProp(owned, "TS_TNM", "g"));
    dropper.addSpecProp("TS05", "DROP_SPEC");
    std::unique_ptr<Tsd_Design> built(twice.buildTSDesign());
    Tsd_Design wrongTIG;
    wrongTIG.getTIGGroupList()->addObj(new Tsd_ClkGroup("not_a_tig"));
    OpenBuilder tigs(&wrongTIG, false);
    NamedRef loose("x");
    const struct {
        std::function<void()> misuse;
        const char* message;
    } cases[] = {
        {[&] { noDesign.addRefProp(&loose, "TS_TNM", "g"); },
         "Tsd_Builder has no design: call initBaseBuilder() first.\n"},
        {[&] { given.initBaseBuilder(&own); },
         "Cannot init base builder or re-init derived builder.\n"},
        {[&] { creating.initBaseBuilder(&own); },
         "Cannot init base builder or re-init derived builder.\n"},
        {[&] { owner.addRefProp(owned, "TS_TPTHRU", "t"); },
         "Already-owned referenced passed to Tsd_Builder::addRefProp(). The reference is "
         "already owned by object TNM=g, and is being added to TS_TPTHRU=t.\n"},
        {[&] { dropper.buildTSDesign(); },
         "DROP_SPEC property TS05 passed to base Tsd_Builder: must be handled by user "
         "builder.\n"},
        {[&] { twice.buildTSDesign(); },
         "buildTSDesign() called more than once on one Tsd_Builder.\n"},
        {[&] { tigs.buildTSDesign(); }, "Non-TIG group in list.\n"},
    };
    for (const auto& c : cases) {
        int code = 0;
        EXPECT_EQ(fatalText(c.misuse, &code), c.message);
        EXPECT_EQ(code, 2);
    }
}

// A link may name a spec that only the trash holds.
TEST(Builder, ALinkToASpecThatExistsOnlyInTheTrashResolves) {
    MessageCapture capture;
    Tsd_Design design;
    auto* g = new Tsd_TNMGroup("g");
    design.addGroup(g);
    auto* old = new Tsd_Period("TS01");
    old->setPeriodGroup(g);
    old->setDelayValue(ns(10));
    design.addEndpointSpec(old);
    design.moveEndpointSpecToTrash(old);
    OpenBuilder builder(&design, false);
    builder.addSpecProp("TS02", "PERIOD:g:TS01*2");
    ASSERT_EQ(builder.buildTSDesign(), &design) << capture.sink.transcript();
    EXPECT_EQ(design.findEndpointSpecByTSid("TS02", false)->getLinkedSpec(), old);
}

// The builder checks every user group and every spec with shared walks; the
// messages and counts must be those of checking each one alone.
TEST(Builder, WholeDesignChecksMatchCheckingEachGroupAndSpecAlone) {
    for (unsigned seed = 0; seed < 1500; ++seed) {
        SCOPED_TRACE(seed);
        Tsd_Design shared, alone;
        fillGroups(seed, shared);
        fillGroups(seed, alone);
        fillSpecs(seed, shared);
        fillSpecs(seed, alone);
        std::string sharedText, aloneText;
        short sharedCount = 0;
        int aloneCount = 0;
        {
            MessageCapture capture;
            OpenBuilder builder(&shared, false);
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
                    for (Tsd_BaseObj* obj : objects(list)) {
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

} // namespace

// Chains as deep as a large design can make them: a chain of definitions
// each naming the next, a chain of linked TSids, one group of very many
// members. Building, trimming after the base is withdrawn and dumping must
// not exhaust the stack (their speed is measured by the benchmarks).
TEST(Builder, DeepChainsAndWideGroupsBuildTrimAndDump) {
    const int n = 200000;
    struct Shape {
        const char* name;
        PropSet set;
        std::size_t trashed; // objects trim() reports once `base` is withdrawn
    };
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
        auto* design = new RecordingDesign;
        OpenBuilder builder(design, false);
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

namespace {

// Enough stored properties to fill several blocks of text.
constexpr int kMore = 3000;

// Group names of a few dozen characters; the 1000th is longer than a block.
std::string longName(char first, int i) {
    std::string name(1, first);
    name += std::to_string(i);
    name.append(i == 1000 ? 70000 : 30, 'x');
    return name;
}

} // namespace

// A hook may store more properties while the build processes the stored
// ones: they are processed after them, in order, across the blocks that
// hold their texts and through one text longer than a block.
TEST(Builder, PropertiesStoredByAHookDuringTheBuildAreProcessedInOrder) {
    class GrowingBuilder : public Tsd_Builder {
    public:
        int groupsAdded = 0;
        int specsAdded = 0;

    protected:
        Tsd_PredefGroup* getPredefGroupForGroup(const char* name) override {
            // "u<i>" names "v<i>", which the hook then defines.
            if (name[0] == 'v' && groupsAdded < kMore)
                addUserGroupProp(name, longName('t', ++groupsAdded).c_str());
            return Tsd_Builder::getPredefGroupForGroup(name);
        }
        Tsd_TermGroup* getTermGroupForSpec(const char* name) override {
            // Each period defines the next, each on a group of its own.
            if (specsAdded < kMore) {
                ++specsAdded;
                addSpecProp(("TS" + std::to_string(specsAdded)).c_str(),
                            ("PERIOD " + longName('t', specsAdded) + " 10 ns").c_str());
            }
            return Tsd_Builder::getTermGroupForSpec(name);
        }
    };
    PropSet set;
    for (int i = 1; i <= kMore; ++i)
        set.refs.push_back({"e" + std::to_string(i), "TS_TNM", longName('t', i)});
    for (int i = 1; i <= kMore; ++i)
        set.groups.emplace_back("u" + std::to_string(i), "v" + std::to_string(i));
    set.specs = {{"TS0", "PERIOD " + longName('t', 1) + " 10 ns"}};
    MessageCapture capture;
    GrowingBuilder builder;
    Built built = build(set, builder);
    ASSERT_NE(built.design, nullptr) << capture.sink.transcript().substr(0, 2000);
    EXPECT_EQ(builder.groupsAdded, kMore);
    EXPECT_EQ(builder.specsAdded, kMore);
    // Every group the hook stored was defined, so no "v" stayed unresolved,
    // and each spec it stored was built, in the order stored.
    EXPECT_TRUE(capture.sink.records.empty()) << capture.sink.transcript().substr(0, 2000);
    const Tsd_BaseObjList* specs = built.design->getEndpointSpecList();
    ASSERT_EQ(specs->getCount(), kMore + 1);
    for (int i = 0; i <= kMore; ++i) {
        const Tsd_Period* period = specs->getAt(i)->getEndpointSpec()->getPeriod();
        ASSERT_NE(period, nullptr) << i;
        EXPECT_EQ(std::string(period->getTSid()), "TS" + std::to_string(i));
        EXPECT_EQ(std::string(period->getPeriodGroup()->getName()), longName('t', i == 0 ? 1 : i));
    }
}
