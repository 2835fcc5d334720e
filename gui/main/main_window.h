// The main window: the two labels, the record list of the shown database,
// the menus and the toolbar. It adapts the workspace (app/document.h) to
// widgets and routes every command; the work itself is done by the document
// layer and by the dialog modules.
//
// For the dialog modules: workspace(), context(), document() and
// RebuildList() are what a command needs. Each command of a module has one
// private slot below whose body calls into that module; the module asks the
// command's access check itself (the menus and keys only grey what cannot
// apply).
#pragma once

#include <QMainWindow>
#include <QPointer>
#include <array>
#include <map>

#include "app/commands.h"
#include "app/document.h"
#include "platform/settings.h"

class QAction;
class QDialog;
class QLabel;
class QMenu;

namespace cx::gui {

class QtUiPort;
class RecordListModel;
class RecordListView;

class MainWindow : public QMainWindow, private WorkspaceListener, private DocumentListener {
  Q_OBJECT

 public:
  MainWindow(Workspace& workspace, QtUiPort& ui, QWidget* parent = nullptr);
  ~MainWindow() override;

  Workspace& workspace() { return workspace_; }
  AppContext& context() { return workspace_.context(); }
  QtUiPort& ui() { return ui_; }
  // The program's settings store (the preferences' own, so that tests and
  // screenshots never touch the user's); null until the session sets it.
  Settings* settings() const { return settings_; }
  void SetSettings(Settings* settings);
  // The document of the shown level; null when nothing is open.
  Document* document() { return workspace_.shown(); }
  // Reads rows and columns again and selects the current record.
  void RebuildList();
  // Brings menus, tool buttons and labels up to date.
  void UpdateCommandState();

  RecordListView* list() const { return list_; }
  RecordListModel* model() const { return model_; }
  // The action of a menu command, by its text or its id.
  QAction* action(const QString& text) const;
  QAction* action(Command command) const;

  // The start dialog, as after "Close": new, open or nothing.
  void ShowStartDialog();

  // The heading menu's entries, and the About box (made here so that the
  // screenshot program shows the same).
  static QMenu* CreateHeadingMenu(QWidget* parent);
  static QDialog* CreateAboutBox(QWidget* parent);

 protected:
  void closeEvent(QCloseEvent* event) override;

 private slots:
  // File menu.
  void newDatabase();
  void openDatabase();
  void reopenDatabase(int n);
  void saveDatabase();
  void saveDatabaseAs();
  void closeDatabase();
  void editPreferences();
  void exitProgram();
  // Records menu: the commands done here.
  void findAgain();
  void deleteRecords();
  // The heading menu.
  void showHeadingMenu(int column);
  void sortFromHeading(int field, bool forward);
  void hideField(int field);
  void headingReportCommand(int field);
  // The list.
  void cellTapped(int row, int column);
  void columnWidthChosen(int column, int pixels);
  void autoFit(int column);
  void backToParent();
  // Help menu.
  void showHelpContents();
  void showAbout();

  // --- Slots of the dialog modules (each body is replaced when its module
  // --- lands; until then it says the command is not there yet).
  // Record editor: a tap, Enter or double click on a row (the row is
  // already the current record), and a new record (tool button,
  // Ctrl+Shift+N).
  void openRecordAt(int row, int column);
  void newRecord();
  // After a linked level was closed: the level beneath is shown with its
  // current record again (the record the link was followed from).
  void resumeAfterLinkedLevel();
  // Design dialogs.
  void showDbProperties();
  void showFieldProperties(int field);
  // Data dialogs.
  void showSortDialog();
  void showFilterDialog();
  void disableFilters();
  void recalculate();
  void showFindDialog();
  void runReport();
  void runHeadingReport(int field);
  void exportRecords();
  void importRecords();
  void moveRecordsTo();
  void copyRecordsTo();
  void printRecords();
  void beamRecords();
  void beamDatabase();
  void receiveViaInfrared();

 private:
  // WorkspaceListener
  void LevelPushed(int level, Document& shown) override;
  void LevelPopped(int level, Document& shown) override;
  void DocumentOpened(Document& shown) override;
  void DocumentClosed() override;
  void DocumentReplaced(Document& shown) override;
  // DocumentListener
  void ViewRebuilt() override;
  void RecordChanged(size_t recordIndex) override;
  void ColumnsChanged() override;
  void ChangedMarkToggled(bool changed) override;
  void CurrentRecordChanged(size_t recordIndex) override;
  void FoundRecordChanged() override;

  using Slot = void (MainWindow::*)();
  static Slot SlotOf(Command command);
  void BuildMenus();
  void BuildToolBar();
  void RebuildReopenMenu();
  void AttachShownDocument();
  void UpdateLabels();
  void SelectCurrentRecord();
  // Runs a command only when a database is open (shortcuts reach commands
  // whose menu entry is greyed only if they are not disabled in time).
  bool RequireOpen() const { return workspace_.shown() != nullptr; }
  void NotAvailableYet(const QString& command);
  void OpenPath(const std::string& path);
  void RunStartChoice();

  Workspace& workspace_;
  QtUiPort& ui_;
  Settings* settings_ = nullptr;
  Document* attached_ = nullptr;
  QLabel* title_ = nullptr;
  QLabel* status_ = nullptr;
  RecordListView* list_ = nullptr;
  RecordListModel* model_ = nullptr;
  QMenu* reopenMenu_ = nullptr;
  QAction* newRecordAction_ = nullptr;
  QAction* backAction_ = nullptr;
  QAction* saveAction_ = nullptr;
  std::array<QAction*, kCommandCount> commandActions_{};
  std::map<QString, QAction*> actions_;
  bool selecting_ = false;
};

}  // namespace cx::gui
