// The command-line contract: exit codes, JSON shapes and value texts under
// two regional conventions.
#include <gtest/gtest.h>

#include <sstream>

#include "cli/global_options.h"
#include "engine/dates.h"
#include "engine/record_store.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

Result RunTool(std::vector<std::string> args) { return RunInProcess(std::move(args)); }

// A database with one record holding a value of every type.
std::string MakeEveryType(const testing::TempDir& dir) {
  std::string path = dir.File("Every.PDB");
  Result r = RunTool({"new", path, "--name", "Every", "--field", "Text:Text", "--field", "Int:Integer",
                  "--field", "Float:Float:places=2", "--field", "Pop:Pop-Up:items=Red|Grün",
                  "--field", "Check:Check-Box", "--field", "Uniq:Unique", "--field", "Img:Image",
                  "--field", "Date:Date", "--field", "Time:Time", "--field", "Link:Link",
                  "--field", "Linked:Linked", "--field", "Note:Note", "--field", "Head:Heading",
                  "--field", "DBPop:DB Popup", "--field", "Secs:Calculated:format=time",
                  "--field", "Day:Calculated:format=date", "--field", "Calc:Calculated:format=2dp"});
  EXPECT_EQ(r.code, 0) << r.err;
  Database db;
  SilentUi ui;
  EXPECT_TRUE(db.Open(path, ui).ok());
  const Schema& s = db.schema();
  Bytes e = NewEditingRecord(s);
  SetEditingText(e, 0, "caf\xE9", s);
  SetEditingText(e, 1, "-42", s);
  SetEditingText(e, 2, "3.14", s);
  SetEditingByte(e, 3, 1, s);
  SetEditingByte(e, 4, 1, s);
  SetEditingNumber(e, 5, 7, s);
  SetEditingNumber(e, 7, DateToDayNumber({2024, 3, 9}), s);
  std::span<uint8_t> t = EditingSlot(e, 8);
  t[0] = 5, t[1] = 7, t[2] = 13;
  SetEditingNumber(e, 9, 12, s);
  SetEditingNumber(e, 10, 12, s);
  SetEditingText(e, 10, "Parent", s);
  SetEditingText(e, 11, "line 1\r\nline 2", s);
  SetEditingText(e, 13, "Ana", s);
  SetEditingText(e, 14, "3725", s);
  SetEditingText(e, 15, "366", s);
  SetEditingText(e, 16, "2,50", s);
  db.AppendRecord(Compact(e, s));
  EXPECT_TRUE(db.Save().ok());
  return path;
}

std::string TextsOf(const std::string& json) {
  // The "text" values in order, for compact comparison.
  std::string texts;
  for (size_t at = json.find("\"text\":"); at != std::string::npos; at = json.find("\"text\":", at + 1)) {
    size_t start = at + 8;
    size_t end = json.find("\",\"value\":", start);
    texts += json.substr(start, end - start) + "|";
  }
  return texts;
}

std::string ValuesOf(const std::string& json) {
  // The typed "value"s as JSON, in order.
  std::string values;
  for (size_t at = json.find("\"value\":"); at != std::string::npos; at = json.find("\"value\":", at + 1)) {
    size_t start = at + 8;
    values += json.substr(start, json.find('}', start) - start) + "|";
  }
  return values;
}

// Typed values read the same under any conventions: numbers with a point,
// ISO dates, 24-hour times, null where the list shows no value.
const char* const kEveryTypeValues =
    "\"café\"|-42|3.14|\"Grün\"|true|7|null|\"2024-03-09\"|\"13:07:05\"|12|12|"
    "\"line 1\\r\\nline 2\"|null|\"Ana\"|\"01:02:05\"|\"1905-01-01\"|2.5|";

