#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>

#include "engine/byte_order.h"
#include "ops/csv_export.h"
#include "ops/csv_import.h"
#include "ops/csv_reader.h"
#include "ops/database_settings.h"
#include "ops/value_parse.h"
#include "platform/file_io.h"
#include "tests/ops/output_fixture.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::SampleDatabase;
using testing::TempDir;
using Rows = std::vector<std::vector<std::string>>;

std::vector<std::string> Fields(const std::string& text, char separator = ',') {
  CsvStream in(text);
  CsvLine line;
  EXPECT_TRUE(ReadCsvLine(in, line, separator));
  return std::vector<std::string>(line.fields.begin(), line.fields.begin() + line.found);
}

std::string Quote(const std::string& text, bool quoteAll, char separator = ',') {
  std::string out;
  QuoteCsvValue(text, out, quoteAll, separator);
  return out;
}

TEST(CsvQuoteTest, QuotesOnlyWhatNeedsIt) {
  EXPECT_EQ(Quote("plain", false), "plain");
  EXPECT_EQ(Quote("plain", true), "\"plain\"");
  EXPECT_EQ(Quote("a,b", false), "\"a,b\"");
  EXPECT_EQ(Quote("say \"hi\"", false), "\"say \"\"hi\"\"\"");
  EXPECT_EQ(Quote("two\rlines", false), "\"two\rlines\"");
  EXPECT_EQ(Quote("two\nlines", false), "\"two\nlines\"");
  EXPECT_EQ(Quote("", false), "");
  EXPECT_EQ(Quote("", true), "\"\"");
  // The separator in force decides, not the comma.
  EXPECT_EQ(Quote("a,b", false, ';'), "a,b");
  EXPECT_EQ(Quote("a;b", false, ';'), "\"a;b\"");
}

// Long values are scanned in blocks: a character that needs quotes must
// be found at any place of a value of any length, including the bytes a
// block does not cover and a second quote after the first special byte.
TEST(CsvQuoteTest, FindsTheSpecialByteAtEveryPlace) {
  for (size_t length = 1; length <= 40; ++length) {
    for (size_t at = 0; at < length; ++at) {
      for (char special : {'"', ';', '\r', '\n'}) {
        std::string text(length, 'x');
        text[at] = special;
        std::string expected = "\"" + text.substr(0, at) + (special == '"' ? "\"\"" : std::string(1, special)) +
                               text.substr(at + 1) + "\"";
        EXPECT_EQ(Quote(text, false, ';'), expected) << length << " " << at << " " << int(special);
      }
      // A quote after the first special byte is doubled as well.
      std::string twoKinds(length, 'y');
      twoKinds[at] = '\n';
      twoKinds.back() = '"';
      const std::string doubled = twoKinds.substr(0, length - 1) + "\"\"";
      EXPECT_EQ(Quote(twoKinds, false), "\"" + doubled + "\"") << length << " " << at;
    }
    EXPECT_EQ(Quote(std::string(length, 'x'), false, ';'), std::string(length, 'x'));
  }
}

TEST(CsvReadTest, SeparatorAfterClosingQuoteBelongsToIt) {
  CsvStream in("a,,\"b,c\",\nnext\n");
  CsvLine line;
  ASSERT_TRUE(ReadCsvLine(in, line));
  EXPECT_EQ(line.found, 3u);
  ASSERT_EQ(line.fields.size(), 30u);
  EXPECT_EQ(line.fields[0], "a");
  EXPECT_EQ(line.fields[1], "");
  EXPECT_EQ(line.fields[2], "b,c");
  for (size_t i = 3; i < 30; ++i) EXPECT_EQ(line.fields[i], "");
  ASSERT_TRUE(ReadCsvLine(in, line));  // left at the start of the next line
  EXPECT_EQ(line.found, 1u);
  EXPECT_EQ(line.fields[0], "next");
  EXPECT_FALSE(ReadCsvLine(in, line));

  EXPECT_EQ(Fields("a,\n"), (std::vector<std::string>{"a", ""}));
  EXPECT_EQ(Fields(",\n"), (std::vector<std::string>{""}));
  EXPECT_EQ(Fields(",,x\n"), (std::vector<std::string>{"", "", "x"}));
}

