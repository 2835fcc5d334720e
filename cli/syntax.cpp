#include "cli/syntax.h"

#include <algorithm>
#include <stdexcept>

#include <CLI/CLI.hpp>

namespace cx::cli {
namespace {

constexpr size_t kWidth = 79;
// Descriptions start at most this far in; a longer option pushes its own
// description along instead of every other.
constexpr size_t kMaxColumn = 27;
constexpr const char* kProgram = "cardovex-cli";

// The words CLI11 could not place, with what it took each for: the order
// of the command line is kept, which the global options' pass needs.
class Parser : public CLI::App {
 public:
  Parser() {
    set_help_flag();
    allow_extras();
  }
  struct Word {
    bool option;  // looked like an option
    bool marker;  // the "--" that ends the options
    std::string text;
  };
  std::vector<Word> Unplaced() const {
    std::vector<Word> words;
    for (const auto& [kind, text] : missing_) {
      const bool marker = kind == CLI::detail::Classifier::POSITIONAL_MARK;
      const bool option = !marker && kind != CLI::detail::Classifier::NONE;
      words.push_back({option, marker, text});
    }
    return words;
  }
};

// Appends `text` wrapped to kWidth, continuation lines (and lines after a
// line break in `text`) at `column`; `used` characters of the current line
// are taken already.
void AppendWrapped(std::string& out, const std::string& text, size_t column, size_t used) {
  size_t at = 0;
  bool lineStart = true;
  while (at <= text.size()) {
    const size_t lineEnd = std::min(text.find('\n', at), text.size());
    const std::string line = text.substr(at, lineEnd - at);
    size_t pos = 0;
    if (!lineStart) {
      out += "\n" + std::string(column, ' ');
      used = column;
    }
    bool first = true;
    while (pos < line.size()) {
      size_t end = line.find(' ', pos);
      if (end == std::string::npos) end = line.size();
      const std::string word = line.substr(pos, end - pos);
      if (!first && used + 1 + word.size() > kWidth) {
        out += "\n" + std::string(column, ' ');
        used = column;
        first = true;
      }
      if (!first) {
        out += ' ';
        ++used;
      }
      out += word;
      used += word.size();
      first = false;
      pos = end + 1;
    }
    lineStart = false;
    at = lineEnd + 1;
  }
}

std::string CountText(const std::string& name, Count count) {
  std::string text;
  for (int i = 0; i < count.min; ++i) text += (i ? " " : "") + name;
  if (count.max < 0) {
    if (count.min == 0) return "[" + name + "...]";
    return text + "...";
  }
  std::string optional;
  for (int i = count.max - count.min; i > 0; --i) {
    optional = "[" + name + (optional.empty() ? "" : " " + optional) + "]";
  }
  return text + (text.empty() || optional.empty() ? "" : " ") + optional;
}

std::vector<std::string> SplitNames(const std::string& names) {
  std::vector<std::string> out;
  size_t at = 0;
  while (at <= names.size()) {
    size_t end = std::min(names.find(',', at), names.size());
    out.push_back(names.substr(at, end - at));
    at = end + 1;
  }
  return out;
}

}  // namespace

std::optional<std::string> Arguments::value(const std::string& option) const {
  const auto& all = values(option);
  if (all.empty()) return std::nullopt;
  return all.back();
}

const std::vector<std::string>& Arguments::values(const std::string& option) const {
  auto it = values_.find(option);
  if (it == values_.end()) throw std::logic_error("option not declared: " + option);
  return it->second;
}

Syntax::Syntax(std::string command) : command_(std::move(command)), app_(std::make_unique<Parser>()) {}

Syntax::~Syntax() = default;

Syntax& Syntax::About(std::string text) {
  about_ = std::move(text);
  return *this;
}

Syntax& Syntax::Notes(std::string text) {
  notes_ = std::move(text);
  return *this;
}

Syntax& Syntax::Positional(std::string name, Count count) {
  positionals_.push_back({std::move(name), count});
  return *this;
}

Syntax& Syntax::Option(const std::string& names, std::string value, std::string description, Take take) {
  app_->add_option(names, CLI::callback_t{}, description)
      ->type_name(value)
      ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  options_.push_back({SplitNames(names), std::move(value), std::move(description), take});
  return *this;
}

Syntax& Syntax::Flag(const std::string& names, std::string description) {
  // A description passed along would be taken for a variable to set.
  app_->add_flag(names)->description(description)->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  options_.push_back({SplitNames(names), "", std::move(description), Take::kRepeatable});
  return *this;
}

Syntax& Syntax::Form(std::vector<std::string> words) {
  forms_.push_back(std::move(words));
  return *this;
}

Syntax& Syntax::Globals(std::vector<std::string> words) {
  globals_ = std::move(words);
  return *this;
}

const Syntax::OptionInfo* Syntax::Find(const std::string& name, const Syntax* globals) const {
  for (const OptionInfo& o : options_) {
    if (std::find(o.names.begin(), o.names.end(), name) != o.names.end()) return &o;
  }
  return globals ? globals->Find(name, nullptr) : nullptr;
}

bool Syntax::Parse(const std::vector<std::string>& words, Arguments& out, std::string& error) const {
  return ParseWords(words, out, nullptr, error);
}

bool Syntax::ParseKnown(const std::vector<std::string>& words, Arguments& out, std::vector<std::string>& rest,
                        std::string& error) const {
  return ParseWords(words, out, &rest, error);
}

bool Syntax::ParseWords(const std::vector<std::string>& words, Arguments& out, std::vector<std::string>* rest,
                        std::string& error) const {
  auto& parser = static_cast<Parser&>(*app_);
  if (!rest && !parser.get_option_no_throw("arguments")) {
    // Every positional in one list: the declaration checks their number,
    // so that "FILE... OUT" works with options anywhere. The global
    // options' pass has none, leaving each word where it stands.
    parser.add_option("arguments", CLI::callback_t{}, "")
        ->expected(0, CLI::detail::expected_max_vector_size)
        ->allow_extra_args()
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  }
  parser.clear();
  out = Arguments();
  auto firstUnknown = [&]() -> std::optional<std::string> {
    if (rest) return std::nullopt;
    for (const Parser::Word& w : parser.Unplaced()) {
      if (w.option) return w.text;
    }
    return std::nullopt;
  };
  try {
    // CLI11 takes the words last first.
    std::vector<std::string> reversed(words.rbegin(), words.rend());
    parser.parse(reversed);
  } catch (const CLI::ParseError& e) {
    // An unknown option before the problem is what the user got wrong first.
    if (auto unknown = firstUnknown()) {
      error = "unknown option " + *unknown;
      return false;
    }
    // The only complaint left to CLI11 is a value that never came.
    const std::string what = e.what();
    for (const OptionInfo& o : options_) {
      for (const std::string& name : o.names) {
        if (what.rfind(name + ":", 0) == 0) {
          error = "option " + name + " needs a value";
          return false;
        }
      }
    }
    error = what;
    return false;
  }
  if (auto unknown = firstUnknown()) {
    error = "unknown option " + *unknown;
    return false;
  }
  if (rest) {
    for (const Parser::Word& w : parser.Unplaced()) rest->push_back(w.text);
  }
  for (const OptionInfo& o : options_) {
    const CLI::Option* option = app_->get_option(o.names.front());
    std::vector<std::string> values = option->results();
    const std::string& shown = o.names.back();
    if (o.value.empty()) {
      // "--all=yes" would otherwise count as --all.
      for (const std::string& v : values) {
        if (v != "true") {
          error = "option " + shown + " takes no value";
          return false;
        }
      }
      for (std::string& v : values) v.clear();
    }
    if (o.take == Take::kOnce && values.size() > 1) {
      error = shown + " given twice";
      return false;
    }
    if (o.take == Take::kLast && values.size() > 1) values.erase(values.begin(), values.end() - 1);
    for (const std::string& name : o.names) out.values_[name] = values;
  }
  if (!rest) {
    out.positional_ = app_->get_option("arguments")->results();
    size_t min = 0, max = 0;
    bool unlimited = false;
    for (const PositionalInfo& p : positionals_) {
      min += static_cast<size_t>(p.count.min);
      if (p.count.max < 0) unlimited = true;
      max += static_cast<size_t>(std::max(p.count.max, 0));
    }
    if (out.positional_.size() < min) {
      error = "expected " + Synopsis();
      return false;
    }
    if (!unlimited && out.positional_.size() > max) {
      error = "unexpected argument " + out.positional_[max] +
              (positionals_.empty() ? "" : " (expected " + Synopsis() + ")");
      return false;
    }
  }
  for (const OptionInfo& o : options_) {
    if (o.take == Take::kRequired && !out.has(o.names.front())) {
      error = o.names.back() + " is required";
      return false;
    }
  }
  return true;
}

std::string Syntax::Synopsis() const {
  std::string text;
  for (const PositionalInfo& p : positionals_) text += (text.empty() ? "" : " ") + CountText(p.name, p.count);
  return text;
}

std::string Syntax::Word(const std::string& word, const Syntax* globals) const {
  const bool required = word.size() > 2 && word.front() == '(' && word.back() == ')';
  const std::string inner = required ? word.substr(1, word.size() - 2) : word;
  auto bare = [&](const std::string& name) -> std::string {
    const OptionInfo* o = Find(name, globals);
    if (!o) throw std::logic_error("the usage of " + command_ + " names an undeclared option " + name);
    return name + (o->value.empty() ? "" : " " + o->value);
  };
  if (inner.empty() || inner[0] != '-') {
    for (const PositionalInfo& p : positionals_) {
      if (p.name == word) return CountText(p.name, p.count);
    }
    return word;
  }
  if (inner.find('|') != std::string::npos) {
    std::string text;
    size_t at = 0;
    while (at <= inner.size()) {
      const size_t end = std::min(inner.find('|', at), inner.size());
      text += (at ? " | " : "") + bare(inner.substr(at, end - at));
      at = end + 1;
    }
    return required ? text : "[" + text + "]";
  }
  const OptionInfo* o = Find(inner, globals);
  if (required || (o && o->take == Take::kRequired)) return bare(inner);
  return "[" + bare(inner) + "]" + (o && o->take == Take::kRepeatable && !o->value.empty() ? "..." : "");
}

std::string Syntax::Usage(const Syntax* globals) const {
  std::vector<std::vector<std::string>> forms = forms_;
  if (forms.empty()) {
    std::vector<std::string> all;
    for (const PositionalInfo& p : positionals_) all.push_back(p.name);
    for (const OptionInfo& o : options_) all.push_back(o.names.front());
    forms.push_back(all);
  }
  std::string out;
  for (size_t f = 0; f < forms.size(); ++f) {
    std::string line = std::string(f == 0 ? "Usage: " : "       ") + kProgram;
    if (f == 0) {
      for (const std::string& g : globals_) line += " " + Word(g, globals);
    }
    line += " " + command_;
    const size_t column = std::min<size_t>(line.size() + 1, 32);
    size_t used = line.size();
    for (const std::string& word : forms[f]) {
      const std::string text = Word(word, globals);
      if (used + 1 + text.size() > kWidth && used > column) {
        line += "\n" + std::string(column - 1, ' ');
        used = column - 1;
      }
      line += " " + text;
      used += 1 + text.size();
    }
    out += line + "\n";
  }
  return out;
}

std::string Syntax::OptionList() const {
  std::vector<std::string> lefts;
  size_t widest = 0;
  for (const OptionInfo& o : options_) {
    std::string left = "  ";
    for (size_t i = 0; i < o.names.size(); ++i) left += (i ? ", " : "") + o.names[i];
    if (!o.value.empty()) left += " " + o.value;
    widest = std::max(widest, left.size());
    lefts.push_back(left);
  }
  const size_t column = std::min(widest + 2, kMaxColumn);
  std::string out;
  for (size_t i = 0; i < options_.size(); ++i) {
    std::string line = lefts[i];
    line += std::string(line.size() + 2 <= column ? column - line.size() : 2, ' ');
    AppendWrapped(line, options_[i].description, column, line.size());
    out += line + "\n";
  }
  return out;
}

std::string Syntax::Help(const Syntax* globals) const {
  return Usage(globals) + about_ + OptionList() + notes_;
}

}  // namespace cx::cli
