// What every command shares: how errors are introduced, help in both
// spellings, "--" ending the options, the spellings of options and values,
// and help, manual and completion that agree with what the parsers accept.
#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <fstream>
#include <iterator>
#include <sstream>

#include "cli/command.h"
#include "cli/global_options.h"
#include "cli/manual.h"
#include "cli/syntax.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args), {}, false); }

bool OptionChar(char c) {
  return std::islower(static_cast<unsigned char>(c)) || std::isdigit(static_cast<unsigned char>(c)) ||
         c == '-';
}

// The long options a text names ("--name", not "a--b" nor "--fieldN"), read
// the way a user reads the help: what the parser takes is checked against it.
std::vector<std::string> OptionsNamedIn(const std::string& text) {
  std::vector<std::string> found;
  for (size_t at = text.find("--"); at != std::string::npos; at = text.find("--", at + 2)) {
    if (at > 0 && (OptionChar(text[at - 1]) || text[at - 1] == '\'')) continue;
    size_t end = at + 2;
    while (end < text.size() && OptionChar(text[end])) ++end;
    if (end == at + 2 || !std::islower(static_cast<unsigned char>(text[at + 2]))) continue;
    if (end < text.size() && std::isupper(static_cast<unsigned char>(text[end]))) continue;
    const std::string name = text.substr(at, end - at);
    if (std::find(found.begin(), found.end(), name) == found.end()) found.push_back(name);
    at = end - 2;
  }
  return found;
}

bool Contains(const std::vector<std::string>& list, const std::string& item) {
  return std::find(list.begin(), list.end(), item) != list.end();
}

TEST(CliConventions, ErrorsNameTheToolAndTheCommand) {
  testing::TempDir dir;
  const std::string path = dir.File("Books.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Books", "--field", "Title:Text"}).code, 0);

  Result usage = Cli({"records", path, "--bogus"});
  EXPECT_EQ(usage.code, 2);
  EXPECT_EQ(usage.err.rfind("cardovex-cli: records: unknown option --bogus\n", 0), 0u) << usage.err;

  Result missing = Cli({"info", dir.File("none.PDB")});
  EXPECT_EQ(missing.code, 1);
  EXPECT_EQ(missing.err.rfind("cardovex-cli: info: ", 0), 0u) << missing.err;

  Result refused = Cli({"sort", path, "Nope"});
  EXPECT_EQ(refused.code, 2);
  EXPECT_EQ(refused.err.rfind("cardovex-cli: sort: ", 0), 0u) << refused.err;
}

TEST(CliConventions, ErrorsShowFileNamesAsTheyAreSpelled) {
  testing::TempDir dir;
  const std::string missing = dir.File("Z\u00FCrich.PDB");
  Result r = Cli({"info", missing});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find(missing), std::string::npos) << r.err;
  const std::string path = dir.File("Tags.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Tags", "--field", "Tag:Text"}).code, 0);
  Result out = Cli({"export-csv", path, dir.File("n\u00E4") + "/x.csv"});
  EXPECT_EQ(out.code, 1);
  EXPECT_NE(out.err.find("n\u00E4/x.csv"), std::string::npos) << out.err;
}

TEST(CliConventions, HelpCommandAndVersionSpellings) {
  EXPECT_EQ(Cli({"help", "records"}).out, Cli({"--help", "records"}).out);
  EXPECT_EQ(Cli({"records", "--help"}).out, Cli({"--help", "records"}).out);
  Result general = Cli({"help"});
  EXPECT_EQ(general.code, 0);
  EXPECT_EQ(general.out, GeneralHelp());
  EXPECT_EQ(Cli({"help", "no-such-command"}).code, 2);
  EXPECT_EQ(Cli({"help", "records", "info"}).code, 2);

  Result v = Cli({"-V"});
  EXPECT_EQ(v.code, 0);
  EXPECT_EQ(v.out, Cli({"--version"}).out);
  EXPECT_EQ(v.out.rfind("cardovex-cli ", 0), 0u);
}

