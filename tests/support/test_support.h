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

// Records every message, question and file dialog, and answers from queues
// (an empty queue answers No, Cancel, or cancels the dialog).
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
  Answer AskYesNoCancel(const std::string& text, const std::string& caption) override {
    questions.push_back({text, caption});
    ++yesNoCancelAsked;
    if (yesNoCancelAnswers.empty()) return Answer::Cancel;
    Answer a = yesNoCancelAnswers.front();
    yesNoCancelAnswers.pop_front();
    return a;
  }
  // Each queued entry of passwordAnswers is one showing of the prompt: the
  // passwords typed in turn, then a cancel. A showing starts at attempt 0.
  std::optional<std::string> PromptPassword(int attempt) override {
    if (attempt == 0) {
      ++passwordPrompts;
      typing_.clear();
      if (!passwordAnswers.empty()) {
        typing_.assign(passwordAnswers.front().begin(), passwordAnswers.front().end());
        passwordAnswers.pop_front();
      }
    }
    if (typing_.empty()) return std::nullopt;
    std::string typed = typing_.front();
    typing_.pop_front();
    return typed;
  }
  std::optional<std::string> AskOpenFile(const std::string& title, const std::string& filter) override {
    return ChooseOpenFile({title, filter, "", "", ""});
  }
  std::optional<std::string> AskSaveFile(const std::string& title, const std::string& filter,
                                         const std::string& suggested) override {
    return ChooseSaveFile({title, filter, "", suggested, ""});
  }
  std::optional<std::string> ChooseOpenFile(const FileDialogRequest& request) override {
    openRequests.push_back(request);
    return PopFile();
  }
  std::optional<std::string> ChooseSaveFile(const FileDialogRequest& request) override {
    saveRequests.push_back(request);
    return PopFile();
  }

  // True when a message with this text was shown.
  bool Showed(const std::string& text) const {
    for (const auto& m : messages) {
      if (m.text == text) return true;
    }
    return false;
  }

  std::vector<Message> messages;
  std::vector<Message> questions;
  std::deque<bool> yesNoAnswers;
  std::deque<Answer> yesNoCancelAnswers;
  std::deque<std::vector<std::string>> passwordAnswers;
  std::deque<std::optional<std::string>> fileAnswers;
  std::vector<FileDialogRequest> openRequests;
  std::vector<FileDialogRequest> saveRequests;
  int passwordPrompts = 0;
  int yesNoCancelAsked = 0;

 private:
  std::optional<std::string> PopFile() {
    if (fileAnswers.empty()) return std::nullopt;
    auto f = fileAnswers.front();
    fileAnswers.pop_front();
    return f;
  }
  std::deque<std::string> typing_;
};

}  // namespace cx::testing
