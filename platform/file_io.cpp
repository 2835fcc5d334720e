#include "platform/file_io.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <random>

namespace cx {
namespace {

constexpr size_t kWriteBuffer = 1 << 16;

std::string ErrnoText() { return std::strerror(errno); }

std::string DirectoryOf(const std::string& path) {
  size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  if (slash == 0) return "/";
  return path.substr(0, slash);
}

}  // namespace

bool FileExists(const std::string& path) {
  struct stat st{};
  return ::stat(path.c_str(), &st) == 0 && S_ISREG(st.st_mode);
}

int64_t FileSize(const std::string& path) {
  struct stat st{};
  if (::stat(path.c_str(), &st) != 0) return -1;
  return static_cast<int64_t>(st.st_size);
}

bool ReadWholeFile(const std::string& path, std::vector<uint8_t>& out) {
  int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return false;
  struct stat st{};
  if (::fstat(fd, &st) != 0 || !S_ISREG(st.st_mode)) {
    ::close(fd);
    return false;
  }
  out.resize(static_cast<size_t>(st.st_size));
  size_t done = 0;
  while (done < out.size()) {
    ssize_t n = ::read(fd, out.data() + done, out.size() - done);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) break;
    done += static_cast<size_t>(n);
  }
  out.resize(done);  // a file that shrank while being read
  ::close(fd);
  return true;
}

FileBuffer::~FileBuffer() {
  if (data_) ::munmap(data_, mapped_);
}

bool FileBuffer::Read(const std::string& path) {
  constexpr size_t kHugePage = 2u << 20;
  int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return false;
  struct stat st{};
  if (::fstat(fd, &st) != 0 || !S_ISREG(st.st_mode)) {
    ::close(fd);
    return false;
  }
  size_t want = static_cast<size_t>(st.st_size);
  size_t mapped = (want + kHugePage - 1) / kHugePage * kHugePage;
  if (mapped == 0) mapped = kHugePage;
  void* block = ::mmap(nullptr, mapped, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (block == MAP_FAILED) {
    ::close(fd);
    return false;
  }
  if (mapped >= kHugePage) ::madvise(block, mapped, MADV_HUGEPAGE);
  auto* bytes = static_cast<uint8_t*>(block);
  size_t done = 0;
  bool ok = true;
  while (done < want) {
    ssize_t n = ::read(fd, bytes + done, want - done);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) ok = false;
    if (n <= 0) break;
    done += static_cast<size_t>(n);
  }
  ::close(fd);
  if (!ok) {
    ::munmap(block, mapped);
    return false;
  }
  if (data_) ::munmap(data_, mapped_);
  data_ = bytes;
  size_ = done;  // a file that shrank while being read
  mapped_ = mapped;
  return true;
}

int64_t ReadFileRange(const std::string& path, uint64_t offset, size_t length, uint8_t* out) {
  int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return -1;
  size_t done = 0;
  while (done < length) {
    ssize_t n = ::pread(fd, out + done, length - done, static_cast<off_t>(offset + done));
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) {
      ::close(fd);
      return -1;
    }
    if (n == 0) break;
    done += static_cast<size_t>(n);
  }
  ::close(fd);
  return static_cast<int64_t>(done);
}

bool RemoveFile(const std::string& path) { return ::unlink(path.c_str()) == 0; }

std::vector<std::string> ListFiles(const std::string& dir) {
  std::vector<std::string> names;
  DIR* d = ::opendir(dir.c_str());
  if (!d) return names;
  while (dirent* e = ::readdir(d)) {
    std::string name = e->d_name;
    if (name == "." || name == "..") continue;
    if (FileExists(dir + "/" + name)) names.push_back(name);
  }
  ::closedir(d);
  return names;
}

