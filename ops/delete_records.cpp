#include "ops/delete_records.h"

#include <algorithm>

#include "ops/calc.h"
#include "ops/links.h"

namespace cx {

size_t DeleteRecords(DataSession& session, DeleteScope scope, LinkedRecordDeleter* alsoLinked) {
  Database& db = session.db;
  ViewTester tester(db, session.Link());
  // Whether a record is in view depends on it alone, so deciding for every
  // record first and closing the table up once deletes the same records as
  // deleting them one by one, without moving the table once per record.
  std::vector<bool> doomed(db.recordCount(), false);
  size_t deleted = 0;
  for (size_t i = 0; i < db.recordCount(); ++i) {
    const bool inView = scope == DeleteScope::All || tester.InView(i);
    const bool remove = scope == DeleteScope::All ||
                        (scope == DeleteScope::WithinFilterRange ? inView : !inView);
    if (!remove) continue;
    if (alsoLinked) alsoLinked->DeleteLinkedTo(db, i);
    doomed[i] = true;
    ++deleted;
  }
  if (deleted > 0) {
    RecordTable& table = db.table();
    size_t keep = 0;
    for (size_t i = 0; i < table.size(); ++i) {
      if (!doomed[i]) table[keep++] = std::move(table[i]);
    }
    table.resize(keep);
    db.MarkChanged();
  }
  RecalculateAfterMove(session, 0, 1);
  session.view = RebuildView(db, session.Link());
  return deleted;
}

size_t DeleteRecordsCommand(DataSession& session, DeleteScope scope, LinkedRecordDeleter* linked) {
  bool alsoLinked = false;
  if (linked && HasLinkFields(session.db)) {
    alsoLinked = session.ui.AskYesNo(link_messages::kDeleteLinkedQuestion, "QUESTION");
  }
  return DeleteRecords(session, scope, alsoLinked ? linked : nullptr);
}

}  // namespace cx