TEST(CliConventions, DoubleDashKeepsGlobalOptionsForTheCommand) {
  testing::TempDir dir;
  const std::string path = dir.File("Tags.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Tags", "--field", "Tag:Text"}).code, 0);
  // After "--", "--json" is the text searched for, not the global option:
  // the output stays the plain report, and nothing matching is an error.
  Result r = Cli({"find", path, "--", "--json"});
  EXPECT_EQ(r.code, 1) << r.err;
  EXPECT_EQ(r.out.find('{'), std::string::npos) << r.out;
  EXPECT_EQ(r.err.rfind("cardovex-cli: find: ", 0), 0u) << r.err;
  // Before it, the option counts wherever it stands.
  Result json = Cli({"find", path, "--json", "--", "-x"});
  EXPECT_EQ(json.code, 1);
  EXPECT_EQ(json.err.rfind("{\"error\":", 0), 0u) << json.err;
}

// The help a user reads must name exactly what the parser takes: every
// option any help names is tried on every command, followed by two unknown
// options so that whatever the parser makes of it, the command stops
// before doing anything.
TEST(CliConventions, EachParserTakesTheOptionsItsHelpNamesAndNoOthers) {
  const std::vector<std::string> global = OptionsNamedIn(GeneralHelp());
  std::vector<std::string> candidates;
  for (const auto& command : Registry::Instance().All()) {
    for (const std::string& option : OptionsNamedIn(command->help())) {
      if (!Contains(global, option) && !Contains(candidates, option)) candidates.push_back(option);
    }
  }
  for (const auto& command : Registry::Instance().All()) {
    const std::vector<std::string> own = OptionsNamedIn(command->help());
    for (const std::string& option : candidates) {
      Result r = Cli({command->name(), option, "--zz-unknown", "--zz-unknown"});
      EXPECT_EQ(r.code, 2) << command->name() << " " << option;
      const std::string refused = "unknown option " + (Contains(own, option) ? "--zz-unknown" : option) + "\n";
      EXPECT_NE(r.err.find(refused), std::string::npos) << command->name() << " " << option << ": " << r.err;
    }
  }
}

// The option list, the completion and the manual page come from the same
// declaration as the parser; a declared option that any of them left out
// (or a usage line naming one that is not declared) shows here.
TEST(CliManual, HelpPageAndCompletionListWhatIsDeclared) {
  const std::string page = ManPage("1.2.3");
  const std::string completion = BashCompletion();
  for (const auto& command : Registry::Instance().All()) {
    Syntax syntax(command->name());
    command->Declare(syntax);
    const std::string help = command->help();
    const std::vector<std::string> named = OptionsNamedIn(help);
    std::string words;
    for (const Syntax::OptionInfo& o : syntax.options()) {
      for (const std::string& name : o.names) {
        words += (words.empty() ? "" : " ") + name;
        if (name.rfind("--", 0) == 0) {
          EXPECT_TRUE(Contains(named, name)) << command->name() << " " << name;
        }
        std::string roff;
        for (char c : name) roff += c == '-' ? std::string("\\-") : std::string(1, c);
        EXPECT_NE(page.find(roff), std::string::npos) << command->name() << " " << name;
      }
    }
    EXPECT_NE(completion.find("    " + command->name() + ") opts='" + words + "' ;;\n"), std::string::npos)
        << command->name();
  }
  Syntax globals;
  DeclareGlobalOptions(globals);
  for (const Syntax::OptionInfo& o : globals.options()) {
    EXPECT_NE(completion.find(o.names.back()), std::string::npos) << o.names.back();
  }
}

