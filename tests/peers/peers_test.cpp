// Other programs that read and write the same container: Perl's Palm::PDB
// and txt2pdbdoc. Each test is skipped when its program is not installed.
#include <gtest/gtest.h>

#include <sys/wait.h>

#include <cstdio>
#include <cstdlib>
#include <map>
#include <optional>
#include <sstream>

#include "engine/record_store.h"
#include "engine/value_text.h"
#include "tests/engine/test_databases.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ByteVector;

const std::string kScripts = CARDOVEX_PEERS_DIR;

// The paths quoted are the test's own (scratch folders, the source tree).
std::string Quote(const std::string& s) { return "'" + s + "'"; }

bool Succeeds(const std::string& command) {
  int rc = std::system(command.c_str());
  return rc != -1 && WIFEXITED(rc) && WEXITSTATUS(rc) == 0;
}

bool HavePalmPdb() { return Succeeds("timeout 30 perl -MPalm::PDB -MPalm::Raw -e 1 >/dev/null 2>&1"); }

// The standard output of a command that must succeed, at most `limit` bytes.
std::optional<std::string> Output(const std::string& command, size_t limit = size_t(1) << 24) {
  FILE* p = ::popen(command.c_str(), "r");
  if (!p) return std::nullopt;
  std::string out;
  char buf[4096];
  size_t n;
  while (out.size() < limit && (n = std::fread(buf, 1, sizeof buf, p)) > 0) out.append(buf, n);
  int rc = ::pclose(p);
  if (rc == -1 || !WIFEXITED(rc) || WEXITSTATUS(rc) != 0) return std::nullopt;
  return out;
}

std::string Hex(ByteView bytes) {
  static const char* digits = "0123456789abcdef";
  std::string s;
  for (uint8_t b : bytes) {
    s.push_back(digits[b >> 4]);
    s.push_back(digits[b & 15]);
  }
  return s;
}

struct Dump {
  struct Record {
    uint32_t offset = 0;
    int attributes = 0;
    uint32_t id = 0;
    std::string hex;
  };
  std::map<std::string, std::string> header;
  std::vector<Record> records;
};

Dump ParseDump(const std::string& text) {
  Dump d;
  std::istringstream lines(text);
  std::string line;
  while (std::getline(lines, line)) {
    if (line.rfind("record ", 0) == 0) {
      Dump::Record r;
      size_t index = 0;
      std::istringstream in(line.substr(7));
      in >> index;
      for (std::string field; in >> field;) {
        size_t eq = field.find('=');
        std::string key = field.substr(0, eq), value = field.substr(eq + 1);
        if (key == "offset") r.offset = uint32_t(std::stoul(value));
        if (key == "attributes") r.attributes = std::stoi(value);
        if (key == "id") r.id = uint32_t(std::stoul(value));
        if (key == "data") r.hex = value;
      }
      d.records.push_back(r);
    } else if (size_t eq = line.find('='); eq != std::string::npos) {
      d.header[line.substr(0, eq)] = line.substr(eq + 1);
    }
  }
  return d;
}

// Slots: 0 Text, 1 Integer, 2 Pop-Up, 3 Date, 4 Time, 5 Check-Box,
// 6 Float, 7 Note, 8 Unique (make_pdb.pl encodes records for exactly this).
Schema PeerSchema() {
  Schema s = testing::SchemaOf({FieldType::Text, FieldType::Integer, FieldType::PopUp, FieldType::Date,
                                FieldType::Time, FieldType::CheckBox, FieldType::Float, FieldType::Note,
                                FieldType::Unique});
  s.field[0].name.set("Name");
  s.field[6].size = 2;
  s.password.set("pw");
  s.securityLevels = 0x0101;
  s.author.set("peer test");
  return s;
}

