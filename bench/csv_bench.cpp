// CSV export and import of generated databases up to the largest a file can
// hold (65504 records). Both must grow linearly with the record count.
//
// Besides the benchmarks, the program has helper modes that the script
// csv_vs_sqlite.sh times against sqlite3 on the same data:
//   bench_csv --make N DB.PDB DATA.csv   generate a database and its CSV
//   bench_csv --export DB.PDB OUT.csv    open the database, export it
//   bench_csv --import DB.PDB IN.csv OUT.PDB
//                                        import IN into an empty database of
//                                        DB's design and save it as OUT
#include <benchmark/benchmark.h>

#include <cstdio>
#include <filesystem>
#include <string>

#include "bench/generator.h"
#include "ops/csv_export.h"
#include "ops/csv_import.h"
#include "platform/file_io.h"

namespace cx::bench {
namespace {

std::string ScratchFile(const std::string& name) {
  return (std::filesystem::temp_directory_path() / ("cardovex-bench-" + name)).string();
}

Database Generated(size_t records) {
  GeneratorOptions options;
  options.records = records;
  options.maxNoteLength = 120;
  return GenerateDatabase(ScratchFile("csv.PDB"), options);
}

Database EmptyLike(const Database& design, const std::string& path) {
  Database db = Database::CreateNew(path, "Imported");
  db.schema() = design.schema();
  db.popups() = design.popups();
  return db;
}

void BM_CsvExport(benchmark::State& state) {
  const Database db = Generated(static_cast<size_t>(state.range(0)));
  const std::string out = ScratchFile("export.csv");
  SilentUi ui;
  for (auto _ : state) {
    if (ExportCsv(db, {}, out, {}, LocaleInfo(), ui) != 1) state.SkipWithError("export failed");
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetBytesProcessed(state.iterations() * FileSize(out));
  state.SetComplexityN(state.range(0));
  RemoveFile(out);
}

void BM_CsvImport(benchmark::State& state) {
  const Database design = Generated(static_cast<size_t>(state.range(0)));
  const std::string in = ScratchFile("import.csv");
  SilentUi ui;
  ExportCsv(design, {}, in, {}, LocaleInfo(), ui);
  for (auto _ : state) {
    Database db = EmptyLike(design, ScratchFile("imported.PDB"));
    CsvImportResult r = ImportCsvFile(db, in, kCsvColumnsByDisplayOrder, {}, LocaleInfo());
    if (!r.status || r.imported != design.recordCount()) state.SkipWithError("import failed");
    benchmark::DoNotOptimize(db.recordCount());
  }
  state.SetItemsProcessed(state.iterations() * state.range(0));
  state.SetBytesProcessed(state.iterations() * FileSize(in));
  state.SetComplexityN(state.range(0));
  RemoveFile(in);
}

BENCHMARK(BM_CsvExport)->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)->Complexity(benchmark::oN);
BENCHMARK(BM_CsvImport)->Arg(4096)->Arg(16384)->Arg(65504)->Unit(benchmark::kMillisecond)->Complexity(benchmark::oN);

int Fail(const std::string& message) {
  std::fprintf(stderr, "bench_csv: %s\n", message.c_str());
  return 1;
}

int Helper(int argc, char** argv) {
  const std::string mode = argv[1];
  SilentUi ui;
  if (mode == "--make" && argc == 5) {
    GeneratorOptions options;
    options.records = std::stoul(argv[2]);
    options.maxNoteLength = 120;
    if (Status s = GenerateFile(argv[3], options); !s) return Fail(s.message());
    Database db;
    if (Status s = db.Open(argv[3], ui); !s) return Fail(s.message());
    return ExportCsv(db, {}, argv[4], {}, LocaleInfo(), ui) == 1 ? 0 : Fail("export failed");
  }
  if (mode == "--export" && argc == 4) {
    Database db;
    if (Status s = db.Open(argv[2], ui); !s) return Fail(s.message());
    return ExportCsv(db, {}, argv[3], {}, LocaleInfo(), ui) == 1 ? 0 : Fail("export failed");
  }
  if (mode == "--import" && argc == 5) {
    Database design;
    if (Status s = design.Open(argv[2], ui); !s) return Fail(s.message());
    Database db = EmptyLike(design, argv[4]);
    CsvImportResult r = ImportCsvFile(db, argv[3], kCsvColumnsByDisplayOrder, {}, LocaleInfo());
    if (!r.status) return Fail(r.status.message());
    if (Status s = db.Save(); !s) return Fail(s.message());
    return 0;
  }
  return Fail("unknown mode or wrong arguments: " + mode);
}

}  // namespace
}  // namespace cx::bench

int main(int argc, char** argv) {
  if (argc >= 2 && std::string(argv[1]).rfind("--", 0) == 0 &&
      std::string(argv[1]).rfind("--benchmark", 0) != 0) {
    return cx::bench::Helper(argc, argv);
  }
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
