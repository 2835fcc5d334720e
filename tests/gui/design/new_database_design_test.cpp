// From "New" to a protected database of every field type, read back by the
// command-line tool; and a cancelled design step leaves nothing behind.
#include <QCheckBox>
#include <QComboBox>
#include <QDir>
#include <QJsonDocument>
#include <QJsonObject>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QToolButton>
#include <QtTest>

#include "app/document.h"
#include "app/preferences.h"
#include "gui/design/design_commands.h"
#include "gui/design/edit_database_dialog.h"
#include "platform/settings.h"
#include "tests/gui/design/design_gui_support.h"
#include "tests/support/test_support.h"

using namespace cx;
using namespace cx::testing;
using namespace cx::gui;

namespace {

// What one field editor is given and what the tool then shows of it.
struct FieldPlan {
  int slot;
  QString name;
  FieldType type;
  std::function<void(QWidget* editor)> more;  // settings beyond name and type
  QJsonObject expected;                        // keys the tool must show so
};

void Set(QWidget* editor, const char* name, const QString& text) {
  editor->findChild<QLineEdit*>(name)->setText(text);
}
void Pick(QWidget* editor, const char* name, int index) {
  editor->findChild<QComboBox*>(name)->setCurrentIndex(index);
}

}  // namespace

class NewDatabaseDesignTest : public QObject {
  Q_OBJECT

 private:
  TempDir dir_;

 private slots:
  void cleanup() { StopModalWatchers(); }

