// filter FILE [...]: show or set the two filters, as the "Edit Filters"
// dialog does.
#include <cstdio>
#include <ostream>

#include "cli/args.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "engine/value_text.h"
#include "ops/database_settings.h"
#include "ops/filter_dialog.h"
#include "ops/open_database.h"
#include "ops/value_parse.h"
#include "ops/view.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

std::string Quoted(const std::string& cp1252) { return "\"" + Cp1252ToUtf8(cp1252) + "\""; }

std::string TimeText24(const TimeOfDay& t) {
  if (t.hours == format::kNoTimeHours) return "No Time";
  char buf[16];
  std::snprintf(buf, sizeof buf, "%d:%02d:%02d", t.hours, t.minutes, t.seconds);
  return buf;
}

class FilterCommand : public Command {
 public:
  std::string name() const override { return "filter"; }
  std::string summary() const override { return "show or set the two filters"; }
  std::string help() const override {
    return "Usage: cardovex-cli [--json] filter FILE\n"
           "       cardovex-cli filter FILE [--1 FIELD] [--2 FIELD] [VALUES] [--not1] [--not2]\n"
           "                    [--and|--or] [--on1] [--on2] [--off1] [--off2] [--off]\n"
           "Without options: shows both filters and how many records are in view.\n"
           "Otherwise changes them as the Edit Filters dialog does, saves FILE and shows\n"
           "the result.\n"
           "  --1 FIELD, --2 FIELD   switch filter 1 (2) on for FIELD (slot number or\n"
           "                         name); its NOT is then off unless --not1 (--not2)\n"
           "  --not1, --not2         the filter's \"NOT\"\n"
           "  --and, --or            how the two filters combine\n"
           "  --on1, --on2           switch a filter on as it is stored\n"
           "  --off1, --off2, --off  switch one or both filters off (settings are kept)\n"
           "VALUES, per filter n (1 or 2), by the type of its field; values not given\n"
           "keep what is stored:\n"
           "  --containsN TEXT       Text, Note, DB Popup, Linked: \"Must Contain\"\n"
           "                         (empty: only records whose value is empty)\n"
           "  --lowN V, --highN V    Integer, Unique, Float, Calculated: the limits;\n"
           "                         Date: dates in the short date format (\"NO DATE\"\n"
           "                         for none); Time: times such as 9:30 or 5:15:00 PM\n"
           "  --valueN V             Pop-Up: an entry's text, #N for entry N, or\n"
           "                         \"No Value\" (on filter 2 it matches nothing);\n"
           "                         Check-Box: checked/unchecked, yes/no, 1/0\n";
  }

  int Run(Context& ctx, const std::vector<std::string>& argv) override {
    Args args(argv,
              {"--1", "--2", "--contains1", "--contains2", "--low1", "--low2", "--high1", "--high2",
               "--value1", "--value2"},
              {"--not1", "--not2", "--and", "--or", "--on1", "--on2", "--off1", "--off2", "--off"});
    if (!args.ok()) return UsageError(ctx, *this, args.error());
    if (args.positional().size() != 1) return UsageError(ctx, *this, "expected FILE");
    if (args.has("--and") && args.has("--or")) return UsageError(ctx, *this, "--and and --or together");
    Database db;
    if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
    DataSession session(db, ctx.locale, ctx.ui);
    RunPendingWork(session);

    FilterDialogValues values = OpenFilterDialog(db);
    bool changing = false;
    for (int n = 0; n < 2; ++n) {
      const std::string k = std::to_string(n + 1);
      FilterDialogFilter& f = values.filter[n];
      if (auto field = args.value("--" + k)) {
        f.field = ResolveField(db, *field);
        if (f.field < 0) return UsageError(ctx, *this, "no field " + *field);
        f.enabled = true;
        f.notChecked = false;
        changing = true;
      }
      for (const char* flag : {"--not", "--on", "--off"}) {
        if (!args.has(flag + k)) continue;
        changing = true;
        if (std::string(flag) == "--not") f.notChecked = true;
        if (std::string(flag) == "--on") f.enabled = true;
        if (std::string(flag) == "--off") f.enabled = false;
      }
      std::string error;
      if (!ApplyValues(ctx, args, db, n, f, changing, error)) return UsageError(ctx, *this, error);
    }
    if (args.has("--and") || args.has("--or")) {
      values.orBetween = args.has("--or");
      changing = true;
    }
    if (args.has("--off")) {
      values.filter[0].enabled = values.filter[1].enabled = false;
      changing = true;
    }
    if (changing) {
      AcceptFilterDialog(db, values);
      if (!SaveForCommand(ctx, db)) return kExitFailed;
      values = OpenFilterDialog(db);
    }
    Show(ctx, db, values, RebuildView(db).size());
    return kExitOk;
  }

