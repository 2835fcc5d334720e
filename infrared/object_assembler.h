// Collects one object from the headers of its PUT packets, checking every
// length against what the packet holds and the body against the announced
// Length and a size limit.
#pragma once

#include <cstddef>
#include <cstdint>

#include "infrared/obex_server.h"

namespace cx::obex {

class ObjectAssembler {
 public:
  explicit ObjectAssembler(size_t maxObjectSize) : maxObjectSize_(maxObjectSize) {}

  // Takes the headers of one PUT (the bytes after its 3-byte prefix).
  // Returns kContinue while the object is sound; otherwise the error
  // response that refuses it, which every later packet of the same object
  // gets too, until Reset.
  uint8_t Apply(const uint8_t* headers, size_t size);

  // After the final PUT: kSuccess when the object is complete, else the
  // response that refuses it.
  uint8_t Finish() const;

  ReceivedObject& object() { return object_; }
  void Reset();

 private:
  uint8_t ApplyBody(const uint8_t* data, size_t size);

  size_t maxObjectSize_;
  ReceivedObject object_;
  uint8_t error_ = 0;
  bool sawBody_ = false;
};

}  // namespace cx::obex
