// "Sorting": three keys, each a field list with a Forward/Reverse pair.
#pragma once

#include <QDialog>
#include <array>

#include "ops/session.h"
#include "ops/sort.h"

class QComboBox;
class QRadioButton;

namespace cx::gui {

class SortingDialog : public QDialog {
  Q_OBJECT
 public:
  // Messages of a refused key go through `ui` (the "ERROR!" box).
  SortingDialog(Database& db, UiPort& ui, QWidget* parent = nullptr);

  SortingChoice choice() const;
  void setChoice(const SortingChoice& choice);

 public slots:
  // Stores the keys, or shows why a key cannot be sorted and stays open.
  void accept() override;

 private:
  Database& db_;
  UiPort& ui_;
  std::array<QComboBox*, 3> field_{};
  std::array<QRadioButton*, 3> forward_{};
  std::array<QRadioButton*, 3> reverse_{};
};

}  // namespace cx::gui
