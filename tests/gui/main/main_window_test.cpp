// The main window on the sample databases: what the user sees after
// opening, and the list's own commands (heading menu, column widths, Save,
// Close, Exit).
#include <QAction>
#include <QApplication>
#include <QDir>
#include <QFile>
#include <QHeaderView>
#include <QLabel>
#include <QMouseEvent>
#include <QSignalSpy>
#include <QCheckBox>
#include <QComboBox>
#include <QListWidget>
#include <QMenu>
#include <QTest>
#include <QTimer>

#include "app/columns.h"
#include "gui/common/icons.h"
#include "gui/common/text.h"
#include "gui/editor/editor_commands.h"
#include "gui/main/desktop_session.h"
#include "gui/main/record_delegate.h"
#include "gui/main/record_list_model.h"
#include "gui/main/record_list_view.h"
#include "modal_answer.h"
#include "tests/support/test_support.h"

using cx::gui::DesktopSession;
using cx::gui::testing::ModalAnswer;

namespace {

QString SampleCopy(const cx::testing::TempDir& dir, const QString& name) {
  const QString to = QString::fromStdString(dir.File(name.toStdString() + ".PDB"));
  QFile::copy(QStringLiteral(CARDOVEX_SAMPLE_DIR "/") + name + QStringLiteral(".PDB"), to);
  QFile(to).setPermissions(QFile::ReadOwner | QFile::WriteOwner);
  return to;
}

QString Title(DesktopSession& s) { return s.window().findChild<QLabel*>(QStringLiteral("titleLabel"))->text(); }

QStringList Headings(DesktopSession& s) {
  QStringList out;
  auto* model = s.window().model();
  for (int c = 0; c < model->columnCount(); ++c) out << model->headerData(c, Qt::Horizontal, Qt::DisplayRole).toString();
  return out;
}

// A left-button press, move and release on the header, as a drag of the
// divider at the right edge of `column`.
void DragDivider(cx::gui::RecordListView* list, int column, int by) {
  QHeaderView* header = list->horizontalHeader();
  QWidget* port = header->viewport();
  const int x = header->sectionViewportPosition(column) + header->sectionSize(column) - 1;
  const QPoint from(x, header->height() / 2);
  const QPoint to(x + by, header->height() / 2);
  QMouseEvent press(QEvent::MouseButtonPress, from, port->mapToGlobal(from), Qt::LeftButton, Qt::LeftButton, {});
  QApplication::sendEvent(port, &press);
  for (int step = 1; step <= 4; ++step) {
    const QPoint at(x + by * step / 4, from.y());
    QMouseEvent move(QEvent::MouseMove, at, port->mapToGlobal(at), Qt::NoButton, Qt::LeftButton, {});
    QApplication::sendEvent(port, &move);
  }
  QMouseEvent release(QEvent::MouseButtonRelease, to, port->mapToGlobal(to), Qt::LeftButton, Qt::NoButton, {});
  QApplication::sendEvent(port, &release);
}

void ClickHeading(cx::gui::RecordListView* list, int column) {
  QHeaderView* header = list->horizontalHeader();
  const QPoint at(header->sectionViewportPosition(column) + header->sectionSize(column) / 2, header->height() / 2);
  QTest::mouseClick(header->viewport(), Qt::LeftButton, {}, at);
}

}  // namespace

class TestMainWindow : public QObject {
  Q_OBJECT

 private:
  std::unique_ptr<cx::testing::TempDir> dir_;
  std::unique_ptr<DesktopSession> session_;

  DesktopSession& Start(const QStringList& samples, bool autoSave = true) {
    session_.reset();
    dir_ = std::make_unique<cx::testing::TempDir>();
    auto settings = std::make_unique<cx::MemorySettings>();
    settings->Set("AutoSave", autoSave ? "1" : "0");
    session_ = std::make_unique<DesktopSession>(std::move(settings), dir_->path());
    session_->ui().SetNativeFileDialogs(false);
    std::vector<std::string> files;
    for (const QString& name : samples) files.push_back(SampleCopy(*dir_, name).toStdString());
    session_->Start(files);
    return *session_;
  }

