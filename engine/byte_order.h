// Byte-order helpers. The container and the schema/popup records are
// big-endian; values inside data records are little-endian.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

namespace cx {

inline uint16_t GetBE16(const uint8_t* p) { return uint16_t((p[0] << 8) | p[1]); }
inline uint32_t GetBE32(const uint8_t* p) {
  return (uint32_t(p[0]) << 24) | (uint32_t(p[1]) << 16) | (uint32_t(p[2]) << 8) | p[3];
}
inline uint16_t GetLE16(const uint8_t* p) { return uint16_t(p[0] | (p[1] << 8)); }
inline uint32_t GetLE32(const uint8_t* p) {
  return uint32_t(p[0]) | (uint32_t(p[1]) << 8) | (uint32_t(p[2]) << 16) | (uint32_t(p[3]) << 24);
}
inline void PutBE16(uint8_t* p, uint16_t v) {
  p[0] = uint8_t(v >> 8);
  p[1] = uint8_t(v);
}
inline void PutBE32(uint8_t* p, uint32_t v) {
  p[0] = uint8_t(v >> 24);
  p[1] = uint8_t(v >> 16);
  p[2] = uint8_t(v >> 8);
  p[3] = uint8_t(v);
}
inline void PutLE16(uint8_t* p, uint16_t v) {
  p[0] = uint8_t(v);
  p[1] = uint8_t(v >> 8);
}
inline void PutLE32(uint8_t* p, uint32_t v) {
  p[0] = uint8_t(v);
  p[1] = uint8_t(v >> 8);
  p[2] = uint8_t(v >> 16);
  p[3] = uint8_t(v >> 24);
}

// Reads big-endian values from a record's bytes. Reading past the end
// yields zeros and marks the cursor failed; callers look at failed() once,
// at the end of the record.
class GetCursor {
 public:
  GetCursor(const uint8_t* data, size_t size) : data_(data), size_(size) {}

  uint8_t U8() {
    uint8_t b = 0;
    Raw(&b, 1);
    return b;
  }
  uint16_t U16() {
    uint8_t b[2];
    Raw(b, 2);
    return GetBE16(b);
  }
  int16_t I16() { return static_cast<int16_t>(U16()); }
  uint32_t U32() {
    uint8_t b[4];
    Raw(b, 4);
    return GetBE32(b);
  }
  void Raw(uint8_t* out, size_t n) {
    size_t avail = pos_ < size_ ? size_ - pos_ : 0;
    size_t take = n < avail ? n : avail;
    if (take) std::memcpy(out, data_ + pos_, take);
    if (take < n) {
      std::memset(out + take, 0, n - take);
      failed_ = true;
    }
    pos_ += n;
  }
  bool failed() const { return failed_; }
  size_t position() const { return pos_; }

 private:
  const uint8_t* data_;
  size_t size_;
  size_t pos_ = 0;
  bool failed_ = false;
};

// Appends big-endian values to a growing record.
class PutCursor {
 public:
  explicit PutCursor(std::vector<uint8_t>& out) : out_(out) {}
  void U8(uint8_t v) { out_.push_back(v); }
  void U16(uint16_t v) {
    uint8_t b[2];
    PutBE16(b, v);
    Raw(b, 2);
  }
  void U32(uint32_t v) {
    uint8_t b[4];
    PutBE32(b, v);
    Raw(b, 4);
  }
  void Raw(const uint8_t* p, size_t n) { out_.insert(out_.end(), p, p + n); }

 private:
  std::vector<uint8_t>& out_;
};

}  // namespace cx
