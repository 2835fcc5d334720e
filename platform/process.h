// Starting an outside program (the print program): run it with arguments,
// wait for it to end, take its exit code.
#pragma once

#include <string>
#include <vector>

namespace cx {

struct ProcessResult {
  enum class Outcome {
    Exited,        // it ran; exitCode holds its code
    NotFound,      // no such program (on the search path or at the path given)
    NotStarted,    // it exists but could not be started; systemError says why
  };
  Outcome outcome = Outcome::NotStarted;
  // The program's exit code; a program ended by a signal reports 128 + the
  // signal number, as shells do.
  int exitCode = -1;
  int systemError = 0;  // errno of the failed start
  bool started() const { return outcome == Outcome::Exited; }
};

class ProcessRunner {
 public:
  virtual ~ProcessRunner() = default;
  // Runs `program` (looked up on PATH when it holds no '/') with `args`
  // and waits without limit for it to end. Standard streams are inherited.
  virtual ProcessResult Run(const std::string& program, const std::vector<std::string>& args) = 0;
};

// The POSIX implementation (posix_spawnp and waitpid).
class SystemProcessRunner : public ProcessRunner {
 public:
  ProcessResult Run(const std::string& program, const std::vector<std::string>& args) override;
};

}  // namespace cx
