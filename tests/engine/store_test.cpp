#include <gtest/gtest.h>

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <filesystem>

#include "engine/database_folder.h"
#include "engine/record_store.h"
#include "tests/engine/test_databases.h"
#include "tests/support/test_support.h"

namespace cx {
namespace {

using testing::ByteVector;
using testing::ReadBE;
using testing::ReadBytes;
using testing::SlotWriter;

class StoreTest : public ::testing::Test {
 protected:
  // Three records with their own attributes and unique ids, one popup list
  // with its own; the database is marked changed by the additions.
  Database MakeFilled(const std::string& name) {
    Database db = Database::CreateNew(dir.File(name), "Filled");
    db.schema() = testing::EveryTypeSchema();
    db.popups()[3].items = {"Low", "High"};
    db.popups()[3].attributes = 0x05;
    db.popups()[3].uniqueID = 0x00ABCD;
    db.AppendRecord(SlotWriter().Text("one").Number(1).End().bytes, 0x40, 0x010203);
    db.AppendRecord(SlotWriter().Text("two").End().bytes, 0x10, 0x0A0B0C);
    db.AppendRecord(SlotWriter().End().bytes, 0x00, 0xFFFFFF);
    return db;
  }

  cx::testing::TempDir dir;
  cx::testing::ScriptedUi ui;
};

TEST_F(StoreTest, NewDatabaseLayout) {
  Database db = Database::CreateNew(dir.File("new.PDB"), "New DB");
  ASSERT_TRUE(db.Save(FixedClock(1234567890)).ok());
  const ByteVector f = ReadBytes(db.path());
  Header h = InitHeader("New DB");
  h.modificationDate = 1234567890;
  EXPECT_EQ(f, testing::BuildPdb(testing::StandardRecords(), h));
  ASSERT_EQ(f.size(), 368u + 2152 + 30 * 3);
  EXPECT_EQ(testing::EntryOffset(f, 0), 368u);
  EXPECT_EQ(ReadBE(f, 32, 2), 8u);
  EXPECT_EQ(ReadBE(f, 36, 4), 893970430u);
  EXPECT_EQ(ReadBE(f, 48, 4), 86u);
  EXPECT_EQ(std::string(f.begin() + 60, f.begin() + 68), "QrTaQrTa");
  EXPECT_EQ(ReadBE(f, 76, 2), 31u);
}

TEST_F(StoreTest, SavedDatabaseOpensAsItWas) {
  Database db = MakeFilled("filled.PDB");
  ASSERT_TRUE(db.Save(FixedClock(1000)).ok());
  Database back;
  ASSERT_TRUE(back.Open(db.path(), ui).ok());
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_FALSE(back.changed());
  EXPECT_EQ(back.Name(), "Filled");
  EXPECT_TRUE(back.schema() == db.schema());
  EXPECT_EQ(back.popups()[3].items, db.popups()[3].items);
  EXPECT_EQ(back.popups()[3].attributes, 0x05);
  EXPECT_EQ(back.popups()[3].uniqueID, 0x00ABCDu);
  ASSERT_EQ(back.recordCount(), 3u);
  for (size_t i = 0; i < 3; ++i) {
    EXPECT_TRUE(std::ranges::equal(back.record(i), db.record(i))) << i;
    EXPECT_EQ(back.entry(i).attributes(), db.entry(i).attributes());
    EXPECT_EQ(back.entry(i).uniqueID(), db.entry(i).uniqueID());
  }
}

TEST_F(StoreTest, SavingTwiceWithoutChangeDiffersOnlyInDateAndDirtyBit) {
  Database db = MakeFilled("twice.PDB");
  ASSERT_TRUE(db.changed());
  ASSERT_TRUE(db.Save(FixedClock(1000)).ok());
  EXPECT_FALSE(db.changed());
  const ByteVector first = ReadBytes(db.path());
  ASSERT_TRUE(db.Save(FixedClock(2000)).ok());
  const ByteVector second = ReadBytes(db.path());
  ASSERT_EQ(first.size(), second.size());
  const size_t dirtyByte = testing::EntryAt(0) + 4;
  for (size_t i = 0; i < first.size(); ++i) {
    if ((i >= 40 && i < 44) || i == dirtyByte) continue;
    ASSERT_EQ(first[i], second[i]) << "byte " << i;
  }
  EXPECT_EQ(ReadBE(second, 40, 4), 2000u);
  EXPECT_EQ(first[dirtyByte], 0x40);
  EXPECT_EQ(second[dirtyByte], 0x00);

  Database reopened;
  ASSERT_TRUE(reopened.Open(db.path(), ui).ok());
  ASSERT_TRUE(reopened.Save(FixedClock(2000)).ok());
  EXPECT_EQ(ReadBytes(db.path()), second);
}

// A mapped open leaves the records as views of the file's own pages. The
// save replaces that file, so the views must still read the old file's
// bytes while they are written out, and after: saving twice, and saving an
// edited copy, gives what a copied open gives.
TEST_F(StoreTest, MappedOpenSavesOverItsOwnFileAsACopiedOpenDoes) {
  Database made = MakeFilled("mapped.PDB");
  ASSERT_TRUE(made.Save(FixedClock(1000)).ok());
  Database copied;
  ASSERT_TRUE(copied.Open(made.path(), ui, FileBuffer::Access::kCopy).ok());
  ASSERT_TRUE(copied.SaveAs(dir.File("copied.PDB"), FixedClock(3000)).ok());

  Database mapped;
  ASSERT_TRUE(mapped.Open(made.path(), ui, FileBuffer::Access::kMap).ok());
  ASSERT_TRUE(mapped.Save(FixedClock(2000)).ok());
  ASSERT_TRUE(mapped.Save(FixedClock(3000)).ok());
  EXPECT_EQ(ReadBytes(made.path()), ReadBytes(dir.File("copied.PDB")));
  EXPECT_EQ(ValueString(*FieldValue(mapped.record(1), 0)), "two");

  mapped.ReplaceRecord(0, SlotWriter().Text("uno").End().bytes);
  copied.ReplaceRecord(0, SlotWriter().Text("uno").End().bytes);
  ASSERT_TRUE(mapped.Save(FixedClock(4000)).ok());
  ASSERT_TRUE(copied.Save(FixedClock(4000)).ok());
  EXPECT_EQ(ReadBytes(made.path()), ReadBytes(dir.File("copied.PDB")));
}

TEST_F(StoreTest, DirtyBitLeavesOtherAttributeBitsAlone) {
  auto records = testing::StandardRecords();
  records[0].attributes = 0x4A;
  records[0].uniqueID = 0x123456;
  ASSERT_TRUE(testing::WriteBytes(dir.File("attr.PDB"), testing::BuildPdb(records)));
  Database db;
  ASSERT_TRUE(db.Open(dir.File("attr.PDB"), ui).ok());
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  ByteVector f = ReadBytes(db.path());
  EXPECT_EQ(f[testing::EntryAt(0) + 4], 0x0A);
  EXPECT_EQ(ReadBE(f, testing::EntryAt(0) + 5, 3), 0x123456u);
  db.MarkChanged();
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  f = ReadBytes(db.path());
  EXPECT_EQ(f[testing::EntryAt(0) + 4], 0x4A);
}

TEST_F(StoreTest, WellFormedForeignFileIsSavedByteForByte) {
  Header h = InitHeader("Foreign");
  h.attributes = 0x0209;
  h.version = 3;
  h.creationDate = 1111;
  h.lastBackupDate = 2222;
  h.modificationNumber = 3333;
  h.sortInfoID = 0;
  h.type = format::FourCC('D', 'A', 'T', 'A');
  h.uniqueIDSeed = 0x00345000;
  h.nextRecordListID = 0;
  auto records = testing::StandardRecords(testing::EveryTypeSchema());
  records[4].bytes = ByteVector{'o', 'n', 'e', 0, 't', 'w', 'o', 0, 0, 0, 0, 0, 0};  // padded
  records[4].attributes = 0x08;
  records[4].uniqueID = 0x000102;
  records.push_back({SlotWriter().Text("a").Number(7).End().bytes, 0x21, 0x00AA00});
  records.push_back({SlotWriter(true).Text("b").bytes, 0x05, 0x00BB00});
  const ByteVector original = testing::BuildPdb(records, h);
  ASSERT_TRUE(testing::WriteBytes(dir.File("in.PDB"), original));

  Database db;
  ASSERT_TRUE(db.Open(dir.File("in.PDB"), ui).ok());
  ASSERT_TRUE(db.SaveAs(dir.File("out.PDB"), FixedClock(4444)).ok());
  ByteVector saved = ReadBytes(dir.File("out.PDB"));
  ASSERT_EQ(saved.size(), original.size());
  EXPECT_EQ(ReadBE(saved, 40, 4), 4444u);
  std::copy(original.begin() + 40, original.begin() + 44, saved.begin() + 40);
  EXPECT_EQ(saved, original);
}

TEST_F(StoreTest, DaylightSavingAddsAnHour) {
  Database db = Database::CreateNew(dir.File("dst.PDB"), "dst");
  ASSERT_TRUE(db.Save(FixedClock(1000000, true)).ok());
  EXPECT_EQ(ReadBE(ReadBytes(db.path()), 40, 4), 1003600u);
  EXPECT_EQ(db.header().modificationDate, 1003600u);
}

TEST_F(StoreTest, SaveIntoAMissingFolderFailsAndKeepsTheChangedMark) {
  Database db = MakeFilled("x.PDB");
  db.SetPath(dir.File("absent/x.PDB"));
  EXPECT_FALSE(db.Save(FixedClock(1)).ok());
  EXPECT_TRUE(db.changed());
  EXPECT_FALSE(std::filesystem::exists(dir.File("absent")));
}

// Checks that a save that fails leaves the old file and the changed mark,
// and no stray temporary file.
void ExpectFailedSaveHarmless(Database& db, const ByteVector& before, const std::string& folder) {
  EXPECT_TRUE(db.changed());
  EXPECT_EQ(ReadBytes(db.path()), before);
  size_t files = 0;
  for (const auto& e : std::filesystem::directory_iterator(folder)) files += e.is_regular_file();
  EXPECT_EQ(files, 1u);
}

TEST_F(StoreTest, SaveThatCannotWriteLeavesTheOldFile) {
  Database db = MakeFilled("full.PDB");
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  const ByteVector before = ReadBytes(db.path());
  db.AppendRecord(ByteVector(20000, 'z'));
  // The file-size limit makes the write fail part way, even for root.
  rlimit old{};
  ASSERT_EQ(getrlimit(RLIMIT_FSIZE, &old), 0);
  auto oldHandler = std::signal(SIGXFSZ, SIG_IGN);
  rlimit small = old;
  small.rlim_cur = 8192;
  ASSERT_EQ(setrlimit(RLIMIT_FSIZE, &small), 0);
  Status s = db.Save(FixedClock(2));
  setrlimit(RLIMIT_FSIZE, &old);
  std::signal(SIGXFSZ, oldHandler);
  EXPECT_FALSE(s.ok());
  ExpectFailedSaveHarmless(db, before, dir.path());
}

TEST_F(StoreTest, SaveIntoAReadOnlyFolderLeavesTheOldFile) {
  if (geteuid() == 0) GTEST_SKIP() << "root may write anywhere";
  Database db = MakeFilled("ro.PDB");
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  const ByteVector before = ReadBytes(db.path());
  db.MarkChanged();
  ASSERT_EQ(::chmod(dir.path().c_str(), 0500), 0);
  Status s = db.Save(FixedClock(2));
  ::chmod(dir.path().c_str(), 0700);
  EXPECT_FALSE(s.ok());
  ExpectFailedSaveHarmless(db, before, dir.path());
}

TEST_F(StoreTest, CopyRecordToFileLeavesOffTheLastByte) {
  Database db = MakeFilled("copy.PDB");
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  for (size_t index : {size_t(31), size_t(33)}) {
    const ByteView rec = db.record(index - 31);
    ASSERT_EQ(CopyRecordToFile(db.path(), index, dir.File("one.cxr")), 1);
    EXPECT_EQ(ReadBytes(dir.File("one.cxr")), ByteVector(rec.begin(), rec.end() - 1)) << index;
  }
  ASSERT_EQ(CopyRecordToFile(db.path(), 0, dir.File("schema.bin")), 1);
  EXPECT_EQ(ReadBytes(dir.File("schema.bin")).size(), 2151u);
  EXPECT_EQ(CopyRecordToFile(db.path(), 34, dir.File("none.cxr")), 0);
  EXPECT_EQ(CopyRecordToFile(dir.File("missing.PDB"), 31, dir.File("none.cxr")), 0);
  EXPECT_FALSE(std::filesystem::exists(dir.File("none.cxr")));
}

TEST_F(StoreTest, ReadRecordAtReadsOneRecord) {
  Database db = MakeFilled("at.PDB");
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  ByteVector out;
  ASSERT_TRUE(ReadRecordAt(db.path(), 32, out));
  EXPECT_TRUE(std::ranges::equal(out, db.record(1)));
  ASSERT_TRUE(ReadRecordAt(db.path(), 33, out));  // the last one runs to the end of the file
  EXPECT_TRUE(std::ranges::equal(out, db.record(2)));
  ASSERT_TRUE(ReadRecordAt(db.path(), 0, out));
  EXPECT_EQ(out, WriteSchema(db.schema()));
  EXPECT_FALSE(ReadRecordAt(db.path(), 34, out));
  EXPECT_FALSE(ReadRecordAt(dir.File("missing.PDB"), 0, out));
}

TEST_F(StoreTest, NewDatabaseNameTakesTheFirstFreeNumber) {
  testing::WriteBytes(dir.File("Untitled1.PDB"), {1});
  testing::WriteBytes(dir.File("Untitled2.PDB"), {1});
  EXPECT_EQ(NewDatabaseName(dir.path()), dir.File("Untitled3.PDB"));
  cx::testing::TempDir other;
  testing::WriteBytes(other.File("Untitled2.PDB"), {1});
  EXPECT_EQ(NewDatabaseName(other.path()), other.File("Untitled1.PDB"));
}

TEST_F(StoreTest, LinkedDatabaseIsLookedForBesideTheReferringFile) {
  std::filesystem::create_directories(dir.File("card"));
  std::filesystem::create_directories(dir.File("docs"));
  testing::WriteBytes(dir.File("docs/Parts.PDB"), {1});
  std::string name = "Parts";
  EXPECT_FALSE(FindDatabaseBeside(name, dir.File("card/Main.PDB")));
  EXPECT_EQ(name, "Parts");
  testing::WriteBytes(dir.File("card/Parts.PDB"), {1});
  EXPECT_TRUE(FindDatabaseBeside(name, dir.File("card/Main.PDB")));
  EXPECT_EQ(name, dir.File("card/Parts.PDB"));
}

TEST_F(StoreTest, AddingStopsAtTheRecordLimit) {
  Database db = Database::CreateNew(dir.File("big.PDB"), "big");
  for (int i = 0; i < 65504; ++i) ASSERT_TRUE(db.AppendRecord({0, 0xFF, 0xFF}));
  EXPECT_FALSE(db.CanAddRecord());
  EXPECT_FALSE(db.InsertRecord(0, {0}));
  EXPECT_FALSE(db.AppendRecord({0}));
  EXPECT_EQ(db.recordCount(), 65504u);
  db.ReplaceRecord(65503, {0, 1, 0, 7, 0xFF, 0xFF});
  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  EXPECT_EQ(ReadBE(ReadBytes(db.path()), 76, 2), 65535u);
  Database back;
  ASSERT_TRUE(back.Open(db.path(), ui).ok());
  ASSERT_EQ(back.recordCount(), 65504u);
  EXPECT_EQ(back.record(65503)[3], 7);
}

// A recalculation replaces records through an arena that is gone long
// before the records are saved; siblings in a block are replaced, deleted
// and moved on their own afterwards.
TEST_F(StoreTest, RecordsCopiedThroughAnArenaOutliveItAndEachOther) {
  Database db = Database::CreateNew(dir.File("arena.PDB"), "arena");
  db.schema() = testing::SchemaOf({FieldType::Unique, FieldType::Text});
  // About 4 MB of copies: blocks of every size, the largest in large pages.
  constexpr int kRecords = 4000;
  for (int i = 0; i < kRecords; ++i) db.AppendRecord(SlotWriter().Number(i + 1).End().bytes);
  const uint32_t next = db.NextUniqueNumber();
  std::vector<ByteVector> expected(kRecords);
  {
    RecordArena arena;
    for (int i = 0; i < kRecords; ++i) {
      expected[i] = SlotWriter().Number(i + 1).Text(std::string(i * 37 % 2000 + 1, char('a' + i % 26))).End().bytes;
      db.ReplaceRecord(i, ByteView(expected[i]), arena);
    }
    // A number past the next one moves it on, as any replacement does.
    expected[7] = SlotWriter().Number(next + 50).Text("big").End().bytes;
    db.ReplaceRecord(7, ByteView(expected[7]), arena);
  }
  EXPECT_EQ(db.TakeUniqueNumber(), next + 51);
  for (int i = 0; i < kRecords; i += 3) {
    expected[i] = SlotWriter().Number(i + 1).Text("own").End().bytes;
    db.ReplaceRecord(i, expected[i]);
  }
  for (int i = kRecords - 1; i >= 0; i -= 5) {
    db.DeleteRecord(i);
    expected.erase(expected.begin() + i);
  }
  db.MoveRecord(0, db.recordCount() - 1);
  std::rotate(expected.begin(), expected.begin() + 1, expected.end());

  ASSERT_TRUE(db.Save(FixedClock(1)).ok());
  Database back;
  ASSERT_TRUE(back.Open(db.path(), ui).ok());
  ASSERT_EQ(back.recordCount(), expected.size());
  for (size_t i = 0; i < expected.size(); ++i) {
    EXPECT_TRUE(std::ranges::equal(back.record(i), expected[i])) << i;
  }
}

TEST_F(StoreTest, NextUniqueNumber) {
  Database db = Database::CreateNew(dir.File("u.PDB"), "u");
  db.schema() = testing::SchemaOf({FieldType::Unique, FieldType::Link, FieldType::Integer});
  EXPECT_EQ(db.NextUniqueNumber(), 1u);
  db.AppendRecord(SlotWriter().Number(5).Number(9).Number(50).End().bytes);
  db.AppendRecord(SlotWriter().Number(3).End().bytes);
  EXPECT_EQ(db.NextUniqueNumber(), 10u);
  EXPECT_EQ(db.TakeUniqueNumber(), 10u);
  EXPECT_EQ(db.TakeUniqueNumber(), 11u);
  // A record that arrives with a larger number moves the count past it.
  db.AppendRecord(SlotWriter().Number(100).End().bytes);
  EXPECT_EQ(db.TakeUniqueNumber(), 101u);
  db.ReplaceRecord(0, SlotWriter().Number(5).Number(400).End().bytes);
  EXPECT_EQ(db.TakeUniqueNumber(), 401u);
  EXPECT_EQ(db.TakeUniqueNumber(), 402u);
}

}  // namespace
}  // namespace cx

