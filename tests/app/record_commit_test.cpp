#include "app/record_commit.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "design/security.h"
#include "ops/calc.h"
#include "ops/links.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "tests/design/design_db.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Num;
using testing::Text;
using testing::TestDb;
using T = FieldType;

const FixedClock kClock(1709121600);

// Names sorted forward, an amount, a running "previous amount + 1" and a
// doubled amount.
struct Ledger : TestDb {
  Ledger() {
    name = Field(T::Text, "Name");
    amount = Field(T::Integer, "Amount");
    prev = Calc("Prev+1", 0, 1, amount, 255, 1, "", "1");
    twice = Calc("Twice", 0, 1, amount, amount);
    db.schema().sortKey[0] = {static_cast<uint8_t>(name), 1};
    for (auto [n, a] : {std::pair{"b", 2}, {"d", 4}, {"f", 6}}) Add({Text(name, n), Num(amount, a)});
    RecalculateFrom(session, 0);
    session.view = RebuildView(db);
    db.ClearChanged();
  }
  std::vector<std::string> Column(int slot) const {
    std::vector<std::string> out;
    for (size_t i = 0; i < db.recordCount(); ++i) out.push_back(TextAt(i, slot));
    return out;
  }
  std::vector<uint32_t> Amounts() const {
    std::vector<uint32_t> out;
    for (size_t i = 0; i < db.recordCount(); ++i) out.push_back(NumberAt(i, amount));
    return out;
  }
  int name, amount, prev, twice;
};

TEST(StoreRecord, NewRecordLandsSortedWithItsCalculationsAndTheRecordsAfterIt) {
  Ledger t;
  ASSERT_EQ(t.Column(t.prev), (std::vector<std::string>{"1", "3", "5"}));
  RecordHistory history;
  RecordForm form(t.session, kNewRecordIndex, kClock);
  form.SetText(t.name, "c");
  form.SetText(t.amount, "10");
  StoreOutcome out = CommitForm(form, &history);
  ASSERT_TRUE(out.ok);
  EXPECT_EQ(out.index, 1u);
  EXPECT_EQ(t.Column(t.name), (std::vector<std::string>{"b", "c", "d", "f"}));
  EXPECT_EQ(t.Column(t.twice), (std::vector<std::string>{"4", "20", "8", "12"}));
  // "d" now follows "c": its previous amount is 10.
  EXPECT_EQ(t.Column(t.prev), (std::vector<std::string>{"1", "3", "11", "5"}));
  EXPECT_EQ(t.session.view, (std::vector<uint32_t>{0, 1, 2, 3}));
  EXPECT_TRUE(t.db.changed());
  EXPECT_TRUE(std::ranges::all_of(t.session.calc.fieldChanged, [](uint8_t m) { return m == 0; }));
}

TEST(StoreRecord, EditedRecordMovesAndThePreviousRecordFieldsFollow) {
  Ledger t;
  RecordForm form(t.session, 0, kClock);
  form.SetText(t.name, "e");
  form.SetText(t.amount, "5");
  StoreOutcome out = CommitForm(form, nullptr);
  ASSERT_TRUE(out.ok);
  EXPECT_EQ(out.index, 1u);
  EXPECT_EQ(t.Column(t.name), (std::vector<std::string>{"d", "e", "f"}));
  EXPECT_EQ(t.Column(t.prev), (std::vector<std::string>{"1", "5", "6"}));
  EXPECT_EQ(t.Column(t.twice), (std::vector<std::string>{"8", "10", "12"}));
}

TEST(StoreRecord, AChangeThatStaysInPlaceStillReachesTheNextRecord) {
  Ledger t;
  RecordForm form(t.session, 1, kClock);
  form.SetText(t.amount, "40");
  ASSERT_TRUE(CommitForm(form, nullptr).ok);
  EXPECT_EQ(t.Column(t.prev), (std::vector<std::string>{"1", "3", "41"}));
}

