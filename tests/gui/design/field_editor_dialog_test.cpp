// The "Edit Field" dialog: which controls each type shows, what can be
// typed, what OK stores, and the questions a type change asks.
#include <QCheckBox>
#include <QComboBox>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QToolButton>
#include <QtTest>

#include "design/security.h"
#include "design/type_change.h"
#include "gui/design/field_editor_dialog.h"
#include "gui/design/popup_list_dialog.h"
#include "tests/design/design_db.h"
#include "tests/gui/design/design_gui_support.h"
#include "tests/support/test_support.h"

using namespace cx;
using namespace cx::testing;
using cx::gui::FieldEditorDialog;

namespace {

// Every control whose showing depends on the type or the operands.
const QStringList kControls = {
    "pixelsShown", "maxCharacters", "editPopups", "popupsAppend",  "otherDatabase",
    "pickOtherDatabase", "otherField", "places", "defaultValue",   "dateBehavior",
    "timeBehavior", "showValueFrom", "group",  "value1",           "constant1",
    "prevRecord1",  "operation",     "value2", "constant2",        "prevRecord2",
    "resultFormat", "visible",       "exportPrint"};

template <typename T = QWidget>
T* Find(QWidget* dialog, const char* name) {
  T* w = dialog->findChild<T*>(QString::fromLatin1(name));
  if (!w) qFatal("no control %s", name);
  return w;
}

QStringList Shown(QWidget* dialog) {
  QStringList shown;
  for (const QString& name : kControls) {
    QWidget* w = dialog->findChild<QWidget*>(name);
    if (w && w->isVisibleTo(dialog)) shown << name;
  }
  shown.sort();
  return shown;
}

}  // namespace

class FieldEditorDialogTest : public QObject {
  Q_OBJECT

 private:
  TempDir dir_;
  ScriptedUi ui_;
  LocaleInfo locale_;

  // Slot 0 an Integer, slot 1 a Unique, slot 2 a Pop-Up with two entries,
  // slot 3 a Text; three records.
  Database MakeFilled() {
    Database db = MakeDatabase(dir_.File("filled.PDB"), {{"Count", FieldType::Integer},
                                                         {"Number", FieldType::Unique},
                                                         {"Colour", FieldType::PopUp},
                                                         {"Note", FieldType::Text}});
    db.popups()[2].items = {"Red", "Blue"};
    AddRecord(db, {"5", "1", "0", "7"});
    AddRecord(db, {"12", "2", "1", ""});
    AddRecord(db, {"-3", "3", "255", "3"});
    return db;
  }

 private slots:
  void init() { ui_ = ScriptedUi(); }
  void cleanup() { StopModalWatchers(); }

  void controlsPerType_data() {
    QTest::addColumn<int>("type");
    QTest::addColumn<QStringList>("shown");
    const QStringList common = {"visible", "exportPrint"};
    const QStringList popups = {"editPopups", "popupsAppend"};
    const QStringList other = {"otherDatabase", "pickOtherDatabase", "otherField"};
    const QStringList calc = {"value1", "constant1", "operation", "value2", "constant2",
                              "resultFormat"};
    QTest::newRow("Not-Used") << 0 << QStringList{};
    QTest::newRow("Text") << 1 << (common + popups + QStringList{"pixelsShown", "maxCharacters"});
    QTest::newRow("Integer") << 2 << (common + popups + QStringList{"pixelsShown"});
    QTest::newRow("Float") << 3 << (common + popups + QStringList{"pixelsShown", "places"});
    QTest::newRow("Pop-Up") << 4
                            << (common + QStringList{"pixelsShown", "editPopups", "defaultValue"});
    QTest::newRow("Check-Box") << 5 << (common + QStringList{"pixelsShown"});
    QTest::newRow("Unique") << 6 << (common + QStringList{"pixelsShown"});
    QTest::newRow("Image") << 7 << QStringList{"visible"};
    QTest::newRow("Date") << 8 << (common + QStringList{"pixelsShown", "dateBehavior"});
    QTest::newRow("Time") << 9 << (common + QStringList{"pixelsShown", "timeBehavior"});
    QTest::newRow("Link") << 10 << (common + other + QStringList{"showValueFrom"});
    QTest::newRow("Linked") << 11 << (common + other + QStringList{"pixelsShown"});
    QTest::newRow("Note") << 12 << (common + popups + QStringList{"pixelsShown"});
    QTest::newRow("Heading") << 13 << common;
    QTest::newRow("DB Popup") << 14
                              << (common + other +
                                  QStringList{"pixelsShown", "maxCharacters", "popupsAppend",
                                              "group"});
    QTest::newRow("Calculated") << 15 << (common + calc + QStringList{"pixelsShown"});
  }

