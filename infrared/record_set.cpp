#include "infrared/record_set.h"

#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"

namespace cx::obex {
namespace {

constexpr size_t kSizeField = 2;
constexpr size_t kLargestRecord = kMaxObjectSize - kRecordSetHeaderSize - kSizeField;

void StartSet(std::vector<std::vector<uint8_t>>& bodies) {
  bodies.emplace_back(kRecordSetSignature, kRecordSetSignature + 4);
  bodies.back().resize(kRecordSetHeaderSize, 0);
}

}  // namespace

bool PackRecordSets(const std::vector<std::span<const uint8_t>>& records,
                    std::vector<std::vector<uint8_t>>& bodies) {
  bodies.clear();
  uint16_t count = 0;
  for (std::span<const uint8_t> record : records) {
    if (record.size() > kLargestRecord) {
      bodies.clear();
      return false;
    }
    if (bodies.empty() || bodies.back().size() + kSizeField + record.size() > kMaxObjectSize) {
      if (!bodies.empty()) PutU16(bodies.back().data() + 4, count);
      StartSet(bodies);
      count = 0;
    }
    std::vector<uint8_t>& body = bodies.back();
    uint8_t size[2];
    PutU16(size, static_cast<uint16_t>(record.size()));
    body.insert(body.end(), size, size + 2);
    body.insert(body.end(), record.begin(), record.end());
    ++count;
  }
  if (!bodies.empty()) PutU16(bodies.back().data() + 4, count);
  return true;
}

bool UnpackRecordSet(std::span<const uint8_t> body, std::vector<std::vector<uint8_t>>& records) {
  records.clear();
  if (body.size() < kRecordSetHeaderSize) return false;
  for (size_t i = 0; i < 4; ++i) {
    if (body[i] != kRecordSetSignature[i]) return false;
  }
  size_t count = GetU16(body.data() + 4);
  size_t pos = kRecordSetHeaderSize;
  for (size_t i = 0; i < count; ++i) {
    if (body.size() - pos < kSizeField) break;
    size_t size = GetU16(body.data() + pos);
    pos += kSizeField;
    if (body.size() - pos < size) break;
    records.emplace_back(body.begin() + static_cast<long>(pos),
                         body.begin() + static_cast<long>(pos + size));
    pos += size;
  }
  if (count == 0 || records.size() != count || pos != body.size()) {
    records.clear();
    return false;
  }
  return true;
}

}  // namespace cx::obex
