#include "ops/calc.h"

#include <algorithm>
#include <array>
#include <vector>

#include "engine/byte_order.h"
#include "engine/value_text.h"
#include "ops/field_values.h"
#include "ops/sort.h"
#include "platform/run_beside.h"

namespace cx {
namespace {

// A Calculated slot holds 15 bytes in the editing form, the last forced to
// NUL: a result never keeps more characters than this.
constexpr size_t kResultChars = 14;

// How many records ahead a walk over the file asks memory for.
constexpr size_t kPrefetchRecords = 2;

// Where each slot of the record being worked on starts (FieldOffset of
// every slot up to the last one a pass uses), found in one walk and moved
// along when a slot is resized. A record's calculated fields read and write
// several slots each, and a walk from the first slot for every one of them
// took longer than the arithmetic.
class SlotIndex {
 public:
  void Build(ByteView record, int last = format::kFieldCount - 1) {
    last_ = last;
    size_t off = DataStart(record);
    int slot = 0;
    for (; slot <= last; ++slot) {
      if (off + 2 > record.size()) break;
      const uint16_t len = GetLE16(record.data() + off);
      if (len == format::kEndMark) break;
      offset_[slot] = static_cast<int>(off + 2);
      off += 2 + size_t{len};
    }
    for (; slot <= last; ++slot) offset_[slot] = -1;
  }
  // Only slots up to the `last` given to Build may be asked for.
  int Offset(int slot) const { return slot >= 0 && slot <= last_ ? offset_[slot] : -1; }
  // FieldValue(record, slot) of the record the index was built for.
  std::optional<ByteView> Value(ByteView record, int slot) const {
    const int off = Offset(slot);
    if (off < 0) return std::nullopt;
    const size_t len = GetLE16(record.data() + off - 2);
    const size_t avail = record.size() - static_cast<size_t>(off);
    return record.subspan(static_cast<size_t>(off), std::min(len, avail));
  }
  // Slot `slot` now takes `delta` bytes more: the slots after it moved by
  // as much.
  void Resized(int slot, std::ptrdiff_t delta) {
    for (int s = slot + 1; s <= last_; ++s) {
      if (offset_[s] >= 0) offset_[s] += static_cast<int>(delta);
    }
  }

 private:
  std::array<int, format::kFieldCount> offset_{};
  int last_ = -1;
};

// A Calculated field with what is the same for every record worked out
// once: its operands, their constants as numbers and its result format.
struct PlannedField {
  int field = -1;
  uint8_t operation = 0;
  uint8_t resultFormat = 0;
  std::array<CalcOperand, 2> operand;
  std::array<double, 2> constant{};
};

PlannedField Plan(const Schema& schema, int field) {
  const FieldDef& def = schema.field[field];
  PlannedField plan;
  plan.field = field;
  plan.operation = def.calcOperation;
  plan.resultFormat = def.resultFormat();
  plan.operand = {CalcOperand1(def), CalcOperand2(def)};
  if (!plan.operand[0].IsField()) plan.constant[0] = ParseDouble(def.Constant1());
  if (!plan.operand[1].IsField()) plan.constant[1] = ParseDouble(def.Constant2());
  return plan;
}

// What one pass needs besides the session: the view test prepared once and
// the fields to evaluate, in display order.
struct Pass {
  DataSession& session;
  ViewTester tester;
  std::vector<PlannedField> fields;
  // The last slot any of the fields reads or writes.
  int lastSlot = -1;
  // The record being worked on, kept between records so that a walk over
  // the whole file does not allocate for each one, and its slots.
  mutable Bytes work;
  mutable SlotIndex slots;
  // The record a walk finished last and its slots, for the fields that
  // read the previous record: after a sort its bytes lie far away.
  mutable size_t previous = SIZE_MAX;
  mutable SlotIndex previousSlots;
  // Told how far a walk got, when a save writes the records meanwhile.
  RecordsReady* ready = nullptr;

