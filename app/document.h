// The document layer: one Document per database shown at a view level, and
// one Workspace that holds the level stack and runs the file commands. Every
// use case (open, save, sort, filter, find, delete, column changes, ...)
// runs here with all of its follow-up steps (re-sort, recalculation, view
// rebuild, changed mark), and listeners are told what changed. The desktop
// program adapts this thinly; the command-line tool calls the same methods.
// No toolkit here.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "app/view_levels.h"
#include "ops/database_settings.h"
#include "ops/delete_records.h"
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

// The list's columns: the fields of the field order whose stored width is
// not 0, left to right, with their pixel widths (stored width x 1.5).
struct ListColumn {
  int field = -1;
  int pixels = 0;
};

class Document {
 public:
  // `db` is owned by the level it belongs to (or shared with a lower one).
  Document(AppContext& context, Database& db, std::optional<LinkRestriction> link = std::nullopt);

  void AddListener(DocumentListener* listener);
  void RemoveListener(DocumentListener* listener);

  Database& db() { return session_.db; }
  const Database& db() const { return session_.db; }
  DataSession& session() { return session_; }
  const DataSession& session() const { return session_; }

  // The view: row r shows record recordAt(r).
  size_t rowCount() const { return session_.view.size(); }
  uint32_t recordAt(size_t row) const { return session_.view[row]; }
  // The row that shows `recordIndex`, or -1 when it is not in view.
  int rowOf(size_t recordIndex) const;
  // The value text of one field of one record, as the list shows it (UTF-8
  // is the GUI's business: this is the 8-bit text).
  std::string ValueText(size_t recordIndex, int field) const;

  std::vector<ListColumn> Columns() const;
  size_t currentRecord() const { return current_; }
  void SetCurrentRecord(size_t recordIndex);

  bool changed() const { return session_.db.changed(); }
  bool neverSaved() const;  // the path holds an asterisk
  std::string TitleLabel() const;

  // Use cases of the list view. Each runs its checks, does the work with
  // its follow-up steps and tells the listeners.
  void SortFromHeader(int field, bool forward);
  void ApplyFilters(const FilterSettings& settings);
  // Find: the hit's record index or -1 ("Not Found in Database!" shown).
  int Find(const SearchSettings& search);
  // Find Again: nullopt when there is no remembered text (the caller shows
  // the Find dialog instead).
  std::optional<int> FindAgain();
  // Delete Records with the access check and the linked-records question.
  size_t DeleteRecords(DeleteScope scope);
  void HideField(int field);
  void SetColumnPixels(int field, int pixels);
  // Auto fit: `measure` gives the pixel extent of a text in the list's font.
  template <typename Measure>
  void AutoFit(int field, Measure&& measure);

  // After an operation done elsewhere (a dialog of another module) changed
  // the database: rebuild the view and tell the listeners.
  void ViewChangedExternally(bool columnsToo);
  // After a record was changed where it stands.
  void RecordChangedExternally(size_t recordIndex);
  void MarkChanged();

 private:
  void Notify(void (DocumentListener::*what)());
  AppContext& context_;
  DataSession session_;
  size_t current_ = 0;
  std::vector<DocumentListener*> listeners_;
};

// The level stack, the shown document and the file commands with the save
// decision. One per main window.
class Workspace {
 public:
  explicit Workspace(AppContext& context);

  // The document of the shown level; null when nothing is open.
  Document* shown();
  int level() const;

  // File commands: each returns false when it was cancelled or failed
  // (the user has been told).
  bool New();                          // the caller shows the design step
  bool Open(const std::string& path);  // with the access check and password
  bool OpenWithDialog();
  bool Reopen(int n);
  bool Save();
  bool SaveAs();
  bool Close();                        // one level, or the database at level 0
  bool Exit();                         // cancellable save decisions
  void Shutdown();                     // silent, not cancellable

 private:
  AppContext& context_;
  ViewLevelStack levels_;
  std::vector<std::unique_ptr<Document>> documents_;  // one per used level
};

}  // namespace cx
