// The data commands of the command-line tool, driven in-process on
// databases built through the tool itself: sort, filter, find, delete,
// recalc, the CSV round trip, report, listing and print.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <optional>
#include <sstream>

#include "cli/global_options.h"
#include "engine/record_store.h"
#include "ops/database_settings.h"
#include "platform/file_io.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

// Every run uses US dates and 24-hour times whatever the machine says.
Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args), {"--date-format", "M/d/yyyy", "--time-format", "H:mm:ss", "--decimal", "."}); }

void WriteText(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

std::string ReadText(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), {});
}

Bytes FileBytes(const std::string& path) {
  Bytes b;
  EXPECT_TRUE(ReadWholeFile(path, b)) << path;
  return b;
}

const std::vector<std::string> kFields = {
    "--field", "Name:Text",  "--field", "Qty:Integer", "--field", "Day:Date",
    "--field", "Color:Pop-Up:items=Red|Green", "--field", "Done:Check-Box", "--field", "At:Time",
    "--field", "Img:Image", "--field", "Sum:Calculated:op=+,v1=Qty,v2=#10,format=int",
    // A running total: Qty plus the previous record's Run.
    "--field", "Run:Calculated:op=+,v1=Qty,v2=Run,prev2,format=int"};

std::string NewDatabase(const testing::TempDir& dir, const std::string& file) {
  const std::string path = dir.File(file);
  std::vector<std::string> args = {"new", path, "--name", "Stock"};
  args.insert(args.end(), kFields.begin(), kFields.end());
  Result r = Cli(args);
  EXPECT_EQ(r.code, 0) << r.err;
  return path;
}

// Four records in this table order: apple, Banana, cherry pie, date.
std::string MakeStock(const testing::TempDir& dir) {
  const std::string path = NewDatabase(dir, "Stock.PDB");
  WriteText(dir.File("in.csv"),
            "apple,5,1/2/2024,Red,1,9:30,,,\n"
            "Banana,12,3/4/2024,,0,13:15,,,\n"
            "cherry pie,7,5/6/2023,Green,1,,,,\n"
            "date,40,12/31/2024,Red,0,8:00,,,\n");
  Result r = Cli({"import-csv", path, dir.File("in.csv")});
  EXPECT_EQ(r.code, 0) << r.err;
  return path;
}

// One field's texts from `records --json`, in output order, "|"-joined.
std::string Column(const std::string& json, const std::string& field) {
  const std::string key = "\"name\":\"" + field + "\",\"text\":\"";
  std::string texts;
  for (size_t at = json.find(key); at != std::string::npos; at = json.find(key, at + 1)) {
    const size_t start = at + key.size();
    texts += json.substr(start, json.find('"', start) - start) + "|";
  }
  return texts;
}

std::string InView(const std::string& path) {
  Result r = Cli({"--json", "records", path});
  EXPECT_EQ(r.code, 0) << r.err;
  return Column(r.out, "Name");
}

// The temporary print file goes next to the data folder.
class ScopedEnv {
 public:
  ScopedEnv(const char* name, const std::string& value) : name_(name) {
    const char* old = std::getenv(name);
    if (old) old_ = old;
    ::setenv(name, value.c_str(), 1);
  }
  ~ScopedEnv() {
    if (old_) {
      ::setenv(name_, old_->c_str(), 1);
    } else {
      ::unsetenv(name_);
    }
  }

 private:
  const char* name_;
  std::optional<std::string> old_;
};

TEST(CliSort, KeysByNameSlotAndReverseSetTheRecordOrder) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  ASSERT_EQ(Cli({"sort", path, "Name"}).out, "4 records sorted\n");
  EXPECT_EQ(InView(path), "apple|Banana|cherry pie|date|");
  ASSERT_EQ(Cli({"sort", path, "name:reverse"}).code, 0);
  EXPECT_EQ(InView(path), "date|cherry pie|Banana|apple|");
  ASSERT_EQ(Cli({"sort", path, "1"}).code, 0);
  EXPECT_EQ(InView(path), "apple|cherry pie|Banana|date|");
  // Pop-Up entries sort by their index ("No Value" after all of them);
  // equal entries fall to the secondary key.
  ASSERT_EQ(Cli({"sort", path, "Color", "Qty:reverse"}).code, 0);
  EXPECT_EQ(InView(path), "date|apple|cherry pie|Banana|");
}

