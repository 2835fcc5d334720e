#include "gui/data/receive_window.h"

#include <QCloseEvent>
#include <QFormLayout>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QMessageBox>
#include <QMetaObject>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QVBoxLayout>
#include <condition_variable>
#include <mutex>

#include "gui/common/help.h"
#include "app/data_dialogs.h"
#include "design/receive_access.h"
#include "design/security.h"
#include "infrared/beam_commands.h"
#include "infrared/obex_format.h"
#include "infrared/receive_store.h"
#include "infrared/receiver.h"
#include "ops/calc.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "platform/tcp_transport.h"

namespace cx::gui {

// Remembers who the listener is talking to, so that the questions about
// what arrives can name the sender.
class ReceiveWindow::PeerNaming : public StreamTransport {
 public:
  explicit PeerNaming(StreamTransport& inner) : inner_(inner) {}
  int Open() override { return inner_.Open(); }
  int FindDevices(std::vector<std::string>& devices) override { return inner_.FindDevices(devices); }
  std::unique_ptr<StreamConnection> Connect(const std::string& device, int& error) override {
    return inner_.Connect(device, error);
  }
  std::unique_ptr<StreamListener> Listen(const std::string& address, int& error) override {
    auto listener = inner_.Listen(address, error);
    return listener ? std::make_unique<Listener>(std::move(listener), *this) : nullptr;
  }
  std::string peer() const {
    std::lock_guard<std::mutex> lock(mutex_);
    return peer_;
  }

 private:
  class Listener : public StreamListener {
   public:
    Listener(std::unique_ptr<StreamListener> inner, PeerNaming& owner) : inner_(std::move(inner)), owner_(owner) {}
    std::unique_ptr<StreamConnection> Accept(int timeoutMs, int& error) override {
      auto connection = inner_->Accept(timeoutMs, error);
      if (connection) {
        std::lock_guard<std::mutex> lock(owner_.mutex_);
        owner_.peer_ = connection->peer();
      }
      return connection;
    }
    std::string address() const override { return inner_->address(); }

   private:
    std::unique_ptr<StreamListener> inner_;
    PeerNaming& owner_;
  };

  StreamTransport& inner_;
  mutable std::mutex mutex_;
  std::string peer_;
};

// The program's port, with each question saying which computer sent what
// it asks about.
class FromPeerUi : public ForwardingUi {
 public:
  FromPeerUi(UiPort& inner, std::string peer) : ForwardingUi(inner), peer_(std::move(peer)) {}
  bool AskYesNo(const std::string& text, const std::string& caption) override {
    return ForwardingUi::AskYesNo(From() + text, caption);
  }
  Answer AskYesNoCancel(const std::string& text, const std::string& caption) override {
    return ForwardingUi::AskYesNoCancel(From() + text, caption);
  }

 private:
  std::string From() const {
    std::string host;
    int port = 0;
    if (peer_.empty()) return std::string();
    if (!ParseHostPort(peer_, 0, host, port)) host = peer_;
    return "From " + host + ":\n";
  }
  std::string peer_;
};

// Runs on the listener's thread: each object waits there while the GUI
// thread handles it, so the listener never touches a database itself.
class ReceiveWindow::Sink : public obex::ObjectSink {
 public:
  Sink(ReceiveWindow* w, const std::atomic<bool>& stop) : w_(w), stop_(stop) {}

  uint8_t Deliver(obex::ReceivedObject& object) override {
    struct State {
      std::mutex mutex;
      std::condition_variable cv;
      bool done = false;
      uint8_t code = obex::kInternalError;
      obex::ReceivedObject object;
    };
    auto state = std::make_shared<State>();
    state->object = object;
    QMetaObject::invokeMethod(
        w_,
        [w = w_, state] {
          const uint8_t code = w->Handle(state->object);
          std::lock_guard<std::mutex> lock(state->mutex);
          state->code = code;
          state->done = true;
          state->cv.notify_all();
        },
        Qt::QueuedConnection);
    std::unique_lock<std::mutex> lock(state->mutex);
    // Waiting in slices: a stop while the user is still being asked must
    // not leave the GUI thread joining a thread that waits for it.
    while (!state->cv.wait_for(lock, std::chrono::milliseconds(50), [&] { return state->done; })) {
      if (stop_) return obex::kInternalError;
    }
    return state->code;
  }

 private:
  ReceiveWindow* w_;
  const std::atomic<bool>& stop_;
};

// The follow-up steps of the database on screen. The access checks are
// the shared ones, the same as the command line's receive makes.
class ReceiveWindow::Hooks : public AccessCheckedReceiveHooks {
 public:
  Hooks(DataSession* session, const std::function<void()>& viewChanged)
      : session_(session), viewChanged_(viewChanged) {}
  void AfterInsertActive(Database& db, size_t position) override {
    if (!session_ || &session_->db != &db) return;
    const size_t placed = RepositionRecord(db, position);
    RecalculateAfterMove(*session_, position, placed);
    session_->view = RebuildView(db, session_->Link());
    if (viewChanged_) viewChanged_();
  }