TEST(StoreRecord, FilteredViewIsRebuiltAfterTheEdit) {
  Ledger t;
  // Filter 1: Name must contain "d".
  FilterSettings settings = LoadFilterSettings(t.db.schema());
  settings.filter[0].enabled = true;
  settings.filter[0].field = t.name;
  settings.filter[0].SetLowerText("d");
  StoreFilterSettings(settings, t.db.schema());
  t.session.view = RebuildView(t.db);
  ASSERT_EQ(t.session.view, (std::vector<uint32_t>{1}));
  RecordForm form(t.session, 2, kClock);
  form.SetText(t.name, "dd");
  ASSERT_TRUE(CommitForm(form, nullptr).ok);
  EXPECT_EQ(t.session.view, (std::vector<uint32_t>{1, 2}));
}

TEST(StoreRecord, UnchangedRecordIsNotWritten) {
  Ledger t;
  const Bytes before(t.db.record(1).begin(), t.db.record(1).end());
  RecordHistory history;
  RecordForm form(t.session, 1, kClock);
  StoreOutcome out = CommitForm(form, &history);
  EXPECT_TRUE(out.ok);
  EXPECT_FALSE(out.stored);
  EXPECT_FALSE(t.db.changed());
  EXPECT_FALSE(history.CanUndo());
  EXPECT_TRUE(std::ranges::equal(t.db.record(1), before));
}

TEST(StoreRecord, AFullDatabaseRefusesTheNewRecord) {
  TestDb t;
  const int a = t.Field(T::Text, "A");
  const Bytes small = t.Build({Text(a, "x")});
  for (int i = 0; i < format::kMaxDataRecords; ++i) t.db.AppendRecord(small);
  RecordForm form(t.session, kNewRecordIndex, kClock);
  form.SetText(a, "one too many");
  EXPECT_FALSE(CommitForm(form, nullptr).ok);
  ASSERT_EQ(t.ui.messages.size(), 1u);
  EXPECT_EQ(t.ui.messages[0].text, "ERROR: Saving record!");
  EXPECT_EQ(t.db.recordCount(), static_cast<size_t>(format::kMaxDataRecords));
}

TEST(StoreRecord, PlacesRecordsWhereTheTableWalkWouldAmongEqualKeys) {
  TestDb t;
  const int name = t.Field(T::Text, "Name");
  const int n = t.Field(T::Integer, "N");
  t.db.schema().sortKey[0] = {static_cast<uint8_t>(name), 0};
  std::mt19937 rng(7);
  const char* names[] = {"a", "b", "b", "c", "d"};
  for (int i = 0; i < 60; ++i) t.Add({Text(name, names[rng() % 5]), Num(n, static_cast<uint32_t>(i))});
  SortAll(t.db);
  for (int step = 0; step < 200; ++step) {
    Database walked = t.db;
    const size_t index = rng() % t.db.recordCount();
    const std::string to = names[rng() % 5];
    RecordForm form(t.session, index, kClock);
    form.SetText(name, to);
    const Bytes stored = [&] {
      RecordForm copy(t.session, index, kClock);
      copy.SetText(name, to);
      return copy.Stored();
    }();
    const StoreOutcome out = CommitForm(form, nullptr);
    ASSERT_TRUE(out.ok);
    walked.ReplaceRecord(index, stored);
    const size_t expected = form.Modified(name) ? RepositionRecord(walked, index) : index;
    ASSERT_EQ(out.index, expected) << "step " << step;
    for (size_t r = 0; r < t.db.recordCount(); ++r) {
      ASSERT_TRUE(std::ranges::equal(t.db.record(r), walked.record(r))) << "step " << step;
    }
  }
}

