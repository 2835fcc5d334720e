// The read-only query of `records`: conditions and sort keys written as
// `filter` and `sort` take them, worked out on the records in memory. The
// file's stored settings are changed only in the copy read, never saved.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "cli/command.h"
#include "engine/record_store.h"
#include "ops/filter_dialog.h"

namespace cx::cli {

// COND is FIELD=VALUE; a field name may itself hold "=", so each "=" is
// tried until the text before it names a field. False with `error` set.
bool ReadFilterCondition(const Context& ctx, const Database& db, const std::string& cond,
                         FilterDialogFilter& f, std::string& error);

// The records (indexes into `db`) that pass every condition, ordered by the
// keys, ties in table order. No conditions: every record; no keys: table
// order. False after the message (usage errors return with `usage` set).
bool QueryRows(Context& ctx, Database& db, const std::vector<std::string>& conditions,
               const std::vector<std::string>& keys, std::vector<size_t>& rows, std::string& usage);

}  // namespace cx::cli
