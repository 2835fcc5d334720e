#include "modal_answer.h"

#include <QAbstractButton>
#include <QApplication>
#include <QDeadlineTimer>
#include <QDialog>
#include <QDialogButtonBox>
#include <QLineEdit>
#include <QMenu>
#include <QMessageBox>
#include <QPushButton>
#include <QTest>
#include <QTimer>

namespace cx::gui::testing {

struct ModalAnswer::State {
  std::function<void(QWidget*)> act;
  QTimer timer;
  QDeadlineTimer deadline;
  bool answered = false;
  QString title;
  QString text;
};

ModalAnswer::ModalAnswer(std::function<void(QWidget*)> act, int timeoutMs) : state_(std::make_shared<State>()) {
  state_->act = std::move(act);
  state_->deadline = QDeadlineTimer(timeoutMs);
  state_->timer.setInterval(10);
  std::weak_ptr<State> weak = state_;
  QObject::connect(&state_->timer, &QTimer::timeout, [weak] {
    auto state = weak.lock();
    if (!state) return;
    if (state->deadline.hasExpired()) {
      state->timer.stop();
      return;
    }
    // Popup menus run a loop of their own just as dialogs do.
    QWidget* modal = QApplication::activePopupWidget();
    if (!modal) modal = QApplication::activeModalWidget();
    if (!modal || !modal->isVisible()) return;
    state->timer.stop();
    state->answered = true;
    state->title = modal->windowTitle();
    if (auto* box = qobject_cast<QMessageBox*>(modal)) state->text = box->text();
    state->act(modal);
  });
  state_->timer.start();
}

ModalAnswer::~ModalAnswer() { state_->timer.stop(); }

bool ModalAnswer::answered() const { return state_->answered; }
QString ModalAnswer::title() const { return state_->title; }
QString ModalAnswer::text() const { return state_->text; }

std::function<void(QWidget*)> ModalAnswer::Press(const QString& buttonText) {
  return [buttonText](QWidget* modal) {
    for (QAbstractButton* b : modal->findChildren<QAbstractButton*>()) {
      if (b->text().remove(QLatin1Char('&')) == buttonText) {
        b->click();
        return;
      }
    }
    // No such button: do not leave the dialog hanging.
    if (auto* dialog = qobject_cast<QDialog*>(modal)) dialog->reject();
  };
}

std::function<void(QWidget*)> ModalAnswer::ChooseMenuEntry(const QString& entryText) {
  return [entryText](QWidget* popup) {
    auto* menu = qobject_cast<QMenu*>(popup);
    if (!menu) return;
    for (QAction* action : menu->actions()) {
      if (action->text() == entryText) {
        QTest::mouseClick(menu, Qt::LeftButton, {}, menu->actionGeometry(action).center());
        return;
      }
    }
    menu->close();
  };
}

std::function<void(QWidget*)> ModalAnswer::Accept() {
  return [](QWidget* modal) {
    if (auto* dialog = qobject_cast<QDialog*>(modal)) dialog->accept();
  };
}

std::function<void(QWidget*)> ModalAnswer::Reject() {
  return [](QWidget* modal) {
    if (auto* dialog = qobject_cast<QDialog*>(modal)) dialog->reject();
  };
}

std::function<void(QWidget*)> ModalAnswer::TypeAndAccept(const QString& text) {
  return [text](QWidget* modal) {
    if (auto* edit = modal->findChild<QLineEdit*>()) {
      edit->clear();
      // Qt Test types only ASCII keys; other characters arrive as input.
      bool ascii = true;
      for (QChar c : text) ascii = ascii && c.unicode() < 128;
      if (ascii) QTest::keyClicks(edit, text);
      else edit->insert(text);
    }
    if (auto* dialog = qobject_cast<QDialog*>(modal)) dialog->accept();
  };
}

bool WaitFor(const std::function<bool()>& done, int timeoutMs) {
  QDeadlineTimer deadline(timeoutMs);
  while (!done()) {
    if (deadline.hasExpired()) return false;
    QApplication::processEvents(QEventLoop::AllEvents, 10);
    QTest::qWait(5);
  }
  return true;
}

void UseOffscreenWhenUnset() {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
}

}  // namespace cx::gui::testing
