#include "TsdTestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

using tsd_test::NamedRef;

namespace {

// Plain objects to put in object lists.
class Plain : public Tsd_BaseObj {};

std::vector<Tsd_Ref*> walk(const Tsd_RefList& list) {
    std::vector<Tsd_Ref*> out;
    Tsd_RefListIter iter(&list);
    while (Tsd_Ref* r = iter.next())
        out.push_back(r);
    return out;
}

} // namespace

TEST(RefList, AddRemoveAndHoles) {
    NamedRef a("a"), b("b");
    Tsd_RefList list(2);
    EXPECT_FALSE(list.addRef(nullptr));
    EXPECT_EQ(list.getCount(), 0);
    EXPECT_TRUE(list.isEmpty());
    EXPECT_FALSE(list.removeRef(&a)); // no slots at all

    EXPECT_TRUE(list.addRef(&a));
    EXPECT_TRUE(list.addRef(&a)); // duplicates are stored
    EXPECT_TRUE(list.addRef(&b)); // grows past the initial capacity
    EXPECT_EQ(list.getCount(), 3);

    EXPECT_TRUE(list.removeRef(&a)); // first occurrence only
    EXPECT_EQ(list.getCount(), 3);   // removal leaves a hole
    EXPECT_EQ(list.getAt(0), nullptr);
    EXPECT_EQ(list.getAt(1), &a);
    EXPECT_FALSE(list.isEmpty());
    EXPECT_EQ(walk(list), (std::vector<Tsd_Ref*>{&a, &b}));

    EXPECT_TRUE(list.removeRef(&a));
    EXPECT_TRUE(list.removeRef(&b));
    EXPECT_FALSE(list.removeRef(&b));
    EXPECT_TRUE(list.isEmpty());           // every slot cleared, count still 3
    EXPECT_FALSE(list.removeRef(nullptr)); // a hole is not a reference
    EXPECT_EQ(list.getCount(), 3);
    list.emptyList();
    EXPECT_EQ(list.getCount(), 0);
}

TEST(RefList, GetSingleRef) {
    NamedRef a("a"), b("b");
    Tsd_RefList list;
    EXPECT_EQ(list.getSingleRef(), nullptr);
    list.addRef(&a);
    list.addRef(&b);
    EXPECT_EQ(list.getSingleRef(), nullptr); // [A, B]
    list.removeRef(&b);
    EXPECT_EQ(list.getSingleRef(), &a); // [A, null]
    list.emptyList();
    list.addRef(&a);
    list.addRef(&a);
    EXPECT_EQ(list.getSingleRef(), nullptr); // [A, A]: two slots, same pointer
    list.emptyList();
    list.append(nullptr);
    list.addRef(&a);
    list.append(nullptr);
    EXPECT_EQ(list.getSingleRef(), &a); // [null, A, null]
}

TEST(RefList, DeleteAllRefsDestroysEachReferenceOnce) {
    int destroyed = 0;
    auto* a = new NamedRef("a", &destroyed);
    auto* b = new NamedRef("b", &destroyed);
    Tsd_RefList list;
    list.addRef(a);
    list.addRef(b);
    list.addRef(a); // added twice by hand
    list.deleteAllRefs();
    EXPECT_EQ(destroyed, 2);
    EXPECT_EQ(list.getCount(), 0);
}

TEST(BaseObjList, WalkSkipsHolesAndSurvivesRemovalDuringTheWalk) {
    Plain o[5];
    Tsd_BaseObjList list(1);
    for (Plain& p : o)
        list.addObj(&p);
    EXPECT_FALSE(list.addObj(nullptr));
    EXPECT_TRUE(list.contains(&o[2]));
    EXPECT_FALSE(list.contains(nullptr));

    // Remove the element just returned, and one further ahead, while walking.
    std::vector<Tsd_BaseObj*> seen;
    Tsd_BaseObjListIter iter(&list);
    while (Tsd_BaseObj* obj = iter.next()) {
        seen.push_back(obj);
        if (obj == &o[1]) {
            EXPECT_TRUE(list.removeObj(obj));
            EXPECT_TRUE(list.removeObj(&o[3]));
        }
    }
    EXPECT_EQ(seen, (std::vector<Tsd_BaseObj*>{&o[0], &o[1], &o[2], &o[4]}));
    EXPECT_FALSE(list.contains(&o[3]));
    EXPECT_FALSE(list.removeObj(nullptr)); // holes are not objects

    // A second walk sees what is left, in insertion order.
    seen.clear();
    Tsd_BaseObjListIter again(&list);
    while (Tsd_BaseObj* obj = again.next())
        seen.push_back(obj);
    EXPECT_EQ(seen, (std::vector<Tsd_BaseObj*>{&o[0], &o[2], &o[4]}));
}

TEST(BaseObjList, EntriesAppendedDuringAWalkAreVisited) {
    Plain a, b, c;
    Tsd_BaseObjList list;
    list.addObj(&a);
    std::vector<Tsd_BaseObj*> seen;
    Tsd_BaseObjListIter iter(&list);
    while (Tsd_BaseObj* obj = iter.next()) {
        seen.push_back(obj);
        if (obj == &a)
            list.addObj(&b);
        if (obj == &b)
            list.addObj(&c);
    }
    EXPECT_EQ(seen, (std::vector<Tsd_BaseObj*>{&a, &b, &c}));
    // An exhausted iterator stays exhausted until something is appended.
    EXPECT_EQ(iter.next(), nullptr);
}

TEST(BaseObjList, NullListsAndEmptyListsYieldNothing) {
    Tsd_BaseObjListIter none(nullptr);
    EXPECT_EQ(none.next(), nullptr);
    Tsd_RefListIter noRefs(static_cast<const Tsd_RefList*>(nullptr));
    EXPECT_EQ(noRefs.next(), nullptr);
    Plain notAHolder;
    Tsd_RefListIter fromNonHolder(&notAHolder);
    EXPECT_EQ(fromNonHolder.next(), nullptr);
    Tsd_BaseObjList list;
    EXPECT_TRUE(list.isEmpty());
    EXPECT_FALSE(list.removeObj(&notAHolder));
}

TEST(DArray, ResetKeepsNothingAndRemoveAtShiftsLaterSlots) {
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
