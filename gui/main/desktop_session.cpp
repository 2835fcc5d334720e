#include "gui/main/desktop_session.h"

#include <QByteArray>

#include "gui/main/record_list_view.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"
#include "platform/qt/qt_platform.h"

namespace cx::gui {

namespace {
// Where the window was and how large, beside the preferences.
constexpr const char* kGeometryValue = "WindowGeometry";

std::unique_ptr<Settings> OrDesktopSettings(std::unique_ptr<Settings> settings) {
  return settings ? std::move(settings) : OpenDesktopSettings();
}
}  // namespace

DesktopSession::DesktopSession(std::unique_ptr<Settings> settings, std::string dataFolder, LocaleInfo locale)
    : settings_(OrDesktopSettings(std::move(settings))),
      locale_(std::move(locale)),
      preferences_(*settings_),
      recent_(*settings_),
      context_{ui_, locale_, preferences_, recent_,
               dataFolder.empty() ? DataFolder(DesktopDocumentsFolder()) : std::move(dataFolder)} {
  ui_.SetStartFolder(QString::fromStdString(context_.dataFolder));
  workspace_ = std::make_unique<Workspace>(context_);
  window_ = std::make_unique<MainWindow>(*workspace_, ui_);
  window_->SetSettings(settings_.get());
}

bool DesktopSession::Start(const std::vector<std::string>& files, bool showWindow) {
  preferences_.WriteVersion(ProgramVersion());
  // An existing folder is no error; one that cannot be made shows up later
  // as a save that fails, with its message.
  MakeDirectories(context_.dataFolder);
  preferences_.Read();
  if (auto geometry = settings_->Get(kGeometryValue)) {
    window_->restoreGeometry(QByteArray::fromBase64(QByteArray::fromStdString(*geometry)));
  }
  if (showWindow) window_->show();
  const bool open = workspace_->Start(files);
  window_->RebuildList();
  window_->list()->setFocus();
  return open;
}

void DesktopSession::Shutdown() {
  if (shutDown_) return;
  shutDown_ = true;
  workspace_->Shutdown();
  preferences_.Write();
  settings_->Set(kGeometryValue, window_->saveGeometry().toBase64().toStdString());
}

}  // namespace cx::gui
