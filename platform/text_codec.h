// Files hold 8-bit Windows-1252 text; the terminal and the GUI work in
// Unicode. These convert at that edge.
#pragma once

#include <string>
#include <string_view>

namespace cx {

// Each byte becomes its Windows-1252 character, as UTF-8. The five bytes
// that code page leaves undefined (0x81, 0x8D, 0x8F, 0x90, 0x9D) map to the
// C1 control of the same number so that no byte is ever lost.
std::string Cp1252ToUtf8(std::string_view bytes);

// A message for the user: the system's texts and database contents in
// Windows-1252, with file names in the file system's UTF-8 put in. Each
// well-formed multi-byte UTF-8 sequence is taken as the character it
// encodes, every other byte as its Windows-1252 character. Only a
// Windows-1252 text holding a letter from A-circumflex to
// o-circumflex directly followed by symbols from 0x80 to 0xBF reads
// differently, which
// words hardly ever do; no byte is ever dropped.
std::string MessageToUtf8(std::string_view bytes);

// The inverse of Cp1252ToUtf8. A character outside Windows-1252 becomes '?', and so does
// each byte of malformed UTF-8. `lossless`, when given, says whether every
// character could be kept.
std::string Utf8ToCp1252(std::string_view utf8, bool* lossless = nullptr);

// Decodes one UTF-8 sequence at `i` (advancing it); returns U+FFFD for a
// malformed sequence.
char32_t NextCodePoint(std::string_view utf8, size_t& i);
void AppendUtf8(std::string& out, char32_t cp);

}  // namespace cx
