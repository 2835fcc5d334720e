// Preferences and the recent-files list over a settings store.
#include <gtest/gtest.h>

#include <fstream>

#include "app/preferences.h"
#include "tests/app/app_fixture.h"

namespace cx::testing {
namespace {

// Remembers every write, in order.
class RecordingSettings : public MemorySettings {
 public:
  void Set(const std::string& name, const std::string& value) override {
    writes.push_back(name + "=" + value);
    MemorySettings::Set(name, value);
  }
  std::vector<std::string> writes;
};

TEST(PreferencesTest, FirstStartDefaultsAndOneWriteInDialogOrder) {
  RecordingSettings settings;
  Preferences preferences(settings);
  preferences.Read();
  EXPECT_TRUE(preferences.autoSave());
  EXPECT_TRUE(preferences.autoSip());
  EXPECT_TRUE(preferences.allowChecks());
  EXPECT_FALSE(preferences.allowPopups());
  EXPECT_FALSE(preferences.allowDateTime());
  EXPECT_FALSE(preferences.lastFileUsed());
  EXPECT_TRUE(settings.writes.empty());

  preferences.flags.allowPopups = true;
  preferences.Write();
  EXPECT_EQ(settings.writes, (std::vector<std::string>{"AutoSave=1", "AutoSIP=1", "AllowChecks=1",
                                                       "AllowPopups=1", "AllowDateTime=0"}));
}

TEST(PreferencesTest, StoredValuesAndUnreadableOnes) {
  MemorySettings settings;
  settings.Set("AutoSave", "0");
  settings.Set("AllowDateTime", "1");
  settings.Set("AutoSIP", std::string(25, '0'));  // too long to be read: the default stays
  settings.Set("LastFileUsed", "NONE");
  Preferences preferences(settings);
  preferences.Read();
  EXPECT_FALSE(preferences.autoSave());
  EXPECT_TRUE(preferences.allowDateTime());
  EXPECT_TRUE(preferences.autoSip());
  EXPECT_FALSE(preferences.lastFileUsed());

  preferences.WriteLastFileUsed("");
  EXPECT_EQ(settings.Get("LastFileUsed"), std::string("NONE"));
  preferences.WriteLastFileUsed("/data/A.PDB");
  EXPECT_EQ(preferences.lastFileUsed(), std::string("/data/A.PDB"));
}

class RecentFilesTest : public AppFixture {
 protected:
  void Fill(int count) {
    for (int n = count - 1; n >= 0; --n) recent.Add("/f/" + std::to_string(n) + ".PDB");
  }
  std::vector<std::string> All() const {
    std::vector<std::string> all;
    for (int n = 0; n < RecentFiles::kCount; ++n) all.push_back(recent.Entry(n));
    return all;
  }
};

TEST_F(RecentFilesTest, AListedPathMovesUpAndTheOthersShiftDown) {
  Fill(10);  // slot n holds /f/n.PDB
  std::vector<std::string> before = All();
  recent.Add("/F/4.pdb");  // the same file, in other letter case
  std::vector<std::string> after = All();
  EXPECT_EQ(after[0], "/F/4.pdb");
  for (int n = 1; n <= 4; ++n) EXPECT_EQ(after[n], before[n - 1]) << n;
  for (int n = 5; n < 10; ++n) EXPECT_EQ(after[n], before[n]) << n;
}

TEST_F(RecentFilesTest, TheEleventhDropsTheOldest) {
  Fill(10);
  recent.Add("/f/new.PDB");
  EXPECT_EQ(recent.Entry(0), "/f/new.PDB");
  EXPECT_EQ(recent.Entry(1), "/f/0.PDB");
  EXPECT_EQ(recent.Entry(9), "/f/8.PDB");
  for (const auto& p : All()) EXPECT_NE(p, "/f/9.PDB");
}

TEST_F(RecentFilesTest, StartListAndReopenEntriesWithAMissingFile) {
  const std::string a = WritePeople("Alpha");
  const std::string b = WritePeople("Beta");
  recent.Add(b);
  recent.Add(a);
  recent.Add(dir.File("Gone.PDB"));  // slot 0: a file that no longer exists

  EXPECT_EQ(recent.StartList(), (std::vector<std::string>{"More files...", "Alpha", "Beta"}));
  // The list maps by position: its entry 1 stands for slot 0 even though
  // that file was skipped.
  EXPECT_EQ(recent.StartChoice(0), std::nullopt);
  EXPECT_EQ(recent.StartChoice(1), dir.File("Gone.PDB"));
  EXPECT_EQ(recent.StartChoice(2), a);

  const auto entries = recent.ReopenEntries();
  ASSERT_EQ(entries.size(), 2u);
  EXPECT_EQ(entries[0].n, 1);
  EXPECT_EQ(entries[0].name, "Alpha");
  EXPECT_EQ(entries[1].n, 2);
  EXPECT_EQ(entries[1].path, b);
}

TEST_F(RecentFilesTest, StartListStopsAtTheFirstMissingValue) {
  const std::string a = WritePeople("Alpha");
  settings.Set("LastFile0", a);
  settings.Set("LastFile2", a);
  EXPECT_EQ(recent.StartList(), (std::vector<std::string>{"More files...", "Alpha"}));
}

}  // namespace
}  // namespace cx::testing
