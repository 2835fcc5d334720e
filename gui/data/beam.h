// Beaming from the desktop: the transfer runs on its own thread while the
// GUI thread keeps a device-search window (with Cancel) and a progress
// window, and never waits on the sender. The sender's messages are shown
// on the GUI thread.
#pragma once

#include <QObject>
#include <QPointer>
#include <QProgressDialog>
#include <QTemporaryDir>
#include <QTimer>
#include <atomic>
#include <chrono>
#include <memory>
#include <vector>

#include "infrared/beam_commands.h"
#include "infrared/beam_transfer.h"
#include "platform/settings.h"

class QWidget;

namespace cx::gui {

class BeamSession : public QObject {
  Q_OBJECT
 public:
  enum class Outcome { Running, Sent, Cancelled, Failed, TimedOut };

  // Sends `objects` in order through `transport`. Messages go to `ui` on
  // the GUI thread. `scratch` (may be null) is kept until the session ends:
  // it holds a database written for the beam.
  BeamSession(std::unique_ptr<StreamTransport> transport, std::vector<obex::BeamObject> objects, UiPort& ui,
              QWidget* windowParent, obex::BeamOptions options = {},
              std::unique_ptr<QTemporaryDir> scratch = nullptr);
  ~BeamSession() override;

  void Start();
  Outcome outcome() const { return outcome_; }
  // The device-search window's Cancel: the search stops and nothing is said.
  void CancelSearch();
  QProgressDialog* searchWindow() const { return search_.data(); }
  QProgressDialog* progressWindow() const { return progress_.data(); }

 signals:
  void finished(cx::gui::BeamSession::Outcome outcome);

 private:
  class Windows;
  class PostingUi;
  void StartNext();
  void Poll();
  void Finish(Outcome outcome);
  void ShowSearch();
  void CloseSearch();
  void ShowProgress();
  void SetProgress(qint64 sent, qint64 total);
  void CloseProgress();

  std::unique_ptr<StreamTransport> transport_;
  std::vector<obex::BeamObject> objects_;
  UiPort& ui_;
  QPointer<QWidget> parent_;
  obex::BeamOptions options_;
  std::unique_ptr<QTemporaryDir> scratch_;
  std::unique_ptr<Windows> windows_;
  std::unique_ptr<PostingUi> postingUi_;
  std::unique_ptr<obex::BeamTransfer> transfer_;
  size_t next_ = 0;
  std::chrono::steady_clock::time_point started_;
  QTimer poll_;
  // Children of the window they belong to: they go with it if it closes
  // first.
  QPointer<QProgressDialog> search_;
  QPointer<QProgressDialog> progress_;
  std::atomic<bool> cancelled_{false};
  Outcome outcome_ = Outcome::Running;
};

// The peers a beam tries: the BeamPeers setting when it names any;
// otherwise the user types one (remembered for next time) in a small
// dialog. Empty when the dialog was cancelled.
std::vector<std::string> ChooseBeamPeers(QWidget* parent, Settings& settings);

}  // namespace cx::gui
