#include "engine/field_types.h"

#include <array>
#include <cctype>

namespace cx {
namespace {

constexpr std::array<std::string_view, kFieldTypeCount> kLabels = {
    "Not-Used", "Text",  "Integer", "Float", "Pop-Up", "Check-Box", "Unique",  "Image",
    "Date",     "Time",  "Link",    "Linked", "Note",  "Heading",   "DB Popup", "Calculated"};

}  // namespace

std::string SimplifiedLabel(std::string_view s) {
  std::string out;
  for (char c : s) {
    if (std::isalnum(static_cast<unsigned char>(c))) {
      out.push_back(static_cast<char>(std::tolower(static_cast<unsigned char>(c))));
    }
  }
  return out;
}

std::string_view FieldTypeLabel(FieldType type) {
  auto n = static_cast<int>(type);
  return n >= 0 && n < kFieldTypeCount ? kLabels[n] : kLabels[0];
}

std::optional<FieldType> FieldTypeFromLabel(std::string_view label) {
  std::string wanted = SimplifiedLabel(label);
  for (int i = 0; i < kFieldTypeCount; ++i) {
    if (SimplifiedLabel(kLabels[i]) == wanted) return static_cast<FieldType>(i);
  }
  return std::nullopt;
}

}  // namespace cx
