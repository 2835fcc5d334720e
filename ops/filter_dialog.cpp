#include "ops/filter_dialog.h"

#include "ops/database_settings.h"
#include "ops/field_values.h"

namespace cx {
namespace {

TimeOfDay TimeFrom24(uint32_t t) {
  return {static_cast<uint8_t>(t >> 16), static_cast<uint8_t>(t >> 8), static_cast<uint8_t>(t)};
}

}  // namespace

FilterControls FilterControlsFor(const Schema& schema, int field) {
  if (field < 0 || field >= format::kFieldCount) return FilterControls::None;
  const FieldDef& def = schema.field[field];
  switch (def.type()) {
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
    case FieldType::Linked:
      return FilterControls::MustContain;
    case FieldType::Integer:
    case FieldType::Unique:
      return FilterControls::WholeLimits;
    case FieldType::Float:
      return FilterControls::DecimalLimits;
    case FieldType::Date:
      return FilterControls::DateLimits;
    case FieldType::Time:
      return FilterControls::TimeLimits;
    case FieldType::PopUp:
      return FilterControls::PopupValue;
    case FieldType::CheckBox:
      return FilterControls::CheckValue;
    case FieldType::Calculated:
      switch (CalcKindOf(def)) {
        case CalcKind::Decimal: return FilterControls::DecimalLimits;
        case CalcKind::Whole: return FilterControls::WholeLimits;
        case CalcKind::Time: return FilterControls::TimeLimits;
        case CalcKind::Date: return FilterControls::DateLimits;
        case CalcKind::Unknown: return FilterControls::None;
      }
      return FilterControls::None;
    default:
      return FilterControls::None;
  }
}

FilterDialogValues OpenFilterDialog(const Database& db) {
  const FilterSettings settings = LoadFilterSettings(db.schema());
  FilterDialogValues values;
  values.orBetween = settings.UsesOr();
  for (int n = 0; n < 2; ++n) {
    const Filter& f = settings.filter[n];
    FilterDialogFilter& d = values.filter[n];
    d.enabled = f.enabled;
    d.field = f.field;
    d.notChecked = settings.Not(n);
    d.mustContain = f.LowerText();
    if (FilterControlsFor(db.schema(), f.field) == FilterControls::WholeLimits) {
      d.lowerLimit = std::to_string(f.lowerNumber);
      d.upperLimit = std::to_string(f.upperNumber);
    } else {
      d.lowerLimit = f.LowerText();
      d.upperLimit = f.UpperText();
    }
    d.lowerDay = f.LowerDay();
    d.upperDay = f.UpperDay();
    d.lowerTime = TimeFrom24(f.LowerTime());
    d.upperTime = TimeFrom24(f.UpperTime());
    const bool noValue = f.lowerNumber == kNoValueFilter1 || f.lowerNumber == kNoValueFilter2;
    d.popupChoice = noValue ? kNoValueChoice : f.lowerNumber;
    d.checked = f.lowerNumber != 0;
  }
  return values;
}

void AcceptFilterDialog(Database& db, const FilterDialogValues& values) {
  FilterSettings settings = LoadFilterSettings(db.schema());
  settings.combination = 0;
  if (values.orBetween) settings.combination |= kFilterOr;
  for (int n = 0; n < 2; ++n) {
    const FilterDialogFilter& d = values.filter[n];
    Filter& f = settings.filter[n];
    f.enabled = d.enabled;
    f.field = d.field;
    if (d.notChecked) settings.combination |= n == 0 ? kFilterNot1 : kFilterNot2;
    switch (FilterControlsFor(db.schema(), d.field)) {
      case FilterControls::MustContain:
        f.SetLowerText(d.mustContain);
        break;
      case FilterControls::WholeLimits:
        f.lowerNumber = ParseLong(d.lowerLimit);
        f.upperNumber = ParseLong(d.upperLimit);
        break;
      case FilterControls::DecimalLimits:
        f.SetLowerText(d.lowerLimit);
        f.SetUpperText(d.upperLimit);
        break;
      case FilterControls::DateLimits:
        f.SetLowerDay(d.lowerDay);
        f.SetUpperDay(d.upperDay);
        break;
      case FilterControls::TimeLimits:
        f.SetLowerTime(d.lowerTime.hours, d.lowerTime.minutes, d.lowerTime.seconds);
        f.SetUpperTime(d.upperTime.hours, d.upperTime.minutes, d.upperTime.seconds);
        break;
      case FilterControls::PopupValue:
        f.lowerNumber = d.popupChoice == kNoValueChoice || d.popupChoice == kNoValueFilter1
                            ? (n == 0 ? kNoValueFilter1 : kNoValueFilter2)
                            : d.popupChoice;
        break;
      case FilterControls::CheckValue:
        f.lowerNumber = d.checked ? 1 : 0;
        break;
      case FilterControls::None:
        break;
    }
  }
  StoreFilterSettings(settings, db.schema());
  db.MarkChanged();
}

void DisableBothFilters(Database& db) {
  FilterSettings settings = LoadFilterSettings(db.schema());
  settings.filter[0].enabled = false;
  settings.filter[1].enabled = false;
  StoreFilterSettings(settings, db.schema());
  db.MarkChanged();
}

}  // namespace cx
