// Files that are damaged or laid out by other programs: each is either
// refused with its message, leaving the open database as it was, or read as
// far as it can be without losing what cannot be understood.
#include <gtest/gtest.h>

#include <numeric>

#include "engine/record_store.h"
#include "engine/value_text.h"
#include "tests/engine/test_databases.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ByteVector;
using testing::SlotWriter;

class MalformedFileTest : public ::testing::Test {
 protected:
  void SetUp() override {
    Database good = Database::CreateNew(dir.File("good.PDB"), "Good");
    good.schema() = schema;
    good.AppendRecord(SlotWriter().Text("kept").End().bytes);
    good.AppendRecord(SlotWriter().Text("also").End().bytes);
    ASSERT_TRUE(good.Save(FixedClock(5)).ok());
    ASSERT_TRUE(db.Open(good.path(), quiet).ok());
  }

  // A file with the test schema, 30 popup lists and the data records given.
  ByteVector FileWith(const std::vector<ByteVector>& data) {
    auto records = testing::StandardRecords(schema);
    for (const ByteVector& d : data) records.push_back({d, 0, 0});
    return testing::BuildPdb(records);
  }
  ByteVector ThreeRecords() {
    return FileWith({SlotWriter().Text("r0").End().bytes, SlotWriter().Text("r1").End().bytes,
                     SlotWriter().Text("r2").End().bytes});
  }

  Status OpenBytes(const ByteVector& bytes) {
    EXPECT_TRUE(testing::WriteBytes(bad, bytes));
    return db.Open(bad, ui);
  }

  void ExpectRefusedWith(const Status& s, const std::string& message) {
    EXPECT_FALSE(s.ok());
    ASSERT_EQ(ui.messages.size(), 1u);
    EXPECT_EQ(ui.messages[0].text, message);
    EXPECT_EQ(db.path(), dir.File("good.PDB"));
    EXPECT_EQ(db.Name(), "Good");
    ASSERT_EQ(db.recordCount(), 2u);
    EXPECT_EQ(ValueString(*FieldValue(db.record(0), 0)), "kept");
    EXPECT_FALSE(db.changed());
  }

  // Opened with a message for data record `failing`, the ones before it kept.
  void ExpectPartial(const Status& s, size_t failing) {
    ASSERT_TRUE(s.ok());
    ASSERT_EQ(ui.messages.size(), 1u);
    EXPECT_EQ(ui.messages[0].text, "ERROR:Reading Record: " + std::to_string(failing));
    EXPECT_TRUE(db.partial());
    ASSERT_EQ(db.recordCount(), failing);
    for (size_t i = 0; i < failing; ++i) {
      EXPECT_EQ(ValueString(*FieldValue(db.record(i), 0)), "r" + std::to_string(i));
    }
    // The original is never overwritten with the part that could be read.
    const ByteVector before = testing::ReadBytes(bad);
    EXPECT_FALSE(db.Save(FixedClock(9)).ok());
    EXPECT_FALSE(db.SaveAs(dir.path() + "/./bad.PDB", FixedClock(9)).ok());
    EXPECT_EQ(testing::ReadBytes(bad), before);
    ASSERT_TRUE(db.SaveAs(dir.File("rescued.PDB"), FixedClock(9)).ok());
    Database rescued;
    ASSERT_TRUE(rescued.Open(dir.File("rescued.PDB"), ui).ok());
    EXPECT_EQ(rescued.recordCount(), failing);
    EXPECT_TRUE(db.Save(FixedClock(10)).ok());
  }

  Schema schema = testing::SchemaOf({FieldType::Text});
  cx::testing::TempDir dir;
  cx::testing::ScriptedUi ui;
  SilentUi quiet;
  Database db;
  std::string bad = dir.File("bad.PDB");
};

TEST_F(MalformedFileTest, MissingFile) {
  ExpectRefusedWith(db.Open(dir.File("absent.PDB"), ui),
                    "ERROR: Cannot Open File: " + dir.File("absent.PDB") + " for reading");
}

TEST_F(MalformedFileTest, TruncatedHeader) {
  ByteVector f = ThreeRecords();
  f.resize(50);
  ExpectRefusedWith(OpenBytes(f),
                    "ERROR: Reading header!\nMake sure you are converting a Cardovex data file!\n");
}

TEST_F(MalformedFileTest, WrongCreator) {
  ByteVector f = ThreeRecords();
  f[67] = 'b';
  ExpectRefusedWith(OpenBytes(f),
                    "ERROR: Reading header!\nMake sure you are converting a Cardovex data file!\n");
}

