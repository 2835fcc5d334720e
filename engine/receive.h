// Adding a record that arrived from outside (beamed) to a database that may
// be the one on screen, open but not shown, or not open at all.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "platform/ui_port.h"

namespace cx {

// The databases the program has open: the "program-wide" table, passed in.
struct OpenDatabases {
  std::vector<Database*> open;  // every open database, any order
  Database* active = nullptr;   // the one on screen, if any
  std::string dataFolder;       // where received records' databases live
};

// What the layers above the engine contribute to a receive. The two access
// checks have no default: a receiver that let everything through would
// write into databases their owner has closed to additions.
class ReceiveHooks {
 public:
  virtual ~ReceiveHooks() = default;
  // The "Add Records" access check on a database (open, or just loaded).
  virtual bool AllowAdd(Database& db, UiPort& ui) = 0;
  // The "Open Database" access check on a database file about to be loaded.
  virtual bool AllowOpen(const std::string& path, UiPort& ui) = 0;
  // Where a new record goes (its sorted place); the end by default.
  virtual size_t InsertionPlace(const Database& db, ByteView record) {
    (void)record;
    return db.recordCount();
  }
  // The database on screen got a record at `position`: recalculate or
  // re-sort, and refresh the list.
  virtual void AfterInsertActive(Database& db, size_t position) { (void)db, (void)position; }
};

// True when a Calculated field takes a value from the previous record.
bool UsesPreviousRecord(const Schema& schema);

// ReceiveRecord: inserts the record held in `recordFile` into the database
// file `fileName` (a name in the data folder). Messages go through `ui`;
// false on failure, with the target unchanged.
bool ReceiveRecord(const std::string& fileName, const std::string& recordFile, OpenDatabases& dbs,
                   UiPort& ui, ReceiveHooks& hooks);
// The same for record bytes already in memory.
bool ReceiveRecordBytes(const std::string& fileName, Bytes record, OpenDatabases& dbs, UiPort& ui,
                        ReceiveHooks& hooks);
// Several records for one database: the access checks are made once, and a
// database that is not open is loaded and saved once. Returns how many were
// inserted (in order, until the database is full); 0 with the target
// unchanged when a check refuses or the database cannot be opened or saved.
size_t ReceiveRecordsBytes(const std::string& fileName, std::vector<Bytes> records,
                           OpenDatabases& dbs, UiPort& ui, ReceiveHooks& hooks);

}  // namespace cx
