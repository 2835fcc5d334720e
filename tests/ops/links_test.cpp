#include "ops/links.h"

#include <gtest/gtest.h>

#include "ops/delete_records.h"
#include "ops/linked_listing.h"
#include "tests/design/design_db.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ScriptedUi;
using testing::TempDir;
using T = FieldType;

// Orders -> Items -> Parts: each order's Link field holds its number, and
// the items of that order hold it in their Linked field; items link on to
// their parts the same way.
class LinkedFiles : public ::testing::Test {
 protected:
  void SetUp() override {
    Database orders = testing::MakeDatabase(dir.File("Orders.PDB"),
                                            {{"Order", T::Text}, {"Items", T::Link}});
    LinkTo(orders, 1, "Items", 2);
    testing::AddRecord(orders, {"first", "1"});
    testing::AddRecord(orders, {"second", "2"});
    ASSERT_TRUE(orders.Save().ok());

    Database items = testing::MakeDatabase(
        dir.File("Items.PDB"), {{"Item", T::Text}, {"Order", T::Linked}, {"Parts", T::Link}});
    LinkTo(items, 2, "Parts", 2);
    testing::AddRecord(items, {"bolt", "1", "10"});
    testing::AddRecord(items, {"nut", "2", "11"});
    testing::AddRecord(items, {"washer", "1", "12"});
    ASSERT_TRUE(items.Save().ok());

    Database parts = testing::MakeDatabase(dir.File("Parts.PDB"), {{"Part", T::Text}, {"Item", T::Linked}});
    for (const char* v : {"10", "11", "12", "10", "99"}) testing::AddRecord(parts, {std::string("p") + v, v});
    ASSERT_TRUE(parts.Save().ok());
  }

  static void LinkTo(Database& db, int slot, const std::string& name, int otherFieldNumber) {
    db.schema().field[slot].text.set(name);
    db.schema().field[slot].otherField = static_cast<uint8_t>(otherFieldNumber - 1);
  }

  Database Load(const std::string& name) {
    Database db;
    EXPECT_TRUE(db.Open(dir.File(name), ui).ok());
    return db;
  }

  std::vector<std::string> Column0(const std::string& name) {
    Database db = Load(name);
    std::vector<std::string> out;
    for (size_t i = 0; i < db.recordCount(); ++i) out.push_back(ValueString(*FieldValue(db.record(i), 0)));
    return out;
  }

  TempDir dir;
  ScriptedUi ui;
  LinkServices services{ui};
};

TEST_F(LinkedFiles, OpensTheLinkedDatabaseRestrictedToTheRecord) {
  Database orders = Load("Orders.PDB");
  LinkedDatabase items = OpenLinkedDatabase(1, orders, 0, LinkAccess::Open, services);
  ASSERT_TRUE(items);
  EXPECT_TRUE(items.loadedHere());
  EXPECT_EQ(items.restriction().field, 1);
  EXPECT_EQ(items.restriction().value, 1u);
  EXPECT_EQ(LinkedRecordIndexes(items.db(), items.restriction()), (std::vector<size_t>{0, 2}));
  EXPECT_EQ(RebuildView(items.db(), &items.restriction()), (std::vector<uint32_t>{0, 2}));
}

TEST_F(LinkedFiles, MissingDatabaseSaysSoAndNothingElse) {
  Database orders = Load("Orders.PDB");
  orders.schema().field[1].text.set("Nowhere");
  EXPECT_FALSE(OpenLinkedDatabase(1, orders, 0, LinkAccess::Open, services));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "Linked Database is not present in this folder!");
  EXPECT_EQ(ui.messages[0].caption, "ERROR");
}

TEST_F(LinkedFiles, AlreadyOpenDatabaseIsUsedAndChecked) {
  Database orders = Load("Orders.PDB");
  Database items = Load("Items.PDB");
  services.findOpen = [&](const std::string& path) {
    return SameDatabasePath(path, items.path()) ? &items : nullptr;
  };
  int checks = 0;
  services.checkAccess = [&](const Database& db, LinkAccess kind) {
    ++checks;
    EXPECT_EQ(&db, &items);
    return kind != LinkAccess::Delete;
  };
  LinkedDatabase shared = OpenLinkedDatabase(1, orders, 1, LinkAccess::Edit, services);
  ASSERT_TRUE(shared);
  EXPECT_FALSE(shared.loadedHere());
  EXPECT_EQ(&shared.db(), &items);
  EXPECT_FALSE(OpenLinkedDatabase(1, orders, 1, LinkAccess::Delete, services));
  EXPECT_EQ(checks, 2);
}

