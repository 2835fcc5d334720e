#include "platform/process.h"

#include <spawn.h>
#include <sys/wait.h>

#include <cerrno>

extern char** environ;

namespace cx {

ProcessResult SystemProcessRunner::Run(const std::string& program,
                                       const std::vector<std::string>& args) {
  ProcessResult result;
  std::vector<std::string> owned;
  owned.reserve(args.size() + 1);
  owned.push_back(program);
  owned.insert(owned.end(), args.begin(), args.end());
  std::vector<char*> argv;
  argv.reserve(owned.size() + 1);
  for (std::string& a : owned) argv.push_back(a.data());
  argv.push_back(nullptr);

  pid_t pid = 0;
  // glibc reports a failed exec of the child here, so a missing program is
  // told apart from one that started and failed.
  int rc = ::posix_spawnp(&pid, program.c_str(), nullptr, nullptr, argv.data(), environ);
  if (rc != 0) {
    result.systemError = rc;
    result.outcome = (rc == ENOENT || rc == ENOTDIR) ? ProcessResult::Outcome::NotFound
                                                     : ProcessResult::Outcome::NotStarted;
    return result;
  }
  int status = 0;
  pid_t waited;
  do {
    waited = ::waitpid(pid, &status, 0);
  } while (waited < 0 && errno == EINTR);
  if (waited < 0) {
    result.systemError = errno;
    result.outcome = ProcessResult::Outcome::NotStarted;
    return result;
  }
  result.outcome = ProcessResult::Outcome::Exited;
  if (WIFEXITED(status)) {
    result.exitCode = WEXITSTATUS(status);
  } else if (WIFSIGNALED(status)) {
    result.exitCode = 128 + WTERMSIG(status);
  }
  return result;
}

}  // namespace cx
