// The user-interface port: everything below the GUI that must ask or tell
// the user goes through this interface. The desktop application implements
// it with dialogs, the command-line tool with flags and stderr, and tests
// script it.
//
// Threads: any call may come from any thread (a beam's worker reports
// through the same port as the window). An implementation that shows
// windows delivers each call on its GUI thread and, for questions, blocks
// the calling thread until the user has answered; callers therefore must
// not hold locks the GUI thread may wait for while they ask.
#pragma once

#include <optional>
#include <string>

namespace cx {

enum class MessageIcon { None, Information, Warning, Error, Question };

// The answer to a Yes/No/Cancel question.
enum class Answer { Yes, No, Cancel };

// What a file dialog is asked to show. `filter` has the form
// "Label|pattern;pattern|Label|pattern||"; patterns match file names
// without regard to letter case, so "*.pdb" also lists "CONTACTS.PDB".
struct FileDialogRequest {
  std::string title;
  std::string filter;
  std::string folder;         // where the dialog starts; empty: its own choice
  std::string fileName;       // proposed name or full path (save dialogs)
  std::string defaultSuffix;  // added when the typed name has none ("PDB")
};

class UiPort {
 public:
  virtual ~UiPort() = default;

  // A message box with an OK button. Texts are 8-bit (Windows-1252) as the
  // engine holds them; implementations widen them for display.
  virtual void ShowMessage(const std::string& text, const std::string& caption,
                           MessageIcon icon = MessageIcon::None) = 0;

  // A Yes/No question; true for Yes.
  virtual bool AskYesNo(const std::string& text, const std::string& caption) = 0;

  // A Yes/No/Cancel question. Ports that cannot offer Cancel answer it as a
  // Yes/No question.
  virtual Answer AskYesNoCancel(const std::string& text, const std::string& caption) {
    return AskYesNo(text, caption) ? Answer::Yes : Answer::No;
  }

  // The password prompt ("Get Password", one edit "Password:", at most 19
  // characters): what the user typed, or nothing when they cancelled.
  // `attempt` counts the tries of one check from 0; the check itself
  // compares and, after "Invalid Password", prompts again.
  virtual std::optional<std::string> PromptPassword(int attempt) = 0;

  // File dialogs; nothing when cancelled. The save dialog confirms before
  // it names an existing file.
  virtual std::optional<std::string> AskOpenFile(const std::string& title,
                                                 const std::string& filter) = 0;
  virtual std::optional<std::string> AskSaveFile(const std::string& title,
                                                 const std::string& filter,
                                                 const std::string& suggested) = 0;
  // The same with a start folder and a default suffix; ports without them
  // fall back to the calls above.
  virtual std::optional<std::string> ChooseOpenFile(const FileDialogRequest& request) {
    return AskOpenFile(request.title, request.filter);
  }
  virtual std::optional<std::string> ChooseSaveFile(const FileDialogRequest& request) {
    return AskSaveFile(request.title, request.filter, request.fileName);
  }

  // Wait-cursor and status hook for long operations; default does nothing.
  // Callers skip formatting status texts nobody shows.
  virtual void SetBusy(bool /*busy*/) {}
  virtual void Status(const std::string& /*text*/) {}
  virtual bool WantsStatus() const { return false; }
};

// A port that says nothing and answers every question "No" / cancel. Useful
// where an operation must not prompt.
class SilentUi : public UiPort {
 public:
  void ShowMessage(const std::string&, const std::string&, MessageIcon) override {}
  bool AskYesNo(const std::string&, const std::string&) override { return false; }
  Answer AskYesNoCancel(const std::string&, const std::string&) override { return Answer::Cancel; }
  std::optional<std::string> PromptPassword(int) override { return std::nullopt; }
  std::optional<std::string> AskOpenFile(const std::string&, const std::string&) override {
    return std::nullopt;
  }
  std::optional<std::string> AskSaveFile(const std::string&, const std::string&,
                                         const std::string&) override {
    return std::nullopt;
  }
};

// Passes every call on to another port. Ports that change one thing (count
// messages, add a line to questions, show progress) derive from this and
// override only that.
class ForwardingUi : public UiPort {
 public:
  explicit ForwardingUi(UiPort& inner) : inner_(inner) {}
  void ShowMessage(const std::string& text, const std::string& caption, MessageIcon icon) override {
    inner_.ShowMessage(text, caption, icon);
  }
  bool AskYesNo(const std::string& text, const std::string& caption) override {
    return inner_.AskYesNo(text, caption);
  }
  Answer AskYesNoCancel(const std::string& text, const std::string& caption) override {
    return inner_.AskYesNoCancel(text, caption);
  }
  std::optional<std::string> PromptPassword(int attempt) override {
    return inner_.PromptPassword(attempt);
  }
  std::optional<std::string> AskOpenFile(const std::string& title,
                                         const std::string& filter) override {
    return inner_.AskOpenFile(title, filter);
  }
  std::optional<std::string> AskSaveFile(const std::string& title, const std::string& filter,
                                         const std::string& suggested) override {
    return inner_.AskSaveFile(title, filter, suggested);
  }
  std::optional<std::string> ChooseOpenFile(const FileDialogRequest& request) override {
    return inner_.ChooseOpenFile(request);
  }
  std::optional<std::string> ChooseSaveFile(const FileDialogRequest& request) override {
    return inner_.ChooseSaveFile(request);
  }
  void SetBusy(bool busy) override { inner_.SetBusy(busy); }
  void Status(const std::string& text) override { inner_.Status(text); }
  bool WantsStatus() const override { return inner_.WantsStatus(); }

 protected:
  UiPort& inner() { return inner_; }

 private:
  UiPort& inner_;
};

// Sets the wait cursor for the lifetime of the object.
class BusyScope {
 public:
  explicit BusyScope(UiPort& ui) : ui_(ui) { ui_.SetBusy(true); }
  ~BusyScope() { ui_.SetBusy(false); }
  BusyScope(const BusyScope&) = delete;
  BusyScope& operator=(const BusyScope&) = delete;

 private:
  UiPort& ui_;
};

}  // namespace cx
