// Memory of the tool's large, simple structures: buffers written once from
// end to end (file texts, records, the product) and the small blocks of
// which a design holds one per reference line.
#pragma once

#include <cstddef>
#include <memory>
#include <vector>

namespace tsd_cli {

// On Linux, offers [data, data + size) large pages, which spares one page
// fault per 4 KiB; does nothing where it does not apply.
void adviseLargePages(const void* data, std::size_t size);

// Readies the general heap for about `expected` bytes of small objects,
// which the design's objects and indexes are: on Linux with the GNU C
// library, the heap grows once by that much and offers it large pages,
// since a page fault per 4 KiB costs a large design a quarter of its time
// or more. Does nothing below 16 MiB (an input below a megabyte), after the
// first call, under AddressSanitizer (which has its own heap) and where it
// does not apply.
void prepareHeap(std::size_t expected);

// Reserves room for `count` elements of `buffer` (a std::vector or
// std::string) and offers it large pages.
template <class Buffer>
void reserveLarge(Buffer& buffer, std::size_t count) {
    buffer.reserve(count);
    adviseLargePages(buffer.data(), buffer.capacity() * sizeof(*buffer.data()));
}

// Blocks of one size, for objects aligned no more strictly than a pointer,
// carved from large slabs and reused through a free list: no per-block
// header, and no cost in the general heap for a block that comes and goes.
// Slabs are returned when the pool goes. Under AddressSanitizer a block
// that is not handed out is poisoned.
class BlockPool {
public:
    explicit BlockPool(std::size_t blockSize);
    ~BlockPool();
    BlockPool(const BlockPool&) = delete;
    BlockPool& operator=(const BlockPool&) = delete;

    std::size_t blockSize() const { return m_blockSize; }
    void* allocate();
    void release(void* block);

private:
    static std::byte* newSlab();
    struct FreeSlab {
        void operator()(std::byte* slab) const;
    };

    std::size_t m_blockSize;
    std::vector<std::unique_ptr<std::byte[], FreeSlab>> m_slabs;
    std::byte* m_next = nullptr; // the unused rest of the last slab
    std::byte* m_end = nullptr;
    void* m_free = nullptr; // released blocks, each holding the next
};

} // namespace tsd_cli
