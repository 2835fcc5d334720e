#include <gtest/gtest.h>

#include <numeric>

#include "engine/schema.h"
#include "tests/engine/test_databases.h"

namespace cx {
namespace {

using testing::ByteVector;
using testing::ReadBE;

template <size_t N>
void FillRaw(FixedText<N>& t, uint8_t first) {
  for (size_t i = 0; i < N; ++i) t.bytes[i] = uint8_t(first + i);  // no NUL anywhere
}

// Every member away from its default, texts filling their slots.
Schema Unusual() {
  Schema s = InitSchema();
  s.formatWord = 0xA1B2C3D4;
  for (int k = 0; k < 2; ++k) {
    s.filter[k].field = int16_t(-2 - k);
    s.filter[k].mode = int16_t(300 + k);
    s.filter[k].text1.set("first " + std::to_string(k));
    FillRaw(s.filter[k].text2, uint8_t(0x41 + k));
    s.filter[k].low = 0x01020304u + k;
    s.filter[k].high = 0xFFFFFFF0u - k;
  }
  for (int i = 0; i < 3; ++i) s.sortKey[i] = {uint8_t(i + 3), uint8_t(i % 2)};
  s.sortOption1 = 7;
  s.sortOption2 = 0;
  s.listValue1 = -1234;
  s.listValue2 = 0x7ABC;
  s.setting200 = 0x55;
  s.setting201 = 0xAA;
  s.password.set("secret");
  for (int i = 0; i < 30; ++i) {
    FieldDef& f = s.field[i];
    f.typeNumber = int16_t(i < 16 ? i : 100 + i);
    f.size = int16_t(-100 - i);
    f.popupsAppend = uint8_t(2 + i);
    f.behavior = uint8_t(40 + i);
    f.width = int16_t(-i - 1);
    f.exportPrint = uint8_t(i);
    f.visible = uint8_t(60 - i);
    f.calcFlags = uint8_t(0x80 | i);
    f.calcOperation = uint8_t(i * 2);
    f.param1 = uint8_t(200 + i);
    f.param2 = uint8_t(100 + i);
    FillRaw(f.text, uint8_t(i + 1));
    f.param3 = uint8_t(i + 9);
    f.otherField = uint8_t(i);
    f.name.set("Name " + std::to_string(i));
  }
  s.findField = 17;
  s.findOption1 = 3;
  FillRaw(s.findText, 'a');
  s.findOption2 = 9;
  s.recordExtension = -5;
  s.viewValue2 = -70;
  s.viewValue3 = -32000;
  s.resortPending = 1;
  for (int i = 0; i < 30; ++i) {
    s.fieldOrder[i] = uint8_t(29 - i);
    s.fieldFlagsA[i] = uint8_t(i * 3);
    s.fieldFlagsB[i] = uint8_t(255 - i);
  }
  s.securityLevels = 0xBEEF;
  s.author.set("An Author");
  FillRaw(s.comments, 0x20);
  s.recalcFrom = 0xFEDC;
  return s;
}

TEST(SchemaTest, WriteThenReadGivesTheSameSchema) {
  const Schema s = Unusual();
  const ByteVector bytes = WriteSchema(s);
  ASSERT_EQ(bytes.size(), 2152u);
  Schema back;
  ASSERT_TRUE(ReadSchema(bytes, back));
  EXPECT_TRUE(back == s);
  EXPECT_EQ(WriteSchema(back), bytes);
}

TEST(SchemaTest, MembersLieAtTheirOffsetsBigEndian) {
  const ByteVector b = WriteSchema(Unusual());
  const std::pair<size_t, uint32_t> words[] = {
      {0, 0xA1B2C3D4u}, {4 + 84, 0x01020304u}, {96 + 88, 0xFFFFFFEFu}, {188, 0x03000401u},
      {196, 0xFB2E7ABCu}, {222 + 56 * 7, 0x0007FF95u}, {222 + 56 * 7 + 12, 0xCF6B0809u},
      {1940, 0xFFFBFFBAu}, {1946, 0x02011D1Cu}, {2038, 0xBEEF416Eu}, {2148, 0x6465FEDCu}};
  for (auto [offset, value] : words) EXPECT_EQ(ReadBE(b, offset, 4), value) << offset;
  EXPECT_EQ(b[222 + 56 * 29 + 36], 'N');
  EXPECT_EQ(b[1902], 17);
}

TEST(SchemaTest, NewDatabaseDefaults) {
  const Schema s = InitSchema();
  for (int i = 0; i < 30; ++i) {
    EXPECT_EQ(s.field[i].type(), FieldType::NotUsed);
    EXPECT_EQ(s.field[i].name.str(), "Field " + std::to_string(i + 1));
  }
  const ByteVector b = WriteSchema(s);
  EXPECT_EQ(ReadBE(b, 92, 4), 65000u);
  EXPECT_EQ(ByteVector(b.begin() + 188, b.begin() + 202),
            (ByteVector{255, 1, 255, 1, 255, 1, 255, 1, 0, 31, 0, 0, 1, 1}));
  EXPECT_EQ(ByteVector(b.begin() + 222, b.begin() + 232), (ByteVector{0, 0, 0, 40, 0, 1, 0, 58, 1, 1}));
  EXPECT_EQ(b[222 + 35], 255);
  EXPECT_EQ(b[1902], 255);
  EXPECT_EQ(b[1949], 1);
}

ByteVector WithOrder(const std::array<uint8_t, 30>& order) {
  Schema s = InitSchema();
  s.fieldOrder = order;
  return WriteSchema(s);
}

std::array<uint8_t, 30> Identity() {
  std::array<uint8_t, 30> a{};
  std::iota(a.begin(), a.end(), uint8_t(0));
  return a;
}

TEST(SchemaTest, FieldOrderRepair) {
  std::array<uint8_t, 30> reversed{};
  for (int i = 0; i < 30; ++i) reversed[i] = uint8_t(29 - i);
  Schema s;

  auto highSlot = reversed;
  highSlot[29] = 200;  // read as 0, which makes the order whole again
  ASSERT_TRUE(ReadSchema(WithOrder(highSlot), s));
  EXPECT_EQ(s.fieldOrder, reversed);

  ASSERT_TRUE(ReadSchema(WithOrder({}), s));
  EXPECT_EQ(s.fieldOrder, Identity());

  auto duplicate = reversed;
  duplicate[3] = duplicate[4];
  ASSERT_TRUE(ReadSchema(WithOrder(duplicate), s));
  EXPECT_EQ(s.fieldOrder, Identity());

  auto thirty = reversed;
  thirty[0] = 30;  // becomes a second 0
  ASSERT_TRUE(ReadSchema(WithOrder(thirty), s));
  EXPECT_EQ(s.fieldOrder, Identity());
}

// A version-1 record: the current layout cut after fieldFlagsB.
ByteVector VersionOne(Schema s) {
  s.schemaVersion = 1;
  ByteVector b = WriteSchema(s);
  b.resize(2038);
  return b;
}

TEST(SchemaTest, VersionOneRecordIsUpgraded) {
  Schema old = Unusual();
  old.field[0].typeNumber = int16_t(FieldType::Note);
  old.field[0].popupsAppend = 0;
  old.field[1].typeNumber = int16_t(FieldType::Float);
  old.field[1].size = 2;
  old.field[2].typeNumber = int16_t(FieldType::PopUp);
  old.field[2].param1 = 7;
  old.field[3].typeNumber = int16_t(FieldType::Text);
  old.field[3].visible = 1;
  old.field[3].exportPrint = 0;
  old.field[4].visible = 0;
  old.field[4].exportPrint = 0;
  old.viewValue2 = 5;
  Schema s;
  ASSERT_TRUE(ReadSchema(VersionOne(old), s));

  EXPECT_EQ(s.schemaVersion, 2);
  EXPECT_EQ(s.securityLevels, 0x0101);  // items 0 and 4: "Password Required"
  EXPECT_TRUE(s.author.empty());
  EXPECT_TRUE(s.comments.empty());
  EXPECT_EQ(s.recalcFrom, 0);
  EXPECT_EQ(s.setting200, 0);
  EXPECT_EQ(s.viewValue2, 0);
  EXPECT_EQ(s.findOption2, 0);
  EXPECT_EQ(s.resortPending, 0);
  EXPECT_EQ(s.field[0].popupsAppend, 1);
  EXPECT_EQ(s.field[1].size, 4);
  EXPECT_EQ(s.field[2].param1, 0);
  EXPECT_EQ(s.field[2].popupsAppend, 0);
  EXPECT_EQ(s.field[3].exportPrint, 1);
  EXPECT_EQ(s.field[4].exportPrint, 0);
  for (const FieldDef& f : s.field) {
    EXPECT_EQ(f.calcFlags, 0);
    EXPECT_EQ(f.param3, 0);
  }
  // What the upgrade leaves alone is kept.
  EXPECT_EQ(s.password.str(), "secret");
  EXPECT_EQ(s.field[7].param1, 207);
  EXPECT_EQ(s.fieldFlagsB, old.fieldFlagsB);
  EXPECT_EQ(s.filter, old.filter);

  old.password.clear();
  ASSERT_TRUE(ReadSchema(VersionOne(old), s));
  EXPECT_EQ(s.securityLevels, 0);
  // Any version other than 2 is upgraded, even with the full record.
  old.schemaVersion = 3;
  ASSERT_TRUE(ReadSchema(WriteSchema(old), s));
  EXPECT_EQ(s.schemaVersion, 2);
  EXPECT_TRUE(s.author.empty());
}

TEST(SchemaTest, ViewValue2IsClamped) {
  const std::pair<int16_t, int16_t> cases[] = {{78, 78}, {79, 0}, {-70, -70}, {-71, 0}, {32767, 0}};
  for (auto [stored, loaded] : cases) {
    Schema in = InitSchema();
    in.viewValue2 = stored;
    Schema s;
    ASSERT_TRUE(ReadSchema(WriteSchema(in), s));
    EXPECT_EQ(s.viewValue2, loaded) << stored;
  }
}

TEST(SchemaTest, ShortRecordsFail) {
  Schema s;
  ByteVector two = WriteSchema(InitSchema());
  two.pop_back();
  EXPECT_FALSE(ReadSchema(two, s));
  ByteVector one = VersionOne(InitSchema());
  one.pop_back();
  EXPECT_FALSE(ReadSchema(one, s));
  EXPECT_FALSE(ReadSchema({}, s));
}

}  // namespace
}  // namespace cx
