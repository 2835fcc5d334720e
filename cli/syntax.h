// What a command takes, declared once: its positional arguments and its
// options. The help text, the usage lines, the manual page, the bash
// completion and the parser's complaints are all made from the declaration,
// so none of them can name an option the parser does not take.
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace CLI {
class App;
}

namespace cx::cli {

// How many words a positional argument takes (max -1: no limit).
struct Count {
  int min;
  int max;
};
inline constexpr Count kOne{1, 1};
inline constexpr Count kOptional{0, 1};
inline constexpr Count kOneOrMore{1, -1};
inline constexpr Count kAnyNumber{0, -1};

// How often an option may be given.
enum class Take {
  kOnce,        // a second one is a usage error
  kRepeatable,  // every one counts
  kLast,        // the last one counts (for options a script sets ahead)
  kRequired,    // exactly once
};

// What the parser found: positional arguments in the order given, and the
// values of the options (a flag's "value" is empty). Asking for an option
// the declaration does not name is a programming error.
class Arguments {
 public:
  const std::vector<std::string>& positional() const { return positional_; }
  bool has(const std::string& option) const { return !values(option).empty(); }
  std::optional<std::string> value(const std::string& option) const;
  const std::vector<std::string>& values(const std::string& option) const;

 private:
  friend class Syntax;
  std::vector<std::string> positional_;
  std::map<std::string, std::vector<std::string>> values_;
};

class Syntax {
 public:
  // `command` is the name in the usage lines; empty for the global options.
  explicit Syntax(std::string command = {});
  ~Syntax();
  Syntax(const Syntax&) = delete;
  Syntax& operator=(const Syntax&) = delete;

  // Prose between the usage lines and the options, and after the options.
  Syntax& About(std::string text);
  Syntax& Notes(std::string text);

  Syntax& Positional(std::string name, Count count = kOne);
  // `names` as "--record" or "-V,--version"; `value` the word the help
  // shows for its value ("N", "FILE").
  Syntax& Option(const std::string& names, std::string value, std::string description,
                 Take take = Take::kOnce);
  Syntax& Flag(const std::string& names, std::string description);

  // A usage line of its own, for commands whose arguments go together in
  // more than one way. Each word is a positional's name or an option (shown
  // with its value, in brackets unless required), "--a|--b" for options
  // that exclude each other, "(--a|--b)" when one of them must be given;
  // other words stand as they are. Without forms the usage line lists the
  // positionals, then the options.
  Syntax& Form(std::vector<std::string> words);
  // The global options worth showing before the command's name, as words
  // of a form: {"--json", "--password"}.
  Syntax& Globals(std::vector<std::string> words);

  // Parses the words after the command's name. False with `error` in the
  // wording users and scripts know ("unknown option --x", "option --x
  // needs a value", "expected FILE OUT").
  bool Parse(const std::vector<std::string>& words, Arguments& out, std::string& error) const;
  // The global options: takes those it knows wherever they stand before
  // "--", and leaves every other word, "--" included, in `rest` in order.
  bool ParseKnown(const std::vector<std::string>& words, Arguments& out, std::vector<std::string>& rest,
                  std::string& error) const;

  // The command's help: usage lines, prose, option lines, notes; `globals`
  // renders the global options named by Globals().
  std::string Help(const Syntax* globals) const;
  // "  --name VALUE  description" lines for every option.
  std::string OptionList() const;
  // Usage lines alone.
  std::string Usage(const Syntax* globals) const;
  // The positionals as the usage shows them: "FILE [OUT]".
  std::string Synopsis() const;

  struct OptionInfo {
    std::vector<std::string> names;
    std::string value;  // empty for a flag
    std::string description;
    Take take;
  };
  const std::vector<OptionInfo>& options() const { return options_; }

 private:
  struct PositionalInfo {
    std::string name;
    Count count;
  };
  // The option of that name, declared here or else among `globals`.
  const OptionInfo* Find(const std::string& name, const Syntax* globals) const;
  std::string Word(const std::string& word, const Syntax* globals) const;
  bool ParseWords(const std::vector<std::string>& words, Arguments& out, std::vector<std::string>* rest,
                  std::string& error) const;

  std::string command_;
  std::string about_, notes_;
  std::vector<PositionalInfo> positionals_;
  std::vector<OptionInfo> options_;
  std::vector<std::vector<std::string>> forms_;
  std::vector<std::string> globals_;
  std::unique_ptr<CLI::App> app_;
};

}  // namespace cx::cli
