// "Edit Filters": two filters, each with its field and the controls that
// the field's type uses, NOT on each, AND/OR between them.
#pragma once

#include <QDialog>
#include <array>

#include "ops/filter_dialog.h"
#include "platform/ui_port.h"

class QCheckBox;
class QComboBox;
class QDateEdit;
class QLineEdit;
class QRadioButton;
class QStackedWidget;
class QTimeEdit;

namespace cx::gui {

class EditFiltersDialog : public QDialog {
  Q_OBJECT
 public:
  EditFiltersDialog(Database& db, QWidget* parent = nullptr);

  FilterDialogValues values() const;
  void setValues(const FilterDialogValues& values);

 public slots:
  // Stores both filters, or names the limit that is not a number and stays
  // open. The caller rebuilds the view.
  void accept() override;

 private:
  struct Controls {
    QCheckBox* enabled = nullptr;
    QComboBox* field = nullptr;
    QCheckBox* negate = nullptr;
    QStackedWidget* pages = nullptr;
    QLineEdit* mustContain = nullptr;
    QLineEdit* lower = nullptr;
    QLineEdit* upper = nullptr;
    QDateEdit* lowerDate = nullptr;
    QDateEdit* upperDate = nullptr;
    QTimeEdit* lowerTime = nullptr;
    QTimeEdit* upperTime = nullptr;
    QComboBox* popup = nullptr;
    QCheckBox* check = nullptr;
  };
  QWidget* BuildFilter(int n);
  void ShowControlsFor(int n);

  Database& db_;
  std::array<Controls, 2> c_;
  QRadioButton* and_ = nullptr;
  QRadioButton* or_ = nullptr;
  // Values of the controls that the current field does not show, kept so
  // that switching fields back and forth loses nothing.
  FilterDialogValues opened_;
};

}  // namespace cx::gui
