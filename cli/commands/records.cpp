// records FILE: the value text of every field of the records in view (or
// of all records), in table order.
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "engine/value_text.h"
#include "ops/view.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class RecordsCommand : public Command {
 public:
  std::string name() const override { return "records"; }
  std::string summary() const override { return "list the records with every value as shown"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--json] records FILE [--all]\n"
           "Lists the records in view (those that pass the database's filters) in\n"
           "table order, each field in display order, values as the list shows them\n"
           "with the date, time and decimal conventions of the global options.\n"
           "  --all    every record, whatever the filters say\n"
           "With --json: an array of {\"index\": N, \"fields\": [{\"slot\", \"name\",\n"
           "\"text\"}]}, line breaks kept. Without: a tab-separated table with a\n"
           "header row, line breaks shown as blanks.\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv, {}, {"--all"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 1) return UsageError(ctx, *this, "expected FILE");
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;

    std::vector<int> slots;
    for (uint8_t slot : db.schema().fieldOrder) {
      if (db.schema().field[slot].type() != FieldType::NotUsed) slots.push_back(slot);
    }
    std::vector<uint32_t> rows;
    if (args.has("--all")) {
      rows.resize(db.recordCount());
      for (size_t i = 0; i < rows.size(); ++i) rows[i] = static_cast<uint32_t>(i);
    } else {
      rows = RebuildView(db);
    }
    ValueContext vc{db.schema(), db.popups(), ctx.locale};
    if (ctx.json) {
      WriteJson(ctx, db, vc, slots, rows);
    } else {
      WriteTable(ctx, db, vc, slots, rows);
    }
    return kExitOk;
  }

 private:
  static void WriteJson(Context& ctx, const Database& db, const ValueContext& vc,
                        const std::vector<int>& slots, const std::vector<uint32_t>& rows) {
    JsonWriter j(ctx.out);
    j.BeginArray();
    for (uint32_t row : rows) {
      j.BeginObject();
      j.Key("index").Number(row);
      j.Key("fields").BeginArray();
      for (int slot : slots) {
        j.BeginObject();
        j.Key("slot").Number(slot);
        j.Key("name").String(Cp1252ToUtf8(db.schema().field[slot].name.str()));
        j.Key("text").String(Cp1252ToUtf8(ValueText(vc, db.record(row), slot)));
        j.EndObject();
      }
      j.EndArray();
      j.EndObject();
    }
    j.EndArray();
    j.Finish();
  }

  static void WriteTable(Context& ctx, const Database& db, const ValueContext& vc,
                         const std::vector<int>& slots, const std::vector<uint32_t>& rows) {
    std::string line;
    for (size_t k = 0; k < slots.size(); ++k) {
      if (k) line.push_back('\t');
      line += Cp1252ToUtf8(db.schema().field[slots[k]].name.str());
    }
    ctx.out << line << "\n";
    for (uint32_t row : rows) {
      line.clear();
      for (size_t k = 0; k < slots.size(); ++k) {
        if (k) line.push_back('\t');
        std::string text = OneLine(ValueText(vc, db.record(row), slots[k]));
        for (char& c : text) {
          if (c == '\t') c = ' ';
        }
        line += Cp1252ToUtf8(text);
      }
      ctx.out << line << "\n";
    }
  }
};

CX_REGISTER_COMMAND(RecordsCommand);

}  // namespace
}  // namespace cx::cli
