#include "ops/open_database.h"

#include "ops/calc.h"
#include "ops/sort.h"

namespace cx {

PendingWork RunPendingWork(DataSession& session) {
  Database& db = session.db;
  Schema& schema = db.schema();
  if (schema.recalcFrom != 0) {
    const long start = static_cast<long>(schema.recalcFrom) - format::kFirstDataRecord;
    schema.recalcFrom = 0;
    db.MarkChanged();
    if (start < static_cast<long>(db.recordCount())) {
      RecalculateFrom(session, start < 0 ? 0 : static_cast<size_t>(start));
      return PendingWork::Recalculated;
    }
  }
  if (schema.resortPending != 0) {
    SortAll(session, false);
    RecalculateFrom(session, 0);
    schema.resortPending = 0;
    db.MarkChanged();
    return PendingWork::Resorted;
  }
  return PendingWork::None;
}

Status OpenDatabase(DataSession& session, const std::string& path, FileBuffer::Access access,
                    const Database::Admission& admit) {
  Status status = session.db.Open(path, session.ui, access, admit);
  if (!status) return status;
  session.calc = RecalcState{};
  session.found = FindHit{};
  RunPendingWork(session);
  session.view = RebuildView(session.db, session.Link());
  return status;
}

}  // namespace cx
