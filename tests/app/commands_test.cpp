// Which commands are enabled, and which access check each asks.
#include <gtest/gtest.h>

#include <set>

#include "app/commands.h"
#include "design/security.h"
#include "tests/app/app_fixture.h"

namespace cx::testing {
namespace {

// Commands that work on the open database.
const std::set<Command> kNeedDatabase = {
    Command::Close,        Command::SaveAs,        Command::Find,         Command::FindAgain,
    Command::Filter,       Command::Sort,          Command::RunReport,    Command::MoveRecords,
    Command::CopyRecords,  Command::ExportRecords, Command::DeleteRecords, Command::DBProperties,
    Command::BeamRecords,  Command::BeamDatabase,  Command::PrintRecords, Command::NewRecord,
    Command::ImportRecords, Command::DisableFilters, Command::Recalculate};

class CommandsTest : public AppFixture {};

TEST_F(CommandsTest, MenuStateFollowsTheOpenDatabase) {
  MenuState none = MenuStateFor(workspace);
  for (const CommandInfo& info : CommandTable()) {
    const bool greyed = kNeedDatabase.count(info.id) || info.id == Command::Save || info.id == Command::Back;
    EXPECT_EQ(none[info.id], !greyed) << info.text;
  }

  const std::string path = WritePeople();
  ASSERT_TRUE(workspace.Open(path));
  MenuState open = MenuStateFor(workspace);
  for (Command c : kNeedDatabase) EXPECT_TRUE(open[c]) << InfoOf(c).text;
  EXPECT_FALSE(open[Command::Save]);
  EXPECT_FALSE(open[Command::Back]);

  workspace.shown()->SetColumnPixels(0, 30);
  EXPECT_TRUE(MenuStateFor(workspace)[Command::Save]);

  LinkContext link;
  link.restriction.field = -1;
  auto again = std::make_unique<Database>();
  ASSERT_TRUE(again->Open(path, ui).ok());
  ASSERT_TRUE(workspace.PushLinked(LinkedDatabase(std::move(again), link), LevelMode::Browse, 0));
  EXPECT_TRUE(MenuStateFor(workspace)[Command::Back]);
}

TEST(MenuTextTest, UserNamesKeepTheirAmpersands) {
  EXPECT_EQ(EscapeMnemonics("Tom & Jerry"), "Tom && Jerry");
}

TEST_F(CommandsTest, TheHeadingMenuIsNoWayRoundTheGuard) {
  ASSERT_TRUE(workspace.Open(WritePeople()));
  Document& doc = *workspace.shown();
  SetLevel(doc.db().schema(), secured::kDBProperties, access_level::kNone);
  EXPECT_FALSE(CommandAllowed(HeadingCommand::FieldProperties, doc, ui));
  EXPECT_FALSE(CommandAllowed(Command::DBProperties, doc, ui));
  EXPECT_EQ(ui.messages.size(), 2u);
  EXPECT_EQ(ui.messages[0].caption, "ACCESS DENIED");
  EXPECT_TRUE(CommandAllowed(HeadingCommand::SortForward, doc, ui));

  // "Password Required" asks every time.
  doc.db().schema().password.set("pw");
  SetLevel(doc.db().schema(), secured::kDBProperties, access_level::kPassword);
  ui.passwordAnswers = {{"pw"}, {"no"}};
  EXPECT_TRUE(CommandAllowed(HeadingCommand::FieldProperties, doc, ui));
  EXPECT_FALSE(CommandAllowed(HeadingCommand::FieldProperties, doc, ui));
  EXPECT_EQ(ui.passwordPrompts, 2);
}

}  // namespace
}  // namespace cx::testing