  void everyTypeProtectedAndReadBackByTheTool() {
    ScriptedUi ui;
    LocaleInfo locale;
    MemorySettings settings;
    Preferences preferences(settings);
    RecentFiles recent(settings);
    AppContext context{ui, locale, preferences, recent, dir_.path()};
    Workspace workspace(context);
    QVERIFY(workspace.New());
    Document& doc = *workspace.shown();

    const QString contacts = Sample("Contacts");
    ui.fileAnswers = {contacts.toStdString()};
    const std::vector<FieldPlan> plan = {
        {0, "Name", FieldType::Text, [](QWidget* e) { Set(e, "maxCharacters", "30"); },
         {{"maxChars", 30}}},
        {1, "Qty", FieldType::Integer, [](QWidget* e) { Set(e, "pixelsShown", "45"); },
         {{"pixels", 45}}},
        {2, "Price", FieldType::Float, [](QWidget* e) { Pick(e, "places", 2); },
         {{"places", 2}}},
        {3, "Colour", FieldType::PopUp,
         [](QWidget* e) {
           OnModal("popupListDialog", [](QWidget* list) {
             for (const char* value : {"Red", "Green"}) {
               OnModal("editPopupDialog", [value](QWidget* prompt) {
                 Set(prompt, "value", QString::fromLatin1(value));
                 Press(prompt, QDialogButtonBox::Ok);
               });
               list->findChild<QPushButton*>("new")->click();
             }
             Press(list, QDialogButtonBox::Ok);
           });
           e->findChild<QPushButton*>("editPopups")->click();
           Pick(e, "defaultValue", 1);
         },
         {{"default", "Green"}}},
        {4, "Done", FieldType::CheckBox, nullptr, {{"type", "Check-Box"}}},
        {5, "Id", FieldType::Unique, nullptr, {{"type", "Unique"}}},
        {6, "Photo", FieldType::Image,
         [](QWidget* e) { e->findChild<QCheckBox*>("visible")->setChecked(false); },
         {{"visible", false}}},
        {7, "When", FieldType::Date, [](QWidget* e) { Pick(e, "dateBehavior", 1); },
         {{"behavior", "Date Record Added"}}},
        {8, "At", FieldType::Time, [](QWidget* e) { Pick(e, "timeBehavior", 2); },
         {{"behavior", "Time Record Modified"}}},
        {9, "Friend", FieldType::Link,
         [](QWidget* e) {
           e->findChild<QToolButton*>("pickOtherDatabase")->click();
           Set(e, "otherField", "7");
           Pick(e, "showValueFrom", 1);
         },
         {{"otherDb", "Contacts"}, {"otherField", 7}, {"showValueFrom", "Name"}}},
        {10, "Owner", FieldType::Linked,
         [](QWidget* e) {
           Set(e, "otherDatabase", "Orders");
           Set(e, "otherField", "3");
         },
         {{"otherDb", "Orders"}, {"otherField", 3}}},
        {11, "About", FieldType::Note,
         [](QWidget* e) { e->findChild<QCheckBox*>("popupsAppend")->setChecked(true); },
         {{"popupsAppend", true}}},
        {12, "Section", FieldType::Heading, nullptr, {{"type", "Heading"}}},
        {13, "Ship to", FieldType::DBPopup,
         [](QWidget* e) {
           Set(e, "otherDatabase", "Contacts");
           Set(e, "otherField", "1");
           Set(e, "group", "2");
           Set(e, "maxCharacters", "25");
         },
         {{"otherDb", "Contacts"}, {"group", 2}, {"maxChars", 25}}},
        {14, "Running", FieldType::Calculated,
         [](QWidget* e) {
           Pick(e, "value1", 15);  // itself, from the previous record
           e->findChild<QCheckBox*>("prevRecord1")->setChecked(true);
           Pick(e, "operation", 0);
           Pick(e, "value2", 2);  // Qty
           Pick(e, "resultFormat", 1);
         },
         {{"value1", "Running"}, {"prev1", true}, {"operation", "+"}, {"value2", "Qty"},
          {"prev2", false}, {"resultFormat", "Integer"}}},
    };

    EditDatabaseDialog dialog(doc.session());
    dialog.nameEdit()->setText("Designed");
    for (const FieldPlan& p : plan) {
      OnModal("editFieldDialog", [&p](QWidget* editor) {
        Set(editor, "name", p.name);
        Pick(editor, "type", int(p.type));
        if (p.more) p.more(editor);
        Press(editor, QDialogButtonBox::Ok);
      });
      dialog.EditField(p.slot);
      QCOMPARE(dialog.fieldList()->item(p.slot)->text(), p.name);
    }
    OnModal("securityAccessDialog", [](QWidget* security) {
      Pick(security, "level0", 1);
      Pick(security, "level4", 1);
      Pick(security, "level2", 3);
      Set(security, "password", "Pw");
      Press(security, QDialogButtonBox::Ok);
    });
    dialog.findChild<QPushButton*>("securitySettings")->click();
    dialog.accept();
    QVERIFY(doc.changed());

    const std::string path = dir_.File("Designed.PDB");
    QVERIFY(doc.db().SaveAs(path).ok());
    const QString file = QString::fromStdString(path);

    // Protected: without the password the tool may not even open it.
    QVERIFY(RunCli({"set-field", file, "0"}).exitCode != 0);
    for (const FieldPlan& p : plan) {
      const CliResult r =
          RunCli({"--json", "--password", "Pw", "set-field", file, QString::number(p.slot)});
      QVERIFY2(r.exitCode == 0, qPrintable(r.err));
      const QJsonObject shown = QJsonDocument::fromJson(r.out.toUtf8()).object();
      QCOMPARE(shown.value("name").toString(), p.name);
      QCOMPARE(shown.value("type").toString(),
               QString::fromLatin1(FieldTypeLabel(p.type).data(),
                                   qsizetype(FieldTypeLabel(p.type).size())));
      for (auto it = p.expected.begin(); it != p.expected.end(); ++it) {
        QVERIFY2(shown.value(it.key()) == it.value(),
                 qPrintable(p.name + ": " + it.key() + " is " + shown.value(it.key()).toString()));
      }
    }
    const CliResult levels = RunCli({"--json", "--password", "Pw", "security", file});
    QVERIFY2(levels.exitCode == 0, qPrintable(levels.err));
    QVERIFY(levels.out.contains("Password Required"));
    QVERIFY(levels.out.contains("View Records Only"));
    const CliResult popups = RunCli({"--password", "Pw", "popups", file, "Colour"});
    QVERIFY(popups.out.contains("Red") && popups.out.contains("Green"));
  }

  void cancellingTheDesignStepLeavesNothing() {
    ScriptedUi ui;
    LocaleInfo locale;
    MemorySettings settings;
    Preferences preferences(settings);
    RecentFiles recent(settings);
    AppContext context{ui, locale, preferences, recent, dir_.File("data")};
    QDir().mkpath(QString::fromStdString(context.dataFolder));
    Workspace workspace(context);
    OnModal("editDatabaseDialog", [](QWidget* design) {
      OnModal("editFieldDialog", [](QWidget* editor) {
        Pick(editor, "type", int(FieldType::Text));
        Press(editor, QDialogButtonBox::Ok);
      });
      qobject_cast<EditDatabaseDialog*>(design)->EditField(0);
      Press(design, QDialogButtonBox::Cancel);
    });
    QVERIFY(!NewDatabase(nullptr, workspace));
    QVERIFY(workspace.shown() == nullptr);
    QVERIFY(ui.questions.empty());
    QVERIFY(ui.saveRequests.empty());
    QVERIFY(QDir(QString::fromStdString(context.dataFolder)).isEmpty());
  }
};

#include "new_database_design_test.moc"

int RunNewDatabaseDesignTest(int argc, char** argv) {
  NewDatabaseDesignTest t;
  return QTest::qExec(&t, argc, argv);
}
