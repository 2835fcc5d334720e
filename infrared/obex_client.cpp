// SendObexPacket and PutObexInfo: the packet sequence of one transfer.
#include "infrared/obex_client.h"

#include <cerrno>
#include <new>

#include "infrared/obex_format.h"
#include "infrared/obex_messages.h"
#include "infrared/obex_packets.h"
#include "infrared/obex_wire.h"

namespace cx::obex {
namespace {

void Show(ObexLink& link, const char* format, const char* routine, int value,
          const char* caption) {
  if (!link.abandoned) link.ui.ShowMessage(RoutineMessage(format, routine, value), caption);
}

}  // namespace

int SendObexPacket(size_t length, const uint8_t* buffer, StreamConnection& socket,
                   uint8_t expected, ObexLink& link, std::vector<uint8_t>* reply) {
  constexpr char kRoutine[] = "SendObexPacket";
  if (reply) reply->clear();
  int error = 0;
  if (!SendPacket(socket, buffer, length, error)) {
    // Waiting for a reply to a packet that did not go out would only add
    // the reply time-out to every remaining packet.
    Show(link, kMsgSendFailed, kRoutine, error, kCaptionError);
    return 0;
  }
  std::vector<uint8_t> packet;
  ReadPacket(socket, packet, link.replyTimeoutMs, error);
  if (packet.empty()) {
    Show(link, kMsgRecvFailed, kRoutine, error, kCaptionClient);
    return 0;
  }
  if (reply) {
    size_t keep = packet.size() < kReplyInspectSize ? packet.size() : kReplyInspectSize;
    reply->assign(packet.begin(), packet.begin() + static_cast<long>(keep));
  }
  if (packet[0] != expected) {
    Show(link, kMsgBadResponse, kRoutine, packet[0], kCaptionClient);
    return 0;
  }
  return 1;
}

int PutObexInfo(const std::vector<HeaderItem>& items, ObexLink& link) {
  // A page, as the handheld's committed block was: a body of up to 4072
  // bytes goes out in one packet of up to 4078.
  std::unique_ptr<uint8_t[]> buffer(new (std::nothrow) uint8_t[kPacketBufferAllocation]);
  if (!buffer) {
    Show(link, kMsgBufferFailed, "PutObexInfo", ENOMEM, "");
    return 0;
  }
  std::unique_ptr<StreamConnection> socket = InitIrSock(link);
  if (!socket) return 0;
  link.windows.CloseDeviceSearch();
  link.windows.ShowProgress();
  uint8_t* buf = buffer.get();
  auto finish = [&](int result) {
    link.windows.CloseProgress();
    socket->Close();
    return result;
  };

  std::vector<uint8_t> reply;
  SendObexPacket(BuildConnect(buf), buf, *socket, kSuccess, link, &reply);
  // A peer that takes less than our buffer gets packets it can take; one
  // that takes as much or more gets exactly the handheld's packets.
  size_t peerLimit = AnnouncedPacketLimit(reply);
  if (peerLimit >= kPacketBufferSize) peerLimit = 0;
  if (peerLimit != 0 && peerLimit < kMinimumPacketLength) peerLimit = kMinimumPacketLength;

  const HeaderItem* body = nullptr;
  std::vector<HeaderItem> headers;
  for (const HeaderItem& item : items) {
    if (item.id == kHeaderBody) {
      body = &item;
    } else {
      headers.push_back(item);
    }
  }
  for (const auto& group : GroupHeaders(headers, peerLimit ? peerLimit : 0xFFFF)) {
    if (link.abandoned) return finish(0);
    std::vector<uint8_t> put = BuildHeaderPut(group);
    SendObexPacket(put.size(), put.data(), *socket, kContinue, link);
  }

  if (body) {
    size_t offset = 0;
    for (size_t part : BodyPartSizes(body->bodyCount, peerLimit)) {
      if (link.abandoned) return finish(0);
      size_t length = BuildBodyPart(buf, body->value.data() + offset, part);
      SendObexPacket(length, buf, *socket, kContinue, link);
      offset += part;
      link.windows.Progress(offset, body->bodyCount);
    }
  }

  if (link.abandoned) return finish(0);
  SendObexPacket(BuildPutFinal(buf), buf, *socket, kSuccess, link);
  SendObexPacket(BuildDisconnect(buf), buf, *socket, kSuccess, link);
  return finish(1);
}

}  // namespace cx::obex
