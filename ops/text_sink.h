// Where exports, listings and reports write their bytes: a file written
// safely, a string, or a stdio stream (the terminal wants UTF-8, files keep
// the 8-bit Windows-1252 bytes the database holds).
#pragma once

#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "platform/file_io.h"
#include "platform/status.h"

namespace cx {

// The file types offered when a listing or a report is saved as text.
inline constexpr const char* kTextFileTypes = "Text Files (*.txt)|*.txt|All Files (*.*)|*.*||";

class TextSink {
 public:
  virtual ~TextSink() = default;
  // False once writing has failed; later writes are ignored.
  virtual bool Write(std::string_view bytes) = 0;
};

class StringSink : public TextSink {
 public:
  bool Write(std::string_view bytes) override {
    text.append(bytes);
    return true;
  }
  std::string text;
};

// Bytes into a new version of a file that replaces the old one only when
// Commit() succeeds (nothing is left behind otherwise). Not flushed to disk:
// an export can always be made again, and waiting for the disk would make
// every export of a large database pay for it. A FIFO, a terminal or a
// device given as the file is written into, not replaced.
class FileSink : public TextSink {
 public:
  explicit FileSink(const std::string& path)
      : writer_(path, SafeFileWriter::Options{/*sync=*/false, /*writeIntoSpecialFiles=*/true}) {}
  Status Open() { return writer_.Open(); }
  bool Write(std::string_view bytes) override { return writer_.Write(bytes.data(), bytes.size()); }
  Status Commit() { return writer_.Commit(); }

 private:
  SafeFileWriter writer_;
};

// Whether text may be written to `path`: not over a database file of this
// program, nor over one of `inputs` (the files the text is made from). A
// slip in the order of two arguments would otherwise turn a database into
// a page of text. Callers that asked the user may write anyway.
Status CheckTextTarget(const std::string& path, const std::vector<std::string>& inputs);

// A stdio stream (stdout for the command-line tool). With `toUtf8` every
// byte is widened from Windows-1252 to UTF-8 on the way out.
class StdioSink : public TextSink {
 public:
  StdioSink(std::FILE* stream, bool toUtf8) : stream_(stream), toUtf8_(toUtf8) {}
  bool Write(std::string_view bytes) override;
  bool ok() const { return ok_; }

 private:
  std::FILE* stream_;
  bool toUtf8_;
  bool ok_ = true;
};

}  // namespace cx
