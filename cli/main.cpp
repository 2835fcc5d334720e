// cardovex-cli: the command-line companion of Cardovex.
#include <signal.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iostream>
#include <streambuf>
#include <string>
#include <vector>

#include "cli/command.h"
#include "cli/global_options.h"

namespace {

// Standard output written straight to its descriptor. Bytes that could not
// be written stay in the buffer, so the final flush tries them again and
// the error it meets tells the user why the output is incomplete.
class StdoutBuffer : public std::streambuf {
 public:
  StdoutBuffer() { setp(buffer_, buffer_ + sizeof buffer_); }

 protected:
  int_type overflow(int_type ch) override {
    if (sync() != 0) return traits_type::eof();
    if (!traits_type::eq_int_type(ch, traits_type::eof())) {
      *pptr() = traits_type::to_char_type(ch);
      pbump(1);
    }
    return traits_type::not_eof(ch);
  }

  int sync() override {
    char* p = pbase();
    while (p < pptr()) {
      ssize_t n = ::write(STDOUT_FILENO, p, static_cast<size_t>(pptr() - p));
      if (n < 0 && errno == EINTR) continue;
      if (n <= 0) {
        const size_t left = static_cast<size_t>(pptr() - p);
        std::memmove(buffer_, p, left);
        setp(buffer_, buffer_ + sizeof buffer_);
        pbump(static_cast<int>(left));
        return -1;
      }
      p += n;
    }
    setp(buffer_, buffer_ + sizeof buffer_);
    return 0;
  }

 private:
  char buffer_[1 << 16];
};

// Databases are read through a mapping of the file (see OpenForCommand).
// Should another program shorten one in the moment a command runs, reading
// the lost part faults; the command then stops with an error rather than a
// crash. A half-written copy it leaves beside a database is removed by the
// next save of that database.
void StopOnShortenedFile(int) {
  static const char kMessage[] =
      "cardovex-cli: a file was shortened by another program while it was being read; "
      "the command was stopped and nothing was replaced\n";
  ssize_t ignored = ::write(STDERR_FILENO, kMessage, sizeof kMessage - 1);
  (void)ignored;
  ::_exit(cx::cli::kExitFailed);
}

}  // namespace

int main(int argc, char** argv) {
  struct sigaction bus{};
  bus.sa_handler = StopOnShortenedFile;
  sigemptyset(&bus.sa_mask);
  ::sigaction(SIGBUS, &bus, nullptr);
  std::vector<std::string> args(argv + 1, argv + argc);
  cx::cli::CliUi ui(std::cerr);
  StdoutBuffer buffer;
  std::ostream out(&buffer);
  int code = cx::cli::RunCli(args, out, std::cerr, ui);
  // A command's own output failure has been reported already; this catches
  // what was written on the way out (help and version texts).
  errno = 0;
  out.flush();
  int error = errno;
  if (out && ::close(STDOUT_FILENO) != 0 && errno != EBADF) {
    error = errno;
    out.setstate(std::ios::badbit);
  }
  if (!out && code == cx::cli::kExitOk) {
    std::fprintf(stderr, "cardovex-cli: the output could not be written%s%s\n", error ? ": " : "",
                 error ? std::strerror(error) : "");
    code = cx::cli::kExitFailed;
  }
  return code;
}
