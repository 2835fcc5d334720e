// "Edit Record": one row per shown field, in display order, each with the
// control its type calls for, in a scroll area; the Record and Edit menus;
// OK, Cancel, and Page Up / Page Down to the neighbouring records in view.
// The dialog only shows and collects: the values live in a RecordForm and
// are written by app/record_commit.h.
#pragma once

#include <QDialog>
#include <QPointer>
#include <map>
#include <memory>
#include <optional>

#include "app/document.h"
#include "app/record_commit.h"
#include "app/record_form.h"
#include "app/record_history.h"
#include "platform/settings.h"

class QAction;
class QGridLayout;
class QLabel;
class QScrollArea;

namespace cx::gui {

class RecordEditorDialog : public QDialog {
  Q_OBJECT

 public:
  // Why the dialog closed.
  enum class Exit {
    Cancelled,
    Saved,       // OK (the record was written, or needed no writing)
    Deleted,     // "Delete Record"
    Moved,       // "Move Record To...": the record is in another database now
    FollowLink,  // a Link, Linked or DB Popup button: see linkField()
  };

  // The editor on record `record` of `doc` (kNewRecordIndex for a new one,
  // then `copyFrom` may name the record whose values it starts with). With
  // `viewOnly` nothing can be changed and closing writes nothing.
  RecordEditorDialog(Document& doc, size_t record, bool viewOnly, RecordHistory* history,
                     QWidget* parent = nullptr, std::optional<size_t> copyFrom = std::nullopt);
  ~RecordEditorDialog() override;

  // The settings store "Beam Record..." reads; null: the user's own.
  void SetSettings(Settings* settings) { settings_ = settings; }

  Exit exitKind() const { return exit_; }
  // "Edit Popup List" from a Pop-Up field's list (the "Edit Popups" check
  // runs first).
  void EditPopups(int field);
  // The field whose button was pressed (FollowLink).
  int linkField() const { return linkField_; }
  // The record the editor stands on (after saving: where it went).
  size_t record() const { return form_->index(); }
  RecordForm& form() { return *form_; }
  bool viewOnly() const { return viewOnly_; }

  // Writes the edits as OK does; false when saving failed (the message has
  // been shown) or the editor is view-only.
  bool Apply();
  // Moves to the previous (-1) or next (+1) record in view, keeping the
  // edits as OK keeps them. False when there is none.
  bool Step(int delta);
  // The control of a field's row (tests look values up by field).
  QWidget* ControlFor(int field) const;
  QAction* action(const QString& text) const;

 protected:
  void keyPressEvent(QKeyEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;
  void resizeEvent(QResizeEvent* event) override;

 private:
  void BuildMenus();
  void Load(size_t record, std::optional<size_t> copyFrom);
  void BuildRows();
  void AddRow(int field, int row);
  QWidget* MakeTextBox(int field, int height);
  QWidget* MakeNumberBox(int field);
  QWidget* MakePopupBox(int field);
  QWidget* MakeDateButton(int field);
  QWidget* MakeTimeButton(int field);
  QWidget* MakeImageButton(int field);
  QWidget* MakeLinkButton(int field);
  void UpdateLabelWidths();
  void UpdateTitle();
  void FollowLink(int field);

  // Record menu.
  void NewRecord();
  void CopyToNew();
  void Transfer(bool move);
  void ExportRecord();
  void PrintRecord();
  void BeamRecord();
  void DeleteRecord();
  void ChangeFieldWidth(bool increase);
  // Edit menu: the focused text box does the work.
  void EditCommand(const char* method);

  Document& doc_;
  RecordHistory* history_;
  Settings* settings_ = nullptr;
  bool viewOnly_;
  std::unique_ptr<RecordForm> form_;
  Exit exit_ = Exit::Cancelled;
  int linkField_ = -1;

  QScrollArea* scroll_ = nullptr;
  QWidget* rows_ = nullptr;
  QGridLayout* grid_ = nullptr;
  std::map<int, QWidget*> controls_;
  std::vector<QWidget*> labels_;
  std::map<QString, QAction*> actions_;
};

}  // namespace cx::gui
