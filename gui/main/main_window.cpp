#include "gui/main/main_window.h"

#include <QAction>
#include <QApplication>
#include <QCloseEvent>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QItemSelectionModel>
#include <QLabel>
#include <QMenu>
#include <QMenuBar>
#include <QMessageBox>
#include <QProgressDialog>
#include <QToolBar>
#include <QVBoxLayout>
#include <memory>

#include "app/commands.h"
#include "app/preferences.h"
#include "gui/common/help.h"
#include "gui/common/icons.h"
#include "gui/common/qt_ui_port.h"
#include "gui/common/text.h"
#include "gui/data/data_commands.h"
#include "gui/design/design_commands.h"
#include "gui/editor/editor_commands.h"
#include "gui/main/delete_records_dialog.h"
#include "gui/main/preferences_dialog.h"
#include "gui/main/record_list_model.h"
#include "gui/main/record_list_view.h"
#include "gui/main/start_dialog.h"

namespace cx::gui {

MainWindow::MainWindow(Workspace& workspace, QtUiPort& ui, QWidget* parent)
    : QMainWindow(parent), workspace_(workspace), ui_(ui) {
  setObjectName(QStringLiteral("mainWindow"));
  setWindowIcon(AppIcon());
  ui_.SetParent(this);

  auto* central = new QWidget(this);
  auto* layout = new QVBoxLayout(central);
  layout->setContentsMargins(0, 4, 0, 0);
  layout->setSpacing(4);
  auto* labels = new QHBoxLayout;
  labels->setContentsMargins(8, 0, 8, 0);
  title_ = new QLabel(central);
  title_->setObjectName(QStringLiteral("titleLabel"));
  title_->setTextFormat(Qt::PlainText);
  QFont bold = title_->font();
  bold.setBold(true);
  title_->setFont(bold);
  status_ = new QLabel(central);
  status_->setObjectName(QStringLiteral("statusLabel"));
  status_->setTextFormat(Qt::PlainText);
  status_->setAlignment(Qt::AlignRight | Qt::AlignVCenter);
  labels->addWidget(title_, 1);
  labels->addWidget(status_);
  layout->addLayout(labels);

  model_ = new RecordListModel(this);
  list_ = new RecordListView(central);
  list_->setModel(model_);
  list_->setFrameShape(QFrame::NoFrame);
  layout->addWidget(list_, 1);
  setCentralWidget(central);

  connect(list_, &RecordListView::cellTapped, this, &MainWindow::cellTapped);
  connect(list_, &RecordListView::headingClicked, this, &MainWindow::showHeadingMenu);
  connect(list_, &RecordListView::columnWidthChosen, this, &MainWindow::columnWidthChosen);
  connect(list_, &RecordListView::autoFitRequested, this, &MainWindow::autoFit);
  // Moving the selection with the keyboard moves the current record too, so
  // that it is the one a save remembers.
  connect(list_->selectionModel(), &QItemSelectionModel::currentRowChanged, this,
          [this](const QModelIndex& now) {
            Document* doc = document();
            if (selecting_ || !doc || !now.isValid() || now.row() >= static_cast<int>(doc->rowCount())) return;
            selecting_ = true;
            doc->SetCurrentRecord(doc->recordAt(now.row()));
            selecting_ = false;
          });

  BuildMenus();
  InstallEditorCommands(this, workspace_);
  BuildToolBar();

  workspace_.AddListener(this);
  AttachShownDocument();
  resize(760, 520);
}

MainWindow::~MainWindow() {
  workspace_.RemoveListener(this);
  if (attached_) attached_->RemoveListener(this);
}

MainWindow::Slot MainWindow::SlotOf(Command command) {
  switch (command) {
    case Command::New: return &MainWindow::newDatabase;
    case Command::Open: return &MainWindow::openDatabase;
    case Command::MoreFiles: return &MainWindow::openDatabase;
    case Command::Save: return &MainWindow::saveDatabase;
    case Command::SaveAs: return &MainWindow::saveDatabaseAs;
    case Command::Close: return &MainWindow::closeDatabase;
    case Command::Preferences: return &MainWindow::editPreferences;
    case Command::Exit: return &MainWindow::exitProgram;
    case Command::NewRecord: return &MainWindow::newRecord;
    case Command::Find: return &MainWindow::showFindDialog;
    case Command::FindAgain: return &MainWindow::findAgain;
    case Command::Filter: return &MainWindow::showFilterDialog;
    case Command::Sort: return &MainWindow::showSortDialog;
    case Command::DisableFilters: return &MainWindow::disableFilters;
    case Command::Recalculate: return &MainWindow::recalculate;
    case Command::DeleteRecords: return &MainWindow::deleteRecords;
    case Command::MoveRecords: return &MainWindow::moveRecordsTo;
    case Command::CopyRecords: return &MainWindow::copyRecordsTo;
    case Command::ExportRecords: return &MainWindow::exportRecords;
    case Command::ImportRecords: return &MainWindow::importRecords;
    case Command::PrintRecords: return &MainWindow::printRecords;
    case Command::DBProperties: return &MainWindow::showDbProperties;
    case Command::RunReport: return &MainWindow::runReport;
    case Command::Back: return &MainWindow::backToParent;
    case Command::BeamRecords: return &MainWindow::beamRecords;
    case Command::BeamDatabase: return &MainWindow::beamDatabase;
    case Command::Receive: return &MainWindow::receiveViaInfrared;
    case Command::Help: return &MainWindow::showHelpContents;
    case Command::About: return &MainWindow::showAbout;
  }
  return nullptr;
}

QAction* MainWindow::action(const QString& text) const {
  auto it = actions_.find(text);
  return it == actions_.end() ? nullptr : it->second;
}

QAction* MainWindow::action(Command command) const {
  return commandActions_[static_cast<int>(command)];
}

void MainWindow::BuildMenus() {
  const std::pair<MenuGroup, QString> groups[] = {
      {MenuGroup::File, QStringLiteral("&File")},         {MenuGroup::Records, QStringLiteral("&Records")},
      {MenuGroup::Database, QStringLiteral("&Database")}, {MenuGroup::Beam, QStringLiteral("&Beam")},
      {MenuGroup::Help, QStringLiteral("&Help")},
  };
  std::map<MenuGroup, QMenu*> menus;
  for (const auto& [group, title] : groups) menus[group] = menuBar()->addMenu(title);

  for (const CommandInfo& info : CommandTable()) {
    const QString text = QString::fromLatin1(info.text);
    auto* act = new QAction(text, this);
    act->setObjectName(text);
    if (*info.shortcut) act->setShortcut(QKeySequence(QString::fromLatin1(info.shortcut), QKeySequence::PortableText));
    connect(act, &QAction::triggered, this, SlotOf(info.id));
    commandActions_[static_cast<int>(info.id)] = act;
    actions_[text] = act;
    // "More Files..." closes the Reopen submenu, which is built each time it
    // opens.
    if (info.id == Command::MoreFiles) continue;
    QMenu* menu = menus[info.menu];
    if (info.separatorBefore && !menu->isEmpty()) menu->addSeparator();
    menu->addAction(act);
    if (info.id == Command::Open) {
      reopenMenu_ = menu->addMenu(QStringLiteral("Reopen"));
      reopenMenu_->setObjectName(QStringLiteral("reopenMenu"));
      connect(reopenMenu_, &QMenu::aboutToShow, this, &MainWindow::RebuildReopenMenu);
    }
  }
  RebuildReopenMenu();

  newRecordAction_ = action(Command::NewRecord);
  newRecordAction_->setIcon(NewRecordIcon());
  // The desktop's usual key for a new item, beside the table's own.
  newRecordAction_->setShortcuts({newRecordAction_->shortcut(), QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_N)});
  backAction_ = action(Command::Back);
  backAction_->setIcon(BackIcon());
  backAction_->setIconText(QStringLiteral("Back"));
  saveAction_ = action(Command::Save);

