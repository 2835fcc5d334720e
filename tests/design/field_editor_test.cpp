#include "design/field_editor.h"

#include <gtest/gtest.h>

#include "design/field_controls.h"
#include "tests/design/design_db.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ScriptedUi;
using T = FieldType;

class FieldEditor : public ::testing::Test {
 protected:
  FieldApplyOutcome Apply(int slot, const FieldSettings& s) {
    DataSession session(db, locale, ui);
    return ApplyFieldSettings(session, slot, s);
  }
  // Applies `edit` to the loaded settings of `slot` and loads them again.
  template <typename Edit>
  FieldSettings RoundTrip(int slot, Edit edit) {
    FieldSettings s = LoadFieldSettings(db, slot);
    edit(s);
    Apply(slot, s);
    return LoadFieldSettings(db, slot);
  }

  Database db = testing::MakeDatabase("/nonexistent/f.PDB", {{"Name", T::Text},
                                                             {"Other", T::Link},
                                                             {"Sum", T::Calculated},
                                                             {"Colour", T::PopUp},
                                                             {"Price", T::Float}});
  ScriptedUi ui;
  LocaleInfo locale;
};

TEST_F(FieldEditor, TitlesCountFromOne) {
  EXPECT_EQ(FieldEditorTitle(0), "Edit Field 1");
  EXPECT_EQ(FieldNameLabel(29), "Field 30 Name");
}

TEST_F(FieldEditor, ClampsOnStoring) {
  FieldSettings s = RoundTrip(0, [](FieldSettings& s) {
    s.name = "A name of twenty-five chars";
    s.maxCharacters = ReadNumberEdit("999");
    s.pixelsShown = ReadNumberEdit("240");
  });
  EXPECT_EQ(db.schema().field[0].name.str(), "A name of twenty-fi");
  EXPECT_EQ(db.schema().field[0].size, 254);
  EXPECT_EQ(db.schema().field[0].width, 160);
  EXPECT_EQ(s.pixelsShown, 240);

  s = RoundTrip(0, [](FieldSettings& s) { s.pixelsShown = 100; });
  EXPECT_EQ(db.schema().field[0].width, 66);
  EXPECT_EQ(s.pixelsShown, 99);
  EXPECT_TRUE(db.changed());
}

TEST_F(FieldEditor, NumericEditsReadLeadingDigits) {
  EXPECT_EQ(ReadNumberEdit("12ab"), 12);
  EXPECT_EQ(ReadNumberEdit("abc"), 0);
  EXPECT_EQ(ReadNumberEdit("-5"), -5);
  EXPECT_EQ(StoredWidthFromPixels(999), 160);
}

TEST_F(FieldEditor, OtherFieldNumberOutsideTheSlotsStoresSlotZero) {
  for (int entered : {0, 31}) {
    FieldSettings s = RoundTrip(1, [entered](FieldSettings& s) {
      s.otherDatabase = "Parts";
      s.otherFieldNumber = entered;
    });
    EXPECT_EQ(db.schema().field[1].otherField, 0);
    EXPECT_EQ(s.otherFieldNumber, 1);
  }
  FieldSettings s = RoundTrip(1, [](FieldSettings& s) {
    s.otherFieldNumber = 7;
    s.showValueFrom = 3;  // slot 2
  });
  EXPECT_EQ(db.schema().field[1].otherField, 6);
  EXPECT_EQ(db.schema().field[1].param1, 2);
  EXPECT_EQ(db.schema().field[1].text.str(), "Parts");
  EXPECT_EQ(s.showValueFrom, 3);
}

TEST_F(FieldEditor, OtherDatabaseComesFromTheFilesHeader) {
  testing::TempDir dir;
  Database parts = testing::MakeDatabase(dir.File("p2.PDB"), {{"P", T::Text}}, "Parts List");
  ASSERT_TRUE(parts.Save().ok());
  FieldSettings s = LoadFieldSettings(db, 1);
  ASSERT_TRUE(PickOtherDatabase(parts.path(), s));
  EXPECT_EQ(s.otherDatabase, "Parts List");
  EXPECT_FALSE(PickOtherDatabase(dir.File("none.PDB"), s));
  EXPECT_EQ(s.otherDatabase, "Parts List");
}

TEST_F(FieldEditor, DbPopupGroupNeverNegative) {
  RoundTrip(0, [](FieldSettings& s) {
    s.type = static_cast<int>(T::DBPopup);
    s.group = -4;
  });
  EXPECT_EQ(db.schema().field[0].param3, 0);
  RoundTrip(0, [](FieldSettings& s) { s.group = 9; });
  EXPECT_EQ(db.schema().field[0].param3, 9);
}

