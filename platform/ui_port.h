// The user-interface port: everything below the GUI that must ask or tell
// the user goes through this interface. The desktop application implements
// it with dialogs, the command-line tool with flags and stderr, and tests
// script it.
#pragma once

#include <optional>
#include <string>

namespace cx {

enum class MessageIcon { None, Information, Warning, Error, Question };

class UiPort {
 public:
  virtual ~UiPort() = default;

  // A message box with an OK button. Texts are 8-bit (Windows-1252) as the
  // engine holds them; implementations widen them for display.
  virtual void ShowMessage(const std::string& text, const std::string& caption,
                           MessageIcon icon = MessageIcon::None) = 0;

  // A Yes/No question; true for Yes.
  virtual bool AskYesNo(const std::string& text, const std::string& caption) = 0;

  // The password prompt ("Get Password"). The implementation compares the
  // typed text with `expected` exactly and keeps asking (after "Invalid
  // Password" / "ERROR") until it matches or the user cancels. Returns true
  // when the right text was given.
  virtual bool AskPassword(const std::string& expected) = 0;

  // File dialogs; nothing when cancelled.
  virtual std::optional<std::string> AskOpenFile(const std::string& title,
                                                 const std::string& filter) = 0;
  virtual std::optional<std::string> AskSaveFile(const std::string& title,
                                                 const std::string& filter,
                                                 const std::string& suggested) = 0;

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
  bool AskPassword(const std::string&) override { return false; }
  std::optional<std::string> AskOpenFile(const std::string&, const std::string&) override {
    return std::nullopt;
  }
  std::optional<std::string> AskSaveFile(const std::string&, const std::string&,
                                         const std::string&) override {
    return std::nullopt;
  }
};

}  // namespace cx
