// Text files in and out of the command-line tool: UTF-8 by default, the
// databases' own bytes on request, "-" for the standard streams.
#include <gtest/gtest.h>

#include <fcntl.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <sstream>
#include <thread>

#include "cli/global_options.h"
#include "engine/record_store.h"
#include "ops/csv_export.h"
#include "ops/listing.h"
#include "ops/report.h"
#include "ops/text_encoding.h"
#include "platform/text_codec.h"
#include "tests/cli/program_run.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

using testing::TempDir;

Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args)); }

// The program itself, its standard input read from `stdinPath`, given 20
// seconds at most.
Result RunProgram(const TempDir& dir, const std::vector<std::string>& args, const std::string& stdinPath) {
  const std::string outPath = dir.File("stdout.bin"), errPath = dir.File("stderr.txt");
  const pid_t pid = Spawn(args, outPath, errPath, stdinPath);
  const int code = Await(pid, std::chrono::steady_clock::now() + std::chrono::seconds(20));
  return {code, ReadText(outPath), ReadText(errPath)};
}

std::string MakePeople(const TempDir& dir) {
  const std::string path = dir.File("People.PDB");
  Result r = Cli({"new", path, "--name", "People", "--field", "Name:Text", "--field", "Age:Integer",
                  "--field", "City:Text"});
  EXPECT_EQ(r.code, 0) << r.err;
  return path;
}

// What a spreadsheet on Linux writes: UTF-8, a header, quotes where needed.
const std::string kPeopleCsv =
    "Name,Age,City\n"
    "Zo\xC3\xAB M\xC3\xBCller,34,K\xC3\xB6ln\n"
    "\"Fran\xC3\xA7ois, \xC3\x89mile\",51,\xE2\x80\x9EParis\xE2\x80\x9C\n"
    "Plain Smith,7,Leeds\n";

TEST(CliTextFiles, Utf8CsvWithHeaderRoundTripsUnchanged) {
  TempDir dir;
  const std::string db = MakePeople(dir);
  // Editors on some systems begin the file with a byte-order mark.
  WriteText(dir.File("in.csv"), "\xEF\xBB\xBF" + kPeopleCsv);
  Result r = Cli({"import-csv", db, dir.File("in.csv"), "--header"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "3 records imported\n");
  EXPECT_TRUE(r.err.empty()) << r.err;

  r = Cli({"export-csv", db, dir.File("out.csv"), "--header"});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(ReadText(dir.File("out.csv")), kPeopleCsv);
  r = Cli({"export-csv", db, "-", "--header"});
  EXPECT_EQ(r.out, kPeopleCsv);

  // The database holds the characters, not their UTF-8 bytes.
  r = Cli({"export-csv", db, "-", "--encoding", "windows-1252"});
  EXPECT_EQ(r.out.substr(0, r.out.find(',')), "Zo\xEB M\xFCller");
}

TEST(CliTextFiles, CharactersADatabaseCannotHoldAreNamedByLineAndNothingIsStored) {
  TempDir dir;
  const std::string db = MakePeople(dir);
  const std::string before = ReadText(db);
  // A header, an ordinary line, a snowman on line 3, a stray byte on line 5
  // (after a quoted value spanning two lines).
  WriteText(dir.File("in.csv"),
        "Name,Age,City\nAnn,1,Rome\nSnow \xE2\x98\x83 man,2,Oslo\n\"two\nlines\",3,x\nbad \xFF,4,y\n");
  Result r = Cli({"import-csv", db, dir.File("in.csv"), "--header"});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("2 lines hold"), std::string::npos) << r.err;
  EXPECT_NE(r.err.find("line 3: \"\xE2\x98\x83\""), std::string::npos) << r.err;
  EXPECT_NE(r.err.find("line 6: \"\\xFF\""), std::string::npos) << r.err;
  EXPECT_EQ(ReadText(db), before);

  // Lines with values not stored as given count the header line too, so
  // that the numbers match what an editor shows.
  WriteText(dir.File("late.csv"), "Name,Age,City\nAnn,1,Rome\nBob,many,Oslo\n");
  r = Cli({"import-csv", db, dir.File("late.csv"), "--header", "--strict"});
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("line 3"), std::string::npos) << r.err;
  EXPECT_EQ(ReadText(db), before);
}

TEST(CliTextFiles, Windows1252GivesTheStoredBytesAndUtf8TheirWidening) {
  TempDir dir;
  const std::string db = MakePeople(dir);
  WriteText(dir.File("in.csv"), "Ren\xE9" ",40,Z\xFCrich\n\x80uro,2,\x84quoted\x93\n");
  Result r = Cli({"import-csv", db, dir.File("in.csv"), "--encoding", "windows-1252"});
  ASSERT_EQ(r.code, 0) << r.err;

  Database opened;
  SilentUi ui;
  ASSERT_TRUE(opened.Open(db, ui).ok());
  LocaleInfo locale;
  ASSERT_EQ(Cli({"export-csv", db, dir.File("a.csv"), "--encoding", "windows-1252"}).code, 0);
  // Made by the operations the desktop uses for its own exports.
  StringSink csv, listing;
  ASSERT_EQ(ExportCsvTo(opened, CsvExportOptions{}, csv, CsvSettings{}, locale, ui), 1);
  EXPECT_EQ(ReadText(dir.File("a.csv")), csv.text);
  EXPECT_EQ(ReadText(dir.File("a.csv")), ReadText(dir.File("in.csv")));
  ASSERT_EQ(Cli({"export-csv", db, dir.File("u.csv")}).code, 0);
  EXPECT_EQ(ReadText(dir.File("u.csv")), Cp1252ToUtf8(csv.text));

  WriteListing(opened, true, 0, listing, ListingContext{locale, nullptr});
  ASSERT_EQ(Cli({"listing", db, "-o", dir.File("l.txt"), "--encoding", "cp1252"}).code, 0);
  EXPECT_EQ(ReadText(dir.File("l.txt")), listing.text);
  ASSERT_EQ(Cli({"listing", db, "-o", dir.File("lu.txt")}).code, 0);
  EXPECT_EQ(ReadText(dir.File("lu.txt")), Cp1252ToUtf8(listing.text));
  EXPECT_EQ(Cli({"listing", db}).out, Cp1252ToUtf8(listing.text));

  EXPECT_EQ(Cli({"report", db, "Age", "-o", dir.File("r.txt"), "--encoding", "latin-9"}).code, 2);
  EXPECT_FALSE(std::ifstream(dir.File("r.txt")).good());
}

