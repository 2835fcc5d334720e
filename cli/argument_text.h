// Text from the command line: as a database stores it, or as a number.
#pragma once

#include <optional>
#include <string>

namespace cx::cli {

// Text from the command line in the form a database stores it (Windows-1252).
// False, with `error` naming `what` and the first character that code page
// cannot hold, instead of a "?" that would change the text without a word
// (and let a password of question marks be opened with any such text).
bool ToStoredText(const std::string& utf8, const std::string& what, std::string& out,
                  std::string& error);
// The same when only the answer matters: nothing for such a text.
std::optional<std::string> StoredTextOrNothing(const std::string& utf8);

// Parses a whole decimal number; nothing when the text is not one.
std::optional<long> ParseNumber(const std::string& text);

}  // namespace cx::cli
