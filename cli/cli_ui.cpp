#include "cli/cli_ui.h"

#include <termios.h>
#include <unistd.h>

#include <cerrno>
#include <iostream>
#include <ostream>

#include "cli/argument_text.h"
#include "platform/text_codec.h"

namespace cx::cli {

namespace {

// Tries at the terminal before the check gives up, as a dialog would be
// cancelled after a few wrong passwords.
constexpr int kTerminalTries = 3;
// Far more than a stored password can hold; a longer line is cut.
constexpr size_t kPasswordLineMax = 1024;

// One line from the terminal with echo off; nothing at end of input. The
// terminal's settings come back whatever happens.
std::optional<std::string> ReadHidden() {
  termios saved{};
  const bool quiet = ::tcgetattr(STDIN_FILENO, &saved) == 0;
  if (quiet) {
    termios hidden = saved;
    hidden.c_lflag &= ~static_cast<tcflag_t>(ECHO);
    hidden.c_lflag |= ECHONL;
    ::tcsetattr(STDIN_FILENO, TCSAFLUSH, &hidden);
  }
  std::string line;
  bool ended = false;
  char c = 0;
  while (line.size() < kPasswordLineMax) {
    const ssize_t n = ::read(STDIN_FILENO, &c, 1);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) {
      ended = line.empty();
      break;
    }
    if (c == '\n') break;
    line.push_back(c);
  }
  if (quiet) ::tcsetattr(STDIN_FILENO, TCSAFLUSH, &saved);
  if (ended) return std::nullopt;
  if (!line.empty() && line.back() == '\r') line.pop_back();
  return line;
}

std::string Clean(const std::string& text) {
  std::string s = MessageToUtf8(text);
  while (!s.empty() && s.back() == '\n') s.pop_back();
  return s;
}
}  // namespace

void CliUi::ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) {
  ++messages_;
  // Errors and warnings carry the tool's and the command's name as every
  // other diagnostic does; a notice such as a print confirmation does not.
  if ((icon == MessageIcon::Error || icon == MessageIcon::Warning) && !command_.empty()) {
    err_ << "cardovex-cli: " << command_ << ": ";
  }
  err_ << (caption.empty() ? "" : Clean(caption) + ": ") << Clean(text) << "\n";
}

bool CliUi::AskYesNo(const std::string& text, const std::string& caption) {
  if (answer_) {
    err_ << Clean(caption) << ": " << Clean(text) << " -> " << (*answer_ ? "Yes" : "No") << "\n";
    return *answer_;
  }
  if (::isatty(STDIN_FILENO) && ::isatty(STDERR_FILENO)) {
    err_ << Clean(caption) << ": " << Clean(text) << " [y/N] " << std::flush;
    std::string reply;
    std::getline(std::cin, reply);
    return !reply.empty() && (reply[0] == 'y' || reply[0] == 'Y');
  }
  unanswered_ = true;
  err_ << Clean(caption) << ": " << Clean(text)
       << "\n(answer with --yes or --no; nothing was changed)\n";
  return false;
}

std::optional<std::string> CliUi::PromptPassword(int attempt) {
  if (passwordGiven_) {
    if (attempt > 0) return std::nullopt;
    return password_;
  }
  // One typed password serves every check of the command, so the user is
  // asked again only after a wrong one.
  if (attempt == 0 && typed_) return typed_;
  if (attempt >= kTerminalTries || !::isatty(STDIN_FILENO) || !::isatty(STDERR_FILENO)) {
    if (attempt == 0) {
      err_ << "This database asks for its password: give it with --password-file or --password.\n";
    }
    return std::nullopt;
  }
  for (int tries = 0; tries < kTerminalTries; ++tries) {
    err_ << "Password: " << std::flush;
    std::optional<std::string> line = ReadHidden();
    if (!line) return std::nullopt;
    std::string stored, error;
    if (ToStoredText(*line, "the password", stored, error)) {
      typed_ = stored;
      return stored;
    }
    err_ << error << "\n";
  }
  return std::nullopt;
}

std::optional<std::string> CliUi::AskOpenFile(const std::string&, const std::string&) {
  return std::nullopt;
}

std::optional<std::string> CliUi::AskSaveFile(const std::string&, const std::string&,
                                              const std::string&) {
  return std::nullopt;
}

}  // namespace cx::cli
