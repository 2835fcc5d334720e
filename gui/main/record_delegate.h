// Draws the list's cells the way the database's users know them: a solid
// blue bar for the selected row, white elsewhere, text from the top-left
// corner of the cell and cut off at its edge (never shortened with "..."),
// and check boxes as small ticked or empty boxes.
#pragma once

#include <QImage>
#include <QStyledItemDelegate>

namespace cx::gui {

class RecordDelegate : public QStyledItemDelegate {
  Q_OBJECT

 public:
  static const QColor kSelectedFill;  // RGB 64, 188, 255

  explicit RecordDelegate(QObject* parent = nullptr);

  void paint(QPainter* painter, const QStyleOptionViewItem& option,
             const QModelIndex& index) const override;
  QSize sizeHint(const QStyleOptionViewItem& option, const QModelIndex& index) const override;

  // The fixed height of every row for the list's font.
  static int RowHeight(const QFontMetrics& metrics);

 private:
  mutable QImage checked_;
  mutable QImage unchecked_;
  mutable qreal imageScale_ = 0;
};

}  // namespace cx::gui
