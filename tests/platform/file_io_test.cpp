// The safe writer's promises under the ways a save can go wrong, and the
// readers' refusal of anything that is not a regular file.
#include <gtest/gtest.h>

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "platform/file_io.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::TempDir;

void Put(const std::string& path, const std::string& text) {
  ASSERT_TRUE(WriteFileSafely(path, text.data(), text.size()).ok()) << path;
}

std::string Get(const std::string& path) {
  std::vector<uint8_t> b;
  if (!ReadWholeFile(path, b)) return "<unreadable>";
  return {b.begin(), b.end()};
}

std::vector<std::string> Temporaries(const std::string& dir, const std::string& target) {
  std::vector<std::string> found;
  for (const std::string& name : ListFiles(dir)) {
    if (IsTemporaryNameFor(target, name)) found.push_back(name);
  }
  return found;
}

mode_t ModeOf(const std::string& path) {
  struct stat st{};
  return ::stat(path.c_str(), &st) == 0 ? st.st_mode : 0;
}

TEST(SafeWriterTest, NamesUpToTheLengthLimitAreReplaced) {
  TempDir dir;
  // A temporary name built by adding to the target's would not fit.
  for (size_t length : {240u, 255u}) {
    const std::string name = std::string(length - 4, 'n') + ".PDB";
    Put(dir.File(name), "old");
    Put(dir.File(name), "new");
    EXPECT_EQ(Get(dir.File(name)), "new") << length;
    EXPECT_TRUE(Temporaries(dir.path(), name).empty());
  }
  // Long names that differ only at the end get temporaries of their own.
  const std::string a = std::string(250, 'x') + "a.PDB", b = std::string(250, 'x') + "b.PDB";
  SafeFileWriter wa(dir.File(a)), wb(dir.File(b));
  ASSERT_TRUE(wa.Open().ok());
  ASSERT_TRUE(wb.Open().ok());
  EXPECT_NE(wa.temporaryPath(), wb.temporaryPath());
  EXPECT_TRUE(IsTemporaryNameFor(a, wa.temporaryPath().substr(dir.path().size() + 1)));
  EXPECT_FALSE(IsTemporaryNameFor(b, wa.temporaryPath().substr(dir.path().size() + 1)));
}

TEST(SafeWriterTest, FullDiskKeepsTheOldFile) {
  testing::SmallTmpfs disk(64 * 1024);
  if (!disk.ok()) GTEST_SKIP() << disk.why();
  const std::string path = disk.File("Full.PDB");
  Put(path, std::string(8000, 'o'));
  ASSERT_TRUE(disk.FillUp());
  const std::string bigger(40000, 'n');
  Status s = WriteFileSafely(path, bigger.data(), bigger.size());
  ASSERT_FALSE(s.ok());
  EXPECT_NE(s.message().find(path), std::string::npos) << s.message();
  EXPECT_NE(s.message().find("No space"), std::string::npos) << s.message();
  EXPECT_EQ(Get(path), std::string(8000, 'o'));
  EXPECT_TRUE(Temporaries(disk.path(), "Full.PDB").empty());
}

TEST(SafeWriterTest, ReadOnlyFileIsNotReplacedEvenByTheAdministrator) {
  TempDir dir;
  const std::string path = dir.File("Locked.PDB");
  Put(path, "kept");
  ASSERT_EQ(::chmod(path.c_str(), 0444), 0);
  Status s = WriteFileSafely(path, "lost", 4);
  ASSERT_FALSE(s.ok());
  EXPECT_NE(s.message().find(path), std::string::npos) << s.message();
  EXPECT_NE(s.message().find("read-only"), std::string::npos) << s.message();
  EXPECT_EQ(Get(path), "kept");
  EXPECT_EQ(ModeOf(path) & 07777, 0444u);
}

