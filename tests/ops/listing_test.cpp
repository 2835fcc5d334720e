#include <gtest/gtest.h>

#include "ops/linked_listing.h"
#include "ops/listing.h"
#include "platform/file_io.h"
#include "tests/ops/output_fixture.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::SampleDatabase;
using testing::TempDir;

const std::string kDashes = "----------------------------------------\n";

Database ListedSample() {
  Database db = SampleDatabase();
  testing::AddAwkwardRecords(db);
  // Only some fields are marked for export and printing.
  for (int slot : {testing::kPrice, testing::kDone, testing::kId, testing::kTotal, testing::kOwner,
                   testing::kSupplier, testing::kDue}) {
    db.schema().field[slot].exportPrint = 0;
  }
  return db;
}

std::string Listing(const Database& db, bool all, size_t current, LinkedListing* linked = nullptr) {
  LocaleInfo locale;
  StringSink sink;
  WriteListing(db, all, current, sink, ListingContext{locale, linked});
  return sink.text;
}

TEST(ListingTest, OneRecordInDisplayOrderWithItsDashes) {
  Database db = ListedSample();
  // Display order: Notes, Name, Color, Qty, Section, At, Photo (Parts is a
  // Link field and is left out while linked databases cannot be opened).
  EXPECT_EQ(Listing(db, false, 0),
            "Notes: Line one\rLine two \"quoted\"\n"
            "Name: Widget, large\n"
            "Color: Green\n"
            "Qty: -12\n"
            "Section: \n"
            "At: 1:07:05 PM\n"
            "Photo: \n" + kDashes);
  EXPECT_EQ(Listing(db, false, 1).rfind("Notes: \x93Smart\x94 \"\" ,;\nName: \nColor: No Value\n", 0), 0u);
  EXPECT_EQ(Listing(db, false, 99), "");
}

// Lists every record of another database as the records linked to any
// parent record.
class FakeLinks : public LinkedListing {
 public:
  explicit FakeLinks(const Database& other) : other_(other) {}
  bool WriteLinkedRecords(const Database&, size_t, int, TextSink& out, int level) override {
    LocaleInfo locale;
    for (size_t i = 0; i < other_.recordCount(); ++i) {
      WriteRecordListing(i, other_, out, level, ListingContext{locale, this});
    }
    return true;
  }

 private:
  const Database& other_;
};

Database Parts(const std::string& path) {
  Database db = Database::CreateNew(path, "Parts");
  testing::DefineField(db.schema(), 0, FieldType::Text, "Part");
  testing::DefineField(db.schema(), 1, FieldType::Linked, "Parent");
  for (auto [name, parent] : {std::pair<const char*, uint32_t>{"bolt", 7}, {"nut", 8}, {"washer", 7}}) {
    Bytes rec = NewEditingRecord(db.schema());
    SetEditingText(rec, 0, name, db.schema());
    SetEditingNumber(rec, 1, parent, db.schema());
    db.AppendRecord(Compact(rec, db.schema()));
  }
  return db;
}

TEST(ListingTest, LinkedRecordsAreIndentedInTheLinkFieldsPlace) {
  Database parts = Parts("/nonexistent/Parts.PDB");
  Database db = Database::CreateNew("/nonexistent/Job.PDB", "Job");
  testing::DefineField(db.schema(), 0, FieldType::Text, "Job");
  testing::DefineField(db.schema(), 1, FieldType::Link, "Parts");
  testing::DefineField(db.schema(), 2, FieldType::Text, "After");
  Bytes rec = NewEditingRecord(db.schema());
  SetEditingText(rec, 0, "fix", db.schema());
  SetEditingText(rec, 2, "done", db.schema());
  db.AppendRecord(Compact(rec, db.schema()));
  FakeLinks links(parts);
  EXPECT_EQ(Listing(db, false, 0, &links),
            "Job: fix\n"
            "   Part: bolt\n   Parent: 7\n" + kDashes +
            "   Part: nut\n   Parent: 8\n" + kDashes +
            "   Part: washer\n   Parent: 7\n" + kDashes +
            "After: done\n" + kDashes);
}

