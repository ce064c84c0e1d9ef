// The foundation: pointer lists and their index, reference records and their
// owners, the object base, and the text buffers.
#include "TsdTestSupport.h"
#include "internal/Tsd_ObjText.h"

#include <algorithm>
#include <functional>
#include <random>

using namespace tsd_test;

namespace {

class Plain : public Tsd_BaseObj {};

// A reference holder standing in for the groups and net specs.
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

std::vector<Tsd_Ref*> refs(const Tsd_RefList& list) {
    std::vector<Tsd_Ref*> out;
    Tsd_RefListIter iter(&list);
    while (Tsd_Ref* r = iter.next())
        out.push_back(r);
    return out;
}

} // namespace

TEST(RefList, SlotsHolesAndTheSingleReference) {
    NamedRef a("a"), b("b");
    Tsd_RefList list(2);
    EXPECT_FALSE(list.addRef(nullptr));
    EXPECT_FALSE(list.removeRef(&a)); // no slots at all
    EXPECT_EQ(list.getSingleRef(), nullptr);
    EXPECT_TRUE(list.addRef(&a));
    EXPECT_TRUE(list.addRef(&a)); // duplicates are stored
    EXPECT_TRUE(list.addRef(&b)); // grows past the initial capacity
    EXPECT_EQ(list.getSingleRef(), nullptr);
    EXPECT_TRUE(list.removeRef(&a)); // the first occurrence only, leaving a hole
    EXPECT_EQ(list.getCount(), 3);
    EXPECT_EQ(list.getAt(0), nullptr);
    EXPECT_EQ(refs(list), (std::vector<Tsd_Ref*>{&a, &b}));
    EXPECT_TRUE(list.removeRef(&b));
    EXPECT_EQ(list.getSingleRef(), &a);    // [null, A, null]
    EXPECT_FALSE(list.removeRef(nullptr)); // a hole is not a reference
    EXPECT_TRUE(list.removeRef(&a));
    EXPECT_FALSE(list.removeRef(&b));
    EXPECT_TRUE(list.isEmpty()); // every slot cleared, count still 3
    EXPECT_EQ(list.getCount(), 3);
    list.emptyList();
    EXPECT_EQ(list.getCount(), 0);
    list.addRef(&a);
    list.addRef(&a);
    EXPECT_EQ(list.getSingleRef(), nullptr); // two slots, one pointer
}

TEST(RefList, DeleteAllRefsDestroysEachReferenceOnce) {
    // Short and long lists (sorted by different means), references added
    // again by hand far from their first place.
    for (int distinct : {2, 5000}) {
        SCOPED_TRACE(distinct);
        int destroyed = 0;
        std::vector<NamedRef*> refs;
        Tsd_RefList list;
        for (int i = 0; i < distinct; ++i) {
            refs.push_back(new NamedRef("r" + std::to_string(i), &destroyed));
            list.addRef(refs.back());
        }
        for (int i : {0, distinct - 1, 0, distinct / 2})
            list.addRef(refs[static_cast<std::size_t>(i)]);
        list.deleteAllRefs();
        EXPECT_EQ(destroyed, distinct);
        EXPECT_EQ(list.getCount(), 0);
    }
}

TEST(BaseObjList, WalksSkipHolesAndSeeRemovalsAndAppendsDuringTheWalk) {
    Plain o[6];
    Tsd_BaseObjList list(1);
    for (int i = 0; i < 5; ++i)
        list.addObj(&o[i]);
    EXPECT_FALSE(list.addObj(nullptr));
    EXPECT_FALSE(list.contains(nullptr));
    std::vector<Tsd_BaseObj*> seen;
    Tsd_BaseObjListIter iter(&list);
    while (Tsd_BaseObj* obj = iter.next()) {
        seen.push_back(obj);
        if (obj == &o[1]) { // the element just returned, and one further ahead
            EXPECT_TRUE(list.removeObj(obj));
            EXPECT_TRUE(list.removeObj(&o[3]));
        }
        if (obj == &o[4])
            list.addObj(&o[5]);
    }
    EXPECT_EQ(seen, (std::vector<Tsd_BaseObj*>{&o[0], &o[1], &o[2], &o[4], &o[5]}));
    EXPECT_EQ(iter.next(), nullptr); // exhausted until something is appended
    EXPECT_FALSE(list.removeObj(nullptr));
    EXPECT_EQ(objects(&list), (std::vector<Tsd_BaseObj*>{&o[0], &o[2], &o[4], &o[5]}));

    EXPECT_EQ(Tsd_BaseObjListIter(nullptr).next(), nullptr);
    EXPECT_EQ(Tsd_RefListIter(static_cast<const Tsd_RefList*>(nullptr)).next(), nullptr);
    EXPECT_EQ(Tsd_RefListIter(&o[0]).next(), nullptr); // not a holder
}

