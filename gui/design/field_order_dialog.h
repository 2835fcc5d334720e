// "Edit Field Order": the order in which the list and the record form show
// the fields, changed one step at a time with two arrows.
#pragma once

#include <QDialog>

#include "design/properties.h"

class QListWidget;
class QToolButton;

namespace cx::gui {

class FieldOrderDialog : public QDialog {
  Q_OBJECT
 public:
  FieldOrderDialog(Database& db, QWidget* parent = nullptr);
  void accept() override;

  QListWidget* list() const { return list_; }
  QToolButton* upButton() const { return up_; }
  QToolButton* downButton() const { return down_; }

 private:
  void Refill();
  void ShowArrows();
  void Move(bool up);
  Database& db_;
  FieldOrderEditor editor_;
  QListWidget* list_;
  QToolButton* up_;
  QToolButton* down_;
};

}  // namespace cx::gui
