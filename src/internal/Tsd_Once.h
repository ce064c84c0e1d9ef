// Visiting each distinct pointer of a sequence once, at its first place.
#pragma once

#include <algorithm>
#include <functional>
#include <unordered_set>
#include <vector>

namespace tsd_detail {

// Calls visit(p) for each distinct pointer of `items`, in the order of first
// occurrence. Sequences without repeats (the usual case) cost a sort of
// their addresses; only pointers that do repeat are remembered.
template <class T, class Visit>
void forEachOnce(const std::vector<T*>& items, Visit visit) {
    std::vector<T*> sorted(items);
    std::sort(sorted.begin(), sorted.end(), std::less<T*>());
    std::unordered_set<T*> repeated;
    for (std::size_t i = 1; i < sorted.size(); ++i)
        if (sorted[i] == sorted[i - 1])
            repeated.insert(sorted[i]);
    sorted.clear();
    sorted.shrink_to_fit();
    std::unordered_set<T*> visited;
    for (T* p : items) {
        if (!repeated.empty() && repeated.count(p) != 0 && !visited.insert(p).second)
            continue;
        visit(p);
    }
}

} // namespace tsd_detail