TEST(BaseObjList, ResetAndRemoveAtAndOutOfRangeSlots) {
    Plain a, b, c;
    DARRAY_Tsd_BaseObjPtr array(0);
    array.append(&a);
    array.append(&b);
    array.append(&c);
    array.removeAt(1);
    EXPECT_EQ(array.getCount(), 2);
    EXPECT_EQ(array[1], &c);
    EXPECT_EQ(array[5], nullptr); // out of range reads null
    array.setAt(7, &a);           // out of range writes nothing
    array.reset(0);
    EXPECT_EQ(array.getCount(), 0);
}

// Large lists answer from an index; it must agree with a plain scan through
// every way a list changes, duplicates included.
TEST(BaseObjList, LargeListsAgreeWithAScanThroughEveryChange) {
    std::vector<Plain> pool(60);
    std::mt19937 rng(7);
    auto pick = [&] { return &pool[rng() % pool.size()]; };
    for (int round = 0; round < 40; ++round) {
        Tsd_BaseObjList list;
        std::vector<Tsd_BaseObj*> model;
        for (int step = 0; step < 400; ++step) {
            Tsd_BaseObj* p = pick();
            const unsigned op = rng() % 100;
            const int count = static_cast<int>(model.size());
            if (op < 45) {
                list.addObj(p);
                model.push_back(p);
            } else if (op < 75) {
                auto it = std::find(model.begin(), model.end(), p);
                EXPECT_EQ(list.removeObj(p), it != model.end());
                if (it != model.end())
                    *it = nullptr;
            } else if (op < 88 && count > 0) {
                // A store by hand: a hole, another object, or the same one.
                int i = static_cast<int>(rng() % count);
                Tsd_BaseObj* q = rng() % 3 == 0 ? nullptr : p;
                list.setAt(i, q);
                model[i] = q;
            } else if (op < 92 && count > 0) {
                int i = static_cast<int>(rng() % count);
                list.removeAt(i);
                model.erase(model.begin() + i);
            } else if (op < 94) {
                int n = count > 0 ? static_cast<int>(rng() % count) : 0;
                list.reset(n);
                model.resize(n);
            }
            ASSERT_EQ(list.getCount(), static_cast<int>(model.size()));
            Tsd_BaseObj* probe = pick();
            EXPECT_EQ(list.contains(probe),
                      std::find(model.begin(), model.end(), probe) != model.end());
            EXPECT_EQ(list.isEmpty(), std::count(model.begin(), model.end(), nullptr) ==
                                          static_cast<std::ptrdiff_t>(model.size()));
        }
        for (int i = 0; i < list.getCount(); ++i)
            ASSERT_EQ(list.getAt(i), model[i]);
    }
}

TEST(BaseObj, TheBaseAnswersNothingAndHoldersWriteTheirUserString) {
    Plain p;
    Tsd_BaseObj& b = p;
    EXPECT_TRUE(b.getRefList() == nullptr && b.getGroup() == nullptr &&
                b.getUserGroup() == nullptr && b.getSpec() == nullptr &&
                b.getPortTiming() == nullptr && !b.refOwner());
    EXPECT_EQ(propText(b), "<no property>");
    EXPECT_EQ(dumpText(b), "");
    EXPECT_STREQ(b.getUserString(), "no property for object");

    Holder tnm, shortName("TS", "v");
    const char* first = tnm.getUserString();
    EXPECT_STREQ(first, "TNM=clk_ffs"); // "TS_" dropped for holders
    EXPECT_STREQ(shortName.getUserString(), "=v");
    NamedRef loose("x");
    EXPECT_STREQ(loose.getUserString(), "UNOWNED");
    // A plain object writes its property's colons as blanks, in the same buffer.
    struct Described : Plain {
        bool getProp(const char*& name, const char*& value) const override {
            name = "TS01";
            value = "FROM:a:TO:b:10:nS";
            return true;
        }
    } described;
    described.getUserString();
    EXPECT_STREQ(first, "TS01=FROM a TO b 10 nS");
}

