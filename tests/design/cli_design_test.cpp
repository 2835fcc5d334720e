// The design and transfer commands: questions answered by --yes / --no and
// refused without them, access checks with --password, and files left byte
// for byte as they were when nothing is to change.
#include <gtest/gtest.h>

#include <sstream>

#include "cli/global_options.h"
#include "design/security.h"
#include "tests/design/design_db.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

using cx::testing::FileBytes;
using T = FieldType;

Result RunTool(std::vector<std::string> args) { return RunInProcess(std::move(args)); }

class DesignCommands : public ::testing::Test {
 protected:
  void SetUp() override {
    Database db = cx::testing::MakeDatabase(
        path, {{"Code", T::Text}, {"Qty", T::Integer}, {"Colour", T::PopUp}}, "Stock");
    db.popups()[2].items = {"Red", "Green", "Blue"};
    cx::testing::AddRecord(db, {"7", "1", "0"});
    cx::testing::AddRecord(db, {"", "2", "1"});
    cx::testing::AddRecord(db, {"3", "3", "2"});
    ASSERT_TRUE(db.Save().ok());
  }
  // The table without its leading index column: these tests look at values.
  std::string Records(const std::string& file) {
    std::string out;
    std::istringstream lines(RunTool({"records", file}).out);
    for (std::string line; std::getline(lines, line);) {
      const size_t tab = line.find('\t');
      out += (tab == std::string::npos ? line : line.substr(tab + 1)) + "\n";
    }
    return out;
  }
  void Protect(int op, int level, const std::string& password) {
    Database db;
    SilentUi ui;
    ASSERT_TRUE(db.Open(path, ui).ok());
    SetLevel(db.schema(), op, level);
    db.schema().password.set(password);
    ASSERT_TRUE(db.Save().ok());
  }

  cx::testing::TempDir dir;
  std::string path = dir.File("Stock.PDB");
};

TEST_F(DesignCommands, UnansweredOrDeclinedQuestionsLeaveTheFileAlone) {
  const auto before = FileBytes(path);
  Result r = RunTool({"set-field", path, "Code", "--type", "Unique"});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("Use the existing data in this field for the unique values?"), std::string::npos);
  EXPECT_EQ(FileBytes(path), before);

  r = RunTool({"--no", "set-field", path, "Qty", "--type", "Pop-Up"});
  EXPECT_EQ(r.code, 0) << r.err;
  EXPECT_NE(r.err.find("Can't Switch these Field Types without data loss.  Continue?"), std::string::npos);
  EXPECT_EQ(FileBytes(path), before);

  r = RunTool({"set-field", path, "Colour", "--type", "Date"});
  EXPECT_EQ(r.code, 1);
  EXPECT_EQ(FileBytes(path), before);
}

