#include "ops/view.h"

#include "ops/field_values.h"

namespace cx {
namespace {

bool TextRule(std::string_view value, const std::string& lowerNeedle) {
  if (lowerNeedle.empty()) return value.empty();
  return !value.empty() && ContainsText(value, lowerNeedle, false, true);
}

template <typename T>
bool Between(T low, T value, T high) {
  return low <= value && value <= high;
}

}  // namespace

ViewTester::ViewTester(const Database& db, const LinkRestriction* link)
    : db_(db), settings_(LoadFilterSettings(db.schema())) {
  if (link) link_ = *link;
  for (int n = 0; n < 2; ++n) {
    const Filter& f = settings_.filter[n];
    limits_[n].needle = LowerAscii(f.LowerText());
    limits_[n].lowerValue = ParseDouble(f.LowerText());
    limits_[n].upperValue = ParseDouble(f.UpperText());
  }
}

bool ViewTester::PassesFilter(int n, ByteView record) const {
  const Filter& f = settings_.filter[n];
  const Limits& lim = limits_[n];
  std::optional<ByteView> value = FieldValue(record, f.field);
  if (!value) return false;
  const FieldDef& def = db_.schema().field[f.field];
  if (def.typeNumber < 0 || def.typeNumber > 15) return false;

  auto floatRule = [&](std::string_view text) {
    double v = ParseDouble(text);
    return v >= lim.lowerValue && lim.upperValue >= v;
  };
  switch (def.type()) {
    case FieldType::NotUsed:
    case FieldType::Image:
    case FieldType::Link:
    case FieldType::Heading:
      return true;
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
      return TextRule(ValueView(*value), lim.needle);
    case FieldType::Linked: {
      std::optional<std::string_view> text = LinkedText(*value);
      return text && TextRule(*text, lim.needle);
    }
    case FieldType::Integer:
      return Between(f.lowerNumber, static_cast<int32_t>(ValueNumber(*value)), f.upperNumber);
    case FieldType::Unique:
      return Between(static_cast<uint32_t>(f.lowerNumber), ValueNumber(*value),
                     static_cast<uint32_t>(f.upperNumber));
    case FieldType::Float:
      return floatRule(ValueView(*value));
    case FieldType::PopUp:
    case FieldType::CheckBox:
      return int32_t(value->empty() ? 0 : (*value)[0]) == f.lowerNumber;
    case FieldType::Date:
      return Between(f.LowerDay(), ValueNumber(*value), f.UpperDay());
    case FieldType::Time:
      return Between(f.LowerTime(), Time24(*value), f.UpperTime());
    case FieldType::Calculated: {
      std::string_view text = ValueView(*value);
      const int64_t number = ParseLong(text);
      switch (CalcKindOf(def)) {
        case CalcKind::Whole:
          return Between<int64_t>(f.lowerNumber, number, f.upperNumber);
        case CalcKind::Time:
          return Between<int64_t>(TimeSeconds(f.lower[0], f.lower[1], f.lower[2]), number,
                                  TimeSeconds(f.upper[0], f.upper[1], f.upper[2]));
        case CalcKind::Date:
          return Between<int64_t>(f.LowerDay(), number, f.UpperDay());
        case CalcKind::Decimal:
          return floatRule(text);
        case CalcKind::Unknown:
          return false;
      }
      return false;
    }
  }
  return false;
}

bool ViewTester::InView(size_t index) const {
  if (index >= db_.recordCount()) return false;
  const bool f1 = settings_.filter[0].enabled;
  const bool f2 = settings_.filter[1].enabled;
  if (!f1 && !f2 && !link_) return true;
  ByteView record = db_.record(index);
  if (link_ && link_->field != -1) {
    std::optional<ByteView> value = FieldValue(record, link_->field);
    if (!value || ValueNumber(*value) != link_->value) return false;
  }
  bool result = true;
  if (f1) result = PassesFilter(0, record) != settings_.Not(0);
  if (f2) {
    if (f1) {
      if (settings_.UsesOr() && result) return true;
      if (!settings_.UsesOr() && !result) return false;
    }
    result = PassesFilter(1, record) != settings_.Not(1);
  }
  return result;
}

int RecordInView(const Database& db, size_t index, const LinkRestriction* link) {
  // Callers often ask record by record; without filters or a link there is
  // nothing to prepare.
  if (!link && !LoadFilterSettings(db.schema()).AnyEnabled()) return index < db.recordCount() ? 1 : 0;
  return ViewTester(db, link).InView(index) ? 1 : 0;
}

int FilterTest(const Database& db, int filterNumber, ByteView record) {
  if (filterNumber != 1 && filterNumber != 2) return 0;
  return ViewTester(db, nullptr).PassesFilter(filterNumber - 1, record) ? 1 : 0;
}

std::vector<uint32_t> RebuildView(const Database& db, const LinkRestriction* link) {
  ViewTester tester(db, link);
  std::vector<uint32_t> view;
  view.reserve(db.recordCount());
  for (size_t i = 0; i < db.recordCount(); ++i) {
    if (tester.InView(i)) view.push_back(static_cast<uint32_t>(i));
  }
  return view;
}

}  // namespace cx