TEST(BaseObj, MisusesAreFatalOrInternalErrors) {
    MessageCapture capture;
    Plain p;
    Holder h;
    NamedRef r("r");
    Plain notAHolder;
    const struct {
        std::function<void()> misuse;
        const char* message;
    } cases[] = {
        {[&] { p.addRef(&r); }, "addRef() called on non-reference object.\n"},
        {[&] { p.trimRef(&r, true); }, "trimRef() called on non-reference object.\n"},
        {[&] { h.trimRef(&r, false); }, "trimRef() called for reference not held.\n"},
        {[&] { (void)r.isTNM(); }, "Tsd_Ref::isTNM() called on a reference without owner.\n"},
        {[&] { r.trim(); }, "Tsd_Ref::trim() called on a reference without owner.\n"},
        {[&] { r.setOwner(nullptr); }, "Tsd_Ref::setOwner() called with a NULL owner.\n"},
        {[&] { r.setOwner(&notAHolder); }, "addRef() called on non-reference object.\n"},
    };
    for (const auto& c : cases) {
        int code = 0;
        EXPECT_EQ(fatalText(c.misuse, &code), c.message);
        EXPECT_EQ(code, 2);
    }
    h.addRef(nullptr); // ignored
    EXPECT_EQ(h.getRefList()->getCount(), 0);
    capture.sink.clear();
    EXPECT_EQ(p.getTIGid(), nullptr);
    EXPECT_EQ(capture.sink.transcript(), "internal error: getTIGid() called on non-TIG object!\n");
}

TEST(Ref, OwnershipMovesLeavingAHoleAndOwnersDestroyWhatTheyHold) {
    int destroyed = 0;
    auto* kept = new NamedRef("kept", &destroyed);
    {
        Holder first, second;
        auto* r = attachRef(&first, "r", &destroyed);
        EXPECT_EQ(first.getRefList()->getSingleRef(), r);
        r->setOwner(&second);
        EXPECT_EQ(r->getOwner(), &second);
        EXPECT_EQ(first.getRefList()->getCount(), 1); // the hole stays
        EXPECT_TRUE(first.getRefList()->isEmpty());
        EXPECT_STREQ(r->getUserString(), "TNM=clk_ffs");
        // The holder answers none of the group queries.
        EXPECT_FALSE(r->isTIG() || r->isSync() || r->isTNM() || r->isThru());
        {
            MessageCapture capture;
            EXPECT_EQ(r->getTIGid(), nullptr); // the base's internal error
        }
        kept->setOwner(&first);
        Holder other;
        kept->setOwner(&other);
        kept->setOwner(&first); // moved away before `other` goes, and back
        EXPECT_EQ(first.getRefList()->getCount(), 3);

        auto* a = attachRef(&second, "a", &destroyed);
        a->trim();
        EXPECT_EQ(destroyed, 1);
        EXPECT_EQ(second.getRefList()->getSingleRef(), r);
        r->trimNoReport();
        EXPECT_EQ(destroyed, 2);
        EXPECT_TRUE(second.getRefList()->isEmpty());
    }
    EXPECT_EQ(destroyed, 3);
}

TEST(Ref, CopiesJoinTheOwnerAndEqualsAreRedundant) {
    Holder h;
    NamedRef* a = attachRef(&h, "a");
    NamedRef* copy = a->duplicate();
    EXPECT_EQ(copy->getOwner(), &h);
    EXPECT_EQ(h.getRefList()->getCount(), 2);
    NamedRef probeA("a"), probeB("b");
    EXPECT_TRUE(a->redundant(&probeA));
    EXPECT_FALSE(a->redundant(&probeB));
    EXPECT_EQ(dumpText(*a, 2), "      owner defined\n");
    EXPECT_EQ(dumpText(probeA, 1), "   owner undefined\n");
}

