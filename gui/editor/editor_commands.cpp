#include "gui/editor/editor_commands.h"

#include <QAction>
#include <QMainWindow>
#include <QMenu>
#include <QMenuBar>

#include "app/preferences.h"
#include "app/record_commit.h"
#include "design/security.h"
#include "engine/database_folder.h"
#include "engine/value_text.h"
#include "gui/common/qt_ui_port.h"
#include "gui/editor/picker_dialogs.h"
#include "gui/editor/record_editor_dialog.h"
#include "ops/links.h"

namespace cx::gui {
namespace {

// A level opened to choose a record shows all of the other database's
// records, not only those linked to the record beneath.
LinkedDatabase Unrestricted(LinkedDatabase linked) {
  LinkContext context = linked.context();
  context.restriction.field = -1;
  if (linked.loadedHere()) return LinkedDatabase(linked.Release(), context);
  return LinkedDatabase(&linked.db(), context);
}

// The text a chosen record stands for: the field the other database's
// Link field shows ("Show Value From"), else its first text in display
// order.
std::string ChosenRecordText(const Database& db, const LocaleInfo& locale, size_t index, int linkField) {
  const Schema& s = db.schema();
  const ValueContext ctx{s, db.popups(), locale};
  if (linkField >= 0 && linkField < format::kFieldCount) {
    const FieldDef& link = s.field[linkField];
    if (link.type() == FieldType::Link && link.param1 < format::kFieldCount) {
      return OneLine(ValueText(ctx, db.record(index), link.param1));
    }
  }
  for (uint8_t f : s.fieldOrder) {
    if (f >= format::kFieldCount) continue;
    const FieldType t = s.field[f].type();
    if (t == FieldType::Text || t == FieldType::Note || t == FieldType::DBPopup) {
      const std::string text = OneLine(ValueText(ctx, db.record(index), f));
      if (!text.empty()) return text;
    }
  }
  return {};
}

}  // namespace

EditorCommands::EditorCommands(QWidget* window, Workspace& workspace)
    : QObject(window), window_(window), workspace_(workspace) {
  setObjectName(QStringLiteral("editorCommands"));
  undo_ = new QAction(QStringLiteral("Undo Record Change"), this);
  undo_->setObjectName(QStringLiteral("undoRecordAction"));
  undo_->setShortcut(QKeySequence::Undo);
  redo_ = new QAction(QStringLiteral("Redo Record Change"), this);
  redo_->setObjectName(QStringLiteral("redoRecordAction"));
  redo_->setShortcuts({QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_Z), QKeySequence::Redo});
  connect(undo_, &QAction::triggered, this, &EditorCommands::Undo);
  connect(redo_, &QAction::triggered, this, &EditorCommands::Redo);
  if (auto* main = qobject_cast<QMainWindow*>(window)) {
    QMenuBar* bar = main->menuBar();
    QMenu* edit = new QMenu(QStringLiteral("&Edit"), bar);
    edit->setObjectName(QStringLiteral("editMenu"));
    edit->addAction(undo_);
    edit->addAction(redo_);
    const QList<QAction*> menus = bar->actions();
    bar->insertMenu(menus.size() > 1 ? menus[1] : nullptr, edit);
    connect(edit, &QMenu::aboutToShow, this, &EditorCommands::UpdateActions);
  } else {
    window->addAction(undo_);
    window->addAction(redo_);
  }
  workspace_.AddListener(this);
  UpdateActions();
}

EditorCommands::~EditorCommands() { workspace_.RemoveListener(this); }

RecordHistory* EditorCommands::HistoryOf(Document* doc) {
  return doc ? &histories_.For(&doc->db()) : nullptr;
}

InPlacePreferences EditorCommands::preferences() const {
  const Preferences& p = workspace_.context().preferences;
  return InPlacePreferences{p.allowChecks(), p.allowPopups(), p.allowDateTime()};
}

void EditorCommands::UpdateActions() {
  undo_->setEnabled(CanUndo());
  redo_->setEnabled(CanRedo());
}

bool EditorCommands::CanUndo() {
  RecordHistory* h = HistoryOf(workspace_.shown());
  return h && h->CanUndo();
}

bool EditorCommands::CanRedo() {
  RecordHistory* h = HistoryOf(workspace_.shown());
  return h && h->CanRedo();
}

void EditorCommands::Undo() {
  Document* doc = workspace_.shown();
  if (!doc || !CanUndo()) return;
  const long index = HistoryOf(doc)->Undo(doc->session());
  if (index >= 0) doc->SetCurrentRecord(static_cast<size_t>(index));
  doc->ViewChangedExternally(false);
  UpdateActions();
}

