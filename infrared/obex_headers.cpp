#include "infrared/obex_headers.h"

#include <cstring>

#include "infrared/obex_format.h"
#include "infrared/obex_text.h"

namespace cx::obex {

HeaderItem TextItem(uint8_t id, std::string_view utf8) {
  return HeaderItem{id, Utf8ToUtf16Be(utf8), 0};
}

HeaderItem LengthItem(uint32_t count) {
  return HeaderItem{kHeaderLength,
                    {static_cast<uint8_t>(count >> 24), static_cast<uint8_t>(count >> 16),
                     static_cast<uint8_t>(count >> 8), static_cast<uint8_t>(count)},
                    0};
}

HeaderItem CreatorItem(std::string_view code) {
  HeaderItem item{kHeaderCreatorId, std::vector<uint8_t>(4, 0), 0};
  for (size_t i = 0; i < 4 && i < code.size(); ++i) item.value[i] = static_cast<uint8_t>(code[i]);
  return item;
}

HeaderItem BodyItem(std::vector<uint8_t> body) {
  uint16_t count = static_cast<uint16_t>(body.size());
  return HeaderItem{kHeaderBody, std::move(body), count};
}

bool ObjectItems(std::string_view description, std::string_view name, std::string_view creator,
                 std::vector<uint8_t> body, std::vector<HeaderItem>& items) {
  items.clear();
  if (body.size() > kMaxObjectSize) return false;
  items.push_back(TextItem(kHeaderDescription, description));
  items.push_back(TextItem(kHeaderName, name));
  items.push_back(CreatorItem(creator));
  items.push_back(LengthItem(static_cast<uint32_t>(body.size())));
  items.push_back(BodyItem(std::move(body)));
  return true;
}

size_t EncodedSize(const HeaderItem& item) {
  switch (item.id & kEncodingMask) {
    case kEncodingUnicode:
      return item.value.size() + 5;  // id, length, the characters, a 16-bit zero
    case kEncodingBytes:
      return item.id == kHeaderBody ? 0 : item.value.size() + 3;
    case kEncodingByte:
      return 2;
    default:
      return 5;
  }
}

size_t EncodeHeader(const HeaderItem& item, uint8_t* out) {
  size_t size = EncodedSize(item);
  if (size == 0) return 0;
  out[0] = item.id;
  switch (item.id & kEncodingMask) {
    case kEncodingUnicode:
      PutU16(out + 1, static_cast<uint16_t>(size));
      if (!item.value.empty()) std::memcpy(out + 3, item.value.data(), item.value.size());
      out[size - 2] = 0;
      out[size - 1] = 0;
      break;
    case kEncodingBytes:
      PutU16(out + 1, static_cast<uint16_t>(size));
      if (!item.value.empty()) std::memcpy(out + 3, item.value.data(), item.value.size());
      break;
    case kEncodingByte:
      out[1] = item.value.empty() ? 0 : item.value[0];
      break;
    default:
      for (size_t i = 0; i < 4; ++i) out[1 + i] = i < item.value.size() ? item.value[i] : 0;
      break;
  }
  return size;
}

bool HeaderReader::Next(Header& header) {
  if (malformed_ || pos_ >= size_) return false;
  const uint8_t* p = data_ + pos_;
  size_t left = size_ - pos_;
  header = Header{};
  header.id = p[0];
  size_t total = 0;
  switch (header.id & kEncodingMask) {
    case kEncodingUnicode:
    case kEncodingBytes:
      if (left < 3) break;
      total = GetU16(p + 1);
      if (total < 3 || total > left) {
        total = 0;
        break;
      }
      header.data = p + 3;
      header.size = total - 3;
      break;
    case kEncodingByte:
      if (left < 2) break;
      total = 2;
      header.number = p[1];
      header.data = p + 1;
      header.size = 1;
      break;
    default:
      if (left < 5) break;
      total = 5;
      header.number = GetU32(p + 1);
      header.data = p + 1;
      header.size = 4;
      break;
  }
  if (total == 0) {
    malformed_ = true;
    return false;
  }
  pos_ += total;
  return true;
}

}  // namespace cx::obex