TEST(RecordHistory, UndoAndRedoEveryKindOfChange) {
  Ledger t;
  RecordHistory history;
  const auto names = [&] { return t.Column(t.name); };

  RecordForm edit(t.session, 0, kClock);
  edit.SetText(t.name, "z");
  ASSERT_TRUE(CommitForm(edit, &history).ok);
  ASSERT_EQ(names(), (std::vector<std::string>{"d", "f", "z"}));

  RecordForm add(t.session, kNewRecordIndex, kClock);
  add.SetText(t.name, "a");
  add.SetText(t.amount, "1");
  ASSERT_TRUE(CommitForm(add, &history).ok);

  const uint32_t id = t.db.entry(2).uniqueID();
  DeleteRecordAt(t.session, 2, &history);  // "f"
  ASSERT_EQ(names(), (std::vector<std::string>{"a", "d", "z"}));

  // Something else sorts the table between the change and its undo.
  t.db.schema().sortKey[0].direction = 0;
  SortAll(t.db);
  ASSERT_EQ(names(), (std::vector<std::string>{"z", "d", "a"}));

  EXPECT_GE(history.Undo(t.session), 0);  // the deletion
  EXPECT_EQ(names(), (std::vector<std::string>{"z", "f", "d", "a"}));
  EXPECT_EQ(t.db.entry(1).uniqueID(), id);
  EXPECT_GE(history.Undo(t.session), 0);  // the addition
  EXPECT_EQ(names(), (std::vector<std::string>{"z", "f", "d"}));
  EXPECT_GE(history.Undo(t.session), 0);  // the edit
  EXPECT_EQ(names(), (std::vector<std::string>{"f", "d", "b"}));
  EXPECT_EQ(t.Column(t.prev), (std::vector<std::string>{"1", "7", "5"}));
  EXPECT_FALSE(history.CanUndo());
  EXPECT_EQ(history.Undo(t.session), -1);

  EXPECT_GE(history.Redo(t.session), 0);
  EXPECT_GE(history.Redo(t.session), 0);
  EXPECT_GE(history.Redo(t.session), 0);
  EXPECT_EQ(names(), (std::vector<std::string>{"z", "d", "a"}));
  EXPECT_FALSE(history.CanRedo());
  EXPECT_EQ(t.session.view.size(), 3u);

  // A new change forgets what could be redone.
  history.Undo(t.session);
  RecordForm again(t.session, 0, kClock);
  again.SetText(t.amount, "99");
  CommitForm(again, &history);
  EXPECT_FALSE(history.CanRedo());
}

TEST(RecordHistory, AStepWhoseRecordIsGoneIsDroppedNotMisapplied) {
  Ledger t;
  RecordHistory history;
  RecordForm edit(t.session, 1, kClock);
  edit.SetText(t.amount, "77");
  ASSERT_TRUE(CommitForm(edit, &history).ok);
  t.db.DeleteRecord(1);  // behind the history's back
  const auto before = t.Amounts();
  EXPECT_EQ(history.Undo(t.session), -1);
  EXPECT_EQ(t.Amounts(), before);
  EXPECT_FALSE(history.CanRedo());
}

TEST(PopupsAppend, TypedTextsJoinTheListAfterTheEditPopupsCheck) {
  Ledger t;
  t.db.schema().field[t.name].popupsAppend = 1;
  t.db.popups()[t.name].items = {"b"};
  t.db.schema().password.set("pw");
  SecuritySettings s = LoadSecuritySettings(t.db.schema());
  s.levels[secured::kEditPopups] = access_level::kPassword;
  ApplySecuritySettings(t.db, s);
  t.db.ClearChanged();

  auto typed = [&](const std::string& name, const std::string& amount) {
    RecordForm form(t.session, kNewRecordIndex, kClock);
    form.SetText(t.name, name);
    form.SetText(t.amount, amount);
    return AppendTypedToPopups(form);
  };
  // A refused check keeps the list; an entry already there asks nothing;
  // a field without the option adds nothing.
  EXPECT_FALSE(typed("c", "7"));
  EXPECT_EQ(t.ui.passwordPrompts, 1);
  EXPECT_FALSE(typed("b", "7"));
  EXPECT_EQ(t.ui.passwordPrompts, 1);
  EXPECT_EQ(t.db.popups()[t.name].items, std::vector<std::string>{"b"});
  EXPECT_TRUE(t.db.popups()[t.amount].items.empty());
  EXPECT_FALSE(t.db.changed());

  t.ui.passwordAnswers.push_back({"pw"});
  EXPECT_TRUE(typed("c", "7"));
  EXPECT_EQ(t.db.popups()[t.name].items, (std::vector<std::string>{"b", "c"}));
  EXPECT_TRUE(t.db.changed());

  // A full list takes no more.
  t.db.popups()[t.name].items.resize(60, "x");
  t.ui.passwordAnswers.push_back({"pw"});
  EXPECT_FALSE(typed("z", "7"));
  EXPECT_EQ(t.db.popups()[t.name].items.size(), 60u);
}