  // Loading a field of the type and picking the type in the list show the
  // same controls.
  void controlsPerType() {
    QFETCH(int, type);
    QFETCH(QStringList, shown);
    shown.sort();
    Database db = MakeDatabase(dir_.File("t.PDB"), {{"Stored", TypeFromNumber(type)}});
    db.schema().field[0].param1 = db.schema().field[0].param2 = 255;  // operands: constants
    DataSession session(db, locale_, ui_);
    FieldEditorDialog loaded(session, 0);
    QCOMPARE(Shown(&loaded), shown);
    QCOMPARE(Find<QComboBox>(&loaded, "type")->currentIndex(), type);

    FieldEditorDialog picked(session, 1);
    Find<QComboBox>(&picked, "type")->setCurrentIndex(type);
    QCOMPARE(Shown(&picked), shown);
  }

  void calculatedOperandsSwapConstantAndPrevRecord() {
    Database db = MakeDatabase(dir_.File("c.PDB"), {{"Calc", FieldType::Calculated},
                                                    {"Amount", FieldType::Integer}});
    db.schema().field[0].param1 = db.schema().field[0].param2 = 255;
    DataSession session(db, locale_, ui_);
    FieldEditorDialog dialog(session, 0);
    QVERIFY(Find(&dialog, "constant1")->isVisibleTo(&dialog));
    QVERIFY(!Find(&dialog, "prevRecord1")->isVisibleTo(&dialog));
    Find<QComboBox>(&dialog, "value1")->setCurrentIndex(2);  // "Amount"
    QVERIFY(!Find(&dialog, "constant1")->isVisibleTo(&dialog));
    QVERIFY(Find(&dialog, "prevRecord1")->isVisibleTo(&dialog));
    QVERIFY(Find(&dialog, "constant2")->isVisibleTo(&dialog));  // the other pair keeps its own
    Find<QComboBox>(&dialog, "value1")->setCurrentIndex(0);
    QVERIFY(Find(&dialog, "constant1")->isVisibleTo(&dialog));
    QCOMPARE(Find<QComboBox>(&dialog, "value1")->itemText(0), QStringLiteral("No Field"));
    QCOMPARE(Find<QComboBox>(&dialog, "value1")->count(), 31);
  }

  void entryLimits_data() {
    QTest::addColumn<QString>("control");
    QTest::addColumn<QString>("typed");
    QTest::addColumn<QString>("kept");
    const QString letters = QStringLiteral("abcdefghijklmnopqrstuvwxyz");
    QTest::newRow("name") << "name" << letters << letters.left(19);
    QTest::newRow("other database") << "otherDatabase" << letters << letters.left(19);
    QTest::newRow("constant 1") << "constant1" << letters << letters.left(8);
    QTest::newRow("constant 2") << "constant2" << letters << letters.left(8);
    QTest::newRow("max characters") << "maxCharacters" << "1x2345" << "123";
    QTest::newRow("pixels shown") << "pixelsShown" << "98765" << "987";
    QTest::newRow("other field #") << "otherField" << "-4567" << "456";
  }

  void entryLimits() {
    QFETCH(QString, control);
    QFETCH(QString, typed);
    QFETCH(QString, kept);
    Database db = MakeDatabase(dir_.File("l.PDB"), {{"F", FieldType::Text}});
    DataSession session(db, locale_, ui_);
    FieldEditorDialog dialog(session, 0);
    auto* edit = Find<QLineEdit>(&dialog, control.toLatin1().constData());
    edit->clear();
    QTest::keyClicks(edit, typed);
    QCOMPARE(edit->text(), kept);
  }

  void pixelsShownRoundTrip_data() {
    QTest::addColumn<QString>("typed");
    QTest::addColumn<int>("stored");
    QTest::addColumn<QString>("shownAgain");
    QTest::newRow("240") << "240" << 160 << "240";
    QTest::newRow("100") << "100" << 66 << "99";
    QTest::newRow("999 capped") << "999" << 160 << "240";
  }

