// popups FILE FIELD [list|add|rename|delete|sort]: the popup list editor.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "design/popup_editor.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class PopupsCommand : public Command {
 public:
  std::string name() const override { return "popups"; }
  std::string summary() const override { return "list or edit a field's popup list"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .Positional("FIELD")
        .Positional("ACTION", kAnyNumber)
        .Form({"FILE", "FIELD", "[list]"})
        .Form({"FILE", "FIELD", "add", "VALUE [VALUE ...]"})
        .Form({"FILE", "FIELD", "rename", "ENTRY", "NEW-VALUE"})
        .Form({"FILE", "FIELD", "delete", "ENTRY"})
        .Form({"FILE", "FIELD", "sort", "on|off"})
        .About("FIELD is a slot number (0-29) or a field name. ENTRY is an entry's text or\n"
               "#N, its number from 0 in entry order (the number a Pop-Up record stores).\n"
               "list shows the entries as the list shows them (sorted when \"Sort Popups\"\n"
               "is on), each with its entry number; with --json an array of {\"entry\",\n"
               "\"text\"}. A list holds at most 60 entries of at most 79 characters.\n"
               "Deleting an entry of a Pop-Up field renumbers every record: records that\n"
               "held it get \"No Value\", later entries move down by one.\n"
               "Changes need the \"DB Properties\" and \"Edit Popups\" access.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    const std::string action = p.size() > 2 ? p[2] : "list";
    const std::vector<std::string> rest(p.begin() + std::min<size_t>(p.size(), 3), p.end());

    Database db;
    if (!OpenForCommand(ctx, p[0], db)) return kExitFailed;
    const int slot = ResolveField(db, p[1]);
    if (slot < 0) return UsageError(ctx, *this, "no field " + p[1]);
    DataSession session(db, ctx.locale, ctx.ui);
    if (action == "list") {
      if (!rest.empty()) return UsageError(ctx, *this, "list takes no more arguments");
      List(ctx, PopupEditor(session, slot));
      return kExitOk;
    }

    if (action == "add") {
      if (rest.empty()) return UsageError(ctx, *this, "add needs at least one VALUE");
    } else if (action == "rename") {
      if (rest.size() != 2) return UsageError(ctx, *this, "rename needs ENTRY and NEW-VALUE");
    } else if (action == "delete") {
      if (rest.size() != 1) return UsageError(ctx, *this, "delete needs ENTRY");
    } else if (action == "sort") {
      if (rest.size() != 1 || !ParseSwitch(rest[0])) return UsageError(ctx, *this, "sort on|off");
    } else {
      return UsageError(ctx, *this, "unknown action " + action);
    }
    if (!PassAccessCheck(ctx, db, secured::kDBProperties) ||
        !PassAccessCheck(ctx, db, secured::kEditPopups)) {
      return kExitFailed;
    }

    PopupEditor editor(session, slot);
    if (action == "add") {
      for (const std::string& v : rest) {
        std::string value, error;
        if (!ToStoredText(v, "VALUE", value, error)) return UsageError(ctx, *this, error);
        if (!editor.New(value)) return kExitFailed;
      }
    } else if (action == "rename") {
      const int entry = FindEntry(editor, rest[0]);
      if (entry < 0) return Failure(ctx, "No popup entry " + rest[0]);
      std::string value, error;
      if (!ToStoredText(rest[1], "NEW-VALUE", value, error)) return UsageError(ctx, *this, error);
      if (!editor.Rename(editor.PositionOf(entry), value)) return kExitFailed;
    } else if (action == "delete") {
      const int entry = FindEntry(editor, rest[0]);
      if (entry < 0) return Failure(ctx, "No popup entry " + rest[0]);
      editor.Delete(editor.PositionOf(entry));
    } else {
      editor.SetSorted(*ParseSwitch(rest[0]));
    }
    editor.Commit();
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    List(ctx, editor);
    return kExitOk;
  }

 private:
  static int FindEntry(const PopupEditor& editor, const std::string& text) {
    const auto& entries = editor.entries();
    if (text.size() > 1 && text[0] == '#') {
      auto n = ParseNumber(text.substr(1));
      return n && *n >= 0 && *n < static_cast<long>(entries.size()) ? static_cast<int>(*n) : -1;
    }
    const std::optional<std::string> wanted = StoredTextOrNothing(text);
    if (!wanted) return -1;
    for (size_t i = 0; i < entries.size(); ++i) {
      if (entries[i] == *wanted) return static_cast<int>(i);
    }
    return -1;
  }

  static void List(Context& ctx, const PopupEditor& editor) {
    const auto texts = editor.ListTexts();
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginArray();
      for (size_t pos = 0; pos < texts.size(); ++pos) {
        j.BeginObject();
        j.Key("entry").Number(editor.EntryAt(static_cast<int>(pos)));
        j.Key("text").String(Cp1252ToUtf8(texts[pos]));
        j.EndObject();
      }
      j.EndArray();
      j.Finish();
      return;
    }
    for (size_t pos = 0; pos < texts.size(); ++pos) {
      ctx.out << "#" << editor.EntryAt(static_cast<int>(pos)) << "\t" << Cp1252ToUtf8(texts[pos])
              << "\n";
    }
  }
};

CX_REGISTER_COMMAND(PopupsCommand);

}  // namespace
}  // namespace cx::cli