TEST(CliSort, RefusedKeyShowsTheDialogMessageAndLeavesTheFile) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  const Bytes before = FileBytes(path);
  Result image = Cli({"sort", path, "Qty", "Img"});
  EXPECT_EQ(image.code, 1);
  EXPECT_EQ(image.err, "cardovex-cli: sort: ERROR!: This type of field (Img) cannot currently be sorted!\n");
  Result relative = Cli({"sort", path, "Run"});
  EXPECT_EQ(relative.code, 1);
  EXPECT_EQ(relative.err,
            "cardovex-cli: sort: ERROR!: Since this field (Run) references other records, it's value is relative to "
            "it's position, meaning that it cannot be the basis for a sort!\n");
  EXPECT_EQ(Cli({"sort", path, "Nope"}).code, 2);
  EXPECT_EQ(FileBytes(path), before);
}

TEST(CliFilter, SpecsByFieldTypeDecideWhichRecordsAreInView) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  auto filtered = [&](std::vector<std::string> options) {
    options.insert(options.begin(), {"filter", path});
    Result r = Cli(options);
    EXPECT_EQ(r.code, 0) << r.err;
    return InView(path);
  };
  EXPECT_EQ(filtered({"--filter1", "Name=AN"}), "Banana|");
  EXPECT_EQ(filtered({"--filter1", "Qty=6..12"}), "Banana|cherry pie|");
  EXPECT_EQ(filtered({"--filter1", "2=1/1/2024..12/31/2024", "--not1"}), "cherry pie|");
  EXPECT_EQ(filtered({"--filter1", "At=9:00:00..14:00:00"}), "apple|Banana|");
  EXPECT_EQ(filtered({"--filter1", "Done=1"}), "apple|cherry pie|");
  EXPECT_EQ(filtered({"--filter1", "Done=1", "--not1"}), "Banana|date|");
  EXPECT_EQ(filtered({"--filter1", "Done=1", "--filter2", "Qty=40..40", "--or"}), "apple|cherry pie|date|");
  EXPECT_EQ(filtered({"--filter1", "Done=1", "--filter2", "Color=Red"}), "apple|");
  // "No Value" keeps the records without a choice on filter 1 and matches
  // nothing on filter 2.
  EXPECT_EQ(filtered({"--filter1", "Color=No Value"}), "Banana|");
  EXPECT_EQ(filtered({"--filter2", "Color=No Value"}), "");
  EXPECT_EQ(filtered({"--off"}), "apple|Banana|cherry pie|date|");
  // The limits are read in the date format of the global options.
  Result german =
      Cli({"--date-format", "dd.MM.yyyy", "filter", path, "--filter1", "Day=01.01.2024..31.03.2024"});
  ASSERT_EQ(german.code, 0) << german.err;
  EXPECT_EQ(InView(path), "apple|Banana|");
  EXPECT_EQ(Column(Cli({"--json", "records", path, "--all"}).out, "Name"), "apple|Banana|cherry pie|date|");
}

TEST(CliFilter, ShowingAndBadSpecsLeaveTheFile) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  ASSERT_EQ(Cli({"filter", path, "--filter1", "Qty=6..12", "--filter2", "Name=e", "--not2"}).code, 0);
  const Bytes before = FileBytes(path);
  Result shown = Cli({"--json", "filter", path});
  ASSERT_EQ(shown.code, 0) << shown.err;
  EXPECT_EQ(shown.out,
            "{\"filters\":[{\"enabled\":true,\"not\":false,\"slot\":1,\"name\":\"Qty\",\"test\":\"6 to 12\",\"low\":6,\"high\":12},"
            "{\"enabled\":true,\"not\":true,\"slot\":0,\"name\":\"Name\",\"test\":\"contains \\\"e\\\"\"}],"
            "\"combine\":\"AND\",\"inView\":1,\"records\":4}\n");
  for (std::vector<std::string> bad :
       {std::vector<std::string>{"--filter1", "Qty=5"}, {"--filter1", "Qty=a..b"}, {"--filter1", "Nope=1"},
        {"--filter1", "Img=x"}, {"--filter1", "Done=yes"}, {"--filter1", "Color=Blue"},
        {"--filter1", "Day=2/30/2024..13/1/2024"}, {"--not2"}, {"--off", "--or"}}) {
    bad.insert(bad.begin(), {"filter", path});
    EXPECT_EQ(Cli(bad).code, 2) << bad[2] << " " << (bad.size() > 3 ? bad[3] : "");
  }
  EXPECT_EQ(FileBytes(path), before);
  EXPECT_EQ(InView(path), "Banana|");
}