TEST(PeersTest, PalmPdbReadsWhatTheEngineWrites) {
  if (!HavePalmPdb()) GTEST_SKIP() << "perl with Palm::PDB is not installed";
  cx::testing::TempDir dir;
  Database db = Database::CreateNew(dir.File("engine.PDB"), "Engine Made");
  const Schema s = PeerSchema();
  db.schema() = s;
  db.popups()[2].items = {"Red", "Green", "Blue"};
  db.popups()[2].attributes = 0x07;
  db.popups()[2].uniqueID = 0x0000AA;
  // Attribute bytes Palm::PDB keeps whole: categories, dirty, private, and
  // deleted with archive.
  const struct {
    const char* name;
    uint8_t attributes;
    uint32_t id;
  } rows[] = {{"Alice", 0x00, 0x100001}, {"Bob", 0x10, 0x100002}, {"Carol", 0x43, 0x100003},
              {"Dee", 0x28, 0x100004}};
  uint32_t n = 0;
  for (const auto& row : rows) {
    Bytes e = NewEditingRecord(s);
    SetEditingText(e, 0, row.name, s);
    SetEditingText(e, 1, std::to_string(-7 * int(n)), s);
    SetEditingByte(e, 2, uint8_t(n % 3), s);
    SetEditingNumber(e, 3, 406 + n, s);
    SetEditingNumber(e, 4, 0x000D0705, s);
    SetEditingByte(e, 5, 1, s);
    SetEditingText(e, 6, "3.14", s);
    SetEditingText(e, 7, "a note", s);
    SetEditingNumber(e, 8, ++n, s);
    ASSERT_TRUE(db.AppendRecord(Compact(e, s), row.attributes, row.id));
  }
  ASSERT_TRUE(db.Save(FixedClock(1234567890)).ok());

  auto out = Output("timeout 60 perl " + Quote(kScripts + "/dump_pdb.pl") + " " + Quote(db.path()));
  ASSERT_TRUE(out.has_value());
  const Dump d = ParseDump(*out);
  const std::map<std::string, std::string> header = {
      {"name", "Engine Made"}, {"attributes", "8"},        {"version", "0"},
      {"ctime", "893970430"},  {"mtime", "1234567890"},    {"baktime", "0"},
      {"modnum", "86"},        {"type", "QrTa"},           {"creator", "QrTa"},
      {"seed", "0"},           {"appinfo", std::string(80, '0')}, {"records", "35"}};
  EXPECT_EQ(d.header, header);

  std::vector<ByteVector> expected = {WriteSchema(s)};
  for (const PopupList& list : db.popups()) expected.push_back(list.Encode());
  for (size_t i = 0; i < db.recordCount(); ++i) {
    expected.emplace_back(db.record(i).begin(), db.record(i).end());
  }
  ASSERT_EQ(d.records.size(), expected.size());
  uint32_t offset = 80 + 8 * 35 + 40;
  for (size_t i = 0; i < expected.size(); ++i) {
    EXPECT_EQ(d.records[i].offset, offset) << i;
    EXPECT_EQ(d.records[i].hex, Hex(expected[i])) << i;
    offset += uint32_t(expected[i].size());
  }
  EXPECT_EQ(d.records[0].attributes, 0x40);  // saved with unsaved changes
  EXPECT_EQ(d.records[3].attributes, 0x07);
  EXPECT_EQ(d.records[3].id, 0x0000AAu);
  for (size_t i = 0; i < 4; ++i) {
    EXPECT_EQ(d.records[31 + i].attributes, rows[i].attributes) << i;
    EXPECT_EQ(d.records[31 + i].id, rows[i].id) << i;
  }
}

