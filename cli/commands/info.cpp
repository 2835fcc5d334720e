// info FILE: the header, the field definitions and the settings of a
// database.
#include <ostream>

#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "engine/value_text.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

constexpr const char* kOperations[8] = {"Open Database", "Add Records",  "Edit Records",
                                        "Delete Records", "DB Properties", "Delete Database",
                                        "Edit Popups",   "Beam Data"};
constexpr const char* kLevels[4] = {"Full Access", "Password Required", "No Access",
                                    "View Records Only"};

int Level(const Schema& s, int op) { return (s.securityLevels >> (2 * op)) & 3; }

std::string U(const std::string& cp1252) { return Cp1252ToUtf8(cp1252); }

void WriteJson(std::ostream& out, const DatabaseHead& db) {
  const Header& h = db.header;
  const Schema& s = db.schema;
  JsonWriter j(out);
  j.BeginObject();
  j.Key("name").String(U(h.Name()));
  j.Key("type").String(FourCCText(h.type));
  j.Key("creator").String(FourCCText(h.creator));
  j.Key("attributes").Number(h.attributes);
  j.Key("version").Number(h.version);
  j.Key("creationDate").Number(h.creationDate);
  j.Key("modificationDate").Number(h.modificationDate);
  j.Key("numRecords").Number(h.numRecords);
  j.Key("recordCount").Number(static_cast<int64_t>(db.dataRecords));
  j.Key("schemaVersion").Number(s.schemaVersion);
  j.Key("recordExtension").Bool(s.recordExtension != 0);
  j.Key("fields").BeginArray();
  for (int slot = 0; slot < format::kFieldCount; ++slot) {
    const FieldDef& f = s.field[slot];
    j.BeginObject();
    j.Key("slot").Number(slot);
    j.Key("name").String(U(f.name.str()));
    j.Key("type").String(std::string(FieldTypeLabel(f.type())));
    j.Key("typeNumber").Number(f.typeNumber);
    j.Key("size").Number(f.size);
    j.Key("width").Number(f.width);
    j.Key("visible").Bool(f.visible != 0);
    j.Key("exportPrint").Bool(f.exportPrint != 0);
    j.EndObject();
  }
  j.EndArray();
  j.Key("fieldOrder").BeginArray();
  for (uint8_t slot : s.fieldOrder) j.Number(slot);
  j.EndArray();
  j.Key("sortKeys").BeginArray();
  for (const SortKey& k : s.sortKey) {
    j.BeginObject();
    j.Key("field").Number(k.Field() < 0 ? -1 : k.Field());
    j.Key("forward").Bool(k.direction != 0);
    j.EndObject();
  }
  j.EndArray();
  j.Key("popups").BeginArray();
  for (const PopupList& list : db.popups) {
    j.BeginArray();
    for (const std::string& item : list.items) j.String(U(item));
    j.EndArray();
  }
  j.EndArray();
  j.Key("security").BeginObject();
  j.Key("levels").BeginObject();
  for (int op = 0; op < 8; ++op) j.Key(kOperations[op]).String(kLevels[Level(s, op)]);
  j.EndObject();
  j.Key("password").Bool(!s.password.empty());
  j.EndObject();
  j.Key("author").String(U(s.author.str()));
  j.Key("comments").String(U(s.comments.str()));
  j.EndObject();
  j.Finish();
}

void WriteText(std::ostream& out, const DatabaseHead& db) {
  const Header& h = db.header;
  const Schema& s = db.schema;
  out << "Name:        " << U(h.Name()) << "\n"
      << "Type:        " << FourCCText(h.type) << "   Creator: " << FourCCText(h.creator) << "\n"
      << "Records:     " << db.dataRecords << "\n"
      << "Schema:      version " << int(s.schemaVersion)
      << (s.recordExtension ? ", records carry the prefix extension" : "") << "\n";
  if (!s.author.empty()) out << "Author:      " << U(s.author.str()) << "\n";
  if (!s.comments.empty()) out << "Comments:    " << U(OneLine(s.comments.str())) << "\n";
  out << "Fields (display order):\n";
  for (uint8_t slot : s.fieldOrder) {
    const FieldDef& f = s.field[slot];
    if (f.type() == FieldType::NotUsed) continue;
    out << "  " << (slot < 10 ? " " : "") << int(slot) << "  " << U(f.name.str()) << "  ("
        << FieldTypeLabel(f.type()) << ")";
    if (!db.popups[slot].items.empty()) out << "  " << db.popups[slot].items.size() << " popup items";
    out << "\n";
  }
  out << "Sort keys:  ";
  bool any = false;
  for (const SortKey& k : s.sortKey) {
    if (k.Field() < 0 || k.Field() >= format::kFieldCount) continue;
    out << " " << U(s.field[k.Field()].name.str()) << (k.direction ? " (Forward)" : " (Reverse)");
    any = true;
  }
  out << (any ? "" : " none") << "\n";
  out << "Security:\n";
  for (int op = 0; op < 8; ++op) out << "  " << kOperations[op] << ": " << kLevels[Level(s, op)] << "\n";
  out << "  Password: " << (s.password.empty() ? "none" : "set") << "\n";
}

class InfoCommand : public Command {
 public:
  std::string name() const override { return "info"; }
  std::string summary() const override { return "show a database's header, fields and settings"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FILE")
        .About("Shows the database's name, type and creator, record count, fields, display\n"
               "order, sort keys, popup lists, access levels, author and comments.\n");
  }

  int Run(Context& ctx, const Arguments& args) override {
    DatabaseHead db;
    if (!OpenHeadForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    if (ctx.json) {
      WriteJson(ctx.out, db);
    } else {
      WriteText(ctx.out, db);
    }
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(InfoCommand);

}  // namespace
}  // namespace cx::cli
