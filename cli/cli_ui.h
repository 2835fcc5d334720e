// The user-interface port of the command-line tool: messages go to stderr;
// questions are answered by --yes / --no and refused without them; the
// password prompt is answered by --password (or --password-file), once: a
// wrong one is refused rather than asked again. Without either, a terminal
// is asked, without echo.
#pragma once

#include <iosfwd>
#include <optional>
#include <string>

#include "platform/ui_port.h"

namespace cx::cli {

class CliUi : public UiPort {
 public:
  explicit CliUi(std::ostream& err) : err_(err) {}

  void ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) override;
  bool AskYesNo(const std::string& text, const std::string& caption) override;
  std::optional<std::string> PromptPassword(int attempt) override;
  std::optional<std::string> AskOpenFile(const std::string& title, const std::string& filter) override;
  std::optional<std::string> AskSaveFile(const std::string& title, const std::string& filter,
                                         const std::string& suggested) override;

  // --yes / --no: the answer to every question; unset: questions refuse.
  void SetAnswer(std::optional<bool> answer) { answer_ = answer; }
  // --password: typed at every password prompt. `given` tells whether the
  // option was present at all.
  void SetPassword(const std::string& password, bool given) {
    password_ = password;
    passwordGiven_ = given;
  }
  // The command whose error messages are shown (named in front of them).
  void SetCommand(const std::string& name) { command_ = name; }
  // True once a question went unanswered (the command should fail).
  bool unanswered() const { return unanswered_; }
  int messagesShown() const { return messages_; }

 private:
  std::ostream& err_;
  std::optional<bool> answer_;
  std::string password_;
  std::string command_;
  bool passwordGiven_ = false;
  std::optional<std::string> typed_;  // at the terminal, for later checks
  bool unanswered_ = false;
  int messages_ = 0;
};

}  // namespace cx::cli
