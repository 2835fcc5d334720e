#include "gui/data/data_commands.h"

#include <QDir>
#include <QFileDialog>
#include <QFileInfo>
#include <QMessageBox>
#include <QPointer>
#include <QTemporaryDir>

#include "app/data_csv.h"
#include "app/data_dialogs.h"
#include "design/link_access.h"
#include "design/security.h"
#include "gui/common/text.h"
#include "gui/data/beam.h"
#include "gui/data/csv_dialogs.h"
#include "gui/data/filter_dialog.h"
#include "gui/data/print_listing.h"
#include "gui/data/receive_window.h"
#include "gui/data/report_dialogs.h"
#include "gui/data/search_dialog.h"
#include "gui/data/sorting_dialog.h"
#include "infrared/beam_payloads.h"
#include "ops/calc.h"
#include "ops/find.h"
#include "ops/linked_listing.h"
#include "ops/print.h"
#include "ops/links.h"
#include "ops/report.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"
#include "platform/process.h"
#include "platform/qt/qt_platform.h"
#include "platform/tcp_transport.h"

namespace cx::gui {
namespace {

void Rebuild(const DataTarget& t) {
  t.session.view = RebuildView(t.session.db, t.session.Link());
  t.Changed();
}

LinkServices Services(const DataTarget& t) {
  if (t.linkServices) return t.linkServices();
  return SecuredLinkServices(t.session.ui, &t.session.locale, t.findOpen);
}

bool HasRecord(const DataTarget& t) { return t.current < t.session.db.recordCount(); }

void ShowHit(const DataTarget& t, int index) {
  if (index >= 0 && t.showHit) t.showHit(index, t.session.found.column);
}

}  // namespace

bool SortRecordsCommand(QWidget* parent, const DataTarget& t) {
  SortingDialog dialog(t.session.db, t.session.ui, parent);
  if (dialog.exec() != QDialog::Accepted) return false;
  WaitCursor wait;
  SortAfterDialog(t.session);
  t.Changed();
  return true;
}

bool EditFiltersCommand(QWidget* parent, const DataTarget& t) {
  EditFiltersDialog dialog(t.session.db, parent);
  if (dialog.exec() != QDialog::Accepted) return false;
  WaitCursor wait;
  Rebuild(t);
  return true;
}

void DisableFiltersCommand(const DataTarget& t) {
  DisableBothFilters(t.session.db);
  WaitCursor wait;
  Rebuild(t);
}

int SearchDatabaseCommand(QWidget* parent, const DataTarget& t) {
  SearchDialog dialog(t.session.db, parent);
  if (dialog.exec() != QDialog::Accepted) return -1;
  int index;
  {
    WaitCursor wait;
    index = t.find ? t.find(dialog.settings()) : SearchDatabase(t.session, dialog.settings());
  }
  if (!t.find) ShowHit(t, index);
  return index;
}

int FindAgainCommand(QWidget* parent, const DataTarget& t) {
  if (LoadSearchSettings(t.session.db.schema()).text.empty()) return SearchDatabaseCommand(parent, t);
  int index;
  {
    WaitCursor wait;
    index = RepeatFind(t.session);
  }
  ShowHit(t, index);
  return index;
}

void RecalculateCommand(QWidget*, const DataTarget& t) {
  WaitCursor wait;
  RecalculateFrom(t.session, 0);
  Rebuild(t);
}

void RunReportCommand(QWidget* parent, const DataTarget& t, int field) {
  int last = field;
  for (;;) {
    if (field < 0) {
      ReportChooserDialog chooser(t.session.db, last, parent);
      if (chooser.exec() != QDialog::Accepted || chooser.field() < 0) return;
      field = chooser.field();
    }
    std::optional<std::string> text;
    {
      WaitCursor wait;
      text = RunReport(t.session.db, field, t.session.locale, t.session.ui, t.session.Link());
    }
    if (!text) return;
    ReportResultsDialog results(*text, parent);
    results.setSourcePath(t.session.db.path());
    if (results.exec() != ReportResultsDialog::kNewReport) return;
    // "New Report" offers the field choice again, on the field just shown.
    last = field;
    field = -1;
  }
}

bool ExportCsvCommand(QWidget* parent, const DataTarget& t) {
  const QString base = QFileInfo(QString::fromStdString(t.session.db.path())).completeBaseName().remove('*');
  const QString folder = QString::fromStdString(t.folder.empty() ? QDir::homePath().toStdString() : t.folder);
  CsvExportDialog dialog(folder + "/" + (base.isEmpty() ? "Export" : base) + ".csv", parent);
  if (dialog.exec() != QDialog::Accepted) return false;
  if (!ConfirmTextTarget(parent, dialog.path().toStdString(), {t.session.db.path()})) return false;
  std::string error;
  int result;
  {
    WaitCursor wait;
    result = ExportCsvEncoded(t.session, dialog.options(), dialog.encoding(), dialog.path().toStdString(), error);
  }
  if (!error.empty()) {
    QMessageBox::warning(parent, "Error", QString::fromStdString(error));
    return false;
  }
  if (result != 1) {
    QMessageBox::warning(parent, "Export Records",
                         "Some records could not be read; the file holds all the others.");
  }
  return true;
}

bool ImportCsvCommand(QWidget* parent, const DataTarget& t) {
  if (!Allowed(CheckAccess(t.session.db, secured::kAddRecords, t.session.ui))) return false;
  CsvImportDialog dialog(QString::fromStdString(t.folder), parent);
  if (dialog.exec() != QDialog::Accepted) return false;
  QTemporaryDir scratch;
  const size_t before = t.session.db.recordCount();
  CsvImportResult result;
  {
    WaitCursor wait;
    result = ImportCsvEncoded(t.session.db, dialog.path().toStdString(), dialog.mode(), dialog.encoding(),
                              t.session.locale, scratch.path().toStdString());
    if (result.imported > 0) {
      // New records arrive at the end; the table must be in its sorted
      // order again and calculated fields filled in.
      SortAll(t.session.db);
      RecalculateFrom(t.session, 0);
    }
    Rebuild(t);
  }
  QString text = QString("%1 of %2 lines imported as new records.").arg(result.imported).arg(result.lines);
  if (!result.status) text += "\n\n" + FromDb(result.status.message());
  if (result.lines > result.imported && result.status) {
    text += QString("\n%1 lines could not be added.").arg(result.lines - result.imported);
  }
  if (!result.issues.empty()) {
    // Stored all the same, by the import rules: the user should know which
    // values to look at.
    text += QString("\n\n%1 %2 values that were not stored as written:")
                .arg(result.issues.lines)
                .arg(result.issues.lines == 1 ? "line holds" : "lines hold");
    for (const std::string& line : result.issues.Describe(t.session.db.schema())) text += "\n" + FromDb(line);
    if (result.issues.lines > CsvImportIssues::kKeptLines) text += "\n...";
  }
  (void)before;
  if (result.status) {
    QMessageBox::information(parent, "Import Records", text);
  } else {
    QMessageBox::warning(parent, "Import Records", text);
  }
  return result.imported > 0;
}

bool TransferCommand(QWidget* parent, const DataTarget& t, bool move, bool all) {
  if (!all && !HasRecord(t)) return false;
  QFileDialog dialog(parent, move ? "Move Records To" : "Copy Records To", QString::fromStdString(t.folder),
                     DesktopFileFilter("Cardovex Files (*.pdb)|*.pdb|All Files (*.*)|*.*||"));
  dialog.setObjectName("transferTarget");
  dialog.setFileMode(QFileDialog::ExistingFile);
  dialog.setDefaultSuffix("PDB");
  if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty()) return false;
  return TransferToFile(t, move, all, dialog.selectedFiles().first().toStdString());
}

