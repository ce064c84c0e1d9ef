// A set of addresses kept flat in memory, for walks over large designs where
// a node per element would cost more than the walk.
#pragma once

#include "tsd/Tsd_BaseObj.h"

namespace tsd_detail {

class PointerSet {
public:
    bool contains(const void* p) const { return m_index.first(p) >= 0; }
    void insert(const void* p) {
        if (!contains(p))
            m_index.add(p, 0);
    }
    void erase(const void* p) { m_index.remove(p, 0); }

private:
    Tsd_SlotIndex m_index; // every address held is recorded at slot 0
};

} // namespace tsd_detail