  // Entries are greyed after every change; the refresh when a menu opens
  // catches anything those missed.
  for (const auto& [group, menu] : menus) connect(menu, &QMenu::aboutToShow, this, &MainWindow::UpdateCommandState);
}

void MainWindow::BuildToolBar() {
  QToolBar* bar = addToolBar(QStringLiteral("Records"));
  bar->setObjectName(QStringLiteral("toolBar"));
  bar->setMovable(false);
  bar->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
  bar->addAction(newRecordAction_);
  bar->addAction(backAction_);
}

void MainWindow::RebuildReopenMenu() {
  reopenMenu_->clear();
  for (const RecentFiles::ReopenEntry& entry : context().recent.ReopenEntries()) {
    QAction* a = reopenMenu_->addAction(EscapeMnemonic(FromDb(entry.name)));
    a->setToolTip(QString::fromStdString(entry.path));
    const int n = entry.n;
    connect(a, &QAction::triggered, this, [this, n] { reopenDatabase(n); });
  }
  reopenMenu_->addSeparator();
  reopenMenu_->addAction(action(Command::MoreFiles));
}

void MainWindow::UpdateCommandState() {
  const MenuState state = MenuStateFor(workspace_);
  for (int c = 0; c < kCommandCount; ++c) {
    if (QAction* act = commandActions_[c]) act->setEnabled(state.enabled[c]);
  }
  UpdateLabels();
}

