#include <gtest/gtest.h>

#include <sys/stat.h>

#include <cerrno>

#include "ops/print.h"
#include "platform/file_io.h"
#include "tests/ops/output_fixture.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ScriptedUi;
using testing::TempDir;

// Answers every run with a set result and keeps what the command was given
// to print (read while it "runs", as a real print program would).
class FakeRunner : public ProcessRunner {
 public:
  ProcessResult Run(const std::string& program, const std::vector<std::string>& args) override {
    ++runs;
    this->program = program;
    this->args = args;
    std::vector<uint8_t> bytes;
    if (!args.empty() && ReadWholeFile(args.back(), bytes)) printed.assign(bytes.begin(), bytes.end());
    return result;
  }
  ProcessResult result;
  int runs = 0;
  std::string program;
  std::vector<std::string> args;
  std::string printed;
};

ProcessResult Exited(int code) {
  ProcessResult r;
  r.outcome = ProcessResult::Outcome::Exited;
  r.exitCode = code;
  return r;
}

struct PrintFixture {
  TempDir dir;
  LocaleInfo locale;
  ScriptedUi ui;
  FakeRunner runner;
  PrintSettings settings;
  Database db = testing::SampleDatabase();

  PrintFixture() {
    testing::AddAwkwardRecords(db);
    settings.tempPath = dir.File("cxprnttemp.txt");
    settings.arguments = {"-d", "office"};
  }
  PrintOutcome Print(bool all, size_t current = 0) {
    return PrintRecords(db, all, current, ListingContext{locale, nullptr}, settings, runner, ui);
  }
  std::string Listing(bool all, size_t current = 0) {
    StringSink sink;
    WriteListing(db, all, current, sink, ListingContext{locale, nullptr});
    return sink.text;
  }
};

TEST(PrintTest, ExitCodesAndTheirMessages) {
  PrintFixture f;
  f.runner.result = Exited(0);
  EXPECT_EQ(f.Print(true), PrintOutcome::Printed);
  EXPECT_EQ(f.runner.program, "lp");
  EXPECT_EQ(f.runner.args, (std::vector<std::string>{"-d", "office", f.settings.tempPath}));
  EXPECT_EQ(f.runner.printed, f.Listing(true));
  ASSERT_EQ(f.ui.messages.size(), 1u);
  EXPECT_EQ(f.ui.messages[0].text, "Data Printed OK");
  EXPECT_EQ(f.ui.messages[0].caption, "Update");
  EXPECT_FALSE(FileExists(f.settings.tempPath));

  f.runner.result = Exited(63);  // the user cancelled: no message
  EXPECT_EQ(f.Print(false, 1), PrintOutcome::Cancelled);
  EXPECT_EQ(f.runner.printed, f.Listing(false, 1));
  EXPECT_EQ(f.ui.messages.size(), 1u);

  f.runner.result = Exited(1);
  EXPECT_EQ(f.Print(false, 2), PrintOutcome::Failed);
  ASSERT_EQ(f.ui.messages.size(), 2u);
  EXPECT_EQ(f.ui.messages[1].text, "There was a problem printing to PrintPocketCE");
  EXPECT_EQ(f.ui.messages[1].caption, "Update");
  EXPECT_FALSE(FileExists(f.settings.tempPath));
}

TEST(PrintTest, AProgramThatCannotBeRunGivesTwoMessages) {
  PrintFixture f;
  f.runner.result.outcome = ProcessResult::Outcome::NotFound;
  f.runner.result.systemError = ENOENT;
  EXPECT_EQ(f.Print(true), PrintOutcome::NotStarted);
  f.runner.result.outcome = ProcessResult::Outcome::NotStarted;
  f.runner.result.systemError = EACCES;
  EXPECT_EQ(f.Print(true), PrintOutcome::NotStarted);
  ASSERT_EQ(f.ui.messages.size(), 4u);
  EXPECT_EQ(f.ui.messages[0].text,
            "Unable to call PrintPocketCE.  Please check to see if it is properly installed.");
  EXPECT_EQ(f.ui.messages[0].caption, "ERROR");
  EXPECT_EQ(f.ui.messages[1].text, "File not found");
  EXPECT_EQ(f.ui.messages[1].caption, "ERROR");
  EXPECT_EQ(f.ui.messages[3].text, "Error #: 5");
  EXPECT_FALSE(FileExists(f.settings.tempPath));
  EXPECT_EQ(PrintErrorText(995), "Op Aborted.");
}

TEST(PrintTest, NothingInViewRunsNothingAndLeavesNoFile) {
  PrintFixture f;
  f.db = testing::SampleDatabase();
  EXPECT_EQ(f.Print(true), PrintOutcome::NothingToPrint);
  EXPECT_EQ(f.Print(false, 65000), PrintOutcome::NothingToPrint);  // a new record
  EXPECT_EQ(f.runner.runs, 0);
  EXPECT_TRUE(f.ui.messages.empty());
  EXPECT_FALSE(FileExists(f.settings.tempPath));

  f.settings.tempPath = "/nonexistent/dir/cxprnttemp.txt";
  EXPECT_EQ(f.Print(true), PrintOutcome::TempFileFailed);
  ASSERT_EQ(f.ui.messages.size(), 1u);
  EXPECT_EQ(f.ui.messages[0].text, "ERROR: Unable to open temp file for writing.");
  EXPECT_EQ(f.ui.messages[0].caption, "Error");
}

TEST(ProcessTest, RunsWaitsAndTellsMissingProgramsApart) {
  SystemProcessRunner runner;
  ProcessResult r = runner.Run("sh", {"-c", "exit 63"});
  EXPECT_EQ(r.outcome, ProcessResult::Outcome::Exited);
  EXPECT_EQ(r.exitCode, 63);
  r = runner.Run("sh", {"-c", "kill -TERM $$"});
  EXPECT_EQ(r.exitCode, 128 + 15);
  r = runner.Run("cardovex-no-such-program", {});
  EXPECT_EQ(r.outcome, ProcessResult::Outcome::NotFound);
  EXPECT_EQ(LaunchErrorCode(r), 2);
  r = runner.Run("/nonexistent/dir/lp", {});
  EXPECT_EQ(r.outcome, ProcessResult::Outcome::NotFound);
}

TEST(ProcessTest, PrintsThroughAConfiguredCommand) {
  PrintFixture f;
  // A print handler that keeps a copy of what it is given and exits 0.
  const std::string script = f.dir.File("printer.sh");
  const std::string copy = f.dir.File("printed.txt");
  const std::string body = "#!/bin/sh\ncp \"$1\" '" + copy + "'\n";
  ASSERT_TRUE(WriteFileSafely(script, body.data(), body.size()));
  ASSERT_EQ(::chmod(script.c_str(), 0755), 0);
  f.settings.command = script;
  f.settings.arguments.clear();
  SystemProcessRunner runner;
  EXPECT_EQ(PrintRecords(f.db, true, 0, ListingContext{f.locale, nullptr}, f.settings, runner, f.ui),
            PrintOutcome::Printed);
  std::vector<uint8_t> bytes;
  ASSERT_TRUE(ReadWholeFile(copy, bytes));
  EXPECT_EQ(std::string(bytes.begin(), bytes.end()), f.Listing(true));
  EXPECT_FALSE(FileExists(f.settings.tempPath));
}

}  // namespace
}  // namespace cx
