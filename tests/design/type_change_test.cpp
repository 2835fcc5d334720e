#include "design/type_change.h"

#include <gtest/gtest.h>

#include "design/field_editor.h"
#include "engine/value_text.h"
#include "tests/design/design_db.h"
#include "tests/engine/test_databases.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ScriptedUi;
using T = FieldType;

// Old type down, new type across, in type-number order:
// K keep, C convert, L lose.
constexpr const char* kClassMatrix[16] = {
    "KCCCCCCCCCCCCCCC",  // Not-Used
    "KKCKLCCLCCCCKLKK",  // Text
    "KCKCLLKLLLLLLLLL",  // Integer
    "KKCKLCCLCCCCKLKK",  // Float
    "KCLLKLLLLLLLLLLL",  // Pop-Up
    "KCLLLKLLLLLLLLLL",  // Check-Box
    "KCKCLLKLLLKLLLLL",  // Unique
    "KLLLLLLKLLLLLLLL",  // Image
    "KCLLLLLLKLLLLLLL",  // Date
    "KCLLLLLLLKLLLLLL",  // Time
    "KCKCLLKLLLKLLLLL",  // Link
    "KCKCLLKLLLKKLLLL",  // Linked
    "KKCKLCCLCCCCKLKK",  // Note
    "KLLLLLLLLLLLLKLL",  // Heading
    "KKCKLCCLCCCCKLKK",  // DB Popup
    "KKCKLCCLCCCCKLKK",  // Calculated
};

TEST(TypeChangeClass, EveryPairOfTypes) {
  for (int from = 0; from < 16; ++from) {
    for (int to = 0; to < 16; ++to) {
      const char want = kClassMatrix[from][to];
      const TypeChange got = ClassifyTypeChange(TypeFromNumber(from), TypeFromNumber(to));
      const char gotChar = got == TypeChange::Keep ? 'K' : got == TypeChange::Convert ? 'C' : 'L';
      EXPECT_EQ(gotChar, want) << FieldTypeLabel(TypeFromNumber(from)) << " -> "
                               << FieldTypeLabel(TypeFromNumber(to));
    }
  }
}

TEST(TypeChangeClass, QuestionTexts) {
  EXPECT_EQ(ConversionQuestion(ConversionRule::AskUnique),
            "Use the existing data in this field for the unique values? (Note: The values must be "
            "unique numbers for this to convert properly.) ");
  EXPECT_EQ(ConversionQuestion(ConversionRule::AskLink),
            "Use the existing data in this field for the link values? (Note: The values must be "
            "unique numbers for this to convert properly.) ");
  EXPECT_EQ(ConversionQuestion(ConversionRule::AskLinked),
            "Use the existing data in this field for the linked values? (Note: The values must be "
            "numbers that relate to the link field for this to convert properly.) ");
  EXPECT_EQ(ConversionQuestion(ConversionRule::Reset), "");
}

enum class Asked { None, Loss, Unique, Link, Linked };

struct ConversionCase {
  const char* label;
  T from;
  std::vector<std::string> values;  // slot 0 of each record, as the editor writes it
  T to;
  std::deque<bool> answers;
  Asked asked;
  std::vector<std::string> shown;   // slot 0's display text afterwards
};

std::ostream& operator<<(std::ostream& os, const ConversionCase& c) { return os << c.label; }

class Conversion : public ::testing::TestWithParam<ConversionCase> {
 protected:
  static std::string QuestionFor(Asked a) {
    switch (a) {
      case Asked::Loss: return type_change_messages::kDataLoss;
      case Asked::Unique: return ConversionQuestion(ConversionRule::AskUnique);
      case Asked::Link: return ConversionQuestion(ConversionRule::AskLink);
      case Asked::Linked: return ConversionQuestion(ConversionRule::AskLinked);
      default: return "";
    }
  }
};