void MainWindow::UpdateLabels() {
  title_->setText(FromDb(workspace_.TitleLabel()));
  status_->setText(FromDb(workspace_.StatusLabel()));
  setWindowTitle(FromDb(workspace_.WindowTitle()));
}

// --- Following the shown document ------------------------------------------

void MainWindow::AttachShownDocument() {
  Document* doc = workspace_.shown();
  if (doc != attached_) {
    if (attached_) attached_->RemoveListener(this);
    attached_ = doc;
    if (attached_) attached_->AddListener(this);
  }
  model_->SetDocument(attached_);
  list_->ApplyColumnWidths();
  SelectCurrentRecord();
  UpdateCommandState();
}

void MainWindow::RebuildList() {
  QApplication::setOverrideCursor(Qt::WaitCursor);
  if (Document* doc = document()) doc->RebuildView();  // tells ViewRebuilt
  AttachShownDocument();
  QApplication::restoreOverrideCursor();
}

void MainWindow::SelectCurrentRecord() {
  Document* doc = attached_;
  if (!doc) return;
  selecting_ = true;
  list_->SelectRow(doc->rowOf(doc->currentRecord()));
  selecting_ = false;
}

void MainWindow::LevelPushed(int, Document&) {
  // The document beneath stays alive: stop listening to it.
  AttachShownDocument();
}

void MainWindow::LevelPopped(int, Document&) {
  attached_ = nullptr;  // the closed level's document is gone
  AttachShownDocument();
}

void MainWindow::DocumentOpened(Document&) { AttachShownDocument(); }

void MainWindow::DocumentClosed() {
  attached_ = nullptr;
  AttachShownDocument();
}

void MainWindow::DocumentReplaced(Document&) {
  attached_ = nullptr;
  AttachShownDocument();
}

void MainWindow::ViewRebuilt() {
  model_->Reset();
  list_->ApplyColumnWidths();
  SelectCurrentRecord();
  UpdateCommandState();
}

void MainWindow::RecordChanged(size_t recordIndex) { model_->RecordChanged(recordIndex); }

void MainWindow::ColumnsChanged() {
  model_->Reset();
  list_->ApplyColumnWidths();
  SelectCurrentRecord();
  UpdateCommandState();
}

void MainWindow::ChangedMarkToggled(bool) { UpdateCommandState(); }

void MainWindow::CurrentRecordChanged(size_t) {
  if (!selecting_) SelectCurrentRecord();
}