TEST(PeersTest, EngineReadsWhatPalmPdbWrites) {
  if (!HavePalmPdb()) GTEST_SKIP() << "perl with Palm::PDB is not installed";
  cx::testing::TempDir dir;
  const Schema s = PeerSchema();
  {
    std::string hex = Hex(WriteSchema(s));
    testing::WriteBytes(dir.File("schema.hex"), ByteVector(hex.begin(), hex.end()));
  }
  const std::string made = dir.File("perl.PDB");
  ASSERT_TRUE(Succeeds("timeout 60 perl " + Quote(kScripts + "/make_pdb.pl") + " " +
                       Quote(dir.File("schema.hex")) + " " + Quote(made)));

  cx::testing::ScriptedUi ui;
  Database db;
  ASSERT_TRUE(db.Open(made, ui).ok());
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_EQ(db.Name(), "Perl Made");
  EXPECT_EQ(db.header().version, 1);
  EXPECT_EQ(db.header().attributes, 8);
  EXPECT_EQ(db.header().creationDate, 893970430u);
  EXPECT_EQ(db.header().modificationNumber, 86u);
  EXPECT_EQ(db.header().uniqueIDSeed, 0x00305000u);
  EXPECT_TRUE(db.schema() == s);
  EXPECT_EQ(db.schemaUniqueID(), 1u);
  EXPECT_EQ(db.popups()[2].items, (std::vector<std::string>{"Red", "Green", "Blue"}));
  EXPECT_EQ(db.popups()[9].items, std::vector<std::string>{"unused"});
  for (int i = 0; i < 30; ++i) {
    EXPECT_EQ(db.popups()[i].attributes, i % 16) << i;
    EXPECT_EQ(db.popups()[i].uniqueID, uint32_t(0x100 + i)) << i;
  }

  ASSERT_EQ(db.recordCount(), 4u);
  const uint8_t attributes[] = {0x00, 0x10, 0x43, 0x28};
  const std::vector<std::vector<std::string>> values = {
      {"Alice", "42", "Green", "2/10/1905", "1:07:05 PM", "1", "3.14", "line1\r\nline2", "1"},
      {"Bob", "-5", "No Value", "NO DATE", "No Time", "0", "0.5", "", "2"},
      {"Zo\xEB", "2147483647", "Red", "2/29/2024", "11:59:59 PM", "1", "-1.25", "n", "3"},
      {"Dee", "", "", "", "", "", "", "", ""}};
  const LocaleInfo locale = LocaleInfo::UnitedStates();
  const ValueContext ctx{db.schema(), db.popups(), locale};
  for (size_t r = 0; r < 4; ++r) {
    EXPECT_EQ(db.entry(r).attributes(), attributes[r]) << r;
    EXPECT_EQ(db.entry(r).uniqueID(), 0x100001u + r) << r;
    for (int slot = 0; slot < 9; ++slot) {
      EXPECT_EQ(ValueText(ctx, db.record(r), slot), values[r][slot]) << r << "/" << slot;
    }
  }

  // Saved at the same moment, the engine's file is the peer's, byte for byte.
  ASSERT_TRUE(db.SaveAs(dir.File("copy.PDB"), FixedClock(893970435)).ok());
  EXPECT_EQ(testing::ReadBytes(dir.File("copy.PDB")), testing::ReadBytes(made));
}

TEST(PeersTest, PalmDocFileIsRefused) {
  if (!Succeeds("command -v txt2pdbdoc >/dev/null 2>&1")) GTEST_SKIP() << "txt2pdbdoc is not installed";
  cx::testing::TempDir dir;
  std::string text;
  for (int i = 0; i < 50; ++i) text += "A line of plain text for a document reader.\n";
  testing::WriteBytes(dir.File("in.txt"), ByteVector(text.begin(), text.end()));
  ASSERT_TRUE(Succeeds("timeout 60 txt2pdbdoc \"Sample Doc\" " + Quote(dir.File("in.txt")) + " " +
                       Quote(dir.File("out.pdb")) + " >/dev/null"));

  Header h;
  EXPECT_EQ(ReadHeader(dir.File("out.pdb"), h), -1);
  EXPECT_EQ(FourCCText(h.creator), "REAd");
  EXPECT_EQ(FourCCText(h.type), "TEXt");
  cx::testing::ScriptedUi ui;
  Database db;
  EXPECT_FALSE(db.Open(dir.File("out.pdb"), ui).ok());
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text,
            "ERROR: Reading header!\nMake sure you are converting a Cardovex data file!\n");
}

}  // namespace
}  // namespace cx
