#include "app/data_dialogs.h"

#include <cctype>
#include <cerrno>
#include <cstdlib>
#include <limits>

#include "platform/data_folder.h"
#include "platform/file_io.h"
#include "platform/tcp_transport.h"

namespace cx {
namespace {

std::string Trimmed(const std::string& text) {
  size_t b = 0, e = text.size();
  while (b < e && std::isspace(static_cast<unsigned char>(text[b]))) ++b;
  while (e > b && std::isspace(static_cast<unsigned char>(text[e - 1]))) --e;
  return text.substr(b, e - b);
}

// The stored limit is a signed 32-bit number: a wider one would wrap and
// filter on a value the user never typed.
bool IsWholeNumber(const std::string& text) {
  const std::string t = Trimmed(text);
  if (t.empty()) return false;
  errno = 0;
  char* end = nullptr;
  const long long v = std::strtoll(t.c_str(), &end, 10);
  return errno == 0 && *end == '\0' && v >= std::numeric_limits<int32_t>::min() &&
         v <= std::numeric_limits<int32_t>::max();
}

// Decimal limits stay text in the file and are read with "." as the point
// whatever the locale, so that is what is accepted here too.
bool IsDecimalNumber(const std::string& text) {
  const std::string t = Trimmed(text);
  if (t.empty()) return false;
  char* end = nullptr;
  std::strtod(t.c_str(), &end);
  return *end == '\0';
}

std::string Lower(std::string s) {
  for (char& c : s) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return s;
}

}  // namespace

std::optional<std::string> CheckFilterLimits(const Schema& schema, const FilterDialogFilter& filter) {
  if (!filter.enabled) return std::nullopt;
  switch (FilterControlsFor(schema, filter.field)) {
    case FilterControls::WholeLimits:
      if (!IsWholeNumber(filter.lowerLimit)) return "The Lower Limit must be a whole number.";
      if (!IsWholeNumber(filter.upperLimit)) return "The Upper Limit must be a whole number.";
      return std::nullopt;
    case FilterControls::DecimalLimits:
      if (!IsDecimalNumber(filter.lowerLimit)) return "The Lower Limit must be a number (\".\" as the point).";
      if (!IsDecimalNumber(filter.upperLimit)) return "The Upper Limit must be a number (\".\" as the point).";
      if (filter.lowerLimit.size() > 39 || filter.upperLimit.size() > 39) return "A limit may have at most 39 characters.";
      return std::nullopt;
    default:
      return std::nullopt;
  }
}

std::vector<std::string> RememberedPeers(const std::string& stored) {
  std::vector<std::string> peers;
  for (const std::string& p : ParsePeerList(stored)) {
    bool seen = false;
    for (const std::string& q : peers) seen = seen || Lower(q) == Lower(p);
    if (!seen && peers.size() < kRememberedPeers) peers.push_back(p);
  }
  return peers;
}

std::string RememberPeer(const std::string& stored, const std::string& peer) {
  std::vector<std::string> peers = RememberedPeers(Trimmed(peer) + "," + stored);
  std::string out;
  for (const std::string& p : peers) out += (out.empty() ? "" : ",") + p;
  return out;
}

std::string ReceiveAddressOrDefault(const std::optional<std::string>& setting, const std::string& fallback) {
  if (setting && !CheckReceiveAddress(Trimmed(*setting))) return Trimmed(*setting);
  return fallback;
}

std::optional<std::string> CheckReceiveAddress(const std::string& address) {
  std::string host;
  int port = 0;
  // Port 0 asks for any free port; the window shows which one it got.
  if (!ParseHostPort(address, -1, host, port, /*allowPortZero=*/true) || port < 0) {
    return "Give the address to listen on as HOST:PORT, for example 0.0.0.0:6500.";
  }
  return std::nullopt;
}

Status BeamableDatabaseFile(const Database& db, const std::string& scratchFolder, std::string& path) {
  if (!db.changed() && FileExists(db.path())) {
    path = db.path();
    return Status::Ok();
  }
  std::string name = FileNamePart(db.path());
  // A database never saved has an asterisk in its path; the receiver needs
  // a plain file name.
  for (char& c : name) {
    if (c == '*') c = '_';
  }
  if (name.empty()) name = "Untitled.PDB";
  Database copy = db;  // records are shared, not duplicated
  path = scratchFolder + "/" + name;
  return copy.SaveAs(path);
}

}  // namespace cx
