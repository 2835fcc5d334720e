// The document layer: one Document per database shown at a view level, and
// one Workspace that holds the level stack and runs the file commands. Every
// use case (open, save, sort, filter, find, delete, column changes, ...)
// runs here with all of its follow-up steps (re-sort, recalculation, view
// rebuild, changed mark), and listeners are told what changed. The desktop
// program adapts this thinly. No toolkit here.
//
// Threads: everything here runs on the thread that owns the workspace (the
// GUI thread); listeners are called on it, synchronously.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "app/columns.h"
#include "app/view_levels.h"
#include "engine/format.h"
#include "engine/record.h"
#include "ops/database_settings.h"
#include "ops/delete_records.h"
#include "ops/filter_dialog.h"
#include "ops/links.h"
#include "ops/session.h"
#include "platform/clock.h"
#include "platform/locale_info.h"
#include "platform/status.h"
#include "platform/ui_port.h"

namespace cx {

class Preferences;
class RecentFiles;

// The record number that stands for "a new record is being added".
inline constexpr size_t kNewRecord = 65000;

// What changed, told to every listener of a document. Each call comes after
// the change is complete, so a listener may read the document at once.
class DocumentListener {
 public:
  virtual ~DocumentListener() = default;
  // The rows of the view were rebuilt: their number or order may differ.
  virtual void ViewRebuilt() {}
  // One record changed where it stands (an in-place edit): its row, if it is
  // in view, needs drawing again.
  virtual void RecordChanged(size_t /*recordIndex*/) {}
  // Field definitions, widths, order or names changed: columns need
  // rebuilding (a view rebuild follows separately when rows changed too).
  virtual void ColumnsChanged() {}
  // The changed mark was set or cleared (title "*", Save enabled).
  virtual void ChangedMarkToggled(bool /*changed*/) {}
  // The current record moved (selection to follow).
  virtual void CurrentRecordChanged(size_t /*recordIndex*/) {}
  // The found record or field changed (after Find / Find Again).
  virtual void FoundRecordChanged() {}
};

// Program-wide things the documents share; made once by the caller and
// passed in (nothing of this lives in globals).
struct AppContext {
  UiPort& ui;
  const LocaleInfo& locale;
  Preferences& preferences;
  RecentFiles& recent;
  std::string dataFolder;  // where new databases are offered a name
  const Clock& clock = DefaultClock();
};

// The outcome of storing a record: its index after it was placed in sorted
// order, or the failure (already shown to the user).
struct StoreResult {
  Status status;
  size_t index = 0;
  bool ok() const { return status.ok(); }
  explicit operator bool() const { return ok(); }
};

// Gives the pixel extent of a text in the list's font (auto fit).
using MeasureText = std::function<int(const std::string& text)>;

class Document {
 public:
  // `db` is owned by the level it belongs to (or shared with a lower one).
  Document(AppContext& context, Database& db, std::optional<LinkRestriction> link = std::nullopt);
  Document(const Document&) = delete;
  Document& operator=(const Document&) = delete;

  void AddListener(DocumentListener* listener);
  void RemoveListener(DocumentListener* listener);

  AppContext& context() { return context_; }
  Database& db() { return session_.db; }
  const Database& db() const { return session_.db; }
  DataSession& session() { return session_; }
  const DataSession& session() const { return session_; }
  const std::string& path() const { return session_.db.path(); }
  std::string name() const { return session_.db.Name(); }
  // The restriction this level was opened with (levels above 0).
  const LinkRestriction* link() const { return session_.Link(); }

  // The view: row r shows record recordAt(r).
  size_t rowCount() const { return session_.view.size(); }
  uint32_t recordAt(size_t row) const { return session_.view[row]; }
  // The row that shows `recordIndex`, or -1 when it is not in view.
  int rowOf(size_t recordIndex) const;
  // The value text of one field of one record, as the list shows it (the
  // 8-bit text; widening is the GUI's business).
  std::string ValueText(size_t recordIndex, int field) const;

  std::vector<ListColumn> Columns() const;
  // The field shown in list column `column`, -1 when there is none.
  int FieldOfColumn(int column) const;
  // The current record (kNewRecord while one is being added).
  size_t currentRecord() const { return current_; }
  void SetCurrentRecord(size_t recordIndex);
  // The last find hit (index -1 when there is none).
  const FindHit& found() const { return session_.found; }

  bool changed() const { return session_.db.changed(); }
  bool neverSaved() const;  // the path holds an asterisk
  // Made by "New" and not yet given its fields (the properties dialog
  // that follows reads this).
  bool isNewDatabase() const { return newDatabase_; }
  void SetNewDatabase(bool on) { newDatabase_ = on; }
  // "Name* (shown/total)" as the title label shows it.
  std::string TitleLabel() const;
  // "Link+Filter", "Filtered", "Linked" or empty.
  std::string StatusLabel() const;