 private slots:
  // The beam commands offer the peers remembered in the session's own
  // settings store, not in the user's real one.
  void beamCommandsReadTheSessionsSettings() {
    DesktopSession& s = Start({"Orders"});
    s.settings().Set("RecentBeamPeers", "remembered.example:6500");
    auto offered = [](QWidget* w) {
      auto* box = w->findChild<QComboBox*>(QStringLiteral("beamPeer"));
      return box ? box->itemText(0) : QStringLiteral("<no peer dialog: %1>").arg(w->objectName());
    };
    QString fromWindow, fromEditor;
    {
      ModalAnswer peers([&](QWidget* w) {
        fromWindow = offered(w);
        ModalAnswer::Reject()(w);
      });
      s.window().action(QStringLiteral("Beam Records..."))->trigger();
      QVERIFY(peers.answered());
    }
    QCOMPARE(fromWindow, QStringLiteral("remembered.example:6500"));

    ModalAnswer editor([&](QWidget* w) {
      QAction* beam = nullptr;
      for (QAction* a : w->findChildren<QAction*>()) {
        if (a->text() == QStringLiteral("Beam Record...")) beam = a;
      }
      if (beam) {
        ModalAnswer peers([&](QWidget* p) {
          fromEditor = offered(p);
          ModalAnswer::Reject()(p);
        });
        beam->trigger();
      }
      ModalAnswer::Reject()(w);
    });
    cx::gui::EditorCommandsOf(&s.window(), s.workspace()).OpenRecordAt(0, 1, QPoint());
    QVERIFY(editor.answered());
    QCOMPARE(fromEditor, QStringLiteral("remembered.example:6500"));
  }

  void cleanup() {
    if (session_) {
      // Nothing the test left changed is saved or asked about.
      while (cx::Document* doc = session_->workspace().shown()) {
        doc->db().ClearChanged();
        if (!session_->workspace().Close()) break;
      }
    }
    session_.reset();
    dir_.reset();
  }

  void opensEachSample_data() {
    QTest::addColumn<QString>("sample");
    QTest::addColumn<QString>("password");
    QTest::addColumn<QString>("title");
    QTest::addColumn<QStringList>("firstHeadings");
    QTest::newRow("Contacts") << "Contacts" << "" << "Contacts (4/4)"
                              << QStringList{"Name", "Phone", "Birthday", "Category", "Favorite", "Contact#", "Orders"};
    QTest::newRow("Orders") << "Orders" << "" << "Orders (5/5)"
                            << QStringList{"Order#", "Item", "Customer", "Quantity", "Price", "Total", "Running"};
    QTest::newRow("Vault") << "Vault" << "secret" << "Vault (3/3)"
                           << QStringList{"Site", "User", "Secret", "Changed", "Strength"};
  }
  void opensEachSample() {
    QFETCH(QString, sample);
    QFETCH(QString, password);
    QFETCH(QString, title);
    QFETCH(QStringList, firstHeadings);
    std::unique_ptr<ModalAnswer> prompt;
    if (!password.isEmpty()) prompt = std::make_unique<ModalAnswer>(ModalAnswer::TypeAndAccept(password));
    DesktopSession& s = Start({sample});
    if (prompt) QCOMPARE(prompt->title(), QStringLiteral("Get Password"));
    QCOMPARE(Title(s), title);
    QVERIFY(s.window().windowTitle().contains(sample));
    cx::Document* doc = s.workspace().shown();
    QVERIFY(doc);
    QCOMPARE(s.window().model()->rowCount(), static_cast<int>(doc->db().recordCount()));
    QCOMPARE(Headings(s).mid(0, firstHeadings.size()), firstHeadings);
    // Every column is as wide as the file says (stored width x 1.5), and a
    // field of width 0 has none.
    const auto columns = cx::ListColumns(doc->db().schema());
    QCOMPARE(s.window().model()->columnCount(), static_cast<int>(columns.size()));
    for (size_t c = 0; c < columns.size(); ++c) {
      QCOMPARE(s.window().list()->columnWidth(static_cast<int>(c)), columns[c].pixels);
    }
    QVERIFY(!s.window().action(QStringLiteral("Save"))->isEnabled());
    QVERIFY(s.window().action(QStringLiteral("Close"))->isEnabled());
  }

