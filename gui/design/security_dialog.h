// "Security Access": the level of each guarded operation and the database
// password.
#pragma once

#include <QDialog>
#include <array>

#include "design/security.h"
#include "engine/record_store.h"

class QComboBox;
class QLineEdit;

namespace cx::gui {

class SecurityDialog : public QDialog {
  Q_OBJECT
 public:
  SecurityDialog(Database& db, QWidget* parent = nullptr);
  void accept() override;

  // The level list of an operation (0 to 7); the hidden row's too.
  QComboBox* levelList(int op) const { return levels_[static_cast<size_t>(op)]; }
  QLineEdit* passwordEdit() const { return password_; }

 private:
  Database& db_;
  SecuritySettings loaded_;
  std::array<QComboBox*, secured::kCount> levels_{};
  QLineEdit* password_;
};

}  // namespace cx::gui
