// set-field FILE FIELD [settings]: the field editor from the command line,
// type changes with their conversion questions included.
#include <ostream>
#include <set>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "cli/json_output.h"
#include "design/field_controls.h"
#include "design/field_editor.h"
#include "ops/field_values.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

// Settings shown as numbers (the others are texts or yes/no).
const std::set<std::string> kNumberRows = {"slot", "max-chars", "places", "pixels", "other-field",
                                           "group"};

// An entry of a list given by its label (case ignored) or its index.
template <typename List>
std::optional<int> ListEntry(const List& list, const std::string& text) {
  if (auto n = ParseNumber(text); n && *n >= 0 && *n < static_cast<long>(list.size())) {
    return static_cast<int>(*n);
  }
  for (size_t i = 0; i < list.size(); ++i) {
    if (LowerAscii(std::string(list[i])) == LowerAscii(text)) return static_cast<int>(i);
  }
  return std::nullopt;
}

class SetFieldCommand : public Command {
 public:
  std::string name() const override { return "set-field"; }
  std::string summary() const override {
    return "show or change a field's settings (type changes convert the records)";
  }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--yes|--no", "--password"})
        .Positional("FILE")
        .Positional("FIELD")
        .Form({"FILE", "FIELD", "[settings]"})
        .About("FIELD is a slot number (0-29) or a field name. Without settings the field's\n"
               "settings are shown (with --json as an object). Settings:\n")
        .Option("--name", "TEXT", "field name (at most 19 characters)")
        .Option("--type", "TYPE",
                "Not-Used, Text, Integer, Float, Pop-Up, Check-Box, Unique, Image, Date, Time, "
                "Link, Linked, Note, Heading, DB Popup, Calculated")
        .Option("--max-chars", "N", "Max Characters (stored at most 254)")
        .Option("--places", "N", "Float: places after the decimal point, 0-4")
        .Option("--pixels", "N", "Pixels Shown (stored x 2/3, at most 160)")
        .Option("--visible", "yes|no", "shown in the list")
        .Option("--export", "yes|no", "Export/Print")
        .Option("--popups-append", "yes|no", "Pop-Up: Popups Append")
        .Option("--default", "VALUE", "Pop-Up default: an entry's text or \"No Value\"")
        .Option("--behavior", "B", "Date/Time Behavior: its label or index")
        .Option("--other-db", "NAME", "Link, Linked, DB Popup: the other database's name")
        .Option("--other-db-from", "FILE", "the same, read from that database file's header")
        .Option("--other-field", "N", "Other Field # (counted from 1)")
        .Option("--group", "N", "DB Popup: Group (0=none)")
        .Option("--show-value-from", "F", "Link: a field of the other database, or none")
        .Option("--value1", "F", "Calculated operand 1: a field, or none for a constant")
        .Option("--value2", "F", "Calculated operand 2: a field, or none for a constant")
        .Option("--constant1", "C", "the constant of operand 1 (at most 8 characters)")
        .Option("--constant2", "C", "the constant of operand 2 (at most 8 characters)")
        .Option("--prev1", "yes|no", "take operand 1 from the previous record")
        .Option("--prev2", "yes|no", "take operand 2 from the previous record")
        .Option("--operation", "OP", "+ - * / Min Max Average")
        .Option("--result-format", "FMT",
                "\"To 4 Decimal Places\", Integer, Time, Date, \"To 3 Decimal Places\", \"To 2 "
                "...\", \"To 1 Decimal Place\" or 0-6")
        .Notes("A type change of a field that holds data may ask \"Can't Switch these Field\n"
               "Types without data loss.  Continue?\" or whether to use the existing data for\n"
               "unique, link or linked values: answer with --yes or --no; without them the\n"
               "command refuses and the file is not touched. A No to the data-loss question\n"
               "leaves the file byte for byte as it was. Needs the \"DB Properties\" access.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    const int slot = ResolveField(db, args.positional()[1]);
    if (slot < 0) return UsageError(ctx, *this, "no field " + args.positional()[1]);

    FieldSettings s = LoadFieldSettings(db, slot);
    bool any = false;
    std::string error;
    if (!Collect(args, db, slot, s, any, error)) return UsageError(ctx, *this, error);
    if (!any) {
      Show(ctx, db, slot, s);
      return kExitOk;
    }
    if (!PassAccessCheck(ctx, db, secured::kDBProperties)) return kExitFailed;

    const FieldDef before = db.schema().field[slot];
    DataSession session(db, ctx.locale, ctx.ui);
    FieldApplyOutcome out = ApplyFieldSettings(session, slot, s);
    if (!QuestionsAnswered(ctx)) return kExitFailed;
    if (out.result == ApplyResult::Declined) {
      ctx.err << "Field left unchanged.\n";
      if (ctx.json) PrintChange(ctx, db, slot, before, false, 0);
      return kExitOk;
    }
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    if (ctx.json) {
      PrintChange(ctx, db, slot, before, true, out.converted ? out.conversion.recordsRewritten : 0);
      return kExitOk;
    }
    ctx.out << "Field " << slot << " " << Cp1252ToUtf8(db.schema().field[slot].name.str());
    if (before.type() != db.schema().field[slot].type()) {
      ctx.out << ": " << FieldTypeLabel(before.type()) << " -> "
              << FieldTypeLabel(db.schema().field[slot].type());
      if (out.converted) ctx.out << ", " << out.conversion.recordsRewritten << " records rewritten";
    }
    ctx.out << "\n";
    return kExitOk;
  }