  void pixelsShownRoundTrip() {
    QFETCH(QString, typed);
    QFETCH(int, stored);
    QFETCH(QString, shownAgain);
    Database db = MakeDatabase(dir_.File("p.PDB"), {{"F", FieldType::Text}});
    DataSession session(db, locale_, ui_);
    {
      FieldEditorDialog dialog(session, 0);
      Find<QLineEdit>(&dialog, "pixelsShown")->setText(typed);
      dialog.accept();
    }
    QCOMPARE(int(db.schema().field[0].width), stored);
    FieldEditorDialog again(session, 0);
    QCOMPARE(Find<QLineEdit>(&again, "pixelsShown")->text(), shownAgain);
  }

  // A No to the data-loss question stores nothing: saved again, the file
  // is the same byte for byte.
  void integerToPopUpNoLeavesTheFileAsItWas() {
    const std::string path = dir_.File("loss.PDB");
    Database db = MakeFilled();
    const FixedClock clock(1700000000);
    QVERIFY(db.SaveAs(path, clock).ok());
    const QByteArray before = ReadAll(QString::fromStdString(path));
    DataSession session(db, locale_, ui_);
    ui_.yesNoAnswers = {false};
    FieldEditorDialog dialog(session, 0);
    Find<QComboBox>(&dialog, "type")->setCurrentIndex(int(FieldType::PopUp));
    Find<QLineEdit>(&dialog, "name")->setText("Changed");
    dialog.accept();
    QCOMPARE(dialog.result(), int(QDialog::Accepted));
    QCOMPARE(dialog.outcome().result, ApplyResult::Declined);
    QCOMPARE(ui_.questions.size(), size_t(1));
    QCOMPARE(ui_.questions[0].text,
             std::string("Can't Switch these Field Types without data loss.  Continue?"));
    QCOMPARE(ui_.questions[0].caption, std::string("QUESTION"));
    QVERIFY(db.changed());
    QVERIFY(db.Save(clock).ok());
    QCOMPARE(ReadAll(QString::fromStdString(path)), before);
  }

  void typeChangeQuestions_data() {
    QTest::addColumn<int>("slot");
    QTest::addColumn<int>("to");
    QTest::addColumn<QString>("question");
    QTest::newRow("Unique to Linked loses") << 1 << int(FieldType::Linked)
                                            << "Can't Switch these Field Types without data "
                                               "loss.  Continue?";
    QTest::newRow("Unique to Link keeps") << 1 << int(FieldType::Link) << "";
    QTest::newRow("Integer to Unique keeps") << 0 << int(FieldType::Unique) << "";
    QTest::newRow("Text to Unique asks about the data")
        << 3 << int(FieldType::Unique)
        << "Use the existing data in this field for the unique values? (Note: The values must "
           "be unique numbers for this to convert properly.) ";
    QTest::newRow("Text to Linked asks about the data")
        << 3 << int(FieldType::Linked)
        << "Use the existing data in this field for the linked values? (Note: The values must "
           "be numbers that relate to the link field for this to convert properly.) ";
  }

  void typeChangeQuestions() {
    QFETCH(int, slot);
    QFETCH(int, to);
    QFETCH(QString, question);
    Database db = MakeFilled();
    DataSession session(db, locale_, ui_);
    ui_.yesNoAnswers = {true};
    FieldEditorDialog dialog(session, slot);
    dialog.setProgressThreshold(1);
    Find<QComboBox>(&dialog, "type")->setCurrentIndex(to);
    dialog.accept();
    if (question.isEmpty()) {
      QVERIFY(ui_.questions.empty());
    } else {
      QCOMPARE(ui_.questions.size(), size_t(1));
      QCOMPARE(QString::fromStdString(ui_.questions[0].text), question);
    }
    QCOMPARE(int(db.schema().field[slot].typeNumber), to);
    // Every conversion rewrites under the progress window here (threshold 1).
    QCOMPARE(dialog.showedProgress(), dialog.outcome().converted);
    QCOMPARE(QGuiApplication::overrideCursor(), nullptr);
  }

