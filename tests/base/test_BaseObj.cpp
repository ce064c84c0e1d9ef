#include "TsdTestSupport.h"

#include <gtest/gtest.h>

using tsd_test::fatalText;
using tsd_test::MessageCapture;
using tsd_test::NamedRef;

namespace {

// A reference holder standing in for the groups and net specs of later modules.
class Holder : public Tsd_BaseObj {
public:
    explicit Holder(const char* name = "TS_TNM", const char* value = "clk_ffs")
        : m_name(name), m_value(value) {}
    ~Holder() override { m_refs.deleteAllRefs(); }
    Tsd_RefList* getRefList() override { return &m_refs; }
    bool getProp(const char*& name, const char*& value) const override {
        name = m_name;
        value = m_value;
        return true;
    }

private:
    const char* m_name;
    const char* m_value;
    Tsd_RefList m_refs;
};

class Plain : public Tsd_BaseObj {};

class Described : public Tsd_BaseObj {
public:
    bool getProp(const char*& name, const char*& value) const override {
        name = "TS01";
        value = "FROM:a:TO:b:10:nS";
        return true;
    }
};

} // namespace

TEST(BaseObj, TypeQueriesOfTheBaseAnswerNull) {
    Plain p;
    Tsd_BaseObj& b = p;
    EXPECT_EQ(b.getRefList(), nullptr);
    EXPECT_EQ(b.getGroup(), nullptr);
    EXPECT_EQ(b.getUserGroup(), nullptr);
    EXPECT_EQ(b.getSpec(), nullptr);
    EXPECT_EQ(b.getPortTiming(), nullptr);
    EXPECT_FALSE(b.refOwner());
    const char* name = "x";
    const char* value = "y";
    EXPECT_FALSE(b.getProp(name, value));
    EXPECT_EQ(name, nullptr);
    EXPECT_EQ(value, nullptr);
    EXPECT_EQ(tsd_test::dumpText(b), "");
}

TEST(BaseObj, UserStringForms) {
    Holder tnm;
    EXPECT_STREQ(tnm.getUserString(), "TNM=clk_ffs"); // TS_ dropped for holders
    Described spec;
    EXPECT_STREQ(spec.getUserString(), "TS01=FROM a TO b 10 nS"); // colons become blanks
    Plain none;
    EXPECT_STREQ(none.getUserString(), "no property for object");
    Holder shortName("TS", "v");
    EXPECT_STREQ(shortName.getUserString(), "=v");
}

TEST(BaseObj, UserStringIsSharedAndOverwrittenByTheNextCall) {
    Holder tnm;
    Described spec;
    const char* first = tnm.getUserString();
    std::string kept = first;
    spec.getUserString();
    EXPECT_STREQ(first, "TS01=FROM a TO b 10 nS");
    EXPECT_EQ(kept, "TNM=clk_ffs");
}

TEST(BaseObj, GetTIGidOnANonTIGObjectIsAnInternalError) {
    MessageCapture capture;
    Plain p;
    EXPECT_EQ(p.getTIGid(), nullptr);
    ASSERT_EQ(capture.sink.records.size(), 1u);
    EXPECT_EQ(capture.sink.records[0].severity, MessageSeverity::InternalError);
    EXPECT_EQ(capture.sink.records[0].text, "getTIGid() called on non-TIG object!\n");
}

TEST(BaseObj, ReferenceOperationsOnNonHoldersAreFatal) {
    MessageCapture capture;
    Plain p;
    NamedRef r("r");
    int code = 0;
    EXPECT_EQ(fatalText([&] { p.addRef(&r); }, &code),
              "addRef() called on non-reference object.\n");
    EXPECT_EQ(code, 2);
    EXPECT_EQ(fatalText([&] { p.trimRef(&r, true); }),
              "trimRef() called on non-reference object.\n");
    Holder h;
    EXPECT_EQ(fatalText([&] { h.trimRef(&r, false); }),
              "trimRef() called for reference not held.\n");
    h.addRef(nullptr); // ignored
    EXPECT_EQ(h.getRefList()->getCount(), 0);
}