TEST(CsvReadTest, QuotingRules) {
  EXPECT_EQ(Fields("\"say \"\"hi\"\"\",2\n"), (std::vector<std::string>{"say \"hi\"", "2"}));
  // A quote inside an unquoted value is dropped and quotes the rest.
  EXPECT_EQ(Fields("ab\"c,d\"e\n"), (std::vector<std::string>{"abc,d", "e"}));
  // A closing quote followed by anything else ends the value there.
  EXPECT_EQ(Fields("\"abc\"x,y\n"), (std::vector<std::string>{"abc", "x", "y"}));
  EXPECT_EQ(Fields("a,\"q\"\n"), (std::vector<std::string>{"a", "q"}));
  EXPECT_EQ(Fields("\"\",\"\"\n"), (std::vector<std::string>{"", ""}));
  // Blanks are part of the values.
  EXPECT_EQ(Fields(" a , b \n"), (std::vector<std::string>{" a ", " b "}));
  EXPECT_EQ(Fields("a;b,c\n", ';'), (std::vector<std::string>{"a", "b,c"}));
  // An unfinished quote runs to the end of the file.
  EXPECT_EQ(Fields("\"open,end"), (std::vector<std::string>{"open,end"}));
}

TEST(CsvReadTest, LineBreaksInsideQuotesBecomeCrEach) {
  EXPECT_EQ(Fields("\"one\r\ntwo\",3\r\n"), (std::vector<std::string>{"one\r\rtwo", "3"}));
  EXPECT_EQ(Fields("\"one\ntwo\"\n"), (std::vector<std::string>{"one\rtwo"}));
  EXPECT_EQ(Fields("\"one\rtwo\"\n"), (std::vector<std::string>{"one\rtwo"}));
}

TEST(CsvReadTest, LineEndsAndLengths) {
  // CR LF and LF CR are one line end; a lone CR, LF or zero byte ends a
  // line too.
  const std::string text = std::string("a\r\nb\n\rc\rd\ne") + '\0' + "f\r\n\r\n\"x\ny\"\n";
  CsvStream in(text);
  EXPECT_EQ(MeasureCsvLine(in), 3u);   // a CR LF
  EXPECT_EQ(MeasureCsvLine(in), 3u);   // b LF CR
  EXPECT_EQ(MeasureCsvLine(in), 2u);   // c CR
  EXPECT_EQ(MeasureCsvLine(in), 2u);   // d LF
  EXPECT_EQ(MeasureCsvLine(in), 2u);   // e NUL
  EXPECT_EQ(MeasureCsvLine(in), 3u);   // f CR LF
  EXPECT_EQ(MeasureCsvLine(in), 2u);   // an empty line
  EXPECT_EQ(MeasureCsvLine(in), 6u);   // a quoted value over two lines
  EXPECT_EQ(MeasureCsvLine(in), 0u);

  CsvStream again(text);
  CsvLine line;
  std::vector<std::string> firsts;
  std::vector<size_t> counts;
  while (ReadCsvLine(again, line)) {
    firsts.push_back(line.fields[0]);
    counts.push_back(line.found);
  }
  EXPECT_EQ(firsts, (std::vector<std::string>{"a", "b", "c", "d", "e", "f", "", "x\ry"}));
  EXPECT_EQ(counts, (std::vector<size_t>{1, 1, 1, 1, 1, 1, 0, 1}));
}

TEST(CsvReadTest, KeepsMoreThanThirtyFieldsAndReadsFilesAcrossBuffers) {
  TempDir dir;
  std::string wide;
  for (int i = 0; i < 40; ++i) wide += (i ? "," : "") + std::to_string(i);
  std::string big(70000, 'x');  // longer than the reader's buffer
  std::string text = wide + "\n\"" + big + "\",end\nlast";
  ASSERT_TRUE(WriteFileSafely(dir.File("in.csv"), text.data(), text.size()));
  CsvStream in;
  ASSERT_TRUE(in.Open(dir.File("in.csv")));
  CsvLine line;
  ASSERT_TRUE(ReadCsvLine(in, line));
  EXPECT_EQ(line.found, 40u);
  EXPECT_EQ(line.fields[39], "39");
  ASSERT_TRUE(ReadCsvLine(in, line));
  EXPECT_EQ(line.fields[0], big);
  EXPECT_EQ(line.fields[1], "end");
  ASSERT_TRUE(ReadCsvLine(in, line));
  EXPECT_EQ(line.fields[0], "last");
  EXPECT_FALSE(ReadCsvLine(in, line));
}

