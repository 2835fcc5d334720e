// add FILE FIELD=VALUE... and edit FILE INDEX FIELD=VALUE...: one record
// typed in as the record editor takes it, then stored as its OK stores it.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/command_document.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "cli/record_values.h"

namespace cx::cli {
namespace {

constexpr const char* kValueHelp =
    "FIELD is a slot number (0-29) or a field name; VALUE is typed as in the\n"
    "record editor:\n"
    "  Text, DB Popup        the text (line breaks become blanks)\n"
    "  Note                  the text, line breaks kept\n"
    "  Integer               a whole number; Float: a number with \".\" or the\n"
    "                        --decimal separator\n"
    "  Check-Box             1 or 0 (yes/no, true/false, on/off)\n"
    "  Pop-Up                an entry's text (case ignored) or \"No Value\"\n"
    "  Date                  in the --date-format order, or YYYY-MM-DD; empty or\n"
    "                        \"NO DATE\" for no date\n"
    "  Time                  in the --time-format, e.g. 14:30 or 2:30 PM; empty or\n"
    "                        \"No Time\" for no time\n"
    "Unique, Link, Linked, Calculated and Image fields are filled in by the\n"
    "program and take no VALUE, nor do dates and times whose Behavior fills\n"
    "them in when the record is added or modified. The record is placed in sorted order and the\n"
    "calculated fields brought up to date, then FILE is saved. A VALUE that does\n"
    "not convert is an error (exit status 1) and FILE is left as it was.\n";

// Types every assignment into the form; false after the message.
bool TypeAll(Context& ctx, RecordForm& form, const std::vector<FieldAssignment>& values) {
  for (const FieldAssignment& a : values) {
    std::string error;
    if (!TypeValue(form, ctx.locale, a.field, a.value, error)) {
      Failure(ctx, error);
      return false;
    }
  }
  return true;
}

void PrintIndex(Context& ctx, const char* verb, size_t index) {
  if (ctx.json) {
    JsonWriter j(ctx.out);
    j.BeginObject().Key("index").Number(static_cast<int64_t>(index)).EndObject();
    j.Finish();
    return;
  }
  ctx.out << "record " << index << " " << verb << "\n";
}

class AddCommand : public Command {
 public:
  std::string name() const override { return "add"; }
  std::string summary() const override { return "add a record with the values given"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json", "--password"})
        .Positional("FILE")
        .Positional("FIELD=VALUE", kAnyNumber)
        .About(std::string("Adds a record (needs the \"Add Records\" access). Fields not named get a\n"
                           "new record's defaults: the Pop-Up default entry, today for \"Current\n"
                           "Date\" dates, new numbers for Unique and Link fields.\n") +
               kValueHelp + "Prints the new record's index (with --json: {\"index\": N}).\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    Database db;
    if (!OpenForCommand(ctx, p[0], db)) return kExitFailed;
    std::vector<FieldAssignment> values;
    std::string error;
    if (!ReadAssignments(db, {p.begin() + 1, p.end()}, values, error)) return UsageError(ctx, *this, error);
    if (!PassAccessCheck(ctx, db, secured::kAddRecords)) return kExitFailed;

    CommandDocument cd(ctx, db);
    RecordForm form(cd.doc().session(), kNewRecordIndex, cd.clock());
    if (!TypeAll(ctx, form, values)) return kExitFailed;
    form.PrepareForSave();
    const StoreResult stored = cd.doc().StoreRecord(kNewRecord, form.Stored(), form.ModifiedFields());
    if (!stored || !SaveForCommand(ctx, db)) return kExitFailed;
    PrintIndex(ctx, "added", stored.index);
    return kExitOk;
  }
};

class EditCommand : public Command {
 public:
  std::string name() const override { return "edit"; }
  std::string summary() const override { return "change the named fields of one record"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json", "--password"})
        .Positional("FILE")
        .Positional("INDEX")
        .Positional("FIELD=VALUE", kOneOrMore)
        .About(std::string("Changes the named fields of record INDEX (as 'records' numbers them;\n"
                           "needs the \"Edit Records\" access); every other value of the record stays\n"
                           "as it was, byte for byte. Date and time fields set to be filled in when a\n"
                           "record is modified are filled in.\n") +
               kValueHelp +
               "Prints the record's index afterwards, which the sort may have moved (with\n"
               "--json: {\"index\": N}). Values equal to those stored change nothing and\n"
               "FILE is not written.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    const std::optional<long> n = ParseNumber(p[1]);
    if (!n || *n < 0) return UsageError(ctx, *this, "INDEX is a record index (0, 1, ...)");
    Database db;
    if (!OpenForCommand(ctx, p[0], db)) return kExitFailed;
    if (static_cast<size_t>(*n) >= db.recordCount()) {
      return Failure(ctx, "there is no record " + p[1] + "; the database has " +
                              std::to_string(db.recordCount()) + " records");
    }
    std::vector<FieldAssignment> values;
    std::string error;
    if (!ReadAssignments(db, {p.begin() + 2, p.end()}, values, error)) return UsageError(ctx, *this, error);
    if (!PassAccessCheck(ctx, db, secured::kEditRecords)) return kExitFailed;

    CommandDocument cd(ctx, db);
    RecordForm form(cd.doc().session(), static_cast<size_t>(*n), cd.clock());
    if (!TypeAll(ctx, form, values)) return kExitFailed;
    if (!form.AnyModified()) {
      PrintIndex(ctx, "unchanged", form.index());
      return kExitOk;
    }
    form.PrepareForSave();
    const StoreResult stored = cd.doc().StoreRecord(form.index(), form.Stored(), form.ModifiedFields());
    if (!stored || !SaveForCommand(ctx, db)) return kExitFailed;
    PrintIndex(ctx, "changed", stored.index);
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(AddCommand);
CX_REGISTER_COMMAND(EditCommand);

}  // namespace
}  // namespace cx::cli
