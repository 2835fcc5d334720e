// CSV export and import as the desktop offers them: the ops writer and
// reader, with the file's text encoding chosen by the user (UTF-8 by
// default, or the databases' own Windows-1252 bytes).
#pragma once

#include <string>

#include "ops/csv_export.h"
#include "ops/csv_import.h"
#include "ops/session.h"
#include "ops/text_encoding.h"

namespace cx {

using CsvEncoding = TextEncoding;

// Writes the export to `path` (replaced only once complete). 1 when every
// record was written, 0 as ExportCsv says; a file that cannot be written
// gives 0 with `error` set.
int ExportCsvEncoded(const DataSession& session, const CsvExportOptions& options, CsvEncoding encoding,
                     const std::string& path, std::string& error);

// Appends the lines of the file at `path`. A UTF-8 file holding a character
// that Windows-1252 lacks is refused before anything is added; the message
// names the first line holding one. `scratchFolder` is no longer used: the
// conversion happens in memory.
CsvImportResult ImportCsvEncoded(Database& db, const std::string& path, int mode, CsvEncoding encoding,
                                 const LocaleInfo& locale, const std::string& scratchFolder);

}  // namespace cx