TEST(StaticBuf, GrowsByWholeIncrementsAndNeverShrinks) {
    // Each step: c cat, p copy, x clear, n cat(null), N copy(null); then the
    // limit and size it leaves. A mirror string holds the expected text.
    const struct {
        char op;
        std::string text;
        int limit, size;
    } steps[] = {
        {'c', std::string(40, 'a'), 48, 41},
        {'c', std::string(7, 'b'), 48, 48},
        {'c', "c", 64, 49},
        {'c', std::string(100, 'd'), 160, 149},
        {'n', "", 160, 149},
        {'c', "", 160, 149},
        {'p', "short", 160, 6},
        {'N', "", 160, 1},
        {'p', std::string(159, 'e'), 160, 160},
        {'p', std::string(160, 'f'), 176, 161},
        {'p', "", 176, 1},
        {'p', "abc", 176, 4},
        {'x', "", 176, 1},
    };
    Tsd_StaticBuf buf(32, 16);
    EXPECT_EQ(buf.getLimit(), 32);
    EXPECT_EQ(buf.getSize(), 1);
    std::string mirror;
    for (const auto& s : steps) {
        if (s.op == 'c')
            buf.cat(s.text.c_str());
        else if (s.op == 'p')
            buf.copy(s.text.c_str());
        else if (s.op == 'n')
            buf.cat(nullptr);
        else if (s.op == 'N')
            buf.copy(nullptr);
        else
            buf.clear();
        mirror = s.op == 'c' ? mirror + s.text : s.op == 'p' ? s.text : s.op == 'n' ? mirror : "";
        EXPECT_EQ(buf.getLimit(), s.limit) << s.op << " " << s.text.size();
        EXPECT_EQ(buf.getSize(), s.size) << s.op << " " << s.text.size();
        EXPECT_EQ(std::string(buf), mirror);
    }
    Tsd_StaticBuf tiny(0, 0); // non-positive sizes still grow
    tiny.cat("hello");
    EXPECT_STREQ(tiny, "hello");
    EXPECT_EQ(tiny.getLimit(), 6);
}

TEST(StaticBuf, ArgumentsPointingIntoTheBufferItselfAndStats) {
    Tsd_StaticBuf buf(8, 4);
    buf.copy("abcdef");
    buf.cat(buf.getBuffer()); // appending itself forces a reallocation
    EXPECT_STREQ(buf, "abcdefabcdef");
    buf.copy(buf.getBuffer() + 6);
    EXPECT_STREQ(buf, "abcdef");
    buf.cat(buf.getBuffer() + 4); // fits: moved within the block
    EXPECT_STREQ(buf, "abcdefef");
    Tsd_StaticBuf small(4, 4);
    small.copy("abc");
    small.copy(small.getBuffer() + 1);
    EXPECT_STREQ(small, "bc");

    MessageCapture capture;
    small.dumpStats();
    EXPECT_EQ(capture.sink.transcript(),
              "status: Tsd_StaticBuf::dumpStats()\nstatus:    current limit: 4\n"
              "status:    current size:  3\nstatus:    contents: bc\n"
              "status:    length validation: okay\nstatus:    limit validation: okay\n");
}