// Dates and times of imported columns (and of reports) read back through
// the locale's patterns.
TEST(ValueParseTest, DatesFollowThePatternsOrderAndTheCenturyRule) {
  LocaleInfo us;
  auto date = [](std::string_view text, const LocaleInfo& l) {
    std::optional<CalendarDate> d = ParseDateText(text, l);
    return d ? std::to_string(d->year) + "-" + std::to_string(d->month) + "-" + std::to_string(d->day)
             : std::string("none");
  };
  EXPECT_EQ(date("3/7/2024", us), "2024-3-7");
  EXPECT_EQ(date("3/7/29", us), "2029-3-7");
  EXPECT_EQ(date("3/7/30", us), "1930-3-7");
  EXPECT_EQ(date("3/7/0", us), "2000-3-7");
  EXPECT_EQ(date("2024-03-07", us), "2024-3-7");  // year first, whatever the pattern
  EXPECT_EQ(date("2/29/1900", us), "1900-2-29");  // every fourth year is a leap year
  EXPECT_EQ(date("2/29/2023", us), "none");
  EXPECT_EQ(date("13/1/2024", us), "none");
  EXPECT_EQ(date("NO DATE", us), "none");
  EXPECT_EQ(date("", us), "none");
  EXPECT_EQ(date("3/7", us), "none");
  LocaleInfo de;
  de.shortDate = "dd.MMM.yy";
  de.dateSeparator = '.';
  EXPECT_EQ(date("01.02.05", de), "2005-2-1");
  EXPECT_EQ(date(DateText(DateTextToDayNumber("31.12.99", de), de), de), "1999-12-31");
  EXPECT_EQ(DateTextToDayNumber("1/1/1905", us), 366u);
  EXPECT_EQ(DateTextToDayNumber("1/1/1904", us), 0u);
  EXPECT_EQ(DateTextToDayNumber("12/31/1903", us), 0u);
}

TEST(ValueParseTest, TimesWithDesignatorsAndTwentyFourHourPatterns) {
  LocaleInfo us;
  auto time = [](std::string_view text, const LocaleInfo& l) {
    std::optional<ClockTime> t = ParseTimeText(text, l);
    return t ? std::to_string(t->hours) + ":" + std::to_string(t->minutes) + ":" + std::to_string(t->seconds)
             : std::string("none");
  };
  EXPECT_EQ(time("1:05:09 PM", us), "13:5:9");
  EXPECT_EQ(time("12:30:00 AM", us), "0:30:0");
  EXPECT_EQ(time("12:30:00 pm", us), "12:30:0");
  EXPECT_EQ(time("7:45", us), "7:45:0");
  EXPECT_EQ(time("No Time", us), "none");
  EXPECT_EQ(time("7", us), "none");
  LocaleInfo h24;
  h24.timeFormat = "HH.mm.ss";
  h24.timeSeparator = '.';
  h24.am = "";
  h24.pm = "";
  EXPECT_EQ(time("23.59.58", h24), "23:59:58");
  EXPECT_EQ(time("26.00.00", h24), "26:0:0");  // calculated times pass a day
  LocaleInfo before;  // designator first, minutes before hours
  before.timeFormat = "tt mm:h";
  before.am = "vorm.";
  before.pm = "nachm.";
  EXPECT_EQ(time("nachm. 15:2", before), "14:15:0");
}

// Two fields, default display order: the simplest exact bytes.
Database TwoFieldDatabase() {
  Database db = Database::CreateNew("/nonexistent/Two.PDB", "Two");
  testing::DefineField(db.schema(), 0, FieldType::Text, "Item name");
  testing::DefineField(db.schema(), 1, FieldType::Integer, "Count");
  for (auto [name, count] : {std::pair<const char*, int>{"pen", 3}, {"ink, blue", -1}, {"", 0}}) {
    Bytes rec = NewEditingRecord(db.schema());
    SetEditingText(rec, 0, name, db.schema());
    SetEditingNumber(rec, 1, static_cast<uint32_t>(count), db.schema());
    db.AppendRecord(Compact(rec, db.schema()));
  }
  return db;
}

std::string ExportToString(const Database& db, const CsvExportOptions& options,
                           const CsvSettings& settings = {}) {
  StringSink sink;
  SilentUi ui;
  EXPECT_EQ(ExportCsvTo(db, options, sink, settings, LocaleInfo(), ui), 1);
  return sink.text;
}

TEST(CsvExportTest, ExactBytesOfEachSwitch) {
  Database db = TwoFieldDatabase();
  EXPECT_EQ(ExportToString(db, {}), "pen,3\n\"ink, blue\",-1\nNo Value,0\n");
  CsvExportOptions all;
  all.quoteAll = true;
  all.withHeader = true;
  CsvSettings quoteNames;
  quoteNames.alwaysQuote = true;
  EXPECT_EQ(ExportToString(db, all, quoteNames),
            "\"Item name\",\"Count\"\n\"pen\",\"3\"\n\"ink, blue\",\"-1\"\n\"No Value\",\"0\"\n");
  CsvExportOptions header;
  header.withHeader = true;
  EXPECT_EQ(ExportToString(db, header).substr(0, 16), "Item name,Count\n");
  CsvSettings semicolon;
  semicolon.separator = ';';
  EXPECT_EQ(ExportToString(db, {}, semicolon), "pen;3\nink, blue;-1\nNo Value;0\n");
}