bool MakeDirectories(const std::string& dir) {
  if (dir.empty()) return false;
  struct stat st{};
  if (::stat(dir.c_str(), &st) == 0) return S_ISDIR(st.st_mode);
  std::string parent = DirectoryOf(dir);
  if (parent != dir && parent != "." && parent != "/") MakeDirectories(parent);
  return ::mkdir(dir.c_str(), 0777) == 0 || errno == EEXIST;
}

SafeFileWriter::SafeFileWriter(std::string target, bool sync)
    : target_(std::move(target)), sync_(sync) {}

SafeFileWriter::~SafeFileWriter() { Abandon(); }

Status SafeFileWriter::Open() {
  std::random_device rd;
  for (int attempt = 0; attempt < 16; ++attempt) {
    temp_ = target_ + ".tmp-" + std::to_string(::getpid()) + "-" + std::to_string(rd() % 1000000);
    fd_ = ::open(temp_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (fd_ >= 0) break;
    if (errno != EEXIST) break;
  }
  if (fd_ < 0) {
    temp_.clear();
    failed_ = true;
    error_ = ErrnoText();
    return Status::Error("Cannot create a file beside " + target_ + ": " + error_);
  }
  buffer_.reserve(kWriteBuffer);
  return Status::Ok();
}

bool SafeFileWriter::WriteAll(const uint8_t* p, size_t size) {
  size_t done = 0;
  while (done < size) {
    ssize_t n = ::write(fd_, p + done, size - done);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) {
      failed_ = true;
      error_ = n < 0 ? ErrnoText() : "short write";
      return false;
    }
    done += static_cast<size_t>(n);
  }
  return true;
}

bool SafeFileWriter::Flush() {
  bool ok = WriteAll(buffer_.data(), buffer_.size());
  buffer_.clear();
  return ok;
}

bool SafeFileWriter::Write(const void* data, size_t size) {
  if (failed_ || fd_ < 0) return false;
  if (size == 0) return true;
  const uint8_t* p = static_cast<const uint8_t*>(data);
  if (buffer_.size() + size > kWriteBuffer) {
    if (!Flush()) return false;
    // Large blocks go straight to the file rather than through the buffer.
    if (size >= kWriteBuffer) return WriteAll(p, size);
  }
  buffer_.insert(buffer_.end(), p, p + size);
  return true;
}

Status SafeFileWriter::Commit() {
  if (fd_ < 0) return Status::Error("Cannot write " + target_ + (error_.empty() ? "" : ": " + error_));
  if (!failed_) Flush();
  if (!failed_ && sync_ && ::fsync(fd_) != 0) {
    failed_ = true;
    error_ = ErrnoText();
  }
  // Keep the permissions of the file being replaced.
  struct stat st{};
  if (!failed_ && ::stat(target_.c_str(), &st) == 0) ::fchmod(fd_, st.st_mode & 07777);
  if (::close(fd_) != 0 && !failed_) {
    failed_ = true;
    error_ = ErrnoText();
  }
  fd_ = -1;
  if (!failed_ && ::rename(temp_.c_str(), target_.c_str()) != 0) {
    failed_ = true;
    error_ = ErrnoText();
  }
  if (failed_) {
    ::unlink(temp_.c_str());
    temp_.clear();
    return Status::Error("Cannot write " + target_ + ": " + error_);
  }
  temp_.clear();
  if (!sync_) return Status::Ok();
  // Make the rename itself durable.
  int dfd = ::open(DirectoryOf(target_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (dfd >= 0) {
    ::fsync(dfd);
    ::close(dfd);
  }
  return Status::Ok();
}

void SafeFileWriter::Abandon() {
  if (fd_ >= 0) {
    ::close(fd_);
    fd_ = -1;
  }
  if (!temp_.empty()) {
    ::unlink(temp_.c_str());
    temp_.clear();
  }
}

Status WriteFileSafely(const std::string& path, const void* data, size_t size) {
  SafeFileWriter w(path);
  Status s = w.Open();
  if (!s) return s;
  w.Write(data, size);
  return w.Commit();
}

}  // namespace cx