  // Use cases of the list view. Each runs its checks, does the work with
  // its follow-up steps and tells the listeners.
  void SortFromHeader(int field, bool forward);
  // Stores the filters (marking the database changed) and rebuilds the view.
  void ApplyFilters(const FilterSettings& settings);
  // The Edit Filters dialog's OK, and "Disable both filters": stored, then
  // the view rebuilt.
  void ApplyFilterDialog(const FilterDialogValues& values);
  void DisableFilters();
  // Find: the hit's record index, or -1 after "Not Found in Database!".
  int Find(const SearchSettings& search);
  // Find Again: nullopt when there is no remembered text (the caller shows
  // the Find dialog instead); otherwise as Find.
  std::optional<int> FindAgain();
  // Delete Records after the dialog's OK: the linked-records question when
  // the database has Link fields, then the deletion. The "Delete Records"
  // access check comes before the dialog and is the caller's
  // (CommandAllowed), so that a password is asked once. The number deleted.
  size_t DeleteRecords(DeleteScope scope);
  void HideField(int field);
  // A divider drag: the width is stored (pixels x 2/3) and the database
  // marked changed; no rebuild.
  void SetColumnPixels(int field, int pixels);
  // Auto fit of one field's column from its values and heading.
  void AutoFit(int field, const MeasureText& measure);
  // "Run Report" from the heading: false after the message when the
  // field's type has no report.
  bool CanRunReport(int field) const;

  // Writes `stored` (compact form) over record `recordIndexOrNew`, or adds
  // it when that is kNewRecord; places it in sorted order, recalculates what
  // depends on it, rebuilds the view and makes it the current record. The
  // access checks are the caller's. `changedFields` marks the fields the
  // user changed (all, when not given), for the recalculation.
  StoreResult StoreRecord(size_t recordIndexOrNew, Bytes stored);
  StoreResult StoreRecord(size_t recordIndexOrNew, Bytes stored,
                          const std::array<bool, format::kFieldCount>& changedFields);
  // Deletes one record (with the records linked to it when `alsoLinked`),
  // recalculates and rebuilds the view. False when there is no such record.
  bool DeleteRecord(size_t index, bool alsoLinked);

  // After an operation done elsewhere (a dialog of another module) changed
  // the database: rebuild the view and tell the listeners.
  void ViewChangedExternally(bool columnsToo);
  // After a record was changed where it stands.
  void RecordChangedExternally(size_t recordIndex);
  void MarkChanged();
  // Tells the listeners whether the mark changed since they last heard
  // (after a save cleared it, say).
  void ChangedMarkMayHaveChanged();

  // What linked work started from this document needs (access checks,
  // databases already open at other levels).
  LinkServices MakeLinkServices() const;
  // Set by the workspace: finds a database open at some level.
  void SetOpenDatabaseFinder(std::function<Database*(const std::string&)> find) {
    findOpen_ = std::move(find);
  }

  // Rebuilds the view list and tells the listeners (rows, current record).
  void RebuildView();

 private:
  void Notify(void (DocumentListener::*what)());
  void NotifyCurrent();
  void NotifyChangedMark();
  void NotifyFound();
  void KeepCurrentInRange();

  AppContext& context_;
  DataSession session_;
  size_t current_ = 0;
  bool lastToldChanged_ = false;
  bool newDatabase_ = false;
  std::vector<DocumentListener*> listeners_;
  std::function<Database*(const std::string&)> findOpen_;
};

// What the workspace tells the main window.
class WorkspaceListener {
 public:
  virtual ~WorkspaceListener() = default;
  // A linked level was opened on top: `level` is its number (1 to 19).
  virtual void LevelPushed(int /*level*/, Document& /*shown*/) {}
  // The top level was closed; `level` is the one shown now.
  virtual void LevelPopped(int /*level*/, Document& /*shown*/) {}
  // A database is shown at level 0 where none was.
  virtual void DocumentOpened(Document& /*shown*/) {}
  // Nothing is open any more (the previous documents are gone).
  virtual void DocumentClosed() {}
  // Level 0 now holds another database (the previous documents are gone).
  virtual void DocumentReplaced(Document& /*shown*/) {}
};

// How the save decision runs: the menu commands may be cancelled and ask;
// the end of the program neither asks nor may be cancelled.
struct SaveDecisionMode {
  bool cancellable = true;
  bool silent = false;
};

// The level stack, the shown document and the file commands with the save
// decision. One per main window.
class Workspace {
 public:
  explicit Workspace(AppContext& context);
  ~Workspace();
  Workspace(const Workspace&) = delete;
  Workspace& operator=(const Workspace&) = delete;

