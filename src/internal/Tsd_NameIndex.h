// Finding the first element of an object list by name without walking it.
#pragma once

#include "tsd/Tsd_BaseObj.h"

#include <cstdint>
#include <vector>

namespace tsd_detail {

// A library-wide count of name and TSid changes: an index by name is rebuilt
// when it moved since the index was last brought up to date.
std::uint64_t nameChanges();
void noteNameChange();

// The first slot of a list whose element has a given key (a group's name, a
// spec's TSid), as a walk of the list in order would find it.
//
// The index catches up lazily: slots appended since the last lookup are
// indexed on the next one, and slots cleared since are skipped when met. Any
// other change of the list, and any name change anywhere, makes it start
// over, so a lookup is never wrong, only slower after such changes.
class NameIndex {
public:
    // The key of an element, or null when it has none (it never matches).
    // Sets `foreign` for an element that is not of the list's class.
    using KeyOf = const char* (*)(Tsd_BaseObj* obj, bool& foreign);

    explicit NameIndex(KeyOf keyOf) : m_keyOf(keyOf) {}

    struct Hit {
        int slot = -1;              // the first slot whose key equals, or -1
        bool foreignBefore = false; // a foreign element stands before it
    };
    // A null key matches nothing.
    Hit find(const Tsd_BaseObjList& list, const char* key);

    // Changes whenever the list changes other than by appending or by
    // clearing a slot: while it stays, a slot found holds what it held.
    static std::uint32_t shapeOf(const Tsd_BaseObjList& list) { return list.getShape(); }

private:
    struct Bucket {
        std::uint32_t hash;
        std::int32_t head; // first slot of the chain; kFree or kGone when none
    };
    static constexpr std::int32_t kFree = -2; // never used
    static constexpr std::int32_t kGone = -1; // its slots were all cleared

    void catchUp(const Tsd_BaseObjList& list);
    void insert(const Tsd_BaseObjList& list, std::int32_t slot, const char* key);
    // Skips the cleared slots at the head of a chain; false when none is left.
    bool liveHead(const Tsd_BaseObjList& list, Bucket& bucket);
    bool headMatches(const Tsd_BaseObjList& list, const Bucket& bucket, const char* key) const;
    void rehash(const Tsd_BaseObjList& list);

    KeyOf m_keyOf;
    bool m_built = false;
    std::uint32_t m_shape = 0;
    std::uint64_t m_changes = 0;
    std::vector<Bucket> m_table;         // open addressing, power-of-two size
    std::size_t m_taken = 0;             // buckets not kFree
    std::vector<std::int32_t> m_next;    // per slot: the next slot of its chain
    std::vector<std::int32_t> m_tail;    // per chain head: the last slot of the chain
    std::vector<std::int32_t> m_foreign; // slots of foreign elements, ascending
    std::size_t m_foreignHead = 0;       // the ones before it were cleared
};

} // namespace tsd_detail
