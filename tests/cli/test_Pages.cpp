// The block pool that reference records come from: blocks stay apart across
// slabs, and released blocks are handed out again before new ones. The heap
// readied for a large design still serves blocks of every size.
#include "Pages.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <set>
#include <vector>

TEST(Pages, PoolBlocksStayApartAndAreReused) {
    tsd_cli::BlockPool pool(20);
    ASSERT_EQ(pool.blockSize() % alignof(void*), 0u);
    ASSERT_GE(pool.blockSize(), 20u);
    // Enough blocks for several slabs, each filled with its own number.
    std::vector<void*> blocks;
    for (std::uint32_t i = 0; i < 300000; ++i) {
        void* block = pool.allocate();
        ASSERT_EQ(reinterpret_cast<std::uintptr_t>(block) % alignof(void*), 0u);
        std::memset(block, static_cast<int>(i & 0xFF), pool.blockSize());
        blocks.push_back(block);
    }
    EXPECT_EQ(std::set<void*>(blocks.begin(), blocks.end()).size(), blocks.size());
    for (std::size_t i = 0; i < blocks.size(); i += 2)
        pool.release(blocks[i]);
    // Every released block comes back, and only those.
    std::set<void*> released;
    for (std::size_t i = 0; i < blocks.size(); i += 2)
        released.insert(blocks[i]);
    for (std::size_t n = released.size(); n > 0; --n)
        EXPECT_EQ(released.erase(pool.allocate()), 1u);
    // The blocks that stayed out kept their contents.
    for (std::size_t i = 1; i < blocks.size(); i += 2)
        ASSERT_EQ(*static_cast<unsigned char*>(blocks[i]), i & 0xFF) << i;
}

TEST(Pages, APreparedHeapServesEveryBlockSize) {
    tsd_cli::prepareHeap(std::size_t(256) << 20);
    tsd_cli::prepareHeap(std::size_t(512) << 20); // once is enough: a no-op
    // Blocks from a few bytes to past the largest that the heap serves,
    // every other one freed and allocated again in between.
    std::vector<std::vector<unsigned char>> blocks;
    for (std::size_t size = 8; size <= (std::size_t(64) << 20); size *= 4)
        blocks.emplace_back(size, static_cast<unsigned char>(blocks.size() + 1));
    for (std::size_t i = 0; i < blocks.size(); i += 2) {
        std::vector<unsigned char>().swap(blocks[i]);
        blocks[i].assign(std::size_t(3) << (2 * i), static_cast<unsigned char>(0xA0 + i));
    }
    for (std::size_t i = 0; i < blocks.size(); ++i) {
        const unsigned char expected = i % 2 == 0 ? 0xA0 + i : i + 1;
        ASSERT_FALSE(blocks[i].empty());
        EXPECT_EQ(blocks[i].front(), expected) << i;
        EXPECT_EQ(blocks[i].back(), expected) << i;
    }
}
