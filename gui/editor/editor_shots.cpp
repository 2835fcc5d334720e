// Pictures of the record editor on each sample, the pickers and the image
// editor, for the screenshot program.
#include <QMenu>
#include <memory>

#include "app/image_picture.h"
#include "gui/editor/image_editor_dialog.h"
#include "gui/editor/picker_dialogs.h"
#include "gui/editor/record_editor_dialog.h"
#include "gui/main/desktop_session.h"
#include "gui/main/main_window.h"
#include "gui/main/shots/shot_context.h"

namespace cx::gui {
namespace {

void EditorShot(ShotContext& shots, Document& doc, size_t record, bool viewOnly, const QString& name) {
  RecordEditorDialog editor(doc, record, viewOnly, nullptr, &shots.window());
  editor.resize(540, editor.height());
  shots.Save(&editor, name);
  editor.hide();
}

// A picture to show: a framed cup of coffee, drawn with the pen's lines.
Bytes SamplePicture() {
  Bytes p = NewPicture();
  const int box[][4] = {{4, 4, 155, 4}, {155, 4, 155, 95}, {155, 95, 4, 95}, {4, 95, 4, 4},
                        {50, 40, 110, 40}, {50, 40, 55, 80}, {110, 40, 105, 80}, {55, 80, 105, 80},
                        {110, 48, 122, 48}, {122, 48, 122, 64}, {122, 64, 108, 64},
                        {40, 86, 120, 86}, {65, 30, 62, 18}, {80, 30, 83, 16}, {95, 30, 92, 18}};
  for (const auto& l : box) DrawPictureLine(p, l[0], l[1], l[2], l[3], true);
  return p;
}

}  // namespace

void AddEditorShots(ShotContext& shots) {
  Workspace& workspace = shots.session().workspace();
  QWidget* window = &shots.window();
  const char* names[] = {"Orders", "Contacts"};
  for (const char* sample : names) {
    if (!shots.OpenSample(QString::fromLatin1(sample))) continue;
    Document& doc = *workspace.shown();
    EditorShot(shots, doc, doc.recordAt(0), false, QStringLiteral("editor-") + QString::fromLatin1(sample).toLower());
  }

  // The password-protected sample, read without its open check.
  const QString vaultPath = shots.CopySample(QStringLiteral("Vault"));
  Database vault;
  if (!vaultPath.isEmpty() && vault.Open(vaultPath.toStdString(), workspace.context().ui).ok()) {
    Document doc(workspace.context(), vault);
    doc.RebuildView();
    if (doc.rowCount() > 0) {
      EditorShot(shots, doc, doc.recordAt(0), false, QStringLiteral("editor-vault"));
      EditorShot(shots, doc, doc.recordAt(0), true, QStringLiteral("editor-view-only"));
    }
  }

  if (shots.OpenSample(QStringLiteral("Contacts"))) {
    Document& doc = *workspace.shown();
    const QPoint at = window->mapToGlobal(QPoint(220, 160));
    std::unique_ptr<QMenu> dates(CreateDateMenu(window, true));
    dates->popup(at);
    shots.Save(dates.get(), QStringLiteral("editor-date-menu"));
    dates->hide();
    for (int f = 0; f < format::kFieldCount; ++f) {
      if (doc.db().schema().field[f].type() != FieldType::PopUp) continue;
      std::unique_ptr<QMenu> values(CreatePopupMenu(window, PopupMenuEntries(doc.db(), f, true, false)));
      values->popup(at);
      shots.Save(values.get(), QStringLiteral("editor-popup-menu"));
      values->hide();
      break;
    }
  }

  const Clock& clock = workspace.context().clock;
  CalendarDialog calendar(CalendarDate{2024, 3, 14}, clock, window);
  shots.Save(&calendar, QStringLiteral("editor-choose-date"));
  calendar.hide();
  TimeDialog time(TimeBytes{0, 30, 9, 0}, clock, window);
  shots.Save(&time, QStringLiteral("editor-choose-time"));
  time.hide();
  ImageEditorDialog image(SamplePicture(), false, window);
  shots.Save(&image, QStringLiteral("editor-image"));
  image.hide();
}

}  // namespace cx::gui