void MainWindow::FoundRecordChanged() {
  Document* doc = attached_;
  if (!doc || doc->found().index < 0) return;
  const int row = doc->rowOf(static_cast<size_t>(doc->found().index));
  if (row < 0) return;
  selecting_ = true;
  list_->SelectRow(row);
  const int column = model_->ColumnOfField(doc->found().field);
  if (column >= 0) list_->scrollTo(model_->index(row, column));
  selecting_ = false;
  list_->setFocus();
}

// --- File commands -------------------------------------------------------------

void MainWindow::OpenPath(const std::string& path) {
  WaitCursor wait;
  workspace_.Open(path);
  UpdateCommandState();
}

void MainWindow::newDatabase() {
  if (!workspace_.New()) return;
  AttachShownDocument();
  // A new database is defined in the properties dialog before anything
  // else happens to it; abandoning that leaves no file and nothing open.
  if (!DesignNewDatabase(this, *workspace_.shown())) {
    workspace_.shown()->db().ClearChanged();
    workspace_.Close();
  }
  RebuildList();
  UpdateCommandState();
}

void MainWindow::openDatabase() {
  workspace_.OpenWithDialog();
  UpdateCommandState();
}

void MainWindow::reopenDatabase(int n) {
  WaitCursor wait;
  workspace_.Reopen(n);
  UpdateCommandState();
}

void MainWindow::saveDatabase() {
  if (!RequireOpen() || !document()->changed()) return;
  workspace_.Save();
  UpdateCommandState();
}

void MainWindow::saveDatabaseAs() {
  if (!RequireOpen()) return;
  workspace_.SaveAs();
  UpdateCommandState();
}

void MainWindow::closeDatabase() {
  if (!RequireOpen()) return;
  const int level = workspace_.level();
  if (!workspace_.Close()) {
    UpdateCommandState();
    return;
  }
  UpdateCommandState();
  if (level > 0) {
    resumeAfterLinkedLevel();
  } else {
    ShowStartDialog();
  }
}

void MainWindow::backToParent() {
  if (workspace_.level() == 0) return;
  closeDatabase();
}

void MainWindow::exitProgram() { close(); }

void MainWindow::closeEvent(QCloseEvent* event) {
  // Closing the window is Exit: the save decisions may still be cancelled.
  if (!workspace_.Exit()) {
    event->ignore();
    UpdateCommandState();
    return;
  }
  event->accept();
}

void MainWindow::editPreferences() {
  PreferencesDialog dialog(context().preferences.flags, this);
  if (dialog.exec() == QDialog::Accepted) context().preferences.flags = dialog.flags();
}

void MainWindow::ShowStartDialog() {
  StartDialog dialog(context().recent.StartList(), this);
  if (dialog.exec() != QDialog::Accepted) return;
  switch (dialog.choice()) {
    case StartDialog::Choice::New:
      newDatabase();
      break;
    case StartDialog::Choice::Open: {
      const int index = dialog.listIndex();
      if (index == 0) {
        openDatabase();
      } else if (auto path = context().recent.StartChoice(index)) {
        OpenPath(*path);
      }
      break;
    }
    case StartDialog::Choice::None:
      break;
  }
}

// --- Commands of the list ------------------------------------------------------

void MainWindow::findAgain() {
  Document* doc = document();
  if (!doc) return;
  std::optional<int> hit;
  {
    WaitCursor wait;
    hit = doc->FindAgain();
  }
  if (!hit) showFindDialog();
}

void MainWindow::deleteRecords() {
  Document* doc = document();
  if (!doc || !CommandAllowed(Command::DeleteRecords, *doc, ui_)) return;
  DeleteRecordsDialog dialog(this);
  if (dialog.exec() != QDialog::Accepted) return;
  WaitCursor wait;
  document()->DeleteRecords(dialog.scope());
  UpdateCommandState();
}