TEST(CsvExportTest, HeaderLacksTheLeadingSeparatorOfTheDataLines) {
  Database db = SampleDatabase();
  testing::SampleValues v;
  v.name = "n";
  testing::AddSample(db, v);
  CsvExportOptions options;
  options.withHeader = true;
  std::string text = ExportToString(db, options);
  EXPECT_EQ(text.substr(0, text.find('\n')),
            "Notes,Name,Color,Qty,Price,Section,Done,Due,At,Photo,Id,Total,Parts,Owner,Supplier");
  // Position 0 is Not-Used, so the data line starts with a separator; the
  // Image column stays empty, other empty texts read "No Value".
  EXPECT_EQ(text.substr(text.find('\n') + 1),
            ",No Value,n,No Value,0,No Value,No Value,0,NO DATE,No Time,,0,No Value,0,0,No Value\n");

  options.fieldNumberOrder = true;
  text = ExportToString(db, options);
  EXPECT_EQ(text.substr(text.find('\n') + 1),
            "n,0,No Value,No Value,0,NO DATE,No Time,No Value,0,,No Value,No Value,0,0,No Value\n");
}

TEST(CsvExportTest, FilteredOnlyFollowsTheViewAndFailuresReturnZero) {
  Database db = TwoFieldDatabase();
  CsvExportOptions filtered;
  filtered.filteredOnly = true;
  EXPECT_EQ(ExportToString(db, filtered), ExportToString(db, {}));  // filters off
  FilterSettings settings = LoadFilterSettings(db.schema());
  settings.filter[0].enabled = true;
  settings.filter[0].field = 0;
  settings.filter[0].SetLowerText("INK");
  StoreFilterSettings(settings, db.schema());
  EXPECT_EQ(ExportToString(db, filtered), "\"ink, blue\",-1\n");
  EXPECT_EQ(ExportToString(db, {}).size(), 32u);  // the switch off: every record
  StoreFilterSettings(FilterSettings(), db.schema());

  testing::ScriptedUi ui;
  EXPECT_EQ(ExportCsv(db, {}, "/nonexistent/dir/out.csv", {}, LocaleInfo(), ui), 0);

  // A record without bytes is reported and skipped; the rest is written.
  db.AppendRecord(Bytes{});
  TempDir dir;
  EXPECT_EQ(ExportCsv(db, {}, dir.File("out.csv"), {}, LocaleInfo(), ui), 0);
  std::vector<uint8_t> bytes;
  ASSERT_TRUE(ReadWholeFile(dir.File("out.csv"), bytes));
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()), "pen,3\n\"ink, blue\",-1\nNo Value,0\n");
}

// A value is cut to its first 4095 bytes before it is quoted: a byte that
// needs quotes counts only when it survives the cut.
TEST(CsvExportTest, LongValuesAreCutBeforeTheyAreQuoted) {
  Database db = Database::CreateNew("/nonexistent/Long.PDB", "Long");
  testing::DefineField(db.schema(), 0, FieldType::Note, "Notes");
  std::string expected;
  auto add = [&](const std::string& text) {
    Bytes record = {0, 0, 0};
    PutLE16(record.data() + 1, static_cast<uint16_t>(text.size() + 1));
    record.insert(record.end(), text.begin(), text.end());
    record.insert(record.end(), {0, 0xFF, 0xFF});
    db.AppendRecord(record);
    QuoteCsvValue(std::string_view(text).substr(0, 4095), expected, false, ',');
    expected += "\n";
  };
  for (size_t at : {size_t{10}, size_t{4000}, size_t{4094}, size_t{4095}, size_t{4500}}) {
    for (char special : {',', '"', '\n'}) {
      std::string text(5000, 'w');
      text[at] = special;
      add(text);
    }
  }
  add(std::string(5000, 'w'));
  EXPECT_EQ(ExportToString(db, {}), expected);
}

