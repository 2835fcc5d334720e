// Writing the records of a database as comma-separated text, one record a
// line, values as the list shows them.
#pragma once

#include <string>
#include <string_view>

#include "engine/record_store.h"
#include "ops/csv_format.h"
#include "ops/text_sink.h"
#include "ops/view.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx {

struct CsvExportOptions {
  bool quoteAll = false;          // quote every value, empty ones as ""
  bool withHeader = false;        // a first line of field names
  bool filteredOnly = false;      // only the records in view
  bool fieldNumberOrder = false;  // columns in slot order instead of display order
};

// QuoteCsvValue: appends `text` to `out`, every double quote doubled, the
// whole wrapped in double quotes when it holds a quote, the separator, a CR
// or an LF, or when `quoteAll` is set. An empty text gives "" with
// quoteAll and nothing otherwise.
void QuoteCsvValue(std::string_view text, std::string& out, bool quoteAll, char separator = ',');

// ExportCsv: writes the file at `path` (replacing it once complete).
// Returns 1 when everything was written, 0 when the file could not be
// written or a record could not be read (the rest is still written). Each
// value is its display text, "No Value" when that is empty; Image columns
// stay empty. Progress goes to `ui`'s status hook.
int ExportCsv(const Database& db, const CsvExportOptions& options, const std::string& path,
              const CsvSettings& settings, const LocaleInfo& locale, UiPort& ui,
              const LinkRestriction* link = nullptr);

// The same into any sink (the terminal, a string).
int ExportCsvTo(const Database& db, const CsvExportOptions& options, TextSink& out,
                const CsvSettings& settings, const LocaleInfo& locale, UiPort& ui,
                const LinkRestriction* link = nullptr);

}  // namespace cx
