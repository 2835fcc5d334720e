// A peer in infrared range can send anything. The receiver must answer
// every packet, end the session cleanly, hand over only objects whose body
// matches what was announced, and what stores and inserts the objects must
// keep to the data folder and leave its databases whole.
//
// Input: one byte, then the bytes the peer sends. The byte's low six bits
// say how the stream is cut into receives (1 to 63 bytes each, or all at
// once for 0); bit 6 has the target database open on screen; bit 7 makes
// the user answer No to every question.
#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

#include "bench/generator.h"
#include "engine/database_folder.h"
#include "engine/receive.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "fuzz/fuzz_check.h"
#include "fuzz/scratch.h"
#include "fuzz/targets.h"
#include "infrared/obex_format.h"
#include "infrared/obex_server.h"
#include "infrared/receive_store.h"
#include "infrared/received_name.h"
#include "infrared/record_set.h"
#include "platform/clock.h"
#include "platform/file_io.h"
#include "platform/transport.h"
#include "platform/ui_port.h"

namespace cx::fuzz {
namespace {

// A connection whose far side is the fuzz input: receives hand it out in
// pieces and sends are collected.
class ScriptedConnection : public StreamConnection {
 public:
  ScriptedConnection(const uint8_t* data, size_t size, size_t piece)
      : data_(data), size_(size), piece_(piece) {}

  long Send(const uint8_t* data, size_t size) override {
    sent_.insert(sent_.end(), data, data + size);
    ++replies_;
    return static_cast<long>(size);
  }
  long Receive(uint8_t* data, size_t size, int /*timeoutMs*/) override {
    if (pos_ == size_) return 0;
    size_t n = std::min({size, size_ - pos_, piece_ == 0 ? size_ : piece_});
    std::copy(data_ + pos_, data_ + pos_ + n, data);
    pos_ += n;
    return static_cast<long>(n);
  }
  void Close() override {}
  int error() const override { return 0; }
  std::string peer() const override { return "fuzz"; }

  int replies() const { return replies_; }
  const std::vector<uint8_t>& sent() const { return sent_; }

 private:
  const uint8_t* data_;
  size_t size_;
  size_t piece_;
  size_t pos_ = 0;
  std::vector<uint8_t> sent_;
  int replies_ = 0;
};

class AnsweringUi : public SilentUi {
 public:
  explicit AnsweringUi(bool yes) : yes_(yes) {}
  bool AskYesNo(const std::string&, const std::string&) override { return yes_; }

 private:
  bool yes_;
};

constexpr char kTargetName[] = "Generated.PDB";
constexpr size_t kTargetRecords = 3;

// The database that beamed records are meant for, as bytes, made once.
const Bytes& TargetBytes() {
  static const Bytes bytes = [] {
    bench::GeneratorOptions options;
    options.records = kTargetRecords;
    options.maxNoteLength = 20;
    const std::string path = ScratchPath("target-source.PDB");
    Bytes b;
    CX_FUZZ_CHECK(bench::GenerateFile(path, options, FixedClock(1700000000)).ok());
    CX_FUZZ_CHECK(ReadWholeFile(path, b));
    return b;
  }();
  return bytes;
}

// Checks every object, then hands it to the program's own receive store.
class CheckingSink : public obex::ObjectSink {
 public:
  CheckingSink(size_t limit, obex::ObjectSink& store) : limit_(limit), store_(store) {}
  uint8_t Deliver(obex::ReceivedObject& object) override {
    CX_FUZZ_CHECK(object.body.size() <= limit_);
    if (object.hasLength) CX_FUZZ_CHECK(object.body.size() == object.length);
    std::string safe = obex::SafeFileName(object.name);
    CX_FUZZ_CHECK(safe.size() <= 255);
    CX_FUZZ_CHECK(safe.find('/') == std::string::npos && safe.find('\\') == std::string::npos);
    CX_FUZZ_CHECK(safe.empty() || safe[0] != '.');
    std::vector<std::vector<uint8_t>> records;
    if (obex::UnpackRecordSet(object.body, records)) {
      size_t total = obex::kRecordSetHeaderSize;
      for (const auto& r : records) total += r.size();
      CX_FUZZ_CHECK(!records.empty() && total <= object.body.size());
    } else {
      CX_FUZZ_CHECK(records.empty());
    }
    if (obex::KindOf(object) == obex::PayloadKind::kDatabase &&
        (safe == kTargetName || safe + ".PDB" == kTargetName)) {
      targetReplaced_ = true;
    }
    return store_.Deliver(object);
  }
  // A database received under the target's name may have replaced it.
  bool targetReplaced() const { return targetReplaced_; }