 private:
  static void PrintChange(Context& ctx, const Database& db, int slot, const FieldDef& before, bool changed,
                          size_t rewritten) {
    const FieldDef& now = db.schema().field[slot];
    JsonWriter j(ctx.out);
    j.BeginObject();
    j.Key("slot").Number(slot);
    j.Key("name").String(Cp1252ToUtf8(now.name.str()));
    j.Key("type").String(std::string(FieldTypeLabel(now.type())));
    j.Key("previousType").String(std::string(FieldTypeLabel(before.type())));
    j.Key("changed").Bool(changed);
    j.Key("recordsRewritten").Number(static_cast<int64_t>(rewritten));
    j.EndObject();
    j.Finish();
  }

  // Reads the options into the settings, as the dialog's controls would
  // hold them; false with `error` for a value that names nothing.
  static bool Collect(const Arguments& args, const Database& db, int slot, FieldSettings& s, bool& any,
                      std::string& error) {
    auto number = [&](const char* option, int& into) {
      auto v = args.value(option);
      if (!v) return true;
      any = true;
      auto n = ParseNumber(*v);
      if (!n) {
        error = std::string(option) + " takes a number";
        return false;
      }
      into = static_cast<int>(*n);
      return true;
    };
    auto onOff = [&](const char* option, bool& into) {
      auto v = args.value(option);
      if (!v) return true;
      any = true;
      auto b = ParseSwitch(*v);
      if (!b) {
        error = std::string(option) + " takes yes or no";
        return false;
      }
      into = *b;
      return true;
    };
    auto text = [&](const char* option, std::string& into, size_t limit) {
      auto v = args.value(option);
      if (!v) return true;
      any = true;
      if (!ToStoredText(*v, option, into, error)) return false;
      if (into.size() > limit) {
        error = std::string(option) + " takes at most " + std::to_string(limit) + " characters";
        return false;
      }
      return true;
    };
    auto field = [&](const char* option, int& into) {
      auto v = args.value(option);
      if (!v) return true;
      any = true;
      if (LowerAscii(*v) == "none" || LowerAscii(*v) == "no field") {
        into = 0;
        return true;
      }
      const int f = ResolveField(db, *v);
      if (f < 0) {
        error = "no field " + *v;
        return false;
      }
      into = f + 1;
      return true;
    };
    auto entry = [&](const char* option, const auto& list, int& into) {
      auto v = args.value(option);
      if (!v) return true;
      any = true;
      auto e = ListEntry(list, *v);
      if (!e) {
        error = std::string(option) + ": no entry " + *v;
        return false;
      }
      into = *e;
      return true;
    };

    if (!text("--name", s.name, 19)) return false;
    if (auto t = args.value("--type")) {
      any = true;
      auto type = FieldTypeFromLabel(*t);
      if (!type) {
        error = "unknown field type " + *t;
        return false;
      }
      const int previous = s.type;
      s.type = static_cast<int>(*type);
      ChooseFieldType(s, previous, db, slot);
    }
    if (!number("--max-chars", s.maxCharacters) || !number("--places", s.places) ||
        !number("--pixels", s.pixelsShown) || !onOff("--visible", s.visible) ||
        !onOff("--export", s.exportPrint) || !onOff("--popups-append", s.popupsAppend)) {
      return false;
    }
    if (!entry("--default", DefaultValueList(db, slot), s.defaultValue)) return false;
    if (auto b = args.value("--behavior")) {
      const bool time = TypeFromNumber(s.type) == FieldType::Time;
      auto e = time ? ListEntry(kTimeBehaviors, *b) : ListEntry(kDateBehaviors, *b);
      if (!e) {
        error = "--behavior: no entry " + *b;
        return false;
      }
      any = true;
      s.behavior = *e;
    }
    if (auto from = args.value("--other-db-from")) {
      any = true;
      if (!PickOtherDatabase(*from, s)) {
        error = "--other-db-from: " + *from + " is not a database";
        return false;
      }
    }
    if (!text("--other-db", s.otherDatabase, 19) || !number("--other-field", s.otherFieldNumber) ||
        !number("--group", s.group) || !field("--show-value-from", s.showValueFrom) ||
        !field("--value1", s.value1) || !field("--value2", s.value2) ||
        !text("--constant1", s.constant1, 8) || !text("--constant2", s.constant2, 8) ||
        !onOff("--prev1", s.prevRecord1) || !onOff("--prev2", s.prevRecord2) ||
        !entry("--operation", kCalcOperations, s.operation) ||
        !entry("--result-format", kResultFormats, s.resultFormat)) {
      return false;
    }
    return true;
  }

