#include "infrared/obex_text.h"

#include "platform/text_codec.h"

namespace cx::obex {
namespace {

void PutUnit(std::vector<uint8_t>& out, uint32_t unit) {
  out.push_back(static_cast<uint8_t>(unit >> 8));
  out.push_back(static_cast<uint8_t>(unit));
}

}  // namespace

std::vector<uint8_t> Utf8ToUtf16Be(std::string_view utf8) {
  std::vector<uint8_t> out;
  out.reserve(utf8.size() * 2);
  for (size_t i = 0; i < utf8.size();) {
    char32_t cp = NextCodePoint(utf8, i);
    if (cp >= 0x10000) {
      uint32_t v = cp - 0x10000;
      PutUnit(out, 0xD800 + (v >> 10));
      PutUnit(out, 0xDC00 + (v & 0x3FF));
    } else {
      PutUnit(out, cp);
    }
  }
  return out;
}

bool Utf16BeToUtf8(const uint8_t* data, size_t size, std::string& out) {
  out.clear();
  if (size % 2 != 0) return false;
  for (size_t i = 0; i + 1 < size; i += 2) {
    char32_t unit = static_cast<char32_t>(data[i] << 8 | data[i + 1]);
    if (unit == 0) break;
    if (unit >= 0xD800 && unit < 0xDC00 && i + 3 < size) {
      char32_t low = static_cast<char32_t>(data[i + 2] << 8 | data[i + 3]);
      if (low >= 0xDC00 && low < 0xE000) {
        AppendUtf8(out, 0x10000 + ((unit - 0xD800) << 10) + (low - 0xDC00));
        i += 2;
        continue;
      }
    }
    AppendUtf8(out, unit >= 0xD800 && unit < 0xE000 ? 0xFFFD : unit);
  }
  return true;
}

}  // namespace cx::obex
