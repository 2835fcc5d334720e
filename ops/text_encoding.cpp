#include "ops/text_encoding.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdint>
#include <cstdio>
#include <cstring>

#include "platform/text_codec.h"

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace cx {
namespace {

// The UTF-8 form of a Windows-1252 byte from 0x80 up (two or three bytes).
struct WideByte {
  uint8_t size = 0;
  char bytes[3] = {0, 0, 0};
};

const std::array<WideByte, 128>& HighBytes() {
  static const std::array<WideByte, 128> table = [] {
    std::array<WideByte, 128> t;
    for (int b = 0; b < 128; ++b) {
      const std::string wide = Cp1252ToUtf8(std::string(1, static_cast<char>(b + 0x80)));
      t[b].size = static_cast<uint8_t>(wide.size());
      std::memcpy(t[b].bytes, wide.data(), wide.size());
    }
    return t;
  }();
  return table;
}

// Where the first byte from 0x80 up lies at or after `from`, or the size.
// Export text is nearly all ASCII, so it is scanned 16 bytes at a time.
size_t FirstHighByte(std::string_view text, size_t from) {
  size_t i = from;
#if defined(__SSE2__)
  for (; i + 16 <= text.size(); i += 16) {
    const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text.data() + i));
    if (const unsigned mask = static_cast<unsigned>(_mm_movemask_epi8(v))) {
      return i + static_cast<size_t>(__builtin_ctz(mask));
    }
  }
#endif
  for (; i < text.size(); ++i) {
    if (static_cast<unsigned char>(text[i]) >= 0x80) return i;
  }
  return text.size();
}

}  // namespace

std::optional<TextEncoding> ParseTextEncoding(std::string_view name) {
  std::string folded;
  for (char c : name) {
    if (c != '-' && c != '_') folded += static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  }
  if (folded == "utf8") return TextEncoding::kUtf8;
  if (folded == "windows1252" || folded == "cp1252") return TextEncoding::kWindows1252;
  return std::nullopt;
}

NarrowedText NarrowText(std::string_view text, TextEncoding encoding) {
  return NarrowTextInPlace(std::string(text), encoding);
}

NarrowedText NarrowTextInPlace(std::string&& bytes, TextEncoding encoding) {
  NarrowedText result;
  if (encoding == TextEncoding::kWindows1252) {
    result.bytes = std::move(bytes);
    return result;
  }
  // Narrowed where it lies: a character never takes more bytes in the
  // code page than in UTF-8, so what is written never overtakes what is
  // still to be read.
  std::string& text = bytes;
  const std::string_view all(text);
  size_t in = all.substr(0, 3) == "\xEF\xBB\xBF" ? 3 : 0;
  size_t out = 0;
  size_t line = 1, lastCounted = 0;
  while (in < text.size()) {
    const unsigned char c = static_cast<unsigned char>(text[in]);
    if (c < 0x80) {
      // Most of a CSV file is ASCII: it passes through a run at a time,
      // without decoding.
      const size_t end = FirstHighByte(all, in);
      line += static_cast<size_t>(std::count(all.begin() + static_cast<std::ptrdiff_t>(in),
                                             all.begin() + static_cast<std::ptrdiff_t>(end), '\n'));
      if (out != in) std::memmove(text.data() + out, text.data() + in, end - in);
      out += end - in;
      in = end;
      continue;
    }
    const size_t start = in;
    const char32_t cp = NextCodePoint(all, in);
    const std::string_view sequence = all.substr(start, in - start);
    const bool malformed = cp == U'\uFFFD' && sequence != "\xEF\xBF\xBD";
    bool lossless = false;
    std::string narrow;
    if (!malformed) narrow = Utf8ToCp1252(sequence, &lossless);
    if (!lossless) {
      if (lastCounted != line) {
        ++result.unstorableLines;
        lastCounted = line;
      }
      if (result.unstorableLines <= NarrowedText::kKeptLines) {
        UnstorableCharacter u;
        u.line = line;
        if (malformed) {
          char hex[8];
          std::snprintf(hex, sizeof hex, "\\x%02X", static_cast<unsigned>(c));
          u.character = hex;
        } else {
          u.character.assign(sequence);
        }
        result.first.push_back(std::move(u));
      }
      narrow = "?";
    }
    // Only now that the sequence has been read may its place be written.
    std::memcpy(text.data() + out, narrow.data(), narrow.size());
    out += narrow.size();
  }
  text.resize(out);
  result.bytes = std::move(text);
  return result;
}

std::vector<std::string> DescribeUnstorable(const NarrowedText& text) {
  std::vector<std::string> lines;
  for (const UnstorableCharacter& u : text.first) {
    lines.push_back("line " + std::to_string(u.line) + ": \"" + u.character +
                    "\" cannot be stored in a database");
  }
  return lines;
}

bool EncodingSink::Write(std::string_view bytes) {
  if (encoding_ == TextEncoding::kWindows1252) return target_.Write(bytes);
  size_t i = FirstHighByte(bytes, 0);
  if (i == bytes.size()) return target_.Write(bytes);
  // A byte widens to at most three; the buffer only ever grows, so that
  // the many blocks of an export reuse it without clearing it each time.
  if (wide_.size() < bytes.size() * 3) wide_.resize(bytes.size() * 3);
  const auto& high = HighBytes();
  char* out = wide_.data();
  std::memcpy(out, bytes.data(), i);
  out += i;
  while (i < bytes.size()) {
    const auto c = static_cast<unsigned char>(bytes[i]);
    if (c >= 0x80) {
      const WideByte& w = high[c - 0x80];
      std::memcpy(out, w.bytes, sizeof w.bytes);
      out += w.size;
      ++i;
      continue;
    }
    const size_t next = FirstHighByte(bytes, i);
    std::memcpy(out, bytes.data() + i, next - i);
    out += next - i;
    i = next;
  }
  return target_.Write(std::string_view(wide_.data(), static_cast<size_t>(out - wide_.data())));
}

}  // namespace cx
