// Beaming and receiving from the desktop: a beam to a receiver in this
// process over loopback TCP, the device search cancelled, and records
// received into an open database under its access rules.
#include <QProgressDialog>
#include <QLineEdit>
#include <QPushButton>
#include <QtTest>
#include <atomic>
#include <thread>

#include "design/security.h"
#include "gui/data/beam.h"
#include "gui/data/data_commands.h"
#include "gui/data/receive_window.h"
#include "infrared/beam_commands.h"
#include "infrared/beam_payloads.h"
#include "infrared/memory_transport.h"
#include "infrared/obex_format.h"
#include "infrared/receiver.h"
#include "ops/view.h"
#include "platform/tcp_transport.h"
#include "tests/gui/data/data_test_support.h"
#include "tests/support/test_support.h"

namespace cx::testing {
namespace {

// Keeps what arrives; runs on the receiver's thread.
class KeepingSink : public obex::ObjectSink {
 public:
  uint8_t Deliver(obex::ReceivedObject& object) override {
    std::lock_guard<std::mutex> lock(mutex);
    objects.push_back(object);
    return obex::kSuccess;
  }
  std::mutex mutex;
  std::vector<obex::ReceivedObject> objects;
};

// A receiver on 127.0.0.1 at a free port, for as long as the object lives.
class LoopbackReceiver {
 public:
  explicit LoopbackReceiver(obex::ObjectSink& sink) {
    obex::ReceiverOptions options;
    options.address = "127.0.0.1:0";
    options.pollMs = 20;
    thread_ = std::thread([this, &sink, options] {
      TcpTransport transport({});
      obex::RunReceiver(transport, sink, options, stop_, [this](const std::string& at) {
        std::lock_guard<std::mutex> lock(mutex_);
        address_ = at;
      });
    });
  }
  ~LoopbackReceiver() {
    stop_ = true;
    thread_.join();
  }
  std::string address() {
    std::lock_guard<std::mutex> lock(mutex_);
    return address_;
  }

 private:
  std::atomic<bool> stop_{false};
  std::mutex mutex_;
  std::string address_;
  std::thread thread_;
};

// Beams `record` to `address` from a thread of its own: the receiver hands
// each object to this (the GUI) thread, which must keep turning meanwhile.
void SendAside(const std::string& address, const obex::BeamObject& record) {
  std::atomic<bool> done{false};
  std::thread sender([&] {
    SilentUi quiet;
    TcpTransport transport({address});
    obex::BeamWindows none;
    obex::BeamObjects({record}, transport, quiet, none, obex::BeamOptions{});
    done = true;
  });
  QTRY_VERIFY_WITH_TIMEOUT(done.load(), 20000);
  sender.join();
}

}  // namespace

class BeamTest : public QObject {
  Q_OBJECT

 private slots:
  void databaseBeamArrivesByteIdenticalAndTheWindowStaysLive() {
    TempDir dir;
    const std::string path = CopySample("Contacts", dir.path());
    KeepingSink sink;
    LoopbackReceiver receiver(sink);
    QTRY_VERIFY_WITH_TIMEOUT(!receiver.address().empty(), 5000);

    ScriptedUi ui;
    LocaleInfo locale;
    Database db;
    QVERIFY(db.Open(path, ui));
    DataSession session(db, locale, ui);
    session.view = RebuildView(db);
    MemorySettings settings;
    settings.Set(obex::kBeamPeersSetting, receiver.address());
    gui::DataTarget target(session, {}, dir.path());
    QPointer<gui::BeamSession> beam = gui::BeamCommand(nullptr, target, settings, obex::BeamWhat::kDatabase);
    QVERIFY(beam);
    // The command returned at once; the GUI thread goes on turning events
    // while the transfer runs on its own thread.
    int ticks = 0;
    QTimer ticker;
    connect(&ticker, &QTimer::timeout, [&] { ++ticks; });
    ticker.start(5);
    QTRY_VERIFY_WITH_TIMEOUT(beam.isNull(), 20000);  // deletes itself when done
    QVERIFY(ticks > 0);
    QVERIFY2(ui.messages.empty(), ui.messages.empty() ? "" : ui.messages[0].text.c_str());
    std::lock_guard<std::mutex> lock(sink.mutex);
    QCOMPARE(sink.objects.size(), size_t(1));
    QCOMPARE(sink.objects[0].name, std::string("Contacts.PDB"));
    const QByteArray file = ReadAll(path);
    QCOMPARE(QByteArray(reinterpret_cast<const char*>(sink.objects[0].body.data()),
                        static_cast<int>(sink.objects[0].body.size())),
             file);
  }

