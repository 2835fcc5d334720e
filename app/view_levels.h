// The stack of view levels the main view shows: level 0 is the database the
// user opened, each level above it a linked database opened from a Link
// field of the level beneath. The view always shows the top level; closing
// it returns to the one beneath. Each level remembers why it was opened.
#pragma once

#include <array>
#include <memory>
#include <optional>
#include <string>

#include "engine/record_store.h"
#include "ops/links.h"
#include "ops/view.h"

namespace cx {

enum class LevelMode {
  Browse,    // an ordinary look at the linked records
  Choose,    // a record is picked for a DB Popup or Link field
  Reassign,  // a record is picked to which a linked record is to be moved
};

struct ViewLevel {
  Database* db = nullptr;            // the database shown at this level
  std::unique_ptr<Database> owned;   // set when the level loaded it itself
  LevelMode mode = LevelMode::Browse;
  std::optional<LinkContext> link;   // levels above 0 only
  int linkField = -1;                // the Link field beneath that led here
  size_t currentRecord = 0;          // this level's current record

  bool open() const { return db != nullptr; }
  const LinkRestriction* restriction() const { return link ? &link->restriction : nullptr; }
};

// What a tap on a row does at the shown level.
enum class TapAction {
  Edit,          // the ordinary tap (in-place edit or the record editor)
  Choose,        // hand the record back and close the level
  AskReassign,   // ask "Would you like to reassign the linked record to this record?"
};

class ViewLevelStack {
 public:
  static constexpr int kMaxLevels = 20;

  // The shown level's number, 0 to 19.
  int current() const { return current_; }
  ViewLevel& shown() { return levels_[current_]; }
  const ViewLevel& shown() const { return levels_[current_]; }
  ViewLevel& level(int n) { return levels_[n]; }
  const ViewLevel& level(int n) const { return levels_[n]; }
  bool AtTop() const { return current_ == kMaxLevels - 1; }

  // Level 0 gets the database the user opened; every level is cleared
  // first (their databases are the caller's to save beforehand).
  void OpenRoot(std::unique_ptr<Database> db);
  // Releases every level (level 0 included); the view shows nothing.
  void Clear();

  // Opens a linked database on top of the shown level, remembering the
  // shown level's current record. False when all 20 levels are in use.
  bool Push(LinkedDatabase linked, LevelMode mode, int linkField);
  // Closes the shown level (above 0): returns the database it loaded
  // itself (null when it was shared), and the level beneath is shown again
  // with its current record as it was when the link was followed.
  std::unique_ptr<Database> Pop();

  // A database already open at some level, found by its path (the lookup
  // linked work uses before loading a file again).
  Database* FindOpen(const std::string& path);

  // The status label: "Link+Filter", "Filtered", "Linked" or empty.
  std::string StatusLabel() const;
  // The title label: the name, "*" when changed, shown and total counts;
  // "Cardovex" when nothing is open.
  std::string TitleLabel(size_t shownCount) const;
  // The back button is enabled while a level above 0 is shown.
  bool BackEnabled() const { return current_ > 0; }

  TapAction ActionForTap() const;

 private:
  std::array<ViewLevel, kMaxLevels> levels_{};
  int current_ = 0;
};

namespace view_level_messages {
inline constexpr const char* kReassignQuestion =
    "Would you like to reassign the linked record to this record?";
}  // namespace view_level_messages

}  // namespace cx
