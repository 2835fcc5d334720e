// The beaming commands as the desktop program and the command-line tool
// call them: build the payload, then run one transfer per object, each on
// a thread of its own while the caller waits with a time-out.
#pragma once

#include <chrono>
#include <string>
#include <vector>

#include "infrared/beam_payloads.h"
#include "infrared/obex_client.h"
#include "platform/settings.h"
#include "platform/status.h"

namespace cx::obex {

// Settings: the peers a beam tries ("HOST[:PORT]" entries separated by
// commas) and the address the receiver listens on.
inline constexpr char kBeamPeersSetting[] = "BeamPeers";
inline constexpr char kReceiveAddressSetting[] = "ReceiveAddress";
// Above 1023, so that listening needs no privileges; peers that listen on
// the classic OBEX port 650 are still reached by naming it.
inline constexpr char kDefaultReceiveAddress[] = "0.0.0.0:6500";

std::vector<std::string> BeamPeers(const Settings& settings);

struct BeamOptions {
  // How long the caller waits for one transfer, the device search included.
  std::chrono::milliseconds wait{60000};
  // How long the sender waits for each reply.
  int replyTimeoutMs = 30000;
};

// Sends the objects one after another. Ok when every transfer ran to its
// end without a message; otherwise says which went wrong (the messages
// themselves have been shown through `ui`).
Status BeamObjects(const std::vector<BeamObject>& objects, StreamTransport& transport, UiPort& ui,
                   BeamWindows& windows, const BeamOptions& options);

enum class BeamWhat { kDatabase, kRecord, kRecordsInView };

// The `beam` command: the database file at `path` as a whole, its data
// record `record` (counted from 0), or its records in view (its own
// filters decide).
Status BeamFile(const std::string& path, BeamWhat what, size_t record, StreamTransport& transport,
                UiPort& ui, BeamWindows& windows, const BeamOptions& options);

// The same over TCP to `peers` ("HOST[:PORT]", tried in order), with no
// windows to show.
Status BeamFile(const std::string& path, BeamWhat what, size_t record,
                const std::vector<std::string>& peers, UiPort& ui, const BeamOptions& options);

}  // namespace cx::obex