TEST(CliFind, ReportsEachRecordOnceWithItsFirstMatchingField) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  Result all = Cli({"--json", "find", path, "e"});
  ASSERT_EQ(all.code, 0) << all.err;
  // A search never starts at the last record: after the hit in record 2
  // nothing is left to search, although record 3 holds an "e" too.
  EXPECT_EQ(all.out, "[{\"index\":0,\"slot\":0},{\"index\":1,\"slot\":3},{\"index\":2,\"slot\":0}]\n");
  EXPECT_EQ(all.err, "cardovex-cli: find: ERROR!: Not Found in Database!\n");
  // Digits match Integer fields as numbers and dates as they are shown.
  Result digits = Cli({"find", path, "12"});
  EXPECT_EQ(digits.out, "1\t1\tQty\n3\t2\tDay\n");
  EXPECT_EQ(Cli({"find", path, "12a"}).code, 1);
  EXPECT_EQ(Cli({"--json", "find", path, "r", "--field", "3"}).out,
            "[{\"index\":0,\"slot\":3},{\"index\":2,\"slot\":3}]\n");
  EXPECT_EQ(Cli({"--json", "find", path, "B", "--case-sensitive"}).out, "[{\"index\":1,\"slot\":0}]\n");
  EXPECT_EQ(Cli({"--json", "find", path, "b", "--case-sensitive"}).code, 1);
  EXPECT_EQ(Cli({"--json", "find", path, "ch", "--begins-with", "--field", "Name"}).out,
            "[{\"index\":2,\"slot\":0}]\n");
  // Only the records in view are searched.
  ASSERT_EQ(Cli({"filter", path, "--filter1", "Qty=6..12"}).code, 0);
  EXPECT_EQ(Cli({"--json", "find", path, "e"}).out, "[{\"index\":1,\"slot\":3},{\"index\":2,\"slot\":0}]\n");
}

TEST(CliFind, NothingFoundFailsAndTheSettingsAreSaved) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  Result none = Cli({"--json", "find", path, "zzz", "--field", "Name", "--begins-with"});
  EXPECT_EQ(none.code, 1);
  EXPECT_EQ(none.out, "[]\n");
  EXPECT_EQ(none.err, "{\"error\":\"cardovex-cli: find: ERROR!: Not Found in Database!\",\"exitCode\":1}\n");
  Database db;
  testing::ScriptedUi ui;
  ASSERT_TRUE(db.Open(path, ui).ok());
  const SearchSettings saved = LoadSearchSettings(db.schema());
  EXPECT_EQ(saved.text, "zzz");
  EXPECT_EQ(saved.field, 0);
  EXPECT_TRUE(saved.beginsWith);
  EXPECT_FALSE(saved.caseSensitive);
}

TEST(CliDelete, ScopesFollowTheFilters) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  EXPECT_EQ(Cli({"delete", path, "--outside"}).out, "0 records deleted, 4 left\n");
  ASSERT_EQ(Cli({"filter", path, "--filter1", "Qty=6..12"}).code, 0);
  EXPECT_EQ(Cli({"delete", path, "--outside"}).out, "2 records deleted, 2 left\n");
  EXPECT_EQ(Column(Cli({"--json", "records", path, "--all"}).out, "Name"), "Banana|cherry pie|");
  ASSERT_EQ(Cli({"filter", path, "--filter1", "Name=ban"}).code, 0);
  EXPECT_EQ(Cli({"delete", path, "--within"}).out, "1 record deleted, 1 left\n");
  EXPECT_EQ(Cli({"delete", path, "--all"}).out, "1 record deleted, 0 left\n");
  EXPECT_EQ(Cli({"delete", path, "--all", "--within"}).code, 2);
}

TEST(CliDelete, LinkFieldsNeedAnAnswer) {
  testing::TempDir dir;
  const std::string path = dir.File("Parents.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Parents", "--field", "Name:Text", "--field",
                 "Kids:Link:db=Kids,other=1,show=0"}).code, 0);
  WriteText(dir.File("p.csv"), "Ann\nBob\n");
  ASSERT_EQ(Cli({"import-csv", path, dir.File("p.csv")}).code, 0);
  const Bytes before = FileBytes(path);
  {
    NoTerminalInput noTerminal;
    Result refused = Cli({"delete", path, "--all"});
    EXPECT_EQ(refused.code, 1);
    EXPECT_NE(refused.err.find("QUESTION: Would you like to delete the linked records also? (Y/N)\n"
                               "(answer with --yes or --no; nothing was changed)"),
              std::string::npos)
        << refused.err;
  }
  EXPECT_EQ(FileBytes(path), before);
  EXPECT_EQ(Cli({"--no", "delete", path, "--all"}).out, "2 records deleted, 0 left\n");
}

