// The properties a builder stores until the build: their texts packed in
// large blocks rather than two allocations each, released block by block
// as the build consumes them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

namespace tsd_detail {

class StoredProps {
public:
    struct Prop {
        const char* name;
        const char* value;
    };

    // Copies both texts (neither null).
    void add(const char* name, const char* value);
    std::size_t size() const { return m_props.size(); }
    Prop at(std::size_t i) const;
    // Frees the texts of the properties before `i`; they must not be read
    // again.
    void releaseBefore(std::size_t i);

private:
    struct Block {
        std::unique_ptr<char[]> text;
        std::size_t size;
    };

    // Each property's name, its value right after it in the same block.
    std::vector<const char*> m_props;
    std::vector<Block> m_blocks;
    std::size_t m_released = 0; // blocks before it are freed
    std::size_t m_used = 0;     // bytes taken in the last block
};

} // namespace tsd_detail
