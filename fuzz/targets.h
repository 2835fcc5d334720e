// The fuzz targets: each takes one input of arbitrary bytes, drives one of
// the paths that read bytes from outside (a database file, CSV text, beamed
// OBEX packets) and checks what must hold whatever the bytes are. A broken
// property aborts with a message, which libFuzzer reports as a crash and a
// test replaying the input reports as a failure.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace cx::fuzz {

// Opens the bytes as a database file, formats every value, round-trips the
// records through the editing form, saves, reopens and saves again.
int FuzzOpenDatabase(const uint8_t* data, size_t size);

// Opens the bytes as a database file and runs the data operations over it:
// sort, view with filters, find, recalculation, CSV export, reports.
int FuzzDataOperations(const uint8_t* data, size_t size);

// Reads the bytes as CSV lines and imports them into databases of every
// field type, then exports and checks the quoting round trip.
int FuzzCsv(const uint8_t* data, size_t size);

// Feeds the bytes to the OBEX receiver as what a peer sent.
int FuzzObexReceiver(const uint8_t* data, size_t size);

struct Target {
  std::string_view name;  // also the folder of its corpus and regressions
  int (*run)(const uint8_t* data, size_t size);
};

inline constexpr Target kTargets[] = {
    {"open", FuzzOpenDatabase},
    {"ops", FuzzDataOperations},
    {"csv", FuzzCsv},
    {"obex", FuzzObexReceiver},
};

}  // namespace cx::fuzz
