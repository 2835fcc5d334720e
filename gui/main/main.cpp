// cardovex: the desktop application.
#include <QApplication>
#include <QSocketNotifier>
#include <QTimer>
#include <csignal>
#include <sys/socket.h>
#include <unistd.h>

#include "gui/common/icons.h"
#include "gui/main/desktop_session.h"
#include "platform/qt/qt_platform.h"

namespace {

// A logout or a `kill` ends the program as closing its window does: the
// shutdown's silent save keeps unsaved changes. The handler only writes a
// byte; the event loop does the rest.
int termination[2] = {-1, -1};

void OnTerminate(int) {
  const char byte = 1;
  [[maybe_unused]] const ssize_t n = ::write(termination[0], &byte, 1);
}

void QuitOnTermination(QApplication& app) {
  if (::socketpair(AF_UNIX, SOCK_STREAM, 0, termination) != 0) return;
  auto* notifier = new QSocketNotifier(termination[1], QSocketNotifier::Read, &app);
  QObject::connect(notifier, &QSocketNotifier::activated, &app, [notifier] {
    notifier->setEnabled(false);
    QApplication::quit();
  });
  struct sigaction action {};
  action.sa_handler = OnTerminate;
  sigemptyset(&action.sa_mask);
  action.sa_flags = SA_RESTART;
  for (int sig : {SIGTERM, SIGINT, SIGHUP}) sigaction(sig, &action, nullptr);
}

}  // namespace

int main(int argc, char** argv) {
  QApplication app(argc, argv);
  QApplication::setOrganizationName(QStringLiteral("Cardovex"));
  QApplication::setApplicationName(QStringLiteral("Cardovex"));
  QApplication::setApplicationDisplayName(QStringLiteral("Cardovex"));
  QApplication::setDesktopFileName(QStringLiteral("io.github.cardovex.Cardovex"));
  QApplication::setWindowIcon(cx::gui::AppIcon());
  QuitOnTermination(app);

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
