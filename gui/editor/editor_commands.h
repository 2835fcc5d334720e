// The record editor's commands as the main window reaches them: a tap on a
// cell (choose and reassign levels, in-place edits, the editor), a new
// record, the return from a linked level, and undo / redo of record
// changes. One object per main window, made by InstallEditorCommands and
// found again with EditorCommandsOf.
#pragma once

#include <QObject>
#include <QPoint>
#include <optional>
#include <vector>

#include "app/document.h"
#include "app/pickers.h"
#include "app/record_history.h"
#include "platform/settings.h"

class QAction;
class QWidget;

namespace cx::gui {

class EditorCommands : public QObject, private WorkspaceListener {
  Q_OBJECT

 public:
  EditorCommands(QWidget* window, Workspace& workspace);
  ~EditorCommands() override;

  // A tap (or Enter, or a double click) on row `row`, column `column` of
  // the list; `cell` is the cell's top-left corner on the screen, where a
  // chooser opens.
  void OpenRecordAt(int row, int column, const QPoint& cell);
  // The new-record command: the "Add Records" check, then the editor.
  void NewRecord();
  // After a linked level was closed: a chosen value is written into the
  // record the link was followed from, and its editor opens again.
  void ResumeAfterLinkedLevel();

  void Undo();
  void Redo();
  bool CanUndo();
  bool CanRedo();
  QAction* undoAction() const { return undo_; }
  QAction* redoAction() const { return redo_; }

  RecordHistory* HistoryOf(Document* doc);
  // The settings store the editor's beam and print commands read (the
  // session's); null: the user's own.
  void SetSettings(Settings* settings) { settings_ = settings; }
  InPlacePreferences preferences() const;

 private:
  // A level opened from the editor, waiting to be closed.
  struct Pending {
    int level = 0;
    int field = -1;        // the field of the record beneath
    size_t record = 0;     // the record beneath
    LevelMode mode = LevelMode::Browse;
    bool viewOnly = false; // the editor it came from could only show
    bool chosen = false;   // a value was handed back
    uint32_t number = 0;   // Linked: the number chosen
    std::string text;      // DB Popup and Linked: the text chosen
  };

  void RunEditor(size_t record, bool viewOnly, std::optional<size_t> copyFrom = std::nullopt);
  bool Follow(Document& doc, size_t record, int field, bool viewOnly);
  void HandBack(Document& doc, size_t chosen);
  bool InPlace(Document& doc, size_t record, int field, const QPoint& cell);
  void UpdateActions();

  void LevelPopped(int level, Document& shown) override;
  void DocumentClosed() override;
  void DocumentReplaced(Document& shown) override;

  QWidget* window_;
  Workspace& workspace_;
  Settings* settings_ = nullptr;
  RecordHistories histories_;
  std::vector<Pending> pending_;
  QAction* undo_ = nullptr;
  QAction* redo_ = nullptr;
};

// Makes the window's editor commands (with the Edit menu's Undo and Redo
// when the window has a menu bar).
EditorCommands& InstallEditorCommands(QWidget* window, Workspace& workspace);
// The window's editor commands, made on first use.
EditorCommands& EditorCommandsOf(QWidget* window, Workspace& workspace);

}  // namespace cx::gui