  Pass(DataSession& s, bool onlyPrevRecordFields) : session(s), tester(s.db, s.Link()) {
    const Schema& schema = s.db.schema();
    std::array<bool, format::kFieldCount> done{};
    for (uint8_t f : schema.fieldOrder) {
      if (f >= format::kFieldCount || done[f] || !IsCalculated(schema, f)) continue;
      done[f] = true;
      if (onlyPrevRecordFields && (schema.field[f].calcFlags & 3) == 0) continue;
      fields.push_back(Plan(schema, f));
      lastSlot = std::max(lastSlot, int{f});
      for (const CalcOperand& op : fields.back().operand) {
        if (op.IsField() && op.field < format::kFieldCount) lastSlot = std::max(lastSlot, op.field);
      }
    }
  }
};

// Replaces the value of slot `field` of a stored record with `text` and its
// NUL. A record that ends before the slot is first brought to its full
// stored form, as writing it from the editor would.
void StoreSlotText(Bytes& record, int field, std::string_view text, const Schema& schema,
                   SlotIndex* index = nullptr) {
  int at = index ? index->Offset(field) : FieldOffset(field, record);
  if (at < 0) {
    record = Compact(Expand(record, schema), schema);
    at = FieldOffset(field, record);
    if (index) index->Build(record);
    if (at < 0) return;
  }
  const size_t start = static_cast<size_t>(at) - 2;
  const size_t oldEnd = std::min(record.size(), static_cast<size_t>(at) + GetLE16(record.data() + start));
  // The slot is resized where it lies and then overwritten: no second
  // buffer for a value that is replaced in nearly every record.
  const size_t oldSize = oldEnd - start;
  const size_t newSize = 2 + text.size() + 1;
  if (newSize > oldSize) {
    record.insert(record.begin() + static_cast<std::ptrdiff_t>(oldEnd), newSize - oldSize, uint8_t{0});
  } else if (newSize < oldSize) {
    record.erase(record.begin() + static_cast<std::ptrdiff_t>(start + newSize),
                 record.begin() + static_cast<std::ptrdiff_t>(oldEnd));
  }
  uint8_t* slot = record.data() + start;
  PutLE16(slot, static_cast<uint16_t>(text.size() + 1));
  std::copy(text.begin(), text.end(), slot + 2);
  slot[2 + text.size()] = 0;
  // A value that ran past the record's end had no slots after it, and
  // still has none: moving them along is right in either case.
  if (index) index->Resized(field, static_cast<std::ptrdiff_t>(newSize) - static_cast<std::ptrdiff_t>(oldSize));
}

double OperandOf(const Database& db, std::optional<ByteView> value, int field);

double Operand(const Pass& pass, const PlannedField& plan, int which, ByteView record,
               const SlotIndex& slots, size_t index) {
  const CalcOperand& op = plan.operand[which];
  if (!op.IsField()) return plan.constant[which];
  const Database& db = pass.session.db;
  if (op.fromPrevious) {
    size_t p = index;
    while (p > 0) {
      --p;
      if (!pass.tester.InView(p)) continue;
      if (p == pass.previous) return OperandOf(db, pass.previousSlots.Value(db.record(p), op.field), op.field);
      return FieldOperandValue(db, db.record(p), op.field);
    }
    return 0.0;
  }
  return OperandOf(db, slots.Value(record, op.field), op.field);
}

// `slots` indexes `record` and is kept up to date with it.
void Evaluate(const Pass& pass, const PlannedField& plan, Bytes& record, SlotIndex& slots, size_t index) {
  DataSession& s = pass.session;
  const double a = Operand(pass, plan, 0, record, slots, index);
  const double b = Operand(pass, plan, 1, record, slots, index);
  const std::string text = CalcResultText(ApplyOperation(plan.operation, a, b), plan.resultFormat, s.locale);

  std::optional<ByteView> old = slots.Value(record, plan.field);
  // Nearly every result is the one stored: that needs no closer look.
  if (old && old->size() == text.size() + 1 && std::equal(text.begin(), text.end(), old->begin()) &&
      (*old)[text.size()] == 0) {
    return;
  }
  if (!old || ValueView(*old) != text) s.calc.fieldChanged[plan.field] = 1;
  StoreSlotText(record, plan.field, text, s.db.schema(), &slots);
}

// `arena`, when given, holds the replaced records of a pass over many.
int RecalculateWith(const Pass& pass, size_t index, RecordArena* arena = nullptr) {
  Database& db = pass.session.db;
  if (index >= db.recordCount()) return -1;
  ByteView stored = db.record(index);
  Bytes& work = pass.work;
  work.assign(stored.begin(), stored.end());
  pass.slots.Build(work, pass.lastSlot);
  for (const PlannedField& plan : pass.fields) Evaluate(pass, plan, work, pass.slots, index);
  if (!std::equal(work.begin(), work.end(), stored.begin(), stored.end())) {
    if (arena) {
      db.ReplaceRecord(index, ByteView(work), *arena);
    } else {
      db.ReplaceRecord(index, ByteView(work));
    }
  }
  // The record now holds exactly `work`, which the slots index.
  pass.previous = index;
  pass.previousSlots = pass.slots;
  return 0;
}

// How many records a walk finishes between two reports to a save.
constexpr size_t kReadyStep = 512;

// Every record from `start` on, or only those in view when the view is
// restricted. Stops at the first failure.
int Walk(const Pass& pass, size_t start) {
  const bool restricted = pass.tester.Restricted();
  RecordArena arena;
  const Database& db = pass.session.db;
  if (pass.ready) pass.ready->Advance(start);
  for (size_t i = start; i < db.recordCount(); ++i) {
    if (pass.ready && i > start && (i - start) % kReadyStep == 0) pass.ready->Advance(i);
    // After a sort the records lie scattered over the file read in: ask
    // for the next ones while this one is worked on, or the walk spends
    // its time waiting for memory.
    for (size_t ahead = i + 1; ahead <= i + kPrefetchRecords && ahead < db.recordCount(); ++ahead) {
      const ByteView next = db.record(ahead);
      for (size_t at = 0; at < next.size(); at += 64) __builtin_prefetch(next.data() + at);
    }
    if (restricted && !pass.tester.InView(i)) continue;
    if (RecalculateWith(pass, i, &arena) != 0) return -1;
  }
  if (pass.ready) pass.ready->Advance(db.recordCount());
  return 0;
}

bool SortKeyIsCalculated(const Schema& schema) {
  return std::any_of(schema.sortKey.begin(), schema.sortKey.end(),
                     [&](const SortKey& k) { return IsCalculated(schema, k.Field()); });
}

// Whether field `f` is a Calculated field that takes a changed field's value
// from the previous record, directly or through the fields it uses.
bool ReachesChangedThroughPrev(const Schema& schema, const RecalcState& calc, int f,
                               std::array<bool, format::kFieldCount>& visited) {
  if (f < 0 || f >= format::kFieldCount || visited[f]) return false;
  visited[f] = true;
  if (!IsCalculated(schema, f)) return false;
  const FieldDef& def = schema.field[f];
  const CalcOperand ops[2] = {CalcOperand1(def), CalcOperand2(def)};
  for (const CalcOperand& op : ops) {
    if (op.fromPrevious && op.field < format::kFieldCount && calc.fieldChanged[op.field]) return true;
  }
  for (const CalcOperand& op : ops) {
    if (op.IsField() && op.field != f && !op.fromPrevious &&
        ReachesChangedThroughPrev(schema, calc, op.field, visited)) {
      return true;
    }
  }
  return false;
}

}  // namespace

int NeedsPrevRecord(const Database& db) {
  const Schema& schema = db.schema();
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (IsCalculated(schema, f) && (schema.field[f].calcFlags & 3) != 0) return 1;
  }
  return 0;
}