namespace cx {
namespace {

class SaveGuardTest : public StoreTest {};

std::string TextValue(ByteView record, int slot) {
  auto v = FieldValue(record, slot);
  return v ? ValueString(*v) : "<none>";
}

TEST_F(SaveGuardTest, FileChangedOnDiskSinceOpeningIsNotReplaced) {
  Database first = MakeFilled("shared.PDB");
  ASSERT_TRUE(first.Save(FixedClock(1)).ok());
  const std::string path = first.path();
  Database mine, theirs;
  ASSERT_TRUE(mine.Open(path, ui).ok());
  ASSERT_TRUE(theirs.Open(path, ui).ok());
  theirs.AppendRecord(SlotWriter().Text("theirs").End().bytes);
  ASSERT_TRUE(theirs.Save(FixedClock(2)).ok());
  // Saving twice in a row is no change by somebody else.
  theirs.MarkChanged();
  ASSERT_TRUE(theirs.Save(FixedClock(3)).ok());

  mine.AppendRecord(SlotWriter().Text("mine").End().bytes);
  EXPECT_TRUE(mine.ChangedOnDisk());
  Status s = mine.Save(FixedClock(4));
  ASSERT_FALSE(s.ok());
  EXPECT_NE(s.message().find(path), std::string::npos) << s.message();
  EXPECT_TRUE(mine.changed());
  Database check;
  ASSERT_TRUE(check.Open(path, ui).ok());
  ASSERT_EQ(check.recordCount(), 4u);
  EXPECT_EQ(TextValue(check.record(3), 0), "theirs");

  // The user chose this version over the other.
  mine.AcceptDiskState();
  ASSERT_TRUE(mine.Save(FixedClock(5)).ok());
  ASSERT_TRUE(check.Open(path, ui).ok());
  EXPECT_EQ(TextValue(check.record(3), 0), "mine");
}

TEST_F(SaveGuardTest, RewriteInPlaceWithTheSameSizeIsNoticed) {
  Database first = MakeFilled("touched.PDB");
  ASSERT_TRUE(first.Save(FixedClock(1)).ok());
  Database mine;
  ASSERT_TRUE(mine.Open(first.path(), ui).ok());
  // Same file, same size: only the time of the change tells, to the
  // nanosecond.
  struct stat st{};
  ASSERT_EQ(::stat(first.path().c_str(), &st), 0);
  timespec times[2] = {st.st_atim, st.st_mtim};
  times[1].tv_nsec = (times[1].tv_nsec + 1) % 1000000000;
  ASSERT_EQ(::utimensat(AT_FDCWD, first.path().c_str(), times, 0), 0);
  mine.MarkChanged();
  EXPECT_FALSE(mine.Save(FixedClock(2)).ok());
  // Saved elsewhere, it is a new file of its own.
  ASSERT_TRUE(mine.SaveAs(dir.File("copy.PDB"), FixedClock(3)).ok());
  mine.MarkChanged();
  EXPECT_TRUE(mine.Save(FixedClock(4)).ok());
}

TEST_F(SaveGuardTest, SaveThroughALinkReplacesTheFileItPointsAt) {
  ASSERT_EQ(::mkdir(dir.File("real").c_str(), 0700), 0);
  Database first = MakeFilled("real/Data.PDB");
  ASSERT_TRUE(first.Save(FixedClock(1)).ok());
  ASSERT_EQ(::symlink("real/Data.PDB", dir.File("Link.PDB").c_str()), 0);
  Database viaLink;
  ASSERT_TRUE(viaLink.Open(dir.File("Link.PDB"), ui).ok());
  viaLink.DeleteRecord(0);
  ASSERT_TRUE(viaLink.Save(FixedClock(2)).ok());
  struct stat st{};
  ASSERT_EQ(::lstat(dir.File("Link.PDB").c_str(), &st), 0);
  EXPECT_TRUE(S_ISLNK(st.st_mode));
  Database check;
  ASSERT_TRUE(check.Open(dir.File("real/Data.PDB"), ui).ok());
  EXPECT_EQ(check.recordCount(), 2u);
  // And again: the state recorded at the last save is the linked file's.
  viaLink.DeleteRecord(0);
  ASSERT_TRUE(viaLink.Save(FixedClock(3)).ok());
}

TEST_F(SaveGuardTest, ReadOnlyDatabaseIsNotRewritten) {
  Database first = MakeFilled("ro-file.PDB");
  ASSERT_TRUE(first.Save(FixedClock(1)).ok());
  const ByteVector before = ReadBytes(first.path());
  ASSERT_EQ(::chmod(first.path().c_str(), 0444), 0);
  Database db;
  ASSERT_TRUE(db.Open(first.path(), ui).ok());
  db.DeleteRecord(0);
  Status s = db.Save(FixedClock(2));
  ASSERT_FALSE(s.ok());
  EXPECT_NE(s.message().find(first.path()), std::string::npos) << s.message();
  EXPECT_NE(s.message().find("read-only"), std::string::npos) << s.message();
  EXPECT_EQ(ReadBytes(first.path()), before);
}

}  // namespace
}  // namespace cx
