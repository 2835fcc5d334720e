#include "cli/json.h"

#include <charconv>
#include <cmath>
#include <cstdio>

namespace cx::cli {

std::string JsonWriter::Escape(const std::string& s) {
  std::string out = "\"";
  for (unsigned char c : s) {
    switch (c) {
      case '"': out += "\\\""; break;
      case '\\': out += "\\\\"; break;
      case '\n': out += "\\n"; break;
      case '\r': out += "\\r"; break;
      case '\t': out += "\\t"; break;
      default:
        if (c < 0x20) {
          char buf[8];
          std::snprintf(buf, sizeof buf, "\\u%04x", c);
          out += buf;
        } else {
          out.push_back(static_cast<char>(c));
        }
    }
  }
  return out + "\"";
}

void JsonWriter::Separate() {
  if (afterKey_) {
    afterKey_ = false;
    return;
  }
  if (!first_.back()) out_ << ",";
  first_.back() = false;
}

JsonWriter& JsonWriter::BeginObject() {
  Separate();
  out_ << "{";
  first_.push_back(true);
  return *this;
}
JsonWriter& JsonWriter::EndObject() {
  first_.pop_back();
  out_ << "}";
  return *this;
}
JsonWriter& JsonWriter::BeginArray() {
  Separate();
  out_ << "[";
  first_.push_back(true);
  return *this;
}
JsonWriter& JsonWriter::EndArray() {
  first_.pop_back();
  out_ << "]";
  return *this;
}
JsonWriter& JsonWriter::Key(const std::string& key) {
  Separate();
  out_ << Escape(key) << ":";
  afterKey_ = true;
  return *this;
}
JsonWriter& JsonWriter::String(const std::string& value) {
  Separate();
  out_ << Escape(value);
  return *this;
}
JsonWriter& JsonWriter::Number(int64_t value) {
  Separate();
  out_ << value;
  return *this;
}
JsonWriter& JsonWriter::Bool(bool value) {
  Separate();
  out_ << (value ? "true" : "false");
  return *this;
}
JsonWriter& JsonWriter::Null() {
  Separate();
  out_ << "null";
  return *this;
}
JsonWriter& JsonWriter::Double(double value) {
  if (!std::isfinite(value)) return Null();
  Separate();
  char buf[32];
  auto end = std::to_chars(buf, buf + sizeof buf, value).ptr;
  out_.write(buf, end - buf);
  return *this;
}
void JsonWriter::Finish() { out_ << "\n"; }

}  // namespace cx::cli
