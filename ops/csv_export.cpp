#include "ops/csv_export.h"

#include <algorithm>
#include <array>
#include <condition_variable>
#include <cstdio>
#include <cstring>
#include <mutex>
#include <optional>
#include <thread>
#include <vector>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

#include "engine/value_text.h"
#include "platform/run_beside.h"

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

// Where `text` first holds a byte that makes a value need quotes (a double
// quote, the separator, CR or LF) or, with kStopAtZero, a zero byte (the end
// of a stored value), or npos. Export asks this of every value and most
// hold none, so long ones are scanned 16 bytes at a time. No load reaches
// past the text's end: a stored value may end its file image.
template <bool kStopAtZero>
size_t FirstOf(std::string_view text, char separator) {
  auto stop = [separator](char c) {
    return (kStopAtZero && c == '\0') || c == csv::kQuote || c == separator || c == '\r' || c == '\n';
  };
  size_t i = 0;
#if defined(__SSE2__)
  if (text.size() >= 16) {
    const __m128i quote = _mm_set1_epi8(csv::kQuote);
    const __m128i sep = _mm_set1_epi8(separator);
    const __m128i cr = _mm_set1_epi8('\r');
    const __m128i lf = _mm_set1_epi8('\n');
    auto hits = [&](size_t at) {
      const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text.data() + at));
      __m128i any = _mm_or_si128(_mm_or_si128(_mm_cmpeq_epi8(v, quote), _mm_cmpeq_epi8(v, sep)),
                                 _mm_or_si128(_mm_cmpeq_epi8(v, cr), _mm_cmpeq_epi8(v, lf)));
      if constexpr (kStopAtZero) any = _mm_or_si128(any, _mm_cmpeq_epi8(v, _mm_setzero_si128()));
      return static_cast<unsigned>(_mm_movemask_epi8(any));
    };
    for (; i + 16 <= text.size(); i += 16) {
      if (unsigned mask = hits(i)) return i + static_cast<size_t>(__builtin_ctz(mask));
    }
    // The last bytes as one more block that overlaps the one before.
    if (i < text.size()) {
      const size_t at = text.size() - 16;
      if (unsigned mask = hits(at)) return at + static_cast<size_t>(__builtin_ctz(mask));
    }
    return std::string_view::npos;
  }
#endif
  for (; i < text.size(); ++i) {
    if (stop(text[i])) return i;
  }
  return std::string_view::npos;
}

size_t FirstSpecial(std::string_view text, char separator) { return FirstOf<false>(text, separator); }

// One pass over the record's own bytes tells whether the text can be copied
// out as it is.
size_t FirstStop(std::string_view text, char separator) { return FirstOf<true>(text, separator); }

constexpr size_t kWriteBlock = size_t{1} << 16;

// Exports of this many records and more format their lines on two
// threads: formatting is most of a large export's time, and below this a
// second thread saves less than it costs to start.
constexpr size_t kParallelRecords = 4096;

