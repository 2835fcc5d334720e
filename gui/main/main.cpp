// cardovex: the desktop application.
#include <QApplication>
#include <QTimer>

#include "gui/common/icons.h"
#include "gui/main/desktop_session.h"
#include "platform/qt/qt_platform.h"

int main(int argc, char** argv) {
  QApplication app(argc, argv);
  QApplication::setOrganizationName(QStringLiteral("Cardovex"));
  QApplication::setApplicationName(QStringLiteral("Cardovex"));
  QApplication::setApplicationDisplayName(QStringLiteral("Cardovex"));
  QApplication::setDesktopFileName(QStringLiteral("io.github.cardovex.Cardovex"));
  QApplication::setWindowIcon(cx::gui::AppIcon());

  std::vector<std::string> files;
  const QStringList args = QApplication::arguments();
  for (qsizetype i = 1; i < args.size(); ++i) files.push_back(args[i].toStdString());

  cx::gui::DesktopSession session(nullptr, "", cx::SystemLocaleInfo());
  if (!session.Start(files)) {
    // The window first, so the start dialog has something to stand on.
    QTimer::singleShot(0, &session.window(), [&session] { session.window().ShowStartDialog(); });
  }
  const int code = app.exec();
  session.Shutdown();
  return code;
}
