#include <gtest/gtest.h>

#include <cstring>

#include "engine/record.h"
#include "tests/engine/test_databases.h"

namespace cx {
namespace {

using testing::ByteVector;
using testing::SchemaOf;
using testing::SlotWriter;

// An editing record of the every-type schema with a value in every slot.
Bytes FilledEveryType(const Schema& s) {
  Bytes e = NewEditingRecord(s);
  SetEditingText(e, 0, "Hello", s);
  SetEditingText(e, 1, "-42", s);
  SetEditingText(e, 2, "3.25", s);
  SetEditingByte(e, 3, 2, s);
  SetEditingByte(e, 4, 1, s);
  SetEditingNumber(e, 5, 77, s);
  std::span<uint8_t> image = EditingSlot(e, 6);
  for (size_t i = 0; i < image.size(); ++i) image[i] = uint8_t(i * 7 + 1);
  SetEditingNumber(e, 7, 366, s);
  SetEditingNumber(e, 8, 0x000D0705, s);
  SetEditingNumber(e, 9, 12, s);
  SetEditingNumber(e, 10, 9, s);
  SetEditingText(e, 10, "linked text", s);
  SetEditingText(e, 11, "a note\r\nof two lines", s);
  SetEditingText(e, 13, "Other", s);
  SetEditingText(e, 14, "3725", s);
  SetEditingText(e, 15, "366", s);
  SetEditingText(e, 16, "2.50", s);
  SetEditingText(e, 17, "1", s);
  return e;
}

ByteVector Value(ByteView record, int slot) {
  auto v = FieldValue(record, slot);
  return v ? ByteVector(v->begin(), v->end()) : ByteVector{0xDE, 0xAD};
}

TEST(RecordLayoutTest, OnlySlotZeroUsedPutsTheEndMarkInSlotOne) {
  Schema s = SchemaOf({FieldType::Text});
  Bytes e = NewEditingRecord(s);
  SetEditingText(e, 0, "ab", s);
  EXPECT_EQ(Compact(e, s), (ByteVector{0, 3, 0, 'a', 'b', 0, 0xFF, 0xFF}));
  EXPECT_EQ(FieldOffset(1, Compact(e, s)), -1);
}

TEST(RecordLayoutTest, AllThirtySlotsUsedHaveNoEndMark) {
  Schema s = InitSchema();
  for (FieldDef& f : s.field) f.typeNumber = static_cast<int16_t>(FieldType::Integer);
  Bytes e = NewEditingRecord(s);
  for (int i = 0; i < 30; ++i) SetEditingNumber(e, i, uint32_t(i * 1000 + 1), s);
  Bytes stored = Compact(e, s);
  ASSERT_EQ(stored.size(), 1u + 30 * 6);
  for (int i = 0; i < 30; ++i) {
    EXPECT_EQ(FieldOffset(i, stored), 3 + 6 * i);
    EXPECT_EQ(FieldLength(stored, i), 4);
    EXPECT_EQ(ValueNumber(*FieldValue(stored, i)), uint32_t(i * 1000 + 1));
  }
}

TEST(RecordLayoutTest, NotUsedBeforeAUsedSlotStoresAnEmptyLength) {
  Schema s = InitSchema();
  s.field[1].typeNumber = static_cast<int16_t>(FieldType::CheckBox);
  Bytes e = NewEditingRecord(s);
  SetEditingByte(e, 1, 1, s);
  EXPECT_EQ(Compact(e, s), (ByteVector{0, 0, 0, 1, 0, 1, 0xFF, 0xFF}));
}

TEST(RecordLayoutTest, IntegerTextIsReadLikeTheCLibrary) {
  Schema s = SchemaOf({FieldType::Integer});
  const std::pair<const char*, int32_t> cases[] = {
      {"12abc", 12}, {"", 0},     {"  -7", -7},         {"+5", 5},
      {"abc", 0},    {"0x10", 0}, {"2147483648", INT32_MAX}, {"-2147483649", INT32_MIN}};
  for (auto [text, number] : cases) {
    Bytes e = NewEditingRecord(s);
    SetEditingText(e, 0, text, s);
    Bytes stored = Compact(e, s);
    ASSERT_EQ(FieldLength(stored, 0), 4) << text;
    EXPECT_EQ(static_cast<int32_t>(ValueNumber(*FieldValue(stored, 0))), number) << text;
  }
}

TEST(RecordLayoutTest, ImageWithoutPictureStoresThreeBytes) {
  Schema s = SchemaOf({FieldType::Image});
  Bytes e = NewEditingRecord(s);
  EditingSlot(e, 0)[10] = 7;
  EXPECT_EQ(Compact(e, s), (ByteVector{0, 1, 0, 0, 0xFF, 0xFF}));
  EditingSlot(e, 0)[0] = 9;
  Bytes stored = Compact(e, s);
  ASSERT_EQ(FieldLength(stored, 0), 2001);
  EXPECT_EQ((*FieldValue(stored, 0))[10], 7);
}

TEST(RecordLayoutTest, LengthsAreLowByteFirst) {
  ByteVector raw = SlotWriter().Text("hell").bytes;  // length bytes 05 00
  ASSERT_EQ(raw[1], 0x05);
  ASSERT_EQ(raw[2], 0x00);
  raw.insert(raw.end(), {0x02, 0x01});  // 258
  raw.insert(raw.end(), 258, 'z');
  raw.insert(raw.end(), {0xFF, 0xFF});
  EXPECT_EQ(FieldLength(raw, 0), 5);
  EXPECT_EQ(FieldLength(raw, 1), 258);
  EXPECT_EQ(FieldOffset(2, raw), -1);
  EXPECT_TRUE(RecordIsWellFormed(raw));
}

TEST(RecordLayoutTest, FloatAndCalculatedKeepAtMostFourteenCharacters) {
  Schema s = SchemaOf({FieldType::Float, FieldType::Calculated, FieldType::Text});
  s.field[2].size = 3;
  Bytes e = NewEditingRecord(s);
  const ByteVector fifteen = {'1', '2', '3', '4', '5', '6', '7', '8', '9', '0', '1', '2', '3', '4', '5'};
  PutFieldValue(0, fifteen, e, s);
  PutFieldValue(1, fifteen, e, s);
  PutFieldValue(2, ByteVector{'a', 'b', 'c', 'd'}, e, s);  // a full Text slot has no NUL
  Bytes stored = Compact(e, s);
  EXPECT_EQ(ValueString(*FieldValue(stored, 0)), "12345678901234");
  EXPECT_EQ(ValueString(*FieldValue(stored, 1)), "12345678901234");
  EXPECT_EQ(Value(stored, 2), (ByteVector{'a', 'b', 'c', 'd', 0}));
  EXPECT_EQ(StoredSize(e, s), stored.size());
}

TEST(RecordLayoutTest, SlotOfUnknownTypeIsDropped) {
  Schema s = SchemaOf({FieldType::Text, FieldType::NotUsed, FieldType::Text});
  s.field[1].typeNumber = 20;
  Bytes e = NewEditingRecord(s);
  SetEditingText(e, 0, "a", s);
  SetEditingText(e, 2, "b", s);
  Bytes stored = Compact(e, s);
  EXPECT_EQ(stored, (ByteVector{0, 2, 0, 'a', 0, 2, 0, 'b', 0, 0xFF, 0xFF}));
  EXPECT_EQ(StoredSize(e, s), stored.size());
}

TEST(RecordLayoutTest, StoredSizeIsTheCompactSizeForEveryType) {
  Schema plain = testing::EveryTypeSchema();
  Schema extended = plain;
  extended.recordExtension = 1;
  Schema lastOnly = InitSchema();
  lastOnly.field[29].typeNumber = static_cast<int16_t>(FieldType::Note);
  Schema odd = plain;
  odd.field[20].typeNumber = 99;
  odd.field[21].typeNumber = -3;
  odd.field[22].typeNumber = static_cast<int16_t>(FieldType::Heading);
  for (const Schema* s : {&plain, &extended, &lastOnly, &odd}) {
    Bytes empty = NewEditingRecord(*s);
    EXPECT_EQ(StoredSize(empty, *s), Compact(empty, *s).size());
    Bytes full = FilledEveryType(*s);
    EXPECT_EQ(StoredSize(full, *s), Compact(full, *s).size());
    // Every text slot filled to the brim, with no NUL at all.
    for (int i = 0; i < 30; ++i) {
      std::span<uint8_t> slot = EditingSlot(full, i);
      std::memset(slot.data(), 'q', slot.size());
    }
    EXPECT_EQ(StoredSize(full, *s), Compact(full, *s).size());
  }
}

TEST(RecordLayoutTest, ExpandAndCompactRoundTrip) {
  Schema s = testing::EveryTypeSchema();
  Bytes stored = Compact(FilledEveryType(s), s);
  Bytes editing = Expand(stored, s);
  EXPECT_EQ(Compact(editing, s), stored);
  EXPECT_EQ(ValueString(EditingSlot(editing, 1)), "-42");
  EXPECT_EQ(ValueString(EditingSlot(editing, 0)), "Hello");
  EXPECT_EQ(ValueNumber(*FieldValue(stored, 10)), 9u);
  EXPECT_EQ(ValueString(EditingSlot(editing, 10).subspan(24)), "linked text");
  EXPECT_EQ(EditingSlot(editing, 6)[2000], uint8_t(2000 * 7 + 1));
}

TEST(RecordLayoutTest, ExtensionPrefixIsCarried) {
  Schema s = SchemaOf({FieldType::Text});
  s.recordExtension = 1;
  Bytes e = NewEditingRecord(s);
  ASSERT_EQ(e[0], 1);
  for (int i = 1; i <= 20; ++i) EXPECT_EQ(e[i], 0) << i;
  for (int i = 1; i <= 20; ++i) e[i] = uint8_t(i);
  SetEditingText(e, 0, "a", s);
  Bytes stored = Compact(e, s);
  EXPECT_TRUE(std::equal(e.begin(), e.begin() + 21, stored.begin()));
  EXPECT_EQ(FieldOffset(0, stored), 23);
  EXPECT_EQ(ValueString(*FieldValue(stored, 0)), "a");
  EXPECT_EQ(Compact(Expand(stored, s), s), stored);
}

TEST(RecordLayoutTest, SwitchingTheExtensionConvertsRecords) {
  Schema plain = SchemaOf({FieldType::Text, FieldType::Integer});
  Schema extended = plain;
  extended.recordExtension = 1;
  const ByteVector without = SlotWriter().Text("x").Number(5).End().bytes;
  Bytes with = Compact(Expand(without, extended), extended);
  ByteVector expected = SlotWriter(true).Text("x").Number(5).End().bytes;
  EXPECT_EQ(with, expected);
  EXPECT_EQ(Compact(Expand(with, plain), plain), without);
}

TEST(RecordLayoutTest, ValuesAreBoundedByTheRecord) {
  const ByteVector overlong = {0, 0x10, 0x00, 'a', 'b'};
  EXPECT_FALSE(RecordIsWellFormed(overlong));
  EXPECT_EQ(FieldLength(overlong, 0), 16);
  EXPECT_EQ(Value(overlong, 0), (ByteVector{'a', 'b'}));
  EXPECT_EQ(FieldOffset(1, overlong), -1);
  EXPECT_FALSE(FieldValue(overlong, 1).has_value());
  EXPECT_EQ(ValueString(*FieldValue(overlong, 0)), "ab");
  EXPECT_EQ(ValueNumber(*FieldValue(overlong, 0)), 0x6261u);
  // A prefix flag promising more bytes than the record has.
  const ByteVector shortPrefix = {1, 2, 3, 4};
  EXPECT_EQ(FieldOffset(0, shortPrefix), -1);
  EXPECT_FALSE(RecordIsWellFormed(shortPrefix));
  // Slot numbers outside 0 to 29.
  const ByteVector good = SlotWriter().Byte(1).End().bytes;
  EXPECT_EQ(FieldOffset(-1, good), -1);
  EXPECT_EQ(FieldOffset(30, good), -1);
  // Expanding a damaged record keeps what it has and does not read past it.
  Schema s = SchemaOf({FieldType::Text, FieldType::Text});
  Bytes e = Expand(overlong, s);
  EXPECT_EQ(ValueString(EditingSlot(e, 0)), "ab");
  EXPECT_EQ(ValueString(EditingSlot(e, 1)), "");
}

TEST(RecordLayoutTest, PutFieldValueAndFieldEquals) {
  Schema s = SchemaOf({FieldType::Date, FieldType::Text});
  s.field[1].size = 5;
  Bytes e = NewEditingRecord(s);
  SetEditingText(e, 1, "abcdef", s);
  EXPECT_EQ(ValueString(EditingSlot(e, 1)), "abcde");
  PutFieldValue(1, ByteVector{'x', 'y'}, e, s);
  EXPECT_TRUE(FieldEquals(1, ByteVector{'x', 'y', 0, 0, 0, 0}, e, s));
  EXPECT_FALSE(FieldEquals(1, ByteVector{'x', 'y', 0, 0, 0, 1}, e, s));
  PutFieldValue(0, ByteVector{1, 2, 3, 4, 5, 6}, e, s);  // cut to the capacity
  EXPECT_TRUE(FieldEquals(0, ByteVector{1, 2, 3, 4}, e, s));
  EXPECT_EQ(ValueString(EditingSlot(e, 1)), "xy");
}

}  // namespace
}  // namespace cx
