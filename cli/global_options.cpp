#include "cli/global_options.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>
#include <optional>
#include <ostream>
#include <sstream>
#include <tuple>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/json_output.h"
#include "platform/locale_info.h"
#include "platform/qt/qt_platform.h"
#include "platform/text_codec.h"

#ifndef CARDOVEX_VERSION
#define CARDOVEX_VERSION "0.0.0"
#endif

namespace cx::cli {
namespace {

// The first line of a file (or of standard input for "-"), without its
// line end; nothing when it cannot be read. An empty file is an empty
// password, as an empty --password is.
std::optional<std::string> ReadPasswordLine(const std::string& file) {
  errno = 0;
  std::string line;
  if (file == "-") {
    std::getline(std::cin, line);
    if (std::cin.bad()) return std::nullopt;
  } else {
    std::ifstream in(file, std::ios::binary);
    if (!in) return std::nullopt;
    std::getline(in, line);
    if (in.bad()) return std::nullopt;
  }
  if (!line.empty() && line.back() == '\r') line.pop_back();
  return line;
}

}  // namespace

void DeclareGlobalOptions(Syntax& s) {
  s.Option("--date-format", "PATTERN",
             "short date pattern in the handheld's tokens, e.g. M/d/yyyy, dd.MMM.yy "
             "(M/MM/MMM month as a number, d/dd day, yy/yyyy year)",
             Take::kLast)
        .Option("--date-sep", "C",
                "date separator (default: the first character of the pattern that is not a letter)",
                Take::kLast)
        .Option("--time-format", "PATTERN", "time pattern, e.g. h:mm:ss tt (12-hour) or HH:mm:ss",
                Take::kLast)
        .Option("--time-sep", "C", "time separator (default as for dates)", Take::kLast)
        .Option("--am", "TEXT", "the 12-hour designator before noon", Take::kLast)
        .Option("--pm", "TEXT", "the 12-hour designator after noon", Take::kLast)
        .Option("--decimal", "C",
                "decimal separator (a value other than \".\" makes numbers use \",\")\n"
                "Defaults for all of these come from the system locale.",
                Take::kLast)
        .Option("--password", "TEXT",
                "the password of a protected database (other users of the machine can read it in "
                "the process list)",
                Take::kLast)
        .Option("--password-file", "FILE",
                "the password from the first line of FILE, or of standard input with -; without "
                "either, a terminal is asked for it without echo",
                Take::kLast)
        .Flag("--yes", "the answer Yes to every question the command asks")
        .Flag("--no",
              "the answer No to every question; without either, questions are asked on the "
              "terminal, or (with no terminal) refused, and the command changes nothing")
        .Flag("--json",
              "machine-readable output: the result as one JSON document; a failure as "
              "{\"error\", \"exitCode\"} on stderr; commands with no result refuse it (exit 2)")
        .Flag("-h,--help", "this text, or with a COMMAND its own (also: help [COMMAND])")
        .Flag("-V,--version", "the program's version");
}

std::string GeneralHelp() {
  std::ostringstream s;
  s << "Usage: cardovex-cli [global options] COMMAND [arguments]\n\n"
    << "Cardovex keeps personal databases in .PDB files. Commands:\n";
  for (const auto& c : Registry::Instance().All()) {
    std::string name = c->name();
    s << "  " << name << std::string(name.size() < 16 ? 16 - name.size() : 1, ' ') << c->summary()
      << "\n";
  }
  Syntax globals;
  DeclareGlobalOptions(globals);
  s << "\nGlobal options (before or after the command):\n"
    << globals.OptionList()
    << "\nExit codes: 0 success, 1 the operation failed (the message is on stderr),\n"
       "2 usage error.\n"
    << "\n'cardovex-cli --help COMMAND' shows a command's arguments.\n";
  return s.str();
}

static int RunCommandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err,
                          CliUi& ui);

int RunCli(const std::vector<std::string>& args, std::ostream& out, std::ostream& err, CliUi& ui) {
  return WithJsonErrors(args, err, [&] { return RunCommandLine(args, out, err, ui); });
}