TEST_P(Conversion, RewritesTheFieldAndNothingElse) {
  const ConversionCase& c = GetParam();
  Database db = testing::MakeDatabase("/nonexistent/c.PDB", {{"Subject", c.from},
                                                             {"Witness", T::Text},
                                                             {"Count", T::Integer}});
  db.popups()[0].items = {"Red", "Green"};
  for (size_t i = 0; i < c.values.size(); ++i) {
    testing::AddRecord(db, {c.values[i], "keep " + std::to_string(i), std::to_string(100 + i)});
  }
  std::vector<Bytes> before;
  for (size_t i = 0; i < db.recordCount(); ++i) before.emplace_back(db.record(i).begin(), db.record(i).end());
  const Bytes schemaBefore = WriteSchema(db.schema());

  ScriptedUi ui;
  ui.yesNoAnswers = c.answers;
  LocaleInfo locale;
  DataSession session(db, locale, ui);
  FieldSettings s = LoadFieldSettings(db, 0);
  s.type = static_cast<int>(c.to);
  FieldApplyOutcome out = ApplyFieldSettings(session, 0, s);

  if (c.asked == Asked::None) {
    EXPECT_TRUE(ui.questions.empty());
  } else {
    ASSERT_EQ(ui.questions.size(), 1u);
    EXPECT_EQ(ui.questions[0].text, QuestionFor(c.asked));
    EXPECT_EQ(ui.questions[0].caption, "QUESTION");
  }
  ASSERT_EQ(db.recordCount(), c.values.size());
  if (out.result == ApplyResult::Declined) {
    // Nothing at all changed, although the database counts as changed.
    EXPECT_EQ(WriteSchema(db.schema()), schemaBefore);
    for (size_t i = 0; i < db.recordCount(); ++i) {
      EXPECT_EQ(Bytes(db.record(i).begin(), db.record(i).end()), before[i]);
    }
    EXPECT_TRUE(db.changed());
    return;
  }
  EXPECT_EQ(db.schema().field[0].type(), c.to);
  ValueContext vc{db.schema(), db.popups(), locale};
  for (size_t i = 0; i < db.recordCount(); ++i) {
    EXPECT_EQ(ValueText(vc, db.record(i), 0), c.shown[i]) << "record " << i;
    for (int other : {1, 2}) {
      auto was = FieldValue(before[i], other);
      auto now = FieldValue(db.record(i), other);
      ASSERT_TRUE(was && now);
      EXPECT_EQ(Bytes(was->begin(), was->end()), Bytes(now->begin(), now->end()));
    }
  }
}

