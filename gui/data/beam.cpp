#include "gui/data/beam.h"

#include <QComboBox>
#include <QDialog>
#include <QDialogButtonBox>
#include <QLabel>
#include <QLineEdit>
#include <QMessageBox>
#include <QMetaObject>
#include <QProgressDialog>
#include <QPushButton>
#include <QVBoxLayout>

#include "app/data_dialogs.h"
#include "gui/common/help.h"
#include "gui/common/text.h"
#include "platform/tcp_transport.h"

namespace cx::gui {

// Called on the sending thread: everything is handed to the GUI thread.
class BeamSession::Windows : public obex::BeamWindows {
 public:
  explicit Windows(BeamSession* s) : s_(s) {}
  void ShowDeviceSearch() override { Post([s = s_] { s->ShowSearch(); }); }
  void CloseDeviceSearch() override { Post([s = s_] { s->CloseSearch(); }); }
  void ShowProgress() override { Post([s = s_] { s->ShowProgress(); }); }
  void Progress(size_t sent, size_t total) override {
    Post([s = s_, sent, total] { s->SetProgress(static_cast<qint64>(sent), static_cast<qint64>(total)); });
  }
  void CloseProgress() override { Post([s = s_] { s->CloseProgress(); }); }

 private:
  template <typename F>
  void Post(F f) {
    // Queued onto the session's thread; dropped if the session is gone.
    QMetaObject::invokeMethod(s_, std::move(f), Qt::QueuedConnection);
  }
  BeamSession* s_;
};

// The sender's messages, shown later on the GUI thread; the sender goes on
// at once, as it does after any message.
class BeamSession::PostingUi : public SilentUi {
 public:
  explicit PostingUi(BeamSession* s) : s_(s) {}
  void ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) override {
    ++messages;
    QMetaObject::invokeMethod(
        s_,
        [s = s_, text, caption, icon] {
          if (!s->cancelled_) s->ui_.ShowMessage(text, caption, icon);
        },
        Qt::QueuedConnection);
  }
  std::atomic<int> messages{0};

 private:
  BeamSession* s_;
};

BeamSession::BeamSession(std::unique_ptr<StreamTransport> transport, std::vector<obex::BeamObject> objects,
                         UiPort& ui, QWidget* windowParent, obex::BeamOptions options,
                         std::unique_ptr<QTemporaryDir> scratch)
    : transport_(std::move(transport)),
      objects_(std::move(objects)),
      ui_(ui),
      parent_(windowParent),
      options_(options),
      scratch_(std::move(scratch)),
      windows_(std::make_unique<Windows>(this)),
      postingUi_(std::make_unique<PostingUi>(this)) {
  poll_.setInterval(20);
  connect(&poll_, &QTimer::timeout, this, &BeamSession::Poll);
}

BeamSession::~BeamSession() {
  // The transfer's thread must end before the windows and port it uses.
  if (transfer_) transfer_->GiveUp();
  transfer_.reset();
  delete search_;
  delete progress_;
}

void BeamSession::Start() {
  if (outcome_ != Outcome::Running || transfer_) return;
  StartNext();
}

void BeamSession::StartNext() {
  if (next_ >= objects_.size()) {
    Finish(Outcome::Sent);
    return;
  }
  transfer_ = std::make_unique<obex::BeamTransfer>(*transport_, *postingUi_, *windows_, options_.replyTimeoutMs);
  started_ = std::chrono::steady_clock::now();
  transfer_->Start(objects_[next_++]);
  poll_.start();
}

void BeamSession::Poll() {
  if (!transfer_) return;
  if (transfer_->Wait(std::chrono::milliseconds(0))) {
    const int result = transfer_->result();
    transfer_.reset();
    poll_.stop();
    if (cancelled_) return Finish(Outcome::Cancelled);
    if (result == 0 || postingUi_->messages > 0) return Finish(Outcome::Failed);
    StartNext();
    return;
  }
  if (std::chrono::steady_clock::now() - started_ > options_.wait) {
    transfer_->GiveUp();
    transfer_.reset();  // joins: the give-up ends it at its next poll or packet
    poll_.stop();
    ui_.ShowMessage("The beam did not finish in time.", "Error", MessageIcon::Error);
    Finish(Outcome::TimedOut);
  }
}

