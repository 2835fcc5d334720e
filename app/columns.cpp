#include "app/columns.h"

#include <algorithm>

#include "engine/field_types.h"

namespace cx {

// Both conversions go through the same double the file's other readers use,
// so a width survives a round trip exactly as it does there.
int PixelsFromStored(int stored) { return static_cast<int>(stored * 1.5); }
int StoredFromPixels(int pixels) { return static_cast<int>(pixels * 0.6666666666666666); }

std::vector<ListColumn> ListColumns(const Schema& schema) {
  std::vector<ListColumn> columns;
  for (uint8_t field : schema.fieldOrder) {
    if (field >= format::kFieldCount) continue;
    const int width = schema.field[field].width;
    if (width == 0) continue;
    columns.push_back({field, PixelsFromStored(width)});
  }
  return columns;
}

int FieldOfListColumn(const Schema& schema, int column) {
  if (column < 0) return -1;
  int n = 0;
  for (uint8_t field : schema.fieldOrder) {
    if (field >= format::kFieldCount || schema.field[field].width == 0) continue;
    if (n++ == column) return field;
  }
  return -1;
}

int AutoFitStoredWidth(const Schema& schema, int field, size_t valueCount,
                       const std::function<std::string(size_t)>& valueText,
                       const std::function<int(const std::string&)>& measure) {
  const FieldDef& def = schema.field[field];
  int valueWidth = -1;
  if (def.type() == FieldType::CheckBox) {
    valueWidth = kCheckBoxValuePixels;
  } else {
    for (size_t i = 0; i < valueCount; ++i) valueWidth = std::max(valueWidth, measure(valueText(i)));
  }
  const int headingWidth = measure(def.name.str()) + kHeadingPadding;
  const int widest = std::max(valueWidth, headingWidth);
  if (widest == -1) return def.width;
  return std::min(StoredFromPixels(widest + 2), kMaxStoredWidth);
}

}  // namespace cx
