// The reader of comma-separated lines. Its quoting rules are those of the
// files other programs and older versions have written, including their
// oddities: a line end inside a quoted value reads as one CR each, and a
// separator right after a closing quote belongs to that quote.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "ops/csv_format.h"
#include "platform/status.h"

namespace cx {

// A byte stream over a file (or a text in memory) that can give back one
// character and return to a remembered position. Buffered: the reader goes
// through the file once, whatever its size.
class CsvStream {
 public:
  // Reads `text` from memory.
  explicit CsvStream(std::string text);
  // Reads the file; check Open() before use.
  CsvStream() = default;
  ~CsvStream();
  CsvStream(const CsvStream&) = delete;
  CsvStream& operator=(const CsvStream&) = delete;

  Status Open(const std::string& path);

  // The next byte (0-255), or -1 at the end.
  int Get();
  // Gives back the byte the last Get() returned (not the end), once.
  void Unget();
  uint64_t Tell() const { return bufferStart_ + pos_; }
  // Takes the bytes that follow in the buffer as long as they are ordinary
  // characters of a field: not a double quote, CR, LF or zero byte, and
  // (outside quotes) not the separator. Lets the reader move through long
  // values without a call per byte; what it takes is never given back.
  std::string_view TakeOrdinary(int separator, bool quoted);
  void Seek(uint64_t position);
  // True when reading the file failed (as opposed to reaching its end).
  bool failed() const { return failed_; }

 private:
  bool Refill();

  std::FILE* file_ = nullptr;
  std::vector<char> buffer_;
  uint64_t bufferStart_ = 0;  // file offset of buffer_[0]
  size_t pos_ = 0;
  size_t length_ = 0;
  bool canUnget_ = false;
  bool failed_ = false;
  // Which bytes end an ordinary run, for the separator last asked about
  // (outside quotes, inside quotes).
  int tableSeparator_ = -1;
  bool stops_[2][256] = {};
};

// One parsed line: the field texts (never fewer than 30; the missing
// trailing ones are empty) and how many fields the line really held.
struct CsvLine {
  std::vector<std::string> fields;
  size_t found = 0;
  // A quoted value was still open at the end of the file: it took in
  // every line after its opening quote.
  bool openQuote = false;
  // Line ends read inside quoted values (a CR LF pair counting once), so
  // that lines of the file can be told from lines of the table.
  size_t innerLineEnds = 0;

  // The nth text; empty past the end.
  const std::string& Field(size_t n) const;
};

// MeasureCsvLine: the length in bytes of the next line including its line
// end (a CR LF or LF CR pair counting as one), by the reading rules; 0 at
// the end of the stream. The stream is left after the line.
uint64_t MeasureCsvLine(CsvStream& in, char separator = ',');

// ReadCsvLine: reads the next line into `line` (its previous contents are
// dropped) and leaves the stream at the start of the following line. False
// at the end of the stream (nothing left to read).
bool ReadCsvLine(CsvStream& in, CsvLine& line, char separator = ',');

}  // namespace cx
