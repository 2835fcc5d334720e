#include "ops/text_encoding.h"

#include <array>
#include <cctype>
#include <cstdio>

#include "platform/text_codec.h"

namespace cx {

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
  NarrowedText result;
  if (encoding == TextEncoding::kWindows1252) {
    result.bytes.assign(text);
    return result;
  }
  if (text.substr(0, 3) == "\xEF\xBB\xBF") text.remove_prefix(3);
  result.bytes.reserve(text.size());
  size_t line = 1, lastCounted = 0;
  size_t i = 0;
  while (i < text.size()) {
    const unsigned char c = static_cast<unsigned char>(text[i]);
    if (c < 0x80) {
      // Most of a CSV file is ASCII; it passes through without decoding.
      result.bytes += static_cast<char>(c);
      if (c == '\n') ++line;
      ++i;
      continue;
    }
    const size_t start = i;
    const char32_t cp = NextCodePoint(text, i);
    std::string_view sequence = text.substr(start, i - start);
    const bool malformed = cp == U'\uFFFD' && sequence != "\xEF\xBF\xBD";
    bool lossless = false;
    std::string narrow;
    if (!malformed) narrow = Utf8ToCp1252(sequence, &lossless);
    if (lossless) {
      result.bytes += narrow;
      continue;
    }
    result.bytes += '?';
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
  }
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
  // Exports write many short pieces, mostly ASCII: those pass unchanged,
  // and the others reuse one buffer rather than allocating each time.
  static const std::array<std::string, 128> kHigh = [] {
    std::array<std::string, 128> high;
    for (int b = 0; b < 128; ++b) high[b] = Cp1252ToUtf8(std::string(1, static_cast<char>(b + 128)));
    return high;
  }();
  size_t i = 0;
  while (i < bytes.size() && static_cast<unsigned char>(bytes[i]) < 0x80) ++i;
  if (i == bytes.size()) return target_.Write(bytes);
  wide_.assign(bytes.substr(0, i));
  for (; i < bytes.size(); ++i) {
    const unsigned char c = static_cast<unsigned char>(bytes[i]);
    if (c < 0x80) {
      wide_.push_back(static_cast<char>(c));
    } else {
      wide_ += kHigh[c - 128];
    }
  }
  return target_.Write(wide_);
}

}  // namespace cx
