#include "infrared/receive_store.h"

#include "engine/database_folder.h"
#include "engine/format.h"
#include "engine/record.h"
#include "infrared/obex_format.h"
#include "infrared/received_name.h"
#include "infrared/record_set.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"

namespace cx::obex {
namespace {

constexpr char kAskDatabase[] = "Receive the database %s?";
constexpr char kAskReplace[] = "A database named %s already exists. Replace it with the one received?";
constexpr char kAskRecord[] = "Insert the received record into %s?";
constexpr char kAskRecords[] = "Insert %d received records into %s?";
constexpr char kNotDatabase[] = "The received file %s is not a Cardovex database.";
constexpr char kCloseFirst[] = "Close %s before receiving a new copy of it.";
constexpr char kCannotStore[] = "Unable to store the received database %s.";
constexpr char kAppeared[] =
    "A database named %s was stored while you were asked; the received one was not stored.";
constexpr char kQuestion[] = "QUESTION";

// Names go into messages as the engine's texts are: Windows-1252.
std::string Shown(const char* pattern, const std::string& utf8Name) {
  return FormatMessage(pattern, Utf8ToCp1252(utf8Name));
}

// The bytes must open as the program opens a file, whole: a creator code
// alone says nothing about the rest, and what is stored here may replace a
// good database.
bool OpensWhole(const std::string& path, const Bytes& body) {
  if (body.size() < format::kHeaderSize || DecodeHeader(body.data()).creator != format::kCreator) {
    return false;
  }
  SilentUi quiet;
  Database db;
  return db.OpenBytes(path, std::make_shared<const Bytes>(body), quiet).ok() && !db.partial();
}

}  // namespace

PayloadKind KindOf(const ReceivedObject& object) {
  std::string name = SafeFileName(object.name);
  if (HasExtension(name, ".cxr")) return PayloadKind::kRecord;
  if (HasExtension(name, ".cxm")) return PayloadKind::kRecordSet;
  if (HasExtension(name, ".PDB") || object.creator == kDatabaseCreator) return PayloadKind::kDatabase;
  return PayloadKind::kOther;
}

std::string TargetDatabase(const ReceivedObject& object) {
  std::string described = SafeFileName(object.description);
  if (HasExtension(described, ".PDB")) return described;
  std::string stem = StemOf(SafeFileName(object.name));
  return stem.empty() ? "" : stem + ".PDB";
}

ReceiveStore::ReceiveStore(OpenDatabases& dbs, UiPort& ui, ReceiveHooks& hooks,
                           std::function<void(const std::string&)> report)
    : dbs_(dbs), ui_(ui), hooks_(hooks), report_(std::move(report)) {}

uint8_t ReceiveStore::Outcome(uint8_t code, const std::string& line) {
  if (report_) report_(line);
  return code;
}

uint8_t ReceiveStore::Deliver(ReceivedObject& object) {
  PayloadKind kind = KindOf(object);
  switch (kind) {
    case PayloadKind::kDatabase:
      return StoreDatabase(object);
    case PayloadKind::kRecord:
    case PayloadKind::kRecordSet:
      return InsertRecords(object, kind);
    case PayloadKind::kOther:
      break;
  }
  return Outcome(kUnsupportedType, "Refused " + object.name + ": not a database or records");
}

uint8_t ReceiveStore::StoreDatabase(const ReceivedObject& object) {
  std::string name = SafeFileName(object.name);
  if (name.empty()) return Outcome(kBadRequest, "Refused a database with an unusable name");
  if (!HasExtension(name, ".PDB")) name += ".PDB";
  const std::string path = DatabasePath(dbs_.dataFolder, name);
  if (!OpensWhole(path, object.body)) {
    ui_.ShowMessage(Shown(kNotDatabase, name), "Error", MessageIcon::Error);
    return Outcome(kUnsupportedType, "Refused " + name + ": not a readable Cardovex database");
  }
  for (const Database* db : dbs_.open) {
    if (db && db->path() == path) {
      ui_.ShowMessage(Shown(kCloseFirst, name), "Error", MessageIcon::Error);
      return Outcome(kForbidden, "Refused " + name + ": it is open");
    }
  }
  bool exists = FileExists(path);
  if (!ui_.AskYesNo(Shown(exists ? kAskReplace : kAskDatabase, name), kQuestion)) {
    return Outcome(kForbidden, "Declined " + name);
  }
  // A file that appeared while the question was open was never asked about.
  if (!exists && FileExists(path)) {
    ui_.ShowMessage(Shown(kAppeared, name), "Error", MessageIcon::Error);
    return Outcome(kConflict, "Refused " + name + ": a database of that name appeared meanwhile");
  }
  MakeDirectories(dbs_.dataFolder);
  SafeFileWriter writer(path);
  Status status = writer.Open();
  if (status) {
    writer.Write(object.body.data(), object.body.size());
    status = writer.Commit();
  }
  if (!status) {
    ui_.ShowMessage(Shown(kCannotStore, name) + "\n" + status.message(), "Error",
                    MessageIcon::Error);
    return Outcome(kInternalError, "Could not store " + name);
  }
  return Outcome(kSuccess, (exists ? "Replaced " : "Stored ") + name);
}

uint8_t ReceiveStore::InsertRecords(const ReceivedObject& object, PayloadKind kind) {
  const std::string target = TargetDatabase(object);
  if (target.empty()) return Outcome(kBadRequest, "Refused records with an unusable name");
  std::vector<Bytes> records;
  if (kind == PayloadKind::kRecord) {
    records.push_back(object.body);
  } else if (!UnpackRecordSet(object.body, records)) {
    return Outcome(kBadRequest, "Refused " + object.name + ": damaged record set");
  }
  for (const Bytes& record : records) {
    if (record.empty() || record.size() >= format::kMaxRecordSize || !RecordIsWellFormed(record)) {
      return Outcome(kBadRequest, "Refused " + object.name + ": damaged record");
    }
  }
  // Ask only when there is somewhere to put them; otherwise the engine's
  // "not found" message is the answer.
  bool known = FileExists(DatabasePath(dbs_.dataFolder, target));
  for (const Database* db : dbs_.open) known = known || (db && FileNamePart(db->path()) == target);
  if (known) {
    std::string question = records.size() == 1
                               ? Shown(kAskRecord, target)
                               : FormatMessage(Shown(kAskRecords, target).c_str(),
                                               static_cast<long>(records.size()));
    if (!ui_.AskYesNo(question, kQuestion)) return Outcome(kForbidden, "Declined records for " + target);
  }
  const size_t count = records.size();
  const size_t inserted = ReceiveRecordsBytes(target, std::move(records), dbs_, ui_, hooks_);
  std::string line = "Inserted " + std::to_string(inserted) + " of " +
                     std::to_string(count) + " records into " + target;
  return Outcome(inserted == count ? kSuccess : kForbidden, line);
}

}  // namespace cx::obex
