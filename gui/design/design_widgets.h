// Small pieces the design dialogs share: storing typed text as 8-bit text
// (refusing what the code page cannot hold), digit-only edits, the help key,
// and the feedback shown while every record of a database is rewritten.
#pragma once

#include <QString>
#include <memory>
#include <string>

#include "platform/ui_port.h"

class QDialog;
class QDialogButtonBox;
class QLineEdit;
class QProgressDialog;
class QWidget;

namespace cx::gui {

// The 8-bit form of `text` typed into the control named `what`; nothing
// (after a message that names the character) when a character cannot be
// stored. Cut to `maxChars` characters.
std::optional<std::string> StorableText(QWidget* parent, const QString& text, const QString& what,
                                        size_t maxChars);

// An edit that takes at most `digits` decimal digits.
void MakeDigitEdit(QLineEdit* edit, int digits);

// F1 and the Help button open the help section `anchor`.
void ConnectHelp(QDialog* dialog, QDialogButtonBox* buttons, const QString& anchor);

// Wraps the port a long design operation talks to: questions pass through
// as they are, and while the operation is busy the wait cursor shows and,
// for a database of at least `progressFrom` records, a progress window too.
class BusyFeedbackPort : public UiPort {
 public:
  BusyFeedbackPort(UiPort& inner, QWidget* parent, size_t records, size_t progressFrom = 5000);
  ~BusyFeedbackPort() override;

  void ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) override {
    inner_.ShowMessage(text, caption, icon);
  }
  bool AskYesNo(const std::string& text, const std::string& caption) override {
    return inner_.AskYesNo(text, caption);
  }
  Answer AskYesNoCancel(const std::string& text, const std::string& caption) override {
    return inner_.AskYesNoCancel(text, caption);
  }
  std::optional<std::string> PromptPassword(int attempt) override {
    return inner_.PromptPassword(attempt);
  }
  std::optional<std::string> AskOpenFile(const std::string& title,
                                         const std::string& filter) override {
    return inner_.AskOpenFile(title, filter);
  }
  std::optional<std::string> AskSaveFile(const std::string& title, const std::string& filter,
                                         const std::string& suggested) override {
    return inner_.AskSaveFile(title, filter, suggested);
  }
  std::optional<std::string> ChooseOpenFile(const FileDialogRequest& request) override {
    return inner_.ChooseOpenFile(request);
  }
  std::optional<std::string> ChooseSaveFile(const FileDialogRequest& request) override {
    return inner_.ChooseSaveFile(request);
  }
  void SetBusy(bool busy) override;
  void Status(const std::string& text) override { inner_.Status(text); }
  bool WantsStatus() const override { return inner_.WantsStatus(); }

  // True once the progress window was shown (for tests).
  bool showedProgress() const { return showedProgress_; }

 private:
  UiPort& inner_;
  QWidget* parent_;
  size_t records_;
  size_t progressFrom_;
  bool busy_ = false;
  bool showedProgress_ = false;
  std::unique_ptr<QProgressDialog> progress_;
};

}  // namespace cx::gui
