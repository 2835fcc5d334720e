// The data operations take their settings (sort keys, filters, find text,
// calculations) from the file itself, so a file of any bytes drives them
// all: none may crash, loop or read outside a record, and a sort must leave
// the table in order.
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "fuzz/fuzz_check.h"
#include "fuzz/scratch.h"
#include "fuzz/targets.h"
#include "ops/calc.h"
#include "ops/compare.h"
#include "ops/csv_export.h"
#include "ops/database_settings.h"
#include "ops/find.h"
#include "ops/listing.h"
#include "ops/report.h"
#include "ops/session.h"
#include "ops/sort.h"
#include "ops/text_sink.h"
#include "ops/view.h"
#include "platform/clock.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx::fuzz {
namespace {

void CheckView(const Database& db, const std::vector<uint32_t>& view) {
  for (size_t i = 0; i < view.size(); ++i) {
    CX_FUZZ_CHECK(view[i] < db.recordCount());
    if (i > 0) CX_FUZZ_CHECK(view[i - 1] < view[i]);
    CX_FUZZ_CHECK(RecordInView(db, view[i]) == 1);
  }
}

// Some comparisons the file format prescribes are not a strict order
// (numbers compared by wrapped difference, a record missing the key's slot
// compared lower both ways round); where every key is a text comparison
// and every record has the slots, the table must end up in order.
bool OrderIsStrict(const Database& db) {
  for (const SortKey& key : db.schema().sortKey) {
    const int field = key.Field();
    if (field == -1) break;
    if (field < 0 || field >= format::kFieldCount) return false;
    switch (db.schema().field[field].type()) {
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
      case FieldType::CheckBox:
      case FieldType::PopUp:
        break;
      default:
        return false;
    }
    for (size_t r = 0; r < db.recordCount(); ++r) {
      if (!FieldValue(db.record(r), field)) return false;
    }
  }
  return true;
}

void CheckSorted(const Database& db) {
  if (db.schema().sortKey[0].Field() == -1 || !OrderIsStrict(db)) return;
  for (size_t i = 1; i < db.recordCount(); ++i) {
    CX_FUZZ_CHECK(CompareRecords(db, db.record(i - 1), db.record(i)) <= 0);
  }
}

}  // namespace

int FuzzDataOperations(const uint8_t* data, size_t size) {
  const std::string path = WriteScratch("ops.PDB", data, size);
  SilentUi ui;
  Database db;
  if (!db.Open(path, ui)) return 0;

  LocaleInfo locale;
  DataSession session(db, locale, ui);

  SortAll(db);
  CheckSorted(db);

  session.view = RebuildView(db);
  CheckView(db, session.view);

  SearchSettings search = LoadSearchSettings(db.schema());
  FindHit hit;
  int found = FindRecord(db, search, 0, 0, &hit, nullptr, nullptr, locale);
  CX_FUZZ_CHECK(found >= -1 && found < static_cast<int>(db.recordCount()));
  if (found >= 0) CX_FUZZ_CHECK(RecordInView(db, static_cast<size_t>(found)) == 1);

  RecalculateFrom(session, 0);
  CX_FUZZ_CHECK(db.recordCount() <= static_cast<size_t>(format::kMaxDataRecords));

  CsvSettings csv;
  for (int variant = 0; variant < 4; ++variant) {
    CsvExportOptions options;
    options.quoteAll = variant & 1;
    options.withHeader = variant & 2;
    options.filteredOnly = variant == 3;
    options.fieldNumberOrder = variant == 2;
    StringSink out;
    ExportCsvTo(db, options, out, csv, locale, ui);
  }
  for (int slot = 0; slot < format::kFieldCount; ++slot) BuildReport(db, slot, locale);

  StringSink listing;
  ListingContext listingContext{locale, nullptr};
  WriteListing(db, true, 0, listing, listingContext);

  // Whatever the operations did, the result saves and reopens.
  const FixedClock clock(1700000000);
  const std::string saved = ScratchPath("ops-saved.PDB");
  CX_FUZZ_CHECK(db.SaveAs(saved, clock).ok());
  Database reopened;
  CX_FUZZ_CHECK(reopened.Open(saved, ui).ok());
  CX_FUZZ_CHECK(reopened.recordCount() == db.recordCount());
  return 0;
}

}  // namespace cx::fuzz
