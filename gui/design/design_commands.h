// The design commands of the desktop program, as the main window calls
// them. Each runs the access check its operation needs (a refusal does
// nothing further), shows its dialog and, when something was stored, tells
// the document so the list follows (columns and rows rebuilt, changed mark).
#pragma once

#include "app/document.h"

class QWidget;

namespace cx::gui {

// "DB Properties...": the "DB Properties" check, then "Edit Database".
// True when something was stored.
bool ShowDatabaseProperties(QWidget* parent, Document& doc);

// The design step of "New": "Edit Database" on the database just made,
// without a check (it is the user's own, unprotected). False when the user
// cancelled it.
bool DesignNewDatabase(QWidget* parent, Document& doc);

// "New" as a whole: the workspace's New (with the save decision for the
// database shown), then the design step. A cancelled design step closes the
// new database without a question, so that no file is written and nothing
// stays open. True when a new database is shown.
bool NewDatabase(QWidget* parent, Workspace& workspace);

// "Field Properties" of the heading menu: the "DB Properties" check, then
// "Edit Field" on `slot`.
bool ShowFieldProperties(QWidget* parent, Document& doc, int slot);

// "Edit Popup List" for `slot` from anywhere (the field editor's button
// does the same): the "Edit Popups" check, then the popup list editor.
// True when something was stored (records may have been renumbered by a
// Delete even when the dialog was cancelled; the document hears of it).
bool EditPopupList(QWidget* parent, Document& doc, int slot);

// "Security Access" on its own: the "DB Properties" check first, as on the
// way through "Edit Database".
bool ShowSecurityAccess(QWidget* parent, Document& doc);

}  // namespace cx::gui
