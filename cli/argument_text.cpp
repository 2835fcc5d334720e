#include "cli/argument_text.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "platform/text_codec.h"

namespace cx::cli {

bool ToStoredText(const std::string& utf8, const std::string& what, std::string& out,
                  std::string& error) {
  bool lossless = true;
  std::string converted = Utf8ToCp1252(utf8, &lossless);
  if (lossless) {
    out = std::move(converted);
    return true;
  }
  for (size_t i = 0; i < utf8.size();) {
    const size_t start = i;
    const char32_t cp = NextCodePoint(utf8, i);
    bool one = true;
    Utf8ToCp1252(std::string_view(utf8).substr(start, i - start), &one);
    if (one) continue;
    const std::string shown = utf8.substr(start, i - start);
    const bool malformed = cp == 0xFFFD && shown != "\xEF\xBF\xBD";
    char code[16];
    std::snprintf(code, sizeof code, "U+%04X", static_cast<unsigned>(cp));
    error = what + " cannot be stored: " +
            (malformed ? std::string("it is not valid UTF-8")
                       : "\"" + shown + "\" (" + code +
                                ") is not a Windows-1252 character") +
            "; a database holds only Windows-1252 text";
    return false;
  }
  error = what + " cannot be stored in a database";
  return false;
}

std::optional<std::string> StoredTextOrNothing(const std::string& utf8) {
  bool lossless = true;
  std::string converted = Utf8ToCp1252(utf8, &lossless);
  if (!lossless) return std::nullopt;
  return converted;
}

std::optional<long> ParseNumber(const std::string& text) {
  if (text.empty()) return std::nullopt;
  errno = 0;
  char* end = nullptr;
  long v = std::strtol(text.c_str(), &end, 10);
  if (errno != 0 || *end != '\0') return std::nullopt;
  return v;
}

}  // namespace cx::cli