// Runs `body` as an ordinary user when this process is the administrator
// (whom no permission stops); its exit code is the result.
int AsOrdinaryUser(const std::function<int()>& body) {
  pid_t pid = ::fork();
  if (pid == 0) {
    if (::geteuid() == 0 && (::setgid(65534) != 0 || ::setuid(65534) != 0)) ::_exit(99);
    ::_exit(body());
  }
  int status = 0;
  ::waitpid(pid, &status, 0);
  return WIFEXITED(status) ? WEXITSTATUS(status) : 100;
}

TEST(SafeWriterTest, FolderWithoutWritePermissionKeepsTheOldFile) {
  TempDir dir;
  ASSERT_EQ(::chmod(dir.path().c_str(), 0755), 0);
  const std::string folder = dir.File("shut");
  ASSERT_EQ(::mkdir(folder.c_str(), 0755), 0);
  const std::string path = folder + "/Shared.PDB";
  Put(path, "kept");
  // Writable itself, so only the folder stands in the way.
  ASSERT_EQ(::chmod(path.c_str(), 0666), 0);
  if (::geteuid() != 0) {
    ASSERT_EQ(::chmod(folder.c_str(), 0555), 0);
  }
  int result = AsOrdinaryUser([&] {
    Status s = WriteFileSafely(path, "lost", 4);
    if (s.ok()) return 1;
    if (s.message().find("Permission denied") == std::string::npos) return 2;
    return 0;
  });
  ::chmod(folder.c_str(), 0755);
  EXPECT_EQ(result, 0);
  EXPECT_EQ(Get(path), "kept");
}

TEST(SafeWriterTest, TemporaryFileHasTheTargetsModeFromTheStart) {
  TempDir dir;
  for (mode_t mode : {0600u, 0640u, 0604u}) {
    const std::string path = dir.File("Private.PDB");
    Put(path, "secret");
    ASSERT_EQ(::chmod(path.c_str(), mode), 0);
    SafeFileWriter w(path);
    ASSERT_TRUE(w.Open().ok());
    // Nothing written yet: this is the moment a reader could have come.
    EXPECT_EQ(ModeOf(w.temporaryPath()) & 07777, mode) << std::oct << mode;
    w.Write("more secret", 11);
    ASSERT_TRUE(w.Commit().ok());
    EXPECT_EQ(ModeOf(path) & 07777, mode) << std::oct << mode;
  }
}

TEST(SafeWriterTest, OwnerAndGroupAreKeptByTheAdministrator) {
  if (::geteuid() != 0) GTEST_SKIP() << "only the administrator saves files of other users";
  TempDir dir;
  const std::string path = dir.File("Theirs.PDB");
  Put(path, "theirs");
  ASSERT_EQ(::chown(path.c_str(), 1234, 5678), 0);
  Put(path, "edited");
  struct stat st{};
  ASSERT_EQ(::stat(path.c_str(), &st), 0);
  EXPECT_EQ(st.st_uid, 1234u);
  EXPECT_EQ(st.st_gid, 5678u);
}

TEST(SafeWriterTest, TemporariesOfDeadSavesAreRemoved) {
  TempDir dir;
  const std::string path = dir.File("Killed.PDB");
  Put(path, "v1");
  int fds[2];
  ASSERT_EQ(::pipe(fds), 0);
  pid_t pid = ::fork();
  if (pid == 0) {
    ::close(fds[0]);
    SafeFileWriter w(path);
    if (!w.Open().ok()) ::_exit(1);
    w.Write("half", 4);
    if (::write(fds[1], "1", 1) != 1) ::_exit(1);
    ::sleep(30);  // killed long before
    ::_exit(0);
  }
  ::close(fds[1]);
  pollfd p{fds[0], POLLIN, 0};
  char ready = 0;
  ASSERT_EQ(::poll(&p, 1, 10000), 1);
  ASSERT_EQ(::read(fds[0], &ready, 1), 1);
  ::close(fds[0]);
  ASSERT_EQ(Temporaries(dir.path(), "Killed.PDB").size(), 1u);
  ::kill(pid, SIGKILL);
  ::waitpid(pid, nullptr, 0);

  // A save in progress in a living process, and another file's leftover.
  SafeFileWriter alive(path);
  ASSERT_TRUE(alive.Open().ok());
  Put(dir.File("Other.PDB"), "x");
  SafeFileWriter other(dir.File("Other.PDB"));
  ASSERT_TRUE(other.Open().ok());

  Put(path, "v2");
  std::vector<std::string> left = Temporaries(dir.path(), "Killed.PDB");
  ASSERT_EQ(left.size(), 1u);
  EXPECT_EQ(dir.File(left[0]), alive.temporaryPath());
  EXPECT_EQ(Temporaries(dir.path(), "Other.PDB").size(), 1u);
  EXPECT_EQ(Get(path), "v2");
}

