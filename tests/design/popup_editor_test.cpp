#include "design/popup_editor.h"

#include <gtest/gtest.h>

#include "design/security.h"
#include "engine/value_text.h"
#include "tests/design/design_db.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ScriptedUi;
using T = FieldType;

class PopupLists : public ::testing::Test {
 protected:
  void SetUp() override {
    db.popups()[0].items = {"Red", "Green", "Blue"};
    for (const char* v : {"0", "1", "2", "255", "1"}) testing::AddRecord(db, {v, "x"});
    db.ClearChanged();
  }
  std::vector<int> Indexes() {
    std::vector<int> out;
    for (size_t i = 0; i < db.recordCount(); ++i) out.push_back((*FieldValue(db.record(i), 0))[0]);
    return out;
  }

  Database db = testing::MakeDatabase("/nonexistent/p.PDB", {{"Colour", T::PopUp}, {"Note", T::Text}});
  ScriptedUi ui;
  LocaleInfo locale;
  DataSession session{db, locale, ui};
};

TEST_F(PopupLists, DeletingRenumbersAtOnceEvenWhenCancelled) {
  {
    PopupEditor editor(session, 0);
    ASSERT_TRUE(editor.Delete(0));
    EXPECT_EQ(editor.entries(), (std::vector<std::string>{"Green", "Blue"}));
    // The stored list waits for OK; the records do not.
    EXPECT_EQ(db.popups()[0].items.size(), 3u);
  }  // cancelled
  EXPECT_EQ(Indexes(), (std::vector<int>{255, 0, 1, 255, 0}));
  EXPECT_TRUE(db.changed());
}

TEST_F(PopupLists, DeleteThenOkKeepsEveryRecordOnItsEntry) {
  PopupEditor editor(session, 0);
  ASSERT_TRUE(editor.Delete(1));
  editor.Commit();
  EXPECT_EQ(Indexes(), (std::vector<int>{0, 255, 1, 255, 255}));
  ValueContext vc{db.schema(), db.popups(), locale};
  EXPECT_EQ(ValueText(vc, db.record(2), 0), "Blue");
}

TEST_F(PopupLists, DeletingFromATextFieldTouchesNoRecord) {
  db.popups()[1].items = {"a", "b"};
  PopupEditor editor(session, 1);
  ASSERT_TRUE(editor.Delete(0));
  EXPECT_EQ(Indexes(), (std::vector<int>{0, 1, 2, 255, 1}));
  EXPECT_FALSE(db.changed());
}

TEST_F(PopupLists, RenameKeepsTheIndex) {
  PopupEditor editor(session, 0);
  EXPECT_FALSE(editor.Rename(-1, "x"));  // no selection
  EXPECT_FALSE(editor.Rename(1, ""));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "You must first enter a value for this popup entry!");
  ASSERT_TRUE(editor.Rename(1, "Lime"));
  editor.Commit();
  ValueContext vc{db.schema(), db.popups(), locale};
  EXPECT_EQ(ValueText(vc, db.record(1), 0), "Lime");
  EXPECT_EQ(Indexes(), (std::vector<int>{0, 1, 2, 255, 1}));
}

TEST_F(PopupLists, SixtyAtMost) {
  PopupEditor editor(session, 1);
  for (int i = 0; i < 60; ++i) ASSERT_TRUE(editor.New("v" + std::to_string(i)));
  EXPECT_FALSE(editor.New("one too many"));
  EXPECT_EQ(editor.entries().size(), 60u);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "You have reached the maximum number of popups allowed!");
  EXPECT_EQ(ui.messages[0].caption, "ERROR");
  editor.Commit();
  EXPECT_EQ(db.popups()[1].items.size(), 60u);
}

TEST_F(PopupLists, LongValuesAreCut) {
  PopupEditor editor(session, 1);
  ASSERT_TRUE(editor.New(std::string(100, 'x')));
  EXPECT_EQ(editor.entries()[0].size(), 79u);
}

TEST_F(PopupLists, SortedViewOnlyChangesTheShownOrder) {
  db.schema().field[1].typeNumber = static_cast<int16_t>(T::Integer);
  db.popups()[1].items = {"10", "9", "100"};
  PopupEditor editor(session, 1);
  editor.SetSorted(true);
  EXPECT_EQ(editor.ListTexts(), (std::vector<std::string>{"9", "10", "100"}));
  EXPECT_EQ(editor.EntryAt(0), 1);
  editor.Commit();
  EXPECT_EQ(db.popups()[1].items, (std::vector<std::string>{"10", "9", "100"}));
  EXPECT_TRUE(PopupEditor(session, 1).sorted());

  // As text the same entries sort differently, case ignored.
  EXPECT_EQ(PopupViewOrder({"10", "9", "100"}, T::Text, true), (std::vector<int>{0, 2, 1}));
  EXPECT_EQ(PopupViewOrder({"b", "A", "c"}, T::Text, true), (std::vector<int>{1, 0, 2}));
}

TEST_F(PopupLists, DeletingTheSelectedRowOfASortedList) {
  PopupEditor editor(session, 0);
  editor.SetSorted(true);  // Blue, Green, Red
  ASSERT_TRUE(editor.Delete(0));  // Blue, entry 2
  EXPECT_EQ(Indexes(), (std::vector<int>{0, 1, 255, 255, 1}));
}

TEST_F(PopupLists, AppendFromTheRecordEditorIsGuarded) {
  EXPECT_EQ(AppendPopupValue(db, 1, "first", ui), 0);
  EXPECT_EQ(AppendPopupValue(db, 1, "first", ui), 0);  // already there
  SetLevel(db.schema(), secured::kEditPopups, access_level::kNone);
  EXPECT_EQ(AppendPopupValue(db, 1, "second", ui), -1);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].caption, "ACCESS DENIED");
  EXPECT_EQ(db.popups()[1].items.size(), 1u);
}

}  // namespace
}  // namespace cx
