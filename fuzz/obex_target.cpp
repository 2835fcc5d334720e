// A peer in infrared range can send anything. The receiver must answer
// every packet, end the session cleanly, hand over only objects whose body
// matches what was announced, and the payload readers behind it must take
// any object apart safely.
//
// Input: one byte giving how the stream is cut into receives (1 to 64
// bytes each, or all at once for 0), then the bytes the peer sends.
#include <algorithm>
#include <string>
#include <vector>

#include "fuzz/fuzz_check.h"
#include "fuzz/targets.h"
#include "infrared/obex_format.h"
#include "infrared/obex_server.h"
#include "infrared/received_name.h"
#include "infrared/record_set.h"
#include "platform/transport.h"

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

class CheckingSink : public obex::ObjectSink {
 public:
  explicit CheckingSink(size_t limit) : limit_(limit) {}
  uint8_t Deliver(obex::ReceivedObject& object) override {
    CX_FUZZ_CHECK(object.body.size() <= limit_);
    if (object.hasLength) CX_FUZZ_CHECK(object.body.size() == object.length);
    std::string safe = obex::SafeFileName(object.name);
    CX_FUZZ_CHECK(safe.size() <= 255);
    CX_FUZZ_CHECK(safe.find('/') == std::string::npos && safe.find('\\') == std::string::npos);
    CX_FUZZ_CHECK(safe.empty() || safe[0] != '.');
    obex::StemOf(safe);
    obex::HasExtension(safe, ".PDB");
    std::vector<std::vector<uint8_t>> records;
    if (obex::UnpackRecordSet(object.body, records)) {
      size_t total = obex::kRecordSetHeaderSize;
      for (const auto& r : records) total += r.size();
      CX_FUZZ_CHECK(!records.empty() && total <= object.body.size());
    } else {
      CX_FUZZ_CHECK(records.empty());
    }
    // Refuse every other object, so both answers are exercised.
    return (++count_ % 2) ? obex::kSuccess : obex::kForbidden;
  }

 private:
  size_t limit_;
  int count_ = 0;
};

}  // namespace

int FuzzObexReceiver(const uint8_t* data, size_t size) {
  if (size == 0) return 0;
  const size_t piece = data[0] % 65;
  ScriptedConnection connection(data + 1, size - 1, piece);
  obex::ServerOptions options;
  options.packetTimeoutMs = 1000;
  options.maxObjectSize = 16384;  // small, so that the limit is reached
  CheckingSink sink(options.maxObjectSize);
  obex::SessionSummary summary = obex::ServeObexSession(connection, sink, options);

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
