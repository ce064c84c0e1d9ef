// Visiting each distinct pointer of a sequence once, at its first place.
#pragma once

#include <algorithm>
#include <cstdint>
#include <functional>
#include <unordered_set>
#include <vector>

namespace tsd_detail {

// Sorts addresses by their bits, eleven at a time and only the bits that
// differ: a few linear passes where a comparison sort of a million objects'
// addresses would take twenty.
inline void sortAddresses(std::vector<std::uintptr_t>& keys) {
    if (keys.size() < 1024) {
        std::sort(keys.begin(), keys.end());
        return;
    }
    std::uintptr_t differ = 0;
    for (std::uintptr_t key : keys)
        differ |= key ^ keys[0];
    constexpr int kDigit = 11;
    constexpr std::size_t kBuckets = std::size_t(1) << kDigit;
    std::vector<std::uintptr_t> other(keys.size());
    std::vector<std::size_t> start(kBuckets + 1);
    for (int shift = 0; shift < 64 && (differ >> shift) != 0; shift += kDigit) {
        std::fill(start.begin(), start.end(), 0);
        for (std::uintptr_t key : keys)
            ++start[((key >> shift) & (kBuckets - 1)) + 1];
        for (std::size_t b = 1; b <= kBuckets; ++b)
            start[b] += start[b - 1];
        for (std::uintptr_t key : keys)
            other[start[(key >> shift) & (kBuckets - 1)]++] = key;
        keys.swap(other);
    }
}

// Tells, pointer by pointer in the order of `items`, whether a pointer is
// met for the first time. Sequences without repeats (the usual case) cost a
// sort of their addresses; only pointers that do repeat are remembered.
template <class T>
class FirstSeen {
public:
    explicit FirstSeen(const std::vector<T*>& items) {
        std::vector<std::uintptr_t> sorted(items.size());
        for (std::size_t i = 0; i < items.size(); ++i)
            sorted[i] = reinterpret_cast<std::uintptr_t>(items[i]);
        sortAddresses(sorted);
        for (std::size_t i = 1; i < sorted.size(); ++i)
            if (sorted[i] == sorted[i - 1])
                m_repeated.insert(reinterpret_cast<T*>(sorted[i]));
    }

    bool operator()(T* p) {
        return m_repeated.empty() || m_repeated.count(p) == 0 || m_seen.insert(p).second;
    }

private:
    std::unordered_set<T*> m_repeated;
    std::unordered_set<T*> m_seen;
};

} // namespace tsd_detail
