#include <gtest/gtest.h>

#include <charconv>
#include <cmath>
#include <random>
#include <vector>

#include "engine/dates.h"
#include "engine/value_text.h"
#include "tests/engine/test_databases.h"

namespace cx {
namespace {

using testing::SlotWriter;

LocaleInfo Dates(const std::string& pattern, char separator) {
  LocaleInfo l;
  l.shortDate = pattern;
  l.dateSeparator = separator;
  return l;
}

LocaleInfo Times(const std::string& pattern) {
  LocaleInfo l;
  l.timeFormat = pattern;
  l.timeSeparator = ':';
  return l;
}

TEST(DateTextTest, FollowsTheShortDatePattern) {
  EXPECT_EQ(DateText(366, Dates("M/d/yyyy", '/')), "1/1/1905");
  EXPECT_EQ(DateText(366, Dates("dd.MMM.yy", '.')), "01.01.05");
  EXPECT_EQ(DateText(366 + 40, Dates("yyyy-MM-dd", '-')), "1905-02-10");
  EXPECT_EQ(DateText(1, Dates("M/d/yyyy", '/')), "1/2/1904");
  // An unknown token prints nothing; its separators stay.
  EXPECT_EQ(DateText(366, Dates("d/q/yyyy", '/')), "1//1905");
}

TEST(DateTextTest, DayZeroIsNoDate) {
  EXPECT_EQ(DateText(0, Dates("M/d/yyyy", '/')), "NO DATE");
  EXPECT_EQ(DateText(0, Dates("dd.MM.yy", '.')), "NO DATE");
}

TEST(DateTextTest, YearsPastTheFourDigitsPrintInFull) {
  EXPECT_EQ(DateText(0xFFFFFFFFu, Dates("dd.MM.yyyy", '.')), "04.08.11760883");
  EXPECT_EQ(DateText(0xFFFFFFFFu, Dates("d/M/yy", '/')), "4/8/83");
  EXPECT_EQ(DateText(DateToDayNumber({2031, 12, 31}), Dates("M/d/yyyy", '/')), "12/31/2031");
}

TEST(TimeTextTest, TwentyFourHourPatterns) {
  EXPECT_EQ(TimeText(5, 7, 0, Times("H:mm:ss")), "0:07:05");
  EXPECT_EQ(TimeText(5, 7, 13, Times("H:mm:ss")), "13:07:05");
  EXPECT_EQ(TimeText(5, 7, 9, Times("HH:mm:ss")), "09:07:05");
  EXPECT_EQ(TimeText(5, 7, 13, Times("hh:mm:ss")), "13:07:05");
  // "h" without "tt" still shows midnight as 12.
  EXPECT_EQ(TimeText(5, 7, 0, Times("h:mm:ss")), "12:07:05");
}

TEST(TimeTextTest, TwelveHourPatternsAppendTheDesignator) {
  EXPECT_EQ(TimeText(5, 7, 0, Times("h:mm:ss tt")), "12:07:05 AM");
  EXPECT_EQ(TimeText(5, 7, 12, Times("h:mm:ss tt")), "12:07:05 PM");
  EXPECT_EQ(TimeText(5, 7, 13, Times("h:mm:ss tt")), "1:07:05 PM");
  EXPECT_EQ(TimeText(5, 7, 13, Times("hh:mm:ss tt")), "01:07:05 PM");
  LocaleInfo other = Times("h:mm:ss tt");
  other.am = "vorm.";
  EXPECT_EQ(TimeText(0, 30, 11, other), "11:30:00 vorm.");
}

TEST(TimeTextTest, HourByte255IsNoTime) {
  EXPECT_EQ(TimeText(0, 0, 255, Times("h:mm:ss tt")), "No Time");
  EXPECT_EQ(TimeText(0, 0, 255, Times("HH:mm:ss")), "No Time");
}

class ValueTextTest : public ::testing::Test {
 protected:
  ValueTextTest() {
    popups[3].items = {"Low", "High", std::string(100, 'x')};
  }
  std::string Text(const testing::ByteVector& record, int slot) {
    return ValueText(ValueContext{schema, popups, locale}, record, slot);
  }