  // Picking Pop-Up anew selects "No Value"; Edit Popups refills the list.
  void defaultValueFollowsThePopupEditor() {
    Database db = MakeFilled();
    DataSession session(db, locale_, ui_);
    FieldEditorDialog dialog(session, 2);
    auto* defaults = Find<QComboBox>(&dialog, "defaultValue");
    QCOMPARE(defaults->count(), 3);
    QCOMPARE(defaults->itemText(2), QStringLiteral("No Value"));
    defaults->setCurrentIndex(1);
    OnModal("popupListDialog", [](QWidget* list) {
      OnModal("editPopupDialog", [](QWidget* prompt) {
        auto* edit = prompt->findChild<QLineEdit*>("value");
        edit->setText("Green");
        Press(prompt, QDialogButtonBox::Ok);
      });
      list->findChild<QPushButton*>("new")->click();
      Press(list, QDialogButtonBox::Ok);
    });
    Find<QPushButton>(&dialog, "editPopups")->click();
    QCOMPARE(defaults->count(), 4);
    QCOMPARE(defaults->itemText(2), QStringLiteral("Green"));
    QCOMPARE(defaults->currentIndex(), 1);  // "Blue" stays chosen
    dialog.accept();
    QCOMPARE(int(db.schema().field[2].param1), 1);

    // A Text field turned into a Pop-Up starts with "No Value".
    FieldEditorDialog text(session, 3);
    db.popups()[3].items = {"a", "b"};
    Find<QComboBox>(&text, "type")->setCurrentIndex(int(FieldType::PopUp));
    auto* textDefaults = Find<QComboBox>(&text, "defaultValue");
    QCOMPARE(textDefaults->currentText(), QStringLiteral("No Value"));
  }

  void editPopupsRefusedWithoutAccess() {
    Database db = MakeFilled();
    SetLevel(db.schema(), secured::kEditPopups, access_level::kNone);
    DataSession session(db, locale_, ui_);
    FieldEditorDialog dialog(session, 2);
    bool opened = false;
    OnModal("popupListDialog", [&opened](QWidget* list) {
      opened = true;
      Press(list, QDialogButtonBox::Cancel);
    });
    Find<QPushButton>(&dialog, "editPopups")->click();
    QTest::qWait(50);
    QVERIFY(!opened);
    QCOMPARE(ui_.messages.size(), size_t(1));
    QCOMPARE(ui_.messages[0].text, std::string(security_messages::kDenied));
    QCOMPARE(ui_.messages[0].caption, std::string("ACCESS DENIED"));
  }

  void otherDatabaseTakesTheNameFromTheHeader() {
    Database db = MakeDatabase(dir_.File("o.PDB"), {{"L", FieldType::Link}});
    const std::string other = dir_.File("file name differs.PDB");
    Database named = Database::CreateNew(other, "Stored Name");
    QVERIFY(named.SaveAs(other).ok());
    DataSession session(db, locale_, ui_);
    FieldEditorDialog dialog(session, 0);
    ui_.fileAnswers = {other, dir_.File("missing.PDB")};
    Find<QToolButton>(&dialog, "pickOtherDatabase")->click();
    QCOMPARE(Find<QLineEdit>(&dialog, "otherDatabase")->text(), QStringLiteral("Stored Name"));
    QCOMPARE(ui_.openRequests.at(0).title, std::string("Cardovex"));
    QCOMPARE(ui_.openRequests.at(0).folder, dir_.path());
    Find<QToolButton>(&dialog, "pickOtherDatabase")->click();
    QCOMPARE(Find<QLineEdit>(&dialog, "otherDatabase")->text(), QStringLiteral("Stored Name"));
  }

  void unstorableNameIsRefused() {
    Database db = MakeDatabase(dir_.File("u.PDB"), {{"F", FieldType::Text}});
    DataSession session(db, locale_, ui_);
    FieldEditorDialog dialog(session, 0);
    Find<QLineEdit>(&dialog, "name")->setText(QStringLiteral("Price \u20AC \u4E2D"));
    QString shown;
    OnModal("QMessageBox", [&shown](QWidget* box) {
      shown = qobject_cast<QMessageBox*>(box)->text();
      Press(box, QDialogButtonBox::Ok);
    });
    dialog.accept();
    QVERIFY(shown.contains(QChar(0x4E2D)));
    QCOMPARE(db.schema().field[0].name.str(), std::string("F"));
    QVERIFY(dialog.result() != QDialog::Accepted);
  }
};

#include "field_editor_dialog_test.moc"

int RunFieldEditorDialogTest(int argc, char** argv) {
  FieldEditorDialogTest t;
  return QTest::qExec(&t, argc, argv);
}
