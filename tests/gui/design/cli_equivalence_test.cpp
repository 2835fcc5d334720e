// Each design dialog stores what the matching command of the command-line
// tool stores: both run on copies of a sample, and the saved files differ
// at most in the header's modification stamp.
#include <QCheckBox>
#include <QComboBox>
#include <QLineEdit>
#include <QListWidget>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QToolButton>
#include <QtTest>
#include <functional>

#include "gui/design/author_dialog.h"
#include "gui/design/edit_database_dialog.h"
#include "gui/design/field_editor_dialog.h"
#include "gui/design/field_order_dialog.h"
#include "gui/design/popup_list_dialog.h"
#include "gui/design/security_dialog.h"
#include "tests/gui/design/design_gui_support.h"
#include "tests/support/test_support.h"

using namespace cx;
using namespace cx::testing;
using namespace cx::gui;

namespace {

int RowOf(QListWidget* list, const QString& text) {
  const auto items = list->findItems(text, Qt::MatchExactly);
  return items.isEmpty() ? -1 : list->row(items.first());
}

}  // namespace

class CliEquivalenceTest : public QObject {
  Q_OBJECT

 private:
  TempDir dir_;
  LocaleInfo locale_;

  // Runs `drive` on one copy of `sample` (saved afterwards) and the tool on
  // another with `command` and `args` (FILE inserted after the command).
  void Compare(const char* sample, const QStringList& before, const QString& command,
               const QStringList& args, ScriptedUi& ui,
               const std::function<void(DataSession&)>& drive) {
    const QString byDialog = QString::fromStdString(dir_.File("dialog.PDB"));
    const QString byTool = QString::fromStdString(dir_.File("tool.PDB"));
    QVERIFY(CopySample(sample, byDialog));
    QVERIFY(CopySample(sample, byTool));

    Database db;
    QVERIFY(db.Open(byDialog.toStdString(), ui).ok());
    DataSession session(db, locale_, ui);
    drive(session);
    QVERIFY(db.changed());
    QVERIFY(db.Save().ok());

    const CliResult r = RunCli(before + QStringList{command, byTool} + args);
    QVERIFY2(r.exitCode == 0, qPrintable(r.err));
    QVERIFY2(SameButStamp(byDialog, byTool), qPrintable(command + QLatin1Char(' ') + args.join(' ')));
  }

 private slots:
  void cleanup() { StopModalWatchers(); }

  void rename() {
    ScriptedUi ui;
    Compare("Contacts", {}, "rename", {"Friends & Family"}, ui, [](DataSession& s) {
      EditDatabaseDialog dialog(s);
      dialog.nameEdit()->setText("Friends & Family");
      dialog.accept();
    });
  }

  void author() {
    ScriptedUi ui;
    Compare("Contacts", {}, "author", {"--author", "Ann Example", "--comments", "Kept for tests"},
            ui, [](DataSession& s) {
              AuthorDialog dialog(s.db);
              dialog.authorEdit()->setText("Ann Example");
              dialog.commentsEdit()->setPlainText("Kept for tests");
              dialog.accept();
            });
  }

  void order() {
    ScriptedUi ui;
    Compare("Contacts", {}, "order", {"up", "Category", "up", "Category", "down", "Name"}, ui,
            [](DataSession& s) {
              FieldOrderDialog dialog(s.db);
              dialog.list()->setCurrentRow(RowOf(dialog.list(), "Category"));
              dialog.upButton()->click();
              dialog.upButton()->click();
              dialog.list()->setCurrentRow(RowOf(dialog.list(), "Name"));
              dialog.downButton()->click();
              dialog.accept();
            });
  }

  void security() {
    ScriptedUi ui;
    Compare("Contacts", {}, "security",
            {"Add Records", "Password Required", "Edit Records", "View Records Only",
             "Beam Data", "No Access", "--set-password", "Pw"},
            ui, [](DataSession& s) {
              SecurityDialog dialog(s.db);
              dialog.levelList(1)->setCurrentIndex(1);
              dialog.levelList(2)->setCurrentIndex(3);
              dialog.levelList(7)->setCurrentIndex(2);
              dialog.passwordEdit()->setText("Pw");
              dialog.accept();
            });
  }

