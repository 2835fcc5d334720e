// "Receive...": listens for beamed databases and records while the user
// wants it. The listener runs on its own thread; each arriving object is
// handed to the GUI thread, which asks the user and stores or inserts it.
#pragma once

#include <QDialog>
#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <thread>

#include "engine/receive.h"
#include "infrared/obex_server.h"
#include "ops/session.h"
#include "platform/settings.h"
#include "platform/transport.h"

class QLabel;
class QLineEdit;
class QPlainTextEdit;
class QPushButton;

namespace cx::gui {

class ReceiveWindow : public QDialog {
  Q_OBJECT
 public:
  // `shown` gives the database on screen (null when none); `viewChanged`
  // is told when received records went into it. `transport` is TCP unless
  // a test gives another.
  ReceiveWindow(Settings& settings, std::string dataFolder, UiPort& ui, std::function<DataSession*()> shown,
                std::function<void()> viewChanged, QWidget* parent = nullptr,
                std::unique_ptr<StreamTransport> transport = nullptr);
  ~ReceiveWindow() override;

  // Starts listening at the address box's address (remembered in the
  // ReceiveAddress setting); false after saying why not.
  bool StartListening();
  void StopListening();
  bool listening() const { return thread_.joinable(); }
  // The address listened on ("127.0.0.1:40123"), once the listener is up.
  QString listeningAddress() const { return actual_; }
  void setAddress(const QString& address);
  QString log() const;

 signals:
  void listeningStarted(const QString& address);
  void objectHandled(const QString& line);
  void listeningStopped();

 protected:
  void closeEvent(QCloseEvent* event) override;

 private:
  class Sink;
  class Hooks;
  class PeerNaming;
  uint8_t Handle(obex::ReceivedObject& object);
  void ListenerEnded(int generation, const std::string& error);
  void AddLine(const QString& line);
  void UpdateControls();

  Settings& settings_;
  std::string dataFolder_;
  UiPort& ui_;
  std::function<DataSession*()> shown_;
  std::function<void()> viewChanged_;
  std::unique_ptr<StreamTransport> transport_;
  std::unique_ptr<PeerNaming> peers_;
  std::unique_ptr<Sink> sink_;
  std::atomic<bool> stop_{false};
  std::thread thread_;
  int generation_ = 0;
  QString actual_;
  QLineEdit* address_;
  QLabel* state_;
  QPushButton* toggle_;
  QPlainTextEdit* log_;
};

}  // namespace cx::gui
