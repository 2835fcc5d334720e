// Text files that people exchange with other programs are UTF-8 today;
// databases hold Windows-1252. Exports, listings and reports widen on the
// way out and imports narrow on the way in, here, for the desktop and the
// command line alike.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ops/text_sink.h"

namespace cx {

enum class TextEncoding { kUtf8, kWindows1252 };

// "utf-8" or "windows-1252" (and the usual spellings of each, any case).
std::optional<TextEncoding> ParseTextEncoding(std::string_view name);

// A character of a UTF-8 text that a database cannot hold.
struct UnstorableCharacter {
  size_t line = 0;        // from 1
  std::string character;  // as UTF-8; a malformed byte as "\xNN"
};

struct NarrowedText {
  std::string bytes;  // Windows-1252; "?" where `unstorable` names a character
  // How many lines hold such characters, and the first of them (at most
  // kKeptLines lines, every such character of those lines).
  size_t unstorableLines = 0;
  std::vector<UnstorableCharacter> first;
  static constexpr size_t kKeptLines = 5;
  bool lossless() const { return unstorableLines == 0; }
};

// Reads a text file's bytes in `encoding` as database text. A UTF-8
// byte-order mark is dropped: editors on some systems begin files with
// one. Lines are counted at LF, so a CR LF file counts as its editor shows.
NarrowedText NarrowText(std::string_view text, TextEncoding encoding);
// The same, narrowing the bytes where they lie (no second copy of a large
// file).
NarrowedText NarrowTextInPlace(std::string&& bytes, TextEncoding encoding);

// One line per kept character, as `line 3: "Ω" cannot be stored`.
std::vector<std::string> DescribeUnstorable(const NarrowedText& text);

// Passes database text on to `target` in `encoding`. Each Windows-1252 byte
// widens on its own, so the text may arrive in pieces of any size.
class EncodingSink : public TextSink {
 public:
  EncodingSink(TextSink& target, TextEncoding encoding) : target_(target), encoding_(encoding) {}
  bool Write(std::string_view bytes) override;

 private:
  TextSink& target_;
  TextEncoding encoding_;
  std::string wide_;
};

}  // namespace cx
