#include "platform/large_block.h"

#include <sys/mman.h>

namespace cx {

std::shared_ptr<uint8_t[]> AllocateLargeBlock(size_t size) {
#if defined(MADV_HUGEPAGE)
  const size_t mapped = (size + kLargePage - 1) / kLargePage * kLargePage;
  if (mapped > 0) {
    void* block = ::mmap(nullptr, mapped, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (block != MAP_FAILED) {
      // Advice only: a system that keeps large pages off still gives the
      // block, in small pages.
      ::madvise(block, mapped, MADV_HUGEPAGE);
      return std::shared_ptr<uint8_t[]>(static_cast<uint8_t*>(block),
                                        [mapped](uint8_t* p) { ::munmap(p, mapped); });
    }
  }
#endif
  return std::make_shared_for_overwrite<uint8_t[]>(size);
}

}  // namespace cx
