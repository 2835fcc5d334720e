#include "cli/text_files.h"

#include <fstream>
#include <iostream>
#include <ostream>
#include <sstream>

namespace cx::cli {
namespace {

class StreamSink : public TextSink {
 public:
  explicit StreamSink(std::ostream& out) : out_(out) {}
  bool Write(std::string_view bytes) override {
    out_.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    return out_.good();
  }

 private:
  std::ostream& out_;
};

}  // namespace

void DeclareEncoding(Syntax& syntax) {
  syntax.Option("--encoding", "E",
                "the text file's encoding: utf-8 (the default) or windows-1252 (the bytes the "
                "database holds)");
}

bool EncodingOption(Context& ctx, const Command& command, const Arguments& args, TextEncoding& encoding,
                    int& code) {
  encoding = TextEncoding::kUtf8;
  std::optional<std::string> name = args.value("--encoding");
  if (!name) return true;
  if (std::optional<TextEncoding> e = ParseTextEncoding(*name)) {
    encoding = *e;
    return true;
  }
  code = UsageError(ctx, command, "unknown encoding " + *name + " (utf-8 or windows-1252)");
  return false;
}

Status WriteTextTo(Context& ctx, const std::string& path, TextEncoding encoding,
                   const std::function<void(TextSink&)>& produce) {
  if (path == "-") {
    StreamSink stream(ctx.out);
    EncodingSink out(stream, encoding);
    produce(out);
    ctx.out.flush();
    if (!ctx.out.good()) return Status::Error("Cannot write to standard output");
    return Status::Ok();
  }
  FileSink file(path);
  if (Status s = file.Open(); !s) return s;
  EncodingSink out(file, encoding);
  produce(out);
  return file.Commit();
}

Status ReadTextFrom(const std::string& path, std::string& bytes) {
  if (path == "-") {
    std::ostringstream all;
    all << std::cin.rdbuf();
    if (std::cin.bad()) return Status::Error("Cannot read standard input");
    bytes = std::move(all).str();
    return Status::Ok();
  }
  // Read as a stream, so that a pipe named as the file (<(command)) works.
  std::ifstream in(path, std::ios::binary);
  if (!in) return Status::Error("Cannot read " + path);
  bytes.clear();
  char buffer[1 << 16];
  // read() reports a failing file (a folder, say) in its state instead of
  // throwing as the buffer's iterators do.
  while (in.read(buffer, sizeof buffer) || in.gcount() > 0) {
    bytes.append(buffer, static_cast<size_t>(in.gcount()));
    if (!in) break;
  }
  if (in.bad()) return Status::Error("Cannot read " + path);
  return Status::Ok();
}

std::string TextFileName(const std::string& path) { return path == "-" ? "standard input" : path; }

}  // namespace cx::cli