TEST_F(FieldEditor, CalculatedOperandsAndConstants) {
  FieldSettings s = RoundTrip(2, [](FieldSettings& s) {
    s.value1 = 0;  // "No Field": a constant
    s.constant1 = "2.5toolong";
    s.prevRecord1 = true;  // ignored for a constant
    s.value2 = 5;          // slot 4
    s.prevRecord2 = true;
    s.operation = 6;
    s.resultFormat = 5;
  });
  const FieldDef& f = db.schema().field[2];
  EXPECT_EQ(f.param1, 255);
  EXPECT_EQ(f.param2, 4);
  EXPECT_EQ(f.calcFlags, 2);
  EXPECT_EQ(f.Constant1(), "2.5toolo");
  EXPECT_EQ(f.calcOperation, 6);
  EXPECT_EQ(f.resultFormat(), 5);
  EXPECT_EQ(s.value1, 0);
  EXPECT_EQ(s.constant1, "2.5toolo");
  EXPECT_TRUE(s.prevRecord2);
  EXPECT_EQ(s.resultFormat, 5);

  // A result format out of range shows as the first entry.
  db.schema().field[2].setResultFormat(9);
  EXPECT_EQ(LoadFieldSettings(db, 2).resultFormat, 0);
}

TEST_F(FieldEditor, PopUpDefaultValue) {
  // No popup values: the list holds only "No Value", which is selected.
  EXPECT_EQ(DefaultValueList(db, 3), std::vector<std::string>{"No Value"});
  db.popups()[3].items = {"Red", "Green"};
  db.schema().field[3].param1 = 255;
  FieldSettings s = LoadFieldSettings(db, 3);
  EXPECT_EQ(s.defaultValue, 2);
  s.defaultValue = 1;
  Apply(3, s);
  EXPECT_EQ(db.schema().field[3].param1, 1);
  s.defaultValue = 2;
  Apply(3, s);
  EXPECT_EQ(db.schema().field[3].param1, 255);
}

TEST_F(FieldEditor, FloatPlacesLiveInTheSizeSlot) {
  db.schema().field[4].size = 9;
  FieldSettings s = LoadFieldSettings(db, 4);
  EXPECT_EQ(s.places, 4);
  s.places = 2;
  s.maxCharacters = 999;  // not the Float's business
  Apply(4, s);
  EXPECT_EQ(db.schema().field[4].size, 2);
}

TEST_F(FieldEditor, TypeChoiceSideEffects) {
  db.popups()[0].items = {"a", "b", "c"};
  FieldSettings s = LoadFieldSettings(db, 0);
  s.defaultValue = 0;
  s.popupsAppend = true;
  s.type = static_cast<int>(T::PopUp);
  ChooseFieldType(s, static_cast<int>(T::Text), db, 0);
  EXPECT_EQ(s.defaultValue, 3);  // "No Value"
  EXPECT_TRUE(s.popupsAppend);

  s.type = static_cast<int>(T::Note);
  ChooseFieldType(s, static_cast<int>(T::PopUp), db, 0);
  EXPECT_FALSE(s.popupsAppend);

  s.popupsAppend = true;
  s.type = static_cast<int>(T::Float);
  ChooseFieldType(s, static_cast<int>(T::Note), db, 0);
  EXPECT_FALSE(s.popupsAppend);

  s.popupsAppend = true;
  s.type = static_cast<int>(T::Date);
  ChooseFieldType(s, static_cast<int>(T::Note), db, 0);
  EXPECT_TRUE(s.popupsAppend);
}

TEST_F(FieldEditor, NoTypeSelectedStoresNothing) {
  const Schema before = db.schema();
  FieldSettings s = LoadFieldSettings(db, 0);
  s.type = -1;
  s.name = "Changed";
  EXPECT_EQ(Apply(0, s).result, ApplyResult::NoTypeSelected);
  EXPECT_EQ(db.schema(), before);
}

TEST_F(FieldEditor, ChoiceLists) {
  auto fields = FieldChoiceList(db.schema());
  ASSERT_EQ(fields.size(), 31u);
  EXPECT_EQ(fields[0], "No Field");
  EXPECT_EQ(fields[1], "Name");
  EXPECT_EQ(fields[30], "Field 30");
}

TEST(FieldControlsTable, ShownControlsPerType) {
  EXPECT_EQ(ControlsForType(T::NotUsed), FieldControls{});
  FieldControls text = ControlsForType(T::Text);
  EXPECT_TRUE(text.pixelsShown && text.maxCharacters && text.editPopups && text.popupsAppend);
  FieldControls popup = ControlsForType(T::PopUp);
  EXPECT_TRUE(popup.editPopups && popup.defaultValue);
  EXPECT_FALSE(popup.popupsAppend);
  FieldControls image = ControlsForType(T::Image);
  EXPECT_TRUE(image.visible);
  EXPECT_FALSE(image.exportPrint || image.pixelsShown);
  FieldControls link = ControlsForType(T::Link);
  EXPECT_TRUE(link.otherDatabase && link.showValueFrom);
  EXPECT_FALSE(link.pixelsShown);
  FieldControls dbPopup = ControlsForType(T::DBPopup);
  EXPECT_TRUE(dbPopup.maxCharacters && dbPopup.popupsAppend && dbPopup.group && dbPopup.otherDatabase);
  EXPECT_FALSE(dbPopup.editPopups);
  EXPECT_TRUE(ControlsForType(T::Calculated).calc);
  EXPECT_TRUE(ControlsForOperand(0).constant);
  EXPECT_TRUE(ControlsForOperand(3).prevRecord);
}

}  // namespace
}  // namespace cx