void MainWindow::cellTapped(int row, int column) {
  Document* doc = document();
  if (!doc || row < 0 || row >= static_cast<int>(doc->rowCount())) return;
  selecting_ = true;
  doc->SetCurrentRecord(doc->recordAt(row));
  list_->SelectRow(row);
  selecting_ = false;
  list_->viewport()->repaint();
  openRecordAt(row, column);
}

void MainWindow::showHeadingMenu(int column) {
  Document* doc = document();
  const int field = model_->FieldOfColumn(column);
  if (!doc || field < 0) return;
  std::unique_ptr<QMenu> menu(CreateHeadingMenu(this));
  QHeaderView* header = list_->horizontalHeader();
  const QPoint at = header->mapToGlobal(QPoint(header->sectionViewportPosition(column), header->height()));
  QAction* chosen = menu->exec(at);
  // The menu answers at once; the command runs after it has gone.
  const int entry = chosen ? menu->actions().indexOf(chosen) : -1;
  menu.reset();
  if (entry < 0) return;
  switch (HeadingMenu()[entry].id) {
    case HeadingCommand::SortForward: sortFromHeading(field, true); break;
    case HeadingCommand::SortReverse: sortFromHeading(field, false); break;
    case HeadingCommand::FieldProperties: showFieldProperties(field); break;
    case HeadingCommand::RunReport: headingReportCommand(field); break;
    case HeadingCommand::HideField: hideField(field); break;
  }
}

QMenu* MainWindow::CreateHeadingMenu(QWidget* parent) {
  auto* menu = new QMenu(parent);
  menu->setObjectName(QStringLiteral("headingMenu"));
  for (const HeadingEntry& entry : HeadingMenu()) {
    menu->addAction(QString::fromLatin1(entry.text))->setObjectName(QString::fromLatin1(entry.text));
  }
  return menu;
}

void MainWindow::sortFromHeading(int field, bool forward) {
  if (Document* doc = document()) {
    WaitCursor wait;
    doc->SortFromHeader(field, forward);
  }
}

void MainWindow::hideField(int field) {
  if (Document* doc = document()) doc->HideField(field);
}

void MainWindow::headingReportCommand(int field) {
  Document* doc = document();
  if (!doc || !doc->CanRunReport(field)) return;
  runHeadingReport(field);
}

void MainWindow::columnWidthChosen(int column, int pixels) {
  Document* doc = document();
  const int field = model_->FieldOfColumn(column);
  if (!doc || field < 0) return;
  doc->SetColumnPixels(field, pixels);
  UpdateCommandState();
}

void MainWindow::autoFit(int column) {
  Document* doc = document();
  const int field = model_->FieldOfColumn(column);
  if (!doc || field < 0) return;
  const QFontMetrics metrics = list_->fontMetrics();
  WaitCursor wait;
  // Every value of the column is measured: on the largest files that can
  // take a while, and the progress shows once it takes over a second.
  const int rows = static_cast<int>(doc->rowCount());
  QProgressDialog progress(QStringLiteral("Fitting the column to its values..."), QString(), 0, rows, this);
  progress.setObjectName(QStringLiteral("autoFitProgress"));
  progress.setWindowModality(Qt::WindowModal);
  progress.setMinimumDuration(1000);
  progress.setCancelButton(nullptr);
  int measured = 0;
  doc->AutoFit(field, [&](const std::string& text) {
    if ((++measured & 1023) == 0) progress.setValue(qMin(measured, rows));
    return metrics.horizontalAdvance(FromDb(text));
  });
}

void MainWindow::showHelpContents() { ShowHelp(this, QString::fromLatin1(kHelpContents)); }

void MainWindow::showAbout() {
  std::unique_ptr<QDialog> box(CreateAboutBox(this));
  box->exec();
}

