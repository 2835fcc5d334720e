// Texts in OBEX headers are UTF-16, most significant byte first, ending
// with a 16-bit zero; file names on this side are UTF-8.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace cx::obex {

// UTF-16 code units of `utf8`, each most significant byte first, without
// the terminating zero.
std::vector<uint8_t> Utf8ToUtf16Be(std::string_view utf8);

// Decodes UTF-16 (most significant byte first), stopping at a zero unit.
// False when the byte count is odd; an unpaired surrogate becomes U+FFFD.
bool Utf16BeToUtf8(const uint8_t* data, size_t size, std::string& out);

}  // namespace cx::obex
