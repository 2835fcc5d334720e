// The record listing shared by `records` and `linked`: every used field in
// display order, values as the list shows them.
#pragma once

#include <cstddef>
#include <vector>

#include "cli/command.h"
#include "engine/record_store.h"

namespace cx::cli {

// --json: [{"index": N, "fields": [{"slot", "name", "text", "value"}]}]
// with line breaks kept ("value" as WriteTypedValue gives it); otherwise a
// tab-separated table with a header row, the record's index first and
// one-line values.
void WriteRecords(Context& ctx, const Database& db, const std::vector<size_t>& rows);

}  // namespace cx::cli
