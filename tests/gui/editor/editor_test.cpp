// The record editor and its commands driven offscreen on copies of the
// sample databases, with a workspace as the main window holds it.
#include <QApplication>
#include <QCheckBox>
#include <QDialogButtonBox>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QLineEdit>
#include <QMainWindow>
#include <QMenu>
#include <QPlainTextEdit>
#include <QProcess>
#include <QPushButton>
#include <QTemporaryDir>
#include <QTest>
#include <QTimer>
#include <QToolButton>
#include <functional>
#include <memory>

#include "app/preferences.h"
#include "design/security.h"
#include "app/image_picture.h"
#include "gui/common/text.h"
#include "ops/field_values.h"
#include "gui/editor/editor_commands.h"
#include "gui/editor/image_editor_dialog.h"
#include "gui/editor/record_editor_dialog.h"
#include "platform/settings.h"
#include "tests/support/test_support.h"

namespace cx::gui {
namespace {

// Runs `act` on the next modal window or popup menu named `name` once it
// shows; polls every 10 ms and gives up after 5 s.
void WhenShown(const QString& name, std::function<void(QWidget*)> act, bool* seen = nullptr) {
  auto* timer = new QTimer(qApp);
  timer->setObjectName(QStringLiteral("modalWatcher"));
  auto ticks = std::make_shared<int>(0);
  QObject::connect(timer, &QTimer::timeout, timer, [=] {
    QWidget* w = QApplication::activeModalWidget();
    if (!w || w->objectName() != name) w = QApplication::activePopupWidget();
    const bool match = w && w->isVisible() && w->objectName() == name;
    if (match || ++*ticks > 500) {
      timer->stop();
      timer->deleteLater();
      if (match) {
        if (seen) *seen = true;
        act(w);
      }
    }
  });
  timer->start(10);
}

// Watchers whose window never came (a command that showed nothing) must
// not act on the next test's windows.
void StopWatchers() {
  for (QTimer* t : qApp->findChildren<QTimer*>(QStringLiteral("modalWatcher"), Qt::FindDirectChildrenOnly)) {
    t->stop();
    delete t;
  }
}

void ChooseMenuEntry(QWidget* w, const QString& text) {
  auto* menu = qobject_cast<QMenu*>(w);
  for (QAction* a : menu->actions()) {
    if (a->text() == text) {
      menu->setActiveAction(a);
      QTest::keyClick(menu, Qt::Key_Return);
      return;
    }
  }
  menu->close();
}

void PressOk(QWidget* dialog) {
  for (auto* box : dialog->findChildren<QDialogButtonBox*>()) {
    if (QPushButton* ok = box->button(QDialogButtonBox::Ok)) ok->click();
  }
}

QString Sample(const char* name) {
  return QStringLiteral(CARDOVEX_SAMPLE_DIR "/") + QLatin1String(name) + QStringLiteral(".PDB");
}

// A workspace over copies of the samples in a scratch folder.
struct Desk {
  Desk() : preferences(settings), recent(settings) {
    for (const char* name : {"Contacts", "Orders", "Vault"}) {
      const QString to = dir.filePath(QLatin1String(name) + QStringLiteral(".PDB"));
      QFile::copy(Sample(name), to);
      QFile::setPermissions(to, QFileDevice::ReadOwner | QFileDevice::WriteOwner);
    }
    context = std::make_unique<AppContext>(AppContext{ui, locale, preferences, recent, dir.path().toStdString()});
    workspace = std::make_unique<Workspace>(*context);
    commands = &InstallEditorCommands(&window, *workspace);
  }
  std::string Path(const char* name) const {
    return dir.filePath(QLatin1String(name) + QStringLiteral(".PDB")).toStdString();
  }
  bool Open(const char* name) { return workspace->Open(Path(name)); }
  Document& doc() { return *workspace->shown(); }
  int ColumnOf(const std::string& fieldName) {
    const auto columns = doc().Columns();
    for (size_t c = 0; c < columns.size(); ++c) {
      if (doc().db().schema().field[columns[c].field].name.str() == fieldName) return static_cast<int>(c);
    }
    return -1;
  }
  int FieldNamed(const std::string& fieldName) {
    for (int f = 0; f < format::kFieldCount; ++f) {
      if (doc().db().schema().field[f].name.str() == fieldName) return f;
    }
    return -1;
  }
  ByteView Value(size_t record, int field) { return *FieldValue(doc().db().record(record), field); }

