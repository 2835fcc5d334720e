#include "ops/csv_export.h"

#include <cstdio>
#include <cstring>
#include <optional>

#include "engine/value_text.h"

namespace cx {
namespace {

std::string Printf(const char* pattern, long value) {
  char buf[64];
  std::snprintf(buf, sizeof buf, pattern, value);
  return buf;
}

// The slot shown at `position` of the export's column order.
int SlotAt(const Schema& schema, int position, bool fieldNumberOrder) {
  return fieldNumberOrder ? position : schema.fieldOrder[position];
}

bool IsNotUsed(const Schema& schema, int slot) {
  return slot >= format::kFieldCount || schema.field[slot].type() == FieldType::NotUsed;
}

}  // namespace

void QuoteCsvValue(std::string_view text, std::string& out, bool quoteAll, char separator) {
  if (text.empty()) {
    if (quoteAll) out += "\"\"";
    return;
  }
  auto holds = [&text](char c) { return std::memchr(text.data(), c, text.size()) != nullptr; };
  const bool quotes = holds(csv::kQuote);
  const bool wrap = quoteAll || quotes || holds(separator) || holds('\r') || holds('\n');
  if (wrap) out.push_back(csv::kQuote);
  if (!quotes) {
    out.append(text);
  } else {
    for (char c : text) {
      if (c == csv::kQuote) out.push_back(csv::kQuote);
      out.push_back(c);
    }
  }
  if (wrap) out.push_back(csv::kQuote);
}

int ExportCsvTo(const Database& db, const CsvExportOptions& options, TextSink& out,
                const CsvSettings& settings, const LocaleInfo& locale, UiPort& ui,
                const LinkRestriction* link) {
  const Schema& schema = db.schema();
  const ValueContext values{schema, db.popups(), locale};
  int result = 1;
  std::string line;

  if (options.withHeader) {
    // Separators between the names written, so a Not-Used first column
    // leaves no empty name (the data lines do keep one; readers expect
    // exactly that).
    bool first = true;
    for (int pos = 0; pos < format::kFieldCount; ++pos) {
      int slot = schema.fieldOrder[pos];
      if (IsNotUsed(schema, slot)) continue;
      if (!first) line.push_back(settings.separator);
      first = false;
      QuoteCsvValue(schema.field[slot].name.str(), line, settings.alwaysQuote, settings.separator);
    }
    line.push_back(csv::kLineEnd);
    out.Write(line);
  }

  std::optional<ViewTester> view;
  if (options.filteredOnly) view.emplace(db, link);
  const size_t count = db.recordCount();
  for (size_t index = 0; index < count; ++index) {
    if (view && !view->InView(index)) continue;
    if (ui.WantsStatus()) {
      ui.Status(Printf("Reading and Writing Record %ld...", static_cast<long>(index)));
      ui.Status(Printf("Reading Record: %ld:", static_cast<long>(index) - 30));
    }
    ByteView record = db.record(index);
    if (record.empty()) {
      ui.Status(Printf("ERROR:Reading Record: %ld", static_cast<long>(index)));
      result = 0;
      continue;
    }
    line.clear();
    const auto fieldValues = FieldValues(record);
    for (int pos = 0; pos < format::kFieldCount; ++pos) {
      int slot = SlotAt(schema, pos, options.fieldNumberOrder);
      if (IsNotUsed(schema, slot)) continue;
      if (pos != 0) line.push_back(settings.separator);
      if (schema.field[slot].type() == FieldType::Image) continue;
      std::string text = ValueTextOf(values, slot, fieldValues[slot]);
      if (text.size() > csv::kMaxValueText) text.resize(csv::kMaxValueText);
      QuoteCsvValue(text.empty() ? std::string_view("No Value") : std::string_view(text), line,
                    options.quoteAll, settings.separator);
    }
    line.push_back(csv::kLineEnd);
    if (!out.Write(line)) result = 0;
  }
  return result;
}

int ExportCsv(const Database& db, const CsvExportOptions& options, const std::string& path,
              const CsvSettings& settings, const LocaleInfo& locale, UiPort& ui,
              const LinkRestriction* link) {
  ui.Status("Exporting to .CSV File...");
  FileSink file(path);
  if (!file.Open()) return 0;
  int result = ExportCsvTo(db, options, file, settings, locale, ui, link);
  if (!file.Commit()) return 0;
  return result;
}

}  // namespace cx
