#include "infrared/beam_commands.h"

#include <atomic>

#include "infrared/beam_transfer.h"
#include "ops/view.h"
#include "platform/tcp_transport.h"

namespace cx::obex {
namespace {

// Passes messages on and counts them: a transfer always runs to its end,
// so the messages are what tells a beam that went wrong.
class CountingUi : public ForwardingUi {
 public:
  explicit CountingUi(UiPort& inner) : ForwardingUi(inner) {}
  void ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) override {
    ++messages;
    ForwardingUi::ShowMessage(text, caption, icon);
  }
  std::atomic<int> messages{0};
};

}  // namespace

std::vector<std::string> BeamPeers(const Settings& settings) {
  return ParsePeerList(settings.Get(kBeamPeersSetting).value_or(""));
}

Status BeamObjects(const std::vector<BeamObject>& objects, StreamTransport& transport, UiPort& ui,
                   BeamWindows& windows, const BeamOptions& options) {
  CountingUi counting(ui);
  for (size_t i = 0; i < objects.size(); ++i) {
    int result = RunTransfer(transport, counting, windows, objects[i], options.wait,
                             options.replyTimeoutMs);
    std::string which = objects.size() > 1 ? " (part " + std::to_string(i + 1) + " of " +
                                                 std::to_string(objects.size()) + ")"
                                           : "";
    if (result < 0) return Status::Error("The beam did not finish in time" + which + ".");
    if (result == 0) return Status::Error("Nothing was beamed" + which + ".");
    if (counting.messages > 0) return Status::Error("The peer did not take the beam" + which + ".");
  }
  return Status::Ok();
}

Status BeamFile(const std::string& path, BeamWhat what, size_t record, StreamTransport& transport,
                UiPort& ui, BeamWindows& windows, const BeamOptions& options) {
  std::vector<BeamObject> objects(1);
  Status status;
  if (what == BeamWhat::kDatabase) {
    status = DatabaseObject(path, objects[0]);
  } else {
    Database db;
    status = db.Open(path, ui);
    if (status && what == BeamWhat::kRecord) status = RecordObject(db, record, objects[0]);
    if (status && what == BeamWhat::kRecordsInView) {
      status = RecordSetObjects(db, RebuildView(db), objects);
    }
  }
  if (!status) return status;
  return BeamObjects(objects, transport, ui, windows, options);
}

Status BeamFile(const std::string& path, BeamWhat what, size_t record,
                const std::vector<std::string>& peers, UiPort& ui, const BeamOptions& options) {
  if (peers.empty()) return Status::Error("No device to beam to: name one, or set " +
                                          std::string(kBeamPeersSetting) + ".");
  TcpTransport transport(peers);
  BeamWindows windows;
  return BeamFile(path, what, record, transport, ui, windows, options);
}

}  // namespace cx::obex
