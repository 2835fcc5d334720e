// The list's rows and columns, read from the shown document on demand: the
// model holds only the column mapping, so its cost follows the rows on
// screen, never the records in the file. Every change of rows or columns is
// a model reset (cheaper for the view than row-by-row inserts).
#pragma once

#include <QAbstractTableModel>
#include <vector>

#include "app/document.h"

namespace cx::gui {

class RecordListModel : public QAbstractTableModel {
  Q_OBJECT

 public:
  // Extra roles the delegate reads.
  enum Role {
    IsCheckBoxRole = Qt::UserRole + 1,  // bool: the column shows a Check-Box field
    FieldRole,                          // int: the field slot of the column
    RecordRole,                         // int: the record index of the row
  };

  explicit RecordListModel(QObject* parent = nullptr);

  // The document shown (null: nothing open). Resets the model.
  void SetDocument(Document* doc);
  Document* document() const { return doc_; }

  // Rows or columns changed in the document: read them again.
  void Reset();
  // One record changed where it stands.
  void RecordChanged(size_t recordIndex);

  int FieldOfColumn(int column) const;
  int ColumnOfField(int field) const;
  // The column's width as stored in the file, in pixels (x 1.5).
  int ColumnPixels(int column) const;

  int rowCount(const QModelIndex& parent = QModelIndex()) const override;
  int columnCount(const QModelIndex& parent = QModelIndex()) const override;
  QVariant data(const QModelIndex& index, int role) const override;
  QVariant headerData(int section, Qt::Orientation orientation, int role) const override;

 private:
  void ReadColumns();

  Document* doc_ = nullptr;
  std::vector<ListColumn> columns_;
  std::vector<bool> checkBox_;
};

}  // namespace cx::gui
