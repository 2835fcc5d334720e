// Sorting, the view rebuild, find and a full recalculation on generated
// databases up to the largest a file can hold (65504 records). A user
// waits for each of these, so at full size each must stay well under the
// time a user notices.
//
// BM_SortAllPlain runs the same quicksort comparing through CompareRecords
// (every comparison walks both records' slots) to show what reading the
// keys out once per sort saves. The Adversarial pair sorts values arranged
// to defeat the median of three: the plain quicksort goes quadratic there,
// SortAll (which falls back to heap sort) does not.
#include <benchmark/benchmark.h>

#include <array>
#include <string>
#include <utility>
#include <vector>

#include "bench/generator.h"
#include "ops/calc.h"
#include "ops/compare.h"
#include "ops/database_settings.h"
#include "ops/find.h"
#include "ops/session.h"
#include "ops/sort.h"
#include "ops/view.h"

namespace cx::bench {
namespace {

Database Generated(size_t records) {
  GeneratorOptions options;
  options.records = records;
  options.maxNoteLength = 120;
  return GenerateDatabase("/nonexistent/bench-ops.PDB", options);
}

// Name forward, Quantity reverse, Price forward.
void ThreeKeys(Database& db) {
  auto& keys = db.schema().sortKey;
  keys[0] = {static_cast<uint8_t>(kName), 1};
  keys[1] = {static_cast<uint8_t>(kQuantity), 0};
  keys[2] = {static_cast<uint8_t>(kPrice), 1};
}

// The median-of-three quicksort without any depth limit, over positions.
template <typename Compare, typename Swap>
void PlainQuickSort(long count, Compare cmp, Swap swap) {
  std::array<std::pair<long, long>, 64> stack;
  size_t depth = 0;
  long lo = 0, hi = count - 1;
  for (;;) {
    while (hi > lo) {
      const long mid = (lo + hi) / 2;
      if (cmp(lo, mid) > 0) swap(lo, mid);
      if (cmp(lo, hi) > 0) swap(lo, hi);
      if (cmp(mid, hi) > 0) swap(mid, hi);
      if (hi - lo < 3) break;
      swap(mid, hi - 1);
      long i = lo, j = hi - 1;
      for (;;) {
        while (++i < hi - 1 && cmp(i, hi - 1) < 0) {
        }
        while (--j > lo && cmp(j, hi - 1) > 0) {
        }
        if (j < i) break;
        swap(i, j);
      }
      swap(i, hi - 1);
      if (j - lo <= hi - i) {
        stack[depth++] = {i + 1, hi};
        hi = j;
      } else {
        stack[depth++] = {lo, j};
        lo = i + 1;
      }
    }
    if (depth == 0) break;
    std::tie(lo, hi) = stack[--depth];
  }
}

void PlainSortAll(Database& db) {
  RecordTable& t = db.table();
  PlainQuickSort(
      static_cast<long>(t.size()),
      [&](long x, long y) { return CompareRecords(db, t[x].bytes(), t[y].bytes()); },
      [&](long x, long y) { std::swap(t[x], t[y]); });
}

// Values arranged so that the plain quicksort above takes n² comparisons:
// an adversary fixes each value only when a comparison forces it, always
// making the pivot as bad as it can be.
std::vector<long> AdversarialValues(long n) {
  std::vector<long> value(static_cast<size_t>(n), n), item(static_cast<size_t>(n));
  for (long i = 0; i < n; ++i) item[static_cast<size_t>(i)] = i;
  long solid = 0, candidate = -1;
  PlainQuickSort(
      n,
      [&](long x, long y) {
        const long a = item[static_cast<size_t>(x)], b = item[static_cast<size_t>(y)];
        long& va = value[static_cast<size_t>(a)];
        long& vb = value[static_cast<size_t>(b)];
        if (va == n && vb == n) (a == candidate ? va : vb) = solid++;
        if (va == n) {
          candidate = a;
        } else if (vb == n) {
          candidate = b;
        }
        return va < vb ? -1 : (va > vb ? 1 : 0);
      },
      [&](long x, long y) { std::swap(item[static_cast<size_t>(x)], item[static_cast<size_t>(y)]); });
  return value;
}

// One Integer field holding the adversarial arrangement, sorted on it.
Database AdversarialDatabase(long n) {
  Database db = Database::CreateNew("/nonexistent/bench-adversary.PDB", "Adversary");
  Schema& s = db.schema();
  s.field[0].typeNumber = static_cast<int16_t>(FieldType::Integer);
  s.field[0].name.set("Value");
  s.sortKey[0] = {0, 1};
  Bytes editing = NewEditingRecord(s);
  for (long v : AdversarialValues(n)) {
    SetEditingNumber(editing, 0, static_cast<uint32_t>(v), s);
    db.AppendRecord(Compact(editing, s));
  }
  return db;
}

// Sorts the records of `db` again and again from their first order.
template <typename Sort>
void TimeSorts(benchmark::State& state, Database db, Sort sort) {
  const RecordTable unsorted = db.table();
  for (auto _ : state) {
    state.PauseTiming();
    db.table() = unsorted;
    state.ResumeTiming();
    sort(db);
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetComplexityN(state.range(0));
}

template <typename Sort>
void RunAdversarialSort(benchmark::State& state, Sort sort) {
  TimeSorts(state, AdversarialDatabase(state.range(0)), sort);
}

void BM_SortAllAdversarial(benchmark::State& state) {
  RunAdversarialSort(state, [](Database& db) { SortAll(db); });
}

void BM_SortAllPlainAdversarial(benchmark::State& state) { RunAdversarialSort(state, PlainSortAll); }

template <typename Sort>
void RunSort(benchmark::State& state, Sort sort) {
  Database db = Generated(static_cast<size_t>(state.range(0)));
  ThreeKeys(db);
  TimeSorts(state, std::move(db), sort);
}

void BM_SortAll(benchmark::State& state) {
  RunSort(state, [](Database& db) { SortAll(db); });
}

void BM_SortAllPlain(benchmark::State& state) { RunSort(state, PlainSortAll); }

// Both filters on: Name contains "a" OR Quantity in 10 to 500.
void BM_RebuildView(benchmark::State& state) {
  Database db = Generated(static_cast<size_t>(state.range(0)));
  FilterSettings f = LoadFilterSettings(db.schema());
  f.filter[0] = Filter{};
  f.filter[0].enabled = true;
  f.filter[0].field = kName;
  f.filter[0].SetLowerText("a");
  f.filter[1] = Filter{};
  f.filter[1].enabled = true;
  f.filter[1].field = kQuantity;
  f.filter[1].lowerNumber = 10;
  f.filter[1].upperNumber = 500;
  f.combination = kFilterOr;
  StoreFilterSettings(f, db.schema());
  for (auto _ : state) benchmark::DoNotOptimize(RebuildView(db).size());
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetComplexityN(state.range(0));
}

// "Search All Fields" for a text that is nowhere: every field of every
// record is turned into text and searched.
void BM_FindAllFields(benchmark::State& state) {
  const Database db = Generated(static_cast<size_t>(state.range(0)));
  SearchSettings search;
  search.text = "no such text";
  const LocaleInfo locale;
  for (auto _ : state) {
    benchmark::DoNotOptimize(FindRecord(db, search, 0, 0, nullptr, nullptr, nullptr, locale));
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetComplexityN(state.range(0));
}

// Every record: Total (Quantity * Price) and Running (a running total over
// the previous record).
void BM_RecalculateAll(benchmark::State& state) {
  Database db = Generated(static_cast<size_t>(state.range(0)));
  const LocaleInfo locale;
  SilentUi ui;
  DataSession session(db, locale, ui);
  for (auto _ : state) {
    if (RecalculateFrom(session, 0) != 0) state.SkipWithError("recalculation failed");
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetComplexityN(state.range(0));
}

BENCHMARK(BM_SortAll)->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)->Complexity(benchmark::oNLogN);
BENCHMARK(BM_SortAllPlain)->Arg(4096)->Arg(65504)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SortAllAdversarial)->Arg(4096)->Arg(65504)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SortAllPlainAdversarial)->Arg(4096)->Arg(16384)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_RebuildView)->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)->Complexity(benchmark::oN);
BENCHMARK(BM_FindAllFields)->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)->Complexity(benchmark::oN);
BENCHMARK(BM_RecalculateAll)->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)->Complexity(benchmark::oN);

}  // namespace
}  // namespace cx::bench

BENCHMARK_MAIN();
