#include "platform/large_block.h"

#include <sys/mman.h>

#include <new>

namespace cx {
namespace {

size_t Rounded(size_t size) { return (size + kLargePage - 1) / kLargePage * kLargePage; }

// A mapping of whole large pages (the system places one of that size on a
// large-page boundary), with the advice to back it by large pages. Advice
// only: a system that keeps them off still gives the memory, in small pages.
void* MapLarge(size_t size) {
  const size_t mapped = Rounded(size);
  void* block = ::mmap(nullptr, mapped, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (block == MAP_FAILED) return nullptr;
#if defined(MADV_HUGEPAGE)
  ::madvise(block, mapped, MADV_HUGEPAGE);
#endif
  return block;
}

}  // namespace

std::shared_ptr<uint8_t[]> AllocateLargeBlock(size_t size) {
  if (size > 0) {
    if (void* block = MapLarge(size)) {
      const size_t mapped = Rounded(size);
      return std::shared_ptr<uint8_t[]>(static_cast<uint8_t*>(block),
                                        [mapped](uint8_t* p) { ::munmap(p, mapped); });
    }
  }
  return std::make_shared_for_overwrite<uint8_t[]>(size);
}

void* AllocateLargePages(size_t size) {
  void* block = size > 0 ? MapLarge(size) : nullptr;
  if (!block) throw std::bad_alloc();
  return block;
}

void FreeLargePages(void* block, size_t size) noexcept {
  if (block) ::munmap(block, Rounded(size));
}

}  // namespace cx
