// The desktop's user-interface port and help: what other modules rely on
// when they ask the user something.
#include <QApplication>
#include <QCursor>
#include <QFile>
#include <QRegularExpression>
#include <QScrollBar>
#include <QGuiApplication>
#include <QTest>
#include <QTextBrowser>
#include <QThread>
#include <atomic>

#include "gui/common/help.h"
#include "gui/common/qt_ui_port.h"
#include "gui/common/text.h"
#include "modal_answer.h"

using cx::gui::QtUiPort;

namespace {
// The id of the help file's last section (the furthest from the top).
QString LastSectionId() {
  QFile file(QStringLiteral(":/help/cardovex.html"));
  if (!file.open(QIODevice::ReadOnly)) return QString();
  const QString html = QString::fromUtf8(file.readAll());
  QString last;
  QRegularExpression id(QStringLiteral("<h2 id=\"([A-Za-z_]+)\""));
  for (auto it = id.globalMatch(html); it.hasNext();) last = it.next().captured(1);
  return last;
}
}  // namespace
using cx::gui::testing::ModalAnswer;

class TestQtUiPort : public QObject {
  Q_OBJECT

 private slots:
  void filtersListBothLetterCases() {
    const QStringList filters = cx::gui::QtNameFilters("Cardovex Files (*.pdb)|*.pdb|All Files (*.*)|*.*||");
    QCOMPARE(filters, QStringList({QStringLiteral("Cardovex Files (*.pdb *.PDB)"), QStringLiteral("All Files (*)")}));
    QCOMPARE(cx::gui::DefaultSuffix("Cardovex Files (*.pdb)|*.pdb|All Files (*.*)|*.*||"), QStringLiteral("PDB"));
    QCOMPARE(cx::gui::DefaultSuffix("All Files (*.*)|*.*||"), QString());
  }

  void messagesKeepTheirCaptionsAndWindows1252Text() {
    QtUiPort ui;
    ModalAnswer answer(ModalAnswer::Accept());
    // 0xE9 is "é" in the database files' code page.
    ui.ShowMessage("Caf\xE9 not found", "ERROR!");
    QVERIFY(answer.answered());
    QCOMPARE(answer.title(), QStringLiteral("ERROR!"));
    QCOMPARE(answer.text(), QString::fromUtf8("Café not found"));
  }

  void questionsAnswerAsPressed() {
    QtUiPort ui;
    {
      ModalAnswer answer(ModalAnswer::Press(QStringLiteral("No")));
      QVERIFY(!ui.AskYesNo("Delete?", "QUESTION"));
      QCOMPARE(answer.title(), QStringLiteral("QUESTION"));
    }
    {
      ModalAnswer answer(ModalAnswer::Press(QStringLiteral("Yes")));
      QVERIFY(ui.AskYesNo("Delete?", "QUESTION"));
    }
    {
      ModalAnswer answer(ModalAnswer::Press(QStringLiteral("Cancel")));
      QCOMPARE(ui.AskYesNoCancel("Save?", "QUESTION"), cx::Answer::Cancel);
    }
    {
      // Escape is Cancel, not No: a closed question must not discard data.
      ModalAnswer answer([](QWidget* w) { QTest::keyClick(w, Qt::Key_Escape); });
      QCOMPARE(ui.AskYesNoCancel("Save?", "QUESTION"), cx::Answer::Cancel);
    }
    {
      ModalAnswer answer(ModalAnswer::Press(QStringLiteral("No")));
      QCOMPARE(ui.AskYesNoCancel("Save?", "QUESTION"), cx::Answer::No);
    }
  }

  void passwordPromptReturnsWhatWasTyped() {
    QtUiPort ui;
    {
      ModalAnswer answer(ModalAnswer::TypeAndAccept(QStringLiteral("Secret")));
      QCOMPARE(ui.PromptPassword(0), std::optional<std::string>("Secret"));
      QCOMPARE(answer.title(), QStringLiteral("Get Password"));
    }
    {
      ModalAnswer answer(ModalAnswer::Reject());
      QCOMPARE(ui.PromptPassword(1), std::nullopt);
    }
    {
      // The slot holds 19 characters.
      ModalAnswer answer(ModalAnswer::TypeAndAccept(QStringLiteral("abcdefghijklmnopqrstuvwxyz")));
      QCOMPARE(ui.PromptPassword(0), std::optional<std::string>("abcdefghijklmnopqrs"));
    }
    {
      // A character the code page lacks can match no stored password; it
      // must not come back as "?" (which a password could hold).
      ModalAnswer answer(ModalAnswer::TypeAndAccept(QString::fromUtf8("pa\u20ACss\u4E2D")));
      const auto typed = ui.PromptPassword(0);
      QVERIFY(typed.has_value());
      QVERIFY(typed->find('?') == std::string::npos);
      QVERIFY(typed->find('\0') != std::string::npos);
    }
  }

