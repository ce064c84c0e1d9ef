#include "internal/Tsd_StoredProps.h"

#include <cstring>
#include <functional>

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
    if (m_blocks.empty() || m_blocks.back().size - m_used < need) {
        // A long property gets a block of its own size. The text is written
        // at once, so the block is not cleared first.
        const std::size_t size = need > kBlockSize ? need : kBlockSize;
        m_blocks.push_back(Block{std::unique_ptr<char[]>(new char[size]), size});
        m_used = 0;
    }
    char* text = m_blocks.back().text.get() + m_used;
    std::memcpy(text, name, nameSize);
    std::memcpy(text + nameSize, value, valueSize);
    m_used += need;
    m_props.push_back(text);
}

StoredProps::Prop StoredProps::at(std::size_t i) const {
    const char* name = m_props[i];
    return Prop{name, name + std::strlen(name) + 1};
}

void StoredProps::releaseBefore(std::size_t i) {
    // The last block stays: more properties may yet be added to it. The
    // others go once the next property to be read stands past them.
    const char* next = i < m_props.size() ? m_props[i] : nullptr;
    auto holds = [](const Block& block, const char* p) {
        return !std::less<const char*>()(p, block.text.get()) &&
               std::less<const char*>()(p, block.text.get() + block.size);
    };
    while (m_released + 1 < m_blocks.size() &&
           (next == nullptr || !holds(m_blocks[m_released], next))) {
        m_blocks[m_released].text.reset();
        ++m_released;
    }
}

} // namespace tsd_detail
