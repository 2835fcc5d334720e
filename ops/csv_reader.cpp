#include "ops/csv_reader.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

namespace cx {
namespace {

constexpr size_t kBufferSize = 64 * 1024;
constexpr int kEnd = -1;

bool IsLineEnd(int c) { return c == '\r' || c == '\n' || c == 0; }

// After the CR or LF that ended a line, takes the other one of a CR LF or
// LF CR pair.
void TakePairedLineEnd(CsvStream& in, int first) {
  if (first != '\r' && first != '\n') return;
  int next = in.Get();
  if (next == kEnd) return;
  if ((first == '\r' && next != '\n') || (first == '\n' && next != '\r')) in.Unget();
}

// Collects fields; with no line given only the bytes are walked.
class FieldCollector {
 public:
  explicit FieldCollector(CsvLine* line) : line_(line) {
    if (line_) {
      line_->found = 0;
      line_->openQuote = false;
      line_->innerLineEnds = 0;
    }
  }
  void OpenQuoteAtEnd() {
    if (line_) line_->openQuote = true;
  }
  void InnerLineEnd() {
    if (line_) ++line_->innerLineEnds;
  }
  void Add(char c) {
    if (line_) current_.push_back(c);
  }
  void Add(std::string_view run) {
    if (line_) current_.append(run);
  }
  void Emit() {
    if (!line_) return;
    if (line_->found < line_->fields.size()) {
      line_->fields[line_->found].swap(current_);
    } else {
      line_->fields.push_back(std::move(current_));
    }
    current_.clear();
    ++line_->found;
  }
  void Finish() {
    if (!line_) return;
    size_t size = line_->found < csv::kMinimumFields ? csv::kMinimumFields : line_->found;
    line_->fields.resize(size);
    for (size_t i = line_->found; i < size; ++i) line_->fields[i].clear();
  }

 private:
  CsvLine* line_;
  std::string current_;
};

// The line state machine shared by measuring and reading. Returns the
// number of bytes taken from the stream.
uint64_t WalkLine(CsvStream& in, char separator, CsvLine* line) {
  enum class State { Between, Unquoted, Quoted };
  const int sep = static_cast<unsigned char>(separator);
  const uint64_t start = in.Tell();
  FieldCollector out(line);
  State state = State::Between;
  int previous = kEnd, last = kEnd;
  for (;;) {
    if (state != State::Between) {
      const std::string_view run = in.TakeOrdinary(sep, state == State::Quoted);
      if (!run.empty()) last = static_cast<unsigned char>(run.back());
      out.Add(run);
    }
    const int c = in.Get();
    previous = std::exchange(last, c);
    if (state == State::Between) {
      if (c == kEnd) break;
      if (c == sep) {
        out.Emit();
      } else if (IsLineEnd(c)) {
        TakePairedLineEnd(in, c);
        break;
      } else if (c == csv::kQuote) {
        state = State::Quoted;
      } else {
        out.Add(static_cast<char>(c));
        state = State::Unquoted;
      }
    } else if (state == State::Unquoted) {
      if (c == sep) {
        out.Emit();
        // A quote right after the separator opens the next field quoted;
        // anything else is read again as the next field's first character.
        int next = in.Get();
        if (next == csv::kQuote) {
          state = State::Quoted;
        } else if (next != kEnd) {
          in.Unget();
        }
      } else if (c == kEnd || IsLineEnd(c)) {
        out.Emit();
        TakePairedLineEnd(in, c);
        break;
      } else if (c == csv::kQuote) {
        state = State::Quoted;  // the quote itself is dropped
      } else {
        out.Add(static_cast<char>(c));
      }
    } else {  // Quoted
      if (c == kEnd) {
        out.OpenQuoteAtEnd();
        out.Emit();
        break;
      }
      if (c == csv::kQuote) {
        int next = in.Get();
        if (next == csv::kQuote) {
          out.Add(csv::kQuote);
        } else {
          out.Emit();
          state = State::Between;
          if (next != sep && next != kEnd) in.Unget();
        }
      } else if (IsLineEnd(c)) {
        out.Add('\r');
        if (c != 0 && !(c == '\n' && previous == '\r')) out.InnerLineEnd();
      } else {
        out.Add(static_cast<char>(c));
      }
    }
  }
  out.Finish();
  return in.Tell() - start;
}

}  // namespace

CsvStream::CsvStream(std::string text) : buffer_(text.begin(), text.end()), length_(buffer_.size()) {}

CsvStream::~CsvStream() {
  if (file_) std::fclose(file_);
}

Status CsvStream::Open(const std::string& path) {
  if (file_) std::fclose(file_);
  file_ = std::fopen(path.c_str(), "rb");
  if (!file_) return Status::Error("Cannot open " + path + ": " + std::strerror(errno));
  buffer_.assign(kBufferSize, 0);
  bufferStart_ = 0;
  pos_ = length_ = 0;
  failed_ = false;
  return Status::Ok();
}

bool CsvStream::Refill() {
  if (!file_) return false;
  bufferStart_ += length_;
  pos_ = length_ = 0;
  length_ = std::fread(buffer_.data(), 1, buffer_.size(), file_);
  if (length_ == 0 && std::ferror(file_)) failed_ = true;
  return length_ > 0;
}

int CsvStream::Get() {
  if (pos_ == length_ && !Refill()) {
    canUnget_ = false;
    return kEnd;
  }
  canUnget_ = true;
  return static_cast<unsigned char>(buffer_[pos_++]);
}

std::string_view CsvStream::TakeOrdinary(int separator, bool quoted) {
  if (separator != tableSeparator_) {
    for (int q = 0; q < 2; ++q) {
      bool* stop = stops_[q];
      std::fill(stop, stop + 256, false);
      stop[static_cast<unsigned char>(csv::kQuote)] = stop[int{'\r'}] = stop[int{'\n'}] = stop[0] = true;
      if (q == 0 && separator >= 0 && separator < 256) stop[separator] = true;
    }
    tableSeparator_ = separator;
  }
  const bool* stop = stops_[quoted ? 1 : 0];
  const size_t start = pos_;
  while (pos_ < length_ && !stop[static_cast<unsigned char>(buffer_[pos_])]) ++pos_;
  if (pos_ != start) canUnget_ = false;
  return std::string_view(buffer_.data() + start, pos_ - start);
}

void CsvStream::Unget() {
  if (canUnget_ && pos_ > 0) --pos_;
  canUnget_ = false;  // only once
}

void CsvStream::Seek(uint64_t position) {
  canUnget_ = false;
  if (position >= bufferStart_ && position <= bufferStart_ + length_) {
    pos_ = static_cast<size_t>(position - bufferStart_);
    return;
  }
  if (!file_) {
    pos_ = length_;
    return;
  }
  if (::fseeko(file_, static_cast<off_t>(position), SEEK_SET) != 0) failed_ = true;
  bufferStart_ = position;
  pos_ = length_ = 0;
}

const std::string& CsvLine::Field(size_t n) const {
  static const std::string kEmpty;
  return n < fields.size() ? fields[n] : kEmpty;
}

uint64_t MeasureCsvLine(CsvStream& in, char separator) { return WalkLine(in, separator, nullptr); }

bool ReadCsvLine(CsvStream& in, CsvLine& line, char separator) {
  if (WalkLine(in, separator, &line) == 0) {
    line.found = 0;
    line.fields.assign(csv::kMinimumFields, std::string());
    return false;
  }
  return true;
}

}  // namespace cx
