// Pictures of the design dialogs for the screenshot program and the help.
#include <QComboBox>
#include <QLineEdit>
#include <QListWidget>
#include <QPlainTextEdit>

#include "gui/design/author_dialog.h"
#include "gui/design/edit_database_dialog.h"
#include "gui/design/field_editor_dialog.h"
#include "gui/design/field_order_dialog.h"
#include "gui/design/popup_list_dialog.h"
#include "gui/design/security_dialog.h"
#include "gui/main/desktop_session.h"
#include "gui/main/main_window.h"
#include "gui/main/shots/shot_context.h"

namespace cx::gui {
namespace {

void FieldShot(ShotContext& shots, Document& doc, int slot, const QString& name) {
  FieldEditorDialog editor(doc.session(), slot, &shots.window());
  shots.Save(&editor, name);
  editor.hide();
}

}  // namespace

void AddDesignShots(ShotContext& shots) {
  Workspace& workspace = shots.session().workspace();
  QWidget* window = &shots.window();

  if (shots.OpenSample(QStringLiteral("Contacts"))) {
    Document& doc = *workspace.shown();
    {
      EditDatabaseDialog dialog(doc.session(), window);
      dialog.fieldList()->setCurrentRow(3);
      shots.Save(&dialog, QStringLiteral("design-edit-database"));
      dialog.hide();
    }
    FieldShot(shots, doc, 0, QStringLiteral("design-edit-field-text"));
    FieldShot(shots, doc, 3, QStringLiteral("design-edit-field-popup"));
    FieldShot(shots, doc, 6, QStringLiteral("design-edit-field-link"));
    {
      PopupListDialog dialog(doc.session(), 3, window);
      dialog.list()->setCurrentRow(1);
      shots.Save(&dialog, QStringLiteral("design-edit-popup-list"));
      dialog.hide();
      EditPopupDialog prompt(doc.context().ui, QStringLiteral("Neighbours"), window);
      shots.Save(&prompt, QStringLiteral("design-edit-popup"));
      prompt.hide();
    }
    {
      AuthorDialog dialog(doc.db(), window);
      dialog.authorEdit()->setText(QStringLiteral("Ann Example"));
      dialog.commentsEdit()->setPlainText(QStringLiteral("Friends, family and work contacts."));
      shots.Save(&dialog, QStringLiteral("design-author"));
      dialog.hide();
    }
    {
      FieldOrderDialog dialog(doc.db(), window);
      dialog.list()->setCurrentRow(2);
      shots.Save(&dialog, QStringLiteral("design-field-order"));
      dialog.hide();
    }
    {
      SecurityDialog dialog(doc.db(), window);
      dialog.levelList(0)->setCurrentIndex(1);
      dialog.levelList(2)->setCurrentIndex(3);
      dialog.levelList(4)->setCurrentIndex(1);
      shots.Save(&dialog, QStringLiteral("design-security"));
      dialog.hide();
    }
  }

  if (shots.OpenSample(QStringLiteral("Orders"))) {
    Document& doc = *workspace.shown();
    FieldShot(shots, doc, 6, QStringLiteral("design-edit-field-calculated"));
    FieldShot(shots, doc, 9, QStringLiteral("design-edit-field-db-popup"));
  }
}

}  // namespace cx::gui
