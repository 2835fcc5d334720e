// Reading comma-separated text into new records: one record a line, each
// column converted by the type of the field it lands in.
#pragma once

#include <cstddef>
#include <string>

#include "engine/record_store.h"
#include "ops/csv_format.h"
#include "ops/csv_reader.h"
#include "platform/locale_info.h"
#include "platform/status.h"

namespace cx {

// Column mappings of ImportCsvRecord.
constexpr int kCsvColumnsByDisplayOrder = 0;  // column n: the nth used field of the display order
constexpr int kCsvColumnsBySlot = 1;          // column n: field slot n

// ImportCsvRecord: appends one record made from `line`. Texts are copied
// (cut to the field's size); Integer, Unique, Link and Check-Box columns
// read as whole numbers; Dates and Times through the locale's patterns
// (times as hours and minutes); Linked as its number; Image and Heading
// fields stay empty. A Pop-Up text is found in the field's list (exactly,
// case and all) or appended to it while it holds fewer than 60 entries; a
// text containing "No Value" (any case), an empty one, or one that finds no
// room gives no choice. A Unique column without a number gets the
// database's next unique number; a number given is kept and the next
// unique number moves past it. False (and nothing added) when the database
// is full.
// `scratch`, when given, is an editing record kept from one call to the
// next of the same import (it saves building one per line).
bool ImportCsvRecord(Database& db, const CsvLine& line, int mode, const LocaleInfo& locale,
                     Bytes* scratch = nullptr);

struct CsvImportResult {
  Status status;         // the first failure, if any
  size_t lines = 0;      // lines found in the file
  size_t imported = 0;   // records appended
};

// Imports every line of the file at `path`, appending the records in file
// order. The file is read twice, once to count its lines and find the
// largest number in its Unique and Link columns (so numbers given out to
// records without one never collide with numbers still to come), then to
// import. A file with more lines than the database has room for is
// refused before anything is added.
CsvImportResult ImportCsvFile(Database& db, const std::string& path, int mode,
                              const CsvSettings& settings, const LocaleInfo& locale);

}  // namespace cx