INSTANTIATE_TEST_SUITE_P(
    Table, Conversion,
    ::testing::Values(
        ConversionCase{"TextToUniqueYes", T::Text, {"7", "", "3"}, T::Unique, {true}, Asked::Unique, {"7", "0", "3"}},
        ConversionCase{"TextToUniqueNo", T::Text, {"7", "", "3"}, T::Unique, {false}, Asked::Unique, {"1", "2", "3"}},
        ConversionCase{"TextToLinkYes", T::Text, {"12", "x"}, T::Link, {true}, Asked::Link, {"12", "0"}},
        ConversionCase{"TextToLinkedNo", T::Text, {"12", "x"}, T::Linked, {false}, Asked::Linked, {"0", "0"}},
        ConversionCase{"TextToLinkedYes", T::Text, {"12", "x"}, T::Linked, {true}, Asked::Linked, {"12", "0"}},
        ConversionCase{"TextToInteger", T::Text, {"12abc", "", "-4"}, T::Integer, {}, Asked::None, {"12", "0", "-4"}},
        ConversionCase{"FloatToInteger", T::Float, {"3.75"}, T::Integer, {}, Asked::None, {"3"}},
        ConversionCase{"TextToCheckBox", T::Text, {"1", "0", "", "2.5"}, T::CheckBox, {}, Asked::None, {"1", "0", "0", "1"}},
        ConversionCase{"TextToDate", T::Text, {"3/7/2024", "", "junk"}, T::Date, {}, Asked::None, {"3/7/2024", "NO DATE", "NO DATE"}},
        ConversionCase{"TextToTime", T::Text, {"1:30 PM", "", "junk"}, T::Time, {}, Asked::None, {"1:30:00 PM", "No Time", "No Time"}},
        ConversionCase{"TextToPopUpYes", T::Text, {"Red"}, T::PopUp, {true}, Asked::Loss, {"No Value"}},
        ConversionCase{"TextToPopUpNo", T::Text, {"Red"}, T::PopUp, {false}, Asked::Loss, {}},
        ConversionCase{"TextToImageNo", T::Text, {"x"}, T::Image, {}, Asked::Loss, {}},
        ConversionCase{"TextToNoteKeeps", T::Text, {"long text"}, T::Note, {}, Asked::None, {"long text"}},
        ConversionCase{"TextToNotUsedKeeps", T::Text, {"x"}, T::NotUsed, {}, Asked::None, {""}},
        ConversionCase{"NoteToIntegerResets", T::Note, {"42"}, T::Integer, {}, Asked::None, {"0"}},
        ConversionCase{"NotUsedToText", T::NotUsed, {""}, T::Text, {}, Asked::None, {""}},
        ConversionCase{"IntegerToText", T::Integer, {"42", "-7"}, T::Text, {}, Asked::None, {"42", "-7"}},
        ConversionCase{"IntegerToFloat", T::Integer, {"42"}, T::Float, {}, Asked::None, {"42"}},
        ConversionCase{"IntegerToUniqueKeeps", T::Integer, {"42"}, T::Unique, {}, Asked::None, {"42"}},
        ConversionCase{"IntegerToPopUpAsks", T::Integer, {"1"}, T::PopUp, {true}, Asked::Loss, {"No Value"}},
        ConversionCase{"IntegerToDateNo", T::Integer, {"1"}, T::Date, {false}, Asked::Loss, {}},
        ConversionCase{"PopUpToText", T::PopUp, {"0", "1", "255"}, T::Text, {}, Asked::None, {"Red", "Green", ""}},
        ConversionCase{"CheckBoxToText", T::CheckBox, {"1", "0"}, T::Text, {}, Asked::None, {"1", "0"}},
        ConversionCase{"DateToText", T::Date, {"366", "0"}, T::Text, {}, Asked::None, {"1/1/1905", ""}},
        ConversionCase{"TimeToText", T::Time, {"13:05:09", ""}, T::Text, {}, Asked::None, {"1:05:09 PM", ""}},
        ConversionCase{"DateToPopUpYes", T::Date, {"366"}, T::PopUp, {true}, Asked::Loss, {"No Value"}},
        ConversionCase{"CheckBoxToTimeYes", T::CheckBox, {"1"}, T::Time, {true}, Asked::Loss, {"No Time"}},
        ConversionCase{"UniqueToText", T::Unique, {"5", "-1"}, T::Text, {}, Asked::None, {"5", "-1"}},
        ConversionCase{"LinkToFloat", T::Link, {"9"}, T::Float, {}, Asked::None, {"9"}},
        ConversionCase{"LinkedToText", T::Linked, {"77"}, T::Text, {}, Asked::None, {"77"}},
        ConversionCase{"UniqueToLinkKeeps", T::Unique, {"5"}, T::Link, {}, Asked::None, {"5"}},
        ConversionCase{"UniqueToLinkedAsks", T::Unique, {"5"}, T::Linked, {true}, Asked::Loss, {"0"}},
        ConversionCase{"LinkedToIntegerKeeps", T::Linked, {"6"}, T::Integer, {}, Asked::None, {"6"}},
        ConversionCase{"ImageToTextYes", T::Image, {""}, T::Text, {true}, Asked::Loss, {""}},
        ConversionCase{"HeadingToUniqueYes", T::Heading, {"", ""}, T::Unique, {true}, Asked::Loss, {"1", "2"}},
        ConversionCase{"CalculatedToInteger", T::Calculated, {"12.5000"}, T::Integer, {}, Asked::None, {"12"}}),
    [](const ::testing::TestParamInfo<ConversionCase>& info) { return std::string(info.param.label); });

