// Opening a database for use: the engine's open, then the work the file
// says is still owed (records that arrived while the database was not on
// screen may need a recalculation or a re-sort), then the view list.
#pragma once

#include <string>

#include "ops/session.h"
#include "platform/status.h"

namespace cx {

enum class PendingWork { None, Recalculated, Resorted };

// RunPendingWork: when `recalcFrom` is set and data record recalcFrom - 31
// still exists (a value from 1 to 31, as receiving writes it, means the
// first record), recalculates from there; a `recalcFrom` past the last
// record is invalid and only cleared. Otherwise, when `resortPending` is
// set, sorts, recalculates everything and clears it. Each mark that was
// acted on is cleared and the database marked changed. A file with both
// marks set keeps `resortPending` for its next opening.
PendingWork RunPendingWork(DataSession& session);

// OpenDatabase: Database::Open of `path` into the session's database
// (messages through the session's port), then RunPendingWork and the view.
// On failure the database is unchanged. `access` as FileBuffer::Read;
// `admit`, when given, as Database::Open takes it.
Status OpenDatabase(DataSession& session, const std::string& path,
                    FileBuffer::Access access = FileBuffer::Access::kCopy,
                    const Database::Admission& admit = {});

}  // namespace cx
