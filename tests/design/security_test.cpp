#include "design/security.h"

#include <gtest/gtest.h>

#include "tests/design/design_db.h"
#include "tests/engine/test_databases.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ScriptedUi;
using testing::TempDir;

constexpr const char* kDenied = "Sorry, You do Not have Security Access to Perform this Operation!";

TEST(SecurityLevels, TwoBitsPerOperation) {
  Schema s = InitSchema();
  SetLevel(s, secured::kEditRecords, access_level::kViewOnly);
  SetLevel(s, secured::kBeamData, access_level::kNone);
  EXPECT_EQ(s.securityLevels, (3u << 4) | (2u << 14));
  EXPECT_EQ(ReadLevel(s, secured::kEditRecords), 3);
  EXPECT_EQ(ReadLevel(s, secured::kBeamData), 2);
  EXPECT_EQ(ReadLevel(s, secured::kOpenDatabase), 0);

  // Setting clears the old bits rather than or-ing into them.
  SetLevel(s, secured::kEditRecords, access_level::kPassword);
  EXPECT_EQ(ReadLevel(s, secured::kEditRecords), 1);

  // Operations past the word read as full access and are not written.
  const uint16_t before = s.securityLevels;
  SetLevel(s, 16, 3);
  SetLevel(s, -1, 3);
  EXPECT_EQ(s.securityLevels, before);
  EXPECT_EQ(ReadLevel(s, 16), 0);
}

TEST(SecurityLevels, NamesForScripts) {
  EXPECT_EQ(OperationFromName("Edit Records"), secured::kEditRecords);
  EXPECT_EQ(OperationFromName("delete-database"), secured::kDeleteDatabase);
  EXPECT_EQ(OperationFromName("Sort"), -1);
  EXPECT_EQ(AccessLevelFromName("View Records Only"), access_level::kViewOnly);
  EXPECT_EQ(AccessLevelFromName("password"), access_level::kPassword);
  EXPECT_EQ(LevelsOffered(secured::kEditRecords), 4);
  EXPECT_EQ(LevelsOffered(secured::kAddRecords), 3);
}

struct CheckCase {
  int level;
  std::vector<std::vector<std::string>> passwords;  // what the user types at each prompt
  Access expected;
  int prompts;
  std::vector<std::string> messages;
};

class AccessCheck : public ::testing::TestWithParam<CheckCase> {};

TEST_P(AccessCheck, AnswersByLevel) {
  const CheckCase& c = GetParam();
  Schema s = InitSchema();
  s.password.set("Secret");
  SetLevel(s, secured::kDeleteRecords, c.level);
  ScriptedUi ui;
  for (const auto& p : c.passwords) ui.passwordAnswers.push_back(p);
  EXPECT_EQ(CheckAccess(s, secured::kDeleteRecords, ui), c.expected);
  EXPECT_EQ(ui.passwordPrompts, c.prompts);
  std::vector<std::string> texts;
  for (const auto& m : ui.messages) texts.push_back(m.text);
  EXPECT_EQ(texts, c.messages);
}

INSTANTIATE_TEST_SUITE_P(
    Levels, AccessCheck,
    ::testing::Values(CheckCase{0, {}, Access::Granted, 0, {}},
                      CheckCase{3, {}, Access::ViewOnly, 0, {}},
                      CheckCase{2, {}, Access::Refused, 0, {kDenied}},
                      CheckCase{1, {{"Secret"}}, Access::Granted, 1, {}},
                      // Wrong case is wrong; the prompt stays open until cancelled.
                      CheckCase{1, {{"secret", "SECRET"}}, Access::Refused, 1,
                                {"Invalid Password", "Invalid Password", kDenied}},
                      CheckCase{1, {{"secret", "Secret"}}, Access::Granted, 1, {"Invalid Password"}},
                      CheckCase{1, {}, Access::Refused, 1, {kDenied}}));

TEST(AccessCheckMore, RefusalCaptionAndQuietMode) {
  Schema s = InitSchema();
  SetLevel(s, secured::kAddRecords, access_level::kNone);
  ScriptedUi ui;
  EXPECT_EQ(CheckAccess(s, secured::kAddRecords, ui), Access::Refused);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].caption, "ACCESS DENIED");
  EXPECT_EQ(CheckAccess(s, secured::kAddRecords, ui, /*showMessage=*/false), Access::Refused);
  EXPECT_EQ(ui.messages.size(), 1u);
}

TEST(AccessCheckMore, NothingIsRemembered) {
  Schema s = InitSchema();
  s.password.set("pw");
  SetLevel(s, secured::kEditRecords, access_level::kPassword);
  ScriptedUi ui;
  ui.passwordAnswers = {{"pw"}, {"pw"}};
  EXPECT_EQ(CheckAccess(s, secured::kEditRecords, ui), Access::Granted);
  EXPECT_EQ(CheckAccess(s, secured::kEditRecords, ui), Access::Granted);
  EXPECT_EQ(CheckAccess(s, secured::kEditRecords, ui), Access::Refused);  // no answer left
  EXPECT_EQ(ui.passwordPrompts, 3);
}

TEST(AccessCheckMore, EmptyPasswordGrantsOnEmptyEntry) {
  Schema s = InitSchema();
  SetLevel(s, secured::kBeamData, access_level::kPassword);
  ScriptedUi ui;
  ui.passwordAnswers = {{""}};
  EXPECT_EQ(CheckAccess(s, secured::kBeamData, ui), Access::Granted);
}

