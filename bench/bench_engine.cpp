// The record store and value text on generated databases up to the largest
// a file can hold (65504 records): opening and saving a file, turning every
// value into the text the list shows, taking every record through the
// editing form, and the summary reports. Opening and saving go through the
// file system as the program does (saving includes the flush to disk).
#include <benchmark/benchmark.h>

#include <filesystem>
#include <map>
#include <string>

#include "bench/generator.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "engine/value_text.h"
#include "ops/report.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx::bench {
namespace {

std::string ScratchFile(const std::string& name) {
  return (std::filesystem::temp_directory_path() / ("cardovex-bench-engine-" + name)).string();
}

GeneratorOptions Options(size_t records) {
  GeneratorOptions options;
  options.records = records;
  options.maxNoteLength = 120;
  return options;
}

// One generated file per size, made on first use and removed at exit.
class GeneratedFiles {
 public:
  ~GeneratedFiles() {
    for (const auto& [records, path] : files_) RemoveFile(path);
  }
  const std::string& Get(size_t records) {
    auto it = files_.find(records);
    if (it != files_.end()) return it->second;
    std::string path = ScratchFile(std::to_string(records) + ".PDB");
    GenerateFile(path, Options(records), FixedClock(1700000000));
    return files_.emplace(records, path).first->second;
  }

 private:
  std::map<size_t, std::string> files_;
};

const std::string& GeneratedFile(size_t records) {
  static GeneratedFiles files;
  return files.Get(records);
}

void SetItems(benchmark::State& state) {
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetComplexityN(state.range(0));
}

void SetBytes(benchmark::State& state, const std::string& path) {
  state.SetBytesProcessed(state.iterations() * FileSize(path));
  SetItems(state);
}

void BM_Open(benchmark::State& state) {
  const std::string& path = GeneratedFile(static_cast<size_t>(state.range(0)));
  SilentUi ui;
  for (auto _ : state) {
    Database db;
    if (!db.Open(path, ui)) state.SkipWithError("open failed");
    benchmark::DoNotOptimize(db.recordCount());
  }
  SetBytes(state, path);
}

void BM_Save(benchmark::State& state) {
  SilentUi ui;
  Database db;
  if (!db.Open(GeneratedFile(static_cast<size_t>(state.range(0))), ui)) state.SkipWithError("open failed");
  const std::string out = ScratchFile("save.PDB");
  const FixedClock clock(1700000000);
  for (auto _ : state) {
    db.MarkChanged();
    if (!db.SaveAs(out, clock)) state.SkipWithError("save failed");
  }
  SetBytes(state, out);
  RemoveFile(out);
}

// Every value of every record as the list shows it.
void BM_ValueTextAll(benchmark::State& state) {
  SilentUi ui;
  Database db;
  if (!db.Open(GeneratedFile(static_cast<size_t>(state.range(0))), ui)) state.SkipWithError("open failed");
  const LocaleInfo locale;
  const ValueContext ctx{db.schema(), db.popups(), locale};
  for (auto _ : state) {
    size_t total = 0;
    for (size_t r = 0; r < db.recordCount(); ++r) {
      for (int slot = 0; slot < kSlotCount; ++slot) total += OneLine(ValueText(ctx, db.record(r), slot)).size();
    }
    benchmark::DoNotOptimize(total);
  }
  SetItems(state);
}

// Every record into the editing form and compacted back, as the record
// editor does on opening and OK.
void BM_EditRoundTrip(benchmark::State& state) {
  SilentUi ui;
  Database db;
  if (!db.Open(GeneratedFile(static_cast<size_t>(state.range(0))), ui)) state.SkipWithError("open failed");
  for (auto _ : state) {
    size_t total = 0;
    for (size_t r = 0; r < db.recordCount(); ++r) {
      total += Compact(Expand(db.record(r), db.schema()), db.schema()).size();
    }
    benchmark::DoNotOptimize(total);
  }
  SetItems(state);
}

// The summary report on a whole number, a decimal and a date field.
void BM_Report(benchmark::State& state) {
  SilentUi ui;
  Database db;
  if (!db.Open(GeneratedFile(static_cast<size_t>(state.range(0))), ui)) state.SkipWithError("open failed");
  const LocaleInfo locale;
  for (auto _ : state) {
    for (int slot : {kQuantity, kPrice, kBorn}) {
      auto report = BuildReport(db, slot, locale);
      if (!report) state.SkipWithError("no report");
      benchmark::DoNotOptimize(report);
    }
  }
  SetItems(state);
}

#define CARDOVEX_SIZES ->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)
BENCHMARK(BM_Open) CARDOVEX_SIZES->Complexity(benchmark::oN);
BENCHMARK(BM_Save) CARDOVEX_SIZES->Complexity(benchmark::oN);
BENCHMARK(BM_ValueTextAll) CARDOVEX_SIZES->Complexity(benchmark::oN);
BENCHMARK(BM_EditRoundTrip) CARDOVEX_SIZES->Complexity(benchmark::oN);
BENCHMARK(BM_Report) CARDOVEX_SIZES->Complexity(benchmark::oN);

}  // namespace
}  // namespace cx::bench

BENCHMARK_MAIN();
