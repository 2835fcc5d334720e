#include "design/properties.h"

#include <gtest/gtest.h>

#include "tests/design/design_db.h"

namespace cx {
namespace {

TEST(DatabaseProperties, NameAuthorAndComments) {
  Database db = testing::MakeDatabase("/nonexistent/Old.PDB", {{"A", FieldType::Text}}, "Old");
  SetDatabaseName(db, "Twenty characters!!!");
  EXPECT_EQ(db.Name(), "Twenty characters!!");
  EXPECT_EQ(db.path(), "/nonexistent/Old.PDB");
  ApplyAuthorInfo(db, {std::string(50, 'a'), std::string(80, 'c')});
  AuthorInfo info = LoadAuthorInfo(db.schema());
  EXPECT_EQ(info.author.size(), 39u);
  EXPECT_EQ(info.comments.size(), 69u);
  EXPECT_TRUE(db.changed());
}

TEST(DatabaseProperties, FieldListHasThirtyEntries) {
  Database db = testing::MakeDatabase("/x", {{"Only", FieldType::Text}});
  auto entries = FieldListEntries(db.schema());
  ASSERT_EQ(entries.size(), 30u);
  EXPECT_EQ(entries[0], "Only");
  EXPECT_EQ(entries[29], "Field 30");
}

TEST(FieldOrder, ArrowsAtTheEndsAreNotOffered) {
  Database db = testing::MakeDatabase("/x", {{"A", FieldType::Text}});
  FieldOrderEditor editor(db.schema());
  EXPECT_FALSE(editor.CanMoveUp());  // no selection
  EXPECT_FALSE(editor.CanMoveDown());
  editor.Select(0);
  EXPECT_FALSE(editor.CanMoveUp());
  EXPECT_FALSE(editor.MoveUp());
  editor.Select(29);
  EXPECT_FALSE(editor.CanMoveDown());
  EXPECT_FALSE(editor.MoveDown());
  editor.Select(28);
  EXPECT_TRUE(editor.CanMoveDown());
}

TEST(FieldOrder, SelectionFollowsTheMovedEntryAndCancelDiscards) {
  Database db = testing::MakeDatabase("/x", {{"A", FieldType::Text}, {"B", FieldType::Text}});
  {
    FieldOrderEditor editor(db.schema());
    editor.Select(0);
    ASSERT_TRUE(editor.MoveDown());
    EXPECT_EQ(editor.selection(), 1);
    ASSERT_TRUE(editor.MoveDown());
    EXPECT_EQ(editor.ListTexts()[0], "B");
    EXPECT_EQ(editor.ListTexts()[2], "A");
  }
  EXPECT_EQ(db.schema().fieldOrder[0], 0);
  EXPECT_FALSE(db.changed());

  FieldOrderEditor editor(db.schema());
  editor.Select(1);
  ASSERT_TRUE(editor.MoveUp());
  editor.Commit(db);
  EXPECT_EQ(db.schema().fieldOrder[0], 1);
  EXPECT_EQ(db.schema().fieldOrder[1], 0);
  EXPECT_TRUE(IsValidFieldOrder(db.schema().fieldOrder));
  EXPECT_TRUE(db.changed());
}

}  // namespace
}  // namespace cx
