// The view test: which records of the open database are shown and which
// are affected by every "within filter range" operation.
#pragma once

#include <cstdint>
#include <vector>

#include "engine/record_store.h"

namespace cx {

// Set when a database was opened from a Link field of another database:
// only records whose `field` holds `value` are in view.
struct LinkRestriction {
  int field = -1;
  uint32_t value = 0;
};

// RecordInView: 1 when record `index` passes the link restriction (if any)
// and the enabled filters, else 0.
int RecordInView(const Database& db, size_t index, const LinkRestriction* link = nullptr);

// RebuildView: the indexes of the records in view, in table order.
std::vector<uint32_t> RebuildView(const Database& db, const LinkRestriction* link = nullptr);

}  // namespace cx
