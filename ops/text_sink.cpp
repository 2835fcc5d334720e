#include "ops/text_sink.h"

#include "engine/container.h"
#include "platform/text_codec.h"

namespace cx {

Status CheckTextTarget(const std::string& path, const std::vector<std::string>& inputs) {
  std::optional<FileState> target = StatFile(path);
  if (!target) return Status::Ok();
  for (const std::string& input : inputs) {
    std::optional<FileState> in = StatFile(input);
    if (in && in->device == target->device && in->inode == target->inode) {
      return Status::Error(path + " is the file being read; writing the text there would destroy it");
    }
  }
  if (IsDatabaseFile(path)) {
    return Status::Error(path + " is a Cardovex database; writing text over it would destroy it");
  }
  return Status::Ok();
}

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
