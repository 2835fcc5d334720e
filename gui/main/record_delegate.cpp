#include "gui/main/record_delegate.h"

#include <QPainter>

#include "gui/common/icons.h"
#include "gui/main/record_list_model.h"

namespace cx::gui {

const QColor RecordDelegate::kSelectedFill(64, 188, 255);

RecordDelegate::RecordDelegate(QObject* parent) : QStyledItemDelegate(parent) {}

int RecordDelegate::RowHeight(const QFontMetrics& metrics) {
  // Room for one line of text, and never less than a check box image.
  return qMax(metrics.height() + 2, 15);
}

QSize RecordDelegate::sizeHint(const QStyleOptionViewItem& option, const QModelIndex&) const {
  return QSize(option.rect.width(), RowHeight(option.fontMetrics));
}

void RecordDelegate::paint(QPainter* painter, const QStyleOptionViewItem& option,
                           const QModelIndex& index) const {
  // The style is not asked to draw anything: it would add its own
  // highlight and focus frame over the fill.
  const bool selected = option.state & QStyle::State_Selected;
  painter->save();
  painter->fillRect(option.rect, selected ? kSelectedFill : QColor(Qt::white));

  QRect cell = option.rect;
  if (cell.width() >= 3) cell.adjust(1, 0, -1, 0);
  painter->setClipRect(cell);

  if (index.data(RecordListModel::IsCheckBoxRole).toBool()) {
    const qreal scale = painter->device() ? painter->device()->devicePixelRatioF() : 1.0;
    if (scale != imageScale_) {
      checked_ = CheckBoxImage(true, scale);
      unchecked_ = CheckBoxImage(false, scale);
      imageScale_ = scale;
    }
    const QString text = index.data(Qt::DisplayRole).toString();
    const bool on = text.startsWith(QLatin1Char('1'));
    painter->drawImage(cell.topLeft(), on ? checked_ : unchecked_);
  } else {
    const QString text = index.data(Qt::DisplayRole).toString();
    if (!text.isEmpty()) {
      painter->setFont(option.font);
      painter->setPen(Qt::black);
      painter->drawText(cell, Qt::AlignLeft | Qt::AlignTop | Qt::TextSingleLine, text);
    }
  }
  painter->restore();
}

}  // namespace cx::gui