// Large exports format groups of lines on two threads and write them in
// order; they must give the bytes, the result and the reports of empty
// records that the record-by-record export gives (which a port that shows
// progress gets). Empty records sit at the edges of the groups.
TEST(CsvExportTest, LargeExportsMatchTheRecordByRecordExport) {
  class Progress : public SilentUi {
   public:
    bool WantsStatus() const override { return true; }
    void Status(const std::string& text) override {
      if (text.starts_with("ERROR")) errors.push_back(text);
    }
    std::vector<std::string> errors;
  };
  class Quiet : public SilentUi {
   public:
    void Status(const std::string& text) override { errors.push_back(text); }
    std::vector<std::string> errors;
  };
  Database db = SampleDatabase();
  testing::AddAwkwardRecords(db);
  for (int i = 0; i < 9000; ++i) {
    testing::SampleValues v;
    v.name = i % 7 == 0 ? "" : "Name " + std::to_string(i) + (i % 5 == 0 ? ", Jr." : "") +
                                   std::string(static_cast<size_t>(i % 40), 'x');
    v.qty = i * 37 - 4000;
    v.notes = i % 11 == 0 ? "line one\nline \"two\"" : std::string(static_cast<size_t>(i % 90), 'n');
    v.due = static_cast<uint32_t>(i % 3 == 0 ? 0 : 40000 + i);
    v.at[2] = static_cast<uint8_t>(i % 4 == 0 ? 255 : i % 24);
    v.color = static_cast<uint8_t>(i % 4);
    testing::AddSample(db, v);
  }
  for (size_t at : {size_t{1023}, size_t{1024}, size_t{4100}}) db.InsertRecord(at, Bytes{});
  db.AppendRecord(Bytes{});

  for (bool quoteAll : {false, true}) {
    CsvExportOptions options;
    options.quoteAll = quoteAll;
    StringSink one, two;
    Progress progress;
    Quiet quiet;
    EXPECT_EQ(ExportCsvTo(db, options, one, {}, LocaleInfo(), progress), 0);
    EXPECT_EQ(ExportCsvTo(db, options, two, {}, LocaleInfo(), quiet), 0);
    EXPECT_EQ(two.text, one.text);
    EXPECT_EQ(quiet.errors, progress.errors);
    EXPECT_EQ(quiet.errors.size(), 4u);
  }
}

// --- Python's csv module as the other side -------------------------------

std::string ScriptPath() { return std::string(CARDOVEX_OPS_TEST_DIR) + "/csv_python_check.py"; }

bool HavePython() { return FileExists("/usr/bin/python3"); }

int RunPython(const std::string& mode, const std::string& from, const std::string& to) {
  std::string command = "/usr/bin/python3 '" + ScriptPath() + "' " + mode + " '" + from + "' '" + to + "'";
  return std::system(command.c_str());
}

std::string Hex(const std::string& bytes) {
  static const char* digits = "0123456789abcdef";
  std::string out;
  for (unsigned char c : bytes) {
    out.push_back(digits[c >> 4]);
    out.push_back(digits[c & 15]);
  }
  return out;
}

std::string Unhex(const std::string& hex) {
  std::string out;
  for (size_t i = 0; i + 1 < hex.size(); i += 2) {
    out.push_back(static_cast<char>(std::stoi(hex.substr(i, 2), nullptr, 16)));
  }
  return out;
}

Rows ReadRowsFile(const std::string& path) {
  Rows rows;
  std::ifstream in(path);
  std::string line;
  while (std::getline(in, line)) {
    std::vector<std::string> row;
    std::istringstream tokens(line);
    std::string token;
    while (tokens >> token) row.push_back(token == "-" ? "" : Unhex(token));
    rows.push_back(row);
  }
  return rows;
}

void WriteRowsFile(const std::string& path, const Rows& rows) {
  std::ofstream out(path);
  for (const auto& row : rows) {
    for (size_t i = 0; i < row.size(); ++i) out << (i ? " " : "") << (row[i].empty() ? "-" : Hex(row[i]));
    out << "\n";
  }
}

// What a reader should see: the display texts, "No Value" for empty ones,
// Image columns empty, and the leading empty column when the first
// position of the order is Not-Used.
Rows ExpectedRows(const Database& db, const CsvExportOptions& options) {
  const Schema& s = db.schema();
  const ValueContext ctx{s, db.popups(), LocaleInfo()};
  auto slotAt = [&](int pos) { return options.fieldNumberOrder ? pos : s.fieldOrder[pos]; };
  Rows rows;
  if (options.withHeader) {
    std::vector<std::string> names;
    for (int pos = 0; pos < 30; ++pos) {
      if (s.field[s.fieldOrder[pos]].type() != FieldType::NotUsed) names.push_back(s.field[s.fieldOrder[pos]].name.str());
    }
    rows.push_back(names);
  }
  for (size_t r = 0; r < db.recordCount(); ++r) {
    std::vector<std::string> row;
    if (s.field[slotAt(0)].type() == FieldType::NotUsed) row.push_back("");
    for (int pos = 0; pos < 30; ++pos) {
      int slot = slotAt(pos);
      FieldType type = s.field[slot].type();
      if (type == FieldType::NotUsed) continue;
      std::string text = type == FieldType::Image ? "" : ValueText(ctx, db.record(r), slot);
      row.push_back(text.empty() && type != FieldType::Image ? "No Value" : text);
    }
    rows.push_back(row);
  }
  return rows;
}

