#include "platform/file_io.h"

#include <dirent.h>
#include <fcntl.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <random>
#include <thread>

namespace cx {
namespace {

constexpr size_t kWriteBuffer = 1 << 16;
// How much of a file to be flushed is written before it is sent on to the
// disk.
constexpr uint64_t kWriteBackStep = uint64_t{4} << 20;

std::string ErrnoText() { return std::strerror(errno); }

std::string DirectoryOf(const std::string& path) {
  size_t slash = path.rfind('/');
  if (slash == std::string::npos) return ".";
  if (slash == 0) return "/";
  return path.substr(0, slash);
}

FileState StateOf(const struct stat& st) {
  FileState f;
  f.device = static_cast<uint64_t>(st.st_dev);
  f.inode = static_cast<uint64_t>(st.st_ino);
  f.size = static_cast<int64_t>(st.st_size);
  f.modifiedSeconds = static_cast<int64_t>(st.st_mtim.tv_sec);
  f.modifiedNanoseconds = static_cast<int64_t>(st.st_mtim.tv_nsec);
  return f;
}

// Opens a regular file for reading, or fails. O_NONBLOCK makes the open
// of a FIFO return at once (it would otherwise wait for a writer); for a
// regular file it changes nothing.
int OpenRegular(const std::string& path, struct stat* st = nullptr) {
  int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (fd < 0) return -1;
  struct stat own{};
  struct stat& s = st ? *st : own;
  if (::fstat(fd, &s) != 0 || !S_ISREG(s.st_mode)) {
    ::close(fd);
    errno = EINVAL;
    return -1;
  }
  return fd;
}

// The longest file name the folder takes.
size_t NameLimit(const std::string& dir) {
  long limit = ::pathconf(dir.c_str(), _PC_NAME_MAX);
  return limit > 0 ? static_cast<size_t>(limit) : 255;
}

std::string Hex32(uint32_t v) {
  char buf[9];
  std::snprintf(buf, sizeof buf, "%08x", v);
  return buf;
}

uint32_t NameHash(const std::string& name) {
  uint32_t hash = 2166136261u;
  for (unsigned char c : name) hash = (hash ^ c) * 16777619u;
  return hash;
}

// Temporary names are "." + the target's name (cut to fit) + "." + a hash
// of the whole name + "-" + the writer's process id + "-" + a random part
// + ".tmp". The hash keeps two long names that share their first bytes
// apart; the process id tells whether the writer is still alive.
std::string TemporaryPrefix(const std::string& targetName, size_t nameLimit) {
  // Room for ".", ".", 8 hex digits, "-", a process id, "-", 6 digits, ".tmp".
  constexpr size_t kOverhead = 1 + 1 + 8 + 1 + 10 + 1 + 6 + 4;
  size_t keep = nameLimit > kOverhead + 1 ? nameLimit - kOverhead : 1;
  std::string base = targetName.substr(0, std::min(keep, targetName.size()));
  // Never end in the middle of a UTF-8 sequence.
  if (base.size() < targetName.size()) {
    while (!base.empty() && (static_cast<unsigned char>(targetName[base.size()]) & 0xC0) == 0x80) {
      base.pop_back();
    }
  }
  return "." + base + "." + Hex32(NameHash(targetName)) + "-";
}

bool ProcessIsGone(long pid) {
  if (pid <= 0) return false;
  return ::kill(static_cast<pid_t>(pid), 0) != 0 && errno == ESRCH;
}

// Removes temporary files of earlier saves of the target whose process has
// died (a save killed or crashed half-way). Files of living writers stay.
void RemoveDeadTemporaries(const std::string& dir, const std::string& prefix) {
  DIR* d = ::opendir(dir.c_str());
  if (!d) return;
  while (dirent* e = ::readdir(d)) {
    std::string name = e->d_name;
    if (name.compare(0, prefix.size(), prefix) != 0) continue;
    if (name.size() < prefix.size() + 4 || name.compare(name.size() - 4, 4, ".tmp") != 0) continue;
    const char* digits = name.c_str() + prefix.size();
    char* end = nullptr;
    long pid = std::strtol(digits, &end, 10);
    if (end == digits || *end != '-') continue;
    if (!ProcessIsGone(pid)) continue;
    std::string path = (dir == "/" ? "" : dir) + "/" + name;
    struct stat st{};
    if (::lstat(path.c_str(), &st) == 0 && S_ISREG(st.st_mode)) ::unlink(path.c_str());
  }
  ::closedir(d);
}

}  // namespace

std::optional<FileState> StatFile(const std::string& path) {
  struct stat st{};
  if (::stat(path.c_str(), &st) != 0) return std::nullopt;
  return StateOf(st);
}

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
  struct stat st{};
  int fd = OpenRegular(path, &st);
  if (fd < 0) return false;
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

bool FileBuffer::Read(const std::string& path, Access access) {
  constexpr size_t kHugePage = 2u << 20;
  struct stat st{};
  int fd = OpenRegular(path, &st);
  if (fd < 0) return false;
  size_t want = static_cast<size_t>(st.st_size);
  if (access == Access::kMap && want > 0) {
    // All pages at once: one by one, each first touch would fault.
    void* block = ::mmap(nullptr, want, PROT_READ, MAP_PRIVATE | MAP_POPULATE, fd, 0);
    if (block != MAP_FAILED) {
      ::close(fd);
      if (data_) ::munmap(data_, mapped_);
      data_ = static_cast<uint8_t*>(block);
      size_ = want;
      mapped_ = want;
      state_ = StateOf(st);
      return true;
    }
  }
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
  state_ = StateOf(st);
  return true;
}

int64_t ReadFileRange(const std::string& path, uint64_t offset, size_t length, uint8_t* out) {
  int fd = OpenRegular(path);
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

bool ResolveLinks(const std::string& path, std::string& resolved) {
  std::string current = path;
  // The system's own limit on links followed in one name.
  for (int hop = 0; hop < 40; ++hop) {
    struct stat st{};
    if (::lstat(current.c_str(), &st) != 0 || !S_ISLNK(st.st_mode)) {
      resolved = current;
      return true;
    }
    std::string link(static_cast<size_t>(st.st_size > 0 ? st.st_size : 0) + 256, '\0');
    ssize_t n = ::readlink(current.c_str(), link.data(), link.size());
    if (n <= 0 || static_cast<size_t>(n) >= link.size()) return false;
    link.resize(static_cast<size_t>(n));
    current = link[0] == '/' ? link : DirectoryOf(current) + "/" + link;
  }
  errno = ELOOP;
  return false;
}

bool IsTemporaryNameFor(const std::string& targetName, const std::string& name) {
  // Whatever the folder's length limit cut the name to.
  const std::string tag = "." + Hex32(NameHash(targetName)) + "-";
  const size_t at = name.rfind(tag);
  if (name.size() < 5 || name[0] != '.' || at == std::string::npos || at < 1) return false;
  const size_t baseLength = at - 1;
  return baseLength <= targetName.size() && name.compare(1, baseLength, targetName, 0, baseLength) == 0 &&
         name.size() > at + tag.size() + 4 && name.compare(name.size() - 4, 4, ".tmp") == 0;
}

SafeFileWriter::SafeFileWriter(std::string target, bool sync)
    : SafeFileWriter(std::move(target), Options{sync, false}) {}

SafeFileWriter::SafeFileWriter(std::string target, Options options)
    : target_(std::move(target)), options_(options) {}

SafeFileWriter::~SafeFileWriter() { Abandon(); }

Status SafeFileWriter::Fail(const std::string& what) {
  failed_ = true;
  error_ = ErrnoText();
  return Status::Error(what + ": " + error_);
}

Status SafeFileWriter::Open() {
  written_.reset();
  writtenBytes_ = startedBytes_ = 0;
  if (!ResolveLinks(target_, real_)) return Fail("Cannot follow the link " + target_);
  const size_t slash = real_.rfind('/');
  const std::string folder = slash == std::string::npos ? "" : real_.substr(0, slash + 1);
  const std::string name = slash == std::string::npos ? real_ : real_.substr(slash + 1);
  if (name.empty()) {
    errno = EISDIR;
    return Fail("Cannot write " + target_);
  }

  struct stat st{};
  const bool exists = ::stat(real_.c_str(), &st) == 0;
  if (exists && S_ISDIR(st.st_mode)) {
    errno = EISDIR;
    return Fail("Cannot write " + target_);
  }
  if (exists && !S_ISREG(st.st_mode)) {
    if (!options_.writeIntoSpecialFiles) {
      failed_ = true;
      error_ = "not a regular file";
      return Status::Error("Cannot write " + target_ + ": it is not a regular file");
    }
    // Replacing a FIFO or a device node by a file would break whoever
    // reads from it (or, for the administrator, the device itself).
    fd_ = ::open(real_.c_str(), O_WRONLY | O_CLOEXEC | O_NOCTTY);
    if (fd_ < 0) return Fail("Cannot write " + target_);
    direct_ = true;
    buffer_.reserve(kWriteBuffer);
    return Status::Ok();
  }
  // The write bits decide even for the administrator, who could write
  // anything: a file nobody may write was made read-only on purpose.
  if (exists && ((st.st_mode & 0222) == 0 ||
                 ::faccessat(AT_FDCWD, real_.c_str(), W_OK, AT_EACCESS) != 0)) {
    failed_ = true;
    error_ = "the file is read-only";
    return Status::Error("Cannot write " + target_ + ": the file is read-only");
  }

  replacing_ = exists;
  const std::string dir = DirectoryOf(real_);
  const std::string prefix = TemporaryPrefix(name, NameLimit(dir));
  RemoveDeadTemporaries(dir, prefix);
  // Owner-only at creation; the target's group and mode follow at once,
  // before a single byte is written.
  const mode_t createMode = exists ? (st.st_mode & 0600) : 0666;
  std::random_device rd;
  for (int attempt = 0; attempt < 16; ++attempt) {
    char random[8];
    std::snprintf(random, sizeof random, "%06u", static_cast<unsigned>(rd() % 1000000));
    temp_ = folder + prefix + std::to_string(::getpid()) + "-" + random + ".tmp";
    fd_ = ::open(temp_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, createMode);
    if (fd_ >= 0 || errno != EEXIST) break;
  }
  if (fd_ < 0) {
    temp_.clear();
    return Fail("Cannot create a file beside " + target_);
  }
  if (exists) {
    // Only the administrator may give a file away; others keep what the
    // system allows (their own group memberships).
    if (st.st_uid != ::geteuid() || st.st_gid != ::getegid()) {
      if (::fchown(fd_, st.st_uid, st.st_gid) != 0) (void)::fchown(fd_, static_cast<uid_t>(-1), st.st_gid);
    }
    ::fchmod(fd_, st.st_mode & 07777);
  }
  buffer_.reserve(kWriteBuffer);
  return Status::Ok();
}

namespace {

// All of p[0, size) at the file's position, or at `at` when that is not
// negative, through interruptions and partial writes; false with the reason
// in `error` when the system refuses.
bool WriteFully(int fd, const uint8_t* p, size_t size, int64_t at, std::string& error) {
  size_t done = 0;
  while (done < size) {
    const ssize_t n = at < 0 ? ::write(fd, p + done, size - done)
                             : ::pwrite(fd, p + done, size - done, static_cast<off_t>(at) + static_cast<off_t>(done));
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) {
      error = n < 0 ? ErrnoText() : "short write";
      return false;
    }
    done += static_cast<size_t>(n);
  }
  return true;
}

}  // namespace

bool SafeFileWriter::WriteAll(const uint8_t* p, size_t size) {
  // A file that will be flushed starts on its way to the disk while the
  // rest is still being written, so that the flush at the end waits for
  // the last part only. Only a start: the flush still decides. The same
  // holds for one that replaces a file without a flush: renaming it over
  // the old one makes the file system send all of it on its way then (lest
  // a crash leave an empty file where the old one was), all at once at the
  // end unless it was started on the way. A large block goes in steps.
  const bool sendOn = (options_.sync || replacing_) && !direct_;
  size_t done = 0;
  while (done < size) {
    const size_t step = sendOn ? std::min<size_t>(size - done, kWriteBackStep) : size - done;
    if (!WriteFully(fd_, p + done, step, -1, error_)) {
      failed_ = true;
      return false;
    }
    done += step;
    writtenBytes_ += step;
#if defined(__linux__)
    if (sendOn && writtenBytes_ - startedBytes_ >= kWriteBackStep) {
      ::sync_file_range(fd_, static_cast<off64_t>(startedBytes_),
                        static_cast<off64_t>(writtenBytes_ - startedBytes_), SYNC_FILE_RANGE_WRITE);
      startedBytes_ = writtenBytes_;
    }
#endif
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

bool SafeFileWriter::SkipTo(uint64_t offset) {
  if (failed_ || fd_ < 0) return false;
  if (direct_) {
    failed_ = true;
    error_ = "cannot skip ahead in a special file";
    return false;
  }
  if (!Flush()) return false;
  if (::lseek(fd_, static_cast<off_t>(offset), SEEK_SET) < 0) {
    failed_ = true;
    error_ = ErrnoText();
    return false;
  }
  // What is sent on to the disk while writing counts from here.
  writtenBytes_ = startedBytes_ = offset;
  return true;
}

bool SafeFileWriter::WriteAt(uint64_t offset, const void* data, size_t size) {
  if (failed_ || fd_ < 0 || !Flush()) return false;
  if (!WriteFully(fd_, static_cast<const uint8_t*>(data), size, static_cast<int64_t>(offset), error_)) {
    failed_ = true;
    return false;
  }
  return true;
}

Status SafeFileWriter::Commit() {
  if (fd_ < 0) return Status::Error("Cannot write " + target_ + (error_.empty() ? "" : ": " + error_));
  if (!failed_) Flush();
  if (!failed_ && options_.sync && !direct_ && ::fsync(fd_) != 0) {
    failed_ = true;
    error_ = ErrnoText();
  }
  struct stat st{};
  if (!failed_ && !direct_ && ::fstat(fd_, &st) == 0) written_ = StateOf(st);
  if (::close(fd_) != 0 && !failed_) {
    failed_ = true;
    error_ = ErrnoText();
  }
  fd_ = -1;
  if (direct_) {
    if (failed_) return Status::Error("Cannot write " + target_ + ": " + error_);
    return Status::Ok();
  }
  if (!failed_ && ::rename(temp_.c_str(), real_.c_str()) != 0) {
    failed_ = true;
    error_ = ErrnoText();
  }
  if (failed_) {
    written_.reset();
    ::unlink(temp_.c_str());
    temp_.clear();
    return Status::Error("Cannot write " + target_ + ": " + error_);
  }
  temp_.clear();
  if (!options_.sync) return Status::Ok();
  // Make the rename itself durable.
  int dfd = ::open(DirectoryOf(real_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
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

Status FileLock::Acquire(const std::string& path, int timeoutMs, Kind kind) {
  Release();
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
  auto pause = std::chrono::milliseconds(1);
  for (;;) {
    struct stat opened{};
    int fd = OpenRegular(path, &opened);
    if (fd < 0) return Status::Ok();
    if (::flock(fd, (kind == Kind::kShared ? LOCK_SH : LOCK_EX) | LOCK_NB) == 0) {
      // The holder before may have saved while this process waited, putting
      // a new file in place of the one locked here: then that one counts.
      struct stat now{};
      if (::stat(path.c_str(), &now) == 0 && now.st_dev == opened.st_dev &&
          now.st_ino == opened.st_ino) {
        fd_ = fd;
        state_ = StateOf(now);
        return Status::Ok();
      }
      ::close(fd);
      if (std::chrono::steady_clock::now() >= deadline) break;
      continue;
    }
    const int error = errno;
    ::close(fd);
    if (error != EWOULDBLOCK && error != EINTR) {
      errno = error;
      return Status::Error("Cannot lock " + path + ": " + ErrnoText());
    }
    if (std::chrono::steady_clock::now() >= deadline) break;
    std::this_thread::sleep_for(pause);
    pause = std::min(pause * 2, std::chrono::milliseconds(50));
  }
  return Status::Error(path + " is in use by another program; try again when it is done");
}

void FileLock::Release() {
  if (fd_ >= 0) {
    ::close(fd_);
    fd_ = -1;
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