TEST_F(DesignCommands, TypeChangeWithYes) {
  Result r = RunTool({"--yes", "set-field", path, "Code", "--type", "Unique"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "Field 0 Code: Text -> Unique, 3 records rewritten\n");
  EXPECT_EQ(Records(path), "Code\tQty\tColour\n7\t1\tRed\n0\t2\tGreen\n3\t3\tBlue\n");

  r = RunTool({"--no", "set-field", path, "Qty", "--type", "Link"});  // Integer to Link loses
  EXPECT_EQ(r.code, 0);
  r = RunTool({"--yes", "set-field", path, "Colour", "--type", "Text", "--max-chars", "3"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(Records(path), "Code\tQty\tColour\n7\t1\tRed\n0\t2\tGre\n3\t3\tBlu\n");
}

TEST_F(DesignCommands, SettingsAreClampedAndShown) {
  ASSERT_EQ(RunTool({"set-field", path, "Code", "--max-chars", "999", "--pixels", "100", "--name",
                 "Article"}).code, 0);
  Result r = RunTool({"set-field", path, "Article"});
  EXPECT_EQ(r.out,
            "slot: 0\nname: Article\ntype: Text\nmax-chars: 254\npixels: 99\nvisible: yes\n"
            "export: yes\npopups-append: no\n");
  EXPECT_EQ(RunTool({"set-field", path, "Code", "--type", "Nonsense"}).code, 2);
  EXPECT_EQ(RunTool({"set-field", path, "Nowhere", "--name", "x"}).code, 2);
}

TEST_F(DesignCommands, PopupDeleteRenumbersTheRecords) {
  Result r = RunTool({"popups", path, "Colour", "delete", "Red"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "#0\tGreen\n#1\tBlue\n");
  EXPECT_EQ(Records(path), "Code\tQty\tColour\n7\t1\tNo Value\n\t2\tGreen\n3\t3\tBlue\n");
  EXPECT_EQ(RunTool({"popups", path, "Colour", "delete", "#5"}).code, 1);
  r = RunTool({"popups", path, "Colour", "sort", "on"});
  EXPECT_EQ(r.out, "#1\tBlue\n#0\tGreen\n");
}

TEST_F(DesignCommands, PopupListHoldsSixty) {
  std::vector<std::string> args{"popups", path, "Code", "add"};
  for (int i = 0; i < 60; ++i) args.push_back("v" + std::to_string(i));
  ASSERT_EQ(RunTool(args).code, 0);
  const auto before = FileBytes(path);
  Result r = RunTool({"popups", path, "Code", "add", "more"});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("You have reached the maximum number of popups allowed!"), std::string::npos);
  EXPECT_EQ(FileBytes(path), before);
}

TEST_F(DesignCommands, SecurityLevelsAndPasswords) {
  Result r = RunTool({"security", path, "Edit Records", "View Records Only", "db-properties",
                  "password", "--set-password", "Secret"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_NE(r.out.find("Edit Records: View Records Only\n"), std::string::npos);
  EXPECT_EQ(RunTool({"security", path, "Add Records", "View Records Only"}).code, 2);
  EXPECT_EQ(RunTool({"security", path, "Delete Database", "No Access"}).code, 2);

  // DB Properties now needs the password, exactly.
  const auto before = FileBytes(path);
  EXPECT_EQ(RunTool({"rename", path, "Other"}).code, 1);
  r = RunTool({"--password", "secret", "rename", path, "Other"});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("Invalid Password"), std::string::npos);
  EXPECT_NE(r.err.find("Sorry, You do Not have Security Access to Perform this Operation!"),
            std::string::npos);
  EXPECT_EQ(FileBytes(path), before);
  EXPECT_EQ(RunTool({"--password", "Secret", "rename", path, "Other"}).code, 0);
  EXPECT_EQ(RunTool({"--password", "Secret", "rename", path, "A name of 20 letters"}).code, 2);
}

TEST_F(DesignCommands, EditPopupsNoAccessRefusesPopupChanges) {
  Protect(secured::kEditPopups, access_level::kNone, "");
  const auto before = FileBytes(path);
  Result r = RunTool({"popups", path, "Colour", "add", "Cyan"});
  EXPECT_EQ(r.code, 1);
  EXPECT_EQ(FileBytes(path), before);
  EXPECT_EQ(RunTool({"popups", path, "Colour"}).code, 0);  // looking is not guarded
}

TEST_F(DesignCommands, FieldOrderMovesAndLimits) {
  EXPECT_EQ(RunTool({"order", path, "up", "Code"}).code, 2);
  EXPECT_EQ(RunTool({"order", path, "down", "29"}).code, 2);
  Result r = RunTool({"order", path, "down", "Code", "down", "Code"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out.substr(0, 28), "0\t1\tQty\n1\t2\tColour\n2\t0\tCode\n");
  EXPECT_EQ(Records(path).substr(0, 18), "Qty\tColour\tCode\n1\t");
  EXPECT_EQ(RunTool({"order", path, "--set", "0,1,2"}).code, 2);
}

TEST_F(DesignCommands, AuthorAndComments) {
  ASSERT_EQ(RunTool({"author", path, "--author", "Ana", "--comments", "Stock list"}).code, 0);
  EXPECT_EQ(RunTool({"author", path}).out, "Author: Ana\nComments: Stock list\n");
  EXPECT_EQ(RunTool({"author", path, "--author", std::string(40, 'x')}).code, 2);
}

TEST_F(DesignCommands, TransferRefusesOtherFieldTypes) {
  const std::string other = dir.File("Other.PDB");
  Database db = cx::testing::MakeDatabase(other, {{"Qty", T::Integer}, {"Code", T::Text}});
  ASSERT_TRUE(db.Save().ok());
  const auto source = FileBytes(path);
  const auto target = FileBytes(other);
  Result r = RunTool({"move-records", path, other});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("do not match that of this database!"), std::string::npos);
  EXPECT_EQ(FileBytes(path), source);
  EXPECT_EQ(FileBytes(other), target);
}

TEST_F(DesignCommands, MoveOneRecordAndCopyToItself) {
  const std::string archive = dir.File("Archive.PDB");
  Database db = cx::testing::MakeDatabase(
      archive, {{"Code", T::Text}, {"Qty", T::Integer}, {"Colour", T::PopUp}});
  ASSERT_TRUE(db.Save().ok());
  Result r = RunTool({"move-records", path, archive, "--record", "1"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "1 record copied, 1 removed from " + path + "\n");
  EXPECT_EQ(Records(archive), "Code\tQty\tColour\n\t2\t\n");
  EXPECT_EQ(RunTool({"move-records", path, path}).code, 1);
  r = RunTool({"copy-records", path, path});
  ASSERT_EQ(r.code, 0) << r.err;
  // The walk runs from the last record, so the copies arrive in reverse.
  EXPECT_EQ(Records(path), "Code\tQty\tColour\n7\t1\tRed\n3\t3\tBlue\n3\t3\tBlue\n7\t1\tRed\n");
}

TEST_F(DesignCommands, LinkedListsTheLinkedRecords) {
  Database orders = cx::testing::MakeDatabase(dir.File("Orders.PDB"),
                                              {{"Order", T::Text}, {"Items", T::Link}});
  orders.schema().field[1].text.set("Stock");
  orders.schema().field[1].otherField = 1;  // Stock's Qty
  cx::testing::AddRecord(orders, {"first", "3"});
  ASSERT_TRUE(orders.Save().ok());
  Result r = RunTool({"linked", orders.path(), "0", "Items"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "Index\tCode\tQty\tColour\n2\t3\t3\tBlue\n");
  EXPECT_EQ(RunTool({"linked", orders.path(), "0", "Order"}).code, 2);

  Protect(secured::kOpenDatabase, access_level::kNone, "");
  r = RunTool({"linked", orders.path(), "0", "Items"});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("Action Not Allowed for this Database!"), std::string::npos);
}

}  // namespace
}  // namespace cx::cli
