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
class BusyFeedbackPort : public ForwardingUi {
 public:
  BusyFeedbackPort(UiPort& inner, QWidget* parent, size_t records, size_t progressFrom = 5000);
  ~BusyFeedbackPort() override;

  void SetBusy(bool busy) override;

  // True once the progress window was shown (for tests).
  bool showedProgress() const { return showedProgress_; }

 private:
  QWidget* parent_;
  size_t records_;
  size_t progressFrom_;
  bool busy_ = false;
  bool showedProgress_ = false;
  std::unique_ptr<QProgressDialog> progress_;
};

}  // namespace cx::gui
