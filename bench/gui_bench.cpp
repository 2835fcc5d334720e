// The desktop list on generated databases up to the largest a file can hold
// (65504 records): from opening a file until its first rows are painted,
// jumping to the last row (which should cost the same at 100 and at 65504
// records: the list reads only the rows on screen), a sort from a column
// heading and the auto fit of a column. Runs on the offscreen platform.
//
//   bench_gui [benchmark options]
//   bench_gui --first-paint FILE   (start, open, first paint, exit: the
//                                   whole-process figure of gui_vs_cli.sh)
//   bench_gui --header-sort FILE   (the same, then a sort on the Name
//                                   heading and its paint)
#include <benchmark/benchmark.h>

#include <QApplication>
#include <QHeaderView>
#include <cstring>
#include <filesystem>
#include <map>
#include <memory>
#include <string>

#include "bench/generator.h"
#include "gui/main/desktop_session.h"
#include "gui/main/record_list_view.h"
#include "platform/file_io.h"
#include "platform/settings.h"

namespace cx::bench {
namespace {

std::string Scratch() {
  const auto dir = std::filesystem::temp_directory_path() / "cardovex-bench-gui";
  std::filesystem::create_directories(dir);
  return dir.string();
}

// One generated file per size, made on first use, removed at exit.
class Files {
 public:
  ~Files() {
    for (const auto& [n, path] : files_) RemoveFile(path);
  }
  const std::string& Get(size_t records) {
    auto it = files_.find(records);
    if (it != files_.end()) return it->second;
    GeneratorOptions options;
    options.records = records;
    options.maxNoteLength = 120;
    const std::string path = Scratch() + "/gen-" + std::to_string(records) + ".PDB";
    GenerateFile(path, options);
    return files_[records] = path;
  }

 private:
  std::map<size_t, std::string> files_;
};
Files& GeneratedFiles() {
  static Files files;
  return files;
}

std::unique_ptr<gui::DesktopSession> NewSession() {
  auto session = std::make_unique<gui::DesktopSession>(std::make_unique<MemorySettings>(), Scratch());
  session->Start({});
  session->window().resize(1000, 700);
  QApplication::processEvents();
  return session;
}

void CloseAll(gui::DesktopSession& session) {
  while (Document* doc = session.workspace().shown()) {
    doc->db().ClearChanged();
    if (!session.workspace().Close()) break;
  }
}

// Paints the list now, as the first frame after a change would.
void Paint(gui::DesktopSession& session) { session.window().list()->viewport()->repaint(); }

void BM_OpenToFirstPaint(benchmark::State& state) {
  const std::string& file = GeneratedFiles().Get(static_cast<size_t>(state.range(0)));
  auto session = NewSession();
  for (auto _ : state) {
    session->workspace().Open(file);
    Paint(*session);
    state.PauseTiming();
    CloseAll(*session);
    state.ResumeTiming();
  }
}

void BM_JumpToLastRow(benchmark::State& state) {
  const std::string& file = GeneratedFiles().Get(static_cast<size_t>(state.range(0)));
  auto session = NewSession();
  session->workspace().Open(file);
  gui::RecordListView* list = session->window().list();
  const int last = static_cast<int>(session->workspace().shown()->rowCount()) - 1;
  bool toEnd = true;
  for (auto _ : state) {
    list->SelectRow(toEnd ? last : 0);
    Paint(*session);
    toEnd = !toEnd;
  }
  CloseAll(*session);
}

void BM_HeaderSort(benchmark::State& state) {
  const std::string& file = GeneratedFiles().Get(static_cast<size_t>(state.range(0)));
  auto session = NewSession();
  session->workspace().Open(file);
  Document* doc = session->workspace().shown();
  // Two fields whose orders have nothing to do with each other, so that
  // every sort really moves the records.
  bool byName = true;
  for (auto _ : state) {
    doc->SortFromHeader(byName ? kName : kCity, true);
    Paint(*session);
    byName = !byName;
  }
  CloseAll(*session);
}

// Auto fit measures the text of the column's every value in the list's font.
void BM_AutoFit(benchmark::State& state) {
  const std::string& file = GeneratedFiles().Get(static_cast<size_t>(state.range(0)));
  auto session = NewSession();
  session->workspace().Open(file);
  Document* doc = session->workspace().shown();
  const QFontMetrics metrics = session->window().list()->fontMetrics();
  for (auto _ : state) {
    doc->AutoFit(kNotes, [&metrics](const std::string& text) {
      return metrics.horizontalAdvance(QString::fromLatin1(text.data(), static_cast<qsizetype>(text.size())));
    });
    Paint(*session);
  }
  CloseAll(*session);
}

BENCHMARK(BM_OpenToFirstPaint)->Arg(100)->Arg(65504)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_JumpToLastRow)->Arg(100)->Arg(65504)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_HeaderSort)->Arg(100)->Arg(65504)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_AutoFit)->Arg(65504)->Unit(benchmark::kMillisecond);

int OpenAndPaint(const char* file, bool sortToo) {
  auto session = NewSession();
  if (!session->workspace().Open(file)) return 1;
  Paint(*session);
  if (sortToo) {
    session->workspace().shown()->SortFromHeader(kName, true);
    Paint(*session);
  }
  CloseAll(*session);
  return 0;
}

}  // namespace
}  // namespace cx::bench

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  if (argc == 3 && std::strcmp(argv[1], "--first-paint") == 0) return cx::bench::OpenAndPaint(argv[2], false);
  if (argc == 3 && std::strcmp(argv[1], "--header-sort") == 0) return cx::bench::OpenAndPaint(argv[2], true);
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
