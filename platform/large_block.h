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

// Memory of `size` bytes in large pages where the system gives them,
// uncleared; throws std::bad_alloc when there is none. Freed with
// FreeLargePages and the same size.
void* AllocateLargePages(size_t size);
void FreeLargePages(void* block, size_t size) noexcept;

// An allocator for containers that grow to a megabyte and more at once
// (a table of every record of a file): those take large pages, smaller
// ones the ordinary heap.
template <typename T>
class LargePageAllocator {
 public:
  using value_type = T;
  static constexpr size_t kFrom = size_t{1} << 20;

  LargePageAllocator() = default;
  template <typename U>
  LargePageAllocator(const LargePageAllocator<U>&) noexcept {}

  T* allocate(size_t n) {
    if (n * sizeof(T) < kFrom) return std::allocator<T>().allocate(n);
    return static_cast<T*>(AllocateLargePages(n * sizeof(T)));
  }
  void deallocate(T* p, size_t n) noexcept {
    if (n * sizeof(T) < kFrom) {
      std::allocator<T>().deallocate(p, n);
    } else {
      FreeLargePages(p, n * sizeof(T));
    }
  }
  friend bool operator==(const LargePageAllocator&, const LargePageAllocator&) { return true; }
};

}  // namespace cx
