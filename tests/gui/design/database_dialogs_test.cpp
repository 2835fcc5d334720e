// "Edit Database", "Author Information", "Edit Field Order", "Security
// Access" and the popup list editor, driven as a user would.
#include <QCheckBox>
#include <QComboBox>
#include <QLineEdit>
#include <QListWidget>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QToolButton>
#include <QtTest>

#include "design/popup_editor.h"
#include "design/security.h"
#include "engine/record.h"
#include "gui/common/help.h"
#include "gui/design/author_dialog.h"
#include "gui/design/edit_database_dialog.h"
#include "gui/design/field_order_dialog.h"
#include "gui/design/popup_list_dialog.h"
#include "gui/design/security_dialog.h"
#include "tests/design/design_db.h"
#include "tests/gui/design/design_gui_support.h"
#include "tests/support/test_support.h"

using namespace cx;
using namespace cx::testing;
using namespace cx::gui;

class DatabaseDialogsTest : public QObject {
  Q_OBJECT

 private:
  TempDir dir_;
  ScriptedUi ui_;
  LocaleInfo locale_;

 private slots:
  void init() { ui_ = ScriptedUi(); }
  void cleanup() { StopModalWatchers(); }

  // F1 in each dialog opens a section that exists, with its picture.
  void helpSectionsExist() {
    for (const char* anchor : {"Edit_Database", "Edit_Field", "Edit_Popup_List",
                               "Author_Information", "Edit_Field_Order", "Security_Access"}) {
      QVERIFY2(HelpHasAnchor(QString::fromLatin1(anchor)), anchor);
    }
    QVERIFY(QFile::exists(":/help/design-security.png"));
    QVERIFY(QFile::exists(":/help/design-edit-field-calculated.png"));
  }

  void editDatabaseListsEverySlotAndKeepsNineteenCharacters() {
    Database db = MakeDatabase(dir_.File("e.PDB"), {{"Only", FieldType::Text}}, "Old");
    DataSession session(db, locale_, ui_);
    EditDatabaseDialog dialog(session);
    QCOMPARE(dialog.fieldList()->count(), 30);
    QCOMPARE(dialog.fieldList()->item(0)->text(), QStringLiteral("Only"));
    QCOMPARE(dialog.fieldList()->item(29)->text(), QStringLiteral("Field 30"));
    dialog.nameEdit()->clear();
    QTest::keyClicks(dialog.nameEdit(), QStringLiteral("A name of twenty chr"));
    QCOMPARE(dialog.nameEdit()->text(), QStringLiteral("A name of twenty ch"));
    dialog.accept();
    QCOMPARE(db.Name(), std::string("A name of twenty ch"));
    QCOMPARE(db.path(), dir_.File("e.PDB"));
    QVERIFY(db.changed());
  }

  // Choosing a slot opens the field editor on it; the list shows the new
  // name on return.
  void choosingAFieldOpensItsEditorAndRefreshes() {
    Database db = MakeDatabase(dir_.File("f.PDB"), {{"One", FieldType::Text}});
    DataSession session(db, locale_, ui_);
    EditDatabaseDialog dialog(session);
    QString title;
    OnModal("editFieldDialog", [&title](QWidget* editor) {
      title = editor->windowTitle();
      editor->findChild<QLineEdit*>("name")->setText("Seventh");
      editor->findChild<QComboBox*>("type")->setCurrentIndex(int(FieldType::Integer));
      Press(editor, QDialogButtonBox::Ok);
    });
    dialog.EditField(6);
    QCOMPARE(title, QStringLiteral("Edit Field 7"));
    QCOMPARE(dialog.fieldList()->item(6)->text(), QStringLiteral("Seventh"));
    QCOMPARE(db.schema().field[6].type(), FieldType::Integer);
    QVERIFY(dialog.designChanged());
  }

  void authorInformationLimits() {
    Database db = MakeDatabase(dir_.File("a.PDB"), {{"F", FieldType::Text}});
    DataSession session(db, locale_, ui_);
    AuthorDialog dialog(db);
    QTest::keyClicks(dialog.authorEdit(), QString(45, QLatin1Char('a')));
    QCOMPARE(dialog.authorEdit()->text().size(), 39);
    QTest::keyClicks(dialog.commentsEdit(), QString(80, QLatin1Char('c')));
    QCOMPARE(dialog.commentsEdit()->toPlainText().size(), 69);
    dialog.commentsEdit()->setPlainText(QStringLiteral("first\nsecond"));
    dialog.accept();
    QCOMPARE(db.schema().author.str(), std::string(39, 'a'));
    // Line breaks are stored as a handheld's edit stores them, and show
    // again as one line break each.
    QCOMPARE(db.schema().comments.str(), std::string("first\r\nsecond"));
    AuthorDialog again(db);
    QCOMPARE(again.commentsEdit()->toPlainText(), QStringLiteral("first\nsecond"));
  }