void EditorCommands::Redo() {
  Document* doc = workspace_.shown();
  if (!doc || !CanRedo()) return;
  const long index = HistoryOf(doc)->Redo(doc->session());
  if (index >= 0) doc->SetCurrentRecord(static_cast<size_t>(index));
  doc->ViewChangedExternally(false);
  UpdateActions();
}

void EditorCommands::OpenRecordAt(int row, int column, const QPoint& cell) {
  Document* doc = workspace_.shown();
  if (!doc || row < 0 || static_cast<size_t>(row) >= doc->rowCount()) return;
  const size_t record = doc->recordAt(static_cast<size_t>(row));
  doc->SetCurrentRecord(record);

  if (workspace_.level() > 0) {
    const LevelMode mode = workspace_.levels().shown().mode;
    if (mode == LevelMode::Choose) {
      HandBack(*doc, record);
      return;
    }
    if (mode == LevelMode::Reassign &&
        doc->session().ui.AskYesNo(view_level_messages::kReassignQuestion, "QUESTION")) {
      HandBack(*doc, record);
      return;
    }
  }

  const Access access = CheckAccess(doc->db(), secured::kEditRecords, doc->session().ui);
  if (access == Access::Refused) return;
  const int field = doc->FieldOfColumn(column);
  if (access == Access::Granted && field >= 0 && InPlace(*doc, record, field, cell)) return;
  RunEditor(record, access == Access::ViewOnly);
}

bool EditorCommands::InPlace(Document& doc, size_t record, int field, const QPoint& cell) {
  const InPlaceKind kind = InPlaceKindFor(doc.db().schema().field[field].type(), preferences());
  if (kind == InPlaceKind::None) return false;
  const Clock& clock = doc.context().clock;
  InPlaceTools tools{doc.session(), clock, HistoryOf(&doc)};
  switch (kind) {
    case InPlaceKind::Check:
      ToggleCheckInPlace(tools, record, field);
      break;
    case InPlaceKind::Popup:
      ChoosePopupInPlace(tools, record, field, ExecPopupMenu(window_, cell, doc.db(), field, true, false));
      break;
    case InPlaceKind::Date:
      ChooseDateInPlace(tools, record, field, ExecDateMenu(window_, cell, true), CalendarFor(window_, clock));
      break;
    case InPlaceKind::Time:
      ChooseTimeInPlace(tools, record, field, TimeChooserFor(window_, clock));
      break;
    case InPlaceKind::None:
      break;
  }
  doc.SetCurrentRecord(record);
  doc.ViewChangedExternally(false);
  UpdateActions();
  return true;
}

void EditorCommands::NewRecord() {
  Document* doc = workspace_.shown();
  if (!doc) return;
  if (!Allowed(CheckAccess(doc->db(), secured::kAddRecords, doc->session().ui))) return;
  RunEditor(kNewRecordIndex, false);
}

void EditorCommands::RunEditor(size_t record, bool viewOnly, std::optional<size_t> copyFrom) {
  Document* doc = workspace_.shown();
  if (!doc) return;
  RecordEditorDialog dialog(*doc, record, viewOnly, HistoryOf(doc), window_, copyFrom);
  dialog.SetSettings(settings_);
  dialog.exec();
  UpdateActions();
  if (dialog.exitKind() == RecordEditorDialog::Exit::FollowLink) {
    const size_t at = dialog.record();
    if (!Follow(*doc, at, dialog.linkField(), viewOnly) && at < doc->db().recordCount()) {
      // The link led nowhere (the user has been told): back to the record.
      RunEditor(at, viewOnly);
    }
  }
}