// Quoted: a first character that cannot begin a bare name, or a name that
// would not read back as itself (blanks, separators, quotes, member keywords).
TEST(AnnoName, QuotesOnlyNamesThatWouldNotReadBack) {
    const char* const cases[][2] = {
        {"clk", "clk"},
        {"$clk", "$clk"},
        {"<clk>", "<clk>"},
        {"/top", "/top"},
        {"9ns", "9ns"},
        {"&a", "&a"},
        {"_a", "_a"},
        {"-a", "-a"},
        {"/", "\"/\""},
        {"//x", "\"//x\""},
        {"*grp", "\"*grp\""},
        {".x", "\".x\""},
        {" lead", "\" lead\""},
        {"FFS(d*)", "FFS(d*)"},
        {"", "\"\""},
        {"a b", "\"a b\""},
        {"both ", "\"both \""},
        {"a\tb", "\"a\tb\""},
        {"a:b", "\"a:b\""},
        {"a=b", "\"a=b\""},
        {"a;b", "\"a;b\""},
        {"it's", "\"it's\""},
        {"\"q", "'\"q'"},
        {"a\"b'c", "\"a\"\"b'c\""},
        {"rising", "\"rising\""},
        {"EXCEPT", "\"EXCEPT\""},
        {"TRANSHI", "\"TRANSHI\""},
        {"RISING_1", "RISING_1"},
        {"FFS(\"x\")", "'FFS(\"x\")'"},
    };
    for (const auto& c : cases)
        EXPECT_STREQ(Tsd_Util::getAnnoName(c[0]), c[1]) << "name: " << c[0];
    EXPECT_STREQ(Tsd_Util::getAnnoName(nullptr), "\"\"");
    // The comparisons under every keyword test take a missing text as no match.
    EXPECT_TRUE(tsd_detail::equalsNoCase(nullptr, nullptr));
    EXPECT_FALSE(tsd_detail::equalsNoCase("a", nullptr) || tsd_detail::equalsNoCase(nullptr, "a"));
    EXPECT_FALSE(tsd_detail::startsWithNoCase(nullptr, "TS") ||
                 tsd_detail::startsWithNoCase("TS01", nullptr) ||
                 tsd_detail::startsWithNoCase("T", "TS"));
    EXPECT_TRUE(tsd_detail::startsWithNoCase("ts01", "TS"));
    // Valid until the next call, whatever the length.
    const char* first = Tsd_Util::getAnnoName("alpha");
    Tsd_Util::getAnnoName("*beta");
    EXPECT_STREQ(first, "\"*beta\"");
    std::string longName(100, 'n');
    EXPECT_EQ(std::string(Tsd_Util::getAnnoName(longName.c_str())), longName);
}

// Short texts live inside the string object and longer ones outside: both
// forms, and the border between them, survive copies, moves and a text set
// from a part of itself.
TEST(TsdString, BothFormsSurviveCopiesMovesAndSelfAssignment) {
    for (std::size_t length : {0, 1, 14, 15, 16, 17, 40}) {
        SCOPED_TRACE(length);
        const std::string text(length, 'a');
        Tsd_String original(text.c_str());
        EXPECT_EQ(original.get(), text);
        Tsd_String copy(original);
        EXPECT_EQ(copy.get(), text);
        Tsd_String moved(std::move(copy));
        EXPECT_EQ(moved.get(), text);
        EXPECT_TRUE(copy.isNull());
        Tsd_String assigned("x");
        assigned = std::move(moved);
        EXPECT_EQ(assigned.get(), text);
        const Tsd_String& same = assigned;
        assigned = same; // a copy onto itself keeps the text
        EXPECT_EQ(assigned.get(), text);
        if (length > 0) {
            assigned.set(assigned.get() + 1); // from inside its own text
            EXPECT_EQ(assigned.get(), text.substr(1));
        }
        assigned.set(nullptr);
        EXPECT_TRUE(assigned.isNull());
    }
}

// A list moved away from is empty in every respect, whatever it held, and
// can be used again.
TEST(BaseObjList, AMovedFromListIsEmptyAndUsable) {
    for (int size : {0, 1, 2, 40}) {
        SCOPED_TRACE(size);
        std::vector<Plain> objs(static_cast<std::size_t>(size) + 1);
        Tsd_BaseObjList from;
        for (int i = 0; i < size; ++i)
            from.addObj(&objs[static_cast<std::size_t>(i)]);
        if (size > 0) {
            EXPECT_TRUE(from.contains(&objs[0])); // builds the index
        }
        Tsd_BaseObjList to(std::move(from));
        EXPECT_EQ(to.getCount(), size);
        EXPECT_EQ(from.getCount(), 0);
        EXPECT_TRUE(from.isEmpty());
        for (int i = 0; i < size; ++i) {
            EXPECT_FALSE(from.contains(&objs[static_cast<std::size_t>(i)]));
            EXPECT_TRUE(to.contains(&objs[static_cast<std::size_t>(i)]));
        }
        from.addObj(&objs.back());
        EXPECT_TRUE(from.contains(&objs.back()));
        EXPECT_EQ(from.getCount(), 1);
        Tsd_BaseObjList assigned;
        assigned = std::move(to);
        EXPECT_EQ(assigned.getCount(), size);
        EXPECT_TRUE(to.isEmpty());
    }
}
