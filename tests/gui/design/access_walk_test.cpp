// Every guarded command of the desktop program at every access level, with
// no password, the right one in the wrong letter case, and the right one.
#include <QComboBox>
#include <QLineEdit>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QSignalSpy>
#include <QtTest>
#include <functional>

#include "app/commands.h"
#include "app/document.h"
#include "app/preferences.h"
#include "design/security.h"
#include "gui/design/design_commands.h"
#include "gui/design/field_editor_dialog.h"
#ifdef CARDOVEX_WALK_EDITOR
#include "app/record_commit.h"
#include "gui/editor/editor_commands.h"
#include "gui/editor/record_editor_dialog.h"
#endif
#ifdef CARDOVEX_WALK_DATA
#include "gui/data/data_commands.h"
#include "gui/data/beam.h"
#include "gui/data/data_util.h"
#include "infrared/beam_commands.h"
#endif
#include "platform/settings.h"
#include "tests/design/design_db.h"
#include "tests/gui/design/design_gui_support.h"
#include "tests/support/test_support.h"

using namespace cx;
using namespace cx::testing;
using namespace cx::gui;

namespace {

enum Typed { kNothing, kWrongCase, kRight };

struct Site {
  const char* name;
  int operation;
  // Runs the command; true when the guarded work ran. `guarded` is the
  // file whose level is set, `plain` an unprotected one of the same design.
  std::function<bool(Workspace&, const std::string& guarded, const std::string& plain)> run;
  // The workspace shows the plain database (the guarded one is the other
  // side of the work) rather than the guarded one.
  bool showsPlain = false;
  // How often one run asks: a move asks the delete check once per record.
  int checksPerRun = 1;
};

// A dialog command ran when its dialog showed (it is then cancelled).
bool ShowsDialog(const char* dialog, const std::function<void()>& command) {
  bool shown = false;
  OnModal(QString::fromLatin1(dialog), [&shown](QWidget* w) {
    shown = true;
    // A read-only record editor has no Cancel button.
    if (auto* d = qobject_cast<QDialog*>(w)) d->reject();
  });
  command();
  StopModalWatchers();
  return shown;
}

#ifdef CARDOVEX_WALK_DATA
// A beam ran when its session started. The peer is a loopback port where
// nothing listens, and the search is cancelled at once: no transfer.
bool Beams(Workspace& ws, obex::BeamWhat what) {
  MemorySettings settings;
  settings.Set(obex::kBeamPeersSetting, "127.0.0.1:1");
  BeamSession* session = BeamCommand(nullptr, DataTarget(ws.shown()->session()), settings, what);
  if (!session) return false;
  QSignalSpy done(session, &BeamSession::finished);
  session->CancelSearch();
  if (done.isEmpty()) done.wait(5000);
  return true;
}
#endif

const std::vector<Site>& Sites() {
  static const std::vector<Site> sites = {
      {"open", secured::kOpenDatabase,
       [](Workspace& ws, const std::string& path, const std::string&) { return ws.Open(path); }},
      {"delete records", secured::kDeleteRecords,
       [](Workspace& ws, const std::string&, const std::string&) {
         // The main window asks before its dialog, then deletes.
         if (!CommandAllowed(Command::DeleteRecords, *ws.shown(), ws.context().ui)) return false;
         return ws.shown()->DeleteRecords(DeleteScope::All) > 0;
       }},
      {"db properties", secured::kDBProperties,
       [](Workspace& ws, const std::string&, const std::string&) {
         return ShowsDialog("editDatabaseDialog",
                            [&] { ShowDatabaseProperties(nullptr, *ws.shown()); });
       }},
      {"field properties", secured::kDBProperties,
       [](Workspace& ws, const std::string&, const std::string&) {
         return ShowsDialog("editFieldDialog",
                            [&] { ShowFieldProperties(nullptr, *ws.shown(), 0); });
       }},
      {"security access", secured::kDBProperties,
       [](Workspace& ws, const std::string&, const std::string&) {
         return ShowsDialog("securityAccessDialog",
                            [&] { ShowSecurityAccess(nullptr, *ws.shown()); });
       }},
      {"edit popup list", secured::kEditPopups,
       [](Workspace& ws, const std::string&, const std::string&) {
         return ShowsDialog("popupListDialog", [&] { EditPopupList(nullptr, *ws.shown(), 0); });
       }},
      {"field editor's edit popups", secured::kEditPopups,
       [](Workspace& ws, const std::string&, const std::string&) {
         FieldEditorDialog editor(ws.shown()->session(), 0);
         return ShowsDialog("popupListDialog",
                            [&] { editor.findChild<QPushButton*>("editPopups")->click(); });
       }},
#ifdef CARDOVEX_WALK_EDITOR
      {"new record", secured::kAddRecords,
       [](Workspace& ws, const std::string&, const std::string&) {
         QWidget window;
         EditorCommands commands(&window, ws);
         return ShowsDialog("recordEditor", [&] { commands.NewRecord(); });
       }},
      {"open record", secured::kEditRecords,
       [](Workspace& ws, const std::string&, const std::string&) {
         QWidget window;
         EditorCommands commands(&window, ws);
         return ShowsDialog("recordEditor", [&] { commands.OpenRecordAt(0, 1, QPoint()); });
       }},
      {"editor's edit popup list", secured::kEditPopups,
       [](Workspace& ws, const std::string&, const std::string&) {
         Document& doc = *ws.shown();
         RecordEditorDialog editor(doc, doc.recordAt(0), false, nullptr);
         return ShowsDialog("popupListDialog", [&] { editor.EditPopups(0); });
       }},
      {"popups append", secured::kEditPopups,
       [](Workspace& ws, const std::string&, const std::string&) {
         Document& doc = *ws.shown();
         doc.db().schema().field[1].popupsAppend = 1;
         RecordForm form(doc.session(), doc.recordAt(0), doc.context().clock);
         form.SetText(1, "typed");
         return AppendTypedToPopups(form);
       }},
#endif
#ifdef CARDOVEX_WALK_DATA
      {"copy records, target", secured::kAddRecords,
       [](Workspace& ws, const std::string& guarded, const std::string&) {
         return TransferToFile(DataTarget(ws.shown()->session()), false, true, guarded);
       },
       true},
      {"move records, source", secured::kDeleteRecords,
       [](Workspace& ws, const std::string&, const std::string& plain) {
         // Refused, a move still copies: it ran when records left the source.
         TransferToFile(DataTarget(ws.shown()->session()), true, true, plain);
         return ws.shown()->db().recordCount() == 0;
       },
       false, 2},
      {"beam records", secured::kBeamData,
       [](Workspace& ws, const std::string&, const std::string&) { return Beams(ws, obex::BeamWhat::kRecordsInView); }},
      {"beam database", secured::kBeamData,
       [](Workspace& ws, const std::string&, const std::string&) { return Beams(ws, obex::BeamWhat::kDatabase); }},
      {"beam record", secured::kBeamData,
       [](Workspace& ws, const std::string&, const std::string&) { return Beams(ws, obex::BeamWhat::kRecord); }},
#endif
  };
  return sites;
}

}  // namespace