  static std::string FieldName(const Database& db, int entry) {
    return entry == 0 ? std::string(kNoField)
                      : Cp1252ToUtf8(db.schema().field[entry - 1].name.str());
  }

  static void Show(Context& ctx, const Database& db, int slot, const FieldSettings& s) {
    const FieldType type = TypeFromNumber(s.type);
    const FieldControls c = ControlsForType(type);
    const auto defaults = DefaultValueList(db, slot);
    std::vector<std::pair<std::string, std::string>> rows;
    rows.emplace_back("slot", std::to_string(slot));
    rows.emplace_back("name", Cp1252ToUtf8(s.name));
    rows.emplace_back("type", s.type < 0 ? "?" : std::string(FieldTypeLabel(type)));
    if (c.maxCharacters) rows.emplace_back("max-chars", std::to_string(s.maxCharacters));
    if (c.placesAfterDecimal) rows.emplace_back("places", std::to_string(s.places));
    if (c.pixelsShown) rows.emplace_back("pixels", std::to_string(s.pixelsShown));
    if (c.visible) rows.emplace_back("visible", s.visible ? "yes" : "no");
    if (c.exportPrint) rows.emplace_back("export", s.exportPrint ? "yes" : "no");
    if (c.popupsAppend) rows.emplace_back("popups-append", s.popupsAppend ? "yes" : "no");
    if (c.defaultValue && s.defaultValue >= 0 && s.defaultValue < static_cast<int>(defaults.size())) {
      rows.emplace_back("default", Cp1252ToUtf8(defaults[s.defaultValue]));
    }
    if (c.dateBehavior && s.behavior < static_cast<int>(kDateBehaviors.size())) {
      rows.emplace_back("behavior", std::string(kDateBehaviors[s.behavior]));
    }
    if (c.timeBehavior && s.behavior < static_cast<int>(kTimeBehaviors.size())) {
      rows.emplace_back("behavior", std::string(kTimeBehaviors[s.behavior]));
    }
    if (c.otherDatabase) {
      rows.emplace_back("other-db", Cp1252ToUtf8(s.otherDatabase));
      rows.emplace_back("other-field", std::to_string(s.otherFieldNumber));
    }
    if (c.group) rows.emplace_back("group", std::to_string(s.group));
    if (c.showValueFrom) rows.emplace_back("show-value-from", FieldName(db, s.showValueFrom));
    if (c.calc) {
      rows.emplace_back("value1", FieldName(db, s.value1));
      rows.emplace_back(s.value1 ? "prev1" : "constant1",
                        s.value1 ? (s.prevRecord1 ? "yes" : "no") : Cp1252ToUtf8(s.constant1));
      rows.emplace_back("operation", std::string(kCalcOperations[s.operation]));
      rows.emplace_back("value2", FieldName(db, s.value2));
      rows.emplace_back(s.value2 ? "prev2" : "constant2",
                        s.value2 ? (s.prevRecord2 ? "yes" : "no") : Cp1252ToUtf8(s.constant2));
      rows.emplace_back("result-format", std::string(kResultFormats[s.resultFormat]));
    }
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginObject();
      for (const auto& [key, value] : rows) {
        j.Key(CamelCaseKey(key));
        if (std::optional<long> n = ParseNumber(value); n && kNumberRows.count(key)) {
          j.Number(*n);
        } else if (value == "yes" || value == "no") {
          j.Bool(value == "yes");
        } else {
          j.String(value);
        }
      }
      j.EndObject();
      j.Finish();
      return;
    }
    for (const auto& [key, value] : rows) ctx.out << key << ": " << value << "\n";
  }
};

CX_REGISTER_COMMAND(SetFieldCommand);

}  // namespace
}  // namespace cx::cli
