// The desktop's user-interface port: message boxes, questions, the password
// prompt and file dialogs as Qt dialogs. Every call may come from any
// thread; widgets are only ever made on the GUI thread (a call from another
// thread waits there until the user has answered).
#pragma once

#include <QPointer>
#include <QString>
#include <QStringList>
#include <functional>
#include <optional>
#include <string>

#include "platform/ui_port.h"

class QWidget;

namespace cx::gui {

// The wait cursor for the lifetime of the guard. Qt keeps override cursors
// on a stack, so every push needs its pop even when the work returns early.
class WaitCursor {
 public:
  WaitCursor();
  ~WaitCursor();
  WaitCursor(const WaitCursor&) = delete;
  WaitCursor& operator=(const WaitCursor&) = delete;
};

// Filters in the handheld's "Description (*.x)|*.x|...||" form become Qt
// name filters, each extension pattern in both letter cases (the desktop's
// file systems tell "*.PDB" from "*.pdb").
QStringList QtNameFilters(const std::string& handheldFilter);
// The first pattern's extension in upper case ("PDB"), or empty (when the
// request does not name one).
QString DefaultSuffix(const std::string& handheldFilter);

// Runs `work` on the GUI thread and returns when it is done. On the GUI
// thread it runs at once (no queue, so it cannot wait for itself).
void RunOnGuiThread(const std::function<void()>& work);

class QtUiPort : public UiPort {
 public:
  explicit QtUiPort(QWidget* parent = nullptr);

  // The window the dialogs belong to (the main window once it exists).
  void SetParent(QWidget* parent) { parent_ = parent; }
  QWidget* parent() const { return parent_; }
  // Qt's own dialogs instead of the desktop's (tests, screenshots).
  void SetNativeFileDialogs(bool native) { native_ = native; }
  // The folder the file dialogs start in when no file is suggested.
  void SetStartFolder(const QString& folder) { startFolder_ = folder; }

  void ShowMessage(const std::string& text, const std::string& caption,
                   MessageIcon icon = MessageIcon::None) override;
  bool AskYesNo(const std::string& text, const std::string& caption) override;
  Answer AskYesNoCancel(const std::string& text, const std::string& caption) override;
  std::optional<std::string> PromptPassword(int attempt) override;
  std::optional<std::string> AskOpenFile(const std::string& title,
                                         const std::string& filter) override;
  std::optional<std::string> AskSaveFile(const std::string& title, const std::string& filter,
                                         const std::string& suggested) override;
  std::optional<std::string> ChooseOpenFile(const FileDialogRequest& request) override;
  std::optional<std::string> ChooseSaveFile(const FileDialogRequest& request) override;
  void SetBusy(bool busy) override;

  // The password prompt with Qt's strings: what was typed, or nothing on
  // Cancel.
  std::optional<QString> PromptPasswordText();

 private:
  bool UseNativeDialogs() const;
  std::optional<QString> OpenFileDialog(const FileDialogRequest& request);
  std::optional<QString> SaveFileDialog(const FileDialogRequest& request);

  QPointer<QWidget> parent_;
  QString startFolder_;
  bool native_ = true;
  int busyDepth_ = 0;
};

}  // namespace cx::gui
