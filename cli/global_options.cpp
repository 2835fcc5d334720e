#include "cli/global_options.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>
#include <optional>
#include <ostream>
#include <sstream>

#include "cli/args.h"
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

constexpr const char* kGlobalHelp = R"(Global options (before or after the command):
  --date-format PATTERN  short date pattern in the handheld's tokens, e.g. M/d/yyyy,
                         dd.MMM.yy (M/MM/MMM month as a number, d/dd day, yy/yyyy year)
  --date-sep C           date separator (default: the first character of the
                         pattern that is not a letter)
  --time-format PATTERN  time pattern, e.g. h:mm:ss tt (12-hour) or HH:mm:ss
  --time-sep C           time separator (default as for dates)
  --am TEXT, --pm TEXT   the 12-hour designators
  --decimal C            decimal separator (a value other than "." makes numbers
                         use ",")
                         Defaults for all of these come from the system locale.
  --password TEXT        the password of a protected database (other users of
                         the machine can read it in the process list)
  --password-file FILE   the password from the first line of FILE, or of
                         standard input with -; without either, a terminal
                         is asked for it without echo
  --yes, --no            the answer to every question the command asks; without
                         one, questions are asked on the terminal, or (with no
                         terminal) refused, and the command changes nothing
  --json                 machine-readable output: the result as one JSON
                         document; a failure as {"error", "exitCode"} on
                         stderr; commands with no result refuse it (exit 2)
  --help [COMMAND]       this text, or a command's own (also: help [COMMAND])
  -V, --version          the program's version

Exit codes: 0 success, 1 the operation failed (the message is on stderr),
2 usage error.
)";

bool TakeValue(const std::vector<std::string>& args, size_t& i, std::string& value) {
  const std::string& a = args[i];
  if (size_t eq = a.find('='); eq != std::string::npos) {
    value = a.substr(eq + 1);
    return true;
  }
  if (i + 1 >= args.size()) return false;
  value = args[++i];
  return true;
}

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

std::string GeneralHelp() {
  std::ostringstream s;
  s << "Usage: cardovex-cli [global options] COMMAND [arguments]\n\n"
    << "Cardovex keeps personal databases in .PDB files. Commands:\n";
  for (const auto& c : Registry::Instance().All()) {
    std::string name = c->name();
    s << "  " << name << std::string(name.size() < 16 ? 16 - name.size() : 1, ' ') << c->summary()
      << "\n";
  }
  s << "\n" << kGlobalHelp << "\n'cardovex-cli --help COMMAND' shows a command's arguments.\n";
  return s.str();
}

static int RunCommandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err,
                          CliUi& ui);

int RunCli(const std::vector<std::string>& args, std::ostream& out, std::ostream& err, CliUi& ui) {
  return WithJsonErrors(args, err, [&] { return RunCommandLine(args, out, err, ui); });
}

static int RunCommandLine(const std::vector<std::string>& args, std::ostream& out, std::ostream& err,
                          CliUi& ui) {
  LocaleInfo locale = SystemLocaleInfo();
  std::string dateSep, timeSep, password;
  bool dateSepGiven = false, timeSepGiven = false, passwordGiven = false, json = false, help = false;
  std::optional<bool> answer;
  std::vector<std::string> rest;

  for (size_t i = 0; i < args.size(); ++i) {
    const std::string& a = args[i];
    // After "--" nothing is an option, global or not: the command's own
    // parser gets the marker and the arguments behind it as they are.
    if (a == "--") {
      rest.insert(rest.end(), args.begin() + static_cast<std::ptrdiff_t>(i), args.end());
      break;
    }
    std::string name = a.substr(0, a.find('='));
    std::string value;
    auto need = [&](std::string& into) {
      if (!TakeValue(args, i, into)) {
        err << "cardovex-cli: option " << name << " needs a value\n";
        return false;
      }
      return true;
    };
    if (name == "--date-format") {
      if (!need(value)) return kExitUsage;
      locale.shortDate = Utf8ToCp1252(value);
      if (!dateSepGiven) locale.dateSeparator = FirstSeparator(locale.shortDate, '/');
    } else if (name == "--date-sep") {
      if (!need(dateSep)) return kExitUsage;
      dateSepGiven = true;
    } else if (name == "--time-format") {
      if (!need(value)) return kExitUsage;
      locale.timeFormat = Utf8ToCp1252(value);
      if (!timeSepGiven) locale.timeSeparator = FirstSeparator(locale.timeFormat, ':');
    } else if (name == "--time-sep") {
      if (!need(timeSep)) return kExitUsage;
      timeSepGiven = true;
    } else if (name == "--am") {
      if (!need(value)) return kExitUsage;
      locale.am = Utf8ToCp1252(value);
    } else if (name == "--pm") {
      if (!need(value)) return kExitUsage;
      locale.pm = Utf8ToCp1252(value);
    } else if (name == "--decimal") {
      if (!need(value)) return kExitUsage;
      if (value.size() != 1) {
        err << "cardovex-cli: --decimal takes one character\n";
        return kExitUsage;
      }
      locale.decimalSeparator = value[0];
    } else if (name == "--password") {
      if (!need(password)) return kExitUsage;
      std::string stored, error;
      if (!ToStoredText(password, "--password", stored, error)) {
        err << "cardovex-cli: " << error << "\n";
        return kExitUsage;
      }
      password = std::move(stored);
      passwordGiven = true;
    } else if (name == "--password-file") {
      std::string file;
      if (!need(file)) return kExitUsage;
      std::optional<std::string> line = ReadPasswordLine(file);
      if (!line) {
        err << "cardovex-cli: --password-file: cannot read " << (file == "-" ? "standard input" : file)
            << (errno ? std::string(": ") + std::strerror(errno) : std::string()) << "\n";
        return kExitFailed;
      }
      std::string stored, error;
      if (!ToStoredText(*line, "the password in " + file, stored, error)) {
        err << "cardovex-cli: " << error << "\n";
        return kExitUsage;
      }
      password = std::move(stored);
      passwordGiven = true;
    } else if (a == "--json") {
      json = true;
    } else if (a == "--yes") {
      answer = true;
    } else if (a == "--no") {
      answer = false;
    } else if (a == "--help" || a == "-h") {
      help = true;
    } else if (a == "--version" || a == "-V") {
      out << "cardovex-cli " << CARDOVEX_VERSION << "\n";
      return kExitOk;
    } else {
      rest.push_back(a);
    }
  }
  for (const auto* sep : {&dateSep, &timeSep}) {
    if (!sep->empty() && Utf8ToCp1252(*sep).size() != 1) {
      err << "cardovex-cli: a separator is one character\n";
      return kExitUsage;
    }
  }
  if (dateSepGiven) locale.dateSeparator = dateSep.empty() ? '/' : Utf8ToCp1252(dateSep)[0];
  if (timeSepGiven) locale.timeSeparator = timeSep.empty() ? ':' : Utf8ToCp1252(timeSep)[0];

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
  Context ctx{locale, password, json, out, err, ui};
  ctx.command = command->name();
  ui.SetCommand(ctx.command);
  std::vector<std::string> commandArgs(rest.begin() + 1, rest.end());
  int code = command->Run(ctx, commandArgs);
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
