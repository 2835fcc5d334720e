// The command-line tool: one small class per command, found by name in a
// registry. Commands write to the context's streams so tests can capture
// them; they return the process exit code (0 success, 1 the operation
// failed, 2 usage error).
#pragma once

#include <functional>
#include <iosfwd>
#include <memory>
#include <string>
#include <vector>

#include "cli/cli_ui.h"
#include "cli/syntax.h"
#include "platform/file_io.h"
#include "platform/locale_info.h"

namespace cx::cli {

constexpr int kExitOk = 0;
constexpr int kExitFailed = 1;
constexpr int kExitUsage = 2;

struct Context {
  LocaleInfo locale;
  std::string password;  // --password
  bool json = false;     // --json
  std::ostream& out;
  std::ostream& err;
  CliUi& ui;
  // Locks on the databases the command works on, held until it ends, so
  // that commands run side by side take turns instead of losing updates.
  std::vector<std::unique_ptr<FileLock>> locks = {};
  // The command being run, named in every error line so that a script
  // running several commands can tell which one complained.
  std::string command = {};
};

class Command {
 public:
  virtual ~Command() = default;
  virtual std::string name() const = 0;
  // One line for the command list.
  virtual std::string summary() const = 0;
  // Its arguments and options with their help, declared once.
  virtual void Declare(Syntax& syntax) const = 0;
  // The usage lines and option descriptions shown by --help COMMAND.
  std::string help() const;
  virtual int Run(Context& ctx, const Arguments& args) = 0;
};

// Declares the global options (global_options.cpp). Each use takes a
// declaration of its own: parsing keeps what it found in the declaration.
void DeclareGlobalOptions(Syntax& syntax);

using CommandFactory = std::function<std::unique_ptr<Command>()>;

// Commands register themselves from their own files at start-up.
class Registry {
 public:
  static Registry& Instance();
  void Add(CommandFactory factory);
  std::unique_ptr<Command> Find(const std::string& name) const;
  std::vector<std::unique_ptr<Command>> All() const;  // sorted by name

 private:
  std::vector<CommandFactory> factories_;
};

struct Registration {
  explicit Registration(CommandFactory factory) { Registry::Instance().Add(std::move(factory)); }
};

#define CX_REGISTER_COMMAND(Type) \
  static const ::cx::cli::Registration kRegister##Type([] { return std::make_unique<Type>(); })

// Usage error: prints the message and the command's usage, returns 2.
int UsageError(Context& ctx, const Command& command, const std::string& message);
// Operation failed: prints "cardovex-cli: COMMAND: message" (UTF-8) on
// stderr, returns 1.
int Failure(Context& ctx, const std::string& message);

}  // namespace cx::cli