TEST(CliConventions, OptionsAndValuesInEverySpelling) {
  testing::TempDir dir;
  const std::string path = dir.File("Notes.PDB");
  ASSERT_EQ(Cli({"new", path, "--name=Notes", "--field", "Title:Text", "--field=Kind:Text"}).code, 0);
  ASSERT_EQ(Cli({"add", path, "Title=caf\u00e9", "Kind=a"}).code, 0);
  ASSERT_EQ(Cli({"add", path, "Title=tea", "Kind=b"}).code, 0);

  // "--name VALUE" and "--name=VALUE", options before, between and after
  // the positionals, "-" for standard output, global options anywhere.
  const Result spaced = Cli({"export-csv", path, "-", "--encoding", "windows-1252", "--header"});
  ASSERT_EQ(spaced.code, 0) << spaced.err;
  EXPECT_EQ(spaced.out, "Title,Kind\ncaf\xE9,a\ntea,b\n");
  EXPECT_EQ(Cli({"export-csv", "--header", path, "--encoding=windows-1252", "-"}).out, spaced.out);
  const Result json = Cli({"records", path, "--where", "Kind=b", "--json"});
  EXPECT_EQ(json.out, Cli({"--json", "records", "--where=Kind=b", path}).out);
  EXPECT_NE(json.out.find("\"text\":\"tea\""), std::string::npos) << json.out;
  EXPECT_EQ(json.out.find("caf"), std::string::npos) << json.out;

  // Repeated where the declaration allows it, "-o VALUE" as a short option.
  const std::string listed = dir.File("listing.txt");
  EXPECT_EQ(Cli({"records", path, "--where", "Kind=b", "--where", "Title=caf"}).out,
            "Index\tTitle\tKind\n");
  ASSERT_EQ(Cli({"listing", path, "-o", listed, "--record", "1"}).code, 0);
  const std::string shown = Cli({"listing", path, "--record=1"}).out;
  EXPECT_EQ(shown, "Title: tea\nKind: b\n" + std::string(40, '-') + "\n");
  std::ifstream file(listed, std::ios::binary);
  EXPECT_EQ(std::string(std::istreambuf_iterator<char>(file), {}), shown);
}

TEST(CliConventions, ParserComplaintsAreUsageErrorsInOurWords) {
  testing::TempDir dir;
  const std::string path = dir.File("Tags.PDB");
  ASSERT_EQ(Cli({"new", path, "--name", "Tags", "--field", "Tag:Text"}).code, 0);
  const struct {
    std::vector<std::string> args;
    const char* message;
  } cases[] = {
      {{"records", path, "--record"}, "records: option --record needs a value"},
      {{"records", path, "--record", "0", "--record=0"}, "records: --record given twice"},
      {{"export-csv", path, "-", "--header=yes"}, "export-csv: option --header takes no value"},
      {{"sort", path, "Tag", "Tag", "Tag", "Tag"}, "sort: unexpected argument Tag (expected FILE KEY [KEY [KEY]])"},
      {{"export-sqlite", path}, "export-sqlite: expected FILE... OUT"},
      {{"new", dir.File("Other.PDB")}, "new: --name is required"},
      {{"records", path, "-q"}, "records: unknown option -q"},
      {{"info", path, "--password"}, "option --password needs a value"},
      {{"--yes", "--no", "info", path}, "--yes and --no exclude each other"},
  };
  for (const auto& c : cases) {
    const Result r = Cli(c.args);
    EXPECT_EQ(r.code, 2) << c.message;
    EXPECT_EQ(r.err.rfind("cardovex-cli: " + std::string(c.message) + "\n", 0), 0u) << r.err;
    std::vector<std::string> json = c.args;
    json.insert(json.begin(), "--json");
    const Result j = Cli(json);
    EXPECT_EQ(j.err, "{\"error\":\"cardovex-cli: " + std::string(c.message) + "\",\"exitCode\":2}\n");
  }
}

TEST(CliManual, PageAndCompletionCoverEveryCommand) {
  const std::string page = ManPage("1.2.3");
  const std::string completion = BashCompletion();
  EXPECT_EQ(page.rfind(".TH CARDOVEX\\-CLI 1 ", 0), 0u);
  for (const auto& command : Registry::Instance().All()) {
    std::string roffName;
    for (char c : command->name()) roffName += c == '-' ? std::string("\\-") : std::string(1, c);
    EXPECT_NE(page.find(".SS " + roffName + "\n"), std::string::npos) << command->name();
    EXPECT_NE(completion.find("    " + command->name() + ") opts="), std::string::npos)
        << command->name();
  }
  // No help line may turn into a roff request.
  std::istringstream lines(page);
  for (std::string line; std::getline(lines, line);) {
    if (line.empty() || line[0] != '.') continue;
    const std::string request = line.substr(1, 2);
    EXPECT_TRUE(request == "TH" || request == "SH" || request == "SS" || request == "nf" ||
                request == "fi" || request == "br" || request == "TP" || request == "B " ||
                request == "I " || request == "BR")
        << line;
  }
}

}  // namespace
}  // namespace cx::cli
