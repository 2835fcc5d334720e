// Small databases with values, built through the engine's editing form, for
// the design, link and view-level tests.
#pragma once

#include <cstdio>
#include <string>
#include <utility>
#include <vector>

#include "engine/record.h"
#include "engine/record_store.h"
#include "platform/file_io.h"

namespace cx::testing {

struct FieldLine {
  std::string name;
  FieldType type;
};

// A new database at `path` whose slots 0, 1, ... have the given names and
// types (the rest Not-Used).
inline Database MakeDatabase(const std::string& path, const std::vector<FieldLine>& fields,
                             const std::string& name = "Test") {
  Database db = Database::CreateNew(path, name);
  for (size_t i = 0; i < fields.size(); ++i) {
    db.schema().field[i].name.set(fields[i].name);
    db.schema().field[i].typeNumber = static_cast<int16_t>(fields[i].type);
  }
  return db;
}

// A record whose slot i holds values[i], written the way the record editor
// would: texts as typed, Integer as decimal text, Unique/Link/Linked/Date
// as numbers, Pop-Up/Check-Box as the byte, Time as "h:m:s".
inline Bytes MakeRecord(const Schema& schema, const std::vector<std::string>& values) {
  Bytes editing = NewEditingRecord(schema);
  for (size_t i = 0; i < values.size(); ++i) {
    const int slot = static_cast<int>(i);
    const std::string& v = values[i];
    switch (schema.field[i].type()) {
      case FieldType::Unique:
      case FieldType::Link:
      case FieldType::Linked:
      case FieldType::Date:
        SetEditingNumber(editing, slot, static_cast<uint32_t>(ParseLong(v)), schema);
        break;
      case FieldType::PopUp:
      case FieldType::CheckBox:
        SetEditingByte(editing, slot, static_cast<uint8_t>(ParseLong(v)), schema);
        break;
      case FieldType::Time: {
        int h = 255, m = 0, s = 0;
        if (!v.empty()) std::sscanf(v.c_str(), "%d:%d:%d", &h, &m, &s);
        auto room = EditingSlot(editing, slot);
        room[0] = uint8_t(s);
        room[1] = uint8_t(m);
        room[2] = uint8_t(h);
        break;
      }
      default: SetEditingText(editing, slot, v, schema);
    }
  }
  return Compact(editing, schema);
}

inline void AddRecord(Database& db, const std::vector<std::string>& values) {
  db.AppendRecord(MakeRecord(db.schema(), values));
}

// Everything the file would hold: the bytes a save writes.
inline std::vector<uint8_t> FileBytes(const std::string& path) {
  std::vector<uint8_t> bytes;
  ReadWholeFile(path, bytes);
  return bytes;
}

}  // namespace cx::testing