  void fieldOrderArrowsShowOnlyWhereAMoveIsPossible() {
    Database db = MakeDatabase(dir_.File("o.PDB"), {{"A", FieldType::Text},
                                                    {"B", FieldType::Text}});
    FieldOrderDialog dialog(db);
    auto* list = dialog.list();
    QCOMPARE(list->count(), 30);
    QVERIFY(!dialog.upButton()->isVisibleTo(&dialog));
    QVERIFY(!dialog.downButton()->isVisibleTo(&dialog));  // nothing selected
    list->setCurrentRow(0);
    QVERIFY(!dialog.upButton()->isVisibleTo(&dialog));
    QVERIFY(dialog.downButton()->isVisibleTo(&dialog));
    list->setCurrentRow(29);
    QVERIFY(dialog.upButton()->isVisibleTo(&dialog));
    QVERIFY(!dialog.downButton()->isVisibleTo(&dialog));
    list->setCurrentRow(1);
    dialog.upButton()->click();
    QCOMPARE(list->currentRow(), 0);
    QCOMPARE(list->item(0)->text(), QStringLiteral("B"));
    QVERIFY(!dialog.upButton()->isVisibleTo(&dialog));
    dialog.downButton()->click();
    dialog.downButton()->click();
    QCOMPARE(list->currentRow(), 2);
    QCOMPARE(list->item(2)->text(), QStringLiteral("B"));
    dialog.accept();
    QCOMPARE(int(db.schema().fieldOrder[0]), 0);
    QCOMPARE(int(db.schema().fieldOrder[1]), 2);
    QCOMPARE(int(db.schema().fieldOrder[2]), 1);
  }

  void fieldOrderCancelKeepsTheOrder() {
    Database db = MakeDatabase(dir_.File("oc.PDB"), {{"A", FieldType::Text}});
    FieldOrderDialog dialog(db);
    dialog.list()->setCurrentRow(3);
    dialog.upButton()->click();
    dialog.reject();
    for (int i = 0; i < 30; ++i) QCOMPARE(int(db.schema().fieldOrder[i]), i);
    QVERIFY(!db.changed());
  }

  void securityRowsOfferTheirLevels() {
    Database db = MakeDatabase(dir_.File("s.PDB"), {{"F", FieldType::Text}});
    SetLevel(db.schema(), secured::kDeleteDatabase, access_level::kNone);
    SetLevel(db.schema(), secured::kBeamData, access_level::kViewOnly);  // another program's
    SecurityDialog dialog(db);
    for (int op = 0; op < 8; ++op) {
      const int offered = op == secured::kEditRecords || op == secured::kBeamData ? 4 : 3;
      QCOMPARE(dialog.levelList(op)->count(), offered);
    }
    QCOMPARE(dialog.levelList(secured::kEditRecords)->itemText(3),
             QStringLiteral("View Records Only"));
    QVERIFY(!dialog.levelList(secured::kDeleteDatabase)->isVisibleTo(&dialog));
    QCOMPARE(dialog.passwordEdit()->maxLength(), 19);
    dialog.levelList(secured::kOpenDatabase)->setCurrentIndex(access_level::kPassword);
    dialog.passwordEdit()->setText("Secret");
    dialog.accept();
    QCOMPARE(ReadLevel(db.schema(), secured::kOpenDatabase), access_level::kPassword);
    QCOMPARE(ReadLevel(db.schema(), secured::kDeleteDatabase), access_level::kNone);
    QCOMPARE(ReadLevel(db.schema(), secured::kBeamData), access_level::kViewOnly);
    QCOMPARE(db.schema().password.str(), std::string("Secret"));
    QVERIFY(db.changed());
  }

