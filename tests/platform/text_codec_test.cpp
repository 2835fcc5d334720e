// Every byte a database can hold must survive the trip to Unicode and back,
// or editing a record would quietly change values the user never touched.
#include <gtest/gtest.h>

#include <string>

#include "platform/text_codec.h"

namespace cx {
namespace {

TEST(TextCodecTest, EveryByteSurvivesTheRoundTrip) {
  std::string all;
  for (int b = 0; b < 256; ++b) {
    const std::string one(1, static_cast<char>(b));
    const std::string wide = Cp1252ToUtf8(one);
    bool lossless = false;
    EXPECT_EQ(Utf8ToCp1252(wide, &lossless), one) << "byte " << b;
    EXPECT_TRUE(lossless) << "byte " << b;
    // Below 0x80 the text is the same in both.
    if (b < 0x80) {
      EXPECT_EQ(wide, one) << "byte " << b;
    }
    all += one;
  }
  bool lossless = false;
  EXPECT_EQ(Utf8ToCp1252(Cp1252ToUtf8(all), &lossless), all);
  EXPECT_TRUE(lossless);
}

TEST(TextCodecTest, CodePageCharactersAndItsGaps) {
  // The printable block 0x80-0x9F differs from Latin-1; the five undefined
  // bytes stay the C1 controls of the same number.
  EXPECT_EQ(Cp1252ToUtf8("\x80"), "\u20AC");
  EXPECT_EQ(Cp1252ToUtf8("\x8A"), "\u0160");
  EXPECT_EQ(Cp1252ToUtf8("\x9F"), "\u0178");
  for (unsigned char gap : {0x81, 0x8D, 0x8F, 0x90, 0x9D}) {
    std::string expected;
    AppendUtf8(expected, gap);
    EXPECT_EQ(Cp1252ToUtf8(std::string(1, static_cast<char>(gap))), expected) << int(gap);
  }
  EXPECT_EQ(Cp1252ToUtf8("\xA0\xE9\xFF"), "\u00A0\u00E9\u00FF");

  // Latin-1 readings of 0x80-0x9F are not the code page's characters.
  bool lossless = true;
  Utf8ToCp1252("\u0080", &lossless);
  EXPECT_FALSE(lossless);
  lossless = true;
  EXPECT_EQ(Utf8ToCp1252("a\u4E2Db", &lossless).size(), 3u);
  EXPECT_FALSE(lossless);
  // Malformed UTF-8 is never read as the character it imitates.
  for (const char* bad : {"\xC3", "\xC0\xAF", "\xE0\x80\xAF", "\xED\xA0\x80", "\xF4\x90\x80\x80"}) {
    lossless = true;
    EXPECT_EQ(Utf8ToCp1252(bad, &lossless), "?") << bad;
    EXPECT_FALSE(lossless) << bad;
  }
}

TEST(TextCodecTest, MessagesKeepUtf8FileNamesAndCodePageTexts) {
  // A database name in Windows-1252 and a folder name in UTF-8, in one
  // message: both must read as the user wrote them.
  const std::string message = std::string("Z\xFCrich: cannot open /home/m\xC3\xBCller/") +
                              "\xD0\x94\xD0\xBE\xD0\xBA/a.PDB";
  EXPECT_EQ(MessageToUtf8(message), "Z\u00FCrich: cannot open /home/m\u00FCller/\u0414\u043E\u043A/a.PDB");
  // Bytes that only start a UTF-8 sequence, over-long forms and lone
  // continuation bytes stay code-page characters; nothing is dropped.
  EXPECT_EQ(MessageToUtf8("\xC3"), "\u00C3");
  EXPECT_EQ(MessageToUtf8("\xC0\xAF"), "\u00C0\u00AF");
  EXPECT_EQ(MessageToUtf8("\xE2\x82"), "\u00E2\u201A");
  EXPECT_EQ(MessageToUtf8("\x80 plain"), "\u20AC plain");
}

}  // namespace
}  // namespace cx