  void wrongPasswordKeepsTheDatabaseShut() {
    // Wrong, then Cancel: "Invalid Password" in between, nothing opens.
    ModalAnswer first(ModalAnswer::TypeAndAccept(QStringLiteral("Secret")));
    std::unique_ptr<ModalAnswer> invalid, cancel;
    QTimer::singleShot(0, [&] {
      invalid = std::make_unique<ModalAnswer>([&](QWidget* w) {
        cancel = std::make_unique<ModalAnswer>(ModalAnswer::Reject());
        ModalAnswer::Accept()(w);
      });
    });
    DesktopSession& s = Start({QStringLiteral("Vault")});
    QVERIFY(invalid && invalid->answered());
    QCOMPARE(invalid->text(), QStringLiteral("Invalid Password"));
    QVERIFY(!s.workspace().shown());
    QCOMPARE(Title(s), QStringLiteral("Cardovex"));
  }

  void headingMenuSorts() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    auto* model = s.window().model();
    ModalAnswer choose(ModalAnswer::ChooseMenuEntry(QStringLiteral("Sort Reverse")));
    ClickHeading(s.window().list(), 0);
    QVERIFY(choose.answered());
    QStringList names;
    for (int r = 0; r < model->rowCount(); ++r) names << model->index(r, 0).data().toString();
    QCOMPARE(names, QStringList({"Dave", QString::fromUtf8("Chloé Dubois"), "Bob O'Neil", QString::fromUtf8("Ana Müller")}));
    QCOMPARE(Title(s), QStringLiteral("Contacts* (4/4)"));
    QVERIFY(s.window().action(QStringLiteral("Save"))->isEnabled());
  }

  void reportFromHeadingRefusesATextField() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    ModalAnswer choose(ModalAnswer::ChooseMenuEntry(QStringLiteral("Run Report")));
    std::unique_ptr<ModalAnswer> error;
    QTimer::singleShot(0, [&] { error = std::make_unique<ModalAnswer>(ModalAnswer::Accept()); });
    ClickHeading(s.window().list(), 0);
    QVERIFY(cx::gui::testing::WaitFor([&] { return error && error->answered(); }));
    QCOMPARE(error->title(), QStringLiteral("ERROR"));
    QVERIFY(error->text().startsWith(QStringLiteral("Can only run reports on the following field types:")));
  }

  void dividerDragStoresTheWidthAndMarksChanged() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    cx::Document* doc = s.workspace().shown();
    const int field = s.window().model()->FieldOfColumn(1);
    const int before = s.window().list()->columnWidth(1);
    DragDivider(s.window().list(), 1, 31);
    const int after = s.window().list()->columnWidth(1);
    QCOMPARE(after, before + 31);
    QCOMPARE(static_cast<int>(doc->db().schema().field[field].width), after * 2 / 3);
    QCOMPARE(Title(s), QStringLiteral("Contacts* (4/4)"));
    QVERIFY(s.window().action(QStringLiteral("Save"))->isEnabled());
    // The drag itself is not a rebuild: the column keeps the dragged width
    // rather than the stored width's (which lost a pixel to the 2/3).
    QCOMPARE(s.window().list()->columnWidth(1), after);
  }

  void doubleClickOnDividerAutoFits() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    cx::Document* doc = s.workspace().shown();
    auto* list = s.window().list();
    const int field = s.window().model()->FieldOfColumn(0);
    QHeaderView* header = list->horizontalHeader();
    const QPoint at(header->sectionSize(0) - 1, header->height() / 2);
    QTest::mouseDClick(header->viewport(), Qt::LeftButton, {}, at);
    const QFontMetrics metrics = list->fontMetrics();
    const int expected = cx::AutoFitStoredWidth(
        doc->db().schema(), field, doc->rowCount(),
        [&](size_t r) { return doc->ValueText(doc->recordAt(r), field); },
        [&](const std::string& t) { return metrics.horizontalAdvance(cx::gui::FromDb(t)); });
    QCOMPARE(static_cast<int>(doc->db().schema().field[field].width), expected);
    QCOMPARE(list->columnWidth(0), cx::PixelsFromStored(expected));
    QVERIFY(doc->changed());
  }

  void saveFollowsTheChangedMark() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    QAction* save = s.window().action(QStringLiteral("Save"));
    QVERIFY(!save->isEnabled());
    // A greyed command does nothing from its key either.
    QTest::keyClick(&s.window(), Qt::Key_S, Qt::ControlModifier);
    QVERIFY(!QApplication::activeModalWidget());
    ModalAnswer hide(ModalAnswer::ChooseMenuEntry(QStringLiteral("Hide Field")));
    ClickHeading(s.window().list(), 1);
    QVERIFY(hide.answered());
    QVERIFY(!Headings(s).contains(QStringLiteral("Phone")));
    QVERIFY(save->isEnabled());
    ModalAnswer saved(ModalAnswer::Accept());
    save->trigger();
    QCOMPARE(saved.title(), QStringLiteral("Update"));
    QCOMPARE(saved.text(), QStringLiteral("File Saved"));
    QVERIFY(!save->isEnabled());
    QCOMPARE(Title(s), QStringLiteral("Contacts (4/4)"));
  }

  void rowsAreDrawnAsTheListKnowsThem() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    auto* list = s.window().list();
    list->resize(700, 300);
    list->SelectRow(1);
    const QImage image = list->viewport()->grab().toImage();
    const int favorite = s.window().model()->ColumnOfField(4);
    QVERIFY(favorite >= 0);
    const int rowHeight = list->rowHeight(0);
    // A free pixel of each row: the right end of the Favorite cell, past
    // its box.
    const int x = list->columnViewportPosition(favorite) + list->columnWidth(favorite) - 1;
    QCOMPARE(image.pixelColor(x, list->rowViewportPosition(0) + rowHeight - 1), QColor(Qt::white));
    QCOMPARE(image.pixelColor(x, list->rowViewportPosition(1) + rowHeight - 1), QColor(64, 188, 255));
    // The box image sits in the top-left corner of the cell, inside the
    // one-pixel inset: Ana's is ticked, Bob's is not.
    const QImage on = cx::gui::CheckBoxImage(true).convertToFormat(QImage::Format_RGB32);
    const QImage off = cx::gui::CheckBoxImage(false).convertToFormat(QImage::Format_RGB32);
    const int left = list->columnViewportPosition(favorite) + 1;
    const QImage cell0 = image.copy(left, list->rowViewportPosition(0), 13, 13).convertToFormat(QImage::Format_RGB32);
    const QImage cell1 = image.copy(left, list->rowViewportPosition(1), 13, 13).convertToFormat(QImage::Format_RGB32);
    QCOMPARE(cell0, on);
    QCOMPARE(cell1, off);
    QVERIFY(on != off);
  }

  void tapsOutsideTheRowsDoNothing() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    auto* list = s.window().list();
    list->resize(600, 400);
    cx::Document* doc = s.workspace().shown();
    const size_t current = doc->currentRecord();
    QSignalSpy taps(list, &cx::gui::RecordListView::cellTapped);
    // Below the last row: no tap, no dialog, the current record stays.
    const int below = list->rowViewportPosition(3) + 3 * list->rowHeight(3);
    QTest::mouseClick(list->viewport(), Qt::LeftButton, {}, QPoint(20, below));
    QCOMPARE(taps.count(), 0);
    QVERIFY(!QApplication::activeModalWidget());
    QCOMPARE(doc->currentRecord(), current);
  }

  void hidingEveryColumnLeavesAnEmptyHeaderButTheRows() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    cx::Document* doc = s.workspace().shown();
    while (s.window().model()->columnCount() > 0) {
      const int before = s.window().model()->columnCount();
      doc->HideField(s.window().model()->FieldOfColumn(0));
      QCOMPARE(s.window().model()->columnCount(), before - 1);
    }
    QCOMPARE(s.window().model()->rowCount(), 4);
    QCOMPARE(Title(s), QStringLiteral("Contacts* (4/4)"));
    // Selecting and painting a list without columns must hold.
    s.window().list()->SelectRow(2);
    s.window().list()->viewport()->grab();
  }

  void closeShowsTheStartDialogOverAnEmptyList() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    ModalAnswer start(ModalAnswer::Reject());
    s.window().action(QStringLiteral("Close"))->trigger();
    QCOMPARE(start.title(), QStringLiteral("Cardovex"));
    QVERIFY(!s.workspace().shown());
    QCOMPARE(Title(s), QStringLiteral("Cardovex"));
    QCOMPARE(s.window().model()->rowCount(), 0);
    QCOMPARE(s.window().model()->columnCount(), 0);
    for (const char* text : {"Save", "Save As...", "Close", "Find...", "Delete Records...", "DB Properties...",
                             "Beam Database...", "New Record"}) {
      QVERIFY2(!s.window().action(QString::fromLatin1(text))->isEnabled(), text);
    }
    QVERIFY(s.window().action(QStringLiteral("Open..."))->isEnabled());
  }

  void startDialogOpensARecentFile() {
    DesktopSession& s = Start({QStringLiteral("Contacts"), QStringLiteral("Orders")});
    QCOMPARE(Title(s), QStringLiteral("Contacts (4/4)"));
    // The second file of the command line went to the recent list; the
    // start dialog after Close offers it.
    ModalAnswer start([](QWidget* dialog) {
      auto* list = dialog->findChild<QListWidget*>(QStringLiteral("recentList"));
      const auto found = list->findItems(QStringLiteral("Orders"), Qt::MatchExactly);
      if (found.isEmpty()) return ModalAnswer::Reject()(dialog);
      list->setCurrentItem(found.first());
      ModalAnswer::Press(QStringLiteral("Open"))(dialog);
    });
    s.window().action(QStringLiteral("Close"))->trigger();
    QVERIFY(start.answered());
    QCOMPARE(Title(s), QStringLiteral("Orders (5/5)"));
  }

  void preferencesChangeOnlyOnOk() {
    DesktopSession& s = Start({QStringLiteral("Contacts")});
    const cx::PreferenceFlags before = s.preferences().flags;
    QVERIFY(before.autoSave && before.allowChecks && !before.allowPopups);
    auto toggle = [](QWidget* dialog, bool ok) {
      dialog->findChild<QCheckBox*>(QStringLiteral("AutoSave"))->setChecked(false);
      dialog->findChild<QCheckBox*>(QStringLiteral("AllowPopups"))->setChecked(true);
      ok ? ModalAnswer::Accept()(dialog) : ModalAnswer::Reject()(dialog);
    };
    {
      ModalAnswer cancel([&](QWidget* w) { toggle(w, false); });
      s.window().action(QStringLiteral("Preferences..."))->trigger();
      QCOMPARE(cancel.title(), QStringLiteral("Preferences"));
      QVERIFY(s.preferences().flags == before);
    }
    {
      ModalAnswer ok([&](QWidget* w) { toggle(w, true); });
      s.window().action(QStringLiteral("Preferences..."))->trigger();
      QVERIFY(ok.answered());
      QVERIFY(!s.preferences().flags.autoSave);
      QVERIFY(s.preferences().flags.allowPopups);
    }
    // Nothing reaches the settings store before the end.
    QCOMPARE(s.settings().Get("AllowPopups"), std::optional<std::string>());
    s.Shutdown();
    QCOMPARE(s.settings().Get("AllowPopups"), std::optional<std::string>("1"));
    QCOMPARE(s.settings().Get("AutoSave"), std::optional<std::string>("0"));
    QVERIFY(s.settings().Get("WindowGeometry").has_value());
  }

  void reopenNamesKeepTheirAmpersands() {
    DesktopSession& s = Start({});
    const std::string path = dir_->File("Cartoons.PDB");
    cx::Database db = cx::Database::CreateNew(path, "Tom & Jerry");
    QVERIFY(db.Save().ok());
    s.recent().Add(path);
    auto* reopen = s.window().findChild<QMenu*>(QStringLiteral("reopenMenu"));
    QVERIFY(reopen);
    emit reopen->aboutToShow();
    QStringList texts;
    for (QAction* a : reopen->actions()) texts << a->text();
    QCOMPARE(texts.first(), QStringLiteral("Tom && Jerry"));
    QCOMPARE(texts.last(), QStringLiteral("More Files..."));
    reopen->actions().first()->trigger();
    QCOMPARE(Title(s), QStringLiteral("Tom & Jerry (0/0)"));
  }

  void closingTheWindowAsksAndMayBeCancelled() {
    DesktopSession& s = Start({QStringLiteral("Contacts")}, /*autoSave=*/false);
    s.workspace().shown()->HideField(0);
    ModalAnswer question(ModalAnswer::Press(QStringLiteral("Cancel")));
    QVERIFY(!s.window().close());
    QCOMPARE(question.text(), QStringLiteral("File (Contacts) has changed.  Save Changes?"));
    QVERIFY(s.window().isVisible());
    QVERIFY(s.workspace().shown());
  }
};

int main(int argc, char** argv) {
  cx::gui::testing::UseOffscreenWhenUnset();
  QApplication app(argc, argv);
  TestMainWindow test;
  return QTest::qExec(&test, argc, argv);
}

#include "main_window_test.moc"
