// A database with one field of every kind, for the export, report and
// listing tests, built through the engine's own record functions.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "engine/record.h"
#include "engine/record_store.h"
#include "engine/value_text.h"

namespace cx::testing {

// Field slots of the sample design.
enum Slot : int {
  kName = 0,      // Text
  kQty = 1,       // Integer
  kPrice = 2,     // Float, 2 places
  kColor = 3,     // Pop-Up: Red, Green
  kDone = 4,      // Check-Box
  kDue = 5,       // Date
  kAt = 6,        // Time
  kNotes = 7,     // Note
  kId = 8,        // Unique
  kPhoto = 9,     // Image
  kSection = 10,  // Heading
  kTotal = 11,    // Calculated, 2 places
  kParts = 12,    // Link
  kOwner = 13,    // Linked
  kSupplier = 14, // DB Popup
  kUnused = 20,   // Not-Used
};

inline void DefineField(Schema& s, int slot, FieldType type, const std::string& name, int size = 40) {
  s.field[slot].typeNumber = static_cast<int16_t>(type);
  s.field[slot].name.set(name);
  s.field[slot].size = static_cast<int16_t>(size);
}

// The sample design. The display order starts with a Not-Used slot and
// shows the fields out of slot order.
inline Database SampleDatabase(const std::string& path = "/nonexistent/Sample.PDB") {
  Database db = Database::CreateNew(path, "Sample");
  Schema& s = db.schema();
  DefineField(s, kName, FieldType::Text, "Name", 60);
  DefineField(s, kQty, FieldType::Integer, "Qty");
  DefineField(s, kPrice, FieldType::Float, "Price", 2);
  DefineField(s, kColor, FieldType::PopUp, "Color");
  DefineField(s, kDone, FieldType::CheckBox, "Done");
  DefineField(s, kDue, FieldType::Date, "Due");
  DefineField(s, kAt, FieldType::Time, "At");
  DefineField(s, kNotes, FieldType::Note, "Notes");
  DefineField(s, kId, FieldType::Unique, "Id");
  DefineField(s, kPhoto, FieldType::Image, "Photo");
  DefineField(s, kSection, FieldType::Heading, "Section");
  DefineField(s, kTotal, FieldType::Calculated, "Total");
  s.field[kTotal].setResultFormat(5);
  DefineField(s, kParts, FieldType::Link, "Parts");
  DefineField(s, kOwner, FieldType::Linked, "Owner");
  DefineField(s, kSupplier, FieldType::DBPopup, "Supplier");
  const std::vector<uint8_t> order = {kUnused, kNotes, kName, kColor, kQty, kPrice, kSection, kDone,
                                      kDue, kAt, kPhoto, kId, kTotal, kParts, kOwner, kSupplier};
  std::vector<bool> placed(30, false);
  size_t pos = 0;
  for (uint8_t slot : order) {
    s.fieldOrder[pos++] = slot;
    placed[slot] = true;
  }
  for (int slot = 0; slot < 30; ++slot) {
    if (!placed[slot]) s.fieldOrder[pos++] = static_cast<uint8_t>(slot);
  }
  db.popups()[kColor].items = {"Red", "Green"};
  return db;
}

struct SampleValues {
  std::string name;
  int32_t qty = 0;
  std::string price;
  uint8_t color = 255;
  uint8_t done = 0;
  uint32_t due = 0;                    // day number
  uint8_t at[3] = {0, 0, 255};         // seconds, minutes, hours
  std::string notes;
  uint32_t id = 0;
  bool photo = false;
  std::string total;
  uint32_t parts = 0;
  uint32_t owner = 0;
  std::string supplier;
};

inline Bytes SampleRecord(const Database& db, const SampleValues& v) {
  const Schema& s = db.schema();
  Bytes rec = NewEditingRecord(s);
  SetEditingText(rec, kName, v.name, s);
  SetEditingNumber(rec, kQty, static_cast<uint32_t>(v.qty), s);
  SetEditingText(rec, kPrice, v.price, s);
  SetEditingByte(rec, kColor, v.color, s);
  SetEditingByte(rec, kDone, v.done, s);
  SetEditingNumber(rec, kDue, v.due, s);
  std::span<uint8_t> at = EditingSlot(rec, kAt);
  at[0] = v.at[0];
  at[1] = v.at[1];
  at[2] = v.at[2];
  SetEditingText(rec, kNotes, v.notes, s);
  SetEditingNumber(rec, kId, v.id, s);
  if (v.photo) EditingSlot(rec, kPhoto)[0] = 7;
  SetEditingText(rec, kTotal, v.total, s);
  SetEditingNumber(rec, kParts, v.parts, s);
  SetEditingNumber(rec, kOwner, v.owner, s);
  SetEditingText(rec, kSupplier, v.supplier, s);
  return Compact(rec, s);
}

inline void AddSample(Database& db, const SampleValues& v) { db.AppendRecord(SampleRecord(db, v)); }

// Three records with awkward texts: separators, quotes, line breaks,
// Windows-1252 letters (e with acute 0xE9, euro 0x80, curly quotes 0x93
// 0x94), an empty text, no date, no time, no pop-up choice.
inline void AddAwkwardRecords(Database& db) {
  SampleValues a;
  a.name = "Widget, large";
  a.qty = -12;
  a.price = "3.50";
  a.color = 1;
  a.done = 1;
  a.due = 44000;
  a.at[0] = 5; a.at[1] = 7; a.at[2] = 13;
  a.notes = "Line one\rLine two \"quoted\"";
  a.id = 1;
  a.photo = true;
  a.total = "7.00";
  a.parts = 4;
  a.owner = 9;
  a.supplier = "Caf\xE9 \x80 Ltd";
  AddSample(db, a);

  SampleValues b;
  b.name = "";
  b.qty = 0;
  b.price = "";
  b.notes = "\x93Smart\x94 \"\" ,;";
  b.id = 2;
  AddSample(db, b);

  SampleValues c;
  c.name = " padded ";
  c.qty = 2147483647;
  c.price = "0.01";
  c.color = 0;
  c.due = 1;
  c.at[0] = 0; c.at[1] = 0; c.at[2] = 0;
  c.notes = "multi\r\nline";
  c.id = 3;
  c.total = "-1.25";
  c.supplier = "x";
  AddSample(db, c);
}

}  // namespace cx::testing