class UniqueNumbers : public ::testing::Test {
 protected:
  void SetUp() override {
    // Slot 1 already numbers the records, so the next unique number is 41.
    for (const char* v : {"7", "", "3"}) testing::AddRecord(db, {v, "40"});
  }
  FieldApplyOutcome ToUnique(bool answer) {
    ui.yesNoAnswers = {answer};
    DataSession session(db, locale, ui);
    FieldSettings s = LoadFieldSettings(db, 0);
    s.type = static_cast<int>(T::Unique);
    return ApplyFieldSettings(session, 0, s);
  }
  uint32_t Slot0(size_t record) { return ValueNumber(*FieldValue(db.record(record), 0)); }

  Database db = testing::MakeDatabase("/nonexistent/u.PDB", {{"Code", T::Text}, {"Id", T::Unique}});
  ScriptedUi ui;
  LocaleInfo locale;
};

TEST_F(UniqueNumbers, ExistingDataSetsTheNextNumber) {
  ToUnique(true);
  EXPECT_EQ(Slot0(0), 7u);
  EXPECT_EQ(Slot0(1), 0u);
  EXPECT_EQ(Slot0(2), 3u);
  EXPECT_EQ(db.NextUniqueNumber(), 8u);
}

TEST_F(UniqueNumbers, RenumberingStartsAtTheNextNumber) {
  ToUnique(false);
  EXPECT_EQ(Slot0(0), 41u);
  EXPECT_EQ(Slot0(1), 42u);
  EXPECT_EQ(Slot0(2), 43u);
  EXPECT_EQ(db.NextUniqueNumber(), 44u);
}

TEST(TypeChangeWithoutRecords, NoQuestionNoRewrite) {
  Database db = testing::MakeDatabase("/nonexistent/e.PDB", {{"A", T::Text}});
  ScriptedUi ui;
  LocaleInfo locale;
  DataSession session(db, locale, ui);
  FieldSettings s = LoadFieldSettings(db, 0);
  s.type = static_cast<int>(T::PopUp);
  FieldApplyOutcome out = ApplyFieldSettings(session, 0, s);
  EXPECT_EQ(out.result, ApplyResult::Stored);
  EXPECT_EQ(out.change, TypeChange::Keep);
  EXPECT_FALSE(out.converted);
  EXPECT_TRUE(ui.questions.empty());
  EXPECT_EQ(db.schema().field[0].type(), T::PopUp);
}

TEST(TypeChangeText, CutToTheNewMaxLength) {
  Database db = testing::MakeDatabase("/nonexistent/t.PDB", {{"N", T::Integer}});
  testing::AddRecord(db, {"123456"});
  ScriptedUi ui;
  LocaleInfo locale;
  DataSession session(db, locale, ui);
  FieldSettings s = LoadFieldSettings(db, 0);
  s.type = static_cast<int>(T::Text);
  s.maxCharacters = 4;
  ApplyFieldSettings(session, 0, s);
  EXPECT_EQ(db.schema().field[0].size, 4);
  EXPECT_EQ(ValueString(*FieldValue(db.record(0), 0)), "1234");
}

TEST(SlotSplice, KeepsOtherSlotsAndTheEndMark) {
  Schema schema = testing::MakeDatabase("/x", {{"A", T::Text}}).schema();
  // Slot 0 only, then the end mark: writing slot 3 fills 1 and 2 empty.
  testing::SlotWriter w;
  w.Text("abc").End();
  Bytes out = WithSlotValue(w.bytes, 3, Bytes{9, 0}, schema);
  testing::SlotWriter want;
  want.Text("abc").Empty().Empty().Raw({9, 0}).End();
  EXPECT_EQ(out, want.bytes);

  // A record that fills all 30 slots gets no end mark.
  testing::SlotWriter full(true);
  for (int i = 0; i < 30; ++i) full.Byte(static_cast<uint8_t>(i));
  Bytes replaced = WithSlotValue(full.bytes, 29, Bytes{1, 2}, schema);
  testing::SlotWriter fullWant(true);
  for (int i = 0; i < 29; ++i) fullWant.Byte(static_cast<uint8_t>(i));
  fullWant.Raw({1, 2});
  EXPECT_EQ(replaced, fullWant.bytes);
}

}  // namespace
}  // namespace cx
