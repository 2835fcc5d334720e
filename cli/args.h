// Options of one command: "--name VALUE" (or "--name=VALUE"), "--flag",
// "-o VALUE", and positional arguments. "--" ends the options.
#pragma once

#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

namespace cx::cli {

class Args {
 public:
  Args(const std::vector<std::string>& args, const std::set<std::string>& withValue,
       const std::set<std::string>& flags);

  bool ok() const { return error_.empty(); }
  const std::string& error() const { return error_; }
  const std::vector<std::string>& positional() const { return positional_; }
  bool has(const std::string& name) const { return values_.count(name) > 0; }
  std::optional<std::string> value(const std::string& name) const;
  const std::vector<std::string>& values(const std::string& name) const;

 private:
  std::vector<std::string> positional_;
  std::map<std::string, std::vector<std::string>> values_;
  std::string error_;
};

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
