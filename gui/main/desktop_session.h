// Everything one run of the desktop program holds, made in start-up order:
// the settings store, the regional settings, the preferences and recent
// files, the user-interface port, the workspace and the main window. The
// executable, the screenshot program and the widget tests all start the
// program through this one object.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "app/document.h"
#include "app/preferences.h"
#include "gui/common/qt_ui_port.h"
#include "gui/main/main_window.h"
#include "platform/locale_info.h"
#include "platform/settings.h"

namespace cx::gui {

class DesktopSession {
 public:
  // `settings` null: the user's own settings store. `dataFolder` empty: the
  // documents folder's "Cardovex".
  explicit DesktopSession(std::unique_ptr<Settings> settings = nullptr, std::string dataFolder = "",
                          LocaleInfo locale = LocaleInfo());

  // Start-up: the data folder made, the version written, the preferences
  // read, the window shown; then the files of the command line (the first
  // opens, the rest join the recent list) or the file used last. Returns
  // true when a database is open (otherwise the caller may offer the start
  // dialog).
  bool Start(const std::vector<std::string>& files, bool showWindow = true);
  // The end: the shown database closed with the silent save decision, the
  // preferences written, every level released.
  void Shutdown();

  Settings& settings() { return *settings_; }
  Preferences& preferences() { return preferences_; }
  RecentFiles& recent() { return recent_; }
  QtUiPort& ui() { return ui_; }
  AppContext& context() { return context_; }
  Workspace& workspace() { return *workspace_; }
  MainWindow& window() { return *window_; }
  const std::string& dataFolder() const { return context_.dataFolder; }

 private:
  std::unique_ptr<Settings> settings_;
  LocaleInfo locale_;
  Preferences preferences_;
  RecentFiles recent_;
  QtUiPort ui_;
  AppContext context_;
  std::unique_ptr<Workspace> workspace_;
  std::unique_ptr<MainWindow> window_;
  bool shutDown_ = false;
};

}  // namespace cx::gui
