#include "engine/receive.h"

#include "engine/database_folder.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"

namespace cx {
namespace {

constexpr const char* kNotFound =
    "Database %s not found on device, and must be present to receive records.";
constexpr const char* kCannotOpen = "Unable to open Database to insert record!";

// The file in the data folder whose name is `name`, compared exactly.
std::string FindInDataFolder(const std::string& folder, const std::string& name) {
  for (const std::string& file : ListFiles(folder)) {
    if (file == name) return DatabasePath(folder, file);
  }
  return "";
}

void MarkPending(Database& db) {
  Schema& s = db.schema();
  if (UsesPreviousRecord(s)) s.recalcFrom = 1;
  for (int k = 0; k < 2; ++k) {
    int field = s.sortKey[k].Field();
    if (field >= 0 && field < format::kFieldCount) s.resortPending = 1;
  }
}

}  // namespace

bool UsesPreviousRecord(const Schema& schema) {
  for (const FieldDef& f : schema.field) {
    if (f.type() == FieldType::Calculated && (f.calcFlags & 3) != 0) return true;
  }
  return false;
}

bool ReceiveRecord(const std::string& fileName, const std::string& recordFile, OpenDatabases& dbs,
                   UiPort& ui, ReceiveHooks& hooks) {
  Bytes record;
  if (!ReadWholeFile(recordFile, record)) return false;
  return ReceiveRecordBytes(fileName, std::move(record), dbs, ui, hooks);
}

bool ReceiveRecordBytes(const std::string& fileName, Bytes record, OpenDatabases& dbs, UiPort& ui,
                        ReceiveHooks& hooks) {
  std::vector<Bytes> one;
  one.push_back(std::move(record));
  return ReceiveRecordsBytes(fileName, std::move(one), dbs, ui, hooks) == 1;
}

size_t ReceiveRecordsBytes(const std::string& fileName, std::vector<Bytes> records,
                           OpenDatabases& dbs, UiPort& ui, ReceiveHooks& hooks) {
  if (records.empty()) return 0;
  const std::string name = FileNamePart(DatabasePath(dbs.dataFolder, fileName));

  std::string path;
  if (dbs.active && FileNamePart(dbs.active->path()) == name) {
    path = dbs.active->path();
  } else {
    path = FindInDataFolder(dbs.dataFolder, name);
  }
  if (path.empty()) {
    ui.ShowMessage(FormatMessage(kNotFound, name), "Update", MessageIcon::Information);
    return 0;
  }

  Database* open = nullptr;
  for (Database* db : dbs.open) {
    if (db && db->path() == path) open = db;
  }
  if (open) {
    if (!hooks.AllowAdd(*open, ui)) return 0;
    size_t inserted = 0;
    for (Bytes& record : records) {
      if (!open->CanAddRecord()) break;
      size_t position = hooks.InsertionPlace(*open, record);
      open->InsertRecord(position, std::move(record));
      if (open == dbs.active) hooks.AfterInsertActive(*open, position);
      ++inserted;
    }
    if (inserted > 0 && open != dbs.active) MarkPending(*open);
    return inserted;
  }

  if (!hooks.AllowOpen(path, ui)) return 0;
  Database db;
  if (!db.Open(path, ui).ok() || db.partial()) {
    ui.ShowMessage(kCannotOpen, "ERROR", MessageIcon::Error);
    return 0;
  }
  if (!hooks.AllowAdd(db, ui)) return 0;
  size_t inserted = 0;
  for (Bytes& record : records) {
    if (!db.CanAddRecord()) break;
    db.InsertRecord(hooks.InsertionPlace(db, record), std::move(record));
    ++inserted;
  }
  if (inserted == 0) return 0;
  MarkPending(db);
  Status saved = db.Save();
  if (!saved) {
    ui.ShowMessage(saved.message(), "ERROR", MessageIcon::Error);
    return 0;
  }
  return inserted;
}

}  // namespace cx