// Formats the lines of the records `indexes` in groups, on this thread and
// one more, and writes the groups in order from this thread. A group's
// buffer is reused once it is written, so memory stays at a few groups
// whatever the size of the export. `reportEmpty` is called, on this
// thread and in order, for records without bytes. False when a write
// failed.
template <typename AppendLine, typename ReportEmpty>
bool FormatInTwoThreads(const std::vector<uint32_t>& indexes, const Database& db,
                        AppendLine& appendLine, ReportEmpty& reportEmpty, TextSink& out) {
  constexpr size_t kGroup = 1024;    // records
  constexpr size_t kInFlight = 4;    // groups formatted ahead of the writing
  struct Group {
    std::string lines;
    std::string text;
    std::vector<uint32_t> empty;  // records without bytes
    bool ready = false;
  };
  const size_t groups = (indexes.size() + kGroup - 1) / kGroup;
  std::array<Group, kInFlight> slots;
  std::mutex mutex;
  std::condition_variable changed;
  size_t next = 0;     // the next group to format
  size_t written = 0;  // groups written so far
  bool ok = true;

  auto format = [&](size_t g) {
    Group& group = slots[g % kInFlight];
    group.lines.clear();
    group.empty.clear();
    const size_t end = std::min(indexes.size(), (g + 1) * kGroup);
    for (size_t i = g * kGroup; i < end; ++i) {
      const ByteView record = db.record(indexes[i]);
      if (record.empty()) {
        group.empty.push_back(indexes[i]);
      } else {
        appendLine(record, group.lines, group.text);
      }
    }
  };
  // Takes the next group that may be formatted now, waiting while all
  // buffers hold groups not yet written; false when none is left.
  auto take = [&](std::unique_lock<std::mutex>& lock, size_t& g) {
    changed.wait(lock, [&] { return next >= groups || next < written + kInFlight; });
    if (next >= groups) return false;
    g = next++;
    return true;
  };

  // The second thread formats groups ahead; without one, this thread
  // formats every group itself and the other finds none left.
  auto helper = [&] {
    std::unique_lock<std::mutex> lock(mutex);
    size_t g = 0;
    while (take(lock, g)) {
      lock.unlock();
      format(g);
      lock.lock();
      slots[g % kInFlight].ready = true;
      changed.notify_all();
    }
  };
  auto writer = [&] {
    std::unique_lock<std::mutex> lock(mutex);
    while (written < groups) {
      Group& due = slots[written % kInFlight];
      size_t g = 0;
      if (!due.ready && next < groups && next < written + kInFlight) {
        take(lock, g);
        lock.unlock();
        format(g);
        lock.lock();
        slots[g % kInFlight].ready = true;
        changed.notify_all();
        continue;
      }
      changed.wait(lock, [&] { return due.ready; });
      lock.unlock();
      for (uint32_t index : due.empty) reportEmpty(index);
      if (!due.lines.empty() && !out.Write(due.lines)) ok = false;
      lock.lock();
      due.ready = false;
      ++written;
      changed.notify_all();
    }
    lock.unlock();
  };
  RunBeside(helper, writer);
  return ok;
}

bool IsNotUsed(const Schema& schema, int slot) {
  return slot >= format::kFieldCount || schema.field[slot].type() == FieldType::NotUsed;
}

}  // namespace

namespace {

// QuoteCsvValue of a text not empty whose first special byte is known.
void QuoteFrom(std::string_view text, size_t first, std::string& out, bool quoteAll) {
  const bool wrap = quoteAll || first != std::string_view::npos;
  const bool quotes = first != std::string_view::npos &&
                      std::memchr(text.data() + first, csv::kQuote, text.size() - first) != nullptr;
  if (wrap) out.push_back(csv::kQuote);
  if (!quotes) {
    out.append(text);
  } else {
    // Runs up to and including each quote, then the quote once more.
    size_t from = 0;
    for (;;) {
      const void* quote = std::memchr(text.data() + from, csv::kQuote, text.size() - from);
      const size_t to = quote ? static_cast<size_t>(static_cast<const char*>(quote) - text.data()) + 1
                              : text.size();
      out.append(text.data() + from, to - from);
      if (!quote) break;
      out.push_back(csv::kQuote);
      from = to;
    }
  }
  if (wrap) out.push_back(csv::kQuote);
}

}  // namespace

void QuoteCsvValue(std::string_view text, std::string& out, bool quoteAll, char separator) {
  if (text.empty()) {
    if (quoteAll) out += "\"\"";
    return;
  }
  QuoteFrom(text, FirstSpecial(text, separator), out, quoteAll);
}

