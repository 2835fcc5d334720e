// The sort behind every "sort the records": positions 0 .. count - 1 are
// put in order through two callbacks, so the key table can move light rows
// instead of records. Ties may end up in any order.
#pragma once

#include <array>
#include <cstddef>

namespace cx {

namespace detail {

// Heap sort of lo .. hi: the fallback when partitioning keeps going badly.
// It stays within n log n comparisons whatever the input, and it ends even
// when the comparison is not a strict order.
template <typename Compare, typename Swap>
void HeapSortRange(long lo, long hi, Compare& compare, Swap& swap) {
  const long n = hi - lo + 1;
  auto sift = [&](long root, long end) {
    for (;;) {
      long child = 2 * root + 1;
      if (child >= end) return;
      if (child + 1 < end && compare(lo + child, lo + child + 1) < 0) ++child;
      if (compare(lo + root, lo + child) >= 0) return;
      swap(lo + root, lo + child);
      root = child;
    }
  };
  for (long start = n / 2 - 1; start >= 0; --start) sift(start, n);
  for (long end = n - 1; end > 0; --end) {
    swap(lo, lo + end);
    sift(0, end);
  }
}

}  // namespace detail

// A quicksort (median of three, the smaller side first, an explicit stack
// of ranges) that hands a range over to heap sort once it has been split
// more than twice log2(count) times: an arrangement that defeats the
// median of three (as a crafted file can) then costs n log n, not n².
// Working on the smaller side first keeps the stack no deeper than
// log2(count), so 64 entries always suffice. The two scans are bounded by
// the range, which a consistent comparison never needs (the pivot and
// position lo stop them) but one that is not a strict order (records
// missing the key's slot, numbers more than 2^31 apart) could otherwise
// run past.
template <typename Compare, typename Swap>
void SortPositions(long count, Compare compare, Swap swap) {
  struct Range {
    long lo, hi;
    int depth;
  };
  int budget = 0;
  for (long n = count; n > 1; n >>= 1) budget += 2;
  std::array<Range, 64> stack;
  size_t top = 0;
  long lo = 0, hi = count - 1;
  int depth = 0;
  for (;;) {
    while (hi > lo) {
      if (depth >= budget) {
        detail::HeapSortRange(lo, hi, compare, swap);
        break;
      }
      ++depth;
      const long mid = lo + (hi - lo) / 2;
      if (compare(lo, mid) > 0) swap(lo, mid);
      if (compare(lo, hi) > 0) swap(lo, hi);
      if (compare(mid, hi) > 0) swap(mid, hi);
      if (hi - lo < 3) break;
      const long pivot = hi - 1;
      swap(mid, pivot);
      long i = lo, j = pivot;
      for (;;) {
        do ++i; while (i < pivot && compare(i, pivot) < 0);
        do --j; while (j > lo && compare(j, pivot) > 0);
        if (j < i) break;
        swap(i, j);
      }
      swap(i, pivot);
      if (j - lo <= hi - i) {
        stack[top++] = {i + 1, hi, depth};
        hi = j;
      } else {
        stack[top++] = {lo, j, depth};
        lo = i + 1;
      }
    }
    if (top == 0) break;
    --top;
    lo = stack[top].lo;
    hi = stack[top].hi;
    depth = stack[top].depth;
  }
}

}  // namespace cx
