// filter FILE [...]: show the two filters, or set them as the "Edit
// Filters" dialog's OK does.
#include <charconv>
#include <ostream>
#include <utility>

#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "cli/query.h"
#include "cli/typed_value.h"
#include "engine/value_text.h"
#include "ops/database_settings.h"
#include "ops/filter_dialog.h"
#include "ops/view.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

std::string Quoted(const std::string& cp1252) { return "\"" + Cp1252ToUtf8(cp1252) + "\""; }

// In the global options' time format, so that what is shown can be typed
// back as a limit.
std::string LimitTimeText(const TimeOfDay& t, const LocaleInfo& locale) {
  return Cp1252ToUtf8(TimeText(t.seconds, t.minutes, t.hours, locale));
}

class FilterCommand : public Command {
 public:
  std::string name() const override { return "filter"; }
  std::string summary() const override { return "show or set the two filters"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FILE")
        .Form({"FILE"})
        .Form({"FILE", "--filter1", "--filter2", "--not1", "--not2", "--or"})
        .Form({"FILE", "(--off)"})
        .About("Without options: shows both filters and how many records are in view.\n"
               "Otherwise stores the filters as the Edit Filters dialog's OK does, saves FILE\n"
               "and shows the result. The command line is the whole dialog: a filter not\n"
               "named is switched off (its settings are kept), NOT and OR are off unless\n"
               "given.\n")
        .Option("--filter1", "COND", "switch filter 1 on with COND")
        .Option("--filter2", "COND", "switch filter 2 on with COND")
        .Flag("--not1", "filter 1's \"NOT\" (needs --filter1)")
        .Flag("--not2", "filter 2's \"NOT\" (needs --filter2)")
        .Flag("--or", "combine the filters with OR (otherwise AND)")
        .Flag("--off", "switch both filters off, changing nothing else")
        .Notes("COND is FIELD=VALUE, FIELD a slot number (0-29) or a field name, VALUE by\n"
               "the field's type:\n"
               "  Text, Note, DB Popup, Linked   the \"Must Contain\" text, case ignored\n"
               "                                 (empty: only records whose value is empty)\n"
               "  Integer, Unique, Float and numeric Calculated   LOW..HIGH, e.g. 10..20\n"
               "                                 or -1.5..2.25 (\".\" as the point)\n"
               "  Date, Time and date or time Calculated   LOW..HIGH in the date or time\n"
               "                                 format of the global options\n"
               "                                 (--date-format, --time-format)\n"
               "  Pop-Up                         an entry's text, or \"No Value\" (on filter\n"
               "                                 2 that matches no record)\n"
               "  Check-Box                      1 (checked) or 0 (not checked)\n"
               "'records FILE' then lists exactly the records in view.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const bool setting = args.has("--filter1") || args.has("--filter2") || args.has("--not1") ||
                         args.has("--not2") || args.has("--or");
    if (args.has("--off") && setting) return UsageError(ctx, *this, "--off goes alone");
    for (const char* k : {"1", "2"}) {
      const std::string filter = std::string("--filter") + k, negate = std::string("--not") + k;
      if (args.has(negate) && !args.has(filter)) return UsageError(ctx, *this, negate + " needs " + filter);
    }
    Database db;
    DataSession session(db, ctx.locale, ctx.ui);
    if (!OpenForCommand(ctx, args.positional()[0], session)) return kExitFailed;

    if (args.has("--off")) {
      DisableBothFilters(db);
    } else if (setting) {
      FilterDialogValues values = OpenFilterDialog(db);
      for (int n = 0; n < 2; ++n) {
        const std::string k = std::to_string(n + 1);
        FilterDialogFilter& f = values.filter[n];
        f.enabled = args.has("--filter" + k);
        f.notChecked = args.has("--not" + k);
        if (!f.enabled) continue;
        std::string error;
        if (!ReadFilterCondition(ctx, db, *args.value("--filter" + k), f, error)) {
          return UsageError(ctx, *this, "--filter" + k + ": " + error);
        }
      }
      values.orBetween = args.has("--or");
      AcceptFilterDialog(db, values);
    }
    const bool changed = setting || args.has("--off");
    if (changed && !SaveForCommand(ctx, db)) return kExitFailed;
    // The open built the view already; only new filters need it again.
    if (changed) session.view = RebuildView(db, session.Link());
    Show(ctx, db, OpenFilterDialog(db), session.view.size());
    return kExitOk;
  }

 private:
  // The values the filter's field type uses, as text.
  static std::string Describe(const Context& ctx, const Database& db, const FilterDialogFilter& f) {
    switch (FilterControlsFor(db.schema(), f.field)) {
      case FilterControls::MustContain:
        return "contains " + Quoted(f.mustContain);
      case FilterControls::WholeLimits:
      case FilterControls::DecimalLimits:
        return Cp1252ToUtf8(f.lowerLimit) + " to " + Cp1252ToUtf8(f.upperLimit);
      case FilterControls::DateLimits:
        return Cp1252ToUtf8(DateText(f.lowerDay, ctx.locale) + " to " + DateText(f.upperDay, ctx.locale));
      case FilterControls::TimeLimits:
        return LimitTimeText(f.lowerTime, ctx.locale) + " to " + LimitTimeText(f.upperTime, ctx.locale);
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

  // "low" and "high" of a range test, the same under any conventions.
  static void WriteLimits(JsonWriter& j, const Database& db, const FilterDialogFilter& f) {
    switch (FilterControlsFor(db.schema(), f.field)) {
      case FilterControls::WholeLimits:
      case FilterControls::DecimalLimits:
        for (const auto& [key, text] : {std::pair{"low", &f.lowerLimit}, std::pair{"high", &f.upperLimit}}) {
          double number = 0;
          auto [ptr, ec] = std::from_chars(text->data(), text->data() + text->size(), number);
          j.Key(key);
          if (!text->empty() && ec == std::errc() && ptr == text->data() + text->size()) {
            j.Double(number);
          } else {
            j.String(Cp1252ToUtf8(*text));
          }
        }
        return;
      case FilterControls::DateLimits:
        j.Key("low").String(IsoDateText(f.lowerDay));
        j.Key("high").String(IsoDateText(f.upperDay));
        return;
      case FilterControls::TimeLimits:
        j.Key("low").String(ClockText(f.lowerTime.hours, f.lowerTime.minutes, f.lowerTime.seconds));
        j.Key("high").String(ClockText(f.upperTime.hours, f.upperTime.minutes, f.upperTime.seconds));
        return;
      default:
        return;
    }
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
        WriteLimits(j, db, f);
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
