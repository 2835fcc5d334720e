// The user's preferences and the recent-files list, kept as named string
// values (the registry-style store behind `Settings`).
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "platform/settings.h"

namespace cx {

// The five flags of the Preferences dialog, with the values a first start
// has.
struct PreferenceFlags {
  bool autoSave = true;       // "Auto save databases when closed"
  bool autoSip = true;        // "Auto show input panel as needed"
  bool allowChecks = true;    // "Allow Checkbox selection in List View"
  bool allowPopups = false;   // "Allow Popup selection in List View"
  bool allowDateTime = false; // "Allow Date/Time selection in List View"
  bool operator==(const PreferenceFlags&) const = default;
};

namespace preference_names {
inline constexpr const char* kAutoSave = "AutoSave";
inline constexpr const char* kAutoSip = "AutoSIP";
inline constexpr const char* kAllowChecks = "AllowChecks";
inline constexpr const char* kAllowPopups = "AllowPopups";
inline constexpr const char* kAllowDateTime = "AllowDateTime";
inline constexpr const char* kLastFileUsed = "LastFileUsed";
inline constexpr const char* kVersion = "Version";
inline constexpr const char* kNoLastFile = "NONE";
}  // namespace preference_names

// The flags are read once when the main window starts and written once when
// the program ends; the dialog changes only the copy held here.
class Preferences {
 public:
  explicit Preferences(Settings& settings) : settings_(settings) {}

  // The five flags and LastFileUsed. A value that is missing or cannot be
  // read keeps the flag's default.
  void Read();
  // The five flags, in the dialog's order, each as "%d".
  void Write() const;

  // LastFileUsed as read: nothing when absent or "NONE".
  std::optional<std::string> lastFileUsed() const;
  // LastFileUsed := `path`, or "NONE" when it is empty.
  void WriteLastFileUsed(const std::string& path);
  // The program's version text, written at every start.
  void WriteVersion(const std::string& version);

  PreferenceFlags flags;

  bool autoSave() const { return flags.autoSave; }
  bool autoSip() const { return flags.autoSip; }
  bool allowChecks() const { return flags.allowChecks; }
  bool allowPopups() const { return flags.allowPopups; }
  bool allowDateTime() const { return flags.allowDateTime; }

 private:
  Settings& settings_;
  std::optional<std::string> lastFileUsed_;
};

// The dialog's labels, in its order (the order Write uses).
struct PreferenceItem {
  const char* valueName;
  const char* label;
  bool PreferenceFlags::*flag;
};
const std::vector<PreferenceItem>& PreferenceItems();

// The program's version text (the About box, the Version value).
const char* ProgramVersion();

// The recently used databases, most recent first: "LastFile0" to
// "LastFile9".
class RecentFiles {
 public:
  static constexpr int kCount = 10;

  explicit RecentFiles(Settings& settings) : settings_(settings) {}

  // Moves `path` to the top (a path already listed, compared without regard
  // to letter case, moves up; a new one pushes the tenth out). All ten
  // values are written back.
  void Add(const std::string& path);
  // Entry `n` (0 to 9); empty when missing.
  std::string Entry(int n) const;
  // The value name of entry `n`: "LastFile%d".
  static std::string ValueName(int n);

  // The "Reopen" submenu: the entries whose file yields a database name.
  struct ReopenEntry {
    int n = 0;          // the entry it opens
    std::string name;   // the database's name (8-bit)
    std::string path;
  };
  std::vector<ReopenEntry> ReopenEntries() const;

  // The start dialog's list: "More files..." first, then the names of the
  // listed files that exist (the filling stops at the first missing value).
  std::vector<std::string> StartList() const;
  // What list entry `index` opens: nothing for entry 0 (the open dialog is
  // shown instead); for entry i >= 1 the path of entry i - 1, by position,
  // even when an earlier file was skipped in the list.
  std::optional<std::string> StartChoice(int index) const;

 private:
  Settings& settings_;
};

inline constexpr const char* kMoreFilesEntry = "More files...";

// The database name stored in a file's header; nothing when the file
// cannot be read as a database.
std::optional<std::string> DatabaseNameOfFile(const std::string& path);

}  // namespace cx
