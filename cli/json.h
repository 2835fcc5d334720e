// A small JSON writer for --json output. Strings given to it are UTF-8.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

namespace cx::cli {

class JsonWriter {
 public:
  explicit JsonWriter(std::ostream& out) : out_(out) {}

  JsonWriter& BeginObject();
  JsonWriter& EndObject();
  JsonWriter& BeginArray();
  JsonWriter& EndArray();
  JsonWriter& Key(const std::string& key);
  JsonWriter& String(const std::string& value);
  JsonWriter& Number(int64_t value);
  JsonWriter& Bool(bool value);
  JsonWriter& Null();
  // The shortest text that reads back as `value`, with "." whatever the
  // locale; a value that is not finite becomes null.
  JsonWriter& Double(double value);
  // Ends the document with a newline.
  void Finish();

  static std::string Escape(const std::string& utf8);

 private:
  void Separate();
  std::ostream& out_;
  std::vector<bool> first_{true};
  bool afterKey_ = false;
};

}  // namespace cx::cli
