// The list view's use cases on one document: sorting from a heading, find,
// deleting, column widths, and storing records from the editor.
#include <gtest/gtest.h>

#include "app/columns.h"
#include "app/commands.h"
#include "app/document.h"
#include "design/security.h"
#include "engine/record.h"
#include "tests/app/app_fixture.h"

namespace cx::testing {
namespace {

// Counts what a document told.
struct Heard : DocumentListener {
  void ViewRebuilt() override { ++rebuilt; }
  void ColumnsChanged() override { ++columns; }
  void ChangedMarkToggled(bool changed) override { marks.push_back(changed); }
  void CurrentRecordChanged(size_t index) override { current = index; }
  void FoundRecordChanged() override { ++found; }
  int rebuilt = 0;
  int columns = 0;
  int found = 0;
  size_t current = 9999;
  std::vector<bool> marks;
};

class DocumentTest : public AppFixture {
 protected:
  Document& Open(const std::string& path) {
    EXPECT_TRUE(workspace.Open(path));
    Document& doc = *workspace.shown();
    doc.AddListener(&heard);
    return doc;
  }
  Document& OpenPeople() { return Open(WritePeople()); }
  // The first field's text of each row, top to bottom.
  static std::vector<std::string> Names(const Document& doc) {
    std::vector<std::string> names;
    for (size_t r = 0; r < doc.rowCount(); ++r) names.push_back(doc.ValueText(doc.recordAt(r), 0));
    return names;
  }
  using Strings = std::vector<std::string>;

