// One record at a time from the command line (add, edit, delete --record),
// the read-only query of records, and how a command finds its database and
// its password.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <sstream>

#include "cli/global_options.h"
#include "engine/record.h"
#include "platform/file_io.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

// German conventions, so that typed values must follow the options given
// rather than anything built in.
Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args), {"--date-format", "dd.MM.yyyy", "--time-format", "HH:mm:ss", "--decimal", ","}); }

Bytes FileBytes(const std::string& path) {
  Bytes b;
  EXPECT_TRUE(ReadWholeFile(path, b)) << path;
  return b;
}

std::string Field(const std::string& name, const std::string& text) {
  return "\"name\":\"" + name + "\",\"text\":\"" + text + "\"";
}

std::string NewEveryType(const testing::TempDir& dir) {
  const std::string path = dir.File("Every.PDB");
  Result r = Cli({"new", path, "--name", "Every", "--field", "Name:Text", "--field", "Qty:Integer",
                  "--field", "Price:Float:places=2", "--field", "Color:Pop-Up:items=Red|Grün",
                  "--field", "Done:Check-Box", "--field", "Id:Unique", "--field", "Day:Date:behavior=0",
                  "--field", "At:Time:behavior=0", "--field", "Memo:Note", "--field", "Pick:DB Popup",
                  "--field", "Stamp:Date:behavior=2", "--field", "Twice:Calculated:op=+,v1=Qty,v2=Qty,format=int"});
  EXPECT_EQ(r.code, 0) << r.err;
  return path;
}

TEST(CliRecordCommands, AddTypesEveryKindOfValueAsTheEditorDoes) {
  testing::TempDir dir;
  const std::string path = NewEveryType(dir);
  Result added = Cli({"--json", "add", path, "Name=Zoë", "Qty=-42", "Price=3,25", "Color=grün", "Done=yes",
                      "Day=09.03.2024", "At=13:07:05", "Memo=one\ntwo", "Pick=Ana"});
  ASSERT_EQ(added.code, 0) << added.err;
  EXPECT_EQ(added.out, "{\"index\":0}\n");
  Result shown = Cli({"--json", "records", path, "--record", "0"});
  ASSERT_EQ(shown.code, 0) << shown.err;
  for (const std::string& part :
       {Field("Name", "Zoë"), Field("Qty", "-42"), Field("Price", "3.25"), Field("Color", "Grün"),
        Field("Done", "1"), Field("Id", "1"), Field("Day", "09.03.2024"), Field("At", "13:07:05"),
        Field("Memo", "one\\r\\ntwo"), Field("Pick", "Ana"), Field("Twice", "-84")}) {
    EXPECT_NE(shown.out.find(part), std::string::npos) << part << "\n" << shown.out;
  }
  // A second record is placed and numbered on its own; fields not named
  // keep a new record's defaults.
  ASSERT_EQ(Cli({"add", path, "Name=Ann"}).code, 0);
  Result second = Cli({"--json", "records", path, "--record", "1"});
  EXPECT_NE(second.out.find(Field("Id", "2")), std::string::npos) << second.out;
  EXPECT_NE(second.out.find(Field("Day", "NO DATE")), std::string::npos) << second.out;
}

TEST(CliRecordCommands, ValueThatDoesNotConvertChangesNothing) {
  testing::TempDir dir;
  const std::string path = NewEveryType(dir);
  ASSERT_EQ(Cli({"add", path, "Name=Keep", "Qty=1"}).code, 0);
  const Bytes before = FileBytes(path);
  const std::vector<std::vector<std::string>> refused = {
      {"add", path, "Qty=12x"},          {"add", path, "Qty=99999999999"},
      {"add", path, "Price=1.2.3"},      {"add", path, "Color=Blue"},
      {"add", path, "Done=maybe"},       {"add", path, "Day=31.02.2024"},
      {"add", path, "At=25:00"},         {"add", path, "Id=7"},
      {"add", path, "Twice=3"},          {"add", path, "Stamp=01.01.2024"},
      {"add", path, "Name=Ωmega"},       {"add", path, "Name=" + std::string(300, 'x')},
      {"edit", path, "0", "Qty=one"},    {"edit", path, "0", "Name=ok", "Day=soon"},
      {"edit", path, "5", "Qty=1"}};
  for (const auto& args : refused) {
    Result r = Cli(args);
    EXPECT_EQ(r.code, 1) << args.back() << ": " << r.err;
    EXPECT_FALSE(r.err.empty()) << args.back();
    EXPECT_EQ(FileBytes(path), before) << args.back();
  }
  EXPECT_EQ(Cli({"add", path, "Nobody=1"}).code, 2);
  EXPECT_EQ(Cli({"add", path, "Qty=1", "Qty=2"}).code, 2);
  EXPECT_EQ(FileBytes(path), before);
}