bool EditorCommands::Follow(Document& doc, size_t record, int field, bool viewOnly) {
  if (record >= doc.db().recordCount() || field < 0 || field >= format::kFieldCount) return false;
  const FieldDef& def = doc.db().schema().field[field];
  std::string otherPath = def.text.str();
  if (!FindDatabaseBeside(otherPath, doc.db().path())) {
    doc.session().ui.ShowMessage(record_messages::kLinkedNotPresent, "ERROR", MessageIcon::Error);
    return false;
  }
  if (workspace_.levels().AtTop()) {
    doc.session().ui.ShowMessage("All 20 levels of linked databases are in use: close one first.", "ERROR",
                                 MessageIcon::Error);
    return false;
  }
  LinkServices services = workspace_.MakeLinkServices();
  LinkedDatabase linked = OpenLinkedDatabase(field, doc.db(), record, LinkAccess::Open, services);
  if (!linked) return false;

  Pending pending;
  pending.field = field;
  pending.record = record;
  pending.viewOnly = viewOnly;
  std::optional<size_t> select;
  switch (def.type()) {
    case FieldType::Link:
      pending.mode = LevelMode::Browse;
      break;
    case FieldType::DBPopup:
      if (viewOnly) return false;
      pending.mode = LevelMode::Choose;
      linked = Unrestricted(std::move(linked));
      break;
    case FieldType::Linked: {
      if (viewOnly) {
        // Only shown: the record it is linked to, nothing to choose.
        pending.mode = LevelMode::Browse;
        break;
      }
      // Linked to nothing yet: choose the record; otherwise show where it
      // is linked, and a tap elsewhere offers to move it there.
      const uint32_t number = linked.restriction().value;
      pending.mode = number == 0 ? LevelMode::Choose : LevelMode::Reassign;
      const int other = linked.restriction().field;
      for (size_t i = 0; number != 0 && other >= 0 && i < linked.db().recordCount(); ++i) {
        auto v = FieldValue(linked.db().record(i), other);
        if (v && v->size() >= 4 && ValueNumber(*v) == number) {
          select = i;
          break;
        }
      }
      linked = Unrestricted(std::move(linked));
      break;
    }
    default:
      return false;
  }
  if (!workspace_.PushLinked(std::move(linked), pending.mode, field)) return false;
  pending.level = workspace_.level();
  pending_.push_back(pending);
  if (select) {
    if (Document* shown = workspace_.shown()) shown->SetCurrentRecord(*select);
  }
  return true;
}

void EditorCommands::HandBack(Document& doc, size_t chosen) {
  if (pending_.empty() || pending_.back().level != workspace_.level()) {
    // A level nobody waits for: nothing to hand back to.
    workspace_.PopLevel();
    return;
  }
  Pending& p = pending_.back();
  Document* below = workspace_.documentAt(workspace_.level() - 1);
  if (!below) return;
  const FieldDef& def = below->db().schema().field[p.field];
  const int other = def.otherField < format::kFieldCount ? def.otherField : 0;
  const Database& db = doc.db();
  const LocaleInfo& locale = doc.session().locale;
  if (def.type() == FieldType::DBPopup) {
    const ValueContext ctx{db.schema(), db.popups(), locale};
    p.text = OneLine(ValueText(ctx, db.record(chosen), other));
  } else {
    auto v = FieldValue(db.record(chosen), other);
    p.number = v ? ValueNumber(*v) : 0;
    p.text = ChosenRecordText(db, locale, chosen, other);
  }
  p.chosen = true;
  if (!workspace_.PopLevel()) {
    p.chosen = false;
    return;
  }
  ResumeAfterLinkedLevel();
}

void EditorCommands::ResumeAfterLinkedLevel() {
  std::optional<Pending> closed;
  while (!pending_.empty() && pending_.back().level > workspace_.level()) {
    if (pending_.back().level == workspace_.level() + 1) closed = pending_.back();
    pending_.pop_back();
  }
  Document* doc = workspace_.shown();
  if (!closed || !doc || closed->record >= doc->db().recordCount()) return;
  size_t record = closed->record;
  if (closed->chosen) {
    RecordForm form(doc->session(), record, doc->context().clock);
    if (form.TypeOf(closed->field) == FieldType::Linked) form.SetNumber(closed->field, closed->number);
    form.SetText(closed->field, closed->text);
    StoreOutcome out = CommitForm(form, HistoryOf(doc));
    if (out.ok) record = out.index;
    doc->SetCurrentRecord(record);
    if (out.stored) doc->ViewChangedExternally(false);
  }
  // Back to the editor as it was: the access was checked when it opened.
  RunEditor(record, closed->viewOnly);
}

void EditorCommands::LevelPopped(int level, Document&) {
  // Histories of databases no level shows any more go with them.
  std::vector<const Database*> open;
  for (int n = 0; n <= level; ++n) {
    if (Document* d = workspace_.documentAt(n)) open.push_back(&d->db());
  }
  histories_.KeepOnly(open);
  UpdateActions();
}

void EditorCommands::DocumentClosed() {
  histories_.KeepOnly({});
  pending_.clear();
  UpdateActions();
}

void EditorCommands::DocumentReplaced(Document&) { DocumentClosed(); }

EditorCommands& InstallEditorCommands(QWidget* window, Workspace& workspace) {
  return EditorCommandsOf(window, workspace);
}

EditorCommands& EditorCommandsOf(QWidget* window, Workspace& workspace) {
  if (auto* existing = window->findChild<EditorCommands*>(QString(), Qt::FindDirectChildrenOnly)) {
    return *existing;
  }
  return *new EditorCommands(window, workspace);
}

}  // namespace cx::gui
