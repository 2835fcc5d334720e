#include "cli/json_output.h"

#include <algorithm>
#include <cctype>
#include <ostream>
#include <streambuf>

#include "cli/json.h"

namespace cx::cli {
namespace {

class HoldingBuffer : public std::streambuf {
 public:
  explicit HoldingBuffer(std::streambuf* through) : through_(through) {}
  std::string& held() { return held_; }

 protected:
  int_type overflow(int_type ch) override {
    if (!traits_type::eq_int_type(ch, traits_type::eof())) held_.push_back(traits_type::to_char_type(ch));
    return traits_type::not_eof(ch);
  }
  std::streamsize xsputn(const char* s, std::streamsize n) override {
    held_.append(s, static_cast<size_t>(n));
    return n;
  }
  int sync() override {
    through_->sputn(held_.data(), static_cast<std::streamsize>(held_.size()));
    held_.clear();
    return through_->pubsync();
  }

 private:
  std::streambuf* through_;
  std::string held_;
};

}  // namespace

int RefuseJson(Context& ctx, const Command& command) {
  if (!ctx.json) return kExitOk;
  return UsageError(ctx, command, "--json: this command prints no result");
}

void PrintCounts(Context& ctx, std::initializer_list<std::pair<const char*, int64_t>> counts) {
  JsonWriter j(ctx.out);
  j.BeginObject();
  for (const auto& [key, value] : counts) j.Key(key).Number(value);
  j.EndObject();
  j.Finish();
}

std::string CamelCaseKey(std::string_view label) {
  std::string key;
  bool wordStart = false, firstWord = true;
  for (char c : label) {
    if (c == ' ' || c == '-' || c == '_') {
      wordStart = !key.empty();
      if (!key.empty()) firstWord = false;
      continue;
    }
    const unsigned char u = static_cast<unsigned char>(c);
    if (firstWord) {
      key += static_cast<char>(std::tolower(u));
    } else if (wordStart) {
      key += static_cast<char>(std::toupper(u));
    } else {
      key += static_cast<char>(std::tolower(u));
    }
    wordStart = false;
  }
  return key;
}

int WithJsonErrors(const std::vector<std::string>& args, std::ostream& err,
                   const std::function<int()>& run) {
  // After "--" a "--json" is an argument, not the option.
  const auto end = std::find(args.begin(), args.end(), "--");
  if (std::find(args.begin(), end, "--json") == end) return run();
  HoldingBuffer holding(err.rdbuf());
  std::streambuf* original = err.rdbuf(&holding);
  // std::cerr flushes after every output, which would pass everything on.
  const std::ios::fmtflags flags = err.flags();
  err.unsetf(std::ios::unitbuf);
  const int code = run();
  err.rdbuf(original);
  err.flags(flags);
  err.clear();
  std::string text = std::move(holding.held());
  if (code == kExitOk) {
    err << text << std::flush;
    return code;
  }
  while (!text.empty() && (text.back() == '\n' || text.back() == ' ')) text.pop_back();
  JsonWriter j(err);
  j.BeginObject();
  j.Key("error").String(text);
  j.Key("exitCode").Number(code);
  j.EndObject();
  j.Finish();
  err.flush();
  return code;
}

}  // namespace cx::cli
