// Databases made up for benchmarks, hardening tests and fuzz seeds: one
// field of every type (two Calculated fields, one of them a running total
// over the previous record), values drawn from a seeded generator so that
// the same options always give the same bytes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <random>
#include <string>

#include "engine/record_store.h"
#include "platform/clock.h"
#include "platform/status.h"

namespace cx::bench {

// Field slots of the generated schema; slots 18 to 29 are Not-Used.
enum Slot : int {
  kName = 0,     // Text, 40
  kQuantity,     // Integer
  kPrice,        // Float, 2 places
  kColor,        // Pop-Up, 12 entries
  kPaid,         // Check-Box
  kId,           // Unique
  kPhoto,        // Image, a picture in one record of 100
  kBorn,         // Date
  kAt,           // Time
  kCustomer,     // Link
  kOrder,        // Linked
  kNotes,        // Note
  kDetails,      // Heading
  kSupplier,     // DB Popup
  kTotal,        // Calculated: Quantity * Price, 2 places
  kRunning,      // Calculated: previous Running + Quantity, whole number
  kCity,         // Text, 30
  kRating,       // Integer, 1 to 5
  kSlotCount
};

struct GeneratorOptions {
  size_t records = 1000;        // at most 65504
  uint32_t seed = 1;
  bool extension = false;       // every record carries the 20-byte prefix extension
  size_t maxNoteLength = 300;   // Note texts are 0 to this many characters
  size_t pictureEvery = 100;    // one record in this many has a picture (0: none)
};

Schema GeneratedSchema(bool extension = false);
// The popup lists of the generated schema (the Color entries).
PopupLists GeneratedPopups();

// One record in stored form, record `index` of a generated database.
Bytes GenerateRecord(const Schema& schema, size_t index, std::mt19937& rng,
                     const GeneratorOptions& options, int64_t& runningTotal);

// A generated database in memory, its path set to `path` (not written).
Database GenerateDatabase(const std::string& path, const GeneratorOptions& options);

// Generates and saves; the file's dates come from `clock`.
Status GenerateFile(const std::string& path, const GeneratorOptions& options,
                    const Clock& clock = DefaultClock());

}  // namespace cx::bench
