// Running the independent OBEX tools as peers: finding them, starting them
// with a time limit, and a private network holding only loopback for the
// tools whose port cannot be changed.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <string>
#include <vector>

namespace cx::testing {

// The tool's full path when it is installed, else empty.
std::string FindTool(const std::string& name);

// Moves this thread (and every thread and process it starts later) into a
// network namespace of its own with only the loopback interface up. False
// when the process may not do that (not root); the result is kept.
bool EnterPrivateNetwork();

class ChildProcess {
 public:
  ChildProcess() = default;
  ~ChildProcess();  // kills and reaps a child still running
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  // Starts `argv` in `workDir` with its output going to `logPath`.
  bool Start(const std::vector<std::string>& argv, const std::string& workDir,
             const std::string& logPath);
  // The exit code, or -1 when `timeout` passed (the child is then killed).
  int Wait(std::chrono::milliseconds timeout);

 private:
  pid_t pid_ = -1;
};

}  // namespace cx::testing