  AppContext& context() { return context_; }
  void AddListener(WorkspaceListener* listener);
  void RemoveListener(WorkspaceListener* listener);

  // The document of the shown level; null when nothing is open.
  Document* shown();
  const Document* shown() const;
  // The shown level's number (0 when nothing or level 0 is shown).
  int level() const;
  // The document at `level` (0 .. level()), null otherwise.
  Document* documentAt(int level);
  const ViewLevelStack& levels() const { return levels_; }
  bool isOpen() const { return shown() != nullptr; }

  // A new level above the shown one for `linked` (a database already open
  // at a lower level is shared, not loaded twice). False when nothing is
  // open, `linked` is empty or all 20 levels are in use.
  bool PushLinked(LinkedDatabase linked, LevelMode mode, int linkField);
  // The save decision for the shown level's database (when this level
  // loaded it), then back to the level beneath with its current record.
  // False at level 0 or when the decision was cancelled.
  bool PopLevel();
  // Link services that know the databases open at every level.
  LinkServices MakeLinkServices();

  // File commands: each returns false when it was cancelled or failed
  // (the user has been told).
  bool New();                          // the caller shows the design step
  bool Open(const std::string& path);  // save decision, access check, load
  bool OpenWithDialog();               // "Open..." and "More Files..."
  bool Reopen(int n);                  // recent entry n (0 to 9)
  bool Save();
  bool SaveAs();
  bool Close();                        // one level, or the database at level 0
  bool Exit();                         // cancellable save decisions
  void Shutdown();                     // silent, not cancellable

  // Start-up: the files of the command line (the first opens, the others
  // go to the recent list) or else `LastFileUsed`. True when a database is
  // open afterwards (otherwise the caller shows the start dialog).
  bool Start(const std::vector<std::string>& commandLineFiles);

  // The save decision for one document (public for the commands of other
  // modules that replace a database, and for tests). True to proceed.
  bool DecideSave(Document& doc, SaveDecisionMode mode);
  // The file name offered for a never-saved database: the data folder and
  // the database's name with ".PDB".
  std::string DefaultFileName(const Document& doc) const;

  // The labels of the main view for the shown level.
  std::string TitleLabel() const;
  std::string StatusLabel() const;
  // The window title: the title label (with its changed mark).
  std::string WindowTitle() const;

 private:
  std::unique_ptr<Document> MakeDocument(int level);
  bool SaveDocument(Document& doc, const std::string& path, bool reportSuccess);
  // True when saving `doc` to `path` would replace a file another program
  // changed after it was read here.
  bool WouldReplaceOtherChanges(const Document& doc, const std::string& path) const;
  // Without a user to ask: the changes go into a free name in the data
  // folder, and the user is told where.
  void KeepCopy(Document& doc, const std::string& original);
  std::optional<std::string> AskSavePath(const Document& doc, const std::string& proposed);
  std::string FreeDefaultFileName(const Document& doc) const;
  bool DecideAllLevels(SaveDecisionMode mode);
  bool LoadRoot(const std::string& path);
  void InstallRoot(std::unique_ptr<Database> db, const RecalcState& calc);
  void ReleaseAll();
  void RememberLastFile();
  template <typename F>
  void Tell(F&& f);

  AppContext& context_;
  ViewLevelStack levels_;
  std::vector<std::unique_ptr<Document>> documents_;  // index: level
  std::vector<WorkspaceListener*> listeners_;
  bool exited_ = false;  // Exit has run its decisions and closed everything
};

namespace file_messages {
inline constexpr const char* kNotDatabase = "ERROR: File selected is not a Cardovex Database!";
inline constexpr const char* kSaveFailed = "ERROR:File could not be saved";
inline constexpr const char* kSaved = "File Saved";
inline constexpr const char* kUpdate = "Update";
inline constexpr const char* kQuestion = "QUESTION";
inline constexpr const char* kNeverSaved = "Database (%s) has never been saved. Save Changes?";
inline constexpr const char* kHasChanged = "File (%s) has changed.  Save Changes?";
inline constexpr const char* kOpenTitle = "Cardovex";
inline constexpr const char* kSaveTitle = "Save As";
inline constexpr const char* kReplaceOther =
    "%s was changed by another program after it was opened here.\n\nReplace that version with "
    "this one? (No keeps this database open with its changes.)";
inline constexpr const char* kKeptCopy =
    "%s could not be replaced, so the changes made here were kept in a copy:\n%s";
inline constexpr const char* kDefaultSuffix = "PDB";
inline constexpr const char* kReportTypes =
    "Can only run reports on the following field types:\nInteger, Float, Checkbox, Time, Date, and "
    "Calculated.";
inline constexpr const char* kSavingRecord = "ERROR: Saving record!";
}  // namespace file_messages

}  // namespace cx
