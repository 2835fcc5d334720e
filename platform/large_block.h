// Blocks of memory of a megabyte and more that are filled as soon as they
// are made (record copies of a whole file). Each small page touched for the
// first time costs the process a fault; these blocks ask the system for
// large pages, which take one fault per 2 MB.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

namespace cx {

// A block of at least `size` bytes, not cleared, freed with the last
// pointer to it. Never null: where large pages cannot be had, the block
// comes from the ordinary heap.
std::shared_ptr<uint8_t[]> AllocateLargeBlock(size_t size);

// Below this size a block is better taken from the ordinary heap.
inline constexpr size_t kLargePage = size_t{2} << 20;

}  // namespace cx
