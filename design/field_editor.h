// The logic of the "Edit Field" dialog: loading one field slot's settings
// into the values its controls show, the side effects of picking another
// type, and applying the settings (with the type-change questions and the
// rewriting of every record) when the user presses OK.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "design/type_change.h"
#include "engine/record_store.h"
#include "ops/session.h"

namespace cx {

// What the dialog's controls hold. List selections are list indexes.
struct FieldSettings {
  std::string name;            // "Field Name", at most 19 characters kept
  int type = 0;                // "Field Type" entry; -1 when none is selected
  int maxCharacters = 40;      // "Max Characters" as entered
  int places = 4;              // "Places after decimal" entry, 0 to 4
  int pixelsShown = 87;        // "Pixels Shown" as entered
  bool visible = true;
  bool exportPrint = true;
  bool popupsAppend = false;
  int defaultValue = 0;        // "Default Value" entry; the last one is "No Value"
  int behavior = 1;            // date or time "Behavior" entry
  std::string otherDatabase;   // at most 19 characters kept
  int otherFieldNumber = 1;    // "Other Field #" as shown (slot + 1)
  int group = 0;               // "Group (0=none)"
  int showValueFrom = 0;       // 0 "No Field", n: slot n - 1
  int value1 = 0;              // 0 "No Field", n: slot n - 1
  int value2 = 0;
  std::string constant1;       // at most 8 characters kept
  std::string constant2;
  bool prevRecord1 = false;
  bool prevRecord2 = false;
  int operation = 0;           // "Operation" entry, 0 to 6
  int resultFormat = 0;        // "Result Format" entry, 0 to 6
};

// "Edit Field %d" and "Field %d Name", with the slot counted from 1.
std::string FieldEditorTitle(int slot);
std::string FieldNameLabel(int slot);

// "No Field" and the names of the 30 slots, in slot order: the entries of
// "Show Value From", "Value 1" and "Value 2".
std::vector<std::string> FieldChoiceList(const Schema& schema);
// The field's popup values in order, then "No Value": the "Default Value"
// entries.
std::vector<std::string> DefaultValueList(const Database& db, int slot);

// A numeric edit's text as the dialog reads it: the leading decimal digits
// (a sign allowed), anything else reading as 0.
int ReadNumberEdit(std::string_view text);

// Width conversions between the stored units and the pixels shown.
int StoredWidthFromPixels(int pixels);  // x 0.6666666666666666, truncated, at most 160
int PixelsFromStoredWidth(int width);   // x 1.5, truncated

// Loading the dialog for slot `slot`.
FieldSettings LoadFieldSettings(const Database& db, int slot);

// Picking another entry of the type list: re-lays the controls with the
// dialog's side effects (a Pop-Up chosen anew selects "No Value"; Note, or
// leaving Note for Text, Integer, Float or DB Popup, turns "Popups Append"
// off). `previousType` is the type last shown.
void ChooseFieldType(FieldSettings& settings, int previousType, const Database& db, int slot);

// The "..." button beside "Other Database": the database name stored in the
// chosen file's header (not its file name) goes into Other Database. False,
// leaving the settings as they were, when the header cannot be read.
bool PickOtherDatabase(const std::string& path, FieldSettings& settings);

enum class ApplyResult {
  Stored,          // the settings were stored
  NoTypeSelected,  // nothing stored
  Declined,        // the data-loss question was answered No: nothing stored
};

struct FieldApplyOutcome {
  ApplyResult result = ApplyResult::Stored;
  TypeChange change = TypeChange::Keep;
  bool converted = false;      // the records were rewritten
  ConversionOutcome conversion;
};

// The type-change class that OK would act on: "keep" for a database
// without records or an unchanged type.
TypeChange PendingTypeChange(const Database& db, int slot, int newType);

// OK: classifies a type change, asks the data-loss question when data would
// be lost (a No stores nothing), converts every record where needed, stores
// the settings with their clamps, brings calculated fields up to date and
// marks the database changed (also after a No).
FieldApplyOutcome ApplyFieldSettings(DataSession& session, int slot, const FieldSettings& settings);

}  // namespace cx
