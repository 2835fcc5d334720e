// Small pieces the data dialogs share: file-type lists in
// the desktop's form, and the target of a command (the open database and
// what to tell when its view changed).
#pragma once

#include <QGuiApplication>
#include <QString>
#include <QWidget>  // qt_ui_port.h holds a QPointer<QWidget>
#include <functional>
#include <string>
#include <vector>

#include "gui/common/qt_ui_port.h"  // WaitCursor
#include "ops/database_settings.h"
#include "ops/links.h"
#include "ops/session.h"


namespace cx::gui {

// "Text Files (*.txt)|*.txt|All Files (*.*)|*.*||" as a file dialog's
// filter ("Text Files (*.txt);;All Files (*)"); extensions match either case.
QString DesktopFileFilter(const std::string& handheldFilter);

// What a data command works on. `viewChanged` is told after records, their
// order or the view changed (the list redraws); `columns` when the field
// layout may differ too.
struct DataTarget {
  explicit DataTarget(DataSession& s, std::function<void()> changed = {}, std::string dataFolder = {})
      : session(s), viewChanged(std::move(changed)), folder(std::move(dataFolder)) {}

  DataSession& session;
  std::function<void()> viewChanged;
  // The folder new files are offered in (the data folder).
  std::string folder;
  // The record the editor or the list's selection stands on.
  size_t current = 0;
  // Selects and scrolls to a find hit (record index, list column).
  std::function<void(int record, int column)> showHit;
  // A database already open at `path` (the view levels), or null.
  std::function<Database*(const std::string& path)> findOpen;
  // The link services of the document, when it has its own (they know the
  // databases open at other levels); otherwise made from `findOpen`.
  std::function<LinkServices()> linkServices;
  // Runs a search through the document, which selects the hit; without
  // it the search runs on the session and `showHit` is told.
  std::function<int(const SearchSettings&)> find;

  void Changed() const {
    if (viewChanged) viewChanged();
  }
};

// A modal message box on the GUI thread, captions as the engine writes
// them (8-bit text).
void ShowBox(QWidget* parent, const std::string& text, const std::string& caption, bool error);

// Text about to be written to `path`: true when that destroys no database
// (of this kind, or one of `inputs`), or when the user said to write anyway.
bool ConfirmTextTarget(QWidget* parent, const std::string& path, const std::vector<std::string>& inputs);

}  // namespace cx::gui
