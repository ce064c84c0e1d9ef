#include "internal/Tsd_StoredProps.h"

#include <cstring>

namespace tsd_detail {

namespace {

// Large enough that the allocations stay few, small enough that a freed
// block is soon used again by the objects the build makes.
constexpr std::size_t kBlockSize = std::size_t(1) << 16;

} // namespace

void StoredProps::add(const char* name, const char* value) {
    const std::size_t nameSize = std::strlen(name) + 1;
    const std::size_t valueSize = std::strlen(value) + 1;
    const std::size_t need = nameSize + valueSize;
    if (m_blocks.empty() || m_room - m_used < need) {
        // A long property gets a block of its own size.
        m_room = need > kBlockSize ? need : kBlockSize;
        m_blocks.push_back(std::make_unique<char[]>(m_room));
        m_used = 0;
    }
    char* text = m_blocks.back().get() + m_used;
    std::memcpy(text, name, nameSize);
    std::memcpy(text + nameSize, value, valueSize);
    m_used += need;
    m_props.push_back(Entry{Prop{text, text + nameSize}, m_blocks.size() - 1});
}

void StoredProps::releaseBefore(std::size_t i) {
    if (m_blocks.empty())
        return;
    // The last block stays: more properties may yet be added to it.
    const std::size_t end = i < m_props.size() ? m_props[i].block : m_blocks.size() - 1;
    for (; m_released < end; ++m_released)
        m_blocks[m_released].reset();
}

} // namespace tsd_detail
