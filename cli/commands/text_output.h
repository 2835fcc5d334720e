// Output of the export, listing and report commands: where it may go (the
// encodings are cli/text_files.h's concern).
#pragma once

#include <ostream>
#include <string_view>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "ops/text_sink.h"
#include "platform/text_codec.h"

namespace cx::cli {

// False (after the message) when `out` is a database or the input file
// `in` and --force was not given.
inline bool TextTargetAllowed(Context& ctx, const Arguments& args, const std::string& out,
                              const std::string& in) {
  if (args.has("--force")) return true;
  Status s = CheckTextTarget(out, {in});
  if (s) return true;
  Failure(ctx, s.message() + " (--force writes it anyway)");
  return false;
}

class Utf8StreamSink : public TextSink {
 public:
  explicit Utf8StreamSink(std::ostream& out) : out_(out) {}
  bool Write(std::string_view bytes) override {
    std::string text = Cp1252ToUtf8(bytes);
    out_.write(text.data(), static_cast<std::streamsize>(text.size()));
    return out_.good();
  }

 private:
  std::ostream& out_;
};

}  // namespace cx::cli
