// Helpers shared by the tests: scratch folders and a scripted user interface.
#pragma once

#include <deque>
#include <optional>
#include <string>
#include <vector>

#include "platform/ui_port.h"

namespace cx::testing {

// A fresh folder under the system's temporary folder, removed with its
// contents when the object goes.
class TempDir {
 public:
  TempDir();
  ~TempDir();
  TempDir(const TempDir&) = delete;
  TempDir& operator=(const TempDir&) = delete;
  const std::string& path() const { return path_; }
  std::string File(const std::string& name) const { return path_ + "/" + name; }

 private:
  std::string path_;
};

// A small tmpfs mounted on a fresh folder, in a mount namespace of this
// process's own so that it goes away with the process even when a test
// dies: a disk that fills up. ok() is false where mounting is not allowed
// (not the administrator, no namespaces); why() then says so.
class SmallTmpfs {
 public:
  explicit SmallTmpfs(size_t bytes);
  ~SmallTmpfs();
  SmallTmpfs(const SmallTmpfs&) = delete;
  SmallTmpfs& operator=(const SmallTmpfs&) = delete;
  bool ok() const { return mounted_; }
  const std::string& why() const { return why_; }
  const std::string& path() const { return dir_.path(); }
  std::string File(const std::string& name) const { return dir_.File(name); }
  // Fills what is left with a file of its own; false if it never filled.
  bool FillUp();

 private:
  TempDir dir_;
  bool mounted_ = false;
  std::string why_;
};

// Records every message and answers questions from queues (an empty queue
// answers No / cancel).
class ScriptedUi : public UiPort {
 public:
  struct Message {
    std::string text;
    std::string caption;
  };

  void ShowMessage(const std::string& text, const std::string& caption, MessageIcon) override {
    messages.push_back({text, caption});
  }
  bool AskYesNo(const std::string& text, const std::string& caption) override {
    questions.push_back({text, caption});
    if (yesNoAnswers.empty()) return false;
    bool a = yesNoAnswers.front();
    yesNoAnswers.pop_front();
    return a;
  }
  // Each queued entry is a sequence of typed passwords ending in a cancel;
  // the first matching one grants (an "Invalid Password" message is recorded
  // for each wrong one).
  bool AskPassword(const std::string& expected) override {
    ++passwordPrompts;
    if (passwordAnswers.empty()) return false;
    std::vector<std::string> tries = passwordAnswers.front();
    passwordAnswers.pop_front();
    for (const auto& t : tries) {
      if (t == expected) return true;
      messages.push_back({"Invalid Password", "ERROR"});
    }
    return false;
  }
  std::optional<std::string> AskOpenFile(const std::string&, const std::string&) override {
    return PopFile();
  }
  std::optional<std::string> AskSaveFile(const std::string&, const std::string&,
                                         const std::string&) override {
    return PopFile();
  }

  std::vector<Message> messages;
  std::vector<Message> questions;
  std::deque<bool> yesNoAnswers;
  std::deque<std::vector<std::string>> passwordAnswers;
  std::deque<std::optional<std::string>> fileAnswers;
  int passwordPrompts = 0;

 private:
  std::optional<std::string> PopFile() {
    if (fileAnswers.empty()) return std::nullopt;
    auto f = fileAnswers.front();
    fileAnswers.pop_front();
    return f;
  }
};

}  // namespace cx::testing