TEST_F(LinkedFiles, DeletesLinkedRecordsThroughThreeDatabases) {
  Database orders = Load("Orders.PDB");
  EXPECT_TRUE(HasLinkFields(orders));
  EXPECT_EQ(DeleteLinkedRecords(0, orders, services), 5u);  // bolt, washer, p10, p12, p10
  EXPECT_EQ(Column0("Items.PDB"), (std::vector<std::string>{"nut"}));
  EXPECT_EQ(Column0("Parts.PDB"), (std::vector<std::string>{"p11", "p99"}));
  EXPECT_EQ(orders.recordCount(), 2u);  // the parent is the caller's to delete
}

TEST_F(LinkedFiles, DeleteRecordsByScopeTakesTheLinkedRecordsAlong) {
  Database orders = Load("Orders.PDB");
  LocaleInfo locale;
  DataSession session(orders, locale, ui);
  LinkedRecordsDeleter deleter(services);
  ui.yesNoAnswers = {true};
  EXPECT_EQ(DeleteRecordsCommand(session, DeleteScope::All, &deleter), 2u);
  ASSERT_EQ(ui.questions.size(), 1u);
  EXPECT_EQ(ui.questions[0].text, "Would you like to delete the linked records also? (Y/N)");
  EXPECT_TRUE(Column0("Items.PDB").empty());
  EXPECT_EQ(Column0("Parts.PDB"), (std::vector<std::string>{"p99"}));
}

TEST_F(LinkedFiles, RefusedDeleteLeavesTheLinkedDatabasesAlone) {
  const auto itemsBefore = testing::FileBytes(dir.File("Items.PDB"));
  const auto partsBefore = testing::FileBytes(dir.File("Parts.PDB"));
  services.checkAccess = [](const Database&, LinkAccess kind) { return kind != LinkAccess::Delete; };
  Database orders = Load("Orders.PDB");
  EXPECT_EQ(DeleteLinkedRecords(0, orders, services), 0u);
  EXPECT_EQ(testing::FileBytes(dir.File("Items.PDB")), itemsBefore);
  EXPECT_EQ(testing::FileBytes(dir.File("Parts.PDB")), partsBefore);
}

TEST_F(LinkedFiles, LinksLeadingBackAreNotFollowedAgain) {
  // Parts links back to Orders through its Item field's value.
  Database parts = Load("Parts.PDB");
  parts.schema().field[2].typeNumber = static_cast<int16_t>(T::Link);
  LinkTo(parts, 2, "Orders", 1);
  ASSERT_TRUE(parts.Save().ok());
  Database orders = Load("Orders.PDB");
  EXPECT_EQ(DeleteLinkedRecords(0, orders, services), 5u);
  EXPECT_EQ(Load("Orders.PDB").recordCount(), 2u);
}

TEST_F(LinkedFiles, ListingFollowsLinksButNotBackAgain) {
  Database parts = Load("Parts.PDB");
  parts.schema().field[2].typeNumber = static_cast<int16_t>(T::Link);
  parts.schema().field[2].name.set("Back");
  LinkTo(parts, 2, "Orders", 1);
  ASSERT_TRUE(parts.Save().ok());
  Database orders = Load("Orders.PDB");
  LocaleInfo locale;
  LinkedRecordsListing linked(services, locale);
  StringSink out;
  WriteRecordListing(1, orders, out, 0, ListingContext{locale, &linked});
  const std::string dashes(40, '-');
  EXPECT_EQ(out.text, "Order: second\n"
                      "   Item: nut\n   Order: 2\n"
                      "      Part: p11\n      Item: 11\n" +
                          dashes + "\n" + dashes + "\n" + dashes + "\n");
  EXPECT_TRUE(services.visiting.empty());
}

TEST_F(LinkedFiles, ForEachLinkedRecordVisitsInTableOrder) {
  Database items = Load("Items.PDB");
  std::vector<std::string> seen;
  EXPECT_TRUE(ForEachLinkedRecord(0, items, 2, services, [&](const Database& db, size_t i) {
    seen.push_back(ValueString(*FieldValue(db.record(i), 0)));
  }));
  EXPECT_EQ(seen, (std::vector<std::string>{"p10", "p10"}));
}

class Transfer : public LinkedFiles {
 protected:
  TransferResult Run(bool move, TransferWhich which, Database& source, const std::string& target) {
    DataSession session(source, locale, ui);
    return TransferRecordsTo(move, which, session, dir.File(target), services);
  }
  LocaleInfo locale;
};

