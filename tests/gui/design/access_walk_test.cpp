// Every guarded command of the desktop program at every access level, with
// no password, the right one in the wrong letter case, and the right one.
#include <QComboBox>
#include <QPushButton>
#include <QtTest>
#include <functional>

#include "app/commands.h"
#include "app/document.h"
#include "app/preferences.h"
#include "design/security.h"
#include "gui/design/design_commands.h"
#include "gui/design/field_editor_dialog.h"
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
  // Runs the command on the shown document; true when the guarded work ran.
  std::function<bool(Workspace&, const std::string& path)> run;
};

// A dialog command ran when its dialog showed (it is then cancelled).
bool ShowsDialog(const char* dialog, const std::function<void()>& command) {
  bool shown = false;
  OnModal(QString::fromLatin1(dialog), [&shown](QWidget* w) {
    shown = true;
    Press(w, QDialogButtonBox::Cancel);
  });
  command();
  StopModalWatchers();
  return shown;
}

const std::vector<Site>& Sites() {
  static const std::vector<Site> sites = {
      {"open", secured::kOpenDatabase,
       [](Workspace& ws, const std::string& path) { return ws.Open(path); }},
      {"delete records", secured::kDeleteRecords,
       [](Workspace& ws, const std::string&) {
         // The main window asks before its dialog, then deletes.
         if (!CommandAllowed(Command::DeleteRecords, *ws.shown(), ws.context().ui)) return false;
         return ws.shown()->DeleteRecords(DeleteScope::All) > 0;
       }},
      {"db properties", secured::kDBProperties,
       [](Workspace& ws, const std::string&) {
         return ShowsDialog("editDatabaseDialog",
                            [&] { ShowDatabaseProperties(nullptr, *ws.shown()); });
       }},
      {"field properties", secured::kDBProperties,
       [](Workspace& ws, const std::string&) {
         return ShowsDialog("editFieldDialog",
                            [&] { ShowFieldProperties(nullptr, *ws.shown(), 0); });
       }},
      {"security access", secured::kDBProperties,
       [](Workspace& ws, const std::string&) {
         return ShowsDialog("securityAccessDialog",
                            [&] { ShowSecurityAccess(nullptr, *ws.shown()); });
       }},
      {"edit popup list", secured::kEditPopups,
       [](Workspace& ws, const std::string&) {
         return ShowsDialog("popupListDialog", [&] { EditPopupList(nullptr, *ws.shown(), 0); });
       }},
      {"field editor's edit popups", secured::kEditPopups,
       [](Workspace& ws, const std::string&) {
         FieldEditorDialog editor(ws.shown()->session(), 0);
         return ShowsDialog("popupListDialog",
                            [&] { editor.findChild<QPushButton*>("editPopups")->click(); });
       }},
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
    {
      Database db = MakeDatabase(path, {{"Colour", FieldType::PopUp}});
      db.popups()[0].items = {"Red", "Blue"};
      AddRecord(db, {"0"});
      AddRecord(db, {"1"});
      db.schema().password.set("Secret");
      SetLevel(db.schema(), s.operation, level);
      QVERIFY(db.SaveAs(path).ok());
    }

    ScriptedUi ui;
    LocaleInfo locale;
    MemorySettings settings;
    Preferences preferences(settings);
    RecentFiles recent(settings);
    AppContext context{ui, locale, preferences, recent, dir_.path()};
    Workspace workspace(context);
    if (s.operation != secured::kOpenDatabase) QVERIFY(workspace.Open(path));
    ui.messages.clear();
    ui.passwordPrompts = 0;
    if (typed == kWrongCase) ui.passwordAnswers = {{"SECRET"}};
    if (typed == kRight) ui.passwordAnswers = {{"Secret"}};

    const bool ran = s.run(workspace, path);

    // Opening knows no "view only": any level but the first two refuses.
    const bool viewOnlyGrants = s.operation != secured::kOpenDatabase;
    bool expected = level == access_level::kFull ||
                    (level == access_level::kViewOnly && viewOnlyGrants) ||
                    (level == access_level::kPassword && typed == kRight);
    QCOMPARE(ran, expected);
    QCOMPARE(ui.passwordPrompts, level == access_level::kPassword ? 1 : 0);

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
