// What the receiving side does with a complete object: asks, stores,
// inserts, refuses; never writes outside the data folder.
#include <gtest/gtest.h>

#include "design/receive_access.h"
#include "design/security.h"
#include "infrared/beam_payloads.h"
#include "infrared/obex_format.h"
#include "infrared/receive_store.h"
#include "infrared/record_set.h"
#include "platform/file_io.h"
#include "tests/infrared/sample_databases.h"
#include "tests/support/test_support.h"

namespace cx::obex {
namespace {

using cx::testing::RecordsOf;
using cx::testing::TwoTextRecord;
using cx::testing::WriteSampleDatabase;
using Bytes = std::vector<uint8_t>;

// The object a beam of `items` delivers (as the protocol side builds it).
ReceivedObject Arrived(const BeamObject& items) {
  ReceivedObject o;
  for (const HeaderItem& item : items) {
    if (item.id == kHeaderBody) o.body = item.value;
    if (item.id == kHeaderCreatorId) o.creator.assign(item.value.begin(), item.value.end());
  }
  // The texts go through UTF-16 and back.
  auto text = [&](uint8_t id) {
    for (const HeaderItem& item : items) {
      if (item.id == id) {
        std::string s;
        for (size_t i = 0; i + 1 < item.value.size(); i += 2) s += static_cast<char>(item.value[i + 1]);
        return s;
      }
    }
    return std::string();
  };
  o.name = text(kHeaderName);
  o.description = text(kHeaderDescription);
  return o;
}

// The same file with its schema record cut to four bytes (the first popup
// list starts right after them): no open can read it.
Bytes SchemaCutShort(Bytes file) {
  uint8_t* first = file.data() + 78;
  const uint32_t cut = GetU32(first) + 4;
  uint8_t* second = first + 8;
  for (int i = 0; i < 4; ++i) second[i] = static_cast<uint8_t>(cut >> (24 - 8 * i));
  return file;
}

class Store : public ::testing::Test {
 protected:
  uint8_t Deliver(ReceivedObject object) { return store_.Deliver(object); }
  std::string Here() const { return dir_.path() + "/here"; }
  std::string There() const { return dir_.path() + "/there"; }
  std::vector<std::string> lines_;
  cx::testing::TempDir dir_;
  cx::testing::ScriptedUi ui_;
  OpenDatabases dbs_{{}, nullptr, dir_.path() + "/there"};
  AccessCheckedReceiveHooks hooks_;
  ReceiveStore store_{dbs_, ui_, hooks_, [this](const std::string& l) { lines_.push_back(l); }};
};

TEST_F(Store, DatabaseIsStoredOnlyWhenTheUserAgrees) {
  std::string sent = WriteSampleDatabase(Here(), "Parts.PDB", {TwoTextRecord("a", "b")});
  BeamObject object;
  ASSERT_TRUE(DatabaseObject(sent, object));
  ReceivedObject o = Arrived(object);
  EXPECT_EQ(o.creator, "lnch");

  EXPECT_EQ(Deliver(o), kForbidden);  // the scripted answer is No
  EXPECT_FALSE(FileExists(There() + "/Parts.PDB"));
  ui_.yesNoAnswers = {true};
  EXPECT_EQ(Deliver(o), kSuccess);
  Bytes original, stored;
  ASSERT_TRUE(ReadWholeFile(sent, original));
  ASSERT_TRUE(ReadWholeFile(There() + "/Parts.PDB", stored));
  EXPECT_EQ(stored, original);
  ASSERT_EQ(ui_.questions.size(), 2u);
  EXPECT_EQ(ui_.questions[1].text, "Receive the database Parts.PDB?");
  EXPECT_EQ(ui_.questions[1].caption, "QUESTION");

  // A second copy replaces it only after its own question.
  o.body[0] ^= 1;
  EXPECT_EQ(Deliver(o), kForbidden);
  EXPECT_EQ(ui_.questions.back().text,
            "A database named Parts.PDB already exists. Replace it with the one received?");
  ASSERT_TRUE(ReadWholeFile(There() + "/Parts.PDB", stored));
  EXPECT_EQ(stored, original);
  EXPECT_EQ(lines_, (std::vector<std::string>{"Declined Parts.PDB", "Stored Parts.PDB",
                                              "Declined Parts.PDB"}));
}

TEST_F(Store, HostileDatabasesStayOutside) {
  std::string sent = WriteSampleDatabase(Here(), "Parts.PDB", {});
  BeamObject object;
  ASSERT_TRUE(DatabaseObject(sent, object));
  ReceivedObject o = Arrived(object);
  o.name = "../../escape/Evil";  // no extension either
  ui_.yesNoAnswers = {true, true};
  EXPECT_EQ(Deliver(o), kSuccess);
  EXPECT_TRUE(FileExists(There() + "/Evil.PDB"));
  EXPECT_FALSE(FileExists(dir_.path() + "/escape/Evil.PDB"));
  o.name = "..";
  EXPECT_EQ(Deliver(o), kBadRequest);
  o.name = "Text.PDB";
  o.body = Bytes(200, 'x');  // not ours: refused with a message, nothing asked
  size_t asked = ui_.questions.size();
  EXPECT_EQ(Deliver(o), kUnsupportedType);
  EXPECT_EQ(ui_.questions.size(), asked);
  EXPECT_EQ(ui_.messages.back().text, "The received file Text.PDB is not a Cardovex database.");
  o.name = "Memo.txt";
  o.creator = "memo";
  EXPECT_EQ(Deliver(o), kUnsupportedType);
  EXPECT_EQ(ListFiles(There()), std::vector<std::string>{"Evil.PDB"});
}

// Only a full open says a database is whole: a good file is never
// replaced by bytes that merely start like one.
TEST_F(Store, UnreadableDatabaseNeverReplacesAGoodOne) {
  const std::string good = WriteSampleDatabase(There(), "Parts.PDB", {TwoTextRecord("a", "b")});
  Bytes original;
  ASSERT_TRUE(ReadWholeFile(good, original));
  BeamObject object;
  ASSERT_TRUE(DatabaseObject(good, object));
  const ReceivedObject whole = Arrived(object);
  ui_.yesNoAnswers = {true, true, true};
  const std::vector<Bytes> bodies = {
      Bytes(whole.body.begin(), whole.body.begin() + 100),  // cut inside the entry list
      SchemaCutShort(whole.body),
  };
  for (const Bytes& body : bodies) {
    ReceivedObject o = whole;
    o.body = body;
    EXPECT_EQ(Deliver(o), kUnsupportedType);
    EXPECT_EQ(ui_.messages.back().text, "The received file Parts.PDB is not a Cardovex database.");
  }
  EXPECT_TRUE(ui_.questions.empty());
  Bytes after;
  ASSERT_TRUE(ReadWholeFile(good, after));
  EXPECT_EQ(after, original);
}

TEST_F(Store, OpenDatabaseIsNotReplaced) {
  std::string path = WriteSampleDatabase(There(), "Parts.PDB", {});
  Database open;
  ASSERT_TRUE(open.Open(path, ui_));
  dbs_.open.push_back(&open);
  BeamObject object;
  ASSERT_TRUE(DatabaseObject(path, object));
  ui_.yesNoAnswers = {true};
  EXPECT_EQ(Deliver(Arrived(object)), kForbidden);
  EXPECT_EQ(ui_.messages.back().text, "Close Parts.PDB before receiving a new copy of it.");
}

TEST_F(Store, RecordsGoIntoTheDatabaseOfTheSameName) {
  Bytes r1 = TwoTextRecord("one", "1"), r2 = TwoTextRecord("two", "2"), r3 = TwoTextRecord("three", "");
  std::string sender = WriteSampleDatabase(Here(), "Parts.PDB", {r1, r2, r3});
  std::string target = WriteSampleDatabase(There(), "Parts.PDB", {r3});
  Database db;
  ASSERT_TRUE(db.Open(sender, ui_));
  BeamObject one;
  ASSERT_TRUE(RecordObject(db, 1, one));
  std::vector<BeamObject> set;
  ASSERT_TRUE(RecordSetObjects(db, {2, 0}, set));
  ASSERT_EQ(set.size(), 1u);

  ui_.yesNoAnswers = {true, false, true};
  EXPECT_EQ(Deliver(Arrived(one)), kSuccess);
  EXPECT_EQ(Deliver(Arrived(set[0])), kForbidden);
  EXPECT_EQ(Deliver(Arrived(set[0])), kSuccess);
  EXPECT_EQ(RecordsOf(target), (std::vector<Bytes>{r3, r2, r3, r1}));
  EXPECT_EQ(ui_.questions[0].text, "Insert the received record into Parts.PDB?");
  EXPECT_EQ(ui_.questions[1].text, "Insert 2 received records into Parts.PDB?");
}

TEST_F(Store, RecordsWithoutTheirDatabaseOrDamagedAreRefused) {
  std::string sender = WriteSampleDatabase(Here(), "Parts.PDB", {TwoTextRecord("a", "b")});
  Database db;
  ASSERT_TRUE(db.Open(sender, ui_));
  BeamObject one;
  ASSERT_TRUE(RecordObject(db, 0, one));
  ReceivedObject o = Arrived(one);
  EXPECT_EQ(Deliver(o), kForbidden);
  EXPECT_TRUE(ui_.questions.empty());  // nothing to ask: the engine says why
  ASSERT_EQ(ui_.messages.size(), 1u);
  EXPECT_EQ(ui_.messages[0].caption, "Update");

  std::string target = WriteSampleDatabase(There(), "Parts.PDB", {});
  ReceivedObject damaged = o;
  damaged.body = {0, 9, 0, 'x'};  // a slot running past the record
  EXPECT_EQ(Deliver(damaged), kBadRequest);
  damaged.name = "Parts.cxm";
  damaged.body = {'C', 'X', 'M', '1', 0, 2, 0, 1, 0};
  EXPECT_EQ(Deliver(damaged), kBadRequest);
  EXPECT_TRUE(RecordsOf(target).empty());
}

// A receive is an addition like any other: the target's "Open Database"
// and "Add Records" levels apply, a password is asked once per object.
TEST_F(Store, RecordsPassTheTargetsAccessChecks) {
  const std::string target = WriteSampleDatabase(There(), "Parts.PDB", {});
  auto guard = [&](int op, int level) {
    SilentUi quiet;
    Database db;
    ASSERT_TRUE(db.Open(target, quiet).ok());
    db.schema().securityLevels = 0;
    db.schema().password.set("pw");
    SetLevel(db.schema(), op, level);
    ASSERT_TRUE(db.Save().ok());
  };
  ReceivedObject one;
  one.name = "Parts.cxr";
  one.body = TwoTextRecord("x", "y");
  ReceivedObject two;
  two.name = "Parts.cxm";
  const Bytes a = TwoTextRecord("a", ""), b = TwoTextRecord("b", "");
  std::vector<Bytes> bodies;
  ASSERT_TRUE(PackRecordSets({a, b}, bodies));
  ASSERT_EQ(bodies.size(), 1u);
  two.body = bodies[0];

  for (int op : {secured::kOpenDatabase, secured::kAddRecords}) {
    guard(op, access_level::kNone);
    ui_.yesNoAnswers = {true};
    EXPECT_EQ(Deliver(one), kForbidden) << op;
    EXPECT_TRUE(RecordsOf(target).empty()) << op;
  }
  guard(secured::kAddRecords, access_level::kPassword);
  ui_.yesNoAnswers = {true};
  EXPECT_EQ(Deliver(two), kForbidden);  // no password given
  EXPECT_TRUE(RecordsOf(target).empty());
  const int prompts = ui_.passwordPrompts;
  ui_.yesNoAnswers = {true};
  ui_.passwordAnswers = {{"pw"}};
  EXPECT_EQ(Deliver(two), kSuccess);
  EXPECT_EQ(ui_.passwordPrompts, prompts + 1);
  EXPECT_EQ(RecordsOf(target).size(), 2u);

  // An open database is checked too, in memory.
  guard(secured::kAddRecords, access_level::kNone);
  Database open;
  ASSERT_TRUE(open.Open(target, ui_).ok());
  dbs_.open.push_back(&open);
  ui_.yesNoAnswers = {true};
  EXPECT_EQ(Deliver(one), kForbidden);
  EXPECT_EQ(open.recordCount(), 2u);
}

TEST_F(Store, OpenButNotShownDatabaseIsMarkedForResorting) {
  std::string target = WriteSampleDatabase(There(), "Parts.PDB", {});
  Database open;
  ASSERT_TRUE(open.Open(target, ui_));
  open.schema().sortKey[0].field = 0;
  dbs_.open.push_back(&open);
  ReceivedObject o;
  o.name = "Parts.cxr";
  o.body = TwoTextRecord("x", "y");
  ui_.yesNoAnswers = {true};
  EXPECT_EQ(Deliver(o), kSuccess);
  EXPECT_EQ(open.recordCount(), 1u);
  EXPECT_EQ(open.schema().resortPending, 1);
  EXPECT_TRUE(RecordsOf(target).empty());  // in memory until it is saved
}

}  // namespace
}  // namespace cx::obex
