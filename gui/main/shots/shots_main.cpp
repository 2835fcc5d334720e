// cardovex-shots: saves pictures of the program's windows and dialogs, made
// on copies of the sample databases, for the README and for looking at.
//
//   cardovex-shots --samples DIR --out DIR
//   cardovex-shots --icons DIR      (the application icon in its sizes)
#include <QApplication>
#include <QCommandLineParser>
#include <QDir>
#include <QTemporaryDir>
#include <cstdio>

#include "gui/common/icons.h"
#include "gui/main/desktop_session.h"
#include "gui/main/shots/shot_hooks.h"
#include "platform/settings.h"

int main(int argc, char** argv) {
  QApplication app(argc, argv);
  QApplication::setApplicationName(QStringLiteral("Cardovex"));
  QApplication::setWindowIcon(cx::gui::AppIcon());

  QCommandLineParser parser;
  parser.addHelpOption();
  parser.addOption({QStringLiteral("samples"), QStringLiteral("Folder of the sample databases."), QStringLiteral("dir")});
  parser.addOption({QStringLiteral("out"), QStringLiteral("Folder for the pictures."), QStringLiteral("dir")});
  parser.addOption({QStringLiteral("icons"), QStringLiteral("Write the application icon's PNGs."), QStringLiteral("dir")});
  parser.process(app);
  if (parser.isSet(QStringLiteral("icons"))) {
    const QDir dir(parser.value(QStringLiteral("icons")));
    for (int size : {16, 24, 32, 48, 64, 128, 256}) {
      const QString file = dir.filePath(QStringLiteral("cardovex-%1.png").arg(size));
      if (!cx::gui::AppIconImage(size).save(file)) return 1;
      std::printf("%s\n", qPrintable(file));
    }
    return 0;
  }
  if (!parser.isSet(QStringLiteral("samples")) || !parser.isSet(QStringLiteral("out"))) {
    std::fprintf(stderr, "usage: cardovex-shots --samples DIR --out DIR\n");
    return 2;
  }

  QTemporaryDir work;
  if (!work.isValid()) return 1;
  // Settings of their own: pictures never show the user's recent files.
  cx::gui::DesktopSession session(std::make_unique<cx::MemorySettings>(), work.path().toStdString());
  session.ui().SetNativeFileDialogs(false);
  session.Start({});

  cx::gui::ShotContext shots(session, parser.value(QStringLiteral("samples")), work.filePath(QStringLiteral("db")),
                             parser.value(QStringLiteral("out")));
  for (cx::gui::ShotHook hook : cx::gui::kShotHooks) hook(shots);

  for (const QString& file : shots.saved()) std::printf("%s\n", qPrintable(file));
  // Nothing of the scratch copies is kept.
  for (cx::Document* doc = session.workspace().shown(); doc; doc = session.workspace().shown()) {
    doc->db().ClearChanged();
    if (!session.workspace().Close()) break;
  }
  session.Shutdown();
  return shots.saved().isEmpty() ? 1 : 0;
}