TEST(SafeWriterTest, LinksKeepPointingAtTheNewVersion) {
  TempDir dir;
  ASSERT_EQ(::mkdir(dir.File("real").c_str(), 0700), 0);
  Put(dir.File("real/Data.PDB"), "old");
  // A relative link to a link.
  ASSERT_EQ(::symlink("real/Data.PDB", dir.File("first").c_str()), 0);
  ASSERT_EQ(::symlink("first", dir.File("Link.PDB").c_str()), 0);
  Put(dir.File("Link.PDB"), "new");
  struct stat st{};
  ASSERT_EQ(::lstat(dir.File("Link.PDB").c_str(), &st), 0);
  EXPECT_TRUE(S_ISLNK(st.st_mode));
  ASSERT_EQ(::lstat(dir.File("first").c_str(), &st), 0);
  EXPECT_TRUE(S_ISLNK(st.st_mode));
  EXPECT_EQ(Get(dir.File("real/Data.PDB")), "new");
  EXPECT_TRUE(Temporaries(dir.path(), "Link.PDB").empty());
  EXPECT_TRUE(Temporaries(dir.File("real"), "Data.PDB").empty());

  // A link to a file not there yet makes that file.
  ASSERT_EQ(::symlink(dir.File("real/Later.PDB").c_str(), dir.File("Later.PDB").c_str()), 0);
  Put(dir.File("Later.PDB"), "made");
  EXPECT_EQ(Get(dir.File("real/Later.PDB")), "made");

  // A loop is an error, not a hang.
  ASSERT_EQ(::symlink("LoopB", dir.File("LoopA").c_str()), 0);
  ASSERT_EQ(::symlink("LoopA", dir.File("LoopB").c_str()), 0);
  EXPECT_FALSE(WriteFileSafely(dir.File("LoopA"), "x", 1).ok());
}

// Reads a FIFO until the writer closes it; bounded.
std::string DrainFifo(int fd) {
  std::string got;
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(10);
  while (std::chrono::steady_clock::now() < end) {
    pollfd p{fd, POLLIN, 0};
    if (::poll(&p, 1, 100) <= 0) continue;
    char buf[256];
    ssize_t n = ::read(fd, buf, sizeof buf);
    if (n > 0) got.append(buf, static_cast<size_t>(n));
    if (n == 0 && !got.empty()) break;
  }
  return got;
}

