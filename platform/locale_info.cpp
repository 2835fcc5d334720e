#include "platform/locale_info.h"

#include <cctype>

namespace cx {

char FirstSeparator(const std::string& pattern, char fallback) {
  for (char c : pattern) {
    if (!std::isalpha(static_cast<unsigned char>(c))) return c;
  }
  return fallback;
}

}  // namespace cx