class AccessWalkTest : public QObject {
  Q_OBJECT

 private:
  TempDir dir_;

 private slots:
  void cleanup() { StopModalWatchers(); }

#ifdef CARDOVEX_WALK_EDITOR
  // "View Records Only" opens the record, but nothing in it can be changed.
  void viewRecordsOnlyOpensTheFormReadOnly() {
    const std::string path = dir_.File("viewonly.PDB");
    Database db = MakeDatabase(path, {{"Colour", FieldType::PopUp}, {"Name", FieldType::Text}});
    db.popups()[0].items = {"Red", "Blue"};
    AddRecord(db, {"0", "first"});
    SetLevel(db.schema(), secured::kEditRecords, access_level::kViewOnly);
    QVERIFY(db.SaveAs(path).ok());
    ScriptedUi ui;
    LocaleInfo locale;
    MemorySettings settings;
    Preferences preferences(settings);
    RecentFiles recent(settings);
    AppContext context{ui, locale, preferences, recent, dir_.path()};
    Workspace workspace(context);
    QVERIFY(workspace.Open(path));
    QWidget window;
    EditorCommands commands(&window, workspace);
    int editable = -1;
    OnModal(QStringLiteral("recordEditor"), [&editable](QWidget* w) {
      editable = 0;
      for (auto* e : w->findChildren<QLineEdit*>()) editable += e->isVisible() && !e->isReadOnly();
      for (auto* e : w->findChildren<QPlainTextEdit*>()) editable += !e->isReadOnly();
      for (auto* c : w->findChildren<QComboBox*>()) editable += c->isEnabled();
      qobject_cast<QDialog*>(w)->reject();
    });
    commands.OpenRecordAt(0, 1, QPoint());
    StopModalWatchers();
    QCOMPARE(editable, 0);
    QCOMPARE(ui.passwordPrompts, 0);
  }
#endif