TEST(CsvPythonTest, EveryExportReadsBackAsTheDisplayedValues) {
  if (!HavePython()) GTEST_SKIP() << "no /usr/bin/python3";
  Database db = SampleDatabase();
  testing::AddAwkwardRecords(db);
  TempDir dir;
  for (int bits = 0; bits < 16; ++bits) {
    CsvExportOptions options;
    options.quoteAll = bits & 1;
    options.withHeader = bits & 2;
    options.filteredOnly = bits & 4;
    options.fieldNumberOrder = bits & 8;
    CsvSettings settings;
    settings.alwaysQuote = options.quoteAll;
    SilentUi ui;
    ASSERT_EQ(ExportCsv(db, options, dir.File("out.csv"), settings, LocaleInfo(), ui), 1);
    ASSERT_EQ(RunPython("read", dir.File("out.csv"), dir.File("rows.txt")), 0);
    EXPECT_EQ(ReadRowsFile(dir.File("rows.txt")), ExpectedRows(db, options)) << "switches " << bits;
  }
}

std::vector<std::string> DisplayedColumns(const Database& db, size_t r) {
  const ValueContext ctx{db.schema(), db.popups(), LocaleInfo()};
  std::vector<std::string> out;
  for (int pos = 0; pos < 30; ++pos) {
    int slot = db.schema().fieldOrder[pos];
    if (db.schema().field[slot].type() != FieldType::NotUsed) out.push_back(ValueText(ctx, db.record(r), slot));
  }
  return out;
}

TEST(CsvPythonTest, PythonWrittenFileImportsIntoExactlyItsValues) {
  if (!HavePython()) GTEST_SKIP() << "no /usr/bin/python3";
  // Columns in display order: Notes, Name, Color, Qty, Price, Section, Done,
  // Due, At, Photo, Id, Total, Parts, Owner, Supplier.
  const Rows written = {
      {"Line one\rLine two \"q\"", "Widget, large", "Green", "-12", "3.50", "", "1", "6/15/2024",
       "1:05:00 PM", "", "17", "7.00", "4", "9", "Caf\xE9 \x80 Ltd"},
      {"", "\x93Smart\x94 \"\" ,;", "Blue", "0", "", "", "0", "NO DATE", "No Time", "", "5", "",
       "0", "0", ""},
      {"\xFC\xDF\"", " padded ", "No Value", "2147483647", "0.01", "", "0", "1/1/1905",
       "12:00:00 AM", "", "3", "-1.25", "0", "0", "x"},
  };
  TempDir dir;
  WriteRowsFile(dir.File("rows.txt"), written);
  ASSERT_EQ(RunPython("write", dir.File("rows.txt"), dir.File("in.csv")), 0);

  Database db = SampleDatabase();
  CsvImportResult result = ImportCsvFile(db, dir.File("in.csv"), kCsvColumnsByDisplayOrder, {}, LocaleInfo());
  ASSERT_TRUE(result.status) << result.status.message();
  EXPECT_EQ(result.lines, 3u);
  ASSERT_EQ(result.imported, 3u);
  for (size_t r = 0; r < 3; ++r) {
    std::vector<std::string> expected = written[r];
    expected[5] = "";  // a Heading holds nothing
    EXPECT_EQ(DisplayedColumns(db, r), expected) << "record " << r;
  }
  EXPECT_EQ(db.popups()[testing::kColor].items, (std::vector<std::string>{"Red", "Green", "Blue"}));
  EXPECT_TRUE(db.changed());
}

TEST(CsvImportTest, BySlotColumnsAndConversions) {
  Database db = SampleDatabase();
  // Slot order: Name, Qty, Price, Color, Done, Due, At, Notes, Id, Photo,
  // Section, Total, Parts, Owner, Supplier.
  CsvStream in("Bolt,12abc,1.5,red,7,3/7/24,23:59:58,n,,x,y,2.00,3,42,Acme\n"
               "Nut,,,,0,1/2/95,25:00,,,,,,,,\n");
  CsvLine line;
  LocaleInfo locale;
  db.SetNextUniqueNumber(100);
  ASSERT_TRUE(ReadCsvLine(in, line));
  ASSERT_TRUE(ImportCsvRecord(db, line, kCsvColumnsBySlot, locale));
  ASSERT_TRUE(ReadCsvLine(in, line));
  ASSERT_TRUE(ImportCsvRecord(db, line, kCsvColumnsBySlot, locale));
  const ValueContext ctx{db.schema(), db.popups(), locale};
  auto text = [&](size_t r, int slot) { return ValueText(ctx, db.record(r), slot); };
  EXPECT_EQ(text(0, testing::kName), "Bolt");
  EXPECT_EQ(text(0, testing::kQty), "12");
  EXPECT_EQ(text(0, testing::kPrice), "1.5");
  EXPECT_EQ(text(0, testing::kColor), "red");  // case counts: a new entry
  EXPECT_EQ(text(0, testing::kDone), "1");
  EXPECT_EQ(text(0, testing::kDue), "3/7/2024");
  // Times keep hours and minutes only.
  EXPECT_EQ(text(0, testing::kAt), "11:59:00 PM");
  EXPECT_EQ(text(0, testing::kId), "100");  // no number given: the next one
  EXPECT_EQ(text(0, testing::kTotal), "2.00");
  EXPECT_EQ(text(0, testing::kParts), "3");
  EXPECT_EQ(text(0, testing::kOwner), "42");
  EXPECT_EQ(text(0, testing::kSupplier), "Acme");
  EXPECT_EQ(text(1, testing::kQty), "0");
  EXPECT_EQ(text(1, testing::kColor), "No Value");
  EXPECT_EQ(text(1, testing::kDue), "1/2/1995");
  EXPECT_EQ(text(1, testing::kAt), "No Time");  // 25 hours is no time of day
  EXPECT_EQ(text(1, testing::kId), "101");
  auto photo = FieldValue(db.record(0), testing::kPhoto);
  ASSERT_TRUE(photo);
  EXPECT_EQ(photo->size(), 1u);  // no picture
}

