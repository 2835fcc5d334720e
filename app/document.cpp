#include "app/document.h"

#include <algorithm>
#include <filesystem>

#include "app/preferences.h"
#include "app/record_commit.h"
#include "design/link_access.h"
#include "design/security.h"
#include "engine/container.h"
#include "engine/database_folder.h"
#include "engine/field_types.h"
#include "engine/value_text.h"
#include "ops/find.h"
#include "ops/open_database.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"

namespace cx {

namespace {

// A record keeps its stored block while it only moves in the table, so the
// block's address finds it again after a sort or a deletion.
const uint8_t* Identity(const Database& db, size_t index) {
  return index < db.recordCount() ? db.record(index).data() : nullptr;
}

size_t Locate(const Database& db, const uint8_t* identity, size_t fallback) {
  if (identity) {
    for (size_t i = 0; i < db.recordCount(); ++i) {
      if (db.record(i).data() == identity) return i;
    }
  }
  return fallback;
}

// The folder a dialog starts in: the file's own, without its final slash.
std::string FolderOf(const std::string& path) {
  std::string folder = FolderPart(path);
  if (folder.size() > 1 && folder.back() == '/') folder.pop_back();
  return folder;
}

std::string Substitute(const char* pattern, const std::string& text) {
  std::string s = pattern;
  if (size_t at = s.find("%s"); at != std::string::npos) s.replace(at, 2, text);
  return s;
}

}  // namespace

// ---------------------------------------------------------------- Document

Document::Document(AppContext& context, Database& db, std::optional<LinkRestriction> link)
    : context_(context), session_(db, context.locale, context.ui, link) {
  session_.view = cx::RebuildView(db, session_.Link());
  current_ = session_.view.empty() ? 0 : session_.view.front();
  lastToldChanged_ = db.changed();
}

void Document::AddListener(DocumentListener* listener) {
  if (listener && std::find(listeners_.begin(), listeners_.end(), listener) == listeners_.end())
    listeners_.push_back(listener);
}

void Document::RemoveListener(DocumentListener* listener) {
  listeners_.erase(std::remove(listeners_.begin(), listeners_.end(), listener), listeners_.end());
}

int Document::rowOf(size_t recordIndex) const {
  const auto& view = session_.view;
  auto it = std::lower_bound(view.begin(), view.end(), recordIndex);
  if (it == view.end() || *it != recordIndex) return -1;
  return static_cast<int>(it - view.begin());
}

std::string Document::ValueText(size_t recordIndex, int field) const {
  const Database& d = db();
  if (recordIndex >= d.recordCount() || field < 0 || field >= format::kFieldCount) return {};
  const ValueContext values{d.schema(), d.popups(), context_.locale};
  return cx::ValueText(values, d.record(recordIndex), field);
}

std::vector<ListColumn> Document::Columns() const { return ListColumns(db().schema()); }

int Document::FieldOfColumn(int column) const { return FieldOfListColumn(db().schema(), column); }

void Document::SetCurrentRecord(size_t recordIndex) {
  if (recordIndex == current_) return;
  current_ = recordIndex;
  NotifyCurrent();
}

bool Document::neverSaved() const { return path().find('*') != std::string::npos; }

std::string Document::TitleLabel() const {
  return name() + (changed() ? "*" : "") + " (" + std::to_string(rowCount()) + "/" +
         std::to_string(db().recordCount()) + ")";
}

std::string Document::StatusLabel() const {
  const bool filtered = LoadFilterSettings(db().schema()).AnyEnabled();
  if (link()) return filtered ? "Link+Filter" : "Linked";
  return filtered ? "Filtered" : "";
}

void Document::SortFromHeader(int field, bool forward) {
  if (field < 0 || field >= format::kFieldCount) return;
  BusyScope busy(context_.ui);
  const uint8_t* current = Identity(db(), current_);
  cx::SortFromHeader(session_, field, forward);
  current_ = Locate(db(), current, current_);
  KeepCurrentInRange();
  Notify(&DocumentListener::ViewRebuilt);
  NotifyCurrent();
  NotifyChangedMark();
}

void Document::ApplyFilters(const FilterSettings& settings) {
  BusyScope busy(context_.ui);
  StoreFilterSettings(settings, db().schema());
  db().MarkChanged();
  RebuildView();
  NotifyChangedMark();
}

void Document::ApplyFilterDialog(const FilterDialogValues& values) {
  BusyScope busy(context_.ui);
  AcceptFilterDialog(db(), values);
  RebuildView();
  NotifyChangedMark();
}

void Document::DisableFilters() {
  BusyScope busy(context_.ui);
  DisableBothFilters(db());
  RebuildView();
  NotifyChangedMark();
}

int Document::Find(const SearchSettings& search) {
  const int hit = SearchDatabase(session_, search);
  NotifyChangedMark();
  NotifyFound();
  if (hit >= 0) SetCurrentRecord(static_cast<size_t>(hit));
  return hit;
}

std::optional<int> Document::FindAgain() {
  if (LoadSearchSettings(db().schema()).text.empty()) return std::nullopt;
  const int hit = RepeatFind(session_);
  NotifyFound();
  if (hit >= 0) SetCurrentRecord(static_cast<size_t>(hit));
  return hit;
}

size_t Document::DeleteRecords(DeleteScope scope) {
  LinkServices services = MakeLinkServices();
  LinkedRecordsDeleter linked(services);
  BusyScope busy(context_.ui);
  const uint8_t* current = Identity(db(), current_);
  const size_t deleted = DeleteRecordsCommand(session_, scope, &linked);
  current_ = Locate(db(), current, current_);
  KeepCurrentInRange();
  Notify(&DocumentListener::ViewRebuilt);
  NotifyCurrent();
  NotifyChangedMark();
  return deleted;
}

void Document::HideField(int field) {
  if (field < 0 || field >= format::kFieldCount) return;
  db().schema().field[field].width = 0;
  db().MarkChanged();
  Notify(&DocumentListener::ColumnsChanged);
  RebuildView();
  NotifyChangedMark();
}

void Document::SetColumnPixels(int field, int pixels) {
  if (field < 0 || field >= format::kFieldCount) return;
  const int stored = std::clamp(StoredFromPixels(std::max(pixels, 0)), 0, 32767);
  db().schema().field[field].width = static_cast<int16_t>(stored);
  db().MarkChanged();
  NotifyChangedMark();
}

void Document::AutoFit(int field, const MeasureText& measure) {
  if (field < 0 || field >= format::kFieldCount || !measure) return;
  BusyScope busy(context_.ui);
  const int stored = AutoFitStoredWidth(
      db().schema(), field, rowCount(), [&](size_t row) { return ValueText(recordAt(row), field); },
      measure);
  db().schema().field[field].width = static_cast<int16_t>(stored);
  db().MarkChanged();
  Notify(&DocumentListener::ColumnsChanged);
  RebuildView();
  NotifyChangedMark();
}

bool Document::CanRunReport(int field) const {
  if (field >= 0 && field < format::kFieldCount) {
    switch (db().schema().field[field].type()) {
      case FieldType::Integer:
      case FieldType::Float:
      case FieldType::CheckBox:
      case FieldType::Date:
      case FieldType::Time:
      case FieldType::Calculated: return true;
      default: break;
    }
  }
  context_.ui.ShowMessage(file_messages::kReportTypes, "ERROR", MessageIcon::Error);
  return false;
}

StoreResult Document::StoreRecord(size_t recordIndexOrNew, Bytes stored) {
  // Without word of which fields the user changed, every one counts as
  // changed: the recalculation then reaches whatever could depend on them.
  std::array<bool, format::kFieldCount> all;
  all.fill(true);
  return StoreRecord(recordIndexOrNew, std::move(stored), all);
}

StoreResult Document::StoreRecord(size_t recordIndexOrNew, Bytes stored,
                                  const std::array<bool, format::kFieldCount>& changedFields) {
  // One rule for writing a record back, shared with the record editor.
  const size_t index = recordIndexOrNew == kNewRecord ? kNewRecordIndex : recordIndexOrNew;
  const StoreOutcome outcome =
      cx::StoreRecord(session_, index, std::move(stored), changedFields, false, nullptr);
  if (!outcome.ok) return StoreResult{Status::Error(record_messages::kSavingError), 0};
  current_ = outcome.index;
  KeepCurrentInRange();
  Notify(&DocumentListener::ViewRebuilt);
  NotifyCurrent();
  NotifyChangedMark();
  return StoreResult{Status::Ok(), outcome.index};
}

bool Document::DeleteRecord(size_t index, bool alsoLinked) {
  Database& d = db();
  if (index >= d.recordCount()) return false;
  if (alsoLinked) {
    LinkServices services = MakeLinkServices();
    // The linked databases may be this one (a link back to itself): the
    // record is found again by its block afterwards.
    const uint8_t* identity = Identity(d, index);
    DeleteLinkedRecords(index, d, services);
    index = Locate(d, identity, index);
    if (index >= d.recordCount()) return false;
  }
  DeleteRecordAt(session_, index, nullptr);
  if (current_ != kNewRecord && current_ > index) --current_;
  KeepCurrentInRange();
  Notify(&DocumentListener::ViewRebuilt);
  NotifyCurrent();
  NotifyChangedMark();
  return true;
}

void Document::ViewChangedExternally(bool columnsToo) {
  if (columnsToo) Notify(&DocumentListener::ColumnsChanged);
  RebuildView();
  NotifyChangedMark();
}

void Document::RecordChangedExternally(size_t recordIndex) {
  for (DocumentListener* l : std::vector<DocumentListener*>(listeners_)) l->RecordChanged(recordIndex);
  NotifyChangedMark();
}

void Document::MarkChanged() {
  db().MarkChanged();
  NotifyChangedMark();
}

void Document::ChangedMarkMayHaveChanged() { NotifyChangedMark(); }

LinkServices Document::MakeLinkServices() const {
  LinkServices services = SecuredLinkServices(context_.ui, &context_.locale, findOpen_);
  services.clock = &context_.clock;
  return services;
}

void Document::RebuildView() {
  session_.view = cx::RebuildView(db(), session_.Link());
  KeepCurrentInRange();
  Notify(&DocumentListener::ViewRebuilt);
  NotifyCurrent();
}

void Document::Notify(void (DocumentListener::*what)()) {
  for (DocumentListener* l : std::vector<DocumentListener*>(listeners_)) (l->*what)();
}

void Document::NotifyCurrent() {
  for (DocumentListener* l : std::vector<DocumentListener*>(listeners_)) l->CurrentRecordChanged(current_);
}

void Document::NotifyChangedMark() {
  const bool now = changed();
  if (now == lastToldChanged_) return;
  lastToldChanged_ = now;
  for (DocumentListener* l : std::vector<DocumentListener*>(listeners_)) l->ChangedMarkToggled(now);
}

void Document::NotifyFound() { Notify(&DocumentListener::FoundRecordChanged); }

void Document::KeepCurrentInRange() {
  if (current_ == kNewRecord) return;
  const size_t count = db().recordCount();
  if (current_ >= count) current_ = count == 0 ? 0 : count - 1;
}

// --------------------------------------------------------------- Workspace

Workspace::Workspace(AppContext& context) : context_(context), documents_(ViewLevelStack::kMaxLevels) {}

Workspace::~Workspace() { ReleaseAll(); }

void Workspace::AddListener(WorkspaceListener* listener) {
  if (listener && std::find(listeners_.begin(), listeners_.end(), listener) == listeners_.end())
    listeners_.push_back(listener);
}

void Workspace::RemoveListener(WorkspaceListener* listener) {
  listeners_.erase(std::remove(listeners_.begin(), listeners_.end(), listener), listeners_.end());
}

template <typename F>
void Workspace::Tell(F&& f) {
  for (WorkspaceListener* l : std::vector<WorkspaceListener*>(listeners_)) f(*l);
}

Document* Workspace::shown() {
  if (!levels_.shown().open()) return nullptr;
  return documents_[levels_.current()].get();
}

const Document* Workspace::shown() const {
  if (!levels_.shown().open()) return nullptr;
  return documents_[levels_.current()].get();
}

int Workspace::level() const { return levels_.current(); }

Document* Workspace::documentAt(int n) {
  if (n < 0 || n > levels_.current() || !levels_.level(n).open()) return nullptr;
  return documents_[n].get();
}

std::unique_ptr<Document> Workspace::MakeDocument(int n) {
  ViewLevel& lv = levels_.level(n);
  std::optional<LinkRestriction> link;
  if (lv.link) link = lv.link->restriction;
  auto doc = std::make_unique<Document>(context_, *lv.db, link);
  doc->SetOpenDatabaseFinder([this](const std::string& path) { return levels_.FindOpen(path); });
  return doc;
}

LinkServices Workspace::MakeLinkServices() {
  LinkServices services =
      SecuredLinkServices(context_.ui, &context_.locale,
                          [this](const std::string& path) { return levels_.FindOpen(path); });
  services.clock = &context_.clock;
  return services;
}

bool Workspace::PushLinked(LinkedDatabase linked, LevelMode mode, int linkField) {
  Document* below = shown();
  if (!below || !linked || levels_.AtTop()) return false;
  if (linked.loadedHere()) {
    // A second copy of a database open beneath would let two levels save
    // different versions of one file: the open one is used instead.
    if (Database* open = levels_.FindOpen(linked.db().path())) {
      linked = LinkedDatabase(open, linked.context());
    }
  }
  levels_.shown().currentRecord = below->currentRecord();
  if (!levels_.Push(std::move(linked), mode, linkField)) return false;
  const int n = levels_.current();
  documents_[n] = MakeDocument(n);
  Document& doc = *documents_[n];
  Tell([&](WorkspaceListener& l) { l.LevelPushed(n, doc); });
  return true;
}

bool Workspace::PopLevel() {
  const int n = levels_.current();
  if (n == 0 || !shown()) return false;
  if (levels_.shown().owned && !DecideSave(*shown(), SaveDecisionMode{true, false})) return false;
  documents_[n].reset();
  std::unique_ptr<Database> released = levels_.Pop();
  released.reset();
  Document& below = *documents_[levels_.current()];
  // The level above may have shared this database or deleted linked
  // records from it: its rows are built again.
  below.SetCurrentRecord(levels_.shown().currentRecord);
  below.ViewChangedExternally(true);
  Tell([&](WorkspaceListener& l) { l.LevelPopped(levels_.current(), below); });
  return true;
}

std::string Workspace::DefaultFileName(const Document& doc) const {
  return DatabasePath(context_.dataFolder, doc.name() + ".PDB");
}

std::string Workspace::FreeDefaultFileName(const Document& doc) const {
  std::string path = DefaultFileName(doc);
  // Saving without a question must never replace another database.
  for (int n = 1; FileExists(path) && n < 100000; ++n) {
    path = DatabasePath(context_.dataFolder, doc.name() + std::to_string(n) + ".PDB");
  }
  return path;
}

std::optional<std::string> Workspace::AskSavePath(const Document& doc, const std::string& proposed) {
  FileDialogRequest request;
  request.title = file_messages::kSaveTitle;
  request.filter = link_messages::kFileFilter;
  request.folder = doc.neverSaved() ? context_.dataFolder : FolderOf(doc.path());
  request.fileName = proposed;
  request.defaultSuffix = file_messages::kDefaultSuffix;
  context_.ui.SetBusy(false);
  return context_.ui.ChooseSaveFile(request);
}

bool Workspace::WouldReplaceOtherChanges(const Document& doc, const std::string& path) const {
  if (doc.neverSaved() || !doc.db().ChangedOnDisk()) return false;
  std::error_code ec;
  return path == doc.path() || std::filesystem::equivalent(path, doc.path(), ec);
}

void Workspace::KeepCopy(Document& doc, const std::string& original) {
  const std::string copy = FreeDefaultFileName(doc);
  if (!SaveDocument(doc, copy, false)) return;
  // Both names go in at once: a path may itself hold "%s".
  std::string text = file_messages::kKeptCopy;
  const size_t first = text.find("%s");
  text.replace(first, 2, original);
  text.replace(text.find("%s", first + original.size()), 2, copy);
  context_.ui.ShowMessage(text, file_messages::kUpdate, MessageIcon::Warning);
}

bool Workspace::SaveDocument(Document& doc, const std::string& path, bool reportSuccess) {
  UiPort& ui = context_.ui;
  if (WouldReplaceOtherChanges(doc, path)) {
    // The user decides whose version wins; No leaves everything as it is,
    // the database still open and marked changed.
    ui.SetBusy(false);
    if (!ui.AskYesNo(Substitute(file_messages::kReplaceOther, path), file_messages::kQuestion)) return false;
    doc.db().AcceptDiskState();
  }
  Status status;
  if (path.find('*') != std::string::npos) {
    status = Status::Error(file_messages::kSaveFailed);
  } else {
    BusyScope busy(ui);
    // SaveAs and not SetPath + Save: a different target is no reason to
    // compare with the state of the file this database came from.
    status = doc.db().SaveAs(path, context_.clock);
  }
  if (!status) {
    ui.ShowMessage(file_messages::kSaveFailed, file_messages::kUpdate, MessageIcon::Error);
    // The box keeps its fixed text; the reason goes to the status line.
    if (!status.message().empty() && status.message() != file_messages::kSaveFailed) ui.Status(status.message());
    return false;
  }
  context_.recent.Add(path);
  doc.ChangedMarkMayHaveChanged();
  if (reportSuccess) ui.ShowMessage(file_messages::kSaved, file_messages::kUpdate, MessageIcon::Information);
  return true;
}

bool Workspace::DecideSave(Document& doc, SaveDecisionMode mode) {
  if (!doc.changed()) return true;
  UiPort& ui = context_.ui;
  const bool never = doc.neverSaved();
  const bool autoSave = context_.preferences.autoSave();

  if (mode.silent || (autoSave && !never)) {
    const std::string path = never ? FreeDefaultFileName(doc) : doc.path();
    // A save nobody watches never replaces another program's version.
    if (mode.silent && WouldReplaceOtherChanges(doc, path)) {
      KeepCopy(doc, path);
      return true;
    }
    if (SaveDocument(doc, path, false)) return true;
    // A command that can stop does, and the user decides. Without a user
    // to ask, a copy in the data folder keeps the changes (the original
    // file may be the one that cannot be written).
    if (mode.cancellable) return false;
    if (!never) KeepCopy(doc, path);
    return true;
  }

  const std::string question =
      Substitute(autoSave ? file_messages::kNeverSaved : file_messages::kHasChanged, doc.name());
  // Bounded only by the user: a Cancel in the save dialog asks again.
  for (;;) {
    ui.SetBusy(false);
    Answer answer = mode.cancellable ? ui.AskYesNoCancel(question, file_messages::kQuestion)
                                     : (ui.AskYesNo(question, file_messages::kQuestion) ? Answer::Yes
                                                                                       : Answer::No);
    if (answer == Answer::Cancel) return false;
    if (answer == Answer::No) return true;
    if (!never) return SaveDocument(doc, doc.path(), false) || !mode.cancellable;
    std::optional<std::string> chosen = AskSavePath(doc, DefaultFileName(doc));
    if (!chosen) continue;
    return SaveDocument(doc, *chosen, false) || !mode.cancellable;
  }
}

bool Workspace::DecideAllLevels(SaveDecisionMode mode) {
  for (int n = levels_.current(); n >= 0; --n) {
    const ViewLevel& lv = levels_.level(n);
    if (!lv.open() || !documents_[n]) continue;
    // A level that shares a database opened beneath leaves the decision to
    // the level that owns it.
    if (n > 0 && !lv.owned) continue;
    if (!DecideSave(*documents_[n], mode)) return false;
  }
  return true;
}

void Workspace::ReleaseAll() {
  for (int n = ViewLevelStack::kMaxLevels - 1; n >= 0; --n) documents_[n].reset();
  levels_.Clear();
}

void Workspace::RememberLastFile() {
  const Document* root = documents_[0] && levels_.level(0).open() ? documents_[0].get() : nullptr;
  context_.preferences.WriteLastFileUsed(root && !root->neverSaved() ? root->path() : "");
}

void Workspace::InstallRoot(std::unique_ptr<Database> db, const RecalcState& calc) {
  const bool wasOpen = levels_.level(0).open();
  ReleaseAll();
  levels_.OpenRoot(std::move(db));
  documents_[0] = MakeDocument(0);
  documents_[0]->session().calc = calc;
  Document& doc = *documents_[0];
  if (wasOpen) {
    Tell([&](WorkspaceListener& l) { l.DocumentReplaced(doc); });
  } else {
    Tell([&](WorkspaceListener& l) { l.DocumentOpened(doc); });
  }
}

bool Workspace::LoadRoot(const std::string& path) {
  UiPort& ui = context_.ui;
  Header header;
  if (ReadHeader(path, header) == -1) {
    ui.ShowMessage(file_messages::kNotDatabase, file_messages::kUpdate, MessageIcon::Error);
    return false;
  }
  if (!CheckOpenAccess(path, ui)) return false;
  auto db = std::make_unique<Database>();
  DataSession loading(*db, context_.locale, ui);
  {
    BusyScope busy(ui);
    if (!OpenDatabase(loading, path)) return false;
  }
  context_.recent.Add(path);
  InstallRoot(std::move(db), loading.calc);
  return true;
}

bool Workspace::New() {
  if (!DecideAllLevels(SaveDecisionMode{true, false})) return false;
  // The name of the first free "UntitledN.PDB": saving under the name offered
  // then replaces nothing.
  const std::string name = std::filesystem::path(NewDatabaseName(context_.dataFolder)).stem().string();
  auto db = std::make_unique<Database>(Database::CreateNew("Untitled*", name));
  InstallRoot(std::move(db), RecalcState{});
  documents_[0]->SetNewDatabase(true);
  return true;
}

bool Workspace::Open(const std::string& path) {
  if (path.empty()) return false;
  if (!DecideAllLevels(SaveDecisionMode{true, false})) return false;
  return LoadRoot(path);
}

bool Workspace::OpenWithDialog() {
  if (!DecideAllLevels(SaveDecisionMode{true, false})) return false;
  FileDialogRequest request;
  request.title = file_messages::kOpenTitle;
  request.filter = link_messages::kFileFilter;
  const Document* doc = documents_[0] && levels_.level(0).open() ? documents_[0].get() : nullptr;
  request.folder = doc && !doc->neverSaved() ? FolderOf(doc->path()) : context_.dataFolder;
  request.defaultSuffix = file_messages::kDefaultSuffix;
  context_.ui.SetBusy(false);
  std::optional<std::string> chosen = context_.ui.ChooseOpenFile(request);
  if (!chosen || chosen->empty()) return false;
  return LoadRoot(*chosen);
}

bool Workspace::Reopen(int n) {
  const std::string path = context_.recent.Entry(n);
  if (path.empty()) return false;
  return Open(path);
}

bool Workspace::Save() {
  Document* doc = shown();
  if (!doc) return false;
  std::string path = doc->path();
  if (doc->neverSaved()) {
    // A cancelled dialog leaves the unsaveable path, and the save below
    // then reports the failure.
    if (std::optional<std::string> chosen = AskSavePath(*doc, DefaultFileName(*doc))) path = *chosen;
  }
  return SaveDocument(*doc, path, true);
}

bool Workspace::SaveAs() {
  Document* doc = shown();
  if (!doc) return false;
  std::optional<std::string> chosen =
      AskSavePath(*doc, doc->neverSaved() ? DefaultFileName(*doc) : doc->path());
  if (!chosen || chosen->empty()) return false;
  return SaveDocument(*doc, *chosen, true);
}

bool Workspace::Close() {
  if (!shown()) return false;
  if (levels_.current() > 0) return PopLevel();
  if (!DecideSave(*shown(), SaveDecisionMode{true, false})) return false;
  ReleaseAll();
  Tell([](WorkspaceListener& l) { l.DocumentClosed(); });
  return true;
}

bool Workspace::Exit() {
  // A second close of the window must not forget what the first one
  // remembered.
  if (exited_ && !isOpen()) return true;
  if (!DecideAllLevels(SaveDecisionMode{true, false})) return false;
  RememberLastFile();
  exited_ = true;
  const bool wasOpen = isOpen();
  // Changes the user chose to discard must not be saved by the silent
  // decision at the very end.
  ReleaseAll();
  if (wasOpen) Tell([](WorkspaceListener& l) { l.DocumentClosed(); });
  return true;
}

void Workspace::Shutdown() {
  // After Exit the databases are closed and LastFileUsed names what was
  // open then; otherwise (the window closed by the system) both happen here.
  if (!exited_) {
    const bool wasOpen = isOpen();
    DecideAllLevels(SaveDecisionMode{false, true});
    RememberLastFile();
    ReleaseAll();
    if (wasOpen) Tell([](WorkspaceListener& l) { l.DocumentClosed(); });
  }
  exited_ = false;
  context_.preferences.Write();
}

bool Workspace::Start(const std::vector<std::string>& commandLineFiles) {
  exited_ = false;
  context_.preferences.WriteVersion(ProgramVersion());
  std::error_code ec;
  if (!context_.dataFolder.empty()) std::filesystem::create_directories(context_.dataFolder, ec);
  context_.preferences.Read();
  std::optional<std::string> target;
  if (!commandLineFiles.empty()) {
    for (size_t i = commandLineFiles.size() - 1; i >= 1; --i) context_.recent.Add(commandLineFiles[i]);
    target = commandLineFiles.front();
    context_.preferences.WriteLastFileUsed(*target);
  } else {
    target = context_.preferences.lastFileUsed();
  }
  if (target && FileExists(*target)) LoadRoot(*target);
  return isOpen();
}

std::string Workspace::TitleLabel() const {
  const Document* doc = shown();
  return levels_.TitleLabel(doc ? doc->rowCount() : 0);
}

std::string Workspace::StatusLabel() const { return levels_.StatusLabel(); }

std::string Workspace::WindowTitle() const {
  if (!shown()) return "Cardovex";
  return TitleLabel() + " - Cardovex";
}

}  // namespace cx
