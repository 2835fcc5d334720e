// "Edit Database": the database's name and the way into its design (the
// fields, their order, the author information and the access settings).
// The dialogs it opens store their changes on their own OK; this dialog's
// OK stores the name.
#pragma once

#include <QDialog>

#include "ops/session.h"

class QLineEdit;
class QListWidget;
class QListWidgetItem;
class QPushButton;

namespace cx::gui {

class EditDatabaseDialog : public QDialog {
  Q_OBJECT
 public:
  EditDatabaseDialog(DataSession& session, QWidget* parent = nullptr);
  void accept() override;

  // Opens the field editor on a slot, as choosing it in the list does.
  void EditField(int slot);
  // True when a dialog opened from here rewrote records.
  bool recordsChanged() const { return recordsChanged_; }
  // Set when anything was stored (by this dialog or one it opened).
  bool designChanged() const { return designChanged_; }
  // The field editor's threshold for its progress window (tests).
  void setProgressThreshold(size_t records) { progressFrom_ = records; }

  QLineEdit* nameEdit() const { return name_; }
  QListWidget* fieldList() const { return fields_; }

 private:
  void RefillFields();
  DataSession& session_;
  QLineEdit* name_;
  QListWidget* fields_;
  bool recordsChanged_ = false;
  bool designChanged_ = false;
  size_t progressFrom_ = 5000;
};

}  // namespace cx::gui