TEST(AccessCheckMore, ViewOnlyOnAnotherOperationCountsAsGranted) {
  Schema s = InitSchema();
  SetLevel(s, secured::kAddRecords, access_level::kViewOnly);  // as another program may store
  ScriptedUi ui;
  Access a = CheckAccess(s, secured::kAddRecords, ui);
  EXPECT_EQ(a, Access::ViewOnly);
  EXPECT_TRUE(Allowed(a));
  EXPECT_TRUE(ui.messages.empty());
}

class OpenAccess : public ::testing::Test {
 protected:
  std::string Write(int openLevel, const std::string& password) {
    Database db = testing::MakeDatabase(dir.File("Guarded.PDB"), {{"Name", FieldType::Text}});
    db.schema().password.set(password);
    SetLevel(db.schema(), secured::kOpenDatabase, openLevel);
    EXPECT_TRUE(db.Save().ok());
    return db.path();
  }
  TempDir dir;
  ScriptedUi ui;
};

TEST_F(OpenAccess, LevelsFromTheFile) {
  EXPECT_EQ(OpenLevel(Write(0, "")), 0);
  EXPECT_EQ(OpenLevel(Write(1, "x")), 1);
  EXPECT_EQ(OpenLevel(Write(2, "")), -1);
  EXPECT_EQ(OpenLevel(Write(3, "")), -1);
  EXPECT_EQ(OpenLevel(dir.File("missing.PDB")), -2);
}

TEST_F(OpenAccess, RefusedOpenShowsItsOwnMessage) {
  for (int level : {2, 3}) {
    ui.messages.clear();
    EXPECT_FALSE(CheckOpenAccess(Write(level, ""), ui));
    ASSERT_EQ(ui.messages.size(), 1u);
    EXPECT_EQ(ui.messages[0].text, "Action Not Allowed for this Database!");
    EXPECT_EQ(ui.messages[0].caption, "ACCESS DENIED");
  }
}

TEST_F(OpenAccess, PasswordFromTheFileAndQuietCancel) {
  const std::string path = Write(1, "Open Sesame");
  ui.passwordAnswers = {{"open sesame"}, {"Open Sesame"}};
  EXPECT_FALSE(CheckOpenAccess(path, ui));
  // Only the wrong password is reported: a cancel abandons quietly.
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "Invalid Password");
  EXPECT_TRUE(CheckOpenAccess(path, ui));
  EXPECT_EQ(ui.passwordPrompts, 2);
}

TEST_F(OpenAccess, UnreadableFileIsRefusedWithTheOpensMessage) {
  ASSERT_TRUE(WriteFileSafely(dir.File("junk.PDB"), "not a database", 14).ok());
  EXPECT_FALSE(CheckOpenAccess(dir.File("junk.PDB"), ui));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, messages::kBadHeader);
}

// The check must read the schema exactly as the open does: a schema record
// the open accepts (here one of the largest size) may not slip past it.
TEST_F(OpenAccess, LargestSchemaRecordStillAsksForThePassword) {
  Schema schema = InitSchema();
  schema.password.set("guard");
  SetLevel(schema, secured::kOpenDatabase, access_level::kPassword);
  std::vector<testing::RawRecord> records = testing::StandardRecords(schema);
  records[0].bytes.resize(format::kMaxRecordSize, 0);
  records.push_back({testing::ByteVector{0, 2, 0, 'x', 0, 0xFF, 0xFF}, 0, 0});
  const std::string path = dir.File("Big.PDB");
  ASSERT_TRUE(testing::WriteBytes(path, testing::BuildPdb(records)));
  Database opened;
  ASSERT_TRUE(opened.Open(path, ui).ok());
  EXPECT_EQ(OpenLevel(path), 1);
  EXPECT_FALSE(CheckOpenAccess(path, ui));
  EXPECT_EQ(ui.passwordPrompts, 1);
  ui.passwordAnswers = {{"guard"}};
  EXPECT_TRUE(CheckOpenAccess(path, ui));
}

TEST(SecuritySettingsDialog, StoresPasswordAndLevelsKeepingTheHiddenRow) {
  Database db = Database::CreateNew("/nonexistent/x.PDB", "X");
  SetLevel(db.schema(), secured::kDeleteDatabase, access_level::kNone);
  SecuritySettings s = LoadSecuritySettings(db.schema());
  EXPECT_EQ(s.levels[secured::kDeleteDatabase], access_level::kNone);
  s.password = "a-password-of-25-letters";
  s.levels[secured::kEditRecords] = access_level::kViewOnly;
  s.levels[secured::kOpenDatabase] = access_level::kPassword;
  ApplySecuritySettings(db, s);
  EXPECT_TRUE(db.changed());
  EXPECT_EQ(db.schema().password.str(), "a-password-of-25-le");
  EXPECT_EQ(ReadLevel(db.schema(), secured::kDeleteDatabase), access_level::kNone);
  EXPECT_EQ(ReadLevel(db.schema(), secured::kEditRecords), access_level::kViewOnly);
  EXPECT_EQ(OpenLevel(db.schema()), 1);
}

}  // namespace
}  // namespace cx
