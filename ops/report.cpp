#include "ops/report.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "engine/value_text.h"
#include "ops/value_parse.h"
#include "ops/text_sink.h"
#include "platform/file_io.h"

namespace cx {
namespace {

constexpr size_t kMaxValueText = 2000;

// Starting values; a value beyond them never becomes an extreme, and with
// no entries the totals keep them.
constexpr long kNumberLow = 2000000;
constexpr long kNumberHigh = -2000000;
constexpr long kTimeLow = 86400;
constexpr long kDateLow = 50000;
constexpr long kSecondsPerDay = 86400;

std::string Line(const char* pattern, long value) {
  char buf[128];
  std::snprintf(buf, sizeof buf, pattern, value);
  return buf;
}

std::string Line(const char* pattern, const std::string& text) {
  char buf[256];
  std::snprintf(buf, sizeof buf, pattern, text.c_str());
  return buf;
}

std::string Percentage(const char* pattern, double value, const LocaleInfo& locale) {
  char buf[128];
  std::snprintf(buf, sizeof buf, pattern, value);
  std::string out = buf;
  if (locale.decimalSeparator != '.') {
    size_t dot = out.find('.');
    if (dot != std::string::npos) out[dot] = ',';
  }
  return out;
}

// Sum / count with the remainder rounding half up (toward the larger
// number for positive sums only, as integer division leaves it).
long RoundedAverage(long sum, long count) {
  long quotient = sum / count;
  long remainder = sum % count;
  if (remainder * 2 >= count) ++quotient;
  return quotient;
}

std::string TimeOfSeconds(long seconds, const LocaleInfo& locale) {
  if (seconds < 0) seconds = 0;
  long hours = std::min<long>(seconds / 3600, 254);
  return TimeText(static_cast<uint8_t>(seconds % 60), static_cast<uint8_t>((seconds / 60) % 60),
                  static_cast<uint8_t>(hours), locale);
}

// The display texts of the field over the records in view.
template <typename Visit>
void ForEachValue(const Database& db, int slot, const LocaleInfo& locale,
                  const LinkRestriction* link, Visit visit) {
  const ValueContext values{db.schema(), db.popups(), locale};
  const ViewTester view(db, link);
  for (size_t i = 0; i < db.recordCount(); ++i) {
    if (!view.InView(i)) continue;
    std::string text = ValueText(values, db.record(i), slot);
    if (text.size() > kMaxValueText) text.resize(kMaxValueText);
    visit(text);
  }
}

std::string IntegerReport(const Database& db, int slot, const LocaleInfo& locale,
                          const LinkRestriction* link) {
  long count = 0;
  int32_t low = kNumberLow, high = kNumberHigh, sum = 0;
  int32_t lowTotal = kNumberLow, highTotal = kNumberHigh;
  ForEachValue(db, slot, locale, link, [&](const std::string& text) {
    int32_t v = ParseLong(text);
    ++count;
    low = std::min(low, v);
    high = std::max(high, v);
    // The sum is 32 bits and wraps as such.
    sum = static_cast<int32_t>(static_cast<uint32_t>(sum) + static_cast<uint32_t>(v));
    lowTotal = std::min(lowTotal, sum);
    highTotal = std::max(highTotal, sum);
  });
  long average = 0;
  if (count == 0) {
    low = high = 0;
  } else {
    average = RoundedAverage(sum, count);
  }
  return Line("Number of Entries:\t%ld\r\n", count) + Line("Minimum Value:\t%ld\r\n", low) +
         Line("Maximum Value:\t%ld\r\n", high) + Line("Sum:\t\t%ld\r\n", sum) +
         Line("Minimum Total:\t%ld\r\n", lowTotal) + Line("Maximum Total:\t%ld\r\n", highTotal) +
         Line("Average:\t\t%ld\r\n", average);
}

std::string FloatReport(const Database& db, int slot, const LocaleInfo& locale,
                        const LinkRestriction* link) {
  double count = 0, sum = 0;
  double low = kNumberLow, high = kNumberHigh, lowTotal = kNumberLow, highTotal = kNumberHigh;
  ForEachValue(db, slot, locale, link, [&](const std::string& text) {
    double v = std::strtod(text.c_str(), nullptr);
    count += 1;
    low = std::min(low, v);
    high = std::max(high, v);
    sum += v;
    lowTotal = std::min(lowTotal, sum);
    highTotal = std::max(highTotal, sum);
  });
  double average = 0;
  if (count == 0) {
    low = high = 0;
  } else {
    average = sum / count;
  }
  const int places = DecimalPlaces(db.schema().field[slot]);
  auto number = [&](double v) { return DecimalText(v, places, locale); };
  return Line("Number of Entries:\t%s\r\n", DecimalText(count, 0, locale)) +
         Line("Minimum Value:\t%s\r\n", number(low)) + Line("Maximum Value:\t%s\r\n", number(high)) +
         Line("Sum:\t\t%s\r\n", number(sum)) + Line("Minimum Total:\t%s\r\n", number(lowTotal)) +
         Line("Maximum Total:\t%s\r\n", number(highTotal)) +
         Line("Average:\t\t%s\r\n", number(average));
}

std::string CheckBoxReport(const Database& db, int slot, const LocaleInfo& locale,
                           const LinkRestriction* link) {
  long entries = 0, checked = 0;
  ForEachValue(db, slot, locale, link, [&](const std::string& text) {
    ++entries;
    if (ParseLong(text) != 0) ++checked;
  });
  double checkedShare = entries ? static_cast<double>(checked) / entries * 100.0 : 0.0;
  double restShare = entries ? static_cast<double>(entries - checked) / entries * 100.0 : 0.0;
  return Line("Number of Entries:\t\t%ld\r\n", entries) +
         Line("Items Checked:\t\t%ld\r\n", checked) +
         Line("Items Not-Checked:\t\t%ld\r\n", entries - checked) +
         Percentage("Percentage Checked:\t\t%5.2f\r\n", checkedShare, locale) +
         Percentage("Percentage Not-Checked:\t%5.2f\r\n", restShare, locale);
}

std::string TimeReport(const Database& db, int slot, const LocaleInfo& locale,
                       const LinkRestriction* link) {
  long count = 0;
  int32_t low = kTimeLow, high = 0, sum = 0;
  ForEachValue(db, slot, locale, link, [&](const std::string& text) {
    // Seconds are not read; a text that is no time ("No Time") counts as 0.
    std::optional<ClockTime> t = ParseTimeText(text, locale);
    int64_t seconds = t ? (int64_t{t->hours} * 60 + t->minutes) * 60 : 0;
    int32_t v = static_cast<int32_t>(std::min<int64_t>(seconds, INT32_MAX));
    ++count;
    low = std::min(low, v);
    high = std::max(high, v);
    sum = static_cast<int32_t>(static_cast<uint32_t>(sum) + static_cast<uint32_t>(v));
  });
  long average = 0;
  if (count == 0) {
    low = high = 0;
  } else {
    average = RoundedAverage(sum, count);
  }
  std::string text = Line("Number of Entries:\t%ld\r\n", count) +
                     Line("Minimum Value:\t%s\r\n", TimeOfSeconds(low, locale)) +
                     Line("Maximum Value:\t%s\r\n", TimeOfSeconds(high, locale)) +
                     Line("Average Time:\t%s\r\n", TimeOfSeconds(average, locale));
  if (sum >= kSecondsPerDay) {
    // This line has no colon after "Total Time"; files read by people and
    // scripts alike have always looked so.
    text += Line("Total Time\t%ld Day(s), ", static_cast<long>(sum / kSecondsPerDay));
    text += TimeOfSeconds(sum % kSecondsPerDay, locale) + "\r\n";
  } else {
    text += Line("Total Time:\t%s\r\n", TimeOfSeconds(sum, locale));
  }
  return text;
}

std::string DateReport(const Database& db, int slot, const LocaleInfo& locale,
                       const LinkRestriction* link) {
  long count = 0;
  uint32_t low = kDateLow, high = 0;
  ForEachValue(db, slot, locale, link, [&](const std::string& text) {
    ++count;
    uint32_t day = DateTextToDayNumber(text, locale);
    if (day == 0) return;  // no date: an entry, but no extreme
    low = std::min(low, day);
    high = std::max(high, day);
  });
  long spanned = count ? static_cast<long>(high) - static_cast<long>(low) : 0;
  return Line("Number of Entries:\t%ld\r\n", count) +
         Line("Minimum Value:\t%s\r\n", DateText(low, locale)) +
         Line("Maximum Value:\t%s\r\n", DateText(high, locale)) +
         Line("Days Spanned:\t%ld\r\n", spanned);
}

}  // namespace

std::optional<ReportKind> ReportKindFor(const FieldDef& field) {
  switch (field.type()) {
    case FieldType::Integer: return ReportKind::Integer;
    case FieldType::Float: return ReportKind::Float;
    case FieldType::CheckBox: return ReportKind::CheckBox;
    case FieldType::Time: return ReportKind::Time;
    case FieldType::Date: return ReportKind::Date;
    case FieldType::Calculated:
      switch (static_cast<ResultFormat>(field.resultFormat())) {
        case ResultFormat::Integer: return ReportKind::Integer;
        case ResultFormat::Time: return ReportKind::Time;
        case ResultFormat::Date: return ReportKind::Date;
        default: return ReportKind::Float;
      }
    default:
      return std::nullopt;
  }
}

std::optional<std::string> BuildReport(const Database& db, int fieldSlot, const LocaleInfo& locale,
                                       const LinkRestriction* link) {
  if (fieldSlot < 0 || fieldSlot >= format::kFieldCount) return std::nullopt;
  const FieldDef& field = db.schema().field[fieldSlot];
  std::optional<ReportKind> kind = ReportKindFor(field);
  if (!kind) return std::nullopt;
  std::string text = Line("Report for %s\r\n", field.name.str());
  switch (*kind) {
    case ReportKind::Integer: text += IntegerReport(db, fieldSlot, locale, link); break;
    case ReportKind::Float: text += FloatReport(db, fieldSlot, locale, link); break;
    case ReportKind::CheckBox: text += CheckBoxReport(db, fieldSlot, locale, link); break;
    case ReportKind::Time: text += TimeReport(db, fieldSlot, locale, link); break;
    case ReportKind::Date: text += DateReport(db, fieldSlot, locale, link); break;
  }
  return text;
}

std::optional<std::string> RunReport(const Database& db, int fieldSlot, const LocaleInfo& locale,
                                     UiPort& ui, const LinkRestriction* link) {
  std::optional<std::string> text = BuildReport(db, fieldSlot, locale, link);
  if (!text) ui.ShowMessage(kReportTypesMessage, "ERROR", MessageIcon::Error);
  return text;
}

Status ExportReportText(const std::string& report, const std::string& path) {
  FileSink file(path);
  if (Status s = file.Open(); !s) return s;
  file.Write(report);
  file.Write("\n");
  return file.Commit();
}

}  // namespace cx