bool TransferToFile(const DataTarget& t, bool move, bool all, const std::string& targetPath) {
  if (!all && !HasRecord(t)) return false;
  TransferWhich which;
  which.allInView = all;
  which.index = t.current;
  TransferResult result;
  {
    WaitCursor wait;
    LinkServices services = Services(t);
    result = TransferRecordsTo(move, which, t.session, targetPath, services);
  }
  if (result.done) Rebuild(t);
  return result.done;
}

bool PrintCommand(QWidget* parent, const DataTarget& t, bool all) {
  if (!all && !HasRecord(t)) return false;
  // Where a print command is set, the listing goes to it as the command-line
  // tool's print does (a printer reached only by a script, say).
  if (auto command = OpenDesktopSettings()->Get(kPrintCommandSetting); command && !command->empty()) {
    PrintSettings settings;
    const QStringList words = QString::fromStdString(*command).split(' ', Qt::SkipEmptyParts);
    settings.command = words.value(0).toStdString();
    for (int i = 1; i < words.size(); ++i) settings.arguments.push_back(words[i].toStdString());
    settings.tempPath = DefaultPrintTempPath(DesktopDocumentsFolder());
    MakeDirectories(FolderPart(settings.tempPath));
    WaitCursor wait;
    LinkServices services = Services(t);
    LinkedRecordsListing linked(services, t.session.locale);
    SystemProcessRunner runner;
    const PrintOutcome outcome = PrintRecords(t.session.db, all, t.current, ListingContext{t.session.locale, &linked},
                                              settings, runner, t.session.ui, t.session.Link());
    return outcome == PrintOutcome::Printed;
  }
  QString listing;
  {
    WaitCursor wait;
    LinkServices services = Services(t);
    LinkedRecordsListing linked(services, t.session.locale);
    listing = ListingText(t.session, all, t.current, &linked);
  }
  if (listing.isEmpty()) {
    QMessageBox::information(parent, "Update", "There are no records in view to print.");
    return false;
  }
  const QString title = FromDb(t.session.db.Name());
  return PreviewAndPrint(parent, listing, title);
}

