// Answers the next modal dialog, message box or popup menu from a timer started before
// the call that opens it (that call does not return until the dialog is
// closed). Every wait is bounded: after `timeoutMs` the answer gives up and
// leaves the dialog to the test's own time limit.
#pragma once

#include <QString>
#include <QWidget>
#include <functional>
#include <memory>

class QMessageBox;

namespace cx::gui::testing {

class ModalAnswer {
 public:
  // `act` gets the modal widget once one shows and must close it. The
  // widget's window title and text (for message boxes) are kept.
  explicit ModalAnswer(std::function<void(QWidget*)> act, int timeoutMs = 5000);
  ~ModalAnswer();

  bool answered() const;
  QString title() const;
  QString text() const;

  // Common answers.
  static std::function<void(QWidget*)> Press(const QString& buttonText);
  static std::function<void(QWidget*)> Accept();
  // Clicks the entry of a popup menu.
  static std::function<void(QWidget*)> ChooseMenuEntry(const QString& entryText);
  static std::function<void(QWidget*)> Reject();
  // Types into the first line edit, then accepts.
  static std::function<void(QWidget*)> TypeAndAccept(const QString& text);

 private:
  struct State;
  std::shared_ptr<State> state_;
};

// Waits (bounded) until `done` holds, letting events run.
bool WaitFor(const std::function<bool()>& done, int timeoutMs = 5000);

// Sets QT_QPA_PLATFORM=offscreen when no platform was chosen (test
// discovery runs the programs outside the test environment).
void UseOffscreenWhenUnset();

}  // namespace cx::gui::testing
