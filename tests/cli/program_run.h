// Runs the real command-line program (CARDOVEX_CLI, set by the build) in a
// child process, for tests that need what only a process has: its own
// standard streams, exit status, locks held by another process, a kill.
#pragma once

#include <signal.h>
#include <sys/wait.h>
#include <fcntl.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <iterator>
#include <string>
#include <thread>
#include <vector>

#include "tests/cli/run_in_process.h"

namespace cx::cli {

inline std::string ReadText(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), {});
}

inline void WriteText(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}

// Starts the program with its output going to the files named, and its
// input read from `stdinPath` when one is given.
inline pid_t Spawn(const std::vector<std::string>& args, const std::string& stdoutPath,
                   const std::string& stderrPath, const std::string& stdinPath = "") {
  pid_t pid = ::fork();
  if (pid != 0) return pid;
  int out = ::open(stdoutPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  int err = ::open(stderrPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
  if (out < 0 || err < 0) ::_exit(126);
  if (!stdinPath.empty()) {
    int in = ::open(stdinPath.c_str(), O_RDONLY);
    if (in < 0) ::_exit(126);
    ::dup2(in, STDIN_FILENO);
  }
  ::dup2(out, STDOUT_FILENO);
  ::dup2(err, STDERR_FILENO);
  std::vector<char*> argv{const_cast<char*>(CARDOVEX_CLI)};
  for (const std::string& a : args) argv.push_back(const_cast<char*>(a.c_str()));
  argv.push_back(nullptr);
  ::execv(CARDOVEX_CLI, argv.data());
  ::_exit(127);
}

// Waits for `pid` until `deadline`: its exit code, -2 when a signal ended
// it, or -1 when it was late (it is then killed).
inline int Await(pid_t pid, std::chrono::steady_clock::time_point deadline) {
  int status = 0;
  while (std::chrono::steady_clock::now() < deadline) {
    if (::waitpid(pid, &status, WNOHANG) == pid) return WIFEXITED(status) ? WEXITSTATUS(status) : -2;
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  ::kill(pid, SIGKILL);
  ::waitpid(pid, &status, 0);
  return -1;
}

}  // namespace cx::cli