TEST(CsvImportTest, PopupListsGrowToSixtyEntries) {
  Database db = SampleDatabase();
  auto& items = db.popups()[testing::kColor].items;
  items.clear();
  for (int i = 0; i < 59; ++i) items.push_back("c" + std::to_string(i));
  const ValueContext ctx{db.schema(), db.popups(), LocaleInfo()};
  auto importColor = [&](const std::string& color) {
    CsvLine line;
    line.fields.assign(30, "");
    line.fields[testing::kColor] = color;
    line.found = 30;
    EXPECT_TRUE(ImportCsvRecord(db, line, kCsvColumnsBySlot, LocaleInfo()));
    return ValueText(ctx, db.record(db.recordCount() - 1), testing::kColor);
  };
  EXPECT_EQ(importColor("c7"), "c7");
  EXPECT_EQ(importColor("NO VALUE here"), "No Value");
  EXPECT_EQ(importColor("Red"), "Red");  // the 60th entry
  EXPECT_EQ(items.size(), 60u);
  EXPECT_EQ(importColor("Blue"), "No Value");  // no room left
  EXPECT_EQ(importColor("Red"), "Red");
  EXPECT_EQ(items.size(), 60u);
}

TEST(CsvImportTest, UniqueNumbersGivenOutNeverMeetNumbersInTheFile) {
  Database db = SampleDatabase();
  testing::SampleValues v;
  v.id = 4;
  testing::AddSample(db, v);
  TempDir dir;
  // By slot: Id is column 8. The first line has none; the second says 9.
  std::string text = ",,,,,,,,\n,,,,,,,,9\n,,,,,,,,\n";
  ASSERT_TRUE(WriteFileSafely(dir.File("ids.csv"), text.data(), text.size()));
  CsvImportResult result = ImportCsvFile(db, dir.File("ids.csv"), kCsvColumnsBySlot, {}, LocaleInfo());
  ASSERT_TRUE(result.status);
  const ValueContext ctx{db.schema(), db.popups(), LocaleInfo()};
  EXPECT_EQ(ValueText(ctx, db.record(1), testing::kId), "10");
  EXPECT_EQ(ValueText(ctx, db.record(2), testing::kId), "9");
  EXPECT_EQ(ValueText(ctx, db.record(3), testing::kId), "11");
}

// Lines of the file, not of the table: the second record spans two.
TEST(CsvImportTest, ReportsValuesNotStoredAsGivenByFileLine) {
  Database db = SampleDatabase();
  TempDir dir;
  const std::string text = "Bolt,12,1.5,red,1,3/7/24,23:59\n"
                           "\"two\r\nlines\",-5,+2.5e3,,0,NO DATE,No Time\n"
                           "Nut,12abc,cheap,,yes,31/31/24,25:00\n" +
                           std::string(300, 'n') + ",2147483648\n"
                           "\"open,1\nrest,2\n";
  ASSERT_TRUE(WriteFileSafely(dir.File("in.csv"), text.data(), text.size()));
  const std::vector<std::string> colors = db.popups()[testing::kColor].items;
  CsvImportResult strict =
      ImportCsvFile(db, dir.File("in.csv"), kCsvColumnsBySlot, {}, LocaleInfo(), true);
  EXPECT_FALSE(strict.status);
  EXPECT_EQ(strict.imported, 0u);
  EXPECT_EQ(db.recordCount(), 0u);
  EXPECT_EQ(db.popups()[testing::kColor].items, colors);

  CsvImportResult result = ImportCsvFile(db, dir.File("in.csv"), kCsvColumnsBySlot, {}, LocaleInfo());
  ASSERT_TRUE(result.status);
  EXPECT_EQ(result.imported, 5u);
  EXPECT_EQ(result.issues.lines, 3u);
  std::vector<std::pair<size_t, int>> where;
  for (const CsvValueIssue& i : result.issues.first) where.push_back({i.line, i.slot});
  const std::vector<std::pair<size_t, int>> expected = {
      {4, testing::kQty}, {4, testing::kPrice}, {4, testing::kDone}, {4, testing::kDue},
      {4, testing::kAt},  {5, testing::kName},  {5, testing::kQty},  {6, -1}};
  EXPECT_EQ(where, expected);
  const std::vector<std::string> lines = result.issues.Describe(db.schema());
  ASSERT_EQ(lines.size(), expected.size());
  EXPECT_EQ(lines[2], "line 4, field \"Done\" (Check-Box): \"yes\" cannot be read");
  EXPECT_EQ(lines[7].rfind("line 6: a quote is never closed", 0), 0u) << lines[7];
}

