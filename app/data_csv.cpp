#include "app/data_csv.h"

#include "platform/file_io.h"
#include "platform/text_codec.h"

namespace cx {

int ExportCsvEncoded(const DataSession& session, const CsvExportOptions& options, CsvEncoding encoding,
                     const std::string& path, std::string& error) {
  CsvSettings settings;
  settings.alwaysQuote = options.quoteAll;
  if (encoding == CsvEncoding::kWindows1252) {
    int result = ExportCsv(session.db, options, path, settings, session.locale, session.ui, session.Link());
    if (result != 1 && !FileExists(path)) error = "Unable to write " + path + ".";
    return result;
  }
  FileSink file(path);
  Status s = file.Open();
  if (!s) {
    error = s.message();
    return 0;
  }
  EncodingSink out(file, encoding);
  const int result =
      ExportCsvTo(session.db, options, out, settings, session.locale, session.ui, session.Link());
  s = file.Commit();
  if (!s) {
    error = s.message();
    return 0;
  }
  return result;
}

CsvImportResult ImportCsvEncoded(Database& db, const std::string& path, int mode, CsvEncoding encoding,
                                 const LocaleInfo& locale, const std::string& /*scratchFolder*/) {
  if (encoding == CsvEncoding::kWindows1252) return ImportCsvFile(db, path, mode, CsvSettings(), locale);
  CsvImportResult result;
  std::vector<uint8_t> bytes;
  if (!ReadWholeFile(path, bytes)) {
    result.status = Status::Error("ERROR: Cannot Open File: " + path + " for reading");
    return result;
  }
  NarrowedText text = NarrowText(
      std::string_view(reinterpret_cast<const char*>(bytes.data()), bytes.size()), encoding);
  if (!text.lossless()) {
    result.status = Status::Error(
        "Line " + std::to_string(text.first.front().line) +
        " of the file holds a character that a database cannot store (or the file is not UTF-8 "
        "text); nothing was imported. If it was written in Windows-1252, choose that encoding.");
    return result;
  }
  return ImportCsvText(db, std::move(text.bytes), path, mode, CsvSettings(), locale);
}

}  // namespace cx
