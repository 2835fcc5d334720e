#include "fuzz/scratch.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "fuzz/fuzz_check.h"

namespace cx::fuzz {
namespace {

// Owns the folder for the life of the process; made on first use.
class ScratchFolder {
 public:
  ScratchFolder() {
    std::string base = "/dev/shm";
    if (::access(base.c_str(), W_OK) != 0) {
      const char* tmp = std::getenv("TMPDIR");
      base = tmp && *tmp ? tmp : "/tmp";
    }
    RemoveStale(base);
    path_ = base + "/" + kPrefix + std::to_string(::getpid());
    std::filesystem::create_directories(path_);
  }
  ~ScratchFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  const std::string& path() const { return path_; }

 private:
  static constexpr const char* kPrefix = "cardovex-fuzz-";

  // libFuzzer ends a run without running destructors, so each process
  // clears the folders of processes that are gone.
  static void RemoveStale(const std::string& base) {
    std::error_code ec;
    for (const auto& e : std::filesystem::directory_iterator(base, ec)) {
      const std::string name = e.path().filename().string();
      if (name.rfind(kPrefix, 0) != 0) continue;
      const long pid = std::strtol(name.c_str() + std::strlen(kPrefix), nullptr, 10);
      if (pid > 0 && ::kill(static_cast<pid_t>(pid), 0) != 0 && errno == ESRCH) {
        std::filesystem::remove_all(e.path(), ec);
      }
    }
  }

  std::string path_;
};

const std::string& Folder() {
  static const ScratchFolder folder;
  return folder.path();
}

}  // namespace

std::string ScratchPath(const std::string& name) { return Folder() + "/" + name; }

std::string WriteScratch(const std::string& name, const uint8_t* data, size_t size) {
  std::string path = ScratchPath(name);
  int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
  CX_FUZZ_CHECK(fd >= 0);
  size_t done = 0;
  while (done < size) {
    ssize_t n = ::write(fd, data + done, size - done);
    CX_FUZZ_CHECK(n > 0);
    done += static_cast<size_t>(n);
  }
  ::close(fd);
  return path;
}

}  // namespace cx::fuzz
