// Calculated fields: one operation on two operands, each from a field of
// the same record, a field of the previous record in view, or a constant.
// The result is stored in the record as text; passes over the database keep
// every result current after edits, moves, sorts and deletions.
#pragma once

#include <cstddef>
#include <functional>
#include <string>

#include "engine/record_store.h"
#include "ops/session.h"
#include "platform/locale_info.h"

namespace cx {

// The operations, in the order of the "Operation" list.
enum class CalcOperation : uint8_t { Add, Subtract, Multiply, Divide, Min, Max, Average };

// NeedsPrevRecord: 1 when some Calculated field has a "Prev Record" flag.
int NeedsPrevRecord(const Database& db);
bool HasCalculatedField(const Schema& schema);

// The operation on two values; "/" by 0 and unknown operations give 0.
double ApplyOperation(int operation, double a, double b);

// A field's value as an operand: numbers as stored, texts converted as
// decimal numbers, a time as seconds since midnight; 0 when the record has
// no slot for the field or the type has no number.
double FieldOperandValue(const Database& db, ByteView record, int field);

// The text stored for a result: printed with the result format's places in
// a field of 12, leading blanks removed, "," for "." when the decimal
// separator is not ".", and cut to the 14 characters a Calculated slot
// holds.
std::string CalcResultText(double value, uint8_t resultFormat, const LocaleInfo& locale);

// EvaluateField: computes Calculated field `field` of `record` (a working
// copy of record `index`), stores the text in it and sets the field's
// changed mark when the text differs from the stored one. 0, or -1 when the
// field is not Calculated.
int EvaluateField(DataSession& session, int field, Bytes& record, size_t index);

// RecalculateRecord: every Calculated field of record `index`, in display
// order, each once; the record is written back. 0, or -1 when there is no
// such record.
int RecalculateRecord(DataSession& session, size_t index);

// RecalculateFrom: the full pass from record `start` to the end (only over
// the records in view when a filter or link restriction is active), with
// the pending re-sort handled before or after it. 0, or -1 when the pass
// stopped early. Marks the database changed.
int RecalculateFrom(DataSession& session, size_t start);

// RecalculatePrevRecordFields: only the fields that use a previous-record
// operand, over the same records as the full pass, from the first.
int RecalculatePrevRecordFields(DataSession& session);

// RecalculateAfterMove: after a record was added, edited, moved or deleted
// (and after sorts and deletions, with 0 and 1): recalculates from the
// smaller index when the move matters to previous-record operands or a
// changed field reaches a Calculated field through one. 0 when nothing had
// to be done, else RecalculateFrom's result.
int RecalculateAfterMove(DataSession& session, size_t oldIndex, size_t newIndex);

// Runs `recalculate` (a recalculation pass, or steps that end with one)
// while the database is saved to its file on a second thread, each record
// written as soon as the pass is done with it: the file is the one that
// running it and then Database::Save() would give. The save's status.
Status RecalculateWhileSaving(DataSession& session, const std::function<void()>& recalculate,
                              const Clock& clock = DefaultClock());

}  // namespace cx
