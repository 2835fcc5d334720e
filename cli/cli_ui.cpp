#include "cli/cli_ui.h"

#include <unistd.h>

#include <iostream>
#include <ostream>

#include "platform/text_codec.h"

namespace cx::cli {

namespace {
std::string Clean(const std::string& text) {
  std::string s = Cp1252ToUtf8(text);
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
  if (attempt > 0) return std::nullopt;
  if (!passwordGiven_) {
    err_ << "This database asks for its password: give it with --password.\n";
    return std::nullopt;
  }
  return password_;
}

std::optional<std::string> CliUi::AskOpenFile(const std::string&, const std::string&) {
  return std::nullopt;
}

std::optional<std::string> CliUi::AskSaveFile(const std::string&, const std::string&,
                                              const std::string&) {
  return std::nullopt;
}

}  // namespace cx::cli
