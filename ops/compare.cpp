#include "ops/compare.h"

#include <utility>

#include "ops/database_settings.h"
#include "ops/field_values.h"

namespace cx {
namespace {

int Sign(double a, double b) { return a < b ? -1 : (a > b ? 1 : 0); }

// The difference of two 32-bit numbers as the handheld computed it:
// wrapped to 32 bits, so values more than 2^31 apart compare backwards.
int WrappedDifference(uint32_t a, uint32_t b) { return static_cast<int32_t>(a - b); }

int CompareLinked(ByteView a, ByteView b) {
  std::optional<std::string_view> ta = LinkedText(a), tb = LinkedText(b);
  if (!ta && !tb) return 0;
  if (!ta) return -1;
  if (!tb) return 1;
  return CompareNoCase(*ta, *tb);
}

int CompareCalculated(const FieldDef& def, ByteView a, ByteView b) {
  switch (CalcKindOf(def)) {
    case CalcKind::Decimal:
      return Sign(ParseDouble(ValueView(a)), ParseDouble(ValueView(b)));
    case CalcKind::Whole:
    case CalcKind::Time:
    case CalcKind::Date:
      return WrappedDifference(static_cast<uint32_t>(ParseLong(ValueView(a))),
                               static_cast<uint32_t>(ParseLong(ValueView(b))));
    case CalcKind::Unknown:
      return 0;
  }
  return 0;
}

}  // namespace

int CompareByField(const Database& db, ByteView recordA, ByteView recordB, int field, int direction) {
  std::optional<ByteView> a = FieldValue(recordA, field);
  if (!a) return -1;
  std::optional<ByteView> b = FieldValue(recordB, field);
  if (!b) return 1;
  if (direction == 0) std::swap(a, b);

  const Schema& schema = db.schema();
  const FieldDef& def = schema.field[field];
  switch (def.type()) {
    case FieldType::NotUsed:
    case FieldType::Image:
    case FieldType::Link:
    case FieldType::Heading:
      return 0;
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
      return CompareNoCase(ValueView(*a), ValueView(*b));
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Date:
      return WrappedDifference(ValueNumber(*a), ValueNumber(*b));
    case FieldType::Float:
      return Sign(ParseDouble(ValueView(*a)), ParseDouble(ValueView(*b)));
    case FieldType::PopUp: {
      const int ia = a->empty() ? 0 : (*a)[0];
      const int ib = b->empty() ? 0 : (*b)[0];
      if (!SortPopupsOn(schema, field)) return ia - ib;
      const PopupList& list = db.popups()[field];
      return CompareNoCase(PopupText(list, ia), PopupText(list, ib));
    }
    case FieldType::CheckBox:
      return int(a->empty() ? 0 : (*a)[0]) - int(b->empty() ? 0 : (*b)[0]);
    case FieldType::Time:
      return static_cast<int>(Time24(*a)) - static_cast<int>(Time24(*b));
    case FieldType::Linked:
      return CompareLinked(*a, *b);
    case FieldType::Calculated:
      return CompareCalculated(def, *a, *b);
  }
  return 0;
}

int CompareRecords(const Database& db, ByteView a, ByteView b) {
  if (a.empty() || b.empty()) return 0;
  const auto& keys = db.schema().sortKey;
  for (const SortKey& key : keys) {
    if (key.Field() == -1) return 0;
    int r = CompareByField(db, a, b, key.Field(), key.direction);
    if (r != 0) return r;
  }
  return 0;
}

int ComparePlacement(const Database& db, ByteView a, ByteView b) {
  for (const SortKey& key : db.schema().sortKey) {
    if (key.Field() == -1) continue;
    int r = CompareByField(db, a, b, key.Field(), key.direction);
    if (r != 0) return r;
  }
  return 0;
}

}  // namespace cx


