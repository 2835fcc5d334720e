// The sort behind every "sort the records": positions 0 .. count - 1 are
// put in order through two callbacks, so the key table can move light rows
// instead of records. Ties may end up in any order.
#pragma once

#include <array>
#include <cstddef>

#include "platform/run_beside.h"

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

namespace detail {

// Twice log2(count): how many splits a range may go through before heap
// sort takes it over.
inline int SplitBudget(long count) {
  int budget = 0;
  for (long n = count; n > 1; n >>= 1) budget += 2;
  return budget;
}

// One split of lo .. hi (more than three positions) around the median of
// three; afterwards lo .. j and i + 1 .. hi remain to be sorted.
template <typename Compare, typename Swap>
void Split(long lo, long hi, Compare& compare, Swap& swap, long& j, long& i) {
  const long mid = lo + (hi - lo) / 2;
  if (compare(lo, mid) > 0) swap(lo, mid);
  if (compare(lo, hi) > 0) swap(lo, hi);
  if (compare(mid, hi) > 0) swap(mid, hi);
  const long pivot = hi - 1;
  swap(mid, pivot);
  i = lo;
  j = pivot;
  for (;;) {
    do ++i; while (i < pivot && compare(i, pivot) < 0);
    do --j; while (j > lo && compare(j, pivot) > 0);
    if (j < i) break;
    swap(i, j);
  }
  swap(i, pivot);
}

// Sorts lo .. hi, which has already been split `depth` times.
template <typename Compare, typename Swap>
void SortRange(long lo, long hi, int depth, int budget, Compare& compare, Swap& swap) {
  struct Range {
    long lo, hi;
    int depth;
  };
  std::array<Range, 64> stack;
  size_t top = 0;
  for (;;) {
    while (hi > lo) {
      if (depth >= budget) {
        HeapSortRange(lo, hi, compare, swap);
        break;
      }
      ++depth;
      if (hi - lo < 3) {
        // The median of three alone puts up to three positions in order.
        const long mid = lo + (hi - lo) / 2;
        if (compare(lo, mid) > 0) swap(lo, mid);
        if (compare(lo, hi) > 0) swap(lo, hi);
        if (compare(mid, hi) > 0) swap(mid, hi);
        break;
      }
      long i = 0, j = 0;
      Split(lo, hi, compare, swap, j, i);
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
  detail::SortRange(0, count - 1, 0, detail::SplitBudget(count), compare, swap);
}

// The same order as SortPositions, the two sides of the first split sorted
// at the same time: what happens within one range never depends on
// another. For callbacks that may run on two threads at once as long as
// their positions differ.
template <typename Compare, typename Swap>
void SortPositionsOnTwoThreads(long count, Compare compare, Swap swap) {
  const int budget = detail::SplitBudget(count);
  if (count < 4 || budget == 0) {
    SortPositions(count, compare, swap);
    return;
  }
  long i = 0, j = 0;
  detail::Split(0, count - 1, compare, swap, j, i);
  RunBeside([&] { detail::SortRange(0, j, 1, budget, compare, swap); },
            [&] { detail::SortRange(i + 1, count - 1, 1, budget, compare, swap); });
}

}  // namespace cx