TEST(CsvImportTest, PopupTextThatWillFindTheListFullIsReported) {
  Database db = SampleDatabase();
  auto& items = db.popups()[testing::kColor].items;
  items.clear();
  for (int i = 0; i < 59; ++i) items.push_back("c" + std::to_string(i));
  TempDir dir;
  const std::string text = ",,,Red\n,,,Blue\n,,,Red\n,,,c3\n";
  ASSERT_TRUE(WriteFileSafely(dir.File("in.csv"), text.data(), text.size()));
  CsvImportResult result = ImportCsvFile(db, dir.File("in.csv"), kCsvColumnsBySlot, {}, LocaleInfo());
  ASSERT_TRUE(result.status);
  ASSERT_EQ(result.issues.lines, 1u);
  EXPECT_EQ(result.issues.first[0].line, 2u);
  EXPECT_EQ(result.issues.first[0].issue, CsvIssue::kNoPopupRoom);
}

TEST(CsvImportTest, RefusesAFileLargerThanTheRoomLeft) {
  Database db = TwoFieldDatabase();
  while (db.recordCount() < static_cast<size_t>(format::kMaxDataRecords) - 1) db.AppendRecord(Bytes{0, 0xFF, 0xFF});
  TempDir dir;
  std::string text = "a,1\nb,2\n";
  ASSERT_TRUE(WriteFileSafely(dir.File("two.csv"), text.data(), text.size()));
  CsvImportResult result = ImportCsvFile(db, dir.File("two.csv"), kCsvColumnsByDisplayOrder, {}, LocaleInfo());
  EXPECT_FALSE(result.status);
  EXPECT_EQ(result.imported, 0u);
  EXPECT_EQ(db.recordCount(), static_cast<size_t>(format::kMaxDataRecords) - 1);
  EXPECT_FALSE(ImportCsvFile(db, dir.File("missing.csv"), 0, {}, LocaleInfo()).status);
}

TEST(CsvRoundTripTest, ExportThenImportGivesTheSameTexts) {
  // A design whose order starts with a used field, so display-order import
  // reads back what display-order export wrote.
  Database source = SampleDatabase();
  std::swap(source.schema().fieldOrder[0], source.schema().fieldOrder[1]);
  testing::AddAwkwardRecords(source);
  TempDir dir;
  SilentUi ui;
  ASSERT_EQ(ExportCsv(source, {}, dir.File("rt.csv"), {}, LocaleInfo(), ui), 1);
  Database target = SampleDatabase();
  std::swap(target.schema().fieldOrder[0], target.schema().fieldOrder[1]);
  CsvImportResult result = ImportCsvFile(target, dir.File("rt.csv"), kCsvColumnsByDisplayOrder, {}, LocaleInfo());
  ASSERT_TRUE(result.status);
  // What an export writes reads back as it was; only the awkward texts
  // kept in a Float field are worth a word.
  for (const CsvValueIssue& i : result.issues.first) {
    EXPECT_EQ(i.slot, testing::kPrice) << i.line << ": " << i.text;
  }
  ASSERT_EQ(target.recordCount(), source.recordCount());
  const Schema& schema = source.schema();
  for (size_t r = 0; r < source.recordCount(); ++r) {
    std::vector<std::string> want = DisplayedColumns(source, r);
    size_t column = 0;
    for (int pos = 0; pos < 30; ++pos) {
      FieldType type = schema.field[schema.fieldOrder[pos]].type();
      if (type == FieldType::NotUsed) continue;
      std::string& t = want[column++];
      // What the format changes on the way: an empty text is written (and
      // so read back) as "No Value", seconds are not read, and a CR LF
      // inside a value reads back as two CRs.
      if (t.empty() && type != FieldType::Image && type != FieldType::Heading) t = "No Value";
      if (type == FieldType::Time && t.size() > 8) t.replace(t.size() - 5, 2, "00");
      for (size_t at; (at = t.find("\r\n")) != std::string::npos;) t.replace(at, 2, "\r\r");
    }
    EXPECT_EQ(DisplayedColumns(target, r), want) << "record " << r;
  }
}

}  // namespace
}  // namespace cx
