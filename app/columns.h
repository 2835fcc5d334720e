// The list's columns: which fields have one, in which order, and the
// conversion between the widths stored in the file and screen pixels.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

#include "engine/schema.h"

namespace cx {

// The largest width a field may be given by auto fit, in stored units.
inline constexpr int kMaxStoredWidth = 160;
// A Check-Box column's value width in pixels (the box image and margin).
inline constexpr int kCheckBoxValuePixels = 16;
// Room given to a heading beside its text.
inline constexpr int kHeadingPadding = 13;

// Stored width x 1.5 and pixels x 2/3, each truncated toward zero.
int PixelsFromStored(int stored);
int StoredFromPixels(int pixels);

// One column of the list: the field it shows and its width in pixels
// (stored width x 1.5).
struct ListColumn {
  int field = -1;
  int pixels = 0;
};

// The fields of the field order whose stored width is not 0, left to right.
std::vector<ListColumn> ListColumns(const Schema& schema);
// The field of list column `column`; -1 when no field maps to it.
int FieldOfListColumn(const Schema& schema, int column);

// The stored width auto fit gives a field: the widest of its values
// (`valueCount` of them, read through `valueText`; a Check-Box counts 16
// pixels) and its heading's extent + 13; then (pixels + 2) x 2/3, capped at
// 160. `measure` gives a text's pixel extent in the list's font.
int AutoFitStoredWidth(const Schema& schema, int field, size_t valueCount,
                       const std::function<std::string(size_t)>& valueText,
                       const std::function<int(const std::string&)>& measure);

}  // namespace cx
