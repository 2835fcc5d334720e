#include "app/view_levels.h"

#include "ops/database_settings.h"

namespace cx {

void ViewLevelStack::OpenRoot(std::unique_ptr<Database> db) {
  Clear();
  ViewLevel& root = levels_[0];
  root.owned = std::move(db);
  root.db = root.owned.get();
}

void ViewLevelStack::Clear() {
  // Higher levels first: a shared level may point at a database owned
  // beneath it.
  for (int n = kMaxLevels - 1; n >= 0; --n) levels_[n] = ViewLevel();
  current_ = 0;
}

bool ViewLevelStack::Push(LinkedDatabase linked, LevelMode mode, int linkField) {
  if (!linked || AtTop() || !shown().open()) return false;
  ViewLevel& next = levels_[current_ + 1];
  next = ViewLevel();
  next.db = &linked.db();
  next.link = linked.context();
  next.owned = linked.Release();
  next.mode = mode;
  next.linkField = linkField;
  ++current_;
  return true;
}

std::unique_ptr<Database> ViewLevelStack::Pop() {
  if (current_ == 0) return nullptr;
  std::unique_ptr<Database> released = std::move(levels_[current_].owned);
  levels_[current_] = ViewLevel();
  --current_;
  return released;
}

Database* ViewLevelStack::FindOpen(const std::string& path) {
  for (int n = 0; n <= current_; ++n) {
    if (levels_[n].db && SameDatabasePath(levels_[n].db->path(), path)) return levels_[n].db;
  }
  return nullptr;
}

std::string ViewLevelStack::StatusLabel() const {
  const ViewLevel& top = shown();
  const bool filtered = top.open() && LoadFilterSettings(top.db->schema()).AnyEnabled();
  if (current_ > 0) return filtered ? "Link+Filter" : "Linked";
  return filtered ? "Filtered" : "";
}

std::string ViewLevelStack::TitleLabel(size_t shownCount) const {
  const ViewLevel& top = shown();
  if (!top.open()) return "Cardovex";
  return top.db->Name() + (top.db->changed() ? "*" : "") + " (" + std::to_string(shownCount) +
         "/" + std::to_string(top.db->recordCount()) + ")";
}

TapAction ViewLevelStack::ActionForTap() const {
  if (current_ == 0) return TapAction::Edit;
  switch (shown().mode) {
    case LevelMode::Choose: return TapAction::Choose;
    case LevelMode::Reassign: return TapAction::AskReassign;
    default: return TapAction::Edit;
  }
}

}  // namespace cx