 private:
  size_t limit_;
  obex::ObjectSink& store_;
  bool targetReplaced_ = false;
};

// After a session: nothing outside the data folder, every database in it
// one of ours, and the target whole.
void CheckDataFolder(const std::string& folder, Database* open, bool targetReplaced) {
  namespace fs = std::filesystem;
  for (const auto& e : fs::directory_iterator(fs::path(folder).parent_path())) {
    CX_FUZZ_CHECK(e.path().filename() == "data");
  }
  for (const auto& e : fs::directory_iterator(folder)) {
    CX_FUZZ_CHECK(e.is_regular_file());
    CX_FUZZ_CHECK(IsDatabaseFile(e.path().string()));
  }
  if (targetReplaced) return;
  SilentUi ui;
  Database target;
  CX_FUZZ_CHECK(target.Open(DatabasePath(folder, kTargetName), ui).ok());
  CX_FUZZ_CHECK(!target.partial() && target.malformedRecords() == 0);
  CX_FUZZ_CHECK(target.recordCount() >= kTargetRecords);
  if (open) {
    for (size_t r = 0; r < open->recordCount(); ++r) {
      CX_FUZZ_CHECK(RecordIsWellFormed(open->record(r)));
      CX_FUZZ_CHECK(open->record(r).size() < format::kMaxRecordSize);
    }
  }
}

}  // namespace

int FuzzObexReceiver(const uint8_t* data, size_t size) {
  if (size == 0) return 0;
  const size_t piece = data[0] & 0x3F;
  const bool targetOpen = data[0] & 0x40;
  const bool answerYes = !(data[0] & 0x80);

  const std::string folder = ScratchPath("obex/data");
  std::filesystem::remove_all(folder);
  std::filesystem::create_directories(folder);
  const Bytes& target = TargetBytes();
  CX_FUZZ_CHECK(WriteFileSafely(DatabasePath(folder, kTargetName), target.data(), target.size()).ok());

  AnsweringUi ui(answerYes);
  OpenDatabases dbs;
  dbs.dataFolder = folder;
  Database open;
  if (targetOpen) {
    CX_FUZZ_CHECK(open.Open(DatabasePath(folder, kTargetName), ui).ok());
    dbs.open.push_back(&open);
    dbs.active = &open;
  }
  // Every access granted, so that the insertion paths are reached.
  struct GrantingHooks : ReceiveHooks {
    bool AllowAdd(Database&, UiPort&) override { return true; }
    bool AllowOpen(const std::string&, UiPort&) override { return true; }
  } hooks;
  obex::ReceiveStore store(dbs, ui, hooks);

  ScriptedConnection connection(data + 1, size - 1, piece);
  obex::ServerOptions options;
  options.packetTimeoutMs = 1000;
  options.maxObjectSize = 16384;  // small, so that the limit is reached
  CheckingSink sink(options.maxObjectSize, store);
  obex::SessionSummary summary = obex::ServeObexSession(connection, sink, options);
  CheckDataFolder(folder, targetOpen ? &open : nullptr, sink.targetReplaced());

  CX_FUZZ_CHECK(summary.accepted <= summary.delivered);
  CX_FUZZ_CHECK(summary.end != obex::SessionEnd::kFailed);  // the stream never fails or stalls
  // Every reply is a whole response packet of its own.
  const std::vector<uint8_t>& sent = connection.sent();
  size_t at = 0;
  int packets = 0;
  while (at < sent.size()) {
    CX_FUZZ_CHECK(sent.size() - at >= obex::kPacketPrefixSize);
    size_t length = obex::GetU16(sent.data() + at + 1);
    CX_FUZZ_CHECK(length >= obex::kPacketPrefixSize && at + length <= sent.size());
    CX_FUZZ_CHECK(sent[at] & obex::kFinalBit);
    at += length;
    ++packets;
  }
  CX_FUZZ_CHECK(packets == connection.replies());
  return 0;
}

}  // namespace cx::fuzz
