// Shared by the data dialog tests: sample copies, the command-line tool,
// and answering the modal dialogs a command opens.
#pragma once

#include <QApplication>
#include <QDialog>
#include <QFile>
#include <QProcess>
#include <QTimer>
#include <QtTest>
#include <functional>
#include <string>

namespace cx::testing {

// Copies a sample database into `folder`; the copy's path.
inline std::string CopySample(const std::string& name, const std::string& folder, const std::string& as = "") {
  const QString target = QString::fromStdString(folder + "/" + (as.empty() ? name : as) + ".PDB");
  QFile::remove(target);
  QFile::copy(QString(CARDOVEX_SAMPLE_DIR) + "/" + QString::fromStdString(name) + ".PDB", target);
  QFile::setPermissions(target, QFile::ReadOwner | QFile::WriteOwner);
  return target.toStdString();
}

// Runs the command-line tool; its standard output, or a failed test.
inline QByteArray RunCli(const QStringList& args, int expectedExit = 0) {
  QProcess p;
  p.start(CARDOVEX_CLI, args);
  if (!p.waitForFinished(30000)) {
    p.kill();
    p.waitForFinished(1000);
    return "<timeout>";
  }
  if (p.exitCode() != expectedExit) {
    qWarning() << "cardovex-cli" << args << "exited" << p.exitCode() << p.readAllStandardError();
  }
  return p.readAllStandardOutput();
}

inline QByteArray ReadAll(const std::string& path) {
  QFile f(QString::fromStdString(path));
  return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray("<missing>");
}

// Answers the next modal dialogs in turn: each step gets the active modal
// widget once one is up. Steps not reached within a few seconds are
// dropped, so a dialog that never opens cannot hang the test.
class ModalAnswers : public QObject {
 public:
  explicit ModalAnswers(std::vector<std::function<void(QWidget*)>> steps) : steps_(std::move(steps)) {
    timer_.setInterval(10);
    QObject::connect(&timer_, &QTimer::timeout, this, [this] { Tick(); });
    timer_.start();
  }
  bool allAnswered() const { return next_ >= steps_.size(); }

 private:
  void Tick() {
    if (++ticks_ > 500 || allAnswered()) {
      timer_.stop();
      return;
    }
    QWidget* modal = QApplication::activeModalWidget();
    if (!modal || modal->property("answeredByTest").toBool()) return;
    modal->setProperty("answeredByTest", true);
    steps_[next_++](modal);
  }
  std::vector<std::function<void(QWidget*)>> steps_;
  size_t next_ = 0;
  int ticks_ = 0;
  QTimer timer_;
};

inline void Reject(QWidget* w) {
  if (auto* d = qobject_cast<QDialog*>(w)) d->reject();
}

}  // namespace cx::testing
