#include "app/record_form.h"

#include <gtest/gtest.h>

#include "engine/dates.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::Byte;
using testing::Num;
using testing::Text;
using testing::TestDb;
using T = FieldType;

// 2024-02-28 12:00:00 UTC.
const FixedClock kClock(1709121600);

TEST(RecordFormLayout, LabelAdjustmentStopsAtItsUnequalBounds) {
  TestDb t;
  t.db.schema().viewValue2 = 72;
  EXPECT_TRUE(IncreaseFieldWidth(t.db));
  EXPECT_EQ(t.db.schema().viewValue2, 78);
  EXPECT_FALSE(IncreaseFieldWidth(t.db));
  EXPECT_EQ(t.db.schema().viewValue2, 78);

  t.db.schema().viewValue2 = -66;
  EXPECT_TRUE(DecreaseFieldWidth(t.db));
  EXPECT_EQ(t.db.schema().viewValue2, -70);
  EXPECT_FALSE(DecreaseFieldWidth(t.db));
  EXPECT_EQ(t.db.schema().viewValue2, -70);
  EXPECT_TRUE(t.db.changed());

  // L = width x (80 + A) / 160, truncated; the value column takes the rest
  // less 3.
  t.db.schema().viewValue2 = 78;
  FormLayout wide = LayoutForm(t.db.schema(), 240);
  EXPECT_EQ(wide.labelWidth, 237);
  EXPECT_EQ(wide.valueWidth, 0);
  t.db.schema().viewValue2 = -70;
  FormLayout narrow = LayoutForm(t.db.schema(), 241);
  EXPECT_EQ(narrow.labelWidth, 15);
  EXPECT_EQ(narrow.valueWidth, 223);
}

TEST(RecordFormLayout, RowsFollowDisplayOrderAndSkipHiddenFields) {
  TestDb t;
  FormLayout empty = LayoutForm(t.db.schema(), 240);
  EXPECT_EQ(empty.height, 15);
  EXPECT_TRUE(empty.fields.empty());

  const int text = t.Field(T::Text, "Text");
  const int note = t.Field(T::Note, "Note");
  const int hidden = t.Field(T::Integer, "Hidden");
  t.db.schema().field[hidden].visible = 0;
  const int heading = t.Field(T::Heading, "Heading");
  // Shown first: the heading, then the note, then the text.
  t.db.schema().fieldOrder = {};
  t.db.schema().fieldOrder[0] = static_cast<uint8_t>(heading);
  t.db.schema().fieldOrder[1] = static_cast<uint8_t>(note);
  t.db.schema().fieldOrder[2] = static_cast<uint8_t>(hidden);
  t.db.schema().fieldOrder[3] = static_cast<uint8_t>(text);
  for (int i = 4; i < format::kFieldCount; ++i) t.db.schema().fieldOrder[i] = static_cast<uint8_t>(i);

  FormLayout layout = LayoutForm(t.db.schema(), 240);
  EXPECT_EQ(layout.fields, (std::vector<int>{heading, note, text}));
  EXPECT_EQ(layout.height, 15 + 22 + 102 + 42);

  for (int f : {text, note, heading}) t.db.schema().field[f].visible = 0;
  EXPECT_EQ(LayoutForm(t.db.schema(), 240).height, 15);
}

// A database with one field of every type that holds a value.
struct AllTypes : TestDb {
  AllTypes() {
    text = Field(T::Text, "Text", 10);
    integer = Field(T::Integer, "Integer");
    real = Field(T::Float, "Float", 2);
    popup = Field(T::PopUp, "Popup");
    check = Field(T::CheckBox, "Check");
    unique = Field(T::Unique, "Unique");
    image = Field(T::Image, "Image");
    date = Field(T::Date, "Date");
    time = Field(T::Time, "Time");
    link = Field(T::Link, "Link");
    linked = Field(T::Linked, "Linked");
    note = Field(T::Note, "Note");
    heading = Field(T::Heading, "Heading");
    dbpopup = Field(T::DBPopup, "DBPopup", 20);
    calc = Calc("Calc", 0, 1, integer, 255, 0, "", "1");
    db.popups()[popup].items = {"red", "green", "blue"};
    Bytes picture(2001, 0);
    picture[0] = 1;
    picture[700] = 0x5A;
    Bytes timeBytes{5, 7, 13, 0x99};  // the reserved byte is carried as found
    Bytes linkedValue(24, 0);
    linkedValue[0] = 3;
    linkedValue[10] = 0x42;  // inside the block: never ours to touch
    for (char c : std::string("Parent")) linkedValue.push_back(static_cast<uint8_t>(c));
    linkedValue.push_back(0);
    original = testing::RawRecord({testing::Str("hello"), testing::Le32(uint32_t(-42)),
                                   testing::Str("3.14"), {2}, {7}, testing::Le32(17), picture,
                                   testing::Le32(44000), timeBytes, testing::Le32(9), linkedValue,
                                   testing::Str("line 1\r\nline 2"), {}, testing::Str("chosen"),
                                   testing::Str("-41")},
                                  true);
    db.AppendRecord(original);
  }
  int text, integer, real, popup, check, unique, image, date, time, link, linked, note, heading,
      dbpopup, calc;
  Bytes original;
};