// The header's modification stamp (bytes 40-43) and the changed value are
// all an edit may move when nothing is sorted or recalculated.
TEST(CliRecordCommands, EditChangesOnlyTheNamedField) {
  testing::TempDir dir;
  const std::string path = dir.File("Plain.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Plain", "--field", "Name:Text", "--field", "City:Text",
                 "--field", "Qty:Integer"})
                .code,
            0);
  for (const char* name : {"Name=Alpha", "Name=Bravo", "Name=Delta"}) {
    ASSERT_EQ(Cli({"add", path, name, "City=Kassel", "Qty=5"}).code, 0);
  }
  const Bytes before = FileBytes(path);
  Result r = Cli({"edit", path, "1", "Name=Omega"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "record 1 changed\n");
  const Bytes after = FileBytes(path);
  ASSERT_EQ(after.size(), before.size());
  const std::string text(before.begin(), before.end());
  const size_t at = text.find("Bravo");
  ASSERT_NE(at, std::string::npos);
  for (size_t i = 0; i < before.size(); ++i) {
    if (before[i] == after[i]) continue;
    EXPECT_TRUE((i >= 40 && i < 44) || (i >= at && i < at + 5)) << "byte " << i << " changed";
  }
  // The same value again is no change at all: the file is not written.
  const Bytes edited = FileBytes(path);
  EXPECT_EQ(Cli({"edit", path, "1", "Name=Omega"}).out, "record 1 unchanged\n");
  EXPECT_EQ(FileBytes(path), edited);
}

TEST(CliRecordCommands, SortedDatabasePlacesAddedAndEditedRecords) {
  testing::TempDir dir;
  const std::string path = dir.File("Sorted.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Sorted", "--field", "Name:Text"}).code, 0);
  ASSERT_EQ(Cli({"add", path, "Name=Mia"}).code, 0);
  ASSERT_EQ(Cli({"add", path, "Name=Zack"}).code, 0);
  ASSERT_EQ(Cli({"sort", path, "Name"}).code, 0);
  EXPECT_EQ(Cli({"add", path, "Name=Anna"}).out, "record 0 added\n");
  EXPECT_EQ(Cli({"edit", path, "0", "Name=Zoe"}).out, "record 2 changed\n");
  Result r = Cli({"delete", path, "--record", "0"});
  EXPECT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "record 0 deleted, 2 left\n");
  EXPECT_EQ(Cli({"records", path}).out, "Index\tName\n0\tZack\n1\tZoe\n");
  EXPECT_EQ(Cli({"delete", path, "--record", "2"}).code, 2);
}

TEST(CliRecordCommands, DeletingOneRecordAsksAboutLinkedRecords) {
  testing::TempDir dir;
  const std::string path = dir.File("Parents.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Parents", "--field", "Name:Text", "--field",
                 "Kids:Link:db=Kids,other=1,show=0"}).code, 0);
  ASSERT_EQ(Cli({"add", path, "Name=Ann"}).code, 0);
  ASSERT_EQ(Cli({"add", path, "Name=Bob"}).code, 0);
  const Bytes before = FileBytes(path);
  {
    NoTerminalInput noTerminal;
    Result refused = Cli({"delete", path, "--record", "1"});
    EXPECT_EQ(refused.code, 1);
    EXPECT_NE(refused.err.find("Would you like to delete the linked records also?"), std::string::npos)
        << refused.err;
  }
  EXPECT_EQ(FileBytes(path), before);
  Result r = Cli({"--no", "delete", path, "--record", "1"});
  EXPECT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(Cli({"records", path}).out.substr(0, 21), "Index\tName\tKids\n0\tAnn");
}

