#include "app/commands.h"

#include "app/document.h"
#include "design/security.h"

namespace cx {

namespace {
constexpr int kNone = -1;
}  // namespace

const std::vector<CommandInfo>& CommandTable() {
  using C = Command;
  using M = MenuGroup;
  static const std::vector<CommandInfo> table = {
      {C::New, "New", M::File, kNone, "Ctrl+N", false, false},
      {C::Open, "Open...", M::File, kNone, "Ctrl+O", false, false},
      {C::MoreFiles, "More Files...", M::File, kNone, "", false, false},
      {C::Save, "Save", M::File, kNone, "Ctrl+S", true, true},
      {C::SaveAs, "Save As...", M::File, kNone, "Ctrl+Shift+S", true, false},
      {C::Close, "Close", M::File, kNone, "Ctrl+W", true, false},
      {C::Preferences, "Preferences...", M::File, kNone, "", false, true},
      {C::Exit, "Exit", M::File, kNone, "Ctrl+Q", false, true},
      {C::NewRecord, "New Record", M::Records, secured::kAddRecords, "Ins", true, false},
      {C::Find, "Find...", M::Records, kNone, "Ctrl+F", true, true},
      {C::FindAgain, "Find Again", M::Records, kNone, "F3", true, false},
      {C::Filter, "Filter...", M::Records, kNone, "", true, true},
      {C::Sort, "Sort...", M::Records, kNone, "", true, false},
      {C::DisableFilters, "Disable both filters", M::Records, kNone, "", true, false},
      {C::Recalculate, "Recalculate", M::Records, kNone, "", true, false},
      {C::DeleteRecords, "Delete Records...", M::Records, secured::kDeleteRecords, "Del", true, true},
      {C::MoveRecords, "Move Records To...", M::Records, kNone, "", true, true},
      {C::CopyRecords, "Copy Records To...", M::Records, kNone, "", true, false},
      {C::ExportRecords, "Export Records...", M::Records, kNone, "", true, true},
      {C::ImportRecords, "Import Records...", M::Records, secured::kAddRecords, "", true, false},
      {C::PrintRecords, "Print Records...", M::Records, kNone, "", true, false},
      {C::DBProperties, "DB Properties...", M::Database, secured::kDBProperties, "", true, false},
      {C::RunReport, "Run Report...", M::Database, kNone, "", true, false},
      {C::Back, "Back to Parent Database", M::Database, kNone, "Alt+Left", false, true},
      {C::BeamRecords, "Beam Records...", M::Beam, secured::kBeamData, "", true, false},
      {C::BeamDatabase, "Beam Database...", M::Beam, secured::kBeamData, "", true, false},
      {C::Receive, "Receive Via Infrared...", M::Beam, kNone, "", false, true},
      {C::Help, "Cardovex Help", M::Help, kNone, "F1", false, false},
      {C::About, "About", M::Help, kNone, "", false, true},
  };
  return table;
}

const CommandInfo& InfoOf(Command command) {
  for (const CommandInfo& info : CommandTable()) {
    if (info.id == command) return info;
  }
  return CommandTable().front();
}

const std::vector<HeadingEntry>& HeadingMenu() {
  using H = HeadingCommand;
  static const std::vector<HeadingEntry> entries = {
      {H::SortForward, "Sort Forward", kNone},
      {H::SortReverse, "Sort Reverse", kNone},
      {H::FieldProperties, "Field Properties", secured::kDBProperties},
      {H::RunReport, "Run Report", kNone},
      {H::HideField, "Hide Field", kNone},
  };
  return entries;
}

MenuState MenuStateFor(bool open, bool changed, int level) {
  MenuState state;
  for (const CommandInfo& info : CommandTable()) {
    state.enabled[static_cast<int>(info.id)] = open || !info.needsDatabase;
  }
  state.enabled[static_cast<int>(Command::Save)] = open && changed;
  state.enabled[static_cast<int>(Command::Back)] = open && level > 0;
  return state;
}

MenuState MenuStateFor(const Workspace& workspace) {
  const Document* doc = workspace.shown();
  return MenuStateFor(doc != nullptr, doc && doc->changed(), workspace.level());
}

bool CommandAllowed(Command command, const Document& doc, UiPort& ui) {
  const int op = InfoOf(command).accessCheck;
  return op == kNone || Allowed(CheckAccess(doc.db(), op, ui));
}

bool CommandAllowed(HeadingCommand command, const Document& doc, UiPort& ui) {
  for (const HeadingEntry& entry : HeadingMenu()) {
    if (entry.id == command) return entry.accessCheck == kNone || Allowed(CheckAccess(doc.db(), entry.accessCheck, ui));
  }
  return true;
}

std::string EscapeMnemonics(const std::string& text) {
  std::string out;
  out.reserve(text.size());
  for (char c : text) {
    if (c == '&') out += '&';
    out += c;
  }
  return out;
}

}  // namespace cx
