#include "app/view_levels.h"

#include <gtest/gtest.h>

#include "ops/database_settings.h"
#include "tests/design/design_db.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using T = FieldType;

std::unique_ptr<Database> NewDb(const std::string& path, const std::string& name) {
  return std::make_unique<Database>(testing::MakeDatabase(path, {{"A", T::Text}}, name));
}

LinkedDatabase Linked(const std::string& path, uint32_t value) {
  LinkContext context;
  context.restriction = {0, value};
  return LinkedDatabase(NewDb(path, "Child"), context);
}

TEST(ViewLevels, EmptyStackShowsNothing) {
  ViewLevelStack stack;
  EXPECT_EQ(stack.current(), 0);
  EXPECT_FALSE(stack.shown().open());
  EXPECT_EQ(stack.TitleLabel(0), "Cardovex");
  EXPECT_EQ(stack.StatusLabel(), "");
  EXPECT_FALSE(stack.BackEnabled());
  // Nothing to link from.
  EXPECT_FALSE(stack.Push(Linked("/x/c.PDB", 1), LevelMode::Browse, 0));
}

TEST(ViewLevels, TwentyLevelsAtMost) {
  ViewLevelStack stack;
  stack.OpenRoot(NewDb("/x/root.PDB", "Root"));
  for (int n = 1; n < ViewLevelStack::kMaxLevels; ++n) {
    ASSERT_TRUE(stack.Push(Linked("/x/l" + std::to_string(n) + ".PDB", n), LevelMode::Browse, 1));
  }
  EXPECT_EQ(stack.current(), 19);
  EXPECT_FALSE(stack.Push(Linked("/x/more.PDB", 99), LevelMode::Browse, 1));
  EXPECT_EQ(stack.shown().restriction()->value, 19u);
  stack.Clear();
  EXPECT_EQ(stack.current(), 0);
  EXPECT_FALSE(stack.shown().open());
}

TEST(ViewLevels, ClosingReturnsToTheLevelBeneath) {
  ViewLevelStack stack;
  stack.OpenRoot(NewDb("/x/root.PDB", "Root"));
  stack.shown().currentRecord = 7;
  ASSERT_TRUE(stack.Push(Linked("/x/child.PDB", 3), LevelMode::Browse, 2));
  stack.shown().currentRecord = 1;
  EXPECT_TRUE(stack.BackEnabled());
  EXPECT_EQ(stack.level(1).linkField, 2);
  std::unique_ptr<Database> closed = stack.Pop();
  ASSERT_TRUE(closed);
  EXPECT_EQ(closed->Name(), "Child");
  EXPECT_EQ(stack.current(), 0);
  EXPECT_EQ(stack.shown().currentRecord, 7u);
  EXPECT_EQ(stack.Pop(), nullptr);  // level 0 is closed another way
}

TEST(ViewLevels, SharedDatabasesAreFoundAndNotOwned) {
  ViewLevelStack stack;
  stack.OpenRoot(NewDb("/x/Root.PDB", "Root"));
  Database* root = stack.FindOpen("/x/root.pdb");
  ASSERT_EQ(root, stack.level(0).db);
  ASSERT_TRUE(stack.Push(LinkedDatabase(root, LinkContext{}), LevelMode::Choose, 0));
  EXPECT_EQ(stack.shown().db, root);
  EXPECT_EQ(stack.FindOpen("/x/other.PDB"), nullptr);
  EXPECT_EQ(stack.Pop(), nullptr);
  EXPECT_TRUE(stack.shown().open());
}

TEST(ViewLevels, LabelsAndTaps) {
  ViewLevelStack stack;
  stack.OpenRoot(NewDb("/x/root.PDB", "Root"));
  Database& root = *stack.shown().db;
  testing::AddRecord(root, {"a"});
  EXPECT_EQ(stack.TitleLabel(1), "Root* (1/1)");
  root.ClearChanged();
  EXPECT_EQ(stack.TitleLabel(0), "Root (0/1)");
  EXPECT_EQ(stack.ActionForTap(), TapAction::Edit);

  FilterSettings filters = LoadFilterSettings(root.schema());
  filters.filter[1].enabled = true;
  StoreFilterSettings(filters, root.schema());
  EXPECT_EQ(stack.StatusLabel(), "Filtered");

  ASSERT_TRUE(stack.Push(Linked("/x/c.PDB", 1), LevelMode::Reassign, 0));
  EXPECT_EQ(stack.StatusLabel(), "Linked");
  EXPECT_EQ(stack.ActionForTap(), TapAction::AskReassign);
  FilterSettings childFilters = LoadFilterSettings(stack.shown().db->schema());
  childFilters.filter[0].enabled = true;
  StoreFilterSettings(childFilters, stack.shown().db->schema());
  EXPECT_EQ(stack.StatusLabel(), "Link+Filter");

  ASSERT_TRUE(stack.Push(Linked("/x/d.PDB", 1), LevelMode::Choose, 0));
  EXPECT_EQ(stack.ActionForTap(), TapAction::Choose);
}

}  // namespace
}  // namespace cx