  void cancellingTheDeviceSearchStopsSilently() {
    ScriptedUi ui;
    auto transport = std::make_unique<MemoryTransport>();  // no device ever in range
    std::vector<obex::BeamObject> objects(1);
    objects[0] = {};
    gui::BeamSession beam(std::move(transport), std::move(objects), ui, nullptr);
    gui::BeamSession::Outcome ended = gui::BeamSession::Outcome::Running;
    connect(&beam, &gui::BeamSession::finished, [&](gui::BeamSession::Outcome o) { ended = o; });
    beam.Start();
    QTRY_VERIFY_WITH_TIMEOUT(beam.searchWindow() && beam.searchWindow()->isVisible(), 5000);
    auto* cancel = beam.searchWindow()->findChild<QPushButton*>();
    QVERIFY(cancel);
    QTest::mouseClick(cancel, Qt::LeftButton);
    QTRY_COMPARE_WITH_TIMEOUT(ended, gui::BeamSession::Outcome::Cancelled, 5000);
    QTest::qWait(50);  // anything posted late would show now
    QVERIFY(ui.messages.empty());
    QVERIFY(!beam.searchWindow()->isVisible());
  }

  void receivedRecordsPassTheAddRecordsCheck() {
    TempDir dir;
    const std::string path = CopySample("Orders", dir.path());
    ScriptedUi ui;
    LocaleInfo locale;
    Database db;
    QVERIFY(db.Open(path, ui));
    DataSession session(db, locale, ui);
    session.view = RebuildView(db);
    const size_t count = db.recordCount();
    obex::BeamObject record;
    QVERIFY(obex::RecordObject(db, 0, record));

    MemorySettings settings;
    int refreshed = 0;
    gui::ReceiveWindow window(settings, dir.path(), ui, [&] { return &session; }, [&] { ++refreshed; });
    window.setAddress("127.0.0.1:0");
    QVERIFY(window.StartListening());
    QTRY_VERIFY_WITH_TIMEOUT(!window.listeningAddress().isEmpty(), 5000);
    const std::string address = window.listeningAddress().toStdString();

    auto send = [&] { SendAside(address, record); };

    auto level = [&](int l) {
      SecuritySettings s = LoadSecuritySettings(db.schema());
      s.password = "pw";
      s.levels[secured::kAddRecords] = l;
      ApplySecuritySettings(db, s);
    };
    level(access_level::kPassword);
    ui.yesNoAnswers = {true, true, true};
    send();  // no password given
    QCOMPARE(db.recordCount(), count);
    QVERIFY(!ui.questions.empty());
    QVERIFY2(ui.questions.front().text.rfind("From 127.0.0.1:\n", 0) == 0, ui.questions.front().text.c_str());
    QVERIFY(!ui.messages.empty());
    QCOMPARE(ui.messages.back().caption, std::string("ACCESS DENIED"));

    ui.passwordAnswers.push_back({"pw"});
    send();
    QCOMPARE(db.recordCount(), count + 1);
    QCOMPARE(session.view.size(), count + 1);
    QCOMPARE(refreshed, 1);

    level(access_level::kNone);
    ui.passwordAnswers.push_back({"pw"});
    send();
    QCOMPARE(db.recordCount(), count + 1);
    QVERIFY(window.log().contains("Refused") || window.log().contains("Declined") || !window.log().isEmpty());

    window.StopListening();
    QVERIFY(!window.listening());
  }

  // Records for a database that is not open load it first: its Open
  // Database level applies as it does everywhere else.
  void receivedRecordsPassTheOpenDatabaseCheckAndTheDefaultPortIsUnprivileged() {
    TempDir dir;
    const std::string path = CopySample("Orders", dir.path());
    ScriptedUi ui;
    obex::BeamObject record;
    {
      Database db;
      QVERIFY(db.Open(path, ui));
      QVERIFY(obex::RecordObject(db, 0, record));
      SecuritySettings s = LoadSecuritySettings(db.schema());
      s.password = "pw";
      s.levels[secured::kOpenDatabase] = access_level::kPassword;
      ApplySecuritySettings(db, s);
      QVERIFY(db.Save());
    }
    const QByteArray before = ReadAll(path);

    MemorySettings settings;
    gui::ReceiveWindow window(settings, dir.path(), ui, [] { return nullptr; }, [] {});
    const QString shown = window.findChild<QLineEdit*>("receiveAddress")->text();
    QCOMPARE(shown, QString(obex::kDefaultReceiveAddress));
    QVERIFY(shown.section(':', -1).toInt() > 1023);

    window.setAddress("127.0.0.1:0");
    QVERIFY(window.StartListening());
    QTRY_VERIFY_WITH_TIMEOUT(!window.listeningAddress().isEmpty(), 5000);
    const std::string address = window.listeningAddress().toStdString();
    auto send = [&] { SendAside(address, record); };

    ui.yesNoAnswers = {true, true, true};
    send();  // the password prompt cancelled
    QCOMPARE(ui.passwordPrompts, 1);
    QCOMPARE(ReadAll(path), before);
    QVERIFY(window.log().contains("Inserted 0 of 1"));

    ui.yesNoAnswers = {true, true, true};
    ui.passwordAnswers.push_back({"pw"});
    send();
    Database after;
    QVERIFY(after.Open(path, ui));
    Database original;
    QVERIFY(original.OpenBytes(path, std::make_shared<const Bytes>(before.begin(), before.end()), ui));
    QCOMPARE(after.recordCount(), original.recordCount() + 1);
    window.StopListening();
  }
};

}  // namespace cx::testing

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  cx::testing::BeamTest test;
  return QTest::qExec(&test, argc, argv);
}

#include "beam_test.moc"
