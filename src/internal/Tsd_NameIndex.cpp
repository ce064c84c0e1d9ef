#include "internal/Tsd_NameIndex.h"

#include <cstring>
#include <functional>
#include <string_view>

namespace tsd_detail {

namespace {

std::uint64_t g_nameChanges = 0;

std::uint32_t hashKey(const char* key) {
    auto h = static_cast<std::uint64_t>(std::hash<std::string_view>()(std::string_view(key)));
    return static_cast<std::uint32_t>(h ^ (h >> 32));
}

} // namespace

std::uint64_t nameChanges() {
    return g_nameChanges;
}

void noteNameChange() {
    ++g_nameChanges;
}

bool NameIndex::liveHead(const Tsd_BaseObjList& list, Bucket& bucket) {
    // Most heads were never cleared: the chain's tail is not even read.
    if (list.getAt(bucket.head) != nullptr)
        return true;
    const std::int32_t tail = m_tail[static_cast<std::size_t>(bucket.head)];
    while (bucket.head >= 0 && list.getAt(bucket.head) == nullptr)
        bucket.head = m_next[static_cast<std::size_t>(bucket.head)];
    if (bucket.head >= 0) {
        m_tail[static_cast<std::size_t>(bucket.head)] = tail;
        return true;
    }
    bucket.head = kGone;
    return false;
}

bool NameIndex::headMatches(const Tsd_BaseObjList& list, const Bucket& bucket,
                            const char* key) const {
    bool foreign = false;
    const char* name = m_keyOf(list.getAt(bucket.head), foreign);
    return name != nullptr && std::strcmp(name, key) == 0;
}

void NameIndex::rehash(const Tsd_BaseObjList& list) {
    // Sized for the keys still held: buckets whose slots were all cleared
    // are dropped here, so a list that keeps clearing and appending (as the
    // placeholders of forward references do) does not grow its table.
    // A bucket's head is only known to be cleared once a probe meets it:
    // when far more buckets claim a key than the list holds pointers, the
    // heads are looked at first.
    std::size_t live = 1;
    for (const Bucket& bucket : m_table)
        live += bucket.head >= 0 ? 1 : 0;
    if (live > 2 * static_cast<std::size_t>(list.getLiveCount()) + 1) {
        live = 1;
        for (Bucket& bucket : m_table)
            live += bucket.head >= 0 && liveHead(list, bucket) ? 1 : 0;
    }
    std::size_t size = 16;
    while (size < 2 * live)
        size *= 2;
    std::vector<Bucket> old;
    old.swap(m_table);
    m_table.assign(size, Bucket{0, kFree});
    m_taken = 0;
    const std::size_t mask = size - 1;
    for (const Bucket& bucket : old) {
        if (bucket.head < 0)
            continue;
        std::size_t i = bucket.hash & mask;
        while (m_table[i].head != kFree)
            i = (i + 1) & mask;
        m_table[i] = bucket;
        ++m_taken;
    }
}

void NameIndex::insert(const Tsd_BaseObjList& list, std::int32_t slot, const char* key) {
    // At most seven buckets in ten taken, counting those whose slots are
    // gone: a small table misses the caches less.
    if (10 * (m_taken + 1) > 7 * m_table.size())
        rehash(list);
    const std::uint32_t hash = hashKey(key);
    const std::size_t mask = m_table.size() - 1;
    std::size_t i = hash & mask;
    for (; m_table[i].head != kFree; i = (i + 1) & mask) {
        Bucket& bucket = m_table[i];
        if (bucket.hash == hash && bucket.head >= 0 && liveHead(list, bucket) &&
            headMatches(list, bucket, key)) {
            std::int32_t& tail = m_tail[static_cast<std::size_t>(bucket.head)];
            m_next[static_cast<std::size_t>(tail)] = slot;
            tail = slot;
            return;
        }
    }
    m_table[i] = Bucket{hash, slot};
    m_tail[static_cast<std::size_t>(slot)] = slot;
    ++m_taken;
}

void NameIndex::catchUp(const Tsd_BaseObjList& list) {
    if (!m_built || list.getShape() != m_shape || nameChanges() != m_changes) {
        m_built = true;
        m_shape = list.getShape();
        m_changes = nameChanges();
        m_table.clear();
        m_taken = 0;
        m_next.clear();
        m_tail.clear();
        m_foreign.clear();
        m_foreignHead = 0;
    }
    for (auto slot = static_cast<std::int32_t>(m_next.size()); slot < list.getCount(); ++slot) {
        m_next.push_back(-1);
        m_tail.push_back(-1);
        Tsd_BaseObj* obj = list.getAt(slot);
        if (obj == nullptr)
            continue;
        bool foreign = false;
        const char* key = m_keyOf(obj, foreign);
        if (foreign)
            m_foreign.push_back(slot);
        else if (key != nullptr)
            insert(list, slot, key);
    }
}

NameIndex::Hit NameIndex::find(const Tsd_BaseObjList& list, const char* key) {
    catchUp(list);
    while (m_foreignHead < m_foreign.size() && list.getAt(m_foreign[m_foreignHead]) == nullptr)
        ++m_foreignHead;
    const bool anyForeign = m_foreignHead < m_foreign.size();
    Hit hit;
    if (key != nullptr && !m_table.empty()) {
        const std::uint32_t hash = hashKey(key);
        const std::size_t mask = m_table.size() - 1;
        for (std::size_t i = hash & mask; m_table[i].head != kFree; i = (i + 1) & mask) {
            Bucket& bucket = m_table[i];
            if (bucket.hash == hash && bucket.head >= 0 && liveHead(list, bucket) &&
                headMatches(list, bucket, key)) {
                hit.slot = bucket.head;
                break;
            }
        }
    }
    hit.foreignBefore = anyForeign && (hit.slot < 0 || m_foreign[m_foreignHead] < hit.slot);
    return hit;
}

} // namespace tsd_detail
