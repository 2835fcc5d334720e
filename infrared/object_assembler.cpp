#include "infrared/object_assembler.h"

#include "infrared/obex_format.h"
#include "infrared/obex_headers.h"
#include "infrared/obex_text.h"

namespace cx::obex {

void ObjectAssembler::Reset() {
  object_ = ReceivedObject{};
  error_ = 0;
  sawBody_ = false;
}

uint8_t ObjectAssembler::ApplyBody(const uint8_t* data, size_t size) {
  sawBody_ = true;
  size_t total = object_.body.size() + size;
  if (total > maxObjectSize_) return kEntityTooLarge;
  if (object_.hasLength && total > object_.length) return kBadRequest;
  object_.body.insert(object_.body.end(), data, data + size);
  return kContinue;
}

uint8_t ObjectAssembler::Apply(const uint8_t* headers, size_t size) {
  if (error_ != 0) return error_;
  HeaderReader reader(headers, size);
  Header h;
  uint8_t result = kContinue;
  while (result == kContinue && reader.Next(h)) {
    switch (h.id) {
      case kHeaderName:
        if (!Utf16BeToUtf8(h.data, h.size, object_.name)) result = kBadRequest;
        break;
      case kHeaderDescription:
        if (!Utf16BeToUtf8(h.data, h.size, object_.description)) result = kBadRequest;
        break;
      case kHeaderType:
        object_.type.assign(reinterpret_cast<const char*>(h.data), h.size);
        while (!object_.type.empty() && object_.type.back() == '\0') object_.type.pop_back();
        break;
      case kHeaderCreatorId:
        object_.creator.assign(reinterpret_cast<const char*>(h.data), h.size);
        break;
      case kHeaderLength:
        if (h.number > maxObjectSize_) {
          result = kEntityTooLarge;
        } else if (object_.body.size() > h.number) {
          result = kBadRequest;
        } else {
          object_.hasLength = true;
          object_.length = h.number;
        }
        break;
      case kHeaderBody:
      case kHeaderEndOfBody:
        result = ApplyBody(h.data, h.size);
        break;
      default:
        break;  // connection id, time, and whatever else a client adds
    }
  }
  if (result == kContinue && reader.malformed()) result = kBadRequest;
  if (result != kContinue) {
    error_ = result;
    object_.body.clear();
    object_.body.shrink_to_fit();
  }
  return result;
}

uint8_t ObjectAssembler::Finish() const {
  if (error_ != 0) return error_;
  // A PUT without any body asks to delete an object; nothing here does that.
  if (!sawBody_) return kNotImplemented;
  if (object_.hasLength && object_.body.size() != object_.length) return kBadRequest;
  return kSuccess;
}

}  // namespace cx::obex