  void popupsAdd() {
    ScriptedUi ui;
    Compare("Contacts", {}, "popups", {"Category", "add", "Neighbours"}, ui, [](DataSession& s) {
      PopupListDialog dialog(s, 3);
      OnModal("editPopupDialog", [](QWidget* prompt) {
        prompt->findChild<QLineEdit*>("value")->setText("Neighbours");
        Press(prompt, QDialogButtonBox::Ok);
      });
      dialog.findChild<QPushButton*>("new")->click();
      dialog.accept();
    });
  }

  void popupsDeleteRenumbers() {
    ScriptedUi ui;
    Compare("Contacts", {}, "popups", {"Category", "delete", "Friends"}, ui, [](DataSession& s) {
      PopupListDialog dialog(s, 3);
      dialog.list()->setCurrentRow(RowOf(dialog.list(), "Friends"));
      dialog.findChild<QPushButton*>("delete")->click();
      dialog.accept();
    });
  }

  void popupsRename() {
    ScriptedUi ui;
    Compare("Contacts", {}, "popups", {"Category", "rename", "Work", "Office"}, ui,
            [](DataSession& s) {
              PopupListDialog dialog(s, 3);
              dialog.list()->setCurrentRow(RowOf(dialog.list(), "Work"));
              OnModal("editPopupDialog", [](QWidget* prompt) {
                prompt->findChild<QLineEdit*>("value")->setText("Office");
                Press(prompt, QDialogButtonBox::Ok);
              });
              dialog.findChild<QPushButton*>("rename")->click();
              dialog.accept();
            });
  }

  void popupsSort() {
    ScriptedUi ui;
    Compare("Contacts", {}, "popups", {"Category", "sort", "on"}, ui, [](DataSession& s) {
      PopupListDialog dialog(s, 3);
      dialog.sortCheck()->setChecked(true);
      dialog.accept();
    });
  }

  void setFieldSettings() {
    ScriptedUi ui;
    Compare("Contacts", {}, "set-field",
            {"Name", "--name", "Full Name", "--pixels", "120", "--max-chars", "35", "--visible",
             "no"},
            ui, [](DataSession& s) {
              FieldEditorDialog dialog(s, 0);
              dialog.findChild<QLineEdit*>("name")->setText("Full Name");
              dialog.findChild<QLineEdit*>("pixelsShown")->setText("120");
              dialog.findChild<QLineEdit*>("maxCharacters")->setText("35");
              dialog.findChild<QCheckBox*>("visible")->setChecked(false);
              dialog.accept();
            });
  }

  void setFieldConverts() {
    ScriptedUi ui;
    Compare("Contacts", {}, "set-field", {"Favorite", "--type", "Text"}, ui, [](DataSession& s) {
      FieldEditorDialog dialog(s, 4);
      dialog.findChild<QComboBox*>("type")->setCurrentIndex(int(FieldType::Text));
      dialog.accept();
    });
  }

  void setFieldLosesDataOnYes() {
    ScriptedUi ui;
    ui.yesNoAnswers = {true};
    Compare("Contacts", {"--yes"}, "set-field", {"Call at", "--type", "Check-Box"}, ui,
            [](DataSession& s) {
              FieldEditorDialog dialog(s, 10);
              dialog.findChild<QComboBox*>("type")->setCurrentIndex(int(FieldType::CheckBox));
              dialog.accept();
            });
    QCOMPARE(ui.questions.size(), size_t(1));
  }

  void setFieldCalculation() {
    ScriptedUi ui;
    Compare("Orders", {}, "set-field",
            {"Total", "--operation", "Max", "--value2", "none", "--constant2", "12.5",
             "--result-format", "Integer"},
            ui, [](DataSession& s) {
              FieldEditorDialog dialog(s, 5);
              dialog.findChild<QComboBox*>("operation")->setCurrentIndex(5);
              dialog.findChild<QComboBox*>("value2")->setCurrentIndex(0);
              dialog.findChild<QLineEdit*>("constant2")->setText("12.5");
              dialog.findChild<QComboBox*>("resultFormat")->setCurrentIndex(1);
              dialog.accept();
            });
  }
};

#include "cli_equivalence_test.moc"

int RunCliEquivalenceTest(int argc, char** argv) {
  CliEquivalenceTest t;
  return QTest::qExec(&t, argc, argv);
}