TEST(CliQuery, ShowsTheResultWithoutTouchingTheFile) {
  testing::TempDir dir;
  const std::string path = dir.File("Query.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Query", "--field", "Name:Text", "--field", "Qty:Integer"}).code, 0);
  for (const char* row : {"Name=b,Qty=2", "Name=a,Qty=9", "Name=c,Qty=2", "Name=d,Qty=5"}) {
    const std::string s = row;
    ASSERT_EQ(Cli({"add", path, s.substr(0, s.find(',')), s.substr(s.find(',') + 1)}).code, 0);
  }
  ::chmod(path.c_str(), 0444);
  const Bytes before = FileBytes(path);
  // Ties on the key stay in table order; the indexes are the file's.
  Result r = Cli({"records", path, "--where", "Qty=0..5", "--sort", "Qty:reverse"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "Index\tName\tQty\n3\td\t5\n0\tb\t2\n2\tc\t2\n");
  r = Cli({"records", path, "--where", "Qty=2..9", "--where", "Name=a", "--sort", "Qty"});
  EXPECT_EQ(r.out, "Index\tName\tQty\n1\ta\t9\n");
  EXPECT_EQ(Cli({"records", path, "--sort", "Nobody"}).code, 2);
  EXPECT_EQ(Cli({"records", path, "--where", "Qty"}).code, 2);
  r = Cli({"find", path, "c", "--records"});
  EXPECT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "Index\tName\tQty\n2\tc\t2\n");
  EXPECT_EQ(FileBytes(path), before);
}

TEST(CliLocating, BareNameIsFoundInTheDataFolder) {
  testing::TempDir dir;
  ASSERT_EQ(Cli({"new", dir.File("Zq7Lookup.PDB"), "--name", "Lookup", "--field", "Name:Text"}).code, 0);
  ::setenv("CARDOVEX_DATA_DIR", dir.path().c_str(), 1);
  EXPECT_EQ(Cli({"add", "Zq7Lookup", "Name=one"}).code, 0);
  EXPECT_EQ(Cli({"records", "Zq7Lookup.PDB"}).out, "Index\tName\n0\tone\n");
  EXPECT_EQ(Cli({"records", "Zq7Missing"}).code, 1);
  Result listed = Cli({"--json", "list"});
  ::unsetenv("CARDOVEX_DATA_DIR");
  EXPECT_EQ(listed.code, 0) << listed.err;
  EXPECT_NE(listed.out.find("{\"file\":\"Zq7Lookup.PDB\",\"name\":\"Lookup\",\"records\":1,\"protected\":false}"),
            std::string::npos)
      << listed.out;
}

TEST(CliPasswords, PasswordFileGivesTheFirstLine) {
  testing::TempDir dir;
  const std::string path = dir.File("Locked.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Locked", "--field", "Name:Text"}).code, 0);
  ASSERT_EQ(Cli({"security", path, "--set-password", "sekrit", "Open Database", "password"}).code, 0);
  std::ofstream(dir.File("right")) << "sekrit\r\nsecond line\n";
  std::ofstream(dir.File("wrong")) << "sekrit \n";
  EXPECT_EQ(Cli({"--password-file", dir.File("right"), "records", path}).code, 0);
  Result wrong = Cli({"--password-file", dir.File("wrong"), "records", path});
  EXPECT_EQ(wrong.code, 1);
  EXPECT_NE(wrong.err.find("Invalid Password"), std::string::npos) << wrong.err;
  // No password and no terminal: refused with a word on how to give one.
  NoTerminalInput noTerminal;
  Result none = Cli({"records", path});
  EXPECT_EQ(none.code, 1);
  EXPECT_NE(none.err.find("--password-file"), std::string::npos) << none.err;
  EXPECT_EQ(Cli({"--password-file", dir.File("absent"), "records", path}).code, 1);
}

}  // namespace
}  // namespace cx::cli
