#include "Pages.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <new>

#ifdef __linux__
#include <sys/mman.h>
#endif

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

BlockPool::BlockPool(std::size_t blockSize)
    : m_blockSize(std::max((blockSize + alignof(void*) - 1) / alignof(void*) * alignof(void*),
                           sizeof(void*))) {}

BlockPool::~BlockPool() {
    for (auto& slab : m_slabs)
        unpoison(slab.get(), kLargePage);
}

void BlockPool::FreeSlab::operator()(std::byte* slab) const {
    std::free(slab);
}

void* BlockPool::allocate() {
    if (m_free != nullptr) {
        void* block = m_free;
        unpoison(block, m_blockSize);
        m_free = *static_cast<void**>(block);
        return block;
    }
    if (static_cast<std::size_t>(m_end - m_next) < m_blockSize) {
        // One large page per slab, aligned so that it can be one.
        auto* slab = static_cast<std::byte*>(std::aligned_alloc(kLargePage, kLargePage));
        if (slab == nullptr)
            throw std::bad_alloc();
        m_slabs.emplace_back(slab);
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