TEST_F(Transfer, MismatchedFieldTypesAreRefused) {
  Database orders = Load("Orders.PDB");
  const auto before = testing::FileBytes(dir.File("Items.PDB"));
  TransferResult r = Run(true, {}, orders, "Items.PDB");
  EXPECT_FALSE(r.done);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "ERROR: Field Types of Database:" + dir.File("Items.PDB") +
                                     " do not match that of this database!");
  EXPECT_EQ(orders.recordCount(), 2u);
  EXPECT_EQ(testing::FileBytes(dir.File("Items.PDB")), before);
}

TEST_F(Transfer, SameTypesInAnotherOrderAreRefused) {
  Database a = testing::MakeDatabase(dir.File("A.PDB"), {{"x", T::Text}, {"n", T::Integer}});
  Database b = testing::MakeDatabase(dir.File("B.PDB"), {{"n", T::Integer}, {"x", T::Text}});
  ASSERT_TRUE(b.Save().ok());
  testing::AddRecord(a, {"v", "1"});
  EXPECT_FALSE(Run(false, {}, a, "B.PDB").done);
}

TEST_F(Transfer, SameDatabaseMoveRefusedCopyDuplicates) {
  Database orders = Load("Orders.PDB");
  TransferResult move = Run(true, {}, orders, "Orders.PDB");
  EXPECT_FALSE(move.done);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "ERROR: Cannot perform this operation to the same database");

  TransferResult copy = Run(false, {}, orders, "orders.pdb");  // case is ignored
  EXPECT_EQ(copy.code, 1);
  EXPECT_EQ(copy.copied, 2u);
  EXPECT_EQ(orders.recordCount(), 4u);
}

TEST_F(Transfer, MoveAllRecordsToAMatchingDatabase) {
  Database orders = Load("Orders.PDB");
  Database archive = testing::MakeDatabase(dir.File("Archive.PDB"),
                                           {{"Order", T::Text}, {"Items", T::Link}});
  archive.schema().sortKey[0].field = 0;
  ASSERT_TRUE(archive.Save().ok());
  TransferResult r = Run(true, {}, orders, "Archive.PDB");
  EXPECT_TRUE(r.done);
  EXPECT_EQ(r.copied, 2u);
  EXPECT_EQ(r.deleted, 2u);
  EXPECT_EQ(orders.recordCount(), 0u);
  Database saved = Load("Archive.PDB");
  ASSERT_EQ(saved.recordCount(), 2u);
  // Walked from the last record: the copies arrive in reverse, and the
  // target sorts them at its next opening.
  EXPECT_EQ(ValueString(*FieldValue(saved.record(0), 0)), "second");
  EXPECT_EQ(saved.schema().resortPending, 1);
}

TEST_F(Transfer, OneRecordCopiedAndChecks) {
  Database orders = Load("Orders.PDB");
  Database archive = testing::MakeDatabase(dir.File("Archive.PDB"),
                                           {{"Order", T::Text}, {"Items", T::Link}});
  ASSERT_TRUE(archive.Save().ok());
  std::vector<LinkAccess> asked;
  services.checkAccess = [&](const Database&, LinkAccess kind) {
    asked.push_back(kind);
    return kind != LinkAccess::Delete;  // the source may not lose records
  };
  TransferResult r = Run(true, {false, 1}, orders, "Archive.PDB");
  EXPECT_EQ(r.copied, 1u);
  EXPECT_EQ(r.deleted, 0u);
  EXPECT_EQ(orders.recordCount(), 2u);
  EXPECT_EQ(asked, (std::vector<LinkAccess>{LinkAccess::Add, LinkAccess::Delete}));
  EXPECT_EQ(Load("Archive.PDB").recordCount(), 1u);

  // Adding refused on the target: nothing is copied.
  services.checkAccess = [](const Database&, LinkAccess kind) { return kind != LinkAccess::Add; };
  EXPECT_FALSE(Run(false, {false, 0}, orders, "Archive.PDB").done);
  EXPECT_EQ(Load("Archive.PDB").recordCount(), 1u);
}

TEST(Notice, JoinsTheTexts) {
  ScriptedUi ui;
  EXPECT_EQ(ShowNotice(0, "a", "b", "c", ui), 0);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "abc");
  EXPECT_EQ(ui.messages[0].caption, "UPDATE");
  ui.yesNoAnswers = {true, false};
  EXPECT_EQ(ShowNotice(1, "q", "", "?", ui), 0);
  EXPECT_EQ(ShowNotice(1, "q", "", "?", ui), 1);
  EXPECT_EQ(ui.questions[0].caption, "QUESTION");
}

}  // namespace
}  // namespace cx
