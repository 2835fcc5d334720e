// Values for scripts: what a record holds in the type JSON gives it,
// the same whatever the regional settings.
#pragma once

#include <cstdint>
#include <string>

#include "cli/json.h"
#include "engine/popups.h"
#include "engine/record.h"
#include "engine/schema.h"

namespace cx::cli {

// Numbers as numbers, check boxes as booleans, dates as "YYYY-MM-DD",
// times as "HH:MM:SS", pop-ups and texts as strings, no value (an empty
// text, "No Value", "NO DATE", "No Time", a missing slot, Image and
// Heading fields) as null.
// "YYYY-MM-DD" of a stored day number, and "HH:MM:SS".
std::string IsoDateText(uint32_t dayNumber);
std::string ClockText(long hours, long minutes, long seconds);

void WriteTypedValue(JsonWriter& json, const Schema& schema, const PopupLists& popups,
                     ByteView record, int slot);

}  // namespace cx::cli
