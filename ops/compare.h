// Record comparison on the sort keys. These read the records' slots on
// every call; SortAll uses a precomputed form (ops/sort_keys.h) that gives
// the same results.
#pragma once

#include "engine/record_store.h"

namespace cx {

// CompareByField: negative, 0 or positive for record `a` against record `b`
// on one key. A record without a slot for the field compares lower (A
// first, then B, whatever the direction); otherwise the type's rule
// applies, with `direction` 0 ("Reverse") swapping the two operands and
// any other value meaning "Forward".
int CompareByField(const Database& db, ByteView a, ByteView b, int field, int direction);

// CompareRecords: over the three sort keys of the schema, a key of -1
// ending the list. 0 when either record has no bytes.
int CompareRecords(const Database& db, ByteView a, ByteView b);

// The comparison used to place one record among the others: every key
// that is set counts in turn, keys of -1 are skipped (not ending the list).
int ComparePlacement(const Database& db, ByteView a, ByteView b);

}  // namespace cx
