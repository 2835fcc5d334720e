// Header items of a beamed object (what the sender writes) and a bounded
// reader for the headers inside a received packet.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace cx::obex {

// One header item as the beaming commands hand it to the sender: its id
// and its value. Texts hold their UTF-16 code units, most significant byte
// first, without the terminator; Length and Creator id hold their 4 bytes;
// Body holds the object's bytes, whose count the sender keeps as a 16-bit
// number.
struct HeaderItem {
  uint8_t id = 0;
  std::vector<uint8_t> value;
  uint16_t bodyCount = 0;
};

HeaderItem TextItem(uint8_t id, std::string_view utf8);
HeaderItem LengthItem(uint32_t count);
HeaderItem CreatorItem(std::string_view code);  // first 4 bytes, zero-padded
HeaderItem BodyItem(std::vector<uint8_t> body);

// The largest object the sender can carry: its byte count is 16-bit.
constexpr size_t kMaxObjectSize = 65535;

// The five items every beaming command sends, in the order the sender
// writes them: Description, Name, Creator id, Length, Body. False (and no
// items) when the body is too large.
bool ObjectItems(std::string_view description, std::string_view name, std::string_view creator,
                 std::vector<uint8_t> body, std::vector<HeaderItem>& items);

// Bytes the item takes in a header PUT (0 for Body, which is not written
// with the headers).
size_t EncodedSize(const HeaderItem& item);
// Writes the item at `out` (EncodedSize bytes); returns the bytes written.
size_t EncodeHeader(const HeaderItem& item, uint8_t* out);

// One header found in a packet. `data`/`size` are the value bytes (for
// text and byte headers, without the 3-byte prefix); `number` holds the
// one- or four-byte value.
struct Header {
  uint8_t id = 0;
  const uint8_t* data = nullptr;
  size_t size = 0;
  uint32_t number = 0;
};

// Walks the headers of `size` bytes at `data`. Every length is checked
// against what is left; a header that does not fit stops the walk and sets
// malformed().
class HeaderReader {
 public:
  HeaderReader(const uint8_t* data, size_t size) : data_(data), size_(size) {}
  bool Next(Header& header);
  bool malformed() const { return malformed_; }

 private:
  const uint8_t* data_;
  size_t size_;
  size_t pos_ = 0;
  bool malformed_ = false;
};

}  // namespace cx::obex
