// The data commands of the desktop program, one function per menu entry.
// Each works on the database a DataTarget names, runs the access check
// where the command is guarded, shows the wait cursor while it works and
// tells the target when its view changed.
#pragma once

#include <string>

#include "gui/data/data_util.h"
#include "infrared/beam_commands.h"
#include "platform/settings.h"

class QWidget;

namespace cx {
class Document;
struct AppContext;
}  // namespace cx

namespace cx::gui {

class BeamSession;
class ReceiveWindow;

// "Sorting": true when new keys were stored and the records sorted.
bool SortRecordsCommand(QWidget* parent, const DataTarget& target);
// "Edit Filters": true when the filters were stored (the view rebuilt).
bool EditFiltersCommand(QWidget* parent, const DataTarget& target);
// "Disable both filters".
void DisableFiltersCommand(const DataTarget& target);
// "Search Database": the hit's record index, or -1 (cancelled or not
// found, the latter after "Not Found in Database!").
int SearchDatabaseCommand(QWidget* parent, const DataTarget& target);
// "Repeat the current Find": the search dialog when no text is stored yet.
int FindAgainCommand(QWidget* parent, const DataTarget& target);
// "Recalculate": every Calculated field of the records in view.
void RecalculateCommand(QWidget* parent, const DataTarget& target);
// "Run Report..." (field -1: the chooser first) and the heading menu's
// "Run Report" (its column's field).
void RunReportCommand(QWidget* parent, const DataTarget& target, int field = -1);
// "Export Records..." as CSV; "Import Records...".
bool ExportCsvCommand(QWidget* parent, const DataTarget& target);
bool ImportCsvCommand(QWidget* parent, const DataTarget& target);
// "Copy Records To..." / "Move Records To..." (`all`), and the editor's
// "Copy Record To..." / "Move Record To..." (the current record).
bool TransferCommand(QWidget* parent, const DataTarget& target, bool move, bool all);
// The same once the target database has been chosen.
bool TransferToFile(const DataTarget& target, bool move, bool all, const std::string& targetPath);
// "Print Records..." / "Print Record...": the print dialog with preview,
// or, when the PrintCommand setting names one, that command run on the
// listing's file as the command-line tool's print does.
inline constexpr char kPrintCommandSetting[] = "PrintCommand";
bool PrintCommand(QWidget* parent, const DataTarget& target, bool all);
// "Export Record..." / the listing of all records in view as text.
bool ExportListingCommand(QWidget* parent, const DataTarget& target, bool all);
// "Beam Database...", "Beam Records...", "Beam Record...": after the Beam
// Data check and the choice of peer, starts the beam and returns at once;
// the session deletes itself when done. Null when nothing was started.
BeamSession* BeamCommand(QWidget* parent, const DataTarget& target, Settings& settings, obex::BeamWhat what);
// "Receive...": the receive window (one per parent; shown again when open).
ReceiveWindow* ReceiveCommand(QWidget* parent, Settings& settings, const std::string& dataFolder, UiPort& ui,
                              std::function<DataSession*()> shown, std::function<void()> viewChanged);

// The same commands on a document of the main window: the view follows
// through the document's listeners.
DataTarget TargetFor(cx::Document& doc);
// "Receive Via Infrared..." for the main window: the database on screen
// is asked of `shown` each time something arrives. `settings` null: the
// desktop's own settings store.
ReceiveWindow* ReceiveForWindow(QWidget* window, cx::AppContext& context, std::function<cx::Document*()> shown,
                                Settings* settings = nullptr);
// The beaming commands for the main window, with its settings store (null:
// the desktop's own).
BeamSession* BeamForWindow(QWidget* window, cx::Document& doc, Settings* settings, obex::BeamWhat what);

}  // namespace cx::gui
