// The block pool that reference records come from: blocks stay apart across
// slabs, and released blocks are handed out again before new ones.
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
