// The logic of the "Edit Database" dialog and the two it opens for the
// whole database: the name, the author information and the display order
// of the fields.
#pragma once

#include <array>
#include <string>
#include <vector>

#include "engine/format.h"
#include "engine/record_store.h"

namespace cx {

inline constexpr size_t kDatabaseNameChars = 19;

// The "Edit Fields:" list: the names of all 30 slots in slot order, unused
// ones included.
std::vector<std::string> FieldListEntries(const Schema& schema);

// OK of "Edit Database": the name (at most 19 characters) replaces the
// database's name and the database is marked changed. The file keeps its
// file name.
void SetDatabaseName(Database& db, const std::string& name);

// The "Author Information" dialog.
struct AuthorInfo {
  std::string author;    // at most 39 characters kept
  std::string comments;  // at most 69 characters kept
};
AuthorInfo LoadAuthorInfo(const Schema& schema);
void ApplyAuthorInfo(Database& db, const AuthorInfo& info);

// The "Edit Field Order" dialog: a copy of the display order with a
// selection that the two arrows move.
class FieldOrderEditor {
 public:
  explicit FieldOrderEditor(const Schema& schema);

  const std::array<uint8_t, format::kFieldCount>& order() const { return order_; }
  // The field names in the working order (30 entries).
  std::vector<std::string> ListTexts() const;

  int selection() const { return selection_; }
  void Select(int position);  // -1 for none; out of range clears it
  // The up arrow shows while the selection is at position 1 or later; the
  // down arrow while it is at position 28 or earlier.
  bool CanMoveUp() const { return selection_ >= 1; }
  bool CanMoveDown() const { return selection_ >= 0 && selection_ <= format::kFieldCount - 2; }
  // Swap the selected entry with its neighbour; the selection follows it.
  // False (nothing moves) when the arrow is not offered.
  bool MoveUp();
  bool MoveDown();

  // OK: the order replaces the schema's and the database is marked changed.
  void Commit(Database& db) const;

 private:
  const Schema& schema_;
  std::array<uint8_t, format::kFieldCount> order_{};
  int selection_ = -1;
};

}  // namespace cx
