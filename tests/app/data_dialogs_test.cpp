// The rules behind the data dialogs: typed filter limits, remembered beam
// peers, the receive address, what a beam of an unsaved database sends,
// and CSV files in either encoding.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "app/data_csv.h"
#include "app/data_dialogs.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"
#include "tests/ops/data_ops_fixture.h"

namespace cx {
namespace {

using testing::TempDir;
using testing::TestDb;
using testing::Text;
using testing::Num;

std::string Slurp(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

void Spill(const std::string& path, const std::string& bytes) {
  std::ofstream(path, std::ios::binary) << bytes;
}

TEST(FilterLimits, NumbersOfTheFieldsKindPassAndOthersAreNamed) {
  TestDb t;
  const int whole = t.Field(FieldType::Integer, "Count");
  const int decimal = t.Field(FieldType::Float, "Price");
  const int text = t.Field(FieldType::Text, "Name");
  FilterDialogFilter f;
  f.enabled = true;
  f.field = whole;
  f.lowerLimit = " -5 ";
  f.upperLimit = "2147483647";
  EXPECT_FALSE(CheckFilterLimits(t.db.schema(), f));
  f.upperLimit = "2147483648";  // would wrap in the stored 32 bits
  ASSERT_TRUE(CheckFilterLimits(t.db.schema(), f));
  EXPECT_NE(CheckFilterLimits(t.db.schema(), f)->find("Upper Limit"), std::string::npos);
  f.lowerLimit = "1.5";
  EXPECT_NE(CheckFilterLimits(t.db.schema(), f)->find("Lower Limit"), std::string::npos);

  f.field = decimal;
  f.lowerLimit = "1.5";
  f.upperLimit = "1e3";
  EXPECT_FALSE(CheckFilterLimits(t.db.schema(), f));
  f.upperLimit = "1,5";  // the stored text is read with "." only
  EXPECT_TRUE(CheckFilterLimits(t.db.schema(), f));

  // Text boxes of other kinds, and a filter that is off, are never refused.
  f.field = text;
  EXPECT_FALSE(CheckFilterLimits(t.db.schema(), f));
  f.field = whole;
  f.enabled = false;
  EXPECT_FALSE(CheckFilterLimits(t.db.schema(), f));
}

TEST(BeamPeers, TypedPeersAreRememberedNewestFirstWithoutRepeats) {
  std::string stored;
  stored = RememberPeer(stored, "alpha:6500");
  stored = RememberPeer(stored, "beta");
  stored = RememberPeer(stored, "ALPHA:6500");
  EXPECT_EQ(RememberedPeers(stored), (std::vector<std::string>{"ALPHA:6500", "beta"}));
  for (int i = 0; i < 20; ++i) stored = RememberPeer(stored, "host" + std::to_string(i));
  const auto peers = RememberedPeers(stored);
  ASSERT_EQ(peers.size(), kRememberedPeers);
  EXPECT_EQ(peers.front(), "host19");
}

TEST(ReceiveAddress, UnusableSettingsFallBackToAnUnprivilegedPort) {
  const std::string fallback = "0.0.0.0:6500";
  EXPECT_EQ(ReceiveAddressOrDefault(std::nullopt, fallback), fallback);
  EXPECT_EQ(ReceiveAddressOrDefault(std::string("nonsense:port"), fallback), fallback);
  EXPECT_EQ(ReceiveAddressOrDefault(std::string(" 127.0.0.1:7000 "), fallback), "127.0.0.1:7000");
  EXPECT_FALSE(CheckReceiveAddress("127.0.0.1:0"));
  EXPECT_TRUE(CheckReceiveAddress("127.0.0.1"));
  EXPECT_TRUE(CheckReceiveAddress("127.0.0.1:65536"));
  EXPECT_FALSE(CheckReceiveAddress("[::1]:6500"));
}

TEST(BeamDatabase, UnsavedChangesAreBeamedFromASnapshotAndTheFileIsLeftAlone) {
  TempDir dir;
  TestDb t;
  const int name = t.Field(FieldType::Text, "Name");
  t.Add({Text(name, "saved")});
  const std::string path = dir.File("Parts.PDB");
  ASSERT_TRUE(t.db.SaveAs(path));
  const std::string onDisk = Slurp(path);

  std::string beamed;
  ASSERT_TRUE(BeamableDatabaseFile(t.db, dir.File(""), beamed));
  EXPECT_EQ(beamed, path);  // nothing unsaved: the file itself

  t.Add({Text(name, "not yet saved")});
  TempDir scratch;
  ASSERT_TRUE(BeamableDatabaseFile(t.db, scratch.path(), beamed));
  EXPECT_EQ(beamed, scratch.File("Parts.PDB"));
  Database received;
  testing::ScriptedUi ui;
  ASSERT_TRUE(received.Open(beamed, ui));
  EXPECT_EQ(received.recordCount(), 2u);
  // The open database still has its changes to save, at its own path.
  EXPECT_TRUE(t.db.changed());
  EXPECT_EQ(t.db.path(), path);
  EXPECT_EQ(Slurp(path), onDisk);
}

TEST(CsvEncoding, Utf8ExportIsTheStoredBytesWidenedAndImportsBack) {
  TempDir dir;
  TestDb t;
  const int name = t.Field(FieldType::Text, "Name");
  const int count = t.Field(FieldType::Integer, "Count");
  t.Add({Text(name, "Caf\xE9, \"chez\" nous"), Num(count, 7)});
  t.Add({Text(name, "Plain"), Num(count, 8)});
  CsvExportOptions options;
  options.withHeader = true;
  std::string error;
  ASSERT_EQ(ExportCsvEncoded(t.session, options, CsvEncoding::kWindows1252, dir.File("a.csv"), error), 1);
  ASSERT_EQ(ExportCsvEncoded(t.session, options, CsvEncoding::kUtf8, dir.File("u.csv"), error), 1);
  EXPECT_TRUE(error.empty());
  EXPECT_EQ(Slurp(dir.File("u.csv")), Cp1252ToUtf8(Slurp(dir.File("a.csv"))));
  EXPECT_NE(Slurp(dir.File("u.csv")).find("Caf\xC3\xA9"), std::string::npos);

  TestDb target;
  target.Field(FieldType::Text, "Name");
  target.Field(FieldType::Integer, "Count");
  Spill(dir.File("in.csv"), "\xEF\xBB\xBF" "Caf\xC3\xA9,3\nB,4\n");
  CsvImportResult r =
      ImportCsvEncoded(target.db, dir.File("in.csv"), kCsvColumnsByDisplayOrder, CsvEncoding::kUtf8,
                       target.locale, dir.path());
  ASSERT_TRUE(r.status) << r.status.message();
  EXPECT_EQ(r.imported, 2u);
  EXPECT_EQ(target.TextAt(0, 0), "Caf\xE9");  // the mark before it is not part of the value
  EXPECT_EQ(target.NumberAt(1, 1), 4u);
  EXPECT_FALSE(FileExists(dir.File("import.csv")));

  // A character the database cannot hold refuses the whole file.
  Spill(dir.File("bad.csv"), "ok,1\n\xE2\x98\x83,2\n");
  r = ImportCsvEncoded(target.db, dir.File("bad.csv"), kCsvColumnsByDisplayOrder, CsvEncoding::kUtf8,
                       target.locale, dir.path());
  EXPECT_FALSE(r.status);
  EXPECT_EQ(target.db.recordCount(), 2u);
}

}  // namespace
}  // namespace cx