bool HasCalculatedField(const Schema& schema) {
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (IsCalculated(schema, f)) return true;
  }
  return false;
}

double ApplyOperation(int operation, double a, double b) {
  switch (static_cast<CalcOperation>(operation)) {
    case CalcOperation::Add: return a + b;
    case CalcOperation::Subtract: return a - b;
    case CalcOperation::Multiply: return a * b;
    case CalcOperation::Divide: return b == 0 ? 0.0 : a / b;
    case CalcOperation::Min: return a > b ? b : a;
    case CalcOperation::Max: return b > a ? b : a;
    case CalcOperation::Average: return (a + b) * 0.5;
  }
  return 0.0;
}

double FieldOperandValue(const Database& db, ByteView record, int field) {
  return OperandOf(db, FieldValue(record, field), field);
}

namespace {

double OperandOf(const Database& db, std::optional<ByteView> value, int field) {
  if (!value) return 0.0;
  switch (db.schema().field[field].type()) {
    case FieldType::Text:
    case FieldType::Float:
    case FieldType::Note:
    case FieldType::DBPopup:
    case FieldType::Calculated:
      return ParseDouble(ValueView(*value));  // an empty text reads as 0
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Date:
      return static_cast<int32_t>(ValueNumber(*value));
    case FieldType::PopUp:
      return value->empty() ? 0 : (*value)[0];
    case FieldType::CheckBox:
      return !value->empty() && (*value)[0] != 0 ? 1 : 0;
    case FieldType::Time: {
      const uint32_t t = Time24(*value);
      return static_cast<double>(TimeSeconds(t & 0xFF, (t >> 8) & 0xFF, (t >> 16) & 0xFF));
    }
    case FieldType::Linked: {
      std::optional<std::string_view> text = LinkedText(*value);
      return text ? ParseDouble(*text) : 0.0;
    }
    default:
      return 0.0;
  }
}

}  // namespace

