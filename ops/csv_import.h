// Reading comma-separated text into new records: one record a line, each
// column converted by the type of the field it lands in.
#pragma once

#include <cstddef>
#include <set>
#include <string>
#include <vector>

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

// Values the import rules above store other than the file gives them.
enum class CsvIssue {
  kNotConverted,  // not a number, date, time or check-box value of the field's type
  kCut,           // longer than the field (or a Pop-Up entry) holds
  kNoPopupRoom,   // a new Pop-Up text, but the list already holds 60 entries
  kOpenQuote,     // a quote never closed: the rest of the file became one value
};

struct CsvValueIssue {
  size_t line = 0;  // line of the file, from 1, where the record starts
  int slot = -1;    // the field (-1 for an open quote)
  CsvIssue issue = CsvIssue::kNotConverted;
  std::string text;  // the value as read (cut for messages)
  size_t room = 0;   // for kCut: the characters the field holds
};

struct CsvImportIssues {
  // How many records of the file hold at least one such value.
  size_t lines = 0;
  // Every such value of the first kKeptLines of those records, in file order.
  std::vector<CsvValueIssue> first;
  static constexpr size_t kKeptLines = 5;

  bool empty() const { return lines == 0; }
  // One line per kept issue ("line 4, field "Done" (Check-Box): "yes"
  // cannot be read"), Windows-1252 like the field names.
  std::vector<std::string> Describe(const Schema& schema) const;
};

struct CsvImportResult {
  Status status;         // the first failure, if any
  size_t lines = 0;      // lines found in the file
  size_t imported = 0;   // records appended
  CsvImportIssues issues;
};

// Imports every line of the file at `path`, appending the records in file
// order. The file is read twice, once to count its lines and find the
// largest number in its Unique and Link columns (so numbers given out to
// records without one never collide with numbers still to come), then to
// import. A file with more lines than the database has room for is
// refused before anything is added. The first reading also finds the
// values the rules will not store as given (`issues`); with `strict` any of
// them refuses the file, again before anything is added. With `skipHeader`
// the first line is a header of names: it is read past, never imported,
// and still counted in the line numbers of `issues`.
CsvImportResult ImportCsvFile(Database& db, const std::string& path, int mode,
                              const CsvSettings& settings, const LocaleInfo& locale,
                              bool strict = false, bool skipHeader = false);
// The same for Windows-1252 text already in memory (standard input, or a
// file converted from another encoding); `name` stands for it in messages.
CsvImportResult ImportCsvText(Database& db, std::string text, const std::string& name, int mode,
                              const CsvSettings& settings, const LocaleInfo& locale,
                              bool strict = false, bool skipHeader = false);

}  // namespace cx