  Heard heard;
};

TEST_F(DocumentTest, SortFromHeaderKeepsTheCurrentRecord) {
  Document& doc = OpenPeople();
  doc.SetCurrentRecord(0);  // Carla
  doc.SortFromHeader(0, true);
  EXPECT_EQ(Names(doc), (Strings{"Anna", "Bert", "Carla"}));
  EXPECT_EQ(doc.db().schema().sortKey[0].field, 0);
  EXPECT_EQ(doc.db().schema().sortKey[0].direction, 1);
  EXPECT_EQ(doc.currentRecord(), 2u);
  EXPECT_EQ(heard.current, 2u);
  EXPECT_EQ(heard.marks, std::vector<bool>{true});

  doc.SortFromHeader(0, false);
  EXPECT_EQ(Names(doc), (Strings{"Carla", "Bert", "Anna"}));
  EXPECT_EQ(doc.db().schema().sortKey[0].direction, 0);
  EXPECT_EQ(doc.ValueText(doc.currentRecord(), 0), "Carla");
}

TEST_F(DocumentTest, FindAndFindAgain) {
  Document& doc = Open(WriteDatabase("Pets", {{"Name", FieldType::Text}},
                                     {{"Rex"}, {"Brandy"}, {"Max"}, {"Andy"}}));
  EXPECT_EQ(doc.FindAgain(), std::nullopt);  // nothing remembered yet: the dialog's turn

  SearchSettings search;
  search.text = "and";
  EXPECT_EQ(doc.Find(search), 1);
  EXPECT_EQ(doc.currentRecord(), 1u);
  EXPECT_EQ(doc.found().index, 1);
  EXPECT_TRUE(doc.changed());  // the search settings live in the file
  EXPECT_EQ(doc.FindAgain(), std::optional<int>(3));
  EXPECT_EQ(doc.currentRecord(), 3u);
  EXPECT_EQ(heard.found, 2);

  // Past the last hit: the message, and the selection stays.
  EXPECT_EQ(doc.FindAgain(), std::optional<int>(-1));
  ASSERT_FALSE(ui.messages.empty());
  EXPECT_EQ(ui.messages.back().text.rfind("Not Found in Database!", 0), 0u);
  EXPECT_EQ(doc.currentRecord(), 3u);
}

TEST_F(DocumentTest, DeleteRecordsByScope) {
  Document& doc = OpenPeople();
  FilterDialogValues values = OpenFilterDialog(doc.db());
  values.filter[0].enabled = true;
  values.filter[0].field = 0;
  values.filter[0].mustContain = "a";  // Carla, Anna
  doc.ApplyFilterDialog(values);
  ASSERT_EQ(doc.rowCount(), 2u);

  EXPECT_EQ(doc.DeleteRecords(DeleteScope::OutsideFilterRange), 1u);
  EXPECT_EQ(doc.db().recordCount(), 2u);
  EXPECT_TRUE(ui.questions.empty());  // no Link fields: no linked question
  EXPECT_EQ(doc.DeleteRecords(DeleteScope::WithinFilterRange), 2u);
  EXPECT_EQ(doc.rowCount(), 0u);
  EXPECT_EQ(doc.currentRecord(), 0u);
}

TEST_F(DocumentTest, DeleteAsksAboutLinkedRecordsAndTheCommandIsGuarded) {
  const std::string path =
      WriteDatabase("Owners", {{"Name", FieldType::Text}, {"Pets", FieldType::Link}}, {{"Ann", "1"}, {"Bo", "2"}});
  Document& doc = Open(path);
  ui.yesNoAnswers = {false};
  EXPECT_EQ(doc.DeleteRecords(DeleteScope::All), 2u);
  ASSERT_EQ(ui.questions.size(), 1u);
  EXPECT_EQ(ui.questions[0].text, "Would you like to delete the linked records also? (Y/N)");
  EXPECT_EQ(ui.questions[0].caption, "QUESTION");

  ASSERT_TRUE(workspace.Open(WritePeople()));
  Document& guarded = *workspace.shown();
  SetLevel(guarded.db().schema(), secured::kDeleteRecords, access_level::kNone);
  EXPECT_FALSE(CommandAllowed(Command::DeleteRecords, guarded, ui));
  EXPECT_EQ(ui.messages.back().caption, "ACCESS DENIED");
}

TEST_F(DocumentTest, ColumnsFollowTheFieldOrderAndHideWidthZero) {
  Document& doc = Open(WriteDatabase(
      "Cols", {{"A", FieldType::Text}, {"B", FieldType::Text}, {"C", FieldType::Text}}, {{"1", "2", "3"}}));
  Schema& schema = doc.db().schema();
  for (int f = 3; f < 30; ++f) schema.field[f].width = 0;
  schema.fieldOrder[0] = 2;
  schema.fieldOrder[1] = 0;
  schema.fieldOrder[2] = 1;
  schema.field[2].width = 7;  // 10.5 pixels, truncated
  schema.field[0].width = 0;
  doc.ViewChangedExternally(true);
  const std::vector<ListColumn> columns = doc.Columns();
  ASSERT_EQ(columns.size(), 2u);
  EXPECT_EQ(columns[0].field, 2);
  EXPECT_EQ(columns[0].pixels, 10);
  EXPECT_EQ(columns[1].field, 1);
  EXPECT_EQ(doc.FieldOfColumn(1), 1);
  EXPECT_EQ(doc.FieldOfColumn(2), -1);

  // Hiding the last visible fields leaves a list without columns.
  heard.columns = 0;
  doc.HideField(2);
  doc.HideField(1);
  EXPECT_TRUE(doc.Columns().empty());
  EXPECT_EQ(heard.columns, 2);
  EXPECT_EQ(doc.FieldOfColumn(0), -1);
}

TEST_F(DocumentTest, DraggingADividerStoresTheWidthWithoutARebuild) {
  Document& doc = OpenPeople();
  heard.rebuilt = 0;
  doc.SetColumnPixels(0, 91);
  EXPECT_EQ(doc.db().schema().field[0].width, 60);  // 91 x 2/3, truncated
  EXPECT_EQ(doc.Columns()[0].pixels, 90);
  EXPECT_EQ(heard.marks, std::vector<bool>{true});
  EXPECT_EQ(heard.rebuilt, 0);
  EXPECT_EQ(workspace.TitleLabel(), "People* (3/3)");
}

TEST_F(DocumentTest, AutoFit) {
  const auto sixPerLetter = [](const std::string& text) { return static_cast<int>(text.size()) * 6; };
  Document& doc = Open(WriteDatabase("Fit", {{"Name", FieldType::Text}, {"On", FieldType::CheckBox}},
                                     {{"abc", "1"}, {"abcdefgh", "0"}}));
  // The widest value, 48 pixels, beats the heading's 24 + 13: (48 + 2) x 2/3.
  doc.AutoFit(0, sixPerLetter);
  EXPECT_EQ(doc.db().schema().field[0].width, 33);
  EXPECT_TRUE(doc.changed());
  // A check box counts 16 pixels; its short heading gives 12 + 13 = 25.
  doc.AutoFit(1, sixPerLetter);
  EXPECT_EQ(doc.db().schema().field[1].width, 18);

  // Never more than 160 units.
  doc.AutoFit(0, [](const std::string&) { return 5000; });
  EXPECT_EQ(doc.db().schema().field[0].width, 160);
}

TEST_F(DocumentTest, AutoFitOfAnEmptyDatabaseUsesTheHeading) {
  Document& doc = Open(WriteDatabase("Empty", {{"Heading", FieldType::Text}}, {}));
  doc.AutoFit(0, [](const std::string& text) { return static_cast<int>(text.size()) * 6; });
  EXPECT_EQ(doc.db().schema().field[0].width, 38);  // (42 + 13 + 2) x 2/3
}

TEST(ColumnWidthTest, ARoundTripMayLoseAUnitAsItAlwaysDid) {
  EXPECT_EQ(StoredFromPixels(PixelsFromStored(58)), 58);
  EXPECT_EQ(StoredFromPixels(PixelsFromStored(1)), 0);
}

TEST_F(DocumentTest, StoredRecordsTakeTheirSortedPlace) {
  Document& doc = OpenPeople();
  doc.SortFromHeader(0, true);  // Anna, Bert, Carla
  const Schema& schema = doc.db().schema();

  StoreResult added = doc.StoreRecord(kNewRecord, MakeRecord(schema, {"Bea", "40"}));
  ASSERT_TRUE(added.ok());
  EXPECT_EQ(added.index, 1u);
  EXPECT_EQ(doc.currentRecord(), 1u);
  EXPECT_EQ(Names(doc), (Strings{"Anna", "Bea", "Bert", "Carla"}));

  // An edit that changes the key moves the record.
  StoreResult moved = doc.StoreRecord(0, MakeRecord(schema, {"Zoe", "52"}));
  ASSERT_TRUE(moved.ok());
  EXPECT_EQ(moved.index, 3u);
  EXPECT_EQ(Names(doc), (Strings{"Bea", "Bert", "Carla", "Zoe"}));

  EXPECT_FALSE(doc.StoreRecord(17, MakeRecord(schema, {"X"})).ok());
  EXPECT_EQ(ui.messages.back().text, "ERROR: Saving record!");

  ASSERT_TRUE(doc.DeleteRecord(1, false));
  EXPECT_EQ(Names(doc), (Strings{"Bea", "Carla", "Zoe"}));
  EXPECT_FALSE(doc.DeleteRecord(3, false));
}

TEST_F(DocumentTest, RunReportOnlyForNumbersAndDates) {
  Document& doc = OpenPeople();
  EXPECT_TRUE(doc.CanRunReport(1));
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_FALSE(doc.CanRunReport(0));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text,
            "Can only run reports on the following field types:\nInteger, Float, Checkbox, Time, Date, and "
            "Calculated.");
  EXPECT_EQ(ui.messages[0].caption, "ERROR");
}

}  // namespace
}  // namespace cx::testing
