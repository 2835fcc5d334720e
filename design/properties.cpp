#include "design/properties.h"

#include <utility>

namespace cx {

std::vector<std::string> FieldListEntries(const Schema& schema) {
  std::vector<std::string> out;
  for (const FieldDef& f : schema.field) out.push_back(f.name.str());
  return out;
}

void SetDatabaseName(Database& db, const std::string& name) {
  db.header().SetName(name.substr(0, kDatabaseNameChars));
  db.MarkChanged();
}

AuthorInfo LoadAuthorInfo(const Schema& schema) {
  return {schema.author.str(), schema.comments.str()};
}

void ApplyAuthorInfo(Database& db, const AuthorInfo& info) {
  db.schema().author.set(info.author);
  db.schema().comments.set(info.comments);
  db.MarkChanged();
}

FieldOrderEditor::FieldOrderEditor(const Schema& schema)
    : schema_(schema), order_(schema.fieldOrder) {}

std::vector<std::string> FieldOrderEditor::ListTexts() const {
  std::vector<std::string> out;
  for (uint8_t slot : order_) {
    out.push_back(slot < format::kFieldCount ? schema_.field[slot].name.str() : std::string());
  }
  return out;
}

void FieldOrderEditor::Select(int position) {
  selection_ = position >= 0 && position < format::kFieldCount ? position : -1;
}

bool FieldOrderEditor::MoveUp() {
  if (!CanMoveUp()) return false;
  std::swap(order_[selection_], order_[selection_ - 1]);
  --selection_;
  return true;
}

bool FieldOrderEditor::MoveDown() {
  if (!CanMoveDown()) return false;
  std::swap(order_[selection_], order_[selection_ + 1]);
  ++selection_;
  return true;
}

void FieldOrderEditor::Commit(Database& db) const {
  db.schema().fieldOrder = order_;
  db.MarkChanged();
}

}  // namespace cx
