#include "infrared/received_name.h"

#include <cctype>

namespace cx::obex {

std::string SafeFileName(const std::string& name) {
  size_t slash = name.find_last_of("/\\");
  std::string base = slash == std::string::npos ? name : name.substr(slash + 1);
  if (base.empty() || base.size() > 255 || base.front() == '.') return "";
  for (unsigned char c : base) {
    if (c < 0x20 || c == 0x7F) return "";
  }
  return base;
}

bool HasExtension(const std::string& name, const std::string& extension) {
  if (name.size() <= extension.size()) return false;
  size_t start = name.size() - extension.size();
  for (size_t i = 0; i < extension.size(); ++i) {
    if (std::tolower(static_cast<unsigned char>(name[start + i])) !=
        std::tolower(static_cast<unsigned char>(extension[i]))) {
      return false;
    }
  }
  return true;
}

std::string StemOf(const std::string& name) {
  size_t dot = name.rfind('.');
  return dot == std::string::npos || dot == 0 ? name : name.substr(0, dot);
}

}  // namespace cx::obex