TEST(CliTextFiles, DashIsStandardInputAndOutputOfTheProgram) {
  TempDir dir;
  const std::string db = MakePeople(dir);
  WriteText(dir.File("in.csv"), kPeopleCsv);
  Result r = RunProgram(dir, {"import-csv", db, "-", "--header"}, dir.File("in.csv"));
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, "3 records imported\n");

  WriteText(dir.File("empty"), "");
  r = RunProgram(dir, {"export-csv", db, "-", "--encoding", "windows-1252"}, dir.File("empty"));
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(r.out, Utf8ToCp1252(kPeopleCsv.substr(kPeopleCsv.find('\n') + 1)));

  // An unstorable character from standard input names it as such.
  WriteText(dir.File("bad.csv"), "A \xE2\x82\xAC and \xE2\x84\xA2 fine,1,x\n\xE2\x88\x9E,2,y\n");
  r = RunProgram(dir, {"import-csv", db, "-"}, dir.File("bad.csv"));
  EXPECT_EQ(r.code, 1);
  EXPECT_NE(r.err.find("line 2: \"\xE2\x88\x9E\""), std::string::npos) << r.err;
  EXPECT_EQ(r.err.find("line 1"), std::string::npos) << r.err;  // euro and trade mark fit
  EXPECT_NE(r.err.find("standard input"), std::string::npos) << r.err;
}

TEST(NarrowText, KeepsWhatFitsAndCountsLinesAtLineFeeds) {
  NarrowedText t = NarrowText("\xEF\xBB\xBF" "a\r\n\xC2\x81\xE2\x80\xA6\r\nb\xEF\xBB\xBF\n", TextEncoding::kUtf8);
  // Only a leading mark is dropped; one inside the text is a character the
  // database cannot hold.
  EXPECT_EQ(t.bytes, "a\r\n\x81\x85\r\nb?\n");
  ASSERT_EQ(t.first.size(), 1u);
  EXPECT_EQ(t.first[0].line, 3u);

  std::string many;
  for (int i = 0; i < 8; ++i) many += "\xC3\x28 \xF0\x9F\x98\x80\n";  // a broken pair and an emoji
  t = NarrowText(many, TextEncoding::kUtf8);
  EXPECT_EQ(t.unstorableLines, 8u);
  EXPECT_EQ(t.first.size(), 2 * NarrowedText::kKeptLines);
  EXPECT_EQ(t.first[0].character, "\\xC3");
  EXPECT_EQ(t.first[1].character, "\xF0\x9F\x98\x80");
  EXPECT_EQ(NarrowText("\xEF\xBB\xBFx", TextEncoding::kWindows1252).bytes, "\xEF\xBB\xBFx");

  // Every byte widens as the code page says, in pieces of any size, and
  // narrows back.
  std::string all;
  for (int b = 1; b < 256; ++b) all.push_back(static_cast<char>(b));
  StringSink wide;
  EncodingSink sink(wide, TextEncoding::kUtf8);
  for (size_t at = 0; at < all.size(); at += 7) sink.Write(std::string_view(all).substr(at, 7));
  EXPECT_EQ(wide.text, Cp1252ToUtf8(all));
  EXPECT_EQ(NarrowText(wide.text, TextEncoding::kUtf8).bytes, all);

  // Long ASCII runs are skipped a block at a time: a wide byte at every
  // place in a block, at the start and the end of a piece, and pieces
  // larger than a block, must all come out the same.
  std::string mixed;
  for (int gap = 0; gap < 40; ++gap) {
    mixed.append(static_cast<size_t>(gap), 'a');
    mixed.push_back(static_cast<char>(0x80 + gap * 3));
  }
  for (size_t piece : {size_t{1}, size_t{15}, size_t{16}, size_t{17}, size_t{100}, mixed.size()}) {
    StringSink pieces;
    EncodingSink widening(pieces, TextEncoding::kUtf8);
    for (size_t at = 0; at < mixed.size(); at += piece) {
      widening.Write(std::string_view(mixed).substr(at, piece));
    }
    EXPECT_EQ(pieces.text, Cp1252ToUtf8(mixed)) << "pieces of " << piece;
  }
  // Narrowing skips the same runs: lines keep their count across them.
  std::string lines, narrowed;
  for (int gap = 0; gap < 40; ++gap) {
    lines += std::string(static_cast<size_t>(gap), 'a') + "\n\xE2\x88\x9E";  // infinity: cannot be stored
    narrowed += std::string(static_cast<size_t>(gap), 'a') + "\n?";
  }
  t = NarrowText(Cp1252ToUtf8(mixed) + lines, TextEncoding::kUtf8);
  EXPECT_EQ(t.bytes, mixed + narrowed);
  EXPECT_EQ(t.unstorableLines, 40u);
  ASSERT_EQ(t.first.size(), NarrowedText::kKeptLines);
  for (size_t k = 0; k < t.first.size(); ++k) EXPECT_EQ(t.first[k].line, k + 2);
}

}  // namespace
}  // namespace cx::cli