// Orders with a Link field to Items, whose Linked field holds the order's
// number.
class DeleteWithLinks : public ::testing::Test {
 protected:
  void SetUp() override {
    Database items = testing::MakeDatabase(dir.File("Items.PDB"), {{"Item", T::Text}, {"Order", T::Linked}});
    for (auto [item, order] : {std::pair{"bolt", "1"}, {"nut", "2"}, {"washer", "1"}}) {
      testing::AddRecord(items, {item, order});
    }
    ASSERT_TRUE(items.Save().ok());
    orders = testing::MakeDatabase(dir.File("Orders.PDB"), {{"Order", T::Text}, {"Items", T::Link}});
    orders.schema().field[1].text.set("Items");
    orders.schema().field[1].otherField = 1;
    testing::AddRecord(orders, {"first", "1"});
    testing::AddRecord(orders, {"second", "2"});
  }
  size_t ItemCount() {
    Database items;
    EXPECT_TRUE(items.Open(dir.File("Items.PDB"), ui).ok());
    return items.recordCount();
  }

  testing::TempDir dir;
  testing::ScriptedUi ui;
  LocaleInfo locale;
  Database orders;
};

TEST_F(DeleteWithLinks, TwoQuestionsDecideWhatGoes) {
  DataSession session(orders, locale, ui);
  LinkServices services(ui);
  LinkedRecordsDeleter deleter(services);

  ui.yesNoAnswers = {false};
  EXPECT_FALSE(DeleteRecordCommand(session, 0, &deleter, nullptr));
  EXPECT_EQ(orders.recordCount(), 2u);
  ASSERT_EQ(ui.questions.size(), 1u);
  EXPECT_EQ(ui.questions[0].text, "Are you sure you want to delete this record?");
  EXPECT_EQ(ui.questions[0].caption, "Confirm Delete");

  ui.yesNoAnswers = {true, false};  // keep the linked records
  EXPECT_TRUE(DeleteRecordCommand(session, 1, &deleter, nullptr));
  EXPECT_EQ(ui.questions.back().text, "Would you like to delete the linked records also? (Y/N)");
  EXPECT_EQ(orders.recordCount(), 1u);
  EXPECT_EQ(ItemCount(), 3u);

  ui.yesNoAnswers = {true, true};
  EXPECT_TRUE(DeleteRecordCommand(session, 0, &deleter, nullptr));
  EXPECT_EQ(orders.recordCount(), 0u);
  EXPECT_EQ(ItemCount(), 1u);  // "nut" of the second order stays
  EXPECT_TRUE(session.view.empty());
}

TEST_F(DeleteWithLinks, RefusedAccessAsksNothing) {
  SetLevel(orders.schema(), secured::kDeleteRecords, access_level::kNone);
  DataSession session(orders, locale, ui);
  EXPECT_FALSE(DeleteRecordCommand(session, 0, nullptr, nullptr));
  EXPECT_TRUE(ui.questions.empty());
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].caption, "ACCESS DENIED");
  EXPECT_EQ(orders.recordCount(), 2u);
}

}  // namespace
}  // namespace cx