TEST(CliRecords, ShowsEveryTypeInUsConventions) {
  testing::TempDir dir;
  std::string path = MakeEveryType(dir);
  Result r = RunTool({"--date-format", "M/d/yyyy", "--time-format", "h:mm:ss tt", "--decimal", ".",
                  "records", path, "--json"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(TextsOf(r.out),
            "café|-42|3.14|Grün|1|7||3/9/2024|1:07:05 PM|12|12|line 1\\r\\nline 2||Ana|1:02:05|1/1/1905|2,50|");
  EXPECT_NE(r.out.find("{\"index\":0,\"fields\":[{\"slot\":0,\"name\":\"Text\",\"text\":\"café\","),
            std::string::npos);
  EXPECT_EQ(ValuesOf(r.out), kEveryTypeValues);
}

TEST(CliRecords, ShowsEveryTypeInGermanConventions) {
  testing::TempDir dir;
  std::string path = MakeEveryType(dir);
  Result r = RunTool({"--date-format", "dd.MM.yyyy", "--time-format", "HH:mm:ss", "--decimal", ",",
                  "records", path, "--json"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(TextsOf(r.out),
            "café|-42|3.14|Grün|1|7||09.03.2024|13:07:05|12|12|line 1\\r\\nline 2||Ana|1:02:05|01.01.1905|2,50|");
  EXPECT_EQ(ValuesOf(r.out), kEveryTypeValues);
}

TEST(CliRecords, TableHasHeaderAndOneLineValues) {
  testing::TempDir dir;
  std::string path = MakeEveryType(dir);
  Result r = RunTool({"--date-format", "M/d/yyyy", "--time-format", "H:mm:ss", "records", path});
  ASSERT_EQ(r.code, 0) << r.err;
  std::istringstream lines(r.out);
  std::string header, row, extra;
  std::getline(lines, header);
  std::getline(lines, row);
  EXPECT_FALSE(std::getline(lines, extra));
  EXPECT_EQ(header.rfind("Index\tText\tInt\tFloat\tPop", 0), 0u);
  EXPECT_EQ(row.rfind("0\tcafé\t-42", 0), 0u);
  EXPECT_NE(row.find("line 1  line 2"), std::string::npos);
}

TEST(CliInfo, JsonDescribesFieldsAndSettings) {
  testing::TempDir dir;
  std::string path = MakeEveryType(dir);
  Result r = RunTool({"info", path, "--json"});
  ASSERT_EQ(r.code, 0) << r.err;
  for (const char* part :
       {"\"name\":\"Every\"", "\"creator\":\"QrTa\"", "\"numRecords\":32", "\"recordCount\":1",
        "\"schemaVersion\":2", "\"recordExtension\":false",
        "{\"slot\":3,\"name\":\"Pop\",\"type\":\"Pop-Up\",\"typeNumber\":4",
        "{\"slot\":29,\"name\":\"Field 30\",\"type\":\"Not-Used\",\"typeNumber\":0",
        "\"sortKeys\":[{\"field\":-1,\"forward\":true}", "[\"Red\",\"Grün\"]",
        "\"Open Database\":\"Full Access\"", "\"password\":false", "\"fieldOrder\":[0,1,2,"}) {
    EXPECT_NE(r.out.find(part), std::string::npos) << part;
  }
}

TEST(CliContract, ExitCodesAndMessages) {
  testing::TempDir dir;
  Result missing = RunTool({"info", dir.File("nope.PDB")});
  EXPECT_EQ(missing.code, 1);
  EXPECT_NE(missing.err.find("ERROR: Cannot Open File: " + dir.File("nope.PDB") + " for reading"),
            std::string::npos);
  EXPECT_EQ(RunTool({"frobnicate"}).code, 2);
  EXPECT_EQ(RunTool({"info"}).code, 2);
  EXPECT_EQ(RunTool({"new", dir.File("x.PDB"), "--name", "X", "--field", "A:Nonsense"}).code, 2);
  EXPECT_EQ(RunTool({"--version"}).code, 0);
  Result help = RunTool({"--help"});
  EXPECT_EQ(help.code, 0);
  EXPECT_NE(help.out.find("resave"), std::string::npos);
}

TEST(CliResave, KeepsEveryByteButTheSaveMarks) {
  testing::TempDir dir;
  std::string path = MakeEveryType(dir);
  Bytes before, after;
  ASSERT_TRUE(ReadWholeFile(path, before));
  ASSERT_EQ(RunTool({"resave", path, dir.File("copy.PDB")}).code, 0);
  ASSERT_TRUE(ReadWholeFile(dir.File("copy.PDB"), after));
  ASSERT_EQ(before.size(), after.size());
  for (size_t i = 0; i < before.size(); ++i) {
    if (i >= 40 && i < 44) continue;  // modificationDate
    if (i == 82) continue;            // record 0's attributes (dirty bit)
    ASSERT_EQ(before[i], after[i]) << "byte " << i;
  }
}

}  // namespace
}  // namespace cx::cli
