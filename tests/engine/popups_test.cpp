#include <gtest/gtest.h>

#include "engine/popups.h"
#include "engine/record_store.h"
#include "tests/engine/test_databases.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ByteVector;

ByteVector Bytes(const std::string& s) { return ByteVector(s.begin(), s.end()); }

TEST(PopupsTest, ItemsRoundTrip) {
  const std::vector<std::string> items = {"Red", "Green", "Blue"};
  const ByteVector record = WritePopupItems(items);
  EXPECT_EQ(record, Bytes(std::string("Red\0Green\0Blue\0\0\0\0", 18)));
  EXPECT_EQ(PopupRecordSize(items), record.size());
  EXPECT_EQ(ReadPopupItems(record), items);
  EXPECT_EQ(WritePopupItems({}), ByteVector(3, 0));
  EXPECT_TRUE(ReadPopupItems(ByteVector(3, 0)).empty());
}

TEST(PopupsTest, EmptyItemsAreSkippedAndTwoZerosEndTheList) {
  EXPECT_EQ(WritePopupItems({"a", "", "b"}), Bytes(std::string("a\0b\0\0\0\0", 7)));
  EXPECT_EQ(PopupRecordSize({"a", "", "b"}), 7u);
  EXPECT_EQ(ReadPopupItems(Bytes(std::string("a\0\0b\0\0\0\0", 8))), std::vector<std::string>{"a"});
  EXPECT_TRUE(ReadPopupItems(Bytes(std::string("\0x\0", 3))).empty());
}

TEST(PopupsTest, AtMostSixtyItemsAreLoaded) {
  std::string text;
  for (int i = 0; i < 75; ++i) text += "item" + std::to_string(i) + '\0';
  const auto items = ReadPopupItems(Bytes(text + std::string(2, '\0')));
  ASSERT_EQ(items.size(), 60u);
  EXPECT_EQ(items[59], "item59");
}

TEST(PopupsTest, UnterminatedTextIsKept) {
  EXPECT_EQ(ReadPopupItems(Bytes("abc")), std::vector<std::string>{"abc"});
  EXPECT_EQ(ReadPopupItems(Bytes(std::string("one\0two", 7))),
            (std::vector<std::string>{"one", "two"}));
  EXPECT_TRUE(ReadPopupItems({}).empty());
}

TEST(PopupsTest, ForeignLayoutIsWrittenBackUnchangedUntilEdited) {
  std::string text;
  for (int i = 0; i < 70; ++i) text += "v" + std::to_string(i) + '\0';
  text += std::string(120, 'L');  // a long unterminated last text
  const ByteVector foreign = Bytes(text);
  PopupList list = DecodePopupList(foreign, 0x45, 0x123456);
  EXPECT_EQ(list.items.size(), 60u);
  EXPECT_EQ(list.Encode(), foreign);
  EXPECT_EQ(list.EncodedSize(), foreign.size());
  list.items[0] = "changed";
  const ByteVector rewritten = list.Encode();
  EXPECT_EQ(rewritten, WritePopupItems(list.items));
  EXPECT_EQ(list.EncodedSize(), rewritten.size());
  EXPECT_EQ(ReadPopupItems(rewritten), list.items);
}

TEST(PopupsTest, ItemTextFromAFileOnDisk) {
  cx::testing::TempDir dir;
  Database db = Database::CreateNew(dir.File("p.PDB"), "p");
  db.popups()[4].items = {"Alpha", "Beta", std::string(100, 'y')};
  ASSERT_TRUE(db.Save(FixedClock(1000)).ok());
  std::string text = "stale";
  EXPECT_EQ(PopupItemText(db.path(), 4, 1, text), 0);
  EXPECT_EQ(text, "Beta");
  EXPECT_EQ(PopupItemText(db.path(), 4, 2, text), 0);
  EXPECT_EQ(text, std::string(79, 'y'));
  EXPECT_EQ(PopupItemText(db.path(), 4, 0, text, 3), 0);
  EXPECT_EQ(text, "Alp");
  EXPECT_EQ(PopupItemText(db.path(), 4, 255, text), 0);
  EXPECT_EQ(text, "No Value");
  EXPECT_EQ(PopupItemText(db.path(), 4, 3, text), -1);
  EXPECT_EQ(text, "");
  EXPECT_EQ(PopupItemText(db.path(), 5, 0, text), -1);
  EXPECT_EQ(PopupItemText(dir.File("missing.PDB"), 4, 0, text), -1);
}

}  // namespace
}  // namespace cx
