// The bytes of every packet the sender writes and the body split rule.
#include <gtest/gtest.h>

#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"
#include "infrared/obex_packets.h"
#include "infrared/obex_text.h"

namespace cx::obex {
namespace {

using Bytes = std::vector<uint8_t>;

TEST(ObexPackets, FixedPackets) {
  uint8_t buf[16];
  ASSERT_EQ(BuildConnect(buf), 7u);
  EXPECT_EQ(Bytes(buf, buf + 7), (Bytes{0x80, 0x00, 0x07, 0x10, 0x00, 0x0F, 0xE8}));
  ASSERT_EQ(BuildPutFinal(buf), 6u);
  EXPECT_EQ(Bytes(buf, buf + 6), (Bytes{0x82, 0x00, 0x06, 0x49, 0x00, 0x03}));
  ASSERT_EQ(BuildDisconnect(buf), 3u);
  EXPECT_EQ(Bytes(buf, buf + 3), (Bytes{0x81, 0x00, 0x03}));
  const uint8_t body[] = {9, 8, 7};
  ASSERT_EQ(BuildBodyPart(buf, body, 3), 9u);
  EXPECT_EQ(Bytes(buf, buf + 9), (Bytes{0x02, 0x00, 0x09, 0x48, 0x00, 0x06, 9, 8, 7}));
}

TEST(ObexPackets, HeaderPutInTheSendersOrderWithoutTheBody) {
  std::vector<HeaderItem> items;
  ASSERT_TRUE(ObjectItems("ab", "c.PDB", "lnch", Bytes{1, 2, 3, 4, 5}, items));
  ASSERT_EQ(items.size(), 5u);
  EXPECT_EQ(items[4].id, kHeaderBody);
  EXPECT_EQ(items[4].bodyCount, 5);
  Bytes expected = {0x02, 0x00, 0x25,
                    0x05, 0x00, 0x09, 0x00, 'a', 0x00, 'b', 0x00, 0x00,
                    0x01, 0x00, 0x0F, 0x00, 'c', 0x00, '.', 0x00, 'P', 0x00, 'D', 0x00, 'B', 0x00, 0x00,
                    0xCF, 'l', 'n', 'c', 'h',
                    0xC3, 0x00, 0x00, 0x00, 0x05};
  EXPECT_EQ(BuildHeaderPut(items), expected);
}

TEST(ObexPackets, TextsAreUtf16MostSignificantByteFirst) {
  EXPECT_EQ(Utf8ToUtf16Be("\xC3\xA9\xE2\x82\xAC"), (Bytes{0x00, 0xE9, 0x20, 0xAC}));
  EXPECT_EQ(Utf8ToUtf16Be("\xF0\x9F\x98\x80"), (Bytes{0xD8, 0x3D, 0xDE, 0x00}));
  std::string back;
  Bytes wire = {0x00, 'x', 0xD8, 0x3D, 0xDE, 0x00, 0x00, 0x00, 0x00, 'y'};
  ASSERT_TRUE(Utf16BeToUtf8(wire.data(), wire.size(), back));
  EXPECT_EQ(back, "x\xF0\x9F\x98\x80");  // stops at the zero unit
  EXPECT_FALSE(Utf16BeToUtf8(wire.data(), 3, back));
  Bytes lone = {0xDC, 0x00};
  ASSERT_TRUE(Utf16BeToUtf8(lone.data(), lone.size(), back));
  EXPECT_EQ(back, "\xEF\xBF\xBD");
}

TEST(ObexPackets, ObjectsMustBeSmallerThan65536Bytes) {
  std::vector<HeaderItem> items;
  EXPECT_TRUE(ObjectItems("d", "n", "QrTa", Bytes(65535), items));
  EXPECT_EQ(items[4].bodyCount, 65535);
  EXPECT_FALSE(ObjectItems("d", "n", "QrTa", Bytes(65536), items));
  EXPECT_TRUE(items.empty());
}

TEST(ObexPackets, BodySplitAtTheBufferEdge) {
  using Sizes = std::vector<size_t>;
  EXPECT_EQ(BodyPartSizes(0, 0), Sizes{0});
  EXPECT_EQ(BodyPartSizes(4072, 0), Sizes{4072});
  EXPECT_EQ(BodyPartSizes(4073, 0), (Sizes{4066, 7}));
  EXPECT_EQ(BodyPartSizes(8132, 0), (Sizes{4066, 4066}));
  EXPECT_EQ(BodyPartSizes(8133, 0), (Sizes{4066, 4066, 1}));
  EXPECT_EQ(BodyPartSizes(65535, 4072), BodyPartSizes(65535, 0));
  EXPECT_EQ(BodyPartSizes(65535, 0).size(), 17u);
}

TEST(ObexPackets, SmallPeersGetPacketsTheyAccept) {
  using Sizes = std::vector<size_t>;
  EXPECT_EQ(BodyPartSizes(1018, 1024), Sizes{1018});
  EXPECT_EQ(BodyPartSizes(2500, 1024), (Sizes{1018, 1018, 464}));
  EXPECT_EQ(BodyPartSizes(4071, 4071), (Sizes{4065, 6}));
  EXPECT_EQ(BodyPartSizes(300, 100), (Sizes{249, 51}));  // below the OBEX minimum

  std::vector<HeaderItem> items;
  ASSERT_TRUE(ObjectItems(std::string(100, 'd'), std::string(100, 'n'), "QrTa", {}, items));
  auto groups = GroupHeaders(items, 255);
  ASSERT_EQ(groups.size(), 2u);
  EXPECT_EQ(groups[0].size(), 1u);  // Description: 205 bytes
  EXPECT_EQ(groups[1].size(), 3u);  // Name, Creator id, Length
  for (const auto& g : groups) EXPECT_LE(BuildHeaderPut(g).size(), 255u);
  EXPECT_EQ(GroupHeaders(items, 0xFFFF).size(), 1u);
}

TEST(ObexPackets, HeaderReaderBoundsEveryLength) {
  Bytes ok = {0x01, 0x00, 0x05, 0x00, 0x00, 0xC3, 0, 0, 1, 0, 0x97, 0x42};
  HeaderReader reader(ok.data(), ok.size());
  Header h;
  ASSERT_TRUE(reader.Next(h));
  EXPECT_EQ(h.id, 0x01);
  EXPECT_EQ(h.size, 2u);
  ASSERT_TRUE(reader.Next(h));
  EXPECT_EQ(h.number, 256u);
  ASSERT_TRUE(reader.Next(h));
  EXPECT_EQ(h.number, 0x42u);
  EXPECT_FALSE(reader.Next(h));
  EXPECT_FALSE(reader.malformed());

  for (Bytes bad : {Bytes{0x48, 0x00, 0x09, 1, 2}, Bytes{0x48, 0x00, 0x02}, Bytes{0x48, 0x00},
                    Bytes{0xC3, 0, 0}, Bytes{0x97}}) {
    HeaderReader r(bad.data(), bad.size());
    while (r.Next(h)) {
    }
    EXPECT_TRUE(r.malformed());
  }
}

}  // namespace
}  // namespace cx::obex
