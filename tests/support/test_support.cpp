#include "tests/support/test_support.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <vector>

namespace cx::testing {

TempDir::TempDir() {
  std::string base = std::filesystem::temp_directory_path().string() + "/cardovex-test-XXXXXX";
  if (char* made = ::mkdtemp(base.data())) path_ = made;
}

TempDir::~TempDir() {
  std::error_code ec;
  if (!path_.empty()) std::filesystem::remove_all(path_, ec);
}

SmallTmpfs::SmallTmpfs(size_t bytes) {
  if (::unshare(CLONE_NEWNS) != 0) {
    why_ = std::string("no mount namespace: ") + std::strerror(errno);
    return;
  }
  // Mounts made from here on stay in this namespace.
  if (::mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) {
    why_ = std::string("cannot make mounts private: ") + std::strerror(errno);
    return;
  }
  const std::string options = "size=" + std::to_string(bytes) + ",mode=0755";
  if (::mount("tmpfs", dir_.path().c_str(), "tmpfs", 0, options.c_str()) != 0) {
    why_ = std::string("cannot mount a tmpfs: ") + std::strerror(errno);
    return;
  }
  mounted_ = true;
}

SmallTmpfs::~SmallTmpfs() {
  if (mounted_) ::umount2(dir_.path().c_str(), MNT_DETACH);
}

bool SmallTmpfs::FillUp() {
  int fd = ::open(File("filler").c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644);
  if (fd < 0) return false;
  std::vector<char> block(4096, 'x');
  bool full = false;
  // Bounded by the largest tmpfs a test asks for.
  for (int i = 0; i < 1 << 16 && !full; ++i) {
    full = ::write(fd, block.data(), block.size()) < static_cast<ssize_t>(block.size());
  }
  // Whatever the last partial block left free goes too.
  for (int i = 0; i < 4096 && full; ++i) {
    if (::write(fd, block.data(), 1) != 1) break;
  }
  ::close(fd);
  return full;
}

}  // namespace cx::testing