int ExportCsvTo(const Database& db, const CsvExportOptions& options, TextSink& out,
                const CsvSettings& settings, const LocaleInfo& locale, UiPort& ui,
                const LinkRestriction* link) {
  const Schema& schema = db.schema();
  const ValueTextWriter values(ValueContext{schema, db.popups(), locale});
  int result = 1;
  std::string pending;  // whole lines not yet written
  std::string text;

  if (options.withHeader) {
    // Separators between the names written, so a Not-Used first column
    // leaves no empty name (the data lines do keep one; readers expect
    // exactly that).
    bool first = true;
    for (int pos = 0; pos < format::kFieldCount; ++pos) {
      int slot = schema.fieldOrder[pos];
      if (IsNotUsed(schema, slot)) continue;
      if (!first) pending.push_back(settings.separator);
      first = false;
      QuoteCsvValue(schema.field[slot].name.str(), pending, settings.alwaysQuote, settings.separator);
    }
    pending.push_back(csv::kLineEnd);
    out.Write(pending);
    pending.clear();
  }

  // The columns of every line, worked out once.
  struct Column {
    int slot;
    bool separatorBefore;
    bool image;        // an empty column
    bool storedBytes;  // text is the stored bytes (ShowsStoredBytes)
  };
  std::vector<Column> columns;
  for (int pos = 0; pos < format::kFieldCount; ++pos) {
    const int slot = SlotAt(schema, pos, options.fieldNumberOrder);
    if (IsNotUsed(schema, slot)) continue;
    columns.push_back({slot, pos != 0, schema.field[slot].type() == FieldType::Image,
                       values.ShowsStoredBytes(slot)});
  }
  std::string noValue;
  QuoteCsvValue("No Value", noValue, options.quoteAll, settings.separator);

  // One record's line, appended to `lines`; `text` is room for a value
  // being quoted. Reads only the database, so two threads may run it.
  auto appendLine = [&](ByteView record, std::string& lines, std::string& text) {
    const auto fieldValues = FieldValues(record);
    for (const Column& column : columns) {
      if (column.separatorBefore) lines.push_back(settings.separator);
      if (column.image) continue;
      const std::optional<ByteView>& stored = fieldValues[column.slot];
      if (column.storedBytes && stored && !options.quoteAll) {
        // Most texts need no quotes and are copied straight from the record.
        const std::string_view bytes(reinterpret_cast<const char*>(stored->data()), stored->size());
        const size_t stop = FirstStop(bytes, settings.separator);
        size_t length = stop == std::string_view::npos ? bytes.size() : stop;
        if (stop != std::string_view::npos && bytes[stop] != '\0') {
          const void* end = std::memchr(bytes.data() + stop, 0, bytes.size() - stop);
          length = end ? static_cast<size_t>(static_cast<const char*>(end) - bytes.data()) : bytes.size();
        }
        length = std::min(length, csv::kMaxValueText);
        if (length == 0) {
          lines += noValue;
        } else if (stop < length) {
          QuoteFrom(bytes.substr(0, length), stop, lines, false);
        } else {
          lines.append(bytes.data(), length);
        }
        continue;
      }
      // The others are formatted in place, and only the rare one that
      // needs quotes is taken out again and quoted.
      const size_t start = lines.size();
      values.Append(column.slot, stored, lines);
      if (lines.size() - start > csv::kMaxValueText) lines.resize(start + csv::kMaxValueText);
      const std::string_view value(lines.data() + start, lines.size() - start);
      if (value.empty()) {
        lines += noValue;
      } else if (options.quoteAll || FirstSpecial(value, settings.separator) != std::string_view::npos) {
        text.assign(value);
        lines.resize(start);
        QuoteCsvValue(text, lines, options.quoteAll, settings.separator);
      }
    }
    lines.push_back(csv::kLineEnd);
  };
  auto reportEmpty = [&](size_t index) {
    ui.Status(Printf("ERROR:Reading Record: %ld", static_cast<long>(index)));
    result = 0;
  };

  std::optional<ViewTester> view;
  if (options.filteredOnly) view.emplace(db, link);
  const size_t count = db.recordCount();
  if (!ui.WantsStatus() && count >= kParallelRecords && std::thread::hardware_concurrency() > 1) {
    std::vector<uint32_t> indexes;
    indexes.reserve(count);
    for (size_t index = 0; index < count; ++index) {
      if (!view || view->InView(index)) indexes.push_back(static_cast<uint32_t>(index));
    }
    if (!FormatInTwoThreads(indexes, db, appendLine, reportEmpty, out)) result = 0;
    return result;
  }
  for (size_t index = 0; index < count; ++index) {
    if (view && !view->InView(index)) continue;
    if (ui.WantsStatus()) {
      ui.Status(Printf("Reading and Writing Record %ld...", static_cast<long>(index)));
      ui.Status(Printf("Reading Record: %ld:", static_cast<long>(index) - 30));
    }
    ByteView record = db.record(index);
    if (record.empty()) {
      reportEmpty(index);
      continue;
    }
    appendLine(record, pending, text);
    // Lines go out in blocks: one write per line would copy every byte
    // once more into the sink's own buffer.
    if (pending.size() >= kWriteBlock) {
      if (!out.Write(pending)) result = 0;
      pending.clear();
    }
  }
  if (!pending.empty() && !out.Write(pending)) result = 0;
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
