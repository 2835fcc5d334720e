// What every command shares: how errors are introduced, help in both
// spellings, "--" ending the options, and help texts that agree with what
// the parsers accept (the manual and the completion are made from them).
#include <gtest/gtest.h>

#include <sstream>

#include "cli/command.h"
#include "cli/global_options.h"
#include "cli/manual.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args), {}, false); }

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
}

// A command's help is the one place its options are written down (the
// manual page and the completion are made from it), so its parser must
// take exactly those: every option any help names is tried on every
// command. Two unknown options follow it, so that whatever the parser makes
// of it, the command stops before doing anything.
TEST(CliConventions, EachParserTakesTheOptionsItsHelpNamesAndNoOthers) {
  const HelpOptions global = OptionsInHelp(GeneralHelp());
  auto contains = [](const std::vector<std::string>& list, const std::string& item) {
    return std::find(list.begin(), list.end(), item) != list.end();
  };
  std::vector<std::string> candidates;
  for (const auto& command : Registry::Instance().All()) {
    for (const std::string& option : OptionsInHelp(command->help()).all) {
      if (!contains(global.all, option) && !contains(candidates, option)) candidates.push_back(option);
    }
  }
  for (const auto& command : Registry::Instance().All()) {
    const std::vector<std::string> own = OptionsInHelp(command->help()).all;
    for (const std::string& option : candidates) {
      Result r = Cli({command->name(), option, "--zz-unknown", "--zz-unknown"});
      EXPECT_EQ(r.code, 2) << command->name() << " " << option;
      const std::string refused = "unknown option " + (contains(own, option) ? "--zz-unknown" : option) + "\n";
      EXPECT_NE(r.err.find(refused), std::string::npos) << command->name() << " " << option << ": " << r.err;
    }
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

TEST(CliManual, OptionsInHelpTellsFlagsFromOptionsWithValues) {
  const HelpOptions o = OptionsInHelp(
      "Usage: x FILE [--all] [--record N] [--to=HOST]\n  --all  every one (not --All, a--b, --fieldN)\n");
  EXPECT_EQ(o.all, (std::vector<std::string>{"--all", "--record", "--to"}));
  EXPECT_EQ(o.withValue, (std::vector<std::string>{"--record", "--to"}));
}

}  // namespace
}  // namespace cx::cli
