// The screenshot program's toolbox. Each GUI module adds one function
//
//   void AddXxxShots(ShotContext& shots);
//
// to the list in shot_hooks.h; it opens its windows and dialogs on copies of
// the sample databases and saves each picture with shots.Save(widget, name).
#pragma once

#include <QString>
#include <QStringList>
#include <functional>

class QWidget;

namespace cx::gui {

class DesktopSession;
class MainWindow;

class ShotContext {
 public:
  ShotContext(DesktopSession& session, QString samplesDir, QString workDir, QString outDir);

  DesktopSession& session() { return session_; }
  MainWindow& window();

  // A fresh copy of a sample ("Contacts") in the scratch folder; its path.
  QString CopySample(const QString& name);
  // Opens a fresh copy of a sample in the main window (closing what was
  // open without saving it). False when it did not open.
  bool OpenSample(const QString& name);

  // Shows `widget` (if it is not shown), lets it lay itself out and paint,
  // and saves it as <outDir>/<name>.png. Works for dialogs too: they are
  // shown without a modal loop.
  void Save(QWidget* widget, const QString& name);
  // Lets pending events run (layouts, paints, timers) for a moment.
  static void Settle(int milliseconds = 60);

  const QStringList& saved() const { return saved_; }
  const QString& outDir() const { return outDir_; }

 private:
  DesktopSession& session_;
  QString samplesDir_;
  QString workDir_;
  QString outDir_;
  QStringList saved_;
};

}  // namespace cx::gui
