#include "Pages.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <new>

#ifdef __linux__
#include <sys/mman.h>
#include <unistd.h>
#endif
#ifdef __GLIBC__
#include <malloc.h>
#endif
#include <climits>

#if defined(__has_feature)
#if __has_feature(address_sanitizer)
#define TSD_POOL_POISON 1
#endif
#endif
#if defined(__SANITIZE_ADDRESS__)
#define TSD_POOL_POISON 1
#endif
#ifdef TSD_POOL_POISON
#include <sanitizer/asan_interface.h>
#endif

namespace tsd_cli {

namespace {

constexpr std::size_t kLargePage = std::size_t(1) << 21;

void poison(void* data, std::size_t size) {
#ifdef TSD_POOL_POISON
    ASAN_POISON_MEMORY_REGION(data, size);
#else
    (void)data;
    (void)size;
#endif
}

void unpoison(void* data, std::size_t size) {
#ifdef TSD_POOL_POISON
    ASAN_UNPOISON_MEMORY_REGION(data, size);
#else
    (void)data;
    (void)size;
#endif
}

} // namespace

void adviseLargePages(const void* data, std::size_t size) {
#if defined(__linux__) && defined(MADV_HUGEPAGE)
    auto begin = (reinterpret_cast<std::uintptr_t>(data) + kLargePage - 1) & ~(kLargePage - 1);
    auto end = (reinterpret_cast<std::uintptr_t>(data) + size) & ~(kLargePage - 1);
    if (end > begin)
        madvise(reinterpret_cast<void*>(begin), end - begin,
                MADV_HUGEPAGE); // a hint: failure is fine
#else
    (void)data;
    (void)size;
#endif
}

void prepareHeap(std::size_t expected) {
#if defined(__linux__) && defined(__GLIBC__) && defined(MADV_HUGEPAGE) && !defined(TSD_POOL_POISON)
    constexpr std::size_t kWorthIt = std::size_t(16) << 20;
    constexpr std::size_t kMost = std::size_t(1) << 30; // the pad is an int
    static bool prepared = false;
    if (prepared || expected < kWorthIt)
        return;
    prepared = true;
    expected = std::min(expected, kMost);
    // Blocks of up to 32 MiB (growing vectors, index tables) come from the
    // heap too, and what is freed at its top stays: a heap that shrank
    // would grow back without the advice.
    mallopt(M_MMAP_THRESHOLD, 32 << 20);
    mallopt(M_TRIM_THRESHOLD, INT_MAX);
    mallopt(M_TOP_PAD, static_cast<int>(expected));
    // A block larger than the free top makes the heap grow, padded by the
    // expectation, in one step.
    void* probe = std::malloc(std::size_t(4) << 20);
    void* end = sbrk(0);
    if (probe != nullptr && end != reinterpret_cast<void*>(-1) && end > probe)
        adviseLargePages(probe, static_cast<std::size_t>(static_cast<std::byte*>(end) -
                                                         static_cast<std::byte*>(probe)));
    std::free(probe);
    mallopt(M_TOP_PAD, 8 << 20);
#else
    (void)expected;
#endif
}

BlockPool::BlockPool(std::size_t blockSize)
    : m_blockSize(std::max((blockSize + alignof(void*) - 1) / alignof(void*) * alignof(void*),
                           sizeof(void*))) {}

BlockPool::~BlockPool() {
    for (auto& slab : m_slabs)
        unpoison(slab.get(), kLargePage);
}

// A slab is one large page, aligned so that it can be one. On Linux it is
// mapped apart from the heap: carved from the heap, its alignment would
// leave gaps that large pages make resident.
std::byte* BlockPool::newSlab() {
#ifdef __linux__
    void* mapped =
        mmap(nullptr, 2 * kLargePage, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (mapped == MAP_FAILED)
        throw std::bad_alloc();
    auto* begin = static_cast<std::byte*>(mapped);
    auto* slab = reinterpret_cast<std::byte*>(
        (reinterpret_cast<std::uintptr_t>(begin) + kLargePage - 1) & ~(kLargePage - 1));
    if (slab != begin)
        munmap(begin, static_cast<std::size_t>(slab - begin));
    munmap(slab + kLargePage, static_cast<std::size_t>(begin + 2 * kLargePage - slab) - kLargePage);
#else
    auto* slab = static_cast<std::byte*>(std::aligned_alloc(kLargePage, kLargePage));
    if (slab == nullptr)
        throw std::bad_alloc();
#endif
    return slab;
}

void BlockPool::FreeSlab::operator()(std::byte* slab) const {
#ifdef __linux__
    munmap(slab, kLargePage);
#else
    std::free(slab);
#endif
}

void* BlockPool::allocate() {
    if (m_free != nullptr) {
        void* block = m_free;
        unpoison(block, m_blockSize);
        m_free = *static_cast<void**>(block);
        return block;
    }
    if (static_cast<std::size_t>(m_end - m_next) < m_blockSize) {
        std::unique_ptr<std::byte[], FreeSlab> owned(newSlab());
        std::byte* slab = owned.get();
        m_slabs.push_back(std::move(owned));
        adviseLargePages(slab, kLargePage);
        poison(slab, kLargePage);
        m_next = slab;
        m_end = slab + kLargePage;
    }
    void* block = m_next;
    m_next += m_blockSize;
    unpoison(block, m_blockSize);
    return block;
}

void BlockPool::release(void* block) {
    *static_cast<void**>(block) = m_free;
    poison(block, m_blockSize);
    m_free = block;
}

} // namespace tsd_cli
