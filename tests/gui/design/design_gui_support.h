// Helpers of the design dialogs' widget tests: answering modal dialogs from
// a timer, copies of the sample databases, the command-line tool, and file
// comparison that allows for the save's time stamp.
#pragma once

#include <QAbstractButton>
#include <QApplication>
#include <QDialog>
#include <QDialogButtonBox>
#include <QFile>
#include <QMessageBox>
#include <QProcess>
#include <QPushButton>
#include <QTimer>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace cx::testing {

// Runs `act` on the next modal window whose objectName is `name` (any
// message box when `name` is "QMessageBox") once it shows. Polls every
// 10 ms and gives up after 5 s, so a dialog that never comes cannot hang.
inline void OnModal(const QString& name, std::function<void(QWidget*)> act) {
  auto* timer = new QTimer(qApp);
  timer->setObjectName(QStringLiteral("modalWatcher"));
  auto ticks = std::make_shared<int>(0);
  QObject::connect(timer, &QTimer::timeout, timer, [timer, ticks, name, act] {
    QWidget* w = QApplication::activeModalWidget();
    const bool match =
        w && w->isVisible() &&
        (name == QLatin1String("QMessageBox") ? qobject_cast<QMessageBox*>(w) != nullptr
                                              : w->objectName() == name);
    if (match || ++*ticks > 500) {
      timer->stop();
      timer->deleteLater();
      if (match) act(w);
    }
  });
  timer->start(10);
}

// Drops the watchers whose dialog never came (a refused command), so that
// none of them acts on a later test's dialog.
inline void StopModalWatchers() {
  for (QTimer* t : qApp->findChildren<QTimer*>(QStringLiteral("modalWatcher"),
                                               Qt::FindDirectChildrenOnly)) {
    t->stop();
    delete t;
  }
}

// Presses a standard button of a dialog's button box.
inline void Press(QWidget* dialog, QDialogButtonBox::StandardButton which) {
  for (auto* box : dialog->findChildren<QDialogButtonBox*>()) {
    if (QPushButton* b = box->button(which)) {
      b->click();
      return;
    }
  }
  if (auto* message = qobject_cast<QMessageBox*>(dialog)) {
    if (QAbstractButton* b = message->button(static_cast<QMessageBox::StandardButton>(which))) {
      b->click();
    }
  }
}

inline QByteArray ReadAll(const QString& path) {
  QFile f(path);
  return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

// Two saved databases are the same apart from the header's modification
// date (bytes 40 to 43) and modification number (48 to 51).
inline bool SameButStamp(const QString& a, const QString& b) {
  QByteArray x = ReadAll(a), y = ReadAll(b);
  if (x.isEmpty() || x.size() != y.size() || x.size() < 52) return false;
  for (int i : {40, 41, 42, 43, 48, 49, 50, 51}) x[i] = y[i] = 0;
  return x == y;
}

inline QString Sample(const char* name) {
  return QStringLiteral(CARDOVEX_SAMPLE_DIR "/") + QLatin1String(name) + QStringLiteral(".PDB");
}

inline bool CopySample(const char* name, const QString& to) {
  QFile::remove(to);
  return QFile::copy(Sample(name), to) &&
         QFile::setPermissions(to, QFileDevice::ReadOwner | QFileDevice::WriteOwner);
}

struct CliResult {
  int exitCode = -1;
  QString out;
  QString err;
};

// The command-line tool on the given arguments; bounded by a time-out.
inline CliResult RunCli(const QStringList& args) {
  QProcess p;
  p.start(QStringLiteral(CARDOVEX_CLI), args);
  CliResult r;
  if (!p.waitForFinished(30000)) {
    p.kill();
    p.waitForFinished(5000);
    return r;
  }
  r.exitCode = p.exitStatus() == QProcess::NormalExit ? p.exitCode() : -1;
  r.out = QString::fromUtf8(p.readAllStandardOutput());
  r.err = QString::fromUtf8(p.readAllStandardError());
  return r;
}

}  // namespace cx::testing