TEST(CliRecalc, FillsImportedRecordsAndFollowsSorts) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  Result imported = Cli({"--json", "records", path});
  EXPECT_EQ(Column(imported.out, "Sum"), "||||");
  Result r = Cli({"recalc", path});
  ASSERT_EQ(r.code, 0) << r.err;
  Result after = Cli({"--json", "records", path});
  EXPECT_EQ(Column(after.out, "Sum"), "15|22|17|50|");
  EXPECT_EQ(Column(after.out, "Run"), "5|17|24|64|");
  // The sort recalculates what depends on the previous record.
  ASSERT_EQ(Cli({"sort", path, "Name:reverse"}).code, 0);
  EXPECT_EQ(Column(Cli({"--json", "records", path}).out, "Run"), "40|47|59|64|");
}

TEST(CliCsv, ExportThenImportGivesTheSameRecords) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  ASSERT_EQ(Cli({"recalc", path}).code, 0);
  ASSERT_EQ(Cli({"export-csv", path, dir.File("out.csv")}).code, 0);
  EXPECT_EQ(ReadText(dir.File("out.csv")).substr(0, 44), "apple,5,1/2/2024,Red,1,9:30:00,,15,5\nBanana,");
  const std::string copy = NewDatabase(dir, "Copy.PDB");
  EXPECT_EQ(Cli({"import-csv", copy, dir.File("out.csv")}).out, "4 records imported\n");
  ASSERT_EQ(Cli({"export-csv", copy, dir.File("again.csv")}).code, 0);
  EXPECT_EQ(ReadText(dir.File("again.csv")), ReadText(dir.File("out.csv")));
  EXPECT_EQ(Cli({"--json", "records", copy}).out, Cli({"--json", "records", path}).out);
}

TEST(CliTextOutput, ReportAndListing) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  Result report = Cli({"report", path, "Qty"});
  ASSERT_EQ(report.code, 0) << report.err;
  EXPECT_EQ(report.out.rfind("Report for Qty\r\nNumber of Entries:\t4\r\n", 0), 0u) << report.out;
  for (size_t at = report.out.find('\n'); at != std::string::npos; at = report.out.find('\n', at + 1)) {
    EXPECT_EQ(report.out[at - 1], '\r') << "line feed at " << at;
  }
  Result one = Cli({"listing", path, "--record", "1"});
  ASSERT_EQ(one.code, 0) << one.err;
  EXPECT_EQ(one.out, "Name: Banana\nQty: 12\nDay: 3/4/2024\nColor: No Value\nDone: 0\nAt: 13:15:00\nImg: \n"
                     "Sum: \nRun: \n" + std::string(40, '-') + "\n");
}

// The print program is a stand-in script that records what it was given
// and exits with the code under test.
TEST(CliPrint, RunsTheCommandAndReportsItsExitCode) {
  testing::TempDir dir;
  const std::string path = MakeStock(dir);
  ScopedEnv dataDir("CARDOVEX_DATA_DIR", dir.File("data"));
  const std::string temp = dir.File("cxprnttemp.txt");
  const std::string script = dir.File("print.sh");
  const std::string listing = Cli({"listing", path, "--record", "2"}).out;

  for (int exitCode : {0, 63, 5}) {
    WriteText(script, "#!/bin/sh\nprintf '%s\\n' \"$@\" > '" + dir.File("args.txt") +
                          "'\nfor last; do :; done\ncat \"$last\" > '" + dir.File("got.txt") + "'\nexit " +
                          std::to_string(exitCode) + "\n");
    ASSERT_EQ(::chmod(script.c_str(), 0700), 0);
    Result r = Cli({"print", path, "--record", "2", "--command", script, "--arg", "-d", "--arg", "desk"});
    EXPECT_EQ(r.code, exitCode == 5 ? 1 : 0) << exitCode;
    EXPECT_EQ(r.err, exitCode == 0    ? "Update: Data Printed OK\n"
                     : exitCode == 63 ? ""
                                      : "Update: There was a problem printing to PrintPocketCE\n");
    EXPECT_EQ(ReadText(dir.File("args.txt")), "-d\ndesk\n" + temp + "\n");
    EXPECT_EQ(ReadText(dir.File("got.txt")), listing);
    EXPECT_FALSE(FileExists(temp));
  }
  Result missing = Cli({"print", path, "--command", dir.File("no-such-program")});
  EXPECT_EQ(missing.code, 1);
  EXPECT_EQ(missing.err,
            "cardovex-cli: print: ERROR: Unable to call PrintPocketCE.  Please check to see if it is "
            "properly installed.\ncardovex-cli: print: ERROR: File not found\n");
  EXPECT_FALSE(FileExists(temp));
}

}  // namespace
}  // namespace cx::cli
