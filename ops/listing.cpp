#include "ops/listing.h"

#include "engine/value_text.h"
#include "ops/text_sink.h"
#include "platform/data_folder.h"

namespace cx {
namespace {

constexpr size_t kMaxValueText = 2048;
constexpr const char* kIndentStep = "   ";
constexpr const char* kRecordEnd = "----------------------------------------\n";

}  // namespace

void WriteRecordListing(size_t index, const Database& db, TextSink& out, int level,
                        const ListingContext& ctx) {
  if (index >= db.recordCount()) return;
  const Schema& schema = db.schema();
  const ValueContext values{schema, db.popups(), ctx.locale};
  std::string indent;
  for (int i = 0; i < level; ++i) indent += kIndentStep;
  ByteView record = db.record(index);
  std::string line;
  for (int pos = 0; pos < format::kFieldCount; ++pos) {
    int slot = schema.fieldOrder[pos];
    if (slot >= format::kFieldCount) continue;
    const FieldDef& field = schema.field[slot];
    if (field.type() == FieldType::NotUsed || field.exportPrint == 0) continue;
    if (field.type() == FieldType::Link) {
      if (ctx.linked) ctx.linked->WriteLinkedRecords(db, index, slot, out, level + 1);
      continue;
    }
    std::string text = ValueText(values, record, slot);
    if (text.size() > kMaxValueText) text.resize(kMaxValueText);
    line = indent;
    line += field.name.str();
    line += ": ";
    line += text;
    line += '\n';
    out.Write(line);
  }
  out.Write(kRecordEnd);
}

void WriteListing(const Database& db, bool all, size_t current, TextSink& out,
                  const ListingContext& ctx, const LinkRestriction* link) {
  if (!all) {
    WriteRecordListing(current, db, out, 0, ctx);
    return;
  }
  const ViewTester view(db, link);
  for (size_t i = 0; i < db.recordCount(); ++i) {
    if (view.InView(i)) WriteRecordListing(i, db, out, 0, ctx);
  }
}

Status WriteListingFile(const Database& db, bool all, size_t current, const std::string& path,
                        const ListingContext& ctx, const LinkRestriction* link) {
  FileSink file(path);
  if (Status s = file.Open(); !s) return s;
  WriteListing(db, all, current, file, ctx, link);
  return file.Commit();
}

bool ExportRecordsText(const Database& db, bool all, size_t current, UiPort& ui,
                       const ListingContext& ctx, const LinkRestriction* link) {
  std::optional<std::string> chosen = ui.AskSaveFile("Save As", kTextFileTypes, "");
  if (!chosen) return false;
  std::string path = *chosen;
  if (FileNamePart(path).find('.') == std::string::npos) path += ".TXT";
  if (Status s = CheckTextTarget(path, {db.path()});
      !s && !ui.AskYesNo(s.message() + ".\n\nWrite the text there anyway?", "QUESTION")) {
    return false;
  }
  ui.SetBusy(true);
  Status written = WriteListingFile(db, all, current, path, ctx, link);
  ui.SetBusy(false);
  if (!written) {
    ui.ShowMessage("ERROR: Unable to open file for writing.", "Error", MessageIcon::Error);
    return false;
  }
  ui.ShowMessage("File Exported OK", "Update", MessageIcon::Information);
  return true;
}

}  // namespace cx
