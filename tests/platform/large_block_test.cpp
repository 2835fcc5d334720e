#include <gtest/gtest.h>

#include <cstring>
#include <numeric>
#include <vector>

#include "platform/large_block.h"

namespace cx {
namespace {

// A container crosses from the heap to large pages and back as it grows,
// is copied and shrinks; its elements must come through every move intact.
TEST(LargePageAllocatorTest, ContainersKeepTheirElementsAcrossTheSizeLimit) {
  struct Item {
    uint64_t a;
    uint32_t b;
  };
  std::vector<Item, LargePageAllocator<Item>> items;
  constexpr uint32_t kCount = 300000;  // about 5 MB
  for (uint32_t i = 0; i < kCount; ++i) items.push_back({uint64_t{i} * 3, i});
  ASSERT_GE(items.capacity() * sizeof(Item), LargePageAllocator<Item>::kFrom);
  EXPECT_EQ(reinterpret_cast<uintptr_t>(items.data()) % alignof(Item), 0u);

  auto copy = items;
  items.erase(items.begin() + 10, items.end());
  items.shrink_to_fit();
  ASSERT_EQ(items.size(), 10u);
  EXPECT_EQ(items[9].b, 9u);
  for (uint32_t i = 0; i < kCount; i += 997) {
    ASSERT_EQ(copy[i].a, uint64_t{i} * 3);
    ASSERT_EQ(copy[i].b, i);
  }
  copy = items;
  EXPECT_EQ(copy.size(), 10u);
}

TEST(LargePageAllocatorTest, BlocksOfAnySizeHoldWhatIsWritten) {
  for (size_t size : {size_t{1}, kLargePage - 1, kLargePage, kLargePage * 3 + 5}) {
    std::shared_ptr<uint8_t[]> block = AllocateLargeBlock(size);
    std::memset(block.get(), 0xA5, size);
    EXPECT_EQ(block[size - 1], 0xA5) << size;
  }
}

}  // namespace
}  // namespace cx