QDialog* MainWindow::CreateAboutBox(QWidget* parent) {
  auto* box = new QMessageBox(parent);
  box->setObjectName(QStringLiteral("aboutBox"));
  box->setWindowTitle(QStringLiteral("About Cardovex"));
  box->setIconPixmap(QPixmap::fromImage(AppIconImage(64)));
  box->setTextFormat(Qt::RichText);
  box->setText(QStringLiteral("<h3>Cardovex %1</h3>").arg(QString::fromLatin1(CARDOVEX_VERSION)));
  box->setInformativeText(
      QStringLiteral("A personal database manager for small databases of typed fields, "
                     "one database per file.<br><br>"
                     "Built with Qt %1.")
          .arg(QString::fromLatin1(qVersion())));
  box->setStandardButtons(QMessageBox::Ok);
  return box;
}

// --- Slots of the dialog modules -------------------------------------------------

void MainWindow::NotAvailableYet(const QString& command) {
  QMessageBox::information(this, command, QStringLiteral("This command is not available yet."));
}

void MainWindow::openRecordAt(int row, int column) {
  const QRect cell = list_->visualRect(model_->index(row, column));
  EditorCommandsOf(this, workspace_).OpenRecordAt(row, column, list_->viewport()->mapToGlobal(cell.topLeft()));
  UpdateCommandState();
}
void MainWindow::newRecord() {
  if (!RequireOpen()) return;
  EditorCommandsOf(this, workspace_).NewRecord();
  UpdateCommandState();
}
void MainWindow::resumeAfterLinkedLevel() {
  EditorCommandsOf(this, workspace_).ResumeAfterLinkedLevel();
  UpdateCommandState();
}
void MainWindow::showDbProperties() {
  if (Document* doc = document()) ShowDatabaseProperties(this, *doc);
  UpdateCommandState();
}
void MainWindow::showFieldProperties(int field) {
  if (Document* doc = document()) ShowFieldProperties(this, *doc, field);
  UpdateCommandState();
}
void MainWindow::showSortDialog() {
  if (Document* doc = document()) SortRecordsCommand(this, TargetFor(*doc));
}
void MainWindow::showFilterDialog() {
  if (Document* doc = document()) EditFiltersCommand(this, TargetFor(*doc));
}
void MainWindow::disableFilters() {
  if (Document* doc = document()) DisableFiltersCommand(TargetFor(*doc));
}
void MainWindow::recalculate() {
  if (Document* doc = document()) RecalculateCommand(this, TargetFor(*doc));
}
void MainWindow::showFindDialog() {
  if (Document* doc = document()) SearchDatabaseCommand(this, TargetFor(*doc));
}
void MainWindow::runReport() {
  if (Document* doc = document()) RunReportCommand(this, TargetFor(*doc));
}
void MainWindow::runHeadingReport(int field) {
  if (Document* doc = document()) RunReportCommand(this, TargetFor(*doc), field);
}
void MainWindow::exportRecords() {
  if (Document* doc = document()) ExportCsvCommand(this, TargetFor(*doc));
}
void MainWindow::importRecords() {
  if (Document* doc = document()) ImportCsvCommand(this, TargetFor(*doc));
}
void MainWindow::moveRecordsTo() {
  if (Document* doc = document()) TransferCommand(this, TargetFor(*doc), /*move=*/true, /*all=*/true);
}
void MainWindow::copyRecordsTo() {
  if (Document* doc = document()) TransferCommand(this, TargetFor(*doc), /*move=*/false, /*all=*/true);
}
void MainWindow::printRecords() {
  if (Document* doc = document()) PrintCommand(this, TargetFor(*doc), /*all=*/true);
}
void MainWindow::SetSettings(Settings* settings) {
  settings_ = settings;
  // The editor's "Beam Record..." reads the same store as the menus here.
  EditorCommandsOf(this, workspace_).SetSettings(settings);
}

void MainWindow::beamRecords() {
  if (Document* doc = document()) BeamForWindow(this, *doc, settings_, obex::BeamWhat::kRecordsInView);
}
void MainWindow::beamDatabase() {
  if (Document* doc = document()) BeamForWindow(this, *doc, settings_, obex::BeamWhat::kDatabase);
}
void MainWindow::receiveViaInfrared() {
  ReceiveForWindow(this, context(), [this] { return document(); }, settings_);
}

}  // namespace cx::gui
