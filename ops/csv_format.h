// Constants of the comma-separated text that export writes and import
// reads, and the program-wide settings that shape it.
#pragma once

#include <cstddef>

namespace cx {

namespace csv {
constexpr char kQuote = '"';
constexpr char kLineEnd = '\n';        // written after every line
constexpr size_t kMinimumFields = 30;  // a parsed line always holds this many
constexpr size_t kMaxValueText = 4095; // a value is cut to this many bytes on export
}  // namespace csv

// Program-wide CSV settings, set up once at start-up and passed to every
// export and import.
struct CsvSettings {
  char separator = ',';
  // Quotes the names of the header line (data values follow the export's
  // own quoteAll switch).
  bool alwaysQuote = false;
};

}  // namespace cx