std::string CalcResultText(double value, uint8_t resultFormat, const LocaleInfo& locale) {
  std::string text = DecimalText(value, ResultPlaces(resultFormat), locale);
  if (text.size() > kResultChars) text.resize(kResultChars);
  return text;
}

int EvaluateField(DataSession& session, int field, Bytes& record, size_t index) {
  if (!IsCalculated(session.db.schema(), field)) return -1;
  Pass pass(session, false);
  SlotIndex slots;
  slots.Build(record);
  Evaluate(pass, Plan(session.db.schema(), field), record, slots, index);
  return 0;
}

int RecalculateRecord(DataSession& session, size_t index) {
  return RecalculateWith(Pass(session, false), index);
}

int RecalculatePrevRecordFields(DataSession& session) {
  return Walk(Pass(session, true), 0);
}

int RecalculateFrom(DataSession& session, size_t start) {
  Database& db = session.db;
  RecalcState& calc = session.calc;
  auto finish = [&](int result) {
    calc.busy = false;
    db.MarkChanged();
    session.ui.SetBusy(false);
    return result;
  };
  session.ui.SetBusy(true);
  calc.busy = true;
  session.ui.Status("Recalculating Fields");
  if (!HasCalculatedField(db.schema())) return finish(0);

  if (SortKeyIsCalculated(db.schema())) {
    calc.resortPending = true;
  } else if (calc.resortPending) {
    session.ui.Status("Resorting...");
    SortAll(db);
    calc.resortPending = false;
    start = 0;
  }

  session.ui.Status("Recalculating Fields...");
  Pass pass(session, false);
  // Records that a sort after the walk moves again are not final yet.
  if (!calc.resortPending) pass.ready = session.savingAlong;
  if (Walk(pass, start) != 0) return finish(-1);

  if (calc.resortPending) {
    SortAll(db);
    calc.resortPending = false;
    if (NeedsPrevRecord(db)) {
      session.ui.Status("Recalculating Previous Record Calculations...");
      RecalculatePrevRecordFields(session);
    }
  }
  return finish(0);
}

int RecalculateAfterMove(DataSession& session, size_t oldIndex, size_t newIndex) {
  const size_t from = std::min(oldIndex, newIndex);
  if (oldIndex != newIndex && NeedsPrevRecord(session.db)) return RecalculateFrom(session, from);
  std::array<bool, format::kFieldCount> visited{};
  for (int f = 0; f < format::kFieldCount; ++f) {
    if (ReachesChangedThroughPrev(session.db.schema(), session.calc, f, visited)) {
      return RecalculateFrom(session, from);
    }
  }
  return 0;
}

Status RecalculateWhileSaving(DataSession& session, const std::function<void()>& recalculate,
                              const Clock& clock) {
  RecordsReady ready;
  Status saved;
  // Without a second thread the save comes after the recalculation, which
  // has then told it everything is final.
  RunBeside([&] { saved = session.db.SaveAlong(ready, clock); },
            [&] {
              session.savingAlong = &ready;
              recalculate();
              session.savingAlong = nullptr;
              ready.Finish();
            });
  return saved;
}

}  // namespace cx