  void walk_data() {
    QTest::addColumn<int>("site");
    QTest::addColumn<int>("level");
    QTest::addColumn<int>("typed");
    const char* levels[] = {"full", "password", "none", "view only"};
    const char* typed[] = {"no password", "wrong case", "right password"};
    for (int s = 0; s < int(Sites().size()); ++s) {
      for (int level = 0; level < 4; ++level) {
        for (int t = kNothing; t <= kRight; ++t) {
          QTest::addRow("%s, %s, %s", Sites()[s].name, levels[level], typed[t]) << s << level << t;
        }
      }
    }
  }

  void walk() {
    QFETCH(int, site);
    QFETCH(int, level);
    QFETCH(int, typed);
    const Site& s = Sites()[static_cast<size_t>(site)];

    const std::string path = dir_.File("guarded.PDB");
    const std::string plain = dir_.File("plain.PDB");
    for (const std::string& file : {path, plain}) {
      Database db = MakeDatabase(file, {{"Colour", FieldType::PopUp}, {"Name", FieldType::Text}});
      db.popups()[0].items = {"Red", "Blue"};
      AddRecord(db, {"0", "first"});
      AddRecord(db, {"1", "second"});
      db.schema().password.set("Secret");
      if (file == path) SetLevel(db.schema(), s.operation, level);
      QVERIFY(db.SaveAs(file).ok());
    }

    ScriptedUi ui;
    LocaleInfo locale;
    MemorySettings settings;
    Preferences preferences(settings);
    RecentFiles recent(settings);
    AppContext context{ui, locale, preferences, recent, dir_.path()};
    Workspace workspace(context);
    if (s.operation != secured::kOpenDatabase) QVERIFY(workspace.Open(s.showsPlain ? plain : path));
    ui.messages.clear();
    ui.passwordPrompts = 0;
    for (int i = 0; i < s.checksPerRun; ++i) {
      if (typed == kWrongCase) ui.passwordAnswers.push_back({"SECRET"});
      if (typed == kRight) ui.passwordAnswers.push_back({"Secret"});
    }

    const bool ran = s.run(workspace, path, plain);

    // Opening knows no "view only": any level but the first two refuses.
    const bool viewOnlyGrants = s.operation != secured::kOpenDatabase;
    bool expected = level == access_level::kFull ||
                    (level == access_level::kViewOnly && viewOnlyGrants) ||
                    (level == access_level::kPassword && typed == kRight);
    QCOMPARE(ran, expected);
    QCOMPARE(ui.passwordPrompts, level == access_level::kPassword ? s.checksPerRun : 0);

    auto said = [&ui](const char* text) {
      for (const auto& m : ui.messages) {
        if (m.text == text) return true;
      }
      return false;
    };
    QCOMPARE(said(security_messages::kInvalidPassword),
             level == access_level::kPassword && typed == kWrongCase);
    if (s.operation == secured::kOpenDatabase) {
      // A refused open says so; a cancelled password prompt gives up quietly.
      QCOMPARE(said(security_messages::kOpenDenied), !expected && level != access_level::kPassword);
      QCOMPARE(workspace.shown() != nullptr, expected);
    } else {
      QCOMPARE(said(security_messages::kDenied), !expected);
    }
  }
};

#include "access_walk_test.moc"

int RunAccessWalkTest(int argc, char** argv) {
  AccessWalkTest t;
  return QTest::qExec(&t, argc, argv);
}
