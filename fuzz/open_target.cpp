// Whatever bytes a database file holds, opening it must either fail with a
// message or give a database that formats, edits, saves and reopens to the
// same content.
#include <algorithm>
#include <string>
#include <vector>

#include "engine/container.h"
#include "engine/popups.h"
#include "engine/record.h"
#include "engine/record_reader.h"
#include "engine/record_store.h"
#include "engine/value_text.h"
#include "fuzz/fuzz_check.h"
#include "fuzz/scratch.h"
#include "fuzz/targets.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx::fuzz {
namespace {

std::vector<LocaleInfo> Locales() {
  LocaleInfo us;
  LocaleInfo german;
  german.shortDate = "dd.MMM.yy";
  german.dateSeparator = '.';
  german.timeFormat = "HH:mm:ss";
  german.decimalSeparator = ',';
  LocaleInfo odd;  // tokens the rules skip, and a 12-hour clock with "hh"
  odd.shortDate = "yyyy-x-D";
  odd.dateSeparator = '-';
  odd.timeFormat = "hh.m.ss tt";
  odd.timeSeparator = '.';
  return {us, german, odd};
}

bool TypesInRange(const Schema& schema) {
  return std::all_of(schema.field.begin(), schema.field.end(),
                     [](const FieldDef& f) { return f.typeNumber >= 0 && f.typeNumber <= 15; });
}

// Every slot of every record read, shown and taken through the editing
// form and back.
void CheckRecords(const Database& db) {
  static const std::vector<LocaleInfo> locales = Locales();
  const bool typesInRange = TypesInRange(db.schema());
  for (size_t r = 0; r < db.recordCount(); ++r) {
    ByteView record = db.record(r);
    // The last record of a file may fill the whole 65535-byte read.
    CX_FUZZ_CHECK(record.size() <= format::kMaxRecordSize);
    for (int slot = 0; slot < format::kFieldCount; ++slot) {
      int offset = FieldOffset(slot, record);
      CX_FUZZ_CHECK(offset >= -1 && offset <= static_cast<int>(record.size()));
      FieldLength(record, slot);
      for (const LocaleInfo& locale : locales) {
        ValueContext ctx{db.schema(), db.popups(), locale};
        std::string text = ValueText(ctx, record, slot);
        OneLine(text);
        CrLfLines(text);
      }
    }
    Bytes editing = Expand(record, db.schema());
    CX_FUZZ_CHECK(editing.size() == EditingSize(db.schema()));
    Bytes stored = Compact(editing, db.schema());
    CX_FUZZ_CHECK(stored.size() == StoredSize(editing, db.schema()));
    if (typesInRange) {
      // Once through the editing form, a record is stable.
      Bytes again = Compact(Expand(stored, db.schema()), db.schema());
      CX_FUZZ_CHECK(again == stored);
    }
  }
}

// The readers that work on a file without loading it.
void CheckSingleRecordReaders(const std::string& path, const Header& header) {
  std::vector<size_t> indexes = {0, 1, 30, 31, header.numRecords, size_t(header.numRecords) + 1};
  if (header.numRecords > 0) indexes.push_back(header.numRecords - 1u);
  for (size_t index : indexes) {
    std::vector<uint8_t> bytes;
    if (ReadRecordAt(path, index, bytes)) {
      CX_FUZZ_CHECK(index < header.numRecords);
      CX_FUZZ_CHECK(bytes.size() < format::kMaxRecordSize);
    }
    CopyRecordToFile(path, index, ScratchPath("copy.bin"));
  }
  for (int slot : {0, 7, 29}) {
    for (int item : {0, 1, 59, 60, 255, -1}) {
      std::string text;
      int found = PopupItemText(path, slot, item, text, format::kMaxPopupText);
      CX_FUZZ_CHECK(found == 0 || found == -1);
      CX_FUZZ_CHECK(text.size() <= format::kMaxPopupText);
    }
  }
}

void CheckSameContent(const Database& a, const Database& b) {
  CX_FUZZ_CHECK(a.schema() == b.schema());
  CX_FUZZ_CHECK((a.schemaAttributes() & ~format::kDirtyBit) ==
                (b.schemaAttributes() & ~format::kDirtyBit));
  CX_FUZZ_CHECK(a.schemaUniqueID() == b.schemaUniqueID());
  for (int i = 0; i < format::kPopupRecords; ++i) {
    CX_FUZZ_CHECK(a.popups()[i].items == b.popups()[i].items);
    CX_FUZZ_CHECK(a.popups()[i].attributes == b.popups()[i].attributes);
    CX_FUZZ_CHECK(a.popups()[i].uniqueID == b.popups()[i].uniqueID);
  }
  CX_FUZZ_CHECK(a.recordCount() == b.recordCount());
  for (size_t r = 0; r < a.recordCount(); ++r) {
    ByteView x = a.record(r), y = b.record(r);
    CX_FUZZ_CHECK(std::equal(x.begin(), x.end(), y.begin(), y.end()));
    CX_FUZZ_CHECK(a.entry(r).attributes() == b.entry(r).attributes());
    CX_FUZZ_CHECK(a.entry(r).uniqueID() == b.entry(r).uniqueID());
  }
  CX_FUZZ_CHECK(a.header().Name() == b.header().Name());
}

}  // namespace

int FuzzOpenDatabase(const uint8_t* data, size_t size) {
  const std::string path = WriteScratch("input.PDB", data, size);
  SilentUi ui;
  const FixedClock clock(1700000000);

  Header header;
  int kind = ReadHeader(path, header);
  // The file exists, so it can be opened: a short one has no header of ours.
  CX_FUZZ_CHECK(kind == (size >= format::kHeaderSize && header.creator == format::kCreator ? 1 : -1));
  CX_FUZZ_CHECK(IsDatabaseFile(path) == (kind == 1));
  CheckSingleRecordReaders(path, header);

  Database db;
  Status opened = db.Open(path, ui);
  if (!opened) {
    CX_FUZZ_CHECK(!opened.message().empty());
    return 0;
  }
  CX_FUZZ_CHECK(kind == 1);
  CX_FUZZ_CHECK(db.recordCount() <= static_cast<size_t>(format::kMaxDataRecords));
  CheckRecords(db);

  // A database that could be read only in part must not replace its file.
  if (db.partial()) CX_FUZZ_CHECK(!db.Save(clock));

  const std::string saved = ScratchPath("saved.PDB");
  Status s = db.SaveAs(saved, clock);
  CX_FUZZ_CHECK(s.ok());
  CX_FUZZ_CHECK(!db.changed());

  Database reopened;
  CX_FUZZ_CHECK(reopened.Open(saved, ui).ok());
  CX_FUZZ_CHECK(!reopened.partial());
  CX_FUZZ_CHECK(reopened.malformedRecords() == db.malformedRecords());
  CheckSameContent(db, reopened);

  // Saving what was saved gives the same bytes.
  const std::string savedAgain = ScratchPath("saved-again.PDB");
  CX_FUZZ_CHECK(reopened.SaveAs(savedAgain, clock).ok());
  std::vector<uint8_t> first, second;
  CX_FUZZ_CHECK(ReadWholeFile(saved, first) && ReadWholeFile(savedAgain, second));
  CX_FUZZ_CHECK(first == second);
  return 0;
}

}  // namespace cx::fuzz
