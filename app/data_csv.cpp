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
  // Widening changes byte counts, so the text is converted as a whole and
  // then written.
  StringSink text;
  const int result =
      ExportCsvTo(session.db, options, text, settings, session.locale, session.ui, session.Link());
  const std::string utf8 = Cp1252ToUtf8(text.text);
  FileSink out(path);
  Status s = out.Open();
  if (s) {
    out.Write(utf8);
    s = out.Commit();
  }
  if (!s) {
    error = s.message();
    return 0;
  }
  return result;
}

CsvImportResult ImportCsvEncoded(Database& db, const std::string& path, int mode, CsvEncoding encoding,
                                 const LocaleInfo& locale, const std::string& scratchFolder) {
  if (encoding == CsvEncoding::kWindows1252) return ImportCsvFile(db, path, mode, CsvSettings(), locale);
  CsvImportResult result;
  std::vector<uint8_t> bytes;
  if (!ReadWholeFile(path, bytes)) {
    result.status = Status::Error("ERROR: Cannot Open File: " + path + " for reading");
    return result;
  }
  std::string_view text(reinterpret_cast<const char*>(bytes.data()), bytes.size());
  // Editors on some systems begin UTF-8 files with a byte-order mark.
  if (text.substr(0, 3) == "\xEF\xBB\xBF") text.remove_prefix(3);
  bool lossless = true;
  const std::string narrow = Utf8ToCp1252(text, &lossless);
  if (!lossless) {
    result.status = Status::Error(
        "The file holds characters that a database cannot store (or is not UTF-8 text); nothing was "
        "imported. If it was written in Windows-1252, choose that encoding.");
    return result;
  }
  const std::string scratch = scratchFolder + "/import.csv";
  {
    SafeFileWriter out(scratch, /*sync=*/false);
    Status s = out.Open();
    if (s) {
      out.Write(narrow.data(), narrow.size());
      s = out.Commit();
    }
    if (!s) {
      result.status = s;
      return result;
    }
  }
  result = ImportCsvFile(db, scratch, mode, CsvSettings(), locale);
  RemoveFile(scratch);
  return result;
}

}  // namespace cx