 private:
  DataSession* session_;
  const std::function<void()>& viewChanged_;
};

ReceiveWindow::ReceiveWindow(Settings& settings, std::string dataFolder, UiPort& ui,
                             std::function<DataSession*()> shown, std::function<void()> viewChanged,
                             QWidget* parent, std::unique_ptr<StreamTransport> transport)
    : QDialog(parent),
      settings_(settings),
      dataFolder_(std::move(dataFolder)),
      ui_(ui),
      shown_(std::move(shown)),
      viewChanged_(std::move(viewChanged)),
      transport_(transport ? std::move(transport) : std::make_unique<TcpTransport>(std::vector<std::string>{})),
      peers_(std::make_unique<PeerNaming>(*transport_)),
      sink_(std::make_unique<Sink>(this, stop_)) {
  setObjectName("receiveWindow");
  setWindowTitle("Receive");
  InstallHelpShortcut(this, QStringLiteral("Receive_Window"));
  auto* layout = new QVBoxLayout(this);
  auto* form = new QFormLayout;
  address_ = new QLineEdit(this);
  address_->setObjectName("receiveAddress");
  address_->setText(QString::fromStdString(ReceiveAddressOrDefault(settings_.Get(obex::kReceiveAddressSetting), obex::kDefaultReceiveAddress)));
  form->addRow("Listen on:", address_);
  state_ = new QLabel(this);
  state_->setObjectName("receiveState");
  form->addRow("State:", state_);
  layout->addLayout(form);
  log_ = new QPlainTextEdit(this);
  log_->setObjectName("receiveLog");
  log_->setReadOnly(true);
  log_->setPlaceholderText("Databases and records received are listed here.");
  layout->addWidget(log_);
  auto* row = new QHBoxLayout;
  toggle_ = new QPushButton(this);
  toggle_->setObjectName("receiveToggle");
  auto* close = new QPushButton("Close", this);
  close->setObjectName("receiveClose");
  row->addStretch();
  row->addWidget(toggle_);
  row->addWidget(close);
  layout->addLayout(row);
  connect(toggle_, &QPushButton::clicked, this, [this] {
    if (listening()) {
      StopListening();
    } else {
      StartListening();
    }
  });
  connect(close, &QPushButton::clicked, this, &QDialog::close);
  resize(420, 300);
  UpdateControls();
}

ReceiveWindow::~ReceiveWindow() { StopListening(); }

void ReceiveWindow::setAddress(const QString& address) { address_->setText(address); }
QString ReceiveWindow::log() const { return log_->toPlainText(); }

bool ReceiveWindow::StartListening() {
  if (listening()) return true;
  const std::string address = address_->text().trimmed().toStdString();
  if (auto error = CheckReceiveAddress(address)) {
    QMessageBox::warning(this, windowTitle(), QString::fromStdString(*error));
    return false;
  }
  settings_.Set(obex::kReceiveAddressSetting, address);
  obex::ReceiverOptions options;
  options.address = address;
  options.pollMs = 100;
  stop_ = false;
  actual_.clear();
  const int generation = ++generation_;
  thread_ = std::thread([this, options, generation] {
    Status s = RunReceiver(*peers_, *sink_, options, stop_, [this](const std::string& at) {
      QMetaObject::invokeMethod(
          this,
          [this, at] {
            actual_ = QString::fromStdString(at);
            UpdateControls();
            emit listeningStarted(actual_);
          },
          Qt::QueuedConnection);
    });
    const std::string error = s ? std::string() : s.message();
    QMetaObject::invokeMethod(this, [this, generation, error] { ListenerEnded(generation, error); },
                              Qt::QueuedConnection);
  });
  UpdateControls();
  return true;
}

void ReceiveWindow::ListenerEnded(int generation, const std::string& error) {
  // A listener already stopped by the user (or replaced) has nothing to add.
  if (generation != generation_ || !thread_.joinable()) return;
  thread_.join();
  if (!error.empty()) {
    AddLine(QString::fromStdString(error));
    QMessageBox::warning(this, windowTitle(), QString::fromStdString(error));
  }
  UpdateControls();
  emit listeningStopped();
}

void ReceiveWindow::StopListening() {
  if (!thread_.joinable()) return;
  stop_ = true;
  thread_.join();
  ++generation_;
  actual_.clear();
  UpdateControls();
  emit listeningStopped();
}

uint8_t ReceiveWindow::Handle(obex::ReceivedObject& object) {
  DataSession* session = shown_ ? shown_() : nullptr;
  OpenDatabases dbs;
  dbs.dataFolder = dataFolder_;
  if (session) {
    dbs.open.push_back(&session->db);
    dbs.active = &session->db;
  }
  Hooks hooks(session, viewChanged_);
  FromPeerUi ui(ui_, peers_->peer());
  obex::ReceiveStore store(dbs, ui, hooks, [this](const std::string& line) {
    AddLine(QString::fromStdString(line));
  });
  const uint8_t code = store.Deliver(object);
  return code;
}

void ReceiveWindow::AddLine(const QString& line) {
  log_->appendPlainText(line);
  emit objectHandled(line);
}

void ReceiveWindow::UpdateControls() {
  const bool on = listening();
  toggle_->setText(on ? "Stop" : "Start");
  address_->setEnabled(!on);
  state_->setText(on ? (actual_.isEmpty() ? "Starting..." : "Listening on " + actual_) : "Not listening");
}

void ReceiveWindow::closeEvent(QCloseEvent* event) {
  // Closing the window ends listening: receiving only runs while asked for.
  StopListening();
  QDialog::closeEvent(event);
}

}  // namespace cx::gui
