#include "infrared/beam_payloads.h"

#include <algorithm>
#include <span>

#include "engine/format.h"
#include "infrared/obex_format.h"
#include "infrared/received_name.h"
#include "infrared/record_set.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"

namespace cx::obex {
namespace {

constexpr char kTooLarge[] = "%s is too large to beam (%d bytes; at most 65535 fit in one transfer).";

Status TooLarge(const std::string& what, size_t size) {
  std::string text = FormatMessage(kTooLarge, static_cast<long>(size));
  return Status::Error(FormatMessage(text.c_str(), Utf8ToCp1252(what)));
}

// Description: the database's file name, so the receiving side knows
// where records belong even if a peer renames the object itself.
BeamObject RecordPayload(const Database& db, const std::string& extension, Bytes body) {
  std::string file = FileNamePart(db.path());
  BeamObject object;
  ObjectItems(file, StemOf(file) + extension, kRecordCreator, std::move(body), object);
  return object;
}

}  // namespace

Status DatabaseObject(const std::string& path, BeamObject& object) {
  Bytes bytes;
  if (!ReadWholeFile(path, bytes)) {
    return Status::Error(FormatMessage(messages::kCannotOpen, Utf8ToCp1252(path)));
  }
  if (bytes.size() < format::kHeaderSize || DecodeHeader(bytes.data()).creator != format::kCreator) {
    return Status::Error(messages::kBadHeader);
  }
  std::string file = FileNamePart(path);
  if (bytes.size() > kMaxObjectSize) return TooLarge(file, bytes.size());
  ObjectItems(file, file, kDatabaseCreator, std::move(bytes), object);
  return Status::Ok();
}

Status RecordObject(const Database& db, size_t index, BeamObject& object) {
  if (index >= db.recordCount()) {
    return Status::Error(FormatMessage("There is no record %d to beam.", static_cast<long>(index)));
  }
  ByteView record = db.record(index);
  if (record.size() > kMaxObjectSize) return TooLarge("The record", record.size());
  object = RecordPayload(db, ".cxr", Bytes(record.begin(), record.end()));
  return Status::Ok();
}

Status RecordSetObjects(const Database& db, const std::vector<uint32_t>& view,
                        std::vector<BeamObject>& objects) {
  objects.clear();
  std::vector<std::span<const uint8_t>> records;
  for (uint32_t index : view) {
    if (index >= db.recordCount()) return Status::Error("The list of records to beam is out of date.");
    records.push_back(db.record(index));
  }
  if (records.empty()) return Status::Error("There are no records in view to beam.");
  std::vector<Bytes> bodies;
  if (!PackRecordSets(records, bodies)) {
    size_t largest = 0;
    for (const auto& r : records) largest = std::max(largest, r.size());
    return TooLarge("A record", largest);
  }
  for (Bytes& body : bodies) objects.push_back(RecordPayload(db, ".cxm", std::move(body)));
  return Status::Ok();
}

}  // namespace cx::obex
