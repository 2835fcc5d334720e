#include "ops/text_sink.h"

#include "platform/text_codec.h"

namespace cx {

bool StdioSink::Write(std::string_view bytes) {
  if (!ok_) return false;
  if (toUtf8_) {
    std::string wide = Cp1252ToUtf8(bytes);
    ok_ = std::fwrite(wide.data(), 1, wide.size(), stream_) == wide.size();
  } else {
    ok_ = std::fwrite(bytes.data(), 1, bytes.size(), stream_) == bytes.size();
  }
  return ok_;
}

}  // namespace cx
