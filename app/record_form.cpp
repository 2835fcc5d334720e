#include "app/record_form.h"

#include <algorithm>
#include <cstring>
#include <ctime>

#include "engine/byte_order.h"
#include "engine/dates.h"
#include "engine/value_text.h"

namespace cx {
namespace {

constexpr size_t kImageBytes = 2001;
constexpr size_t kLinkedBlockBytes = 24;

std::span<const uint8_t> SlotOf(const Bytes& editing, int field) {
  return EditingSlot(const_cast<Bytes&>(editing), field);
}

size_t TextLength(std::span<const uint8_t> bytes) {
  const auto end = std::find(bytes.begin(), bytes.end(), uint8_t{0});
  return static_cast<size_t>(end - bytes.begin());
}

void PutLength(Bytes& out, size_t length) {
  out.push_back(static_cast<uint8_t>(length & 0xFF));
  out.push_back(static_cast<uint8_t>((length >> 8) & 0xFF));
}

std::tm LocalTime(const Clock& clock) {
  const std::time_t now = static_cast<std::time_t>(clock.Now());
  std::tm parts{};
  localtime_r(&now, &parts);
  return parts;
}

}  // namespace

int EditorRowHeight(FieldType type) {
  switch (type) {
    case FieldType::Text:
    case FieldType::DBPopup:
      return 42;
    case FieldType::Note:
      return 102;
    case FieldType::CheckBox:
    case FieldType::Image:
    case FieldType::Date:
    case FieldType::Time:
    case FieldType::Link:
    case FieldType::Linked:
      return 25;
    case FieldType::Integer:
    case FieldType::Float:
    case FieldType::PopUp:
    case FieldType::Unique:
    case FieldType::Heading:
    case FieldType::Calculated:
      return 22;
    case FieldType::NotUsed:
      return 0;
  }
  return 0;
}

bool ShownInEditor(const FieldDef& field) {
  return field.type() != FieldType::NotUsed && field.visible != 0;
}

std::vector<int> EditorFields(const Schema& schema) {
  std::vector<int> fields;
  for (uint8_t slot : schema.fieldOrder) {
    if (slot < format::kFieldCount && ShownInEditor(schema.field[slot])) fields.push_back(slot);
  }
  return fields;
}

int LabelAdjustment(const Schema& schema) {
  return std::clamp<int>(schema.viewValue2, kMinLabelAdjustment, kMaxLabelAdjustment);
}

FormLayout LayoutForm(const Schema& schema, int clientWidth) {
  FormLayout layout;
  layout.labelWidth = clientWidth * (80 + LabelAdjustment(schema)) / 160;
  layout.valueWidth = clientWidth - layout.labelWidth - 3;
  layout.fields = EditorFields(schema);
  for (int f : layout.fields) layout.height += EditorRowHeight(schema.field[f].type());
  return layout;
}

static bool StepAdjustment(Database& db, int step) {
  const int before = LabelAdjustment(db.schema());
  const int after = std::clamp(before + step, kMinLabelAdjustment, kMaxLabelAdjustment);
  if (after == before && db.schema().viewValue2 == before) return false;
  db.schema().viewValue2 = static_cast<int16_t>(after);
  db.MarkChanged();
  return after != before;
}

bool IncreaseFieldWidth(Database& db) { return StepAdjustment(db, kLabelAdjustmentStep); }
bool DecreaseFieldWidth(Database& db) { return StepAdjustment(db, -kLabelAdjustmentStep); }

uint32_t TodayDayNumber(const Clock& clock) {
  const std::tm t = LocalTime(clock);
  return DateToDayNumber(CalendarDate{t.tm_year + 1900, t.tm_mon + 1, t.tm_mday});
}

TimeBytes CurrentTime(const Clock& clock) {
  const std::tm t = LocalTime(clock);
  return TimeBytes{static_cast<uint8_t>(t.tm_sec % 60), static_cast<uint8_t>(t.tm_min),
                   static_cast<uint8_t>(t.tm_hour), 0};
}

Bytes EncodeSlot(const FieldDef& field, std::span<const uint8_t> v) {
  Bytes out;
  auto text = [&](std::span<const uint8_t> bytes) {
    const size_t n = TextLength(bytes);
    PutLength(out, n + 1);
    out.insert(out.end(), bytes.begin(), bytes.begin() + n);
    out.push_back(0);
  };
  auto fixed = [&](size_t n) {
    PutLength(out, n);
    for (size_t i = 0; i < n; ++i) out.push_back(i < v.size() ? v[i] : 0);
  };
  switch (field.type()) {
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
      text(v);
      break;
    case FieldType::Float:
    case FieldType::Calculated:
      // The last byte of the room is never part of the text.
      text(v.empty() ? v : v.first(v.size() - 1));
      break;
    case FieldType::Integer: {
      const std::string digits(v.begin(), v.begin() + TextLength(v));
      uint8_t b[4];
      PutLE32(b, static_cast<uint32_t>(ParseLong(digits)));
      PutLength(out, 4);
      out.insert(out.end(), b, b + 4);
      break;
    }
    case FieldType::PopUp:
    case FieldType::CheckBox:
      fixed(1);
      break;
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Date:
    case FieldType::Time:
      fixed(4);
      break;
    case FieldType::Image:
      if (v.empty() || v[0] == 0) {
        PutLength(out, 1);
        out.push_back(0);
      } else {
        fixed(kImageBytes);
      }
      break;
    case FieldType::Linked: {
      const auto block = v.first(std::min(v.size(), kLinkedBlockBytes));
      const auto rest = v.subspan(block.size());
      const size_t n = TextLength(rest);
      PutLength(out, kLinkedBlockBytes + n + 1);
      out.insert(out.end(), block.begin(), block.end());
      out.resize(out.size() + (kLinkedBlockBytes - block.size()), 0);
      out.insert(out.end(), rest.begin(), rest.begin() + n);
      out.push_back(0);
      break;
    }
    case FieldType::NotUsed:
    case FieldType::Heading:
      PutLength(out, 0);
      break;
  }
  return out;
}

Bytes SpliceRecord(ByteView original, ByteView editing, const Schema& schema,
                   const std::array<bool, format::kFieldCount>& replace) {
  int last = -1;
  for (int i = 0; i < format::kFieldCount; ++i) {
    if (replace[i]) last = i;
  }
  if (last < 0) return Bytes(original.begin(), original.end());
  if (original.empty()) return Compact(editing, schema);

  const auto values = FieldValues(original);
  Bytes editingCopy(editing.begin(), editing.end());
  Bytes out(original.begin(), original.begin() + std::min(DataStart(original), original.size()));
  size_t tail = out.size();  // where the original's walk stands
  for (int i = 0; i < format::kFieldCount; ++i) {
    if (!replace[i] && values[i]) {
      const size_t start = static_cast<size_t>(values[i]->data() - original.data()) - 2;
      tail = start + 2 + values[i]->size();
      out.insert(out.end(), original.begin() + start, original.begin() + tail);
      continue;
    }
    if (replace[i] || i < last) {
      const Bytes slot = EncodeSlot(schema.field[i], SlotOf(editingCopy, i));
      out.insert(out.end(), slot.begin(), slot.end());
      continue;
    }
    // The original ended before this slot and nothing later changed: keep
    // its end mark if it had one.
    if (tail + 2 <= original.size() && original[tail] == 0xFF && original[tail + 1] == 0xFF) {
      out.push_back(0xFF);
      out.push_back(0xFF);
    }
    break;
  }
  return out;
}

RecordForm::RecordForm(DataSession& session, size_t index, const Clock& clock,
                       std::optional<size_t> copyFrom)
    : session_(session), clock_(clock), index_(index), fields_(EditorFields(session.db.schema())) {
  const Schema& s = schema();
  if (!isNew()) {
    ByteView stored = session_.db.record(index_);
    original_.assign(stored.begin(), stored.end());
    baseline_ = Expand(original_, s);
    editing_ = baseline_;
    return;
  }
  baseline_ = NewEditingRecord(s);
  if (copyFrom && *copyFrom < session_.db.recordCount()) {
    editing_ = Expand(session_.db.record(*copyFrom), s);
    // A copy is a record of its own: it gets numbers of its own on saving.
    for (int f = 0; f < format::kFieldCount; ++f) {
      const FieldType t = s.field[f].type();
      if (t == FieldType::Unique || t == FieldType::Link) SetNumber(f, 0);
    }
    return;
  }
  editing_ = baseline_;
  for (int f = 0; f < format::kFieldCount; ++f) {
    const FieldDef& def = s.field[f];
    switch (def.type()) {
      case FieldType::PopUp:
        SetByte(f, def.param1);
        break;
      case FieldType::Time:
        SetTime(f, TimeBytes{});
        break;
      case FieldType::Date:
        if (def.behavior == static_cast<uint8_t>(DateBehavior::Current)) {
          SetNumber(f, TodayDayNumber(clock_));
        }
        break;
      default:
        break;
    }
  }
  // Added at a linked level: the record is linked to the record beneath,
  // or it would vanish from the view it was added in.
  if (const LinkRestriction* link = session_.Link(); link && link->field >= 0 && link->field < format::kFieldCount) {
    SetNumber(link->field, link->value);
  }
  baseline_ = editing_;
}

std::string RecordForm::Text(int field) const {
  auto slot = SlotOf(editing_, field);
  if (TypeOf(field) == FieldType::Linked) slot = slot.subspan(std::min(slot.size(), kLinkedBlockBytes));
  return std::string(slot.begin(), slot.begin() + TextLength(slot));
}

int RecordForm::TextRoom(int field) const {
  const int cap = static_cast<int>(SlotOf(editing_, field).size());
  if (TypeOf(field) == FieldType::Linked) return cap - static_cast<int>(kLinkedBlockBytes) - 1;
  return std::max(cap - 1, 0);
}

bool RecordForm::SetText(int field, const std::string& text) {
  SetEditingText(editing_, field, text, schema());
  return static_cast<int>(text.size()) <= TextRoom(field);
}

uint8_t RecordForm::Byte(int field) const {
  auto slot = SlotOf(editing_, field);
  return slot.empty() ? 0 : slot[0];
}

void RecordForm::SetByte(int field, uint8_t value) { SetEditingByte(editing_, field, value, schema()); }

uint32_t RecordForm::Number(int field) const {
  auto slot = SlotOf(editing_, field);
  if (TypeOf(field) == FieldType::Integer) return static_cast<uint32_t>(ParseLong(Text(field)));
  return slot.size() >= 4 ? GetLE32(slot.data()) : 0;
}

void RecordForm::SetNumber(int field, uint32_t value) {
  SetEditingNumber(editing_, field, value, schema());
}

TimeBytes RecordForm::Time(int field) const {
  auto slot = SlotOf(editing_, field);
  if (slot.size() < 4) return TimeBytes{};
  return TimeBytes{slot[0], slot[1], slot[2], slot[3]};
}

void RecordForm::SetTime(int field, TimeBytes value) {
  auto slot = EditingSlot(editing_, field);
  if (slot.size() < 4) return;
  slot[0] = value.seconds;
  slot[1] = value.minutes;
  slot[2] = value.hours;
  slot[3] = value.reserved;
}

Bytes RecordForm::Image(int field) const {
  auto slot = SlotOf(editing_, field);
  if (slot.empty() || slot[0] == 0) return {};
  return Bytes(slot.begin(), slot.end());
}

void RecordForm::SetImage(int field, const Bytes& picture) {
  auto slot = EditingSlot(editing_, field);
  std::fill(slot.begin(), slot.end(), uint8_t{0});
  if (picture.empty() || picture[0] == 0) return;
  std::copy_n(picture.begin(), std::min(picture.size(), slot.size()), slot.begin());
}

std::string RecordForm::DisplayText(int field) const {
  Bytes value = EncodeSlot(schema().field[field], SlotOf(editing_, field));
  const ValueContext ctx{schema(), session_.db.popups(), session_.locale};
  return ValueTextOf(ctx, field, ByteView(value).subspan(2));
}

bool RecordForm::Modified(int field) const {
  auto a = SlotOf(editing_, field);
  auto b = SlotOf(baseline_, field);
  return !std::equal(a.begin(), a.end(), b.begin(), b.end());
}

std::array<bool, format::kFieldCount> RecordForm::ModifiedFields() const {
  std::array<bool, format::kFieldCount> m{};
  for (int f = 0; f < format::kFieldCount; ++f) m[f] = Modified(f);
  return m;
}

bool RecordForm::AnyModified() const {
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (Modified(f)) return true;
  }
  return false;
}

void RecordForm::PrepareForSave() {
  if (!isNew() && !AnyModified()) return;
  const Schema& s = schema();
  for (int f = 0; f < format::kFieldCount; ++f) {
    const FieldDef& def = s.field[f];
    switch (def.type()) {
      case FieldType::Unique:
      case FieldType::Link:
        if (isNew() && Number(f) == 0) SetNumber(f, session_.db.TakeUniqueNumber());
        break;
      case FieldType::Date:
        if (def.behavior == static_cast<uint8_t>(DateBehavior::Modified) ||
            (isNew() && def.behavior == static_cast<uint8_t>(DateBehavior::Added))) {
          SetNumber(f, TodayDayNumber(clock_));
        }
        break;
      case FieldType::Time:
        if (def.behavior == static_cast<uint8_t>(TimeBehavior::Modified) ||
            (isNew() && def.behavior == static_cast<uint8_t>(TimeBehavior::Added))) {
          SetTime(f, CurrentTime(clock_));
        }
        break;
      default:
        break;
    }
  }
}

Bytes RecordForm::Stored() const {
  if (isNew()) return Compact(editing_, schema());
  return SpliceRecord(original_, editing_, schema(), ModifiedFields());
}

}  // namespace cx
