// Visiting each distinct pointer of a sequence once, at its first place.
#pragma once

#include <algorithm>
#include <functional>
#include <unordered_set>
#include <vector>

namespace tsd_detail {

// Tells, pointer by pointer in the order of `items`, whether a pointer is
// met for the first time. Sequences without repeats (the usual case) cost a
// sort of their addresses; only pointers that do repeat are remembered.
template <class T>
class FirstSeen {
public:
    explicit FirstSeen(const std::vector<T*>& items) {
        std::vector<T*> sorted(items);
        std::sort(sorted.begin(), sorted.end(), std::less<T*>());
        for (std::size_t i = 1; i < sorted.size(); ++i)
            if (sorted[i] == sorted[i - 1])
                m_repeated.insert(sorted[i]);
    }

    bool operator()(T* p) {
        return m_repeated.empty() || m_repeated.count(p) == 0 || m_seen.insert(p).second;
    }

private:
    std::unordered_set<T*> m_repeated;
    std::unordered_set<T*> m_seen;
};

} // namespace tsd_detail
