#include "gui/main/record_list_model.h"

#include "engine/field_types.h"
#include "gui/common/text.h"

namespace cx::gui {

RecordListModel::RecordListModel(QObject* parent) : QAbstractTableModel(parent) {}

void RecordListModel::SetDocument(Document* doc) {
  beginResetModel();
  doc_ = doc;
  ReadColumns();
  endResetModel();
}

void RecordListModel::Reset() {
  beginResetModel();
  ReadColumns();
  endResetModel();
}

void RecordListModel::ReadColumns() {
  columns_.clear();
  checkBox_.clear();
  if (!doc_) return;
  columns_ = doc_->Columns();
  for (const ListColumn& c : columns_) {
    checkBox_.push_back(doc_->db().schema().field[c.field].type() == FieldType::CheckBox);
  }
}

void RecordListModel::RecordChanged(size_t recordIndex) {
  if (!doc_ || columns_.empty()) return;
  const int row = doc_->rowOf(recordIndex);
  if (row < 0) return;
  emit dataChanged(index(row, 0), index(row, columnCount() - 1));
}

int RecordListModel::FieldOfColumn(int column) const {
  if (column < 0 || column >= static_cast<int>(columns_.size())) return -1;
  return columns_[column].field;
}

int RecordListModel::ColumnOfField(int field) const {
  for (size_t i = 0; i < columns_.size(); ++i) {
    if (columns_[i].field == field) return static_cast<int>(i);
  }
  return -1;
}

int RecordListModel::ColumnPixels(int column) const {
  if (column < 0 || column >= static_cast<int>(columns_.size())) return 0;
  return columns_[column].pixels;
}

int RecordListModel::rowCount(const QModelIndex& parent) const {
  if (parent.isValid() || !doc_) return 0;
  return static_cast<int>(doc_->rowCount());
}

int RecordListModel::columnCount(const QModelIndex& parent) const {
  if (parent.isValid()) return 0;
  return static_cast<int>(columns_.size());
}

QVariant RecordListModel::data(const QModelIndex& index, int role) const {
  if (!doc_ || !index.isValid() || index.row() >= rowCount()) return {};
  const int column = index.column();
  if (column >= static_cast<int>(columns_.size())) return {};
  switch (role) {
    case Qt::DisplayRole:
    case Qt::ToolTipRole: {
      const QString text = FromDb(doc_->ValueText(doc_->recordAt(index.row()), columns_[column].field));
      // A tip only where the cell may cut the text off.
      if (role == Qt::ToolTipRole && (checkBox_[column] || text.isEmpty())) return {};
      return text;
    }
    case IsCheckBoxRole: return bool(checkBox_[column]);
    case FieldRole: return columns_[column].field;
    case RecordRole: return static_cast<int>(doc_->recordAt(index.row()));
    default: return {};
  }
}

QVariant RecordListModel::headerData(int section, Qt::Orientation orientation, int role) const {
  if (orientation != Qt::Horizontal || !doc_) return QAbstractTableModel::headerData(section, orientation, role);
  if (section < 0 || section >= static_cast<int>(columns_.size())) return {};
  if (role == Qt::DisplayRole) {
    return FromDb(doc_->db().schema().field[columns_[section].field].name.str());
  }
  if (role == Qt::TextAlignmentRole) return QVariant::fromValue(Qt::AlignLeft | Qt::AlignVCenter);
  return {};
}

}  // namespace cx::gui