 private:
  static bool ApplyValues(Context& ctx, const Args& args, const Database& db, int n, FilterDialogFilter& f,
                          bool& changing, std::string& error) {
    const std::string k = std::to_string(n + 1);
    const FilterControls controls = FilterControlsFor(db.schema(), f.field);
    auto given = [&](const std::string& option, std::initializer_list<FilterControls> fits) {
      auto v = args.value("--" + option + k);
      if (!v) return std::optional<std::string>();
      changing = true;
      for (FilterControls c : fits) {
        if (c == controls) return v;
      }
      error = "--" + option + k + " does not apply to a field of type " +
              std::string(FieldTypeLabel(db.schema().field[f.field].type()));
      return std::optional<std::string>();
    };
    if (auto v = given("contains", {FilterControls::MustContain})) f.mustContain = Utf8ToCp1252(*v);
    for (bool low : {true, false}) {
      auto v = given(low ? "low" : "high", {FilterControls::WholeLimits, FilterControls::DecimalLimits,
                                            FilterControls::DateLimits, FilterControls::TimeLimits});
      if (!v) continue;
      if (controls == FilterControls::DateLimits) {
        uint32_t day = 0;
        if (*v != "NO DATE" && *v != "0") {
          auto date = ParseDateText(*v, ctx.locale);
          if (!date) return (error = "not a date: " + *v), false;
          day = DateToDayNumber(*date);
        }
        (low ? f.lowerDay : f.upperDay) = day;
      } else if (controls == FilterControls::TimeLimits) {
        TimeOfDay t{format::kNoTimeHours, 0, 0};
        if (*v != "No Time") {
          auto time = ParseTimeText(*v, ctx.locale);
          if (!time || time->hours > 254 || time->minutes > 59 || time->seconds > 59) {
            return (error = "not a time: " + *v), false;
          }
          t = {uint8_t(time->hours), uint8_t(time->minutes), uint8_t(time->seconds)};
        }
        (low ? f.lowerTime : f.upperTime) = t;
      } else {
        (low ? f.lowerLimit : f.upperLimit) = Utf8ToCp1252(*v);
      }
    }
    if (auto v = given("value", {FilterControls::PopupValue, FilterControls::CheckValue})) {
      if (controls == FilterControls::CheckValue) {
        std::optional<bool> on = *v == "checked" ? true : *v == "unchecked" ? false : ParseSwitch(*v);
        if (!on) return (error = "--value" + k + " takes checked or unchecked"), false;
        f.checked = *on;
      } else if (!PopupChoice(db, f.field, *v, f.popupChoice)) {
        return (error = "no entry " + *v + " in the popup list"), false;
      }
    }
    return error.empty();
  }

  static bool PopupChoice(const Database& db, int field, const std::string& text, int& choice) {
    const auto& items = db.popups()[field].items;
    if (text == "No Value") return (choice = kNoValueChoice), true;
    if (text.size() > 1 && text[0] == '#') {
      auto n = ParseNumber(text.substr(1));
      if (n && *n >= 0 && static_cast<size_t>(*n) < items.size()) return (choice = int(*n)), true;
      return false;
    }
    const std::string wanted = Utf8ToCp1252(text);
    for (size_t i = 0; i < items.size(); ++i) {
      if (items[i] == wanted) return (choice = int(i)), true;
    }
    return false;
  }

  // The values the filter's field type uses, as text.
  static std::string Describe(const Context& ctx, const Database& db, const FilterDialogFilter& f) {
    switch (FilterControlsFor(db.schema(), f.field)) {
      case FilterControls::MustContain:
        return "contains " + Quoted(f.mustContain);
      case FilterControls::WholeLimits:
      case FilterControls::DecimalLimits:
        return Cp1252ToUtf8(f.lowerLimit) + " to " + Cp1252ToUtf8(f.upperLimit);
      case FilterControls::DateLimits:
        return DateText(f.lowerDay, ctx.locale) + " to " + DateText(f.upperDay, ctx.locale);
      case FilterControls::TimeLimits:
        return TimeText24(f.lowerTime) + " to " + TimeText24(f.upperTime);
      case FilterControls::PopupValue:
        return "value " + (f.popupChoice == kNoValueChoice
                               ? std::string("\"No Value\"")
                               : Quoted(PopupText(db.popups()[f.field], f.popupChoice)));
      case FilterControls::CheckValue:
        return f.checked ? "checked" : "unchecked";
      case FilterControls::None:
        break;
    }
    return "(passes every record with a value slot)";
  }

  static void Show(Context& ctx, const Database& db, const FilterDialogValues& v, size_t inView) {
    auto fieldName = [&](int field) {
      return field >= 0 && field < format::kFieldCount ? Cp1252ToUtf8(db.schema().field[field].name.str())
                                                       : std::string();
    };
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginObject();
      j.Key("filters").BeginArray();
      for (const FilterDialogFilter& f : v.filter) {
        j.BeginObject();
        j.Key("enabled").Bool(f.enabled);
        j.Key("not").Bool(f.notChecked);
        j.Key("slot").Number(f.field);
        j.Key("name").String(fieldName(f.field));
        j.Key("test").String(Describe(ctx, db, f));
        j.EndObject();
      }
      j.EndArray();
      j.Key("combine").String(v.orBetween ? "OR" : "AND");
      j.Key("inView").Number(static_cast<int64_t>(inView));
      j.Key("records").Number(static_cast<int64_t>(db.recordCount()));
      j.EndObject();
      j.Finish();
      return;
    }
    for (int n = 0; n < 2; ++n) {
      const FilterDialogFilter& f = v.filter[n];
      ctx.out << "filter " << n + 1 << ": " << (f.enabled ? "on " : "off") << (f.notChecked ? " NOT" : "")
              << " field " << f.field << " \"" << fieldName(f.field) << "\": " << Describe(ctx, db, f) << "\n";
    }
    ctx.out << "combined with " << (v.orBetween ? "OR" : "AND") << "\n"
            << inView << " of " << db.recordCount() << " records in view\n";
  }
};

CX_REGISTER_COMMAND(FilterCommand);

}  // namespace
}  // namespace cx::cli
