// The commands of the main window: one table the menus, the tool bar and
// the shortcuts are built from, which access check each command asks, and
// the rules that enable or grey them. The GUI asks MenuStateFor after every
// change (not only when a menu opens), so shortcuts obey the same rules.
#pragma once

#include <array>
#include <string>
#include <vector>

#include "platform/ui_port.h"

namespace cx {

class Document;
class Workspace;

enum class Command {
  New,
  Open,
  MoreFiles,
  Save,
  SaveAs,
  Close,
  Preferences,
  Exit,
  NewRecord,
  Find,
  FindAgain,
  Filter,
  Sort,
  DisableFilters,
  Recalculate,
  DeleteRecords,
  MoveRecords,
  CopyRecords,
  ExportRecords,
  ImportRecords,
  PrintRecords,
  DBProperties,
  RunReport,
  Back,
  BeamRecords,
  BeamDatabase,
  Receive,
  Help,
  About,
};
inline constexpr int kCommandCount = static_cast<int>(Command::About) + 1;

enum class MenuGroup { File, Records, Database, Beam, Help };

struct CommandInfo {
  Command id;
  const char* text;      // the menu text, exactly as shown
  MenuGroup menu;
  int accessCheck;       // the guarded operation asked first, -1 none
  const char* shortcut;  // a standard key sequence in portable text, "" none
  bool needsDatabase;    // greyed while nothing is open
  bool separatorBefore;  // a group of its own in its menu
};

// Every command, in menu order within each menu.
const std::vector<CommandInfo>& CommandTable();
const CommandInfo& InfoOf(Command command);

// The heading menu of a list column, in its order.
enum class HeadingCommand { SortForward, SortReverse, FieldProperties, RunReport, HideField };
struct HeadingEntry {
  HeadingCommand id;
  const char* text;
  int accessCheck;  // -1 none
};
const std::vector<HeadingEntry>& HeadingMenu();

// What is enabled at one moment.
struct MenuState {
  std::array<bool, kCommandCount> enabled{};
  bool operator[](Command c) const { return enabled[static_cast<int>(c)]; }
};

// The rules: with a database open the commands that work on it are enabled,
// Save only while it has unsaved changes; with none open they are greyed.
// The new-record button needs an open database, the back button a level
// above 0. The other commands are always enabled.
MenuState MenuStateFor(bool open, bool changed, int level);
MenuState MenuStateFor(const Workspace& workspace);

// Asks the access check the command (or heading entry) stands behind, on
// the shown database; true when it may go on (the check told the user
// otherwise). Commands without a check always may.
bool CommandAllowed(Command command, const Document& doc, UiPort& ui);
bool CommandAllowed(HeadingCommand command, const Document& doc, UiPort& ui);

// A user's text put into a menu or button: "&" doubled so it shows as is.
std::string EscapeMnemonics(const std::string& text);

// The start dialog's texts.
namespace start_dialog_texts {
inline constexpr const char* kCaption = "Cardovex";
inline constexpr const char* kHeading = "Select an option";
inline constexpr const char* kCreateNew = "Create a new database";
inline constexpr const char* kOr = "Or";
inline constexpr const char* kOpenExisting = "Open an existing file";
}  // namespace start_dialog_texts

}  // namespace cx
