// The texts the sender shows. Each names the routine that failed as its
// first argument.
#pragma once

#include <cstdio>
#include <string>

namespace cx::obex {

inline constexpr char kMsgSocketFailed[] = "%s: Allocating socket failed. Error: %d";
inline constexpr char kMsgSearchFailed[] = "%s: Error looking for IR device. Error code: %d";
inline constexpr char kMsgConnectFailed[] =
    "%s: Connecting to the IR port failed - port may in use by another program. Error: %d";
inline constexpr char kMsgSendFailed[] = "%s: Sending First Packet failed. Error: %d";
inline constexpr char kMsgRecvFailed[] = "%s: No data is received, recv failed - %d";
inline constexpr char kMsgBadResponse[] = "%s: Incorrect OBEX Response = %X";
inline constexpr char kMsgBufferFailed[] = "%s: Error allocating packet buffer - %d";

inline constexpr char kCaptionError[] = "Error";
inline constexpr char kCaptionClient[] = "Client";

// Fills one of the texts above with the routine's name and a number.
inline std::string RoutineMessage(const char* format, const char* routine, int value) {
  char text[256];
  std::snprintf(text, sizeof text, format, routine, value);
  return text;
}

}  // namespace cx::obex