  void popupListSixtyAtMost() {
    Database db = MakeDatabase(dir_.File("p.PDB"), {{"P", FieldType::PopUp}});
    for (int i = 0; i < 59; ++i) db.popups()[0].items.push_back("v" + std::to_string(i));
    DataSession session(db, locale_, ui_);
    PopupListDialog dialog(session, 0);
    OnModal("editPopupDialog", [](QWidget* prompt) {
      prompt->findChild<QLineEdit*>("value")->setText("sixtieth");
      Press(prompt, QDialogButtonBox::Ok);
    });
    dialog.findChild<QPushButton*>("new")->click();
    QCOMPARE(dialog.list()->count(), 60);
    bool prompted = false;
    OnModal("editPopupDialog", [&prompted](QWidget* prompt) {
      prompted = true;
      Press(prompt, QDialogButtonBox::Cancel);
    });
    dialog.findChild<QPushButton*>("new")->click();
    QTest::qWait(50);
    QVERIFY(!prompted);
    QCOMPARE(dialog.list()->count(), 60);
    QCOMPARE(ui_.messages.size(), size_t(1));
    QCOMPARE(ui_.messages[0].text,
             std::string("You have reached the maximum number of popups allowed!"));
    QCOMPARE(ui_.messages[0].caption, std::string("ERROR"));
  }

  void emptyPopupValueKeepsThePromptOpen() {
    Database db = MakeDatabase(dir_.File("pe.PDB"), {{"P", FieldType::Text}});
    DataSession session(db, locale_, ui_);
    EditPopupDialog prompt(ui_, QString());
    QTest::keyClicks(prompt.edit(), QString(90, QLatin1Char('x')));
    QCOMPARE(prompt.edit()->text().size(), 79);
    prompt.edit()->clear();
    prompt.accept();
    QVERIFY(prompt.result() != QDialog::Accepted);
    QCOMPARE(ui_.messages.size(), size_t(1));
    QCOMPARE(ui_.messages[0].text,
             std::string("You must first enter a value for this popup entry!"));
  }

  // A Delete renumbers the records at once; Cancel then drops the list
  // edits but not that.
  void deleteRenumbersEvenWhenCancelled() {
    Database db = MakeDatabase(dir_.File("pd.PDB"), {{"P", FieldType::PopUp}});
    db.popups()[0].items = {"zero", "one", "two"};
    AddRecord(db, {"0"});
    AddRecord(db, {"1"});
    AddRecord(db, {"2"});
    AddRecord(db, {"255"});
    DataSession session(db, locale_, ui_);
    PopupListDialog dialog(session, 0);
    dialog.list()->setCurrentRow(0);
    dialog.findChild<QPushButton*>("delete")->click();
    QCOMPARE(dialog.list()->count(), 2);
    QVERIFY(dialog.recordsChanged());
    dialog.reject();
    std::vector<int> stored;
    for (size_t r = 0; r < db.recordCount(); ++r) {
      stored.push_back(db.record(r)[static_cast<size_t>(FieldOffset(0, db.record(r)))]);
    }
    QCOMPARE(stored, (std::vector<int>{255, 0, 1, 255}));
    QCOMPARE(db.popups()[0].items.size(), size_t(3));  // the list itself is as it was
    QVERIFY(db.changed());
  }

  void sortedListShowsNumbersInOrderButStoresEntryOrder() {
    Database db = MakeDatabase(dir_.File("ps.PDB"), {{"N", FieldType::Integer}});
    db.popups()[0].items = {"10", "9", "100"};
    DataSession session(db, locale_, ui_);
    PopupListDialog dialog(session, 0);
    dialog.sortCheck()->setChecked(true);
    QCOMPARE(dialog.list()->item(0)->text(), QStringLiteral("9"));
    QCOMPARE(dialog.list()->item(2)->text(), QStringLiteral("100"));
    dialog.list()->setCurrentRow(0);  // "9", entry 1
    OnModal("editPopupDialog", [](QWidget* prompt) {
      prompt->findChild<QLineEdit*>("value")->setText("11");
      Press(prompt, QDialogButtonBox::Ok);
    });
    dialog.findChild<QPushButton*>("rename")->click();
    dialog.accept();
    QCOMPARE(db.popups()[0].items, (std::vector<std::string>{"10", "11", "100"}));
  }
};

#include "database_dialogs_test.moc"

int RunDatabaseDialogsTest(int argc, char** argv) {
  DatabaseDialogsTest t;
  return QTest::qExec(&t, argc, argv);
}
