#include <gtest/gtest.h>

#include "ops/database_settings.h"
#include "ops/report.h"
#include "platform/file_io.h"
#include "tests/ops/output_fixture.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

// A database of one field (slot 0) of `type` named `name`; `fill` sets the
// value of each new record's editing form.
template <typename Fill>
Database OneField(FieldType type, const std::string& name, size_t count, Fill fill, int size = 40) {
  Database db = Database::CreateNew("/nonexistent/R.PDB", "R");
  testing::DefineField(db.schema(), 0, type, name, size);
  for (size_t i = 0; i < count; ++i) {
    Bytes rec = NewEditingRecord(db.schema());
    fill(rec, i, db.schema());
    db.AppendRecord(Compact(rec, db.schema()));
  }
  return db;
}

Database Integers(std::vector<int32_t> values) {
  return OneField(FieldType::Integer, "Qty", values.size(), [&](Bytes& rec, size_t i, const Schema& s) {
    SetEditingNumber(rec, 0, static_cast<uint32_t>(values[i]), s);
  });
}

Database Texts(FieldType type, std::vector<std::string> values, int size = 40) {
  Database db = OneField(type, "F", 0, [](Bytes&, size_t, const Schema&) {}, size);
  for (const std::string& v : values) {
    Bytes rec = NewEditingRecord(db.schema());
    SetEditingText(rec, 0, v, db.schema());
    db.AppendRecord(Compact(rec, db.schema()));
  }
  return db;
}

std::string Report(const Database& db, const LocaleInfo& locale = LocaleInfo()) {
  std::optional<std::string> text = BuildReport(db, 0, locale);
  EXPECT_TRUE(text);
  return text.value_or("");
}

TEST(ReportTest, IntegerStatisticsAndRunningTotals) {
  EXPECT_EQ(Report(Integers({5, -3, 4})),
            "Report for Qty\r\n"
            "Number of Entries:\t3\r\n"
            "Minimum Value:\t-3\r\n"
            "Maximum Value:\t5\r\n"
            "Sum:\t\t6\r\n"
            "Minimum Total:\t2\r\n"
            "Maximum Total:\t6\r\n"
            "Average:\t\t2\r\n");
  // 1.5 rounds half up.
  EXPECT_NE(Report(Integers({1, 2})).find("Average:\t\t2\r\n"), std::string::npos);
  // The starting values stay where nothing replaces them.
  EXPECT_EQ(Report(Integers({})),
            "Report for Qty\r\nNumber of Entries:\t0\r\nMinimum Value:\t0\r\nMaximum Value:\t0\r\n"
            "Sum:\t\t0\r\nMinimum Total:\t2000000\r\nMaximum Total:\t-2000000\r\nAverage:\t\t0\r\n");
  std::string big = Report(Integers({3000000}));
  EXPECT_NE(big.find("Minimum Value:\t2000000\r\n"), std::string::npos);
  EXPECT_NE(big.find("Maximum Value:\t3000000\r\n"), std::string::npos);
}

TEST(ReportTest, OnlyRecordsInViewCount) {
  Database db = Integers({5, -3, 4});
  testing::DefineField(db.schema(), 1, FieldType::Text, "Tag");
  FilterSettings settings;
  settings.filter[0].enabled = true;
  settings.filter[0].field = 1;
  settings.filter[0].SetLowerText("x");  // no record holds a tag
  StoreFilterSettings(settings, db.schema());
  EXPECT_NE(Report(db).find("Number of Entries:\t0\r\n"), std::string::npos);
}

TEST(ReportTest, FloatNumbersUseTheFieldsPlacesAndSeparator) {
  Database db = Texts(FieldType::Float, {"1.5", "2.25"}, 2);
  EXPECT_EQ(Report(db),
            "Report for F\r\nNumber of Entries:\t2\r\nMinimum Value:\t1.50\r\nMaximum Value:\t2.25\r\n"
            "Sum:\t\t3.75\r\nMinimum Total:\t1.50\r\nMaximum Total:\t3.75\r\nAverage:\t\t1.88\r\n");
  LocaleInfo comma;
  comma.decimalSeparator = ',';
  EXPECT_NE(Report(db, comma).find("Sum:\t\t3,75\r\n"), std::string::npos);
  EXPECT_NE(Report(Texts(FieldType::Float, {}, 2)).find("Minimum Total:\t2000000.00\r\n"),
            std::string::npos);
}

TEST(ReportTest, CheckBoxPercentages) {
  Database db = OneField(FieldType::CheckBox, "Done", 4, [](Bytes& rec, size_t i, const Schema& s) {
    SetEditingByte(rec, 0, i == 2 ? 0 : 5, s);
  });
  EXPECT_EQ(Report(db),
            "Report for Done\r\nNumber of Entries:\t\t4\r\nItems Checked:\t\t3\r\n"
            "Items Not-Checked:\t\t1\r\nPercentage Checked:\t\t75.00\r\n"
            "Percentage Not-Checked:\t25.00\r\n");
  Database none = OneField(FieldType::CheckBox, "Done", 0, [](Bytes&, size_t, const Schema&) {});
  EXPECT_NE(Report(none).find("Percentage Checked:\t\t 0.00\r\n"), std::string::npos);
  LocaleInfo comma;
  comma.decimalSeparator = ',';
  EXPECT_NE(Report(db, comma).find("25,00"), std::string::npos);
}