TEST_F(MalformedFileTest, AnyTypeIsAccepted) {
  ByteVector f = ThreeRecords();
  for (int i = 60; i < 64; ++i) f[i] = 'Z';
  ASSERT_TRUE(OpenBytes(f).ok());
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_EQ(db.recordCount(), 3u);
}

TEST_F(MalformedFileTest, EntryListLongerThanTheFile) {
  ByteVector f = ThreeRecords();
  f[76] = 0x7F;
  ExpectRefusedWith(OpenBytes(f), "Could not initialize file");
}

TEST_F(MalformedFileTest, NoRecordsAtAll) {
  ExpectRefusedWith(OpenBytes(testing::BuildPdb(testing::StandardRecords(), InitHeader("x"), 0)),
                    "Could not read file");
}

TEST_F(MalformedFileTest, ShortSchemaRecord) {
  auto records = testing::StandardRecords();
  records[0].bytes.resize(2000);
  ExpectRefusedWith(OpenBytes(testing::BuildPdb(records)), "Could not read file");
}

TEST_F(MalformedFileTest, DataRecordOffsetsOutOfOrder) {
  ByteVector f = ThreeRecords();
  testing::SetEntryOffset(f, 33, testing::EntryOffset(f, 32) - 1);
  ExpectPartial(OpenBytes(f), 1);
}

TEST_F(MalformedFileTest, DataRecordPastTheEndOfTheFile) {
  ByteVector f = ThreeRecords();
  // Record 1 now runs to an offset past the end, and record 2 starts there.
  testing::SetEntryOffset(f, 33, uint32_t(f.size() + 10));
  ExpectPartial(OpenBytes(f), 1);
}

TEST_F(MalformedFileTest, DataRecordOver65535BytesBeforeTheLast) {
  ByteVector huge = SlotWriter().Text("r0").End().bytes;
  huge.resize(65536, 'h');
  ExpectPartial(OpenBytes(FileWith({huge, SlotWriter().Text("r1").End().bytes})), 0);
}

TEST_F(MalformedFileTest, LargestRecordsThatAreStillRead) {
  ByteVector first = SlotWriter().Text("r0").End().bytes;
  first.resize(65534, 'h');
  ByteVector last = SlotWriter().Text("r1").End().bytes;
  last.resize(70000, 't');
  ASSERT_TRUE(OpenBytes(FileWith({first, last})).ok());
  ASSERT_EQ(db.recordCount(), 2u);
  EXPECT_EQ(db.record(0).size(), 65534u);
  EXPECT_EQ(db.record(1).size(), 65535u);  // the last record is cut...
  // ...so writing it back over the original would lose its tail.
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_TRUE(db.partial());
  EXPECT_FALSE(db.Save(FixedClock(1)).ok());
}

TEST_F(MalformedFileTest, ForeignPopupListsAreKeptByteForByte) {
  auto records = testing::StandardRecords(schema);
  std::string many;
  for (int i = 0; i < 70; ++i) many += "item" + std::to_string(i) + '\0';
  records[1].bytes.assign(many.begin(), many.end());
  records[2].bytes = {'a', 'b', 'c'};
  records[3].bytes = {};
  ASSERT_TRUE(OpenBytes(testing::BuildPdb(records)).ok());
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_EQ(db.popups()[0].items.size(), 60u);
  EXPECT_EQ(db.popups()[1].items, std::vector<std::string>{"abc"});
  EXPECT_TRUE(db.popups()[2].items.empty());
  ASSERT_TRUE(db.SaveAs(dir.File("saved.PDB"), FixedClock(1)).ok());
  ByteVector list;
  for (int i = 1; i <= 2; ++i) {
    ASSERT_TRUE(ReadRecordAt(dir.File("saved.PDB"), i, list));
    EXPECT_EQ(list, records[i].bytes) << i;
  }
}

TEST_F(MalformedFileTest, UnreadablePopupRecordLeavesItsListEmpty) {
  auto records = testing::StandardRecords(schema);
  for (int i = 1; i <= 30; ++i) records[i].bytes = {'p', uint8_t('0' + i % 10), 0, 0, 0};
  records.push_back({SlotWriter().Text("r0").End().bytes, 0, 0});
  ByteVector f = testing::BuildPdb(records);
  testing::SetEntryOffset(f, 5, testing::EntryOffset(f, 6) + 1);
  ASSERT_TRUE(OpenBytes(f).ok());
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_TRUE(db.popups()[4].items.empty());
  EXPECT_EQ(db.popups()[5].items, std::vector<std::string>{"p6"});
  EXPECT_EQ(db.recordCount(), 1u);
}