static int RunCommandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err,
                          CliUi& ui) {
  // The global options are taken wherever they stand before "--"; the rest
  // (the command's name, its arguments, "--" and what follows it) keeps
  // its order for the command's own parser.
  Syntax globals;
  DeclareGlobalOptions(globals);
  Arguments global;
  std::vector<std::string> rest;
  std::string problem;
  if (!globals.ParseKnown(args, global, rest, problem)) {
    err << "cardovex-cli: " << problem << "\n";
    return kExitUsage;
  }
  if (global.has("--version")) {
    out << "cardovex-cli " << CARDOVEX_VERSION << "\n";
    return kExitOk;
  }
  LocaleInfo locale = SystemLocaleInfo();
  if (auto v = global.value("--date-format")) {
    locale.shortDate = Utf8ToCp1252(*v);
    locale.dateSeparator = FirstSeparator(locale.shortDate, '/');
  }
  if (auto v = global.value("--time-format")) {
    locale.timeFormat = Utf8ToCp1252(*v);
    locale.timeSeparator = FirstSeparator(locale.timeFormat, ':');
  }
  if (auto v = global.value("--am")) locale.am = Utf8ToCp1252(*v);
  if (auto v = global.value("--pm")) locale.pm = Utf8ToCp1252(*v);
  if (auto v = global.value("--decimal")) {
    if (v->size() != 1) {
      err << "cardovex-cli: --decimal takes one character\n";
      return kExitUsage;
    }
    locale.decimalSeparator = (*v)[0];
  }
  // An empty separator stands for the usual one.
  for (auto [option, into, usual] : {std::tuple{"--date-sep", &locale.dateSeparator, '/'},
                                     std::tuple{"--time-sep", &locale.timeSeparator, ':'}}) {
    std::optional<std::string> sep = global.value(option);
    if (!sep) continue;
    const std::string c = Utf8ToCp1252(*sep);
    if (c.size() > 1) {
      err << "cardovex-cli: a separator is one character\n";
      return kExitUsage;
    }
    *into = c.empty() ? usual : c[0];
  }
  if (global.has("--password") && global.has("--password-file")) {
    err << "cardovex-cli: --password and --password-file exclude each other\n";
    return kExitUsage;
  }
  if (global.has("--yes") && global.has("--no")) {
    err << "cardovex-cli: --yes and --no exclude each other\n";
    return kExitUsage;
  }
  std::string password;
  const bool passwordGiven = global.has("--password") || global.has("--password-file");
  if (auto given = global.value("--password")) {
    std::string error;
    if (!ToStoredText(*given, "--password", password, error)) {
      err << "cardovex-cli: " << error << "\n";
      return kExitUsage;
    }
  } else if (auto file = global.value("--password-file")) {
    std::optional<std::string> line = ReadPasswordLine(*file);
    if (!line) {
      err << "cardovex-cli: --password-file: cannot read " << (*file == "-" ? "standard input" : *file)
          << (errno ? std::string(": ") + std::strerror(errno) : std::string()) << "\n";
      return kExitFailed;
    }
    std::string error;
    if (!ToStoredText(*line, "the password in " + *file, password, error)) {
      err << "cardovex-cli: " << error << "\n";
      return kExitUsage;
    }
  }
  std::optional<bool> answer;
  if (global.has("--yes")) answer = true;
  if (global.has("--no")) answer = false;
  bool help = global.has("--help");

  if (rest.empty()) {
    (help ? out : err) << GeneralHelp();
    return help ? kExitOk : kExitUsage;
  }
  // "help [COMMAND]" is read as "--help [COMMAND]", the spelling other
  // tools have taught many users.
  if (rest[0] == "help" && !Registry::Instance().Find("help")) {
    if (rest.size() > 2) {
      err << "cardovex-cli: help: expected at most one COMMAND\n";
      return kExitUsage;
    }
    rest.erase(rest.begin());
    if (rest.empty()) {
      out << GeneralHelp();
      return kExitOk;
    }
    help = true;
  }
  auto command = Registry::Instance().Find(rest[0]);
  if (!command) {
    err << "cardovex-cli: unknown command '" << rest[0] << "' (see --help)\n";
    return kExitUsage;
  }
  if (help) {
    out << command->help();
    return kExitOk;
  }
  ui.SetAnswer(answer);
  ui.SetPassword(password, passwordGiven);
  Context ctx{locale, password, global.has("--json"), out, err, ui};
  ctx.command = command->name();
  ui.SetCommand(ctx.command);
  Syntax syntax(command->name());
  command->Declare(syntax);
  Arguments arguments;
  if (!syntax.Parse(std::vector<std::string>(rest.begin() + 1, rest.end()), arguments, problem)) {
    return UsageError(ctx, *command, problem);
  }
  int code = command->Run(ctx, arguments);
  if (code == kExitOk && ui.unanswered()) code = kExitFailed;
  // Output that never arrived (a full disk, a closed pipe) is a failure,
  // however well the rest went.
  out.flush();
  if (!out) {
    // The stream only remembers that a write failed; one more try at what
    // is still buffered brings back the reason.
    out.clear();
    errno = 0;
    out.flush();
    const int error = errno;
    err << "cardovex-cli: the output could not be written"
        << (error ? std::string(": ") + std::strerror(error) : std::string()) << "\n";
    code = kExitFailed;
  }
  return code;
}

}  // namespace cx::cli
