// The view test: which records of the open database are shown and which
// are affected by every "within filter range" operation. It combines, in
// this order, the link restriction, filter 1 and filter 2.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "engine/record_store.h"
#include "ops/database_settings.h"

namespace cx {

// Set when a database was opened from a Link field of another database:
// only records whose `field` holds `value` are in view.
struct LinkRestriction {
  int field = -1;
  uint32_t value = 0;
};

// RecordInView: 1 when record `index` passes the link restriction (if any)
// and the enabled filters, else 0 (also for an index past the table).
int RecordInView(const Database& db, size_t index, const LinkRestriction* link = nullptr);

// FilterTest: 1 when `record` passes filter `filterNumber` (1 or 2) on its
// own, ignoring whether the filter is enabled and its NOT flag.
int FilterTest(const Database& db, int filterNumber, ByteView record);

// RebuildView: the indexes of the records in view, in table order.
std::vector<uint32_t> RebuildView(const Database& db, const LinkRestriction* link = nullptr);

// The view test prepared once for many records: the filter settings are
// decoded and their limits converted a single time. It reads each record
// as it is when asked, so records may change between calls; the filter
// settings and the schema must not.
class ViewTester {
 public:
  ViewTester(const Database& db, const LinkRestriction* link);

  bool InView(size_t index) const;
  // One filter (0 or 1) on its own.
  bool PassesFilter(int n, ByteView record) const;
  // True when a filter is enabled or a link restriction is present: then
  // "the records within filter range" are not simply all records.
  bool Restricted() const { return settings_.AnyEnabled() || link_.has_value(); }
  const FilterSettings& settings() const { return settings_; }

 private:
  struct Limits {
    std::string needle;  // lower-cased "Must Contain"
    double lowerValue = 0;
    double upperValue = 0;
  };

  const Database& db_;
  std::optional<LinkRestriction> link_;
  FilterSettings settings_;
  std::array<Limits, 2> limits_;
};

}  // namespace cx