TEST(Ref, OwnershipMovesBetweenOwnersLeavingAHole) {
    Holder first, second;
    auto* r = new NamedRef("r");
    EXPECT_EQ(r->getOwner(), nullptr);
    EXPECT_STREQ(r->getUserString(), "UNOWNED");
    r->setOwner(&first);
    EXPECT_EQ(r->getOwner(), &first);
    EXPECT_EQ(first.getRefList()->getSingleRef(), r);
    r->setOwner(&second);
    EXPECT_EQ(r->getOwner(), &second);
    EXPECT_EQ(first.getRefList()->getCount(), 1); // the hole stays
    EXPECT_TRUE(first.getRefList()->isEmpty());
    EXPECT_EQ(second.getRefList()->getSingleRef(), r);
    EXPECT_STREQ(r->getUserString(), "TNM=clk_ffs");
    // `second` destroys r with itself.
}

TEST(Ref, TrimDestroysTheReferenceAndLeavesItsOwner) {
    int destroyed = 0;
    Holder h;
    auto* a = new NamedRef("a", &destroyed);
    auto* b = new NamedRef("b", &destroyed);
    a->setOwner(&h);
    b->setOwner(&h);
    a->trim();
    EXPECT_EQ(destroyed, 1);
    EXPECT_EQ(h.getRefList()->getSingleRef(), b);
    b->trimNoReport();
    EXPECT_EQ(destroyed, 2);
    EXPECT_TRUE(h.getRefList()->isEmpty());
}

TEST(Ref, DestroyingTheOwnerDestroysHeldReferencesOnly) {
    int destroyed = 0;
    auto* kept = new NamedRef("kept", &destroyed);
    {
        Holder h;
        (new NamedRef("a", &destroyed))->setOwner(&h);
        kept->setOwner(&h);
        Holder other;
        kept->setOwner(&other); // moved away before h goes
        (void)other.getRefList()->getSingleRef();
        kept->setOwner(&h); // and back again
        EXPECT_EQ(h.getRefList()->getCount(), 3);
    }
    EXPECT_EQ(destroyed, 2);
}

TEST(Ref, OwnerQueriesNeedAnOwner) {
    MessageCapture capture;
    NamedRef r("r");
    EXPECT_EQ(fatalText([&] { (void)r.isTNM(); }),
              "Tsd_Ref::isTNM() called on a reference without owner.\n");
    EXPECT_EQ(fatalText([&] { r.trim(); }),
              "Tsd_Ref::trim() called on a reference without owner.\n");
    EXPECT_EQ(fatalText([&] { r.setOwner(nullptr); }),
              "Tsd_Ref::setOwner() called with a NULL owner.\n");
    Plain notAHolder;
    EXPECT_EQ(fatalText([&] { r.setOwner(&notAHolder); }),
              "addRef() called on non-reference object.\n");
}

TEST(Ref, OwnerQueriesAskTheOwnersClass) {
    Holder h;
    auto* r = new NamedRef("r");
    r->setOwner(&h);
    // The test holder answers none of the group queries.
    EXPECT_FALSE(r->isTIG());
    EXPECT_FALSE(r->isSync());
    EXPECT_FALSE(r->isTNM());
    EXPECT_FALSE(r->isThru());
    MessageCapture capture;
    EXPECT_EQ(r->getTIGid(), nullptr); // the base's internal error
    EXPECT_EQ(capture.sink.records.size(), 1u);
}

TEST(Ref, CopyToJoinsTheSameOwnerAndIsRedundantFindsEquals) {
    Holder h;
    auto* a = new NamedRef("a");
    a->setOwner(&h);
    NamedRef* copy = a->duplicate();
    EXPECT_EQ(copy->getOwner(), &h);
    EXPECT_EQ(h.getRefList()->getCount(), 2);
    NamedRef probeA("a"), probeB("b");
    EXPECT_TRUE(a->redundant(&probeA));
    EXPECT_FALSE(a->redundant(&probeB));
}

TEST(Ref, DumpSaysWhetherItHasAnOwner) {
    Holder h;
    NamedRef loose("x");
    EXPECT_EQ(tsd_test::dumpText(loose, 1), "   owner undefined\n");
    auto* owned = new NamedRef("y");
    owned->setOwner(&h);
    EXPECT_EQ(tsd_test::dumpText(*owned, 2), "      owner defined\n");
}