Database Times(std::vector<std::array<uint8_t, 3>> times) {
  return OneField(FieldType::Time, "At", times.size(), [&](Bytes& rec, size_t i, const Schema&) {
    std::span<uint8_t> slot = EditingSlot(rec, 0);
    slot[0] = times[i][0];
    slot[1] = times[i][1];
    slot[2] = times[i][2];
  });
}

TEST(ReportTest, TimesAndTheTotalLine) {
  // 10:00 and 15:00 make 25 hours: one day and one hour. Seconds are not
  // read.
  EXPECT_EQ(Report(Times({{30, 0, 10}, {0, 0, 15}})),
            "Report for At\r\nNumber of Entries:\t2\r\nMinimum Value:\t10:00:00 AM\r\n"
            "Maximum Value:\t3:00:00 PM\r\nAverage Time:\t12:30:00 PM\r\n"
            "Total Time\t1 Day(s), 1:00:00 AM\r\n");
  LocaleInfo h24;
  h24.timeFormat = "HH:mm:ss";
  EXPECT_EQ(Report(Times({{0, 15, 1}, {0, 30, 0}}), h24),
            "Report for At\r\nNumber of Entries:\t2\r\nMinimum Value:\t00:30:00\r\n"
            "Maximum Value:\t01:15:00\r\nAverage Time:\t00:52:30\r\nTotal Time:\t01:45:00\r\n");
  EXPECT_EQ(Report(Times({}), h24),
            "Report for At\r\nNumber of Entries:\t0\r\nMinimum Value:\t00:00:00\r\n"
            "Maximum Value:\t00:00:00\r\nAverage Time:\t00:00:00\r\nTotal Time:\t00:00:00\r\n");
}

TEST(ReportTest, RecordsWithoutADateCountButSpanNothing) {
  Database db = OneField(FieldType::Date, "Due", 3, [](Bytes& rec, size_t i, const Schema& s) {
    const uint32_t days[] = {400, 0, 366};
    SetEditingNumber(rec, 0, days[i], s);
  });
  EXPECT_EQ(Report(db),
            "Report for Due\r\nNumber of Entries:\t3\r\nMinimum Value:\t1/1/1905\r\n"
            "Maximum Value:\t2/4/1905\r\nDays Spanned:\t34\r\n");
  Database none = OneField(FieldType::Date, "Due", 0, [](Bytes&, size_t, const Schema&) {});
  EXPECT_NE(Report(none).find("Maximum Value:\tNO DATE\r\nDays Spanned:\t0\r\n"), std::string::npos);
}

Database Calculated(uint8_t resultFormat, std::vector<std::string> stored) {
  Database db = Texts(FieldType::Calculated, stored);
  db.schema().field[0].setResultFormat(resultFormat);
  return db;
}

TEST(ReportTest, CalculatedFieldsAreReportedByResultFormat) {
  EXPECT_EQ(ReportKindFor(Calculated(0, {}).schema().field[0]), ReportKind::Float);
  EXPECT_EQ(ReportKindFor(Calculated(6, {}).schema().field[0]), ReportKind::Float);
  EXPECT_NE(Report(Calculated(1, {"7", "8"})).find("Sum:\t\t15\r\nMinimum Total:\t7\r\n"),
            std::string::npos);
  EXPECT_NE(Report(Calculated(5, {"1.25"})).find("Maximum Value:\t1.25\r\n"), std::string::npos);
  // A time result is shown as hours:minutes:seconds and read back so.
  LocaleInfo h24;
  h24.timeFormat = "H:mm:ss";
  EXPECT_NE(Report(Calculated(2, {"5400", "1800"}), h24).find("Total Time:\t2:00:00\r\n"),
            std::string::npos);
  EXPECT_NE(Report(Calculated(3, {"366", "370"})).find("Days Spanned:\t4\r\n"), std::string::npos);
}

TEST(ReportTest, OtherTypesAreRefused) {
  testing::ScriptedUi ui;
  Database db = Texts(FieldType::Text, {"a"});
  EXPECT_FALSE(RunReport(db, 0, LocaleInfo(), ui));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text,
            "Can only run reports on the following field types:\n"
            "Integer, Float, Checkbox, Time, Date, and Calculated.");
  EXPECT_EQ(ui.messages[0].caption, "ERROR");
  for (FieldType t : {FieldType::NotUsed, FieldType::PopUp, FieldType::Unique, FieldType::Note,
                      FieldType::Link}) {
    FieldDef f;
    f.typeNumber = static_cast<int16_t>(t);
    EXPECT_FALSE(ReportKindFor(f));
  }
  EXPECT_TRUE(RunReport(Integers({1}), 0, LocaleInfo(), ui));
  EXPECT_EQ(ui.messages.size(), 1u);
}

TEST(ReportTest, ExportWritesTheTextAndOneLineFeed) {
  testing::TempDir dir;
  std::string text = Report(Integers({1}));
  ASSERT_TRUE(ExportReportText(text, dir.File("r.txt")));
  std::vector<uint8_t> bytes;
  ASSERT_TRUE(ReadWholeFile(dir.File("r.txt"), bytes));
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()), text + "\n");
  EXPECT_FALSE(ExportReportText(text, "/nonexistent/dir/r.txt"));
}

}  // namespace
}  // namespace cx
