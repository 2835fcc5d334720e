// "Edit Popup List" and its "Edit Popup" prompt: the values offered for
// one field, or for a Pop-Up field its whole set of values.
#pragma once

#include <QDialog>
#include <optional>
#include <string>

#include "design/popup_editor.h"

class QCheckBox;
class QLineEdit;
class QListWidget;
class QPushButton;

namespace cx::gui {

// "Edit Popup": one value of at most 79 characters; OK with nothing typed
// says so (through `ui`) and stays open.
class EditPopupDialog : public QDialog {
  Q_OBJECT
 public:
  EditPopupDialog(UiPort& ui, const QString& value, QWidget* parent = nullptr);
  void accept() override;
  // The accepted value, 8-bit.
  const std::string& value() const { return value_; }
  QLineEdit* edit() const { return edit_; }

 private:
  UiPort& ui_;
  QLineEdit* edit_;
  std::string value_;
};

class PopupListDialog : public QDialog {
  Q_OBJECT
 public:
  PopupListDialog(DataSession& session, int slot, QWidget* parent = nullptr);
  void accept() override;

  // True when records were rewritten (a Delete on a Pop-Up field), which
  // stays so whether the dialog ends with OK or Cancel.
  bool recordsChanged() const { return recordsChanged_; }

  QListWidget* list() const { return list_; }
  QCheckBox* sortCheck() const { return sort_; }
  PopupEditor& editor() { return editor_; }

 private:
  void Refill(int selectEntry);
  void OnNew();
  void OnRename();
  void OnDelete();
  void ShowButtons();
  DataSession& session_;
  int slot_;
  PopupEditor editor_;
  QListWidget* list_;
  QPushButton* new_;
  QPushButton* rename_;
  QPushButton* delete_;
  QCheckBox* sort_;
  bool recordsChanged_ = false;
};

}  // namespace cx::gui
