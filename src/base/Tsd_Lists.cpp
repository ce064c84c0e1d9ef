// Reference lists, object lists and their iterators.
#include "tsd/Tsd_BaseObj.h"

#include "internal/Tsd_Once.h"

#include <cstdint>
#include <cstring>
#include <vector>

namespace {

std::size_t hashPointer(const void* p, std::size_t mask) {
    // Fibonacci hashing of the address; the low bits are alignment.
    auto bits = static_cast<std::uint64_t>(reinterpret_cast<std::uintptr_t>(p));
    return static_cast<std::size_t>((bits * 0x9E3779B97F4A7C15ull) >> 20) & mask;
}

// The next non-null slot at or after index, which moves past it.
template <class T>
T* nextSlot(const Tsd_DArray<T>* array, std::int32_t& index) {
    if (array == nullptr)
        return nullptr;
    // The count is read anew on every call: entries appended during a walk
    // are visited, and cleared ones are skipped.
    while (index < array->getCount()) {
        T* p = array->getAt(index++);
        if (p != nullptr)
            return p;
    }
    return nullptr;
}

} // namespace

bool Tsd_RefList::addRef(Tsd_Ref* ref) {
    if (ref == nullptr)
        return false;
    append(ref);
    return true;
}

bool Tsd_RefList::removeRef(Tsd_Ref* ref) {
    // Null is never held: it must not "remove" a hole.
    int slot = firstSlotOf(ref);
    if (slot < 0)
        return false;
    setAt(slot, nullptr);
    return true;
}

bool Tsd_RefList::isEmpty() const {
    return getLiveCount() == 0;
}

Tsd_Ref* Tsd_RefList::getSingleRef() const {
    if (getLiveCount() != 1)
        return nullptr;
    Tsd_Ref* single = nullptr;
    for (int i = 0; i < getCount(); ++i) {
        Tsd_Ref* p = getAt(i);
        if (p == nullptr)
            continue;
        if (single != nullptr)
            return nullptr;
        single = p;
    }
    return single;
}

void Tsd_RefList::emptyList() {
    reset(0);
}

void Tsd_RefList::deleteAllRefs() {
    // A reference added twice by hand is destroyed once, at its first slot.
    std::vector<Tsd_Ref*> refs;
    refs.reserve(static_cast<std::size_t>(getLiveCount()));
    for (int i = 0; i < getCount(); ++i)
        if (Tsd_Ref* ref = getAt(i))
            refs.push_back(ref);
    tsd_detail::FirstSeen<Tsd_Ref> firstSeen(refs);
    for (int i = 0; i < getCount(); ++i) {
        Tsd_Ref* ref = getAt(i);
        if (ref == nullptr)
            continue;
        setAt(i, nullptr);
        if (firstSeen(ref))
            delete ref;
    }
    reset(0);
}

bool Tsd_BaseObjList::addObj(Tsd_BaseObj* obj) {
    if (obj == nullptr)
        return false;
    append(obj);
    return true;
}

bool Tsd_BaseObjList::removeObj(Tsd_BaseObj* obj) {
    int slot = firstSlotOf(obj);
    if (slot < 0)
        return false;
    setAt(slot, nullptr);
    return true;
}

bool Tsd_BaseObjList::isEmpty() const {
    return getLiveCount() == 0;
}

void Tsd_BaseObjList::emptyList() {
    reset(0);
}

bool Tsd_BaseObjList::contains(const Tsd_BaseObj* obj) const {
    return firstSlotOf(obj) >= 0;
}

Tsd_RefListIter::Tsd_RefListIter(Tsd_BaseObj* holder)
    : m_list(holder != nullptr ? holder->getRefList() : nullptr), m_index(0) {}

Tsd_Ref* Tsd_RefListIter::next() {
    return nextSlot(m_list, m_index);
}

Tsd_BaseObj* Tsd_BaseObjListIter::next() {
    return nextSlot(m_list, m_index);
}

// --- Tsd_SlotIndex ---------------------------------------------------------

std::size_t Tsd_SlotIndex::probe(const void* p) const {
    const std::size_t mask = m_table.size() - 1;
    std::size_t i = hashPointer(p, mask);
    while (m_table[i].key != nullptr && m_table[i].key != p)
        i = (i + 1) & mask;
    return i;
}

void Tsd_SlotIndex::rehash(std::size_t size) {
    std::vector<Entry> old;
    old.swap(m_table);
    m_table.assign(size, Entry{nullptr, -1, 0});
    for (const Entry& entry : old)
        if (entry.key != nullptr)
            m_table[probe(entry.key)] = entry;
}

void Tsd_SlotIndex::reserve(std::size_t n) {
    std::size_t size = 64;
    while (size < 2 * (n + 1))
        size *= 2;
    if (size > m_table.size())
        rehash(size);
}

void Tsd_SlotIndex::add(const void* p, std::int32_t slot) {
    // At most half full, so probes stay short.
    if (2 * (m_used + 1) > m_table.size())
        rehash(m_table.empty() ? 64 : m_table.size() * 2);
    Entry& entry = m_table[probe(p)];
    if (entry.key == nullptr) {
        entry = Entry{p, slot, 1};
        ++m_used;
        return;
    }
    ++entry.count;
    if (slot < entry.first)
        entry.first = slot;
}

bool Tsd_SlotIndex::remove(const void* p, std::int32_t slot) {
    if (m_table.empty())
        return false;
    const std::size_t mask = m_table.size() - 1;
    std::size_t i = probe(p);
    Entry& entry = m_table[i];
    if (entry.key == nullptr)
        return false;
    if (--entry.count > 0)
        return entry.first == slot;
    // Backward-shift deletion keeps every other key reachable from its home.
    --m_used;
    std::size_t hole = i;
    for (std::size_t j = (i + 1) & mask; m_table[j].key != nullptr; j = (j + 1) & mask) {
        std::size_t home = hashPointer(m_table[j].key, mask);
        // Move entry j into the hole unless its home lies cyclically in
        // (hole, j].
        bool stays = hole <= j ? (hole < home && home <= j) : (hole < home || home <= j);
        if (!stays) {
            m_table[hole] = m_table[j];
            hole = j;
        }
    }
    m_table[hole] = Entry{nullptr, -1, 0};
    return false;
}

void Tsd_SlotIndex::setFirst(const void* p, std::int32_t slot) {
    Entry& entry = m_table[probe(p)];
    if (entry.key != nullptr)
        entry.first = slot;
}

std::int32_t Tsd_SlotIndex::first(const void* p) const {
    if (m_table.empty())
        return -1;
    const Entry& entry = m_table[probe(p)];
    return entry.key != nullptr ? entry.first : -1;
}

void Tsd_String::set(const char* text) {
    // The old text goes last: `text` may point into it.
    char* old = onHeap() ? heap() : nullptr;
    if (text == nullptr) {
        setNull();
    } else {
        const std::size_t n = std::strlen(text);
        if (n <= kHeld) {
            std::memmove(m_bytes, text, n);
            std::memset(m_bytes + n, 0, sizeof m_bytes - n);
        } else {
            auto* copy = new char[n + 1];
            std::memcpy(copy, text, n + 1);
            setHeap(copy);
        }
    }
    delete[] old;
}
