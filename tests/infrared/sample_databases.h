// Small databases for the beaming tests: two Text fields and records
// assembled byte by byte.
#pragma once

#include <string>
#include <vector>

#include "engine/record_store.h"
#include "platform/file_io.h"

namespace cx::testing {

// A stored record with two Text values and the end mark.
inline std::vector<uint8_t> TwoTextRecord(const std::string& a, const std::string& b) {
  std::vector<uint8_t> r = {0};
  for (const std::string* t : {&a, &b}) {
    r.push_back(static_cast<uint8_t>(t->size() + 1));
    r.push_back(static_cast<uint8_t>((t->size() + 1) >> 8));
    r.insert(r.end(), t->begin(), t->end());
    r.push_back(0);
  }
  r.push_back(0xFF);
  r.push_back(0xFF);
  return r;
}

// Writes "<folder>/<file>" holding `records`; returns its path.
inline std::string WriteSampleDatabase(const std::string& folder, const std::string& file,
                                       const std::vector<std::vector<uint8_t>>& records) {
  MakeDirectories(folder);
  std::string path = folder + "/" + file;
  Database db = Database::CreateNew(path, file.substr(0, file.rfind('.')));
  db.schema().field[0].typeNumber = 1;
  db.schema().field[1].typeNumber = 1;
  for (const auto& r : records) db.AppendRecord(r);
  db.Save();
  return path;
}

inline std::vector<std::vector<uint8_t>> RecordsOf(const std::string& path) {
  SilentUi ui;
  Database db;
  std::vector<std::vector<uint8_t>> out;
  if (!db.Open(path, ui)) return out;
  for (size_t i = 0; i < db.recordCount(); ++i) out.emplace_back(db.record(i).begin(), db.record(i).end());
  return out;
}

}  // namespace cx::testing
