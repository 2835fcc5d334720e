#include "cli/manual.h"

#include <algorithm>
#include <sstream>
#include <vector>

#include "cli/command.h"
#include "cli/global_options.h"
#include "cli/syntax.h"

namespace cx::cli {
namespace {

void AddOnce(std::vector<std::string>& list, const std::string& item) {
  if (std::find(list.begin(), list.end(), item) == list.end()) list.push_back(item);
}

// The options a command (or the global declaration) takes, and among them
// those that take a value.
struct Options {
  std::vector<std::string> all;
  std::vector<std::string> withValue;
};

Options DeclaredOptions(const Syntax& syntax) {
  Options found;
  for (const Syntax::OptionInfo& o : syntax.options()) {
    for (const std::string& name : o.names) {
      AddOnce(found.all, name);
      if (!o.value.empty()) AddOnce(found.withValue, name);
    }
  }
  return found;
}

// Text for roff: a backslash would start an escape and a line opening with
// "." or "'" would be read as a request; "-" written as "\-" stays the
// ASCII minus a user types.
std::string RoffText(const std::string& text) {
  std::string out;
  bool lineStart = true;
  for (char c : text) {
    if (lineStart && (c == '.' || c == '\'')) out += "\\&";
    if (c == '\\') {
      out += "\\e";
    } else if (c == '-') {
      out += "\\-";
    } else {
      out.push_back(c);
    }
    lineStart = c == '\n';
  }
  return out;
}

std::string RoffLines(const std::string& text) {
  std::string out = RoffText(text);
  if (!out.empty() && out.back() != '\n') out.push_back('\n');
  return out;
}

// A bash word list in single quotes.
std::string Words(const std::vector<std::string>& words) {
  std::string out = "'";
  for (size_t i = 0; i < words.size(); ++i) out += (i ? " " : "") + words[i];
  return out + "'";
}

}  // namespace


std::string ManPage(const std::string& version) {
  std::ostringstream s;
  s << ".TH CARDOVEX\\-CLI 1 \"\" \"cardovex\\-cli " << RoffText(version)
    << "\" \"User Commands\"\n"
    << ".SH NAME\ncardovex\\-cli \\- read and change Cardovex databases from the command line\n"
    << ".SH SYNOPSIS\n.B cardovex\\-cli\n[\\fIglobal options\\fR] \\fICOMMAND\\fR "
       "[\\fIarguments\\fR]\n"
    << ".br\n.B cardovex\\-cli help\n[\\fICOMMAND\\fR]\n"
    << ".SH DESCRIPTION\n.nf\n" << RoffLines(GeneralHelp()) << ".fi\n"
    << ".SH COMMANDS\n";
  for (const auto& c : Registry::Instance().All()) {
    s << ".SS " << RoffLines(c->name()) << ".nf\n" << RoffLines(c->help()) << ".fi\n";
  }
  s << ".SH FILES\n.TP\n.I ~/Documents/Cardovex\nthe data folder; the environment variable\n"
    << ".B CARDOVEX_DATA_DIR\nnames another.\n"
    << ".SH SEE ALSO\n.BR cardovex (1)\n";
  return s.str();
}


std::string BashCompletion() {
  Syntax globals;
  DeclareGlobalOptions(globals);
  const Options global = DeclaredOptions(globals);
  std::vector<std::string> names;
  std::ostringstream cases;
  std::vector<std::string> withValue = global.withValue;
  for (const auto& c : Registry::Instance().All()) {
    names.push_back(c->name());
    Syntax syntax(c->name());
    c->Declare(syntax);
    const Options own = DeclaredOptions(syntax);
    cases << "    " << c->name() << ") opts=" << Words(own.all) << " ;;\n";
    for (const auto& o : own.withValue) AddOnce(withValue, o);
  }
  names.push_back("help");

  std::ostringstream s;
  s << "# bash completion for cardovex-cli (generated from its declarations)\n"
    << "_cardovex_cli() {\n"
    << "  local cur=${COMP_WORDS[COMP_CWORD]} prev=${COMP_WORDS[COMP_CWORD-1]}\n"
    << "  local global=" << Words(global.all) << "\n"
    << "  local valued=" << Words(withValue) << "\n"
    << "  local command='' i word skip=0\n"
    << "  for ((i = 1; i < COMP_CWORD; i++)); do\n"
    << "    word=${COMP_WORDS[i]}\n"
    << "    if ((skip)); then skip=0; continue; fi\n"
    << "    [[ $word == -- ]] && break\n"
    << "    if [[ $word == -* ]]; then\n"
    << "      [[ $word != *=* && \" $global \" == *\" $word \"* && \" $valued \" == *\" $word \"* ]] && skip=1\n"
    << "      continue\n"
    << "    fi\n"
    << "    command=$word\n"
    << "    break\n"
    << "  done\n"
    << "  # A value of an option (a pattern, a file): what the shell offers by itself.\n"
    << "  [[ \" $valued \" == *\" $prev \"* ]] && return\n"
    << "  if [[ -z $command ]]; then\n"
    << "    if [[ $cur == -* ]]; then\n"
    << "      COMPREPLY=($(compgen -W \"$global\" -- \"$cur\"))\n"
    << "    else\n"
    << "      COMPREPLY=($(compgen -W " << Words(names) << " -- \"$cur\"))\n"
    << "    fi\n"
    << "    return\n"
    << "  fi\n"
    << "  if [[ $command == help ]]; then\n"
    << "    COMPREPLY=($(compgen -W " << Words(names) << " -- \"$cur\"))\n"
    << "    return\n"
    << "  fi\n"
    << "  local opts=''\n"
    << "  case $command in\n"
    << cases.str() << "  esac\n"
    << "  [[ $cur == -* ]] && COMPREPLY=($(compgen -W \"$opts $global\" -- \"$cur\"))\n"
    << "}\n"
    << "complete -o default -F _cardovex_cli cardovex-cli\n";
  return s.str();
}

}  // namespace cx::cli
