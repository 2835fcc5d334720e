// A NUL-terminated text in a fixed slot of N bytes. The slot's bytes are
// kept exactly as read (including anything after the NUL that another
// program left there) until the text is set.
#pragma once

#include <array>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace cx {

template <size_t N>
struct FixedText {
  std::array<uint8_t, N> bytes{};

  // The characters up to the first NUL (or all N when there is none).
  std::string str() const {
    const void* nul = std::memchr(bytes.data(), 0, N);
    size_t len = nul ? static_cast<const uint8_t*>(nul) - bytes.data() : N;
    return std::string(reinterpret_cast<const char*>(bytes.data()), len);
  }
  bool empty() const { return bytes[0] == 0; }
  // Stores at most N - 1 characters and pads with zeros.
  void set(std::string_view text) {
    bytes.fill(0);
    size_t n = text.size() < N - 1 ? text.size() : N - 1;
    std::memcpy(bytes.data(), text.data(), n);
  }
  void clear() { bytes.fill(0); }
  static constexpr size_t capacity() { return N - 1; }
  bool operator==(const FixedText&) const = default;
};

}  // namespace cx
