// The record list: a table with one fixed row height, no row headers and
// no sorting of its own. It turns the mouse and keyboard into the list's
// commands: a tapped cell, a clicked heading, a divider dragged to a new
// width (told once, when the drag ends), a divider double-clicked.
#pragma once

#include <QTableView>

namespace cx::gui {

class RecordListView : public QTableView {
  Q_OBJECT

 public:
  explicit RecordListView(QWidget* parent = nullptr);

  // Selects and shows the row (-1 clears the selection).
  void SelectRow(int row);
  int selectedRow() const;

  // Applies the columns' widths from the model without telling anyone.
  void ApplyColumnWidths();

 signals:
  void cellTapped(int row, int column);
  void headingClicked(int column);
  void columnWidthChosen(int column, int pixels);
  void autoFitRequested(int column);

 protected:
  void keyPressEvent(QKeyEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;
  void changeEvent(QEvent* event) override;

 private:
  void UpdateRowHeight();

  int resizedColumn_ = -1;
  bool applyingWidths_ = false;
};

}  // namespace cx::gui