void BeamSession::Finish(Outcome outcome) {
  if (outcome_ != Outcome::Running) return;
  outcome_ = outcome;
  CloseSearch();
  CloseProgress();
  emit finished(outcome);
}

void BeamSession::CancelSearch() {
  cancelled_ = true;
  if (transfer_) transfer_->Cancel();
}

void BeamSession::ShowSearch() {
  if (outcome_ != Outcome::Running) return;
  if (!search_) {
    search_ = new QProgressDialog("Looking for a device to beam to...", "Cancel", 0, 0, parent_);
    search_->setObjectName("beamSearchWindow");
    search_->setWindowTitle("Beam");
    search_->setWindowModality(Qt::WindowModal);
    search_->setMinimumDuration(0);
    search_->setAutoReset(false);
    search_->setAutoClose(false);
    connect(search_, &QProgressDialog::canceled, this, &BeamSession::CancelSearch);
  }
  search_->show();
}

void BeamSession::CloseSearch() {
  if (search_) search_->hide();
}

void BeamSession::ShowProgress() {
  if (outcome_ != Outcome::Running) return;
  CloseSearch();
  if (!progress_) {
    progress_ = new QProgressDialog("Beaming...", "Stop", 0, 100, parent_);
    progress_->setObjectName("beamProgressWindow");
    progress_->setWindowTitle("Beam");
    progress_->setWindowModality(Qt::WindowModal);
    progress_->setMinimumDuration(0);
    progress_->setAutoReset(false);
    progress_->setAutoClose(false);
    // Stopping half-way leaves the peer with nothing it keeps; say nothing.
    connect(progress_, &QProgressDialog::canceled, this, [this] {
      cancelled_ = true;
      if (transfer_) transfer_->GiveUp();
    });
  }
  if (objects_.size() > 1) {
    progress_->setLabelText(QString("Beaming part %1 of %2...").arg(next_).arg(objects_.size()));
  }
  progress_->setValue(0);
  progress_->show();
}

void BeamSession::SetProgress(qint64 sent, qint64 total) {
  if (!progress_ || total <= 0) return;
  progress_->setValue(static_cast<int>(sent * 100 / total));
}

void BeamSession::CloseProgress() {
  if (progress_) progress_->hide();
}

std::vector<std::string> ChooseBeamPeers(QWidget* parent, Settings& settings) {
  std::vector<std::string> peers = obex::BeamPeers(settings);
  if (!peers.empty()) return peers;
  const std::string remembered = settings.Get(kRecentBeamPeersSetting).value_or("");
  QDialog dialog(parent);
  dialog.setObjectName("beamPeerDialog");
  dialog.setWindowTitle("Beam To");
  InstallHelpShortcut(&dialog, QStringLiteral("Beam_Dialog"));
  auto* layout = new QVBoxLayout(&dialog);
  layout->addWidget(new QLabel("Computer to beam to (HOST or HOST:PORT):", &dialog));
  auto* peer = new QComboBox(&dialog);
  peer->setObjectName("beamPeer");
  peer->setEditable(true);
  peer->setMinimumWidth(260);
  for (const std::string& p : RememberedPeers(remembered)) peer->addItem(QString::fromStdString(p));
  peer->lineEdit()->setPlaceholderText("for example 192.168.1.20:6500");
  layout->addWidget(peer);
  auto* buttons = new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Cancel, &dialog);
  buttons->button(QDialogButtonBox::Ok)->setText("Beam");
  QObject::connect(buttons, &QDialogButtonBox::accepted, &dialog, &QDialog::accept);
  QObject::connect(buttons, &QDialogButtonBox::rejected, &dialog, &QDialog::reject);
  layout->addWidget(buttons);
  while (dialog.exec() == QDialog::Accepted) {
    const std::string typed = peer->currentText().trimmed().toStdString();
    std::string host;
    int port = 0;
    if (ParseHostPort(typed, kDefaultObexTcpPort, host, port)) {
      settings.Set(kRecentBeamPeersSetting, RememberPeer(remembered, typed));
      return {typed};
    }
    QMessageBox::warning(&dialog, "Beam To",
                         "\"" + QString::fromStdString(typed) + "\" is not a computer's name or address.");
  }
  return {};
}

}  // namespace cx::gui