  Schema schema = testing::EveryTypeSchema();
  PopupLists popups{};
  LocaleInfo locale = LocaleInfo::UnitedStates();
};

TEST_F(ValueTextTest, EveryType) {
  testing::ByteVector linked = {9, 0, 0, 0};
  linked.resize(24, 0xEE);
  linked.insert(linked.end(), {'a', 'b', 0});
  const auto record = SlotWriter()
                          .Text("Hello")
                          .Number(static_cast<uint32_t>(-42))
                          .Text("3.14159")
                          .Byte(1)
                          .Byte(2)
                          .Number(77)
                          .Byte(0)
                          .Number(366)
                          .Raw({5, 7, 13, 0})
                          .Number(12)
                          .Raw(linked)
                          .Text("note\r\nline")
                          .Empty()
                          .Text("Other")
                          .Text("3725")
                          .Text("366")
                          .Text("2.50")
                          .Text("1")
                          .End()
                          .bytes;
  const char* expected[] = {"Hello", "-42", "3.14159", "High", "1", "77", "", "1/1/1905",
                            "1:07:05 PM", "12", "9", "note\r\nline", "", "Other", "1:02:05",
                            "1/1/1905", "2.50", "Error!", ""};
  for (int slot = 0; slot < 19; ++slot) EXPECT_EQ(Text(record, slot), expected[slot]) << slot;
}

// The writer reads the patterns once for a whole export; under every
// pattern it must append to what the buffer holds exactly the text that
// the per-value formatter gives.
TEST_F(ValueTextTest, TheWriterAppendsWhatEachValueGives) {
  const auto record = SlotWriter()
                          .Text("Hello").Number(7).Text("2.5").Byte(255).Byte(1).Number(77).Byte(0)
                          .Number(366 + 40).Raw({5, 7, 0, 0}).Number(12).Empty().Text("n")
                          .Empty().Text("x").Text("3725").Text("400").Text("2.50").Text("1")
                          .End()
                          .bytes;
  const auto shortRecord = SlotWriter().Text("only").End().bytes;
  LocaleInfo twelve = Times("hh:mm:ss tt");
  twelve.shortDate = "dd.MMM.yy";
  twelve.dateSeparator = '.';
  twelve.am = "vorm.";
  const LocaleInfo patterns[] = {LocaleInfo::UnitedStates(), Dates("yyyy-MM-dd", '-'),
                                 Dates("d/q/yyyy", '/'), Times("H:mm:ss"), Times("h:mm:ss"), twelve};
  for (const LocaleInfo& l : patterns) {
    const ValueContext ctx{schema, popups, l};
    const ValueTextWriter writer(ctx);
    for (const auto* r : {&record, &shortRecord}) {
      std::string out = "before|";
      std::string expected = out;
      for (int slot = -1; slot <= 30; ++slot) {
        writer.Append(slot, slot >= 0 && slot < 30 ? FieldValue(*r, slot) : std::nullopt, out);
        expected += ValueText(ctx, *r, slot);
        out += '|';
        expected += '|';
      }
      EXPECT_EQ(out, expected) << l.shortDate << " " << l.timeFormat;
    }
  }
}

TEST_F(ValueTextTest, CalculatedDateOfALargeDayNumber) {
  auto calculated = [](const char* stored) {
    SlotWriter w;
    for (int slot = 0; slot < 15; ++slot) w.Empty();
    return w.Text(stored).End().bytes;
  };
  EXPECT_EQ(Text(calculated("4294967295"), 15), "8/4/11760883");
  EXPECT_EQ(Text(calculated("10000000"), 15), "7/5/29282");
}

TEST_F(ValueTextTest, PopupAndCheckBoxValues) {
  auto withPopup = [](uint8_t item, uint8_t check) {
    return SlotWriter().Empty().Empty().Empty().Byte(item).Byte(check).End().bytes;
  };
  EXPECT_EQ(Text(withPopup(255, 0), 3), "No Value");
  EXPECT_EQ(PopupText(popups[3], -1), "No Value");
  EXPECT_EQ(Text(withPopup(255, 0), 4), "0");
  EXPECT_EQ(Text(withPopup(0, 1), 3), "Low");
  EXPECT_EQ(Text(withPopup(2, 1), 3), std::string(79, 'x'));
  EXPECT_EQ(Text(withPopup(7, 1), 3), "");
}

TEST_F(ValueTextTest, MissingSlotIsEmptyButCalculatedIsError) {
  const auto shortRecord = SlotWriter().Text("only").End().bytes;
  EXPECT_EQ(Text(shortRecord, 0), "only");
  EXPECT_EQ(Text(shortRecord, 1), "");
  EXPECT_EQ(Text(shortRecord, 7), "");
  EXPECT_EQ(Text(shortRecord, 14), "Error!");
  // A record of nothing but its prefix.
  const testing::ByteVector bare = {0};
  EXPECT_EQ(Text(bare, 0), "");
  EXPECT_EQ(Text(bare, 15), "Error!");
  EXPECT_EQ(Text(bare, 30), "");
}

TEST(DecimalTextTest, PlacesAndDecimalSeparator) {
  LocaleInfo dot;
  LocaleInfo comma;
  comma.decimalSeparator = ',';
  LocaleInfo apostrophe;
  apostrophe.decimalSeparator = '\'';
  EXPECT_EQ(DecimalText(3.14159, 2, dot), "3.14");
  EXPECT_EQ(DecimalText(3.14159, 2, comma), "3,14");
  EXPECT_EQ(DecimalText(3.14159, 2, apostrophe), "3,14");
  EXPECT_EQ(DecimalText(-2.5, 4, dot), "-2.5000");
  EXPECT_EQ(DecimalText(7, 0, dot), "7");
  EXPECT_EQ(DecimalText(123456789.125, 3, dot), "123456789.125");
}

// Most values are printed without the general conversion; every one must
// still come out as printf rounds the exact binary value, ties and values
// that round to a signed zero included.
TEST(DecimalTextTest, AgreesWithTheExactConversion) {
  const LocaleInfo dot;
  auto exact = [](double v, int places) {
    char buf[512];
    return std::string(buf, std::to_chars(buf, buf + sizeof buf, v, std::chars_format::fixed, places).ptr);
  };
  std::vector<double> values = {0.0, -0.0, 0.5, -0.5, 1.5, 2.5, 0.125, 0.375, -0.125, 1e-300, -1e-300,
                                0.005, 0.015, 1.005, 2.675, 0.00005, -0.00004, 0x1p42, -0x1p42 + 0.25,
                                4398046511103.75, 1e15, 123456789.125, 99999.99995, -0.0049999};
  std::mt19937_64 random(7);
  for (int i = 0; i < 100000; ++i) {
    const uint64_t bits = random();
    values.push_back(static_cast<double>(static_cast<int64_t>(bits % 20000001) - 10000000) / 100.0);
    values.push_back(static_cast<double>(bits % 1000000) / 1024.0);  // exact binary ties
    values.push_back(std::ldexp(static_cast<double>(bits >> 11), -static_cast<int>(bits % 64)));
    values.push_back(static_cast<double>(bits % 100000) * (static_cast<double>(random() % 10000) / 100.0));
  }
  for (double v : values) {
    for (int places = 0; places <= 4; ++places) {
      ASSERT_EQ(DecimalText(v, places, dot), exact(v, places)) << std::hexfloat << v << " " << places;
    }
  }
}

TEST(DecimalTextTest, PlacesOfAField) {
  FieldDef calc;
  calc.typeNumber = static_cast<int16_t>(FieldType::Calculated);
  const std::pair<uint8_t, int> formats[] = {{0, 4}, {1, 0}, {2, 0}, {3, 0},
                                             {4, 3}, {5, 2}, {6, 1}, {9, 0}};
  for (auto [format, places] : formats) {
    calc.setResultFormat(format);
    EXPECT_EQ(DecimalPlaces(calc), places) << int(format);
  }
  FieldDef number;
  number.typeNumber = static_cast<int16_t>(FieldType::Float);
  number.size = 2;
  EXPECT_EQ(DecimalPlaces(number), 2);
  number.size = 9;
  EXPECT_EQ(DecimalPlaces(number), 4);
  number.size = -1;
  EXPECT_EQ(DecimalPlaces(number), 4);
}

TEST(LineTextTest, LineBreaks) {
  EXPECT_EQ(CrLfLines("a\rb\nc\r\nd\n\re"), "a\r\nb\r\nc\r\nd\r\ne");
  EXPECT_EQ(CrLfLines("\n\n"), "\r\n\r\n");
  EXPECT_EQ(CrLfLines("\r\n\r\n"), "\r\n\r\n");
  EXPECT_EQ(OneLine("a\r\nb\nc"), "a  b c");
}

}  // namespace
}  // namespace cx
