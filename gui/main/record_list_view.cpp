#include "gui/main/record_list_view.h"

#include <QEvent>
#include <QHeaderView>
#include <QKeyEvent>
#include <QMouseEvent>

#include "gui/main/record_delegate.h"
#include "gui/main/record_list_model.h"

namespace cx::gui {

RecordListView::RecordListView(QWidget* parent) : QTableView(parent) {
  setObjectName(QStringLiteral("recordList"));
  setItemDelegate(new RecordDelegate(this));
  setSelectionBehavior(QAbstractItemView::SelectRows);
  setSelectionMode(QAbstractItemView::SingleSelection);
  setEditTriggers(QAbstractItemView::NoEditTriggers);
  setSortingEnabled(false);
  setShowGrid(false);
  setWordWrap(false);
  setTextElideMode(Qt::ElideNone);
  setCornerButtonEnabled(false);
  setHorizontalScrollMode(QAbstractItemView::ScrollPerPixel);
  setVerticalScrollMode(QAbstractItemView::ScrollPerItem);

  QHeaderView* rows = verticalHeader();
  rows->hide();
  rows->setSectionResizeMode(QHeaderView::Fixed);
  UpdateRowHeight();

  QHeaderView* heads = horizontalHeader();
  heads->setObjectName(QStringLiteral("recordListHeader"));
  heads->setSectionsClickable(true);
  heads->setHighlightSections(false);
  heads->setSectionsMovable(false);
  heads->setStretchLastSection(false);
  heads->setMinimumSectionSize(0);
  heads->setDefaultAlignment(Qt::AlignLeft | Qt::AlignVCenter);
  heads->setSectionResizeMode(QHeaderView::Interactive);
  heads->viewport()->installEventFilter(this);
  // The table would size the column to its contents by reading every row;
  // auto fit is the document's rule instead.
  disconnect(heads, SIGNAL(sectionHandleDoubleClicked(int)), this, SLOT(resizeColumnToContents(int)));

  connect(heads, &QHeaderView::sectionClicked, this, &RecordListView::headingClicked);
  connect(heads, &QHeaderView::sectionHandleDoubleClicked, this, [this](int column) {
    resizedColumn_ = -1;
    emit autoFitRequested(column);
  });
  connect(heads, &QHeaderView::sectionResized, this, [this](int column, int, int) {
    if (!applyingWidths_) resizedColumn_ = column;
  });
  connect(this, &QAbstractItemView::clicked, this,
          [this](const QModelIndex& index) { emit cellTapped(index.row(), index.column()); });
}

void RecordListView::UpdateRowHeight() {
  verticalHeader()->setMinimumSectionSize(1);
  verticalHeader()->setDefaultSectionSize(RecordDelegate::RowHeight(fontMetrics()));
}

void RecordListView::changeEvent(QEvent* event) {
  if (event->type() == QEvent::FontChange) UpdateRowHeight();
  QTableView::changeEvent(event);
}

void RecordListView::ApplyColumnWidths() {
  auto* list = qobject_cast<RecordListModel*>(model());
  if (!list) return;
  applyingWidths_ = true;
  for (int c = 0; c < list->columnCount(); ++c) setColumnWidth(c, list->ColumnPixels(c));
  applyingWidths_ = false;
}

void RecordListView::SelectRow(int row) {
  if (row < 0 || !model() || row >= model()->rowCount()) {
    clearSelection();
    return;
  }
  const QModelIndex index = model()->index(row, 0);
  if (!index.isValid()) {
    // A list without columns still has rows; nothing can be marked.
    return;
  }
  selectionModel()->setCurrentIndex(index, QItemSelectionModel::ClearAndSelect | QItemSelectionModel::Rows);
  scrollTo(index);
}

int RecordListView::selectedRow() const {
  const QModelIndexList rows = selectionModel() ? selectionModel()->selectedRows() : QModelIndexList();
  return rows.isEmpty() ? -1 : rows.first().row();
}

void RecordListView::keyPressEvent(QKeyEvent* event) {
  if ((event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter) && event->modifiers() == Qt::NoModifier) {
    const int row = selectedRow();
    if (row >= 0) {
      emit cellTapped(row, qMax(0, currentIndex().column()));
      return;
    }
  }
  QTableView::keyPressEvent(event);
}

bool RecordListView::eventFilter(QObject* watched, QEvent* event) {
  // The header tells of every step of a drag; the width is taken once, when
  // the button comes up.
  if (watched == horizontalHeader()->viewport()) {
    if (event->type() == QEvent::MouseButtonPress) {
      resizedColumn_ = -1;
    } else if (event->type() == QEvent::MouseButtonRelease && resizedColumn_ >= 0) {
      const int column = resizedColumn_;
      resizedColumn_ = -1;
      emit columnWidthChosen(column, columnWidth(column));
    }
  }
  return QTableView::eventFilter(watched, event);
}

}  // namespace cx::gui
