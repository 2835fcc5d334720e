#include "gui/main/shots/shot_context.h"

#include <QApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QWidget>
#include <cstdio>

#include "gui/main/desktop_session.h"

namespace cx::gui {

ShotContext::ShotContext(DesktopSession& session, QString samplesDir, QString workDir, QString outDir)
    : session_(session), samplesDir_(std::move(samplesDir)), workDir_(std::move(workDir)), outDir_(std::move(outDir)) {
  QDir().mkpath(outDir_);
  QDir().mkpath(workDir_);
}

MainWindow& ShotContext::window() { return session_.window(); }

QString ShotContext::CopySample(const QString& name) {
  const QString from = QDir(samplesDir_).filePath(name + QStringLiteral(".PDB"));
  const QString to = QDir(workDir_).filePath(name + QStringLiteral(".PDB"));
  QFile::remove(to);
  if (!QFile::copy(from, to)) {
    std::fprintf(stderr, "cannot copy %s\n", qPrintable(from));
    return QString();
  }
  QFile(to).setPermissions(QFile::ReadOwner | QFile::WriteOwner);
  return to;
}

bool ShotContext::OpenSample(const QString& name) {
  Workspace& workspace = session_.workspace();
  // Whatever the last module left open goes without a question.
  while (Document* doc = workspace.shown()) {
    doc->db().ClearChanged();
    if (!workspace.Close()) break;
  }
  const QString path = CopySample(name);
  if (path.isEmpty()) return false;
  const bool ok = workspace.Open(path.toStdString());
  window().RebuildList();
  Settle();
  return ok;
}

void ShotContext::Settle(int milliseconds) {
  QElapsedTimer timer;
  timer.start();
  while (timer.elapsed() < milliseconds) {
    QApplication::processEvents(QEventLoop::AllEvents, 10);
  }
}

void ShotContext::Save(QWidget* widget, const QString& name) {
  if (!widget->isVisible()) widget->show();
  Settle();
  const QString file = QDir(outDir_).filePath(name + QStringLiteral(".png"));
  if (!widget->grab().save(file)) {
    std::fprintf(stderr, "cannot save %s\n", qPrintable(file));
    return;
  }
  saved_ << file;
}

}  // namespace cx::gui
