// The main window reaches the design dialogs: "DB Properties..." after its
// check, and "New" through the design step, whose Cancel leaves nothing.
#include <QAction>
#include <QDir>
#include <QLineEdit>
#include <QtTest>

#include "app/document.h"
#include "app/preferences.h"
#include "gui/common/qt_ui_port.h"
#include "gui/design/edit_database_dialog.h"
#include "gui/main/main_window.h"
#include "platform/settings.h"
#include "tests/gui/design/design_gui_support.h"
#include "tests/support/test_support.h"

using namespace cx;
using namespace cx::testing;
using namespace cx::gui;

class MainWindowDesignTest : public QObject {
  Q_OBJECT

 private:
  TempDir dir_;

 private slots:
  void cleanup() { StopModalWatchers(); }

  void commandsOpenTheDesignDialogs() {
    QtUiPort ui;
    ui.SetNativeFileDialogs(false);
    LocaleInfo locale;
    MemorySettings settings;
    Preferences preferences(settings);
    RecentFiles recent(settings);
    const std::string data = dir_.File("data");
    QDir().mkpath(QString::fromStdString(data));
    AppContext context{ui, locale, preferences, recent, data};
    Workspace workspace(context);
    MainWindow window(workspace, ui);
    ui.SetParent(&window);

    // New, with its design step cancelled: nothing is open, nothing written.
    bool designed = false;
    OnModal("editDatabaseDialog", [&designed](QWidget* d) {
      designed = true;
      Press(d, QDialogButtonBox::Cancel);
    });
    window.action(Command::New)->trigger();
    QVERIFY(designed);
    QVERIFY(workspace.shown() == nullptr);
    QVERIFY(QDir(QString::fromStdString(data)).isEmpty());

    // New with OK: the new database is shown, named as designed.
    OnModal("editDatabaseDialog", [](QWidget* d) {
      qobject_cast<EditDatabaseDialog*>(d)->nameEdit()->setText("Fresh");
      Press(d, QDialogButtonBox::Ok);
    });
    window.action(Command::New)->trigger();
    QVERIFY(workspace.shown() != nullptr);
    QCOMPARE(workspace.shown()->db().Name(), std::string("Fresh"));
    QVERIFY(window.windowTitle().contains("Fresh"));

    // DB Properties: the dialog opens on the shown database; its OK marks
    // the database changed and the title follows.
    workspace.shown()->db().ClearChanged();
    OnModal("editDatabaseDialog", [](QWidget* d) {
      qobject_cast<EditDatabaseDialog*>(d)->nameEdit()->setText("Renamed");
      Press(d, QDialogButtonBox::Ok);
    });
    window.action(Command::DBProperties)->trigger();
    QCOMPARE(workspace.shown()->db().Name(), std::string("Renamed"));
    QVERIFY(workspace.shown()->changed());
    QVERIFY(window.windowTitle().contains("Renamed"));
  }
};

#include "main_window_design_test.moc"

int RunMainWindowDesignTest(int argc, char** argv) {
  MainWindowDesignTest t;
  return QTest::qExec(&t, argc, argv);
}
