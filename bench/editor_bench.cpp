// The record editor on the largest database a file can hold (65504
// records): the dialog built on a record and closed with OK, at the first,
// middle and last record. Without a change nothing is written; with one,
// the record is stored, placed in sorted order, recalculated and the view
// rebuilt. A running total over the previous record makes a change that
// moves nothing still recalculate every record after it, so that case is
// measured on its own.
#include <benchmark/benchmark.h>

#include <QApplication>
#include <memory>

#include "app/document.h"
#include "app/preferences.h"
#include "bench/generator.h"
#include "gui/editor/record_editor_dialog.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "platform/settings.h"

namespace cx::bench {
namespace {

constexpr size_t kRecords = 65504;

struct Fixture {
  explicit Fixture(bool previousRecordField) : preferences(settings), recent(settings) {
    GeneratorOptions options;
    options.records = kRecords;
    options.maxNoteLength = 120;
    db = GenerateDatabase("/nonexistent/bench-editor.PDB", options);
    if (!previousRecordField) db.schema().field[kRunning].calcFlags = 0;
    db.schema().sortKey[0] = {static_cast<uint8_t>(kName), 1};
    SortAll(db);
    context = std::make_unique<AppContext>(AppContext{ui, locale, preferences, recent, "/nonexistent"});
    doc = std::make_unique<Document>(*context, db);
    doc->RebuildView();
  }
  SilentUi ui;
  LocaleInfo locale;
  MemorySettings settings;
  Preferences preferences;
  RecentFiles recent;
  Database db;
  std::unique_ptr<AppContext> context;
  std::unique_ptr<Document> doc;
};

Fixture& Shared(bool previousRecordField) {
  static Fixture withPrevious(true);
  static Fixture without(false);
  return previousRecordField ? withPrevious : without;
}

size_t Position(const benchmark::State& state) {
  return static_cast<size_t>(state.range(0)) * (kRecords - 1) / 2;
}

void BM_EditorOkUnchanged(benchmark::State& state) {
  Fixture& f = Shared(true);
  const size_t record = Position(state);
  for (auto _ : state) {
    gui::RecordEditorDialog editor(*f.doc, record, false, nullptr);
    benchmark::DoNotOptimize(editor.Apply());
  }
}

// The Quantity of the record changes between two values; with the sort on
// Name it stays where it is.
void OkWithChange(benchmark::State& state, bool previousRecordField) {
  Fixture& f = Shared(previousRecordField);
  const size_t record = Position(state);
  int value = 1;
  for (auto _ : state) {
    gui::RecordEditorDialog editor(*f.doc, record, false, nullptr);
    editor.form().SetText(kQuantity, std::to_string(value));
    value = 3 - value;
    if (!editor.Apply()) state.SkipWithError("not stored");
  }
}

void BM_EditorOkChanged(benchmark::State& state) { OkWithChange(state, false); }
void BM_EditorOkChangedPrevRecord(benchmark::State& state) { OkWithChange(state, true); }

BENCHMARK(BM_EditorOkUnchanged)->DenseRange(0, 2)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_EditorOkChanged)->DenseRange(0, 2)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_EditorOkChangedPrevRecord)->DenseRange(0, 2)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace cx::bench

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