// Every slot of `a` but `except` equals the one of `b`.
void ExpectOtherSlotsKept(ByteView a, ByteView b, int except) {
  auto va = FieldValues(a);
  auto vb = FieldValues(b);
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (f == except) continue;
    ASSERT_EQ(va[f].has_value(), vb[f].has_value()) << "slot " << f;
    if (va[f]) {
      EXPECT_TRUE(std::ranges::equal(*va[f], *vb[f])) << "slot " << f;
    }
  }
}

TEST(RecordFormValues, UntouchedRecordComesBackByteForByte) {
  AllTypes t;
  RecordForm form(t.session, 0, kClock);
  EXPECT_FALSE(form.AnyModified());
  EXPECT_EQ(form.Stored(), t.original);

  // What the controls show.
  EXPECT_EQ(form.Text(t.text), "hello");
  EXPECT_EQ(form.Text(t.integer), "-42");
  EXPECT_EQ(form.Text(t.real), "3.14");
  EXPECT_EQ(form.Byte(t.popup), 2);
  EXPECT_EQ(form.Byte(t.check), 7);
  EXPECT_EQ(form.Number(t.unique), 17u);
  EXPECT_EQ(form.Image(t.image).size(), 2001u);
  EXPECT_EQ(form.Number(t.date), 44000u);
  EXPECT_EQ(form.Time(t.time), (TimeBytes{5, 7, 13, 0x99}));
  EXPECT_EQ(form.Text(t.linked), "Parent");
  EXPECT_EQ(form.Number(t.linked), 3u);
  EXPECT_EQ(form.DisplayText(t.popup), "blue");
  EXPECT_EQ(form.DisplayText(t.calc), "-41");

  // Setting a value to what it was is no change.
  form.SetText(t.text, "hello");
  form.SetByte(t.check, 7);
  EXPECT_FALSE(form.AnyModified());
  EXPECT_EQ(form.Stored(), t.original);
}

TEST(RecordFormValues, EachTypeChangesItsOwnSlotOnly) {
  AllTypes t;
  struct Case {
    int field;
    std::function<void(RecordForm&)> change;
    std::function<void(ByteView)> check;
  };
  Bytes drawn(2001, 0);
  drawn[0] = 1;
  drawn[2000] = 0x80;
  const std::vector<Case> cases = {
      {t.text, [&](RecordForm& f) { EXPECT_FALSE(f.SetText(t.text, "a longer text")); },
       [](ByteView v) { EXPECT_EQ(ValueString(v), "a longer t"); }},
      {t.integer, [&](RecordForm& f) { f.SetText(t.integer, "12abc"); },
       [](ByteView v) { EXPECT_EQ(ValueNumber(v), 12u); }},
      {t.real, [&](RecordForm& f) { f.SetText(t.real, "2.5"); },
       [](ByteView v) { EXPECT_EQ(ValueString(v), "2.5"); }},
      {t.popup, [&](RecordForm& f) { f.SetByte(t.popup, 255); },
       [](ByteView v) { EXPECT_EQ(v[0], 255); }},
      {t.check, [&](RecordForm& f) { f.SetByte(t.check, 0); },
       [](ByteView v) { EXPECT_EQ(v[0], 0); }},
      {t.image, [&](RecordForm& f) { f.SetImage(t.image, drawn); },
       [](ByteView v) { ASSERT_EQ(v.size(), 2001u); EXPECT_EQ(v[2000], 0x80); }},
      {t.image, [&](RecordForm& f) { f.SetImage(t.image, {}); },
       [](ByteView v) { ASSERT_EQ(v.size(), 1u); EXPECT_EQ(v[0], 0); }},
      {t.date, [&](RecordForm& f) { f.SetNumber(t.date, 366); },
       [](ByteView v) { EXPECT_EQ(ValueNumber(v), 366u); }},
      {t.time, [&](RecordForm& f) { f.SetTime(t.time, {0, 30, 8, 0x99}); },
       [](ByteView v) { EXPECT_EQ(Bytes(v.begin(), v.end()), (Bytes{0, 30, 8, 0x99})); }},
      {t.linked, [&](RecordForm& f) { f.SetText(t.linked, "Other"); },
       [](ByteView v) {
         EXPECT_EQ(v[0], 3);
         EXPECT_EQ(v[10], 0x42);
         EXPECT_EQ(ValueString(v.subspan(24)), "Other");
       }},
      {t.note, [&](RecordForm& f) { f.SetText(t.note, ""); },
       [](ByteView v) { EXPECT_EQ(v.size(), 1u); }},
      {t.dbpopup, [&](RecordForm& f) { f.SetText(t.dbpopup, "picked"); },
       [](ByteView v) { EXPECT_EQ(ValueString(v), "picked"); }},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.field);
    RecordForm form(t.session, 0, kClock);
    c.change(form);
    EXPECT_TRUE(form.Modified(c.field));
    const Bytes stored = form.Stored();
    ASSERT_TRUE(RecordIsWellFormed(stored));
    ExpectOtherSlotsKept(stored, t.original, c.field);
    c.check(*FieldValue(stored, c.field));
  }
}