  void callsFromAnotherThreadShowOnTheGuiThread() {
    QtUiPort ui;
    std::atomic<bool> answer{false};
    std::atomic<bool> shownOnGuiThread{false};
    ModalAnswer reply([&](QWidget* w) {
      shownOnGuiThread = QThread::currentThread() == qApp->thread();
      ModalAnswer::Press(QStringLiteral("Yes"))(w);
    });
    QThread* worker = QThread::create([&] { answer = ui.AskYesNo("Accept the database?", "QUESTION"); });
    worker->start();
    QVERIFY(cx::gui::testing::WaitFor([&] { return worker->isFinished(); }));
    worker->wait(1000);
    delete worker;
    QVERIFY(reply.answered());
    QVERIFY(shownOnGuiThread);
    QVERIFY(answer);
  }

  void busyCursorStaysBalanced() {
    QtUiPort ui;
    QVERIFY(!QGuiApplication::overrideCursor());
    ui.SetBusy(true);
    ui.SetBusy(true);
    QCOMPARE(QGuiApplication::overrideCursor()->shape(), Qt::WaitCursor);
    ui.SetBusy(false);
    ui.SetBusy(false);
    // One release too many must not pop a cursor somebody else set.
    QGuiApplication::setOverrideCursor(Qt::CrossCursor);
    ui.SetBusy(false);
    QCOMPARE(QGuiApplication::overrideCursor()->shape(), Qt::CrossCursor);
    QGuiApplication::restoreOverrideCursor();
    {
      cx::gui::WaitCursor wait;
      QCOMPARE(QGuiApplication::overrideCursor()->shape(), Qt::WaitCursor);
    }
    QVERIFY(!QGuiApplication::overrideCursor());
  }

  void textRefusesWhatTheCodePageCannotHold() {
    QCOMPARE(cx::gui::ToDb(QString::fromUtf8("Müller €")), std::optional<std::string>("M\xFCller \x80"));
    QCOMPARE(cx::gui::ToDb(QString::fromUtf8("Ω")), std::nullopt);
    QCOMPARE(cx::gui::FromDb("\x81"), QString(QChar(0x81)));
    QCOMPARE(cx::gui::EscapeMnemonic(QStringLiteral("Tom & Jerry")), QStringLiteral("Tom && Jerry"));
  }

  void helpOpensAtItsSection() {
    for (const char* anchor : {"Main_Contents", "Main_Window", "Heading_Menu", "Start_Dialog", "Preferences_Dialog",
                               "Password_Dialog", "Delete_Records", "File_Commands"}) {
      QVERIFY2(cx::gui::HelpHasAnchor(QString::fromLatin1(anchor)), anchor);
    }
    QWidget owner;
    cx::gui::ShowHelp(&owner, QStringLiteral("Preferences_Dialog"));
    auto* browser = owner.findChild<QTextBrowser*>(QStringLiteral("helpBrowser"));
    QVERIFY(browser);
    QCOMPARE(browser->source().fragment(), QStringLiteral("Preferences_Dialog"));
    QVERIFY(browser->toPlainText().contains(QStringLiteral("Allow Checkbox selection in List View")));
    // A second request reuses the window and scrolls to the section; a
    // section named by its heading's id alone is found too.
    cx::gui::ShowHelp(&owner, QStringLiteral("Main_Contents"));
    QCOMPARE(owner.findChildren<QTextBrowser*>().size(), 1);
    QCOMPARE(browser->source().fragment(), QStringLiteral("Main_Contents"));
    const int top = browser->verticalScrollBar()->value();
    const QString last = LastSectionId();
    QVERIFY(!last.isEmpty());
    cx::gui::ShowHelp(&owner, last);
    QVERIFY(cx::gui::testing::WaitFor([&] { return browser->verticalScrollBar()->value() > top + 200; }, 2000));
  }
};

int main(int argc, char** argv) {
  cx::gui::testing::UseOffscreenWhenUnset();
  QApplication app(argc, argv);
  TestQtUiPort test;
  return QTest::qExec(&test, argc, argv);
}

#include "qt_ui_port_test.moc"