  QTemporaryDir dir;
  testing::ScriptedUi ui;
  LocaleInfo locale;
  MemorySettings settings;
  Preferences preferences;
  RecentFiles recent;
  std::unique_ptr<AppContext> context;
  std::unique_ptr<Workspace> workspace;
  QMainWindow window;
  EditorCommands* commands = nullptr;
};

}  // namespace

class EditorTest : public QObject {
  Q_OBJECT

 private slots:
  void cleanup() { StopWatchers(); }
  void tapMatrix_data();
  void tapMatrix();
  void tapBelowTheLastRowDoesNothing();
  void addedRecordLandsSortedWithItsCalculations();
  void linkLevelsAndBack();
  void dbPopupChoosesFromTheOtherDatabase();
  void missingLinkedDatabaseSaysSoAndReturns();
  void linkedRecordIsReassigned();
  void movedRecordClosesTheEditor();
  void viewOnlyRefusesEdits();
  void pageDownKeepsTheEditsAndMovesOn();
  void imageEditorKeepsUntouchedPicturesAndDraws();
  void everyRecordOfEverySampleTakesAChangeInEachType();
  void undoAndRedoFromTheWindow();
};

void EditorTest::tapMatrix_data() {
  QTest::addColumn<QString>("field");
  QTest::addColumn<bool>("allowed");
  for (const char* field : {"Favorite", "Category", "Birthday", "Call at"}) {
    for (bool allowed : {true, false}) {
      QTest::newRow(qPrintable(QStringLiteral("%1 %2").arg(QLatin1String(field), allowed ? "on" : "off")))
          << QString::fromLatin1(field) << allowed;
    }
  }
}

void EditorTest::tapMatrix() {
  QFETCH(QString, field);
  QFETCH(bool, allowed);
  Desk desk;
  desk.preferences.flags.allowChecks = desk.preferences.flags.allowPopups =
      desk.preferences.flags.allowDateTime = false;
  if (field == QLatin1String("Favorite")) desk.preferences.flags.allowChecks = allowed;
  if (field == QLatin1String("Category")) desk.preferences.flags.allowPopups = allowed;
  if (field == QLatin1String("Birthday") || field == QLatin1String("Call at")) {
    desk.preferences.flags.allowDateTime = allowed;
  }
  QVERIFY(desk.Open("Contacts"));
  const int slot = desk.FieldNamed(field.toStdString());
  const int column = desk.ColumnOf(field.toStdString());
  QVERIFY(column >= 0);
  const size_t record = desk.doc().recordAt(0);
  const Bytes before(desk.Value(record, slot).begin(), desk.Value(record, slot).end());

  bool editorShown = false;
  WhenShown(QStringLiteral("recordEditor"), [](QWidget* w) { static_cast<QDialog*>(w)->reject(); }, &editorShown);
  if (allowed) {
    if (field == QLatin1String("Category")) {
      WhenShown(QStringLiteral("popupValueMenu"), [](QWidget* w) { ChooseMenuEntry(w, QStringLiteral("No Value")); });
    } else if (field == QLatin1String("Birthday")) {
      WhenShown(QStringLiteral("dateMenu"), [](QWidget* w) { ChooseMenuEntry(w, QStringLiteral("No Date")); });
    } else if (field == QLatin1String("Call at")) {
      WhenShown(QStringLiteral("chooseTimeDialog"),
                [](QWidget* w) { w->findChild<QPushButton*>(QStringLiteral("noTimeButton"))->click(); });
    }
  }
  desk.commands->OpenRecordAt(0, column, QPoint(10, 10));
  QTest::qWait(50);

  const size_t now = desk.doc().recordAt(0);
  const Bytes after(desk.Value(now, slot).begin(), desk.Value(now, slot).end());
  QCOMPARE(editorShown, !allowed);
  if (!allowed) {
    QCOMPARE(after, before);
    QVERIFY(!desk.doc().changed());
    return;
  }
  QVERIFY(desk.doc().changed());
  if (field == QLatin1String("Favorite")) QCOMPARE(after[0], uint8_t(before[0] == 0 ? 1 : 0));
  if (field == QLatin1String("Category")) QCOMPARE(after[0], uint8_t(254));
  if (field == QLatin1String("Birthday")) QCOMPARE(ValueNumber(after), 0u);
  if (field == QLatin1String("Call at")) QCOMPARE(after[2], uint8_t(255));
  // The record keeps its row.
  QCOMPARE(now, record);
}

void EditorTest::tapBelowTheLastRowDoesNothing() {
  Desk desk;
  QVERIFY(desk.Open("Contacts"));
  bool editorShown = false;
  WhenShown(QStringLiteral("recordEditor"), [](QWidget* w) { static_cast<QDialog*>(w)->reject(); }, &editorShown);
  desk.commands->OpenRecordAt(static_cast<int>(desk.doc().rowCount()), 0, QPoint());
  QTest::qWait(50);
  QVERIFY(!editorShown);
  QVERIFY(!desk.doc().changed());
}

void EditorTest::addedRecordLandsSortedWithItsCalculations() {
  Desk desk;
  QVERIFY(desk.Open("Orders"));
  const int item = desk.FieldNamed("Item");
  const int quantity = desk.FieldNamed("Quantity");
  const int price = desk.FieldNamed("Price");
  desk.doc().SortFromHeader(item, true);

  WhenShown(QStringLiteral("recordEditor"), [=](QWidget* w) {
    auto* editor = static_cast<RecordEditorDialog*>(w);
    auto* itemBox = qobject_cast<QPlainTextEdit*>(editor->ControlFor(item));
    itemBox->setPlainText(QStringLiteral("Filter papers"));
    QTest::keyClicks(qobject_cast<QLineEdit*>(editor->ControlFor(quantity)), QStringLiteral("3"));
    QTest::keyClicks(qobject_cast<QLineEdit*>(editor->ControlFor(price)), QStringLiteral("2.50"));
    QTest::keyClick(editor, Qt::Key_Return, Qt::ControlModifier);
  });
  desk.commands->NewRecord();
  QVERIFY(desk.doc().db().recordCount() == 6);
  QVERIFY(desk.workspace->Save());

  QProcess cli;
  cli.start(QStringLiteral(CARDOVEX_CLI),
            {QStringLiteral("records"), QStringLiteral("--all"), QStringLiteral("--json"),
             QString::fromStdString(desk.Path("Orders"))});
  QVERIFY(cli.waitForFinished(30000));
  const QByteArray json = cli.readAllStandardOutput();
  QVERIFY2(cli.exitCode() == 0, cli.readAllStandardError().constData());
  // Every record as the command-line tool reads it, in file order, equals
  // what the editor's database holds: sorted by item, totals computed.
  QStringList items;
  QStringList totals;
  QStringList running;
  const QList<QByteArray> records = json.split('{');
  for (const QByteArray& part : records) {
    auto grab = [&](const char* name, QStringList& into) {
      const QByteArray key = QByteArray("\"name\":\"") + name + "\",\"text\":\"";
      const int at = part.indexOf(key);
      if (at >= 0) into << QString::fromUtf8(part.mid(at + key.size()).split('"').front());
    };
    grab("Item", items);
    grab("Total", totals);
    grab("Running", running);
  }
  QCOMPARE(items.size(), 6);
  QStringList sorted = items;
  std::sort(sorted.begin(), sorted.end(), [](const QString& a, const QString& b) {
    return a.compare(b, Qt::CaseInsensitive) < 0;
  });
  QCOMPARE(items, sorted);
  const int added = items.indexOf(QStringLiteral("Filter papers"));
  QVERIFY(added >= 0);
  QCOMPARE(totals[added], QStringLiteral("7.50"));
  // The running total passes through the new record and on to the next.
  double sum = 0;
  for (int i = 0; i < items.size(); ++i) {
    sum += totals[i].toDouble();
    QCOMPARE(running[i], QString::number(sum, 'f', 2));
  }
  for (size_t r = 0; r < desk.doc().db().recordCount(); ++r) {
    QCOMPARE(FromDb(desk.doc().ValueText(r, item)), items[static_cast<int>(r)]);
  }
}

void EditorTest::linkLevelsAndBack() {
  Desk desk;
  QVERIFY(desk.Open("Contacts"));
  const int name = desk.FieldNamed("Name");
  const int orders = desk.FieldNamed("Orders");
  const int phone = desk.FieldNamed("Phone");
  const size_t record = desk.doc().recordAt(0);

  // Typed but not saved: following the link applies it first.
  WhenShown(QStringLiteral("recordEditor"), [=](QWidget* w) {
    auto* editor = static_cast<RecordEditorDialog*>(w);
    qobject_cast<QPlainTextEdit*>(editor->ControlFor(phone))->setPlainText(QStringLiteral("555-0100"));
    editor->findChild<QPushButton*>(QStringLiteral("link_") + QString::number(orders))->click();
  });
  desk.commands->OpenRecordAt(0, desk.ColumnOf("Name"), QPoint());
  QCOMPARE(desk.workspace->level(), 1);
  QCOMPARE(desk.workspace->StatusLabel(), std::string("Linked"));
  QCOMPARE(desk.doc().name(), std::string("Orders"));
  QVERIFY(desk.doc().rowCount() > 0);
  QVERIFY(desk.doc().rowCount() < desk.doc().db().recordCount());
  Document* parent = desk.workspace->documentAt(0);
  QCOMPARE(ValueString(*FieldValue(parent->db().record(record), phone)), std::string("555-0100"));

  // A record added here is linked to the contact, so it stays in view.
  const size_t linkedRows = desk.doc().rowCount();
  const int item = desk.FieldNamed("Item");
  WhenShown(QStringLiteral("recordEditor"), [=](QWidget* w) {
    auto* editor = static_cast<RecordEditorDialog*>(w);
    qobject_cast<QPlainTextEdit*>(editor->ControlFor(item))->setPlainText(QStringLiteral("Tamper"));
    PressOk(editor);
  });
  desk.commands->NewRecord();
  QCOMPARE(desk.doc().rowCount(), linkedRows + 1);

  // Closing the level returns to the editor on the parent record.
  size_t reopenedOn = 99;
  bool reopened = false;
  WhenShown(QStringLiteral("recordEditor"), [&](QWidget* w) {
    auto* editor = static_cast<RecordEditorDialog*>(w);
    reopenedOn = editor->record();
    editor->reject();
  }, &reopened);
  QVERIFY(desk.workspace->Close());
  desk.commands->ResumeAfterLinkedLevel();
  QVERIFY(reopened);
  QCOMPARE(desk.workspace->level(), 0);
  QCOMPARE(reopenedOn, record);
  QCOMPARE(ValueString(*FieldValue(desk.doc().db().record(record), name)),
           ValueString(*FieldValue(parent->db().record(record), name)));
}

void EditorTest::dbPopupChoosesFromTheOtherDatabase() {
  Desk desk;
  QVERIFY(desk.Open("Orders"));
  const int shipTo = desk.FieldNamed("Ship to");
  WhenShown(QStringLiteral("recordEditor"), [=](QWidget* w) {
    w->findChild<QToolButton*>(QStringLiteral("choose_") + QString::number(shipTo))->click();
  });
  desk.commands->OpenRecordAt(1, 0, QPoint());
  QCOMPARE(desk.workspace->level(), 1);
  QCOMPARE(desk.doc().name(), std::string("Contacts"));
  QCOMPARE(desk.doc().rowCount(), desk.doc().db().recordCount());  // every contact offered
  const std::string chosen = desk.doc().ValueText(desk.doc().recordAt(2), 0);

  QString shown;
  WhenShown(QStringLiteral("recordEditor"), [&](QWidget* w) {
    auto* editor = static_cast<RecordEditorDialog*>(w);
    shown = qobject_cast<QPlainTextEdit*>(editor->ControlFor(shipTo))->toPlainText();
    PressOk(editor);
  });
  desk.commands->OpenRecordAt(2, 0, QPoint());
  QCOMPARE(desk.workspace->level(), 0);
  QCOMPARE(shown, FromDb(chosen));
  QCOMPARE(ValueString(desk.Value(desk.doc().currentRecord(), shipTo)), chosen);
}

void EditorTest::missingLinkedDatabaseSaysSoAndReturns() {
  Desk desk;
  QVERIFY(QFile::remove(QString::fromStdString(desk.Path("Orders"))));
  QVERIFY(desk.Open("Contacts"));
  const int orders = desk.FieldNamed("Orders");
  int editors = 0;
  std::function<void(QWidget*)> press = [&](QWidget* w) {
    ++editors;
    w->findChild<QPushButton*>(QStringLiteral("link_") + QString::number(orders))->click();
  };
  WhenShown(QStringLiteral("recordEditor"), press);
  // The editor comes back after the message; then it is closed.
  QTimer::singleShot(300, [&] {
    WhenShown(QStringLiteral("recordEditor"), [&](QWidget* w) {
      ++editors;
      static_cast<QDialog*>(w)->reject();
    });
  });
  desk.commands->OpenRecordAt(0, desk.ColumnOf("Name"), QPoint());
  QCOMPARE(editors, 2);
  QCOMPARE(desk.workspace->level(), 0);
  QVERIFY(!desk.ui.messages.empty());
  QCOMPARE(desk.ui.messages.back().text, std::string("Linked Database is not present on this device!"));
}

void EditorTest::linkedRecordIsReassigned() {
  Desk desk;
  QVERIFY(desk.Open("Orders"));
  const int customer = desk.FieldNamed("Customer");
  const size_t order = desk.doc().recordAt(0);
  const uint32_t linkedTo = ValueNumber(desk.Value(order, customer));
  QVERIFY(linkedTo != 0);
  WhenShown(QStringLiteral("recordEditor"), [=](QWidget* w) {
    w->findChild<QPushButton*>(QStringLiteral("link_") + QString::number(customer))->click();
  });
  desk.commands->OpenRecordAt(0, 0, QPoint());
  QCOMPARE(desk.workspace->level(), 1);
  QCOMPARE(desk.workspace->levels().shown().mode, LevelMode::Reassign);
  Document& contacts = desk.doc();
  const int ordersLink = desk.FieldNamed("Orders");  // Contacts' Link field holds the number
  const size_t current = contacts.currentRecord();
  QCOMPARE(ValueNumber(*FieldValue(contacts.db().record(current), ordersLink)), linkedTo);
  const int other = current == contacts.recordAt(0) ? 1 : 0;
  const uint32_t newNumber = ValueNumber(*FieldValue(contacts.db().record(contacts.recordAt(other)), ordersLink));

  // No: an ordinary tap, the contact's own editor.
  desk.ui.yesNoAnswers = {false};
  bool contactEditor = false;
  WhenShown(QStringLiteral("recordEditor"), [&](QWidget* w) {
    contactEditor = static_cast<RecordEditorDialog*>(w)->record() == contacts.recordAt(other);
    static_cast<QDialog*>(w)->reject();
  });
  desk.commands->OpenRecordAt(other, 0, QPoint());
  QVERIFY(contactEditor);
  QCOMPARE(desk.workspace->level(), 1);
  QCOMPARE(desk.ui.questions.back().text, std::string("Would you like to reassign the linked record to this record?"));

  // Yes: the order is linked to that contact, and its editor comes back.
  desk.ui.yesNoAnswers = {true};
  bool orderEditor = false;
  WhenShown(QStringLiteral("recordEditor"), [&](QWidget* w) {
    orderEditor = true;
    PressOk(w);
  });
  desk.commands->OpenRecordAt(other, 0, QPoint());
  QVERIFY(orderEditor);
  QCOMPARE(desk.workspace->level(), 0);
  const size_t now = desk.doc().currentRecord();
  QCOMPARE(ValueNumber(desk.Value(now, customer)), newNumber);
  QVERIFY(!ValueString(desk.Value(now, customer).subspan(24)).empty());
}

void EditorTest::movedRecordClosesTheEditor() {
  Desk desk;
  const QString twin = desk.dir.filePath(QStringLiteral("Twin.PDB"));
  QVERIFY(QFile::copy(QString::fromStdString(desk.Path("Contacts")), twin));
  QFile::setPermissions(twin, QFileDevice::ReadOwner | QFileDevice::WriteOwner);
  QVERIFY(desk.Open("Contacts"));
  const size_t before = desk.doc().db().recordCount();
  desk.ui.fileAnswers = {twin.toStdString()};
  RecordEditorDialog editor(desk.doc(), desk.doc().recordAt(0), false, nullptr, &desk.window);
  editor.show();
  editor.action(QStringLiteral("Move Record To..."))->trigger();
  QCOMPARE(editor.exitKind(), RecordEditorDialog::Exit::Moved);
  QVERIFY(!editor.isVisible());
  QCOMPARE(desk.doc().db().recordCount(), before - 1);
  QCOMPARE(desk.doc().rowCount(), before - 1);
  Database target;
  QVERIFY(target.Open(twin.toStdString(), desk.ui).ok());
  QCOMPARE(target.recordCount(), before + 1);
}

void EditorTest::viewOnlyRefusesEdits() {
  Desk desk;
  {
    Database db;
    QVERIFY(db.Open(desk.Path("Contacts"), desk.ui).ok());
    SetLevel(db.schema(), secured::kEditRecords, access_level::kViewOnly);
    db.MarkChanged();
    QVERIFY(db.Save().ok());
  }
  desk.preferences.flags.allowChecks = true;
  QVERIFY(desk.Open("Contacts"));
  const Bytes before(desk.doc().db().record(0).begin(), desk.doc().db().record(0).end());
  bool readOnly = false;
  bool checkDisabled = false;
  WhenShown(QStringLiteral("recordEditor"), [&](QWidget* w) {
    auto* editor = static_cast<RecordEditorDialog*>(w);
    auto* name = qobject_cast<QPlainTextEdit*>(editor->ControlFor(desk.FieldNamed("Name")));
    readOnly = name->isReadOnly();
    checkDisabled = !editor->ControlFor(desk.FieldNamed("Favorite"))->isEnabled();
    QVERIFY(!editor->Apply());
    QVERIFY(!editor->action(QStringLiteral("Delete Record"))->isEnabled());
    editor->reject();
  });
  // Even a tap on the check box opens the read-only form.
  desk.commands->OpenRecordAt(0, desk.ColumnOf("Favorite"), QPoint());
  QVERIFY(readOnly);
  QVERIFY(checkDisabled);
  QVERIFY(!desk.doc().changed());
  QVERIFY(std::ranges::equal(desk.doc().db().record(0), before));
}

void EditorTest::pageDownKeepsTheEditsAndMovesOn() {
  Desk desk;
  QVERIFY(desk.Open("Contacts"));
  const int phone = desk.FieldNamed("Phone");
  const size_t first = desk.doc().recordAt(0);
  const size_t second = desk.doc().recordAt(1);
  RecordEditorDialog editor(desk.doc(), first, false, desk.commands->HistoryOf(&desk.doc()), &desk.window);
  editor.show();
  qobject_cast<QPlainTextEdit*>(editor.ControlFor(phone))->setPlainText(QStringLiteral("1\n2"));
  QTest::keyClick(editor.ControlFor(desk.FieldNamed("Name")), Qt::Key_PageDown);
  QCOMPARE(editor.record(), second);
  QCOMPARE(ValueString(desk.Value(first, phone)), std::string("1\r\n2"));
  QVERIFY(!editor.Step(-2));
  QVERIFY(editor.Step(-1));
  QCOMPARE(editor.record(), first);

  // Characters the file cannot hold are refused, not replaced.
  auto* box = qobject_cast<QPlainTextEdit*>(editor.ControlFor(phone));
  box->setPlainText(QStringLiteral("\u4e2d"));
  QCOMPARE(box->toPlainText(), QStringLiteral("1\n2"));
  QVERIFY(!editor.form().AnyModified());
}

void EditorTest::imageEditorKeepsUntouchedPicturesAndDraws() {
  Bytes foreign(2001, 0xA5);  // another program's picture, header byte 0xA5
  ImageEditorDialog untouched(foreign, false);
  QVERIFY(!untouched.edited());
  QCOMPARE(untouched.result(), foreign);

  ImageEditorDialog dialog({}, false);
  PictureCanvas* canvas = dialog.canvas();
  dialog.show();
  QTest::mousePress(canvas, Qt::LeftButton, {}, QPoint(1 + 10 * 3, 1 + 20 * 3));
  QTest::mouseMove(canvas, QPoint(1 + 30 * 3, 1 + 20 * 3));
  QTest::mouseRelease(canvas, Qt::LeftButton, {}, QPoint(1 + 30 * 3, 1 + 20 * 3));
  QVERIFY(dialog.edited());
  const Bytes drawn = dialog.result();
  QCOMPARE(drawn.size(), size_t(2001));
  QCOMPARE(drawn[0], uint8_t(1));
  for (int x = 10; x <= 30; ++x) QVERIFY(PictureInk(drawn, x, 20));
  QVERIFY(!PictureInk(drawn, 31, 20));
  dialog.findChild<QPushButton*>(QStringLiteral("clearButton"))->click();
  QVERIFY(dialog.result().empty());
}

namespace {

// A different value of the same type, as a user would enter it.
void ChangeValue(RecordForm& form, int field) {
  switch (form.TypeOf(field)) {
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
      form.SetText(field, form.Text(field).substr(0, 3) + "\xe9" "dited");
      break;
    case FieldType::Linked:
      form.SetText(field, "re-linked");
      break;
    case FieldType::Integer:
      form.SetText(field, std::to_string(ParseLong(form.Text(field)) + 7));
      break;
    case FieldType::Float:
      form.SetText(field, "12.5");
      break;
    case FieldType::PopUp:
      form.SetByte(field, form.Byte(field) == 0 ? 1 : 0);
      break;
    case FieldType::CheckBox:
      form.SetByte(field, form.Byte(field) == 0 ? 1 : 0);
      break;
    case FieldType::Date:
      form.SetNumber(field, form.Number(field) + 31);
      break;
    case FieldType::Time: {
      TimeBytes t = form.Time(field);
      t.hours = t.none() ? 8 : static_cast<uint8_t>((t.hours + 1) % 24);
      form.SetTime(field, t);
      break;
    }
    case FieldType::Image: {
      Bytes picture = form.Image(field).empty() ? NewPicture() : form.Image(field);
      DrawPictureLine(picture, 0, 0, 159, 99, true);
      form.SetImage(field, picture);
      break;
    }
    default:
      break;
  }
}

std::vector<std::vector<std::string>> AllTexts(const Document& doc) {
  std::vector<std::vector<std::string>> all;
  for (size_t r = 0; r < doc.db().recordCount(); ++r) {
    std::vector<std::string> texts;
    for (int f = 0; f < format::kFieldCount; ++f) {
      texts.push_back(IsCalculated(doc.db().schema(), f) ? std::string() : doc.ValueText(r, f));
    }
    all.push_back(texts);
  }
  return all;
}

}  // namespace

void EditorTest::everyRecordOfEverySampleTakesAChangeInEachType() {
  Desk desk;
  for (const char* sample : {"Contacts", "Orders", "Vault"}) {
    Database db;
    QVERIFY(db.Open(desk.Path(sample), desk.ui).ok());
    // Fields kept out of the editor (the Contacts photo) are made Visible,
    // as Edit Field would, so that every type takes a change.
    for (FieldDef& f : db.schema().field) f.visible = 1;
    Document doc(*desk.context, db);
    doc.RebuildView();
    const size_t count = db.recordCount();
    for (size_t r = 0; r < count; ++r) {
      auto before = AllTexts(doc);
      RecordEditorDialog editor(doc, r, false, nullptr, &desk.window);
      std::vector<int> changed;
      for (int f : editor.form().fields()) {
        ChangeValue(editor.form(), f);
        if (editor.form().Modified(f)) changed.push_back(f);
      }
      QVERIFY(!changed.empty());
      if (std::string(sample) == "Contacts") {
        QVERIFY(std::ranges::any_of(changed, [&](int f) { return editor.form().TypeOf(f) == FieldType::Image; }));
      }
      std::vector<std::string> expected = before[r];
      for (int f : changed) expected[f] = editor.form().DisplayText(f);
      QVERIFY(editor.Apply());
      auto after = AllTexts(doc);
      // The edited record holds its new values and nothing else changed;
      // the other records are as they were (in whatever order the sort
      // put them).
      QCOMPARE(after[editor.record()], expected);
      after.erase(after.begin() + static_cast<long>(editor.record()));
      before.erase(before.begin() + static_cast<long>(r));
      std::sort(after.begin(), after.end());
      std::sort(before.begin(), before.end());
      QVERIFY(after == before);
    }
    QVERIFY(db.Save().ok());

    // The command-line tool reads back exactly what the editor holds.
    QProcess cli;
    // In the regional settings the editor used.
    cli.start(QStringLiteral(CARDOVEX_CLI), {QStringLiteral("--date-format"), QString::fromStdString(desk.locale.shortDate),
                                             QStringLiteral("--time-format"), QString::fromStdString(desk.locale.timeFormat),
                                             QStringLiteral("--decimal"), QStringLiteral("."),
                                             QStringLiteral("--password"), QStringLiteral("secret"),
                                             QStringLiteral("records"), QStringLiteral("--all"),
                                             QStringLiteral("--json"), QString::fromStdString(desk.Path(sample))});
    QVERIFY(cli.waitForFinished(30000));
    QVERIFY2(cli.exitCode() == 0, cli.readAllStandardError().constData());
    const QJsonArray records = QJsonDocument::fromJson(cli.readAllStandardOutput()).array();
    QCOMPARE(static_cast<size_t>(records.size()), count);
    for (size_t r = 0; r < count; ++r) {
      for (const QJsonValue& v : records[static_cast<int>(r)].toObject()[QStringLiteral("fields")].toArray()) {
        const QJsonObject field = v.toObject();
        const int slot = field[QStringLiteral("slot")].toInt();
        QCOMPARE(field[QStringLiteral("text")].toString(), FromDb(doc.ValueText(r, slot)));
      }
    }
  }
}

void EditorTest::undoAndRedoFromTheWindow() {
  Desk desk;
  desk.preferences.flags.allowChecks = true;
  QVERIFY(desk.Open("Contacts"));
  const int favorite = desk.FieldNamed("Favorite");
  const size_t record = desk.doc().recordAt(0);
  const uint8_t before = desk.Value(record, favorite)[0];
  desk.commands->OpenRecordAt(0, desk.ColumnOf("Favorite"), QPoint());
  QVERIFY(desk.Value(record, favorite)[0] != before);
  QVERIFY(desk.commands->undoAction()->isEnabled());
  desk.commands->undoAction()->trigger();
  QCOMPARE(desk.Value(record, favorite)[0], before);
  QVERIFY(desk.commands->redoAction()->isEnabled());
  desk.commands->redoAction()->trigger();
  QVERIFY(desk.Value(record, favorite)[0] != before);
}

}  // namespace cx::gui

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  cx::gui::EditorTest test;
  return QTest::qExec(&test, argc, argv);
}

#include "editor_test.moc"
