// Pictures of the main window, its own dialogs and the help window.
#include <QHeaderView>
#include <QMenu>
#include <QWidget>
#include <memory>

#include "gui/common/help.h"
#include "gui/main/delete_records_dialog.h"
#include "gui/main/desktop_session.h"
#include "gui/main/main_window.h"
#include "gui/main/preferences_dialog.h"
#include "gui/main/record_list_view.h"
#include "gui/main/shots/shot_hooks.h"
#include "gui/main/start_dialog.h"

namespace cx::gui {

void AddMainShots(ShotContext& shots) {
  MainWindow& window = shots.window();
  window.resize(860, 470);

  if (shots.OpenSample(QStringLiteral("Orders"))) shots.Save(&window, QStringLiteral("main-window-orders"));
  if (shots.OpenSample(QStringLiteral("Contacts"))) {
    window.list()->SelectRow(1);
    shots.Save(&window, QStringLiteral("main-window"));

    std::unique_ptr<QMenu> menu(MainWindow::CreateHeadingMenu(&window));
    QHeaderView* header = window.list()->horizontalHeader();
    menu->popup(header->mapToGlobal(QPoint(header->sectionViewportPosition(1), header->height())));
    shots.Save(menu.get(), QStringLiteral("heading-menu"));
    menu->hide();
  }

  StartDialog start(shots.session().recent().StartList(), &window);
  shots.Save(&start, QStringLiteral("start-dialog"));
  start.hide();

  PreferencesDialog preferences(shots.session().preferences().flags, &window);
  shots.Save(&preferences, QStringLiteral("preferences"));
  preferences.hide();

  DeleteRecordsDialog remove(&window);
  shots.Save(&remove, QStringLiteral("delete-records"));
  remove.hide();

  std::unique_ptr<QDialog> about(MainWindow::CreateAboutBox(&window));
  shots.Save(about.get(), QStringLiteral("about"));
  about->hide();

  ShowHelp(&window, QString::fromLatin1(kHelpContents));
  if (auto* help = window.findChild<QWidget*>(QStringLiteral("helpWindow"))) {
    shots.Save(help, QStringLiteral("help"));
    help->hide();
  }
}

}  // namespace cx::gui
