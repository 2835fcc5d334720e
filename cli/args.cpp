#include "cli/args.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "platform/text_codec.h"

namespace cx::cli {

Args::Args(const std::vector<std::string>& args, const std::set<std::string>& withValue,
           const std::set<std::string>& flags) {
  bool optionsDone = false;
  for (size_t i = 0; i < args.size(); ++i) {
    const std::string& a = args[i];
    if (optionsDone || a.size() < 2 || a[0] != '-' || a == "-") {
      positional_.push_back(a);
      continue;
    }
    if (a == "--") {
      optionsDone = true;
      continue;
    }
    std::string name = a;
    std::optional<std::string> inlineValue;
    if (size_t eq = a.find('='); eq != std::string::npos && a.rfind("--", 0) == 0) {
      name = a.substr(0, eq);
      inlineValue = a.substr(eq + 1);
    }
    if (withValue.count(name)) {
      if (inlineValue) {
        values_[name].push_back(*inlineValue);
      } else if (i + 1 < args.size()) {
        values_[name].push_back(args[++i]);
      } else {
        error_ = "option " + name + " needs a value";
        return;
      }
    } else if (flags.count(name) && !inlineValue) {
      values_[name].push_back("");
    } else {
      error_ = "unknown option " + a;
      return;
    }
  }
}

std::optional<std::string> Args::value(const std::string& name) const {
  auto it = values_.find(name);
  if (it == values_.end() || it->second.empty()) return std::nullopt;
  return it->second.back();
}

const std::vector<std::string>& Args::values(const std::string& name) const {
  static const std::vector<std::string> kNone;
  auto it = values_.find(name);
  return it == values_.end() ? kNone : it->second;
}

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