TEST_F(MalformedFileTest, InvalidFieldOrder) {
  Schema s = schema;
  s.fieldOrder.fill(3);
  auto records = testing::StandardRecords(s);
  ASSERT_TRUE(OpenBytes(testing::BuildPdb(records)).ok());
  std::array<uint8_t, 30> identity{};
  std::iota(identity.begin(), identity.end(), uint8_t(0));
  EXPECT_EQ(db.schema().fieldOrder, identity);
}

TEST_F(MalformedFileTest, SlotLengthPastTheEndOfTheRecord) {
  const ByteVector damaged = {0, 0x50, 0x00, 'a', 'b'};
  ASSERT_TRUE(OpenBytes(FileWith({SlotWriter().Text("r0").End().bytes, damaged})).ok());
  EXPECT_EQ(ui.messages.size(), 1u);  // a warning, not a refusal
  EXPECT_EQ(db.malformedRecords(), 1u);
  ASSERT_EQ(db.recordCount(), 2u);
  PopupLists popups{};
  LocaleInfo locale;
  EXPECT_EQ(ValueText({db.schema(), popups, locale}, db.record(1), 0), "ab");
  ASSERT_TRUE(db.SaveAs(dir.File("saved.PDB"), FixedClock(1)).ok());
  ByteVector back;
  ASSERT_TRUE(ReadRecordAt(dir.File("saved.PDB"), 32, back));
  EXPECT_EQ(back, damaged);
}

TEST_F(MalformedFileTest, FewerThanThirtyOneRecords) {
  for (uint16_t count : {uint16_t(1), uint16_t(5)}) {
    auto records = testing::StandardRecords(schema);
    records.resize(count);
    for (size_t i = 1; i < records.size(); ++i) records[i].bytes = {'L', uint8_t('0' + i), 0, 0, 0};
    ui.messages.clear();
    ASSERT_TRUE(OpenBytes(testing::BuildPdb(records)).ok()) << count;
    EXPECT_TRUE(ui.messages.empty());
    EXPECT_EQ(db.recordCount(), 0u);
    for (size_t i = 0; i < 30; ++i) EXPECT_EQ(db.popups()[i].items.size(), i + 1 < count ? 1u : 0u);
    ASSERT_TRUE(db.SaveAs(dir.File("whole.PDB"), FixedClock(1)).ok());
    Database whole;
    ASSERT_TRUE(whole.Open(dir.File("whole.PDB"), ui).ok());
    EXPECT_EQ(whole.header().numRecords, 31);
    EXPECT_EQ(whole.popups()[0].items.size(), count > 1 ? 1u : 0u);
  }
}

// The count at open walks several records side by side, each from its own
// part of the file; whatever part a bad record falls in, and in the records
// left over after the parts, it must agree with the records checked one by
// one.
TEST(CountMalformedTest, AgreesWithTheCheckOfEachRecord) {
  const std::vector<ByteVector> kinds = {
      {},                                      // no slots at all
      SlotWriter().Text("ok").End().bytes,     // ends with the mark
      SlotWriter().Text("ok").Number(7).bytes, // ends without a mark
      {0, 0x10, 0x00, 'a', 'b'},               // a length past the end
      {1, 2, 3, 4},                            // a prefix longer than the record
      SlotWriter(true).Text("ext").End().bytes,
      {0, 0x02, 0x00, 'x', 'y', 0x05},         // a length cut in half
  };
  RecordTable records;
  size_t expected = 0;
  for (size_t n = 0; n < 61; ++n) {
    // Steps of 3 through 7 kinds give every lane every kind for some count.
    const ByteVector& bytes = kinds[(n * 3) % kinds.size()];
    records.emplace_back(bytes, 0, 0);
    if (!RecordIsWellFormed(records.back().bytes())) ++expected;
    EXPECT_EQ(CountMalformed(records), expected) << n + 1 << " records";
  }
  RecordTable full(30);
  ByteVector all;
  all.push_back(0);
  for (int slot = 0; slot < format::kFieldCount; ++slot) all.insert(all.end(), {1, 0, 'v'});
  all.insert(all.end(), {0x40, 0x00});  // past the last slot: never read
  for (DataRecord& r : full) r = DataRecord(all, 0, 0);
  EXPECT_EQ(CountMalformed(full), 0u);

  // A large file is checked in two halves; bad records on either side of
  // the middle and at both ends all count.
  RecordTable large(20001, DataRecord(kinds[1], 0, 0));
  for (size_t at : {size_t{0}, size_t{9999}, size_t{10000}, size_t{10001}, size_t{20000}}) {
    large[at] = DataRecord(kinds[3], 0, 0);
  }
  EXPECT_EQ(CountMalformed(large), 5u);
}

}  // namespace
}  // namespace cx
