// The record editor's model, without widgets: which fields the form shows
// and how it is laid out, the values of one record as the controls show
// and collect them, and the stored bytes that result. The record is edited
// in its full-capacity form; only the slots the user actually changed are
// re-encoded, so everything else comes back byte for byte as it was read
// (also values another program laid out differently).
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "engine/record.h"
#include "engine/schema.h"
#include "ops/session.h"
#include "platform/clock.h"

namespace cx {

inline constexpr size_t kNewRecordIndex = 65000;

// --- Layout ----------------------------------------------------------------

// Pixels a row of this type adds to the form (0 for types without a row).
int EditorRowHeight(FieldType type);
// True when the field gets a row: a used type whose "Visible" flag is on.
bool ShownInEditor(const FieldDef& field);
// The shown fields in display order.
std::vector<int> EditorFields(const Schema& schema);

struct FormLayout {
  int labelWidth = 0;  // L = width x (80 + A) / 160
  int valueWidth = 0;  // width - L - 3
  int height = 15;     // 15 plus every row's height
  std::vector<int> fields;
};
FormLayout LayoutForm(const Schema& schema, int clientWidth);

// The label-width adjustment A kept with the database, and its bounds.
inline constexpr int kMaxLabelAdjustment = 78;
inline constexpr int kMinLabelAdjustment = -70;
inline constexpr int kLabelAdjustmentStep = 8;
int LabelAdjustment(const Schema& schema);
// "Increase Field Width" (+8, at most 78) / "Decrease Field Width" (-8, at
// least -70). The database is marked changed when A moved; false when it
// stood at its bound already.
bool IncreaseFieldWidth(Database& db);
bool DecreaseFieldWidth(Database& db);

// --- Values ----------------------------------------------------------------

struct TimeBytes {
  uint8_t seconds = 0;
  uint8_t minutes = 0;
  uint8_t hours = format::kNoTimeHours;
  uint8_t reserved = 0;
  bool none() const { return hours == format::kNoTimeHours; }
  bool operator==(const TimeBytes&) const = default;
};

// Date "Behavior" entries and time "Behavior" entries, by index.
enum class DateBehavior { AskUser = 0, Added = 1, Modified = 2, Current = 3 };
enum class TimeBehavior { AskUser = 0, Added = 1, Modified = 2 };

// The local date and time of a clock.
uint32_t TodayDayNumber(const Clock& clock);
TimeBytes CurrentTime(const Clock& clock);

class RecordForm {
 public:
  // The form on record `index` of the session's database, or on a new
  // record when `index` is kNewRecordIndex (defaults filled in: the Pop-Up
  // default entry, "Current Date" dates). `source` starts a new record from
  // a copy of another record's values ("Copy Record To New").
  RecordForm(DataSession& session, size_t index, const Clock& clock,
             std::optional<size_t> copyFrom = std::nullopt);

  bool isNew() const { return index_ == kNewRecordIndex; }
  size_t index() const { return index_; }
  const Schema& schema() const { return session_.db.schema(); }
  DataSession& session() { return session_; }
  const std::vector<int>& fields() const { return fields_; }
  FieldType TypeOf(int field) const { return schema().field[field].type(); }

  // Text, Note, DB Popup, Float and Integer (its decimal text), and the
  // text part of a Linked value. Set cuts to the slot's room and returns
  // false when it had to cut.
  std::string Text(int field) const;
  bool SetText(int field, const std::string& text);
  // Room for text in the slot (characters, without the NUL).
  int TextRoom(int field) const;

  uint8_t Byte(int field) const;  // Pop-Up entry, Check-Box byte
  void SetByte(int field, uint8_t value);
  uint32_t Number(int field) const;  // Unique, Link, Date, Linked's number
  void SetNumber(int field, uint32_t value);
  TimeBytes Time(int field) const;
  void SetTime(int field, TimeBytes value);
  // The 2001 picture bytes, or empty when the field holds no picture.
  Bytes Image(int field) const;
  // A picture (2001 bytes, first byte nonzero) or empty for none.
  void SetImage(int field, const Bytes& picture);

  // The value text as the list would show it, of the value as now edited
  // (Unique, Link, Linked, Calculated rows show this).
  std::string DisplayText(int field) const;

  bool Modified(int field) const;
  bool AnyModified() const;
  std::array<bool, format::kFieldCount> ModifiedFields() const;

  // The stored record the edits make: the original bytes with the changed
  // slots re-encoded. Behaviours that fill a value on saving ("Date/Time
  // Record Modified", "Added" for a new record) and the unique numbers of a
  // new record are applied by PrepareForSave first.
  Bytes Stored() const;
  void PrepareForSave();

  const Bytes& editing() const { return editing_; }

 private:
  DataSession& session_;
  const Clock& clock_;
  size_t index_;
  Bytes original_;   // stored form as read (empty for a new record)
  Bytes baseline_;   // editing form of the original
  Bytes editing_;
  std::vector<int> fields_;
};

// The slot's value in stored form (length bytes first), encoded from an
// editing record as the compaction does.
Bytes EncodeSlot(const FieldDef& field, std::span<const uint8_t> capacityBytes);

// A stored record whose slots in `replace` are taken from `editing` and
// all others kept from `original` as they were.
Bytes SpliceRecord(ByteView original, ByteView editing, const Schema& schema,
                   const std::array<bool, format::kFieldCount>& replace);

}  // namespace cx