TEST(SafeWriterTest, SpecialFilesAreWrittenIntoNotReplaced) {
  TempDir dir;
  const std::string fifo = dir.File("pipe");
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  // A database save never writes into one.
  SafeFileWriter database(fifo);
  EXPECT_FALSE(database.Open().ok());

  int reader = ::open(fifo.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  ASSERT_GE(reader, 0);
  SafeFileWriter text(fifo, SafeFileWriter::Options{false, true});
  ASSERT_TRUE(text.Open().ok());
  text.Write("through the pipe", 16);
  ASSERT_TRUE(text.Commit().ok());
  EXPECT_EQ(DrainFifo(reader), "through the pipe");
  ::close(reader);
  EXPECT_TRUE(S_ISFIFO(ModeOf(fifo)));

  // A device that is full: the write fails, and the node stays a device.
  const std::string full = dir.File("full");
  if (::mknod(full.c_str(), S_IFCHR | 0666, makedev(1, 7)) != 0) {
    GTEST_SKIP() << "cannot make a device node here";
  }
  SafeFileWriter device(full, SafeFileWriter::Options{false, true});
  ASSERT_TRUE(device.Open().ok());
  device.Write("x", 1);
  Status s = device.Commit();
  EXPECT_FALSE(s.ok());
  EXPECT_NE(s.message().find("No space"), std::string::npos) << s.message();
  EXPECT_TRUE(S_ISCHR(ModeOf(full)));
}

TEST(ReadingTest, FifosAndDevicesAreRefusedAtOnce) {
  TempDir dir;
  const std::string fifo = dir.File("Waiting.PDB");
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  // Opening a FIFO for reading waits for a writer that never comes; the
  // alarm ends the test instead of letting it hang.
  ::alarm(20);
  std::vector<uint8_t> bytes;
  EXPECT_FALSE(ReadWholeFile(fifo, bytes));
  FileBuffer buffer;
  EXPECT_FALSE(buffer.Read(fifo));
  uint8_t head[78];
  EXPECT_EQ(ReadFileRange(fifo, 0, sizeof head, head), -1);
  EXPECT_EQ(ReadFileRange("/dev/zero", 0, sizeof head, head), -1);
  EXPECT_FALSE(buffer.Read("/dev/zero"));
  ::alarm(0);
}

TEST(ReadingTest, AMappedReadHoldsWhatACopiedReadHolds) {
  TempDir dir;
  const std::string path = dir.File("Mapped.PDB");
  std::string text;
  for (int i = 0; i < 5000; ++i) text += std::to_string(i * 7919) + ",";
  Put(path, text);
  FileBuffer copied, mapped;
  ASSERT_TRUE(copied.Read(path, FileBuffer::Access::kCopy));
  ASSERT_TRUE(mapped.Read(path, FileBuffer::Access::kMap));
  ASSERT_EQ(mapped.size(), text.size());
  EXPECT_EQ(std::memcmp(mapped.data(), text.data(), text.size()), 0);
  EXPECT_EQ(mapped.state(), copied.state());
  // Reading again into the same buffer gives up the first mapping.
  Put(path, "short");
  ASSERT_TRUE(mapped.Read(path, FileBuffer::Access::kMap));
  EXPECT_EQ(std::string(reinterpret_cast<const char*>(mapped.data()), mapped.size()), "short");

  // An empty file cannot be mapped; it reads as empty all the same.
  Put(path, "");
  ASSERT_TRUE(mapped.Read(path, FileBuffer::Access::kMap));
  EXPECT_EQ(mapped.size(), 0u);
  EXPECT_FALSE(mapped.Read(dir.File("Missing.PDB"), FileBuffer::Access::kMap));
}

TEST(FileLockTest, OneHolderAtATime) {
  TempDir dir;
  const std::string path = dir.File("Shared.PDB");
  Put(path, "x");
  FileLock first, second;
  ASSERT_TRUE(first.Acquire(path, 1000).ok());
  EXPECT_TRUE(first.held());
  Status busy = second.Acquire(path, 50);
  EXPECT_FALSE(busy.ok());
  EXPECT_NE(busy.message().find(path), std::string::npos);
  first.Release();
  EXPECT_TRUE(second.Acquire(path, 1000).ok());
  EXPECT_TRUE(second.held());

  // Readers share the file with each other, never with a writer.
  second.Release();
  FileLock reader1, reader2, writer;
  ASSERT_TRUE(reader1.Acquire(path, 1000, FileLock::Kind::kShared).ok());
  EXPECT_TRUE(reader2.Acquire(path, 50, FileLock::Kind::kShared).ok());
  EXPECT_FALSE(writer.Acquire(path, 50).ok());
  reader1.Release();
  reader2.Release();
  ASSERT_TRUE(writer.Acquire(path, 1000).ok());
  EXPECT_FALSE(reader1.Acquire(path, 50, FileLock::Kind::kShared).ok());

  // Nothing to lock is no error.
  FileLock none;
  EXPECT_TRUE(none.Acquire(dir.File("Missing.PDB"), 50).ok());
  EXPECT_FALSE(none.held());
}

}  // namespace
}  // namespace cx
