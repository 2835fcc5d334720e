// CSV files come from spreadsheets, other programs and hand editing. The
// reader must walk any bytes line by line, always moving on, reading a file
// the same way as the same text in memory; importing must give well-formed
// records; and what export quotes must read back as the value it was.
//
// Input: one byte of settings, then the text. Bit 0: columns by slot
// (else by display order); bit 1: ';' as the separator; bit 2: records with
// the prefix extension; bit 3: the Pop-Up list already full.
#include <algorithm>
#include <string>
#include <vector>

#include "bench/generator.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "fuzz/fuzz_check.h"
#include "fuzz/scratch.h"
#include "fuzz/targets.h"
#include "ops/csv_export.h"
#include "ops/csv_import.h"
#include "ops/csv_reader.h"
#include "ops/text_sink.h"
#include "platform/clock.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx::fuzz {
namespace {

std::vector<CsvLine> ReadAll(CsvStream& in, char separator, size_t limit) {
  std::vector<CsvLine> lines;
  uint64_t last = in.Tell();
  CsvLine line;
  while (ReadCsvLine(in, line, separator)) {
    CX_FUZZ_CHECK(in.Tell() > last);  // every line takes at least one byte
    last = in.Tell();
    CX_FUZZ_CHECK(line.fields.size() >= csv::kMinimumFields);
    CX_FUZZ_CHECK(line.found <= line.fields.size());
    lines.push_back(line);
    CX_FUZZ_CHECK(lines.size() <= limit);
  }
  return lines;
}

bool SameLine(const CsvLine& a, const CsvLine& b) { return a.found == b.found && a.fields == b.fields; }

// What a value becomes after being quoted and read back: line ends inside
// quotes read as CR.
std::string AfterRoundTrip(std::string text) {
  std::replace(text.begin(), text.end(), '\n', '\r');
  return text;
}

void CheckQuoting(const std::string& value, char separator) {
  for (bool quoteAll : {false, true}) {
    std::string quoted;
    QuoteCsvValue(value, quoted, quoteAll, separator);
    quoted += separator;
    quoted += "x\n";
    CsvStream in(quoted);
    CsvLine line;
    CX_FUZZ_CHECK(ReadCsvLine(in, line, separator));
    CX_FUZZ_CHECK(line.Field(0) == AfterRoundTrip(value));
    CX_FUZZ_CHECK(line.Field(1) == "x");
    CX_FUZZ_CHECK(!ReadCsvLine(in, line, separator));
  }
}

Database TargetDatabase(const std::string& path, uint8_t settings) {
  bench::GeneratorOptions options;
  options.records = 0;
  options.extension = settings & 4;
  Database db = bench::GenerateDatabase(path, options);
  if (settings & 8) {
    auto& items = db.popups()[bench::kColor].items;
    while (items.size() < static_cast<size_t>(format::kMaxPopupItems)) {
      items.push_back("Entry " + std::to_string(items.size()));
    }
  }
  return db;
}

void CheckImported(const Database& db) {
  for (size_t r = 0; r < db.recordCount(); ++r) {
    ByteView record = db.record(r);
    CX_FUZZ_CHECK(RecordIsWellFormed(record));
    CX_FUZZ_CHECK(record.size() < format::kMaxRecordSize);
  }
  for (const PopupList& list : db.popups()) {
    CX_FUZZ_CHECK(list.items.size() <= static_cast<size_t>(format::kMaxPopupItems));
    for (const std::string& item : list.items) CX_FUZZ_CHECK(item.size() <= format::kMaxPopupText);
  }
}

}  // namespace

int FuzzCsv(const uint8_t* data, size_t size) {
  if (size == 0) return 0;
  const uint8_t settings = data[0];
  const std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);
  const int mode = (settings & 1) ? kCsvColumnsBySlot : kCsvColumnsByDisplayOrder;
  CsvSettings csv;
  csv.separator = (settings & 2) ? ';' : ',';
  const LocaleInfo locale;

  // Measuring walks the whole text, line by line, to its end.
  {
    CsvStream in(text);
    uint64_t total = 0;
    for (uint64_t n; (n = MeasureCsvLine(in, csv.separator)) != 0;) total += n;
    CX_FUZZ_CHECK(total == text.size());
    CX_FUZZ_CHECK(in.Tell() == text.size());
  }

  CsvStream memory(text);
  const std::vector<CsvLine> lines = ReadAll(memory, csv.separator, text.size());
  const std::string path = WriteScratch("input.csv", data + 1, size - 1);
  {
    CsvStream file;
    CX_FUZZ_CHECK(file.Open(path).ok());
    const std::vector<CsvLine> fromFile = ReadAll(file, csv.separator, text.size());
    CX_FUZZ_CHECK(fromFile.size() == lines.size());
    for (size_t i = 0; i < lines.size(); ++i) CX_FUZZ_CHECK(SameLine(lines[i], fromFile[i]));
  }

  for (const CsvLine& line : lines) {
    for (size_t f = 0; f < line.found && f < 4; ++f) CheckQuoting(line.fields[f], csv.separator);
  }

  Database db = TargetDatabase(ScratchPath("csv.PDB"), settings);
  for (const CsvLine& line : lines) CX_FUZZ_CHECK(ImportCsvRecord(db, line, mode, locale));
  CX_FUZZ_CHECK(db.recordCount() == lines.size());
  CheckImported(db);

  Database fromFile = TargetDatabase(ScratchPath("csv-file.PDB"), settings);
  CsvImportResult result = ImportCsvFile(fromFile, path, mode, csv, locale);
  CX_FUZZ_CHECK(result.status.ok());
  CX_FUZZ_CHECK(result.lines == lines.size() && result.imported == lines.size());
  CheckImported(fromFile);

  // Every record exports as one line that reads back.
  SilentUi ui;
  StringSink out;
  CsvExportOptions options;
  options.fieldNumberOrder = mode == kCsvColumnsBySlot;
  ExportCsvTo(db, options, out, csv, locale, ui);
  CsvStream exported(out.text);
  CX_FUZZ_CHECK(ReadAll(exported, csv.separator, out.text.size()).size() == db.recordCount());

  const FixedClock clock(1700000000);
  CX_FUZZ_CHECK(db.SaveAs(db.path(), clock).ok());
  Database reopened;
  CX_FUZZ_CHECK(reopened.Open(db.path(), ui).ok());
  CX_FUZZ_CHECK(reopened.recordCount() == db.recordCount());
  return 0;
}

}  // namespace cx::fuzz