TEST(ListingTest, LinkedDatabasesAreFoundBesideTheParent) {
  TempDir dir;
  Database parts = Parts(dir.File("Parts.PDB"));
  ASSERT_TRUE(parts.Save());
  Database db = Database::CreateNew(dir.File("Job.PDB"), "Job");
  testing::DefineField(db.schema(), 0, FieldType::Text, "Job");
  testing::DefineField(db.schema(), 1, FieldType::Link, "Parts");
  db.schema().field[1].text.set("Parts");
  db.schema().field[1].otherField = 1;
  Bytes rec = NewEditingRecord(db.schema());
  SetEditingText(rec, 0, "fix", db.schema());
  SetEditingNumber(rec, 1, 7, db.schema());
  db.AppendRecord(Compact(rec, db.schema()));

  testing::ScriptedUi ui;
  LinkServices services(ui);
  LocaleInfo locale;
  LinkedRecordsListing links(services, locale);
  EXPECT_EQ(Listing(db, false, 0, &links),
            "Job: fix\n"
            "   Part: bolt\n   Parent: 7\n" + kDashes +
            "   Part: washer\n   Parent: 7\n" + kDashes + kDashes);
  EXPECT_TRUE(ui.messages.empty());

  // Without the other file the field is left out.
  ASSERT_TRUE(RemoveFile(dir.File("Parts.PDB")));
  EXPECT_EQ(Listing(db, false, 0, &links), "Job: fix\n" + kDashes);
}

TEST(ListingTest, ExportRecordsTextAsksForTheFileAndReports) {
  Database db = ListedSample();
  TempDir dir;
  LocaleInfo locale;
  testing::ScriptedUi ui;
  const ListingContext ctx{locale, nullptr};

  EXPECT_FALSE(ExportRecordsText(db, true, 0, ui, ctx));  // cancelled
  EXPECT_TRUE(ui.messages.empty());

  ui.fileAnswers.push_back(dir.File("records"));
  EXPECT_TRUE(ExportRecordsText(db, true, 0, ui, ctx));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "File Exported OK");
  EXPECT_EQ(ui.messages[0].caption, "Update");
  std::vector<uint8_t> bytes;
  ASSERT_TRUE(ReadWholeFile(dir.File("records.TXT"), bytes));
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()), Listing(db, true, 0));

  ui.fileAnswers.push_back(dir.File("one.txt"));
  EXPECT_TRUE(ExportRecordsText(db, false, 2, ui, ctx));
  ASSERT_TRUE(ReadWholeFile(dir.File("one.txt"), bytes));
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()), Listing(db, false, 2));

  ui.fileAnswers.push_back(std::string("/nonexistent/dir/x.txt"));
  EXPECT_FALSE(ExportRecordsText(db, true, 0, ui, ctx));
  EXPECT_EQ(ui.messages.back().text, "ERROR: Unable to open file for writing.");
  EXPECT_EQ(ui.messages.back().caption, "Error");

  // A database picked by mistake is replaced only when the user says so.
  const std::string other = dir.File("Other.PDB");
  ASSERT_TRUE(db.SaveAs(other).ok());
  std::vector<uint8_t> before;
  ASSERT_TRUE(ReadWholeFile(other, before));
  ui.fileAnswers.push_back(other);
  ui.yesNoAnswers = {false};
  EXPECT_FALSE(ExportRecordsText(db, true, 0, ui, ctx));
  ASSERT_EQ(ui.questions.size(), 1u);
  EXPECT_NE(ui.questions[0].text.find(other), std::string::npos);
  ASSERT_TRUE(ReadWholeFile(other, bytes));
  EXPECT_EQ(bytes, before);
  ui.fileAnswers.push_back(other);
  ui.yesNoAnswers = {true};
  EXPECT_TRUE(ExportRecordsText(db, true, 0, ui, ctx));
  ASSERT_TRUE(ReadWholeFile(other, bytes));
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()), Listing(db, true, 0));
}

}  // namespace
}  // namespace cx