bool ExportListingCommand(QWidget*, const DataTarget& t, bool all) {
  if (!all && !HasRecord(t)) return false;
  WaitCursor wait;
  LinkServices services = Services(t);
  LinkedRecordsListing linked(services, t.session.locale);
  ListingContext ctx{t.session.locale, &linked};
  return ExportRecordsText(t.session.db, all, t.current, t.session.ui, ctx, t.session.Link());
}

BeamSession* BeamCommand(QWidget* parent, const DataTarget& t, Settings& settings, obex::BeamWhat what) {
  Database& db = t.session.db;
  if (what == obex::BeamWhat::kRecord && !HasRecord(t)) return nullptr;
  if (!Allowed(CheckAccess(db, secured::kBeamData, t.session.ui))) return nullptr;
  std::vector<std::string> peers = ChooseBeamPeers(parent, settings);
  if (peers.empty()) return nullptr;
  std::vector<obex::BeamObject> objects(1);
  auto scratch = std::make_unique<QTemporaryDir>();
  Status status;
  {
    WaitCursor wait;
    if (what == obex::BeamWhat::kDatabase) {
      std::string path;
      status = BeamableDatabaseFile(db, scratch->path().toStdString(), path);
      if (status) status = obex::DatabaseObject(path, objects[0]);
    } else if (what == obex::BeamWhat::kRecord) {
      status = obex::RecordObject(db, t.current, objects[0]);
    } else {
      status = obex::RecordSetObjects(db, t.session.view, objects);
    }
  }
  if (!status) {
    QMessageBox::warning(parent, "Error", FromDb(status.message()));
    return nullptr;
  }
  auto* session = new BeamSession(std::make_unique<TcpTransport>(peers), std::move(objects), t.session.ui, parent,
                                  obex::BeamOptions{}, std::move(scratch));
  QObject::connect(session, &BeamSession::finished, session, &QObject::deleteLater);
  session->Start();
  return session;
}

ReceiveWindow* ReceiveCommand(QWidget* parent, Settings& settings, const std::string& dataFolder, UiPort& ui,
                              std::function<DataSession*()> shown, std::function<void()> viewChanged) {
  auto* existing = parent ? parent->findChild<ReceiveWindow*>(QString(), Qt::FindDirectChildrenOnly) : nullptr;
  if (!existing) {
    existing = new ReceiveWindow(settings, dataFolder, ui, std::move(shown), std::move(viewChanged), parent);
    existing->setAttribute(Qt::WA_DeleteOnClose);
  }
  existing->show();
  existing->raise();
  existing->activateWindow();
  return existing;
}

}  // namespace cx::gui
