#include "gui/design/design_commands.h"

#include "design/security.h"
#include "gui/design/edit_database_dialog.h"
#include "gui/design/field_editor_dialog.h"
#include "gui/design/popup_list_dialog.h"
#include "gui/design/security_dialog.h"

namespace cx::gui {
namespace {

bool Granted(Document& doc, int op) {
  return Allowed(CheckAccess(doc.db(), op, doc.context().ui));
}

// The list shows fields by their definitions and records by their values:
// after a design change both may differ.
void Follow(Document& doc) {
  doc.MarkChanged();
  doc.ViewChangedExternally(true);
}

bool RunEditDatabase(QWidget* parent, Document& doc) {
  EditDatabaseDialog dialog(doc.session(), parent);
  const bool ok = dialog.exec() == QDialog::Accepted;
  if (dialog.designChanged() || dialog.recordsChanged()) Follow(doc);
  return ok;
}

}  // namespace

bool ShowDatabaseProperties(QWidget* parent, Document& doc) {
  if (!Granted(doc, secured::kDBProperties)) return false;
  return RunEditDatabase(parent, doc);
}

bool DesignNewDatabase(QWidget* parent, Document& doc) { return RunEditDatabase(parent, doc); }

bool NewDatabase(QWidget* parent, Workspace& workspace) {
  if (!workspace.New()) return false;
  Document* doc = workspace.shown();
  if (!doc) return false;
  if (DesignNewDatabase(parent, *doc)) return true;
  // Nothing of the abandoned design is worth a question.
  doc->db().ClearChanged();
  workspace.Close();
  return false;
}

bool ShowFieldProperties(QWidget* parent, Document& doc, int slot) {
  if (!Granted(doc, secured::kDBProperties)) return false;
  FieldEditorDialog editor(doc.session(), slot, parent);
  const bool ok = editor.exec() == QDialog::Accepted;
  if (ok || editor.recordsChanged()) Follow(doc);
  return ok;
}

bool EditPopupList(QWidget* parent, Document& doc, int slot) {
  if (!Granted(doc, secured::kEditPopups)) return false;
  PopupListDialog dialog(doc.session(), slot, parent);
  const bool ok = dialog.exec() == QDialog::Accepted;
  if (ok || dialog.recordsChanged()) Follow(doc);
  return ok;
}

bool ShowSecurityAccess(QWidget* parent, Document& doc) {
  if (!Granted(doc, secured::kDBProperties)) return false;
  SecurityDialog dialog(doc.db(), parent);
  const bool ok = dialog.exec() == QDialog::Accepted;
  if (ok) Follow(doc);
  return ok;
}

}  // namespace cx::gui