TEST(RecordFormValues, ValuesAnotherProgramLaidOutDifferentlySurviveEdits) {
  TestDb t;
  const int a = t.Field(T::Text, "A", 3);  // room for 3; the file holds more
  const int b = t.Field(T::Integer, "B");
  const int c = t.Field(T::Text, "C");
  (void)c;
  // Slot 0 longer than its room, slot 1 a 6-byte integer, then the end mark
  // before slot 2.
  const Bytes original = testing::RawRecord({testing::Str("too long"), {1, 0, 0, 0, 9, 9}});
  t.db.AppendRecord(original);

  RecordForm untouched(t.session, 0, kClock);
  EXPECT_EQ(untouched.Stored(), original);

  RecordForm form(t.session, 0, kClock);
  form.SetText(c, "new");
  const Bytes stored = form.Stored();
  EXPECT_EQ(ValueString(*FieldValue(stored, a)), "too long");
  EXPECT_EQ(FieldValue(stored, b)->size(), 6u);
  EXPECT_EQ(ValueString(*FieldValue(stored, c)), "new");
}

TEST(RecordFormValues, NewRecordDefaultsAndSavingFills) {
  TestDb t;
  const int popup = t.Field(T::PopUp, "Popup");
  t.db.schema().field[popup].param1 = 1;
  const int current = t.Field(T::Date, "Current");
  t.db.schema().field[current].behavior = static_cast<uint8_t>(DateBehavior::Current);
  const int added = t.Field(T::Date, "Added");
  t.db.schema().field[added].behavior = static_cast<uint8_t>(DateBehavior::Added);
  const int asked = t.Field(T::Date, "Asked");
  t.db.schema().field[asked].behavior = static_cast<uint8_t>(DateBehavior::AskUser);
  const int modified = t.Field(T::Time, "Modified");
  t.db.schema().field[modified].behavior = static_cast<uint8_t>(TimeBehavior::Modified);
  const int unique = t.Field(T::Unique, "Unique");
  const int link = t.Field(T::Link, "Link");
  t.Add({Num(unique, 40)});

  const uint32_t today = DateToDayNumber({2024, 2, 28});
  RecordForm form(t.session, kNewRecordIndex, kClock);
  EXPECT_EQ(form.Byte(popup), 1);
  EXPECT_EQ(form.Number(current), today);
  EXPECT_EQ(form.Number(added), 0u);
  EXPECT_TRUE(form.Time(modified).none());
  form.PrepareForSave();
  EXPECT_EQ(form.Number(added), today);
  EXPECT_EQ(form.Number(asked), 0u);
  EXPECT_EQ(form.Time(modified), (TimeBytes{0, 0, 12, 0}));
  // Unique and Link numbers come from one counter above the largest in use.
  EXPECT_EQ(form.Number(unique), 41u);
  EXPECT_EQ(form.Number(link), 42u);

  // Editing an existing record refreshes only "Modified" behaviours, and
  // only when something changed.
  RecordForm edit(t.session, 0, kClock);
  edit.PrepareForSave();
  EXPECT_FALSE(edit.AnyModified());
  edit.SetByte(popup, 2);
  edit.PrepareForSave();
  EXPECT_EQ(edit.Number(added), 0u);
  EXPECT_EQ(edit.Time(modified).hours, 12);

  // Added where the view shows the records linked to another one: linked
  // to it too.
  t.session.link = LinkRestriction{link, 7};
  RecordForm linked(t.session, kNewRecordIndex, kClock);
  EXPECT_EQ(linked.Number(link), 7u);
  t.session.link.reset();

  // A copy gets numbers of its own.
  RecordForm copy(t.session, kNewRecordIndex, kClock, size_t{0});
  EXPECT_EQ(copy.Number(unique), 0u);
  copy.PrepareForSave();
  EXPECT_EQ(copy.Number(unique), 43u);
}

}  // namespace
}  // namespace cx
