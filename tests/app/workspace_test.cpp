// The file commands and the save decision, driven through a scripted user.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "app/document.h"
#include "tests/app/app_fixture.h"

namespace cx::testing {
namespace {

constexpr const char* kNeverSaved = "Database (%s) has never been saved. Save Changes?";
constexpr const char* kChanged = "File (%s) has changed.  Save Changes?";

std::string With(const char* pattern, const std::string& name) {
  std::string s = pattern;
  s.replace(s.find("%s"), 2, name);
  return s;
}

// What the main window hears.
struct Events : WorkspaceListener {
  void LevelPushed(int level, Document&) override { log.push_back("pushed " + std::to_string(level)); }
  void LevelPopped(int level, Document&) override { log.push_back("popped " + std::to_string(level)); }
  void DocumentOpened(Document& d) override { log.push_back("opened " + d.name()); }
  void DocumentClosed() override { log.push_back("closed"); }
  void DocumentReplaced(Document& d) override { log.push_back("replaced " + d.name()); }
  std::vector<std::string> log;
};

class WorkspaceTest : public AppFixture {
 protected:
  WorkspaceTest() { workspace.AddListener(&events); }
  ~WorkspaceTest() override { workspace.RemoveListener(&events); }

  Document& OpenChanged(const std::string& path) {
    EXPECT_TRUE(workspace.Open(path));
    Document& doc = *workspace.shown();
    doc.HideField(1);
    EXPECT_TRUE(doc.changed());
    return doc;
  }
  // Reads a database file back as another program would.
  static Database Reread(const std::string& path) {
    Database db;
    SilentUi silent;
    EXPECT_TRUE(db.Open(path, silent).ok());
    return db;
  }

  Events events;
};

TEST_F(WorkspaceTest, AutoSaveKeepsChangesOfASavedDatabaseWithoutAsking) {
  const std::string path = WritePeople();
  OpenChanged(path);
  recent.Add(dir.File("Other.PDB"));
  ASSERT_TRUE(workspace.Close());
  EXPECT_TRUE(ui.questions.empty());
  EXPECT_TRUE(ui.messages.empty());
  EXPECT_EQ(Reread(path).schema().field[1].width, 0);
  EXPECT_EQ(recent.Entry(0), path);
  EXPECT_EQ(workspace.shown(), nullptr);
  EXPECT_EQ(events.log.back(), "closed");
}

TEST_F(WorkspaceTest, NothingToSaveAsksNothing) {
  ASSERT_TRUE(workspace.Open(WritePeople()));
  preferences.flags.autoSave = false;
  EXPECT_TRUE(workspace.Close());
  EXPECT_TRUE(ui.questions.empty());
}

TEST_F(WorkspaceTest, NeverSavedDatabaseWithAutoSave) {
  ASSERT_TRUE(workspace.New());
  Document& doc = *workspace.shown();
  EXPECT_TRUE(doc.neverSaved());
  EXPECT_TRUE(doc.isNewDatabase());
  EXPECT_EQ(doc.name(), "Untitled1");
  doc.MarkChanged();

  // Cancel keeps it open; the question names the database.
  ui.yesNoCancelAnswers = {Answer::Cancel};
  EXPECT_FALSE(workspace.Close());
  ASSERT_EQ(ui.questions.size(), 1u);
  EXPECT_EQ(ui.questions[0].text, With(kNeverSaved, "Untitled1"));
  EXPECT_EQ(ui.questions[0].caption, "QUESTION");
  EXPECT_EQ(workspace.shown(), &doc);

  // Yes, then Cancel in the save dialog: the question comes again; Yes and a
  // name save it there.
  const std::string target = dir.File("Kept.PDB");
  ui.yesNoCancelAnswers = {Answer::Yes, Answer::Yes};
  ui.fileAnswers = {std::nullopt, target};
  EXPECT_TRUE(workspace.Close());
  EXPECT_EQ(ui.questions.size(), 3u);
  ASSERT_EQ(ui.saveRequests.size(), 2u);
  EXPECT_EQ(ui.saveRequests[0].fileName, dir.File("Untitled1.PDB"));
  EXPECT_EQ(ui.saveRequests[0].defaultSuffix, "PDB");
  EXPECT_EQ(ui.saveRequests[0].folder, dir.path());
  EXPECT_TRUE(FileExists(target));
  EXPECT_EQ(recent.Entry(0), target);
}

TEST_F(WorkspaceTest, NoDiscardsANeverSavedDatabase) {
  ASSERT_TRUE(workspace.New());
  workspace.shown()->MarkChanged();
  ui.yesNoCancelAnswers = {Answer::No};
  EXPECT_TRUE(workspace.Close());
  EXPECT_FALSE(FileExists(dir.File("Untitled1.PDB")));
  EXPECT_TRUE(ui.saveRequests.empty());
}

TEST_F(WorkspaceTest, WithoutAutoSaveTheChangedQuestionDecides) {
  preferences.flags.autoSave = false;
  const std::string path = WritePeople();
  const std::string other = WriteDatabase("Other", {{"X", FieldType::Text}}, {{"1"}});
  const auto before = FileBytes(path);
  OpenChanged(path);

  // Cancel: the database stays and no open dialog is shown.
  ui.yesNoCancelAnswers = {Answer::Cancel};
  EXPECT_FALSE(workspace.OpenWithDialog());
  EXPECT_EQ(QuestionTexts(), std::vector<std::string>{With(kChanged, "People")});
  EXPECT_TRUE(ui.openRequests.empty());
  EXPECT_EQ(workspace.shown()->name(), "People");

  // No: nothing is written, and the other database replaces it.
  ui.yesNoCancelAnswers = {Answer::No};
  ui.fileAnswers = {other};
  EXPECT_TRUE(workspace.OpenWithDialog());
  ASSERT_EQ(ui.openRequests.size(), 1u);
  EXPECT_EQ(ui.openRequests[0].title, "Cardovex");
  EXPECT_EQ(ui.openRequests[0].filter, "Cardovex Files (*.pdb)|*.pdb|All Files (*.*)|*.*||");
  EXPECT_EQ(workspace.shown()->name(), "Other");
  EXPECT_EQ(FileBytes(path), before);
  EXPECT_EQ(events.log.back(), "replaced Other");

  // Yes: saved under its own path without a dialog.
  workspace.shown()->HideField(0);
  ui.yesNoCancelAnswers = {Answer::Yes};
  EXPECT_TRUE(workspace.Open(path));
  EXPECT_EQ(Reread(other).schema().field[0].width, 0);
  EXPECT_TRUE(ui.saveRequests.empty());
}

TEST_F(WorkspaceTest, WithoutAutoSaveANeverSavedDatabaseGoesThroughTheDialog) {
  preferences.flags.autoSave = false;
  ASSERT_TRUE(workspace.New());
  workspace.shown()->MarkChanged();
  ui.yesNoCancelAnswers = {Answer::Yes, Answer::No};
  EXPECT_TRUE(workspace.Close());
  EXPECT_EQ(QuestionTexts(), (std::vector<std::string>{With(kChanged, "Untitled1"), With(kChanged, "Untitled1")}));
  EXPECT_EQ(ui.saveRequests.size(), 1u);
  EXPECT_FALSE(FileExists(dir.File("Untitled1.PDB")));
}

TEST_F(WorkspaceTest, CancelledOpenDialogKeepsTheDatabase) {
  const std::string path = WritePeople();
  ASSERT_TRUE(workspace.Open(path));
  EXPECT_FALSE(workspace.OpenWithDialog());
  ASSERT_NE(workspace.shown(), nullptr);
  EXPECT_EQ(ui.openRequests.at(0).folder, dir.path());
}

TEST_F(WorkspaceTest, ShutdownSavesSilentlyAndNeverOverwrites) {
  for (bool autoSave : {true, false}) {
    SCOPED_TRACE(autoSave);
    TempDir folder;
    context.dataFolder = folder.path();
    preferences.flags.autoSave = autoSave;
    // An "Untitled1" from an earlier run, and a database the new one is
    // renamed after: neither may be replaced.
    const std::string untitled = DatabasePath(folder.path(), "Untitled1.PDB");
    const std::string people = DatabasePath(folder.path(), "People.PDB");
    for (const auto& p : {untitled, people}) {
      Database keep = MakeDatabase(p, {{"Kept", FieldType::Text}}, "Keep");
      ASSERT_TRUE(keep.Save().ok());
    }
    const auto untitledBytes = FileBytes(untitled);
    const auto peopleBytes = FileBytes(people);

    ASSERT_TRUE(workspace.New());
    EXPECT_EQ(workspace.shown()->name(), "Untitled2");
    workspace.shown()->MarkChanged();
    workspace.Shutdown();
    EXPECT_TRUE(FileExists(DatabasePath(folder.path(), "Untitled2.PDB")));

    ASSERT_TRUE(workspace.New());
    workspace.shown()->db().header().SetName("People");
    workspace.shown()->MarkChanged();
    workspace.Shutdown();
    EXPECT_TRUE(FileExists(DatabasePath(folder.path(), "People1.PDB")));

    EXPECT_EQ(FileBytes(untitled), untitledBytes);
    EXPECT_EQ(FileBytes(people), peopleBytes);
    EXPECT_TRUE(ui.questions.empty());
  }
}

TEST_F(WorkspaceTest, ShutdownKeepsChangesThatCannotGoToTheirFile) {
  Document& doc = OpenChanged(WritePeople());
  doc.db().SetPath(dir.File("gone/People.PDB"));
  workspace.Shutdown();
  ASSERT_EQ(ui.messages.size(), 2u);
  EXPECT_EQ(ui.messages[0].text, "ERROR:File could not be saved");
  EXPECT_NE(ui.messages[1].text.find(dir.File("People1.PDB")), std::string::npos);
  EXPECT_EQ(Reread(dir.File("People1.PDB")).schema().field[1].width, 0);
}

// Another program rewrites the file while it is open here.
TEST_F(WorkspaceTest, AFileChangedOnDiskIsReplacedOnlyWhenTheUserSaysSo) {
  const std::string path = WritePeople();
  auto otherProgram = [&] {
    WriteDatabase("People", {{"Theirs", FieldType::Text}}, {{"x"}});
    return FileBytes(path);
  };
  Document& doc = OpenChanged(path);
  const auto theirs = otherProgram();

  ui.yesNoAnswers = {false};
  EXPECT_FALSE(workspace.Save());
  ASSERT_EQ(ui.questions.size(), 1u);
  EXPECT_NE(ui.questions[0].text.find(path), std::string::npos);
  EXPECT_TRUE(ui.messages.empty()) << ui.messages[0].text;
  EXPECT_TRUE(doc.changed());
  EXPECT_EQ(workspace.shown(), &doc);
  EXPECT_EQ(FileBytes(path), theirs);

  ui.yesNoAnswers = {true};
  EXPECT_TRUE(workspace.Save());
  EXPECT_FALSE(doc.changed());
  EXPECT_EQ(Reread(path).schema().field[1].width, 0);

  // Once saved, the file is ours again: no question.
  doc.HideField(0);
  ui.questions.clear();
  EXPECT_TRUE(workspace.Save());
  EXPECT_TRUE(ui.questions.empty());

  // Nobody is asked at shutdown: their version stays, ours goes beside it.
  doc.MarkChanged();
  const auto theirsAgain = otherProgram();
  ui.messages.clear();
  workspace.Shutdown();
  EXPECT_TRUE(ui.questions.empty());
  EXPECT_EQ(FileBytes(path), theirsAgain);
  const std::string copy = dir.File("People1.PDB");
  EXPECT_EQ(Reread(copy).schema().field[0].width, 0);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_NE(ui.messages[0].text.find(copy), std::string::npos);
  EXPECT_NE(ui.messages[0].text.find(path), std::string::npos);
}

TEST_F(WorkspaceTest, SaveCommand) {
  ASSERT_TRUE(workspace.New());
  Document& doc = *workspace.shown();
  doc.MarkChanged();

  // A never-saved database whose dialog is cancelled cannot be saved.
  EXPECT_FALSE(workspace.Save());
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "ERROR:File could not be saved");
  EXPECT_EQ(ui.messages[0].caption, "Update");
  EXPECT_TRUE(doc.changed());

  const std::string target = dir.File("Mine.PDB");
  ui.fileAnswers = {target};
  EXPECT_TRUE(workspace.Save());
  EXPECT_EQ(ui.messages.back().text, "File Saved");
  EXPECT_EQ(ui.messages.back().caption, "Update");
  EXPECT_FALSE(doc.changed());
  EXPECT_EQ(doc.path(), target);
  EXPECT_EQ(recent.Entry(0), target);

  // Save As offers the current path.
  ui.fileAnswers = {dir.File("Copy.PDB")};
  EXPECT_TRUE(workspace.SaveAs());
  EXPECT_EQ(ui.saveRequests.back().fileName, target);
  EXPECT_EQ(recent.Entry(0), dir.File("Copy.PDB"));
  EXPECT_EQ(recent.Entry(1), target);
}

TEST_F(WorkspaceTest, OpenRefusesWhatIsNotADatabase) {
  ASSERT_TRUE(workspace.Open(WritePeople()));
  const std::string junk = dir.File("Junk.PDB");
  std::ofstream(junk) << std::string(200, 'x');
  EXPECT_FALSE(workspace.Open(junk));
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "ERROR: File selected is not a Cardovex Database!");
  EXPECT_EQ(ui.messages[0].caption, "Update");
  ASSERT_NE(workspace.shown(), nullptr);
  EXPECT_EQ(workspace.shown()->name(), "People");
}

TEST_F(WorkspaceTest, ProtectedSampleOpensOnlyWithItsPassword) {
  const std::string vault = Sample("Vault");
  ASSERT_TRUE(FileExists(vault));

  // Letter case counts; a cancel then abandons the open quietly.
  ui.passwordAnswers = {{"Secret"}};
  EXPECT_FALSE(workspace.Open(vault));
  EXPECT_EQ(ui.passwordPrompts, 1);
  ASSERT_EQ(ui.messages.size(), 1u);
  EXPECT_EQ(ui.messages[0].text, "Invalid Password");
  EXPECT_EQ(ui.messages[0].caption, "ERROR");
  EXPECT_EQ(workspace.shown(), nullptr);

  // Another try in the same prompt succeeds.
  ui.passwordAnswers = {{"wrong", "secret"}};
  ASSERT_TRUE(workspace.Open(vault));
  EXPECT_EQ(workspace.shown()->name(), "Vault");
  EXPECT_EQ(recent.Entry(0), vault);
}

TEST_F(WorkspaceTest, StartOpensTheFirstFileAndListsTheRest) {
  const std::string a = WritePeople("A");
  const std::string b = WritePeople("B");
  const std::string c = WritePeople("C");
  ASSERT_TRUE(workspace.Start({a, b, c}));
  EXPECT_EQ(workspace.shown()->name(), "A");
  EXPECT_EQ(recent.Entry(0), a);
  EXPECT_EQ(recent.Entry(1), b);
  EXPECT_EQ(recent.Entry(2), c);
  EXPECT_EQ(settings.Get("Version"), std::string(ProgramVersion()));
  EXPECT_TRUE(std::filesystem::is_directory(dir.path()));
}

TEST_F(WorkspaceTest, LastFileUsedAcrossRuns) {
  const std::string path = WritePeople();
  settings.Set("LastFileUsed", path);
  ASSERT_TRUE(workspace.Start({}));
  EXPECT_TRUE(workspace.Exit());
  EXPECT_TRUE(workspace.Exit());
  EXPECT_EQ(settings.Get("LastFileUsed"), path);
  workspace.Shutdown();
  EXPECT_EQ(settings.Get("LastFileUsed"), path);

  // A run that ends with nothing open leaves "NONE"; a missing file is
  // ignored at start.
  ASSERT_TRUE(workspace.Start({}));
  ASSERT_TRUE(workspace.Close());
  EXPECT_TRUE(workspace.Exit());
  EXPECT_EQ(settings.Get("LastFileUsed"), std::string("NONE"));
  settings.Set("LastFileUsed", dir.File("Gone.PDB"));
  EXPECT_FALSE(workspace.Start({}));
}

TEST_F(WorkspaceTest, ExitDiscardsWhatTheUserRefusedToSave) {
  preferences.flags.autoSave = false;
  const std::string path = WritePeople();
  const auto before = FileBytes(path);
  OpenChanged(path);
  ui.yesNoCancelAnswers = {Answer::No};
  ASSERT_TRUE(workspace.Exit());
  workspace.Shutdown();
  EXPECT_EQ(FileBytes(path), before);
  EXPECT_EQ(settings.Get("AutoSave"), std::string("0"));
}

TEST_F(WorkspaceTest, ReopenOfAnEmptyEntryDoesNothing) {
  ASSERT_TRUE(workspace.Open(WritePeople()));
  workspace.shown()->MarkChanged();
  EXPECT_FALSE(workspace.Reopen(5));
  EXPECT_TRUE(ui.questions.empty());
  EXPECT_NE(workspace.shown(), nullptr);
}

// ------------------------------------------------------------ view levels

class LevelTest : public WorkspaceTest {
 protected:
  LinkedDatabase Load(const std::string& path, int field, uint32_t value) {
    auto db = std::make_unique<Database>();
    EXPECT_TRUE(db->Open(path, ui).ok());
    LinkContext link;
    link.restriction = {field, value};
    return LinkedDatabase(std::move(db), link);
  }
  void Filter(Document& doc, int field, const std::string& mustContain) {
    FilterDialogValues values = OpenFilterDialog(doc.db());
    values.filter[0].enabled = true;
    values.filter[0].field = field;
    values.filter[0].mustContain = mustContain;
    doc.ApplyFilterDialog(values);
  }
};

TEST_F(LevelTest, TitleAndStatusAtEachLevel) {
  EXPECT_EQ(workspace.TitleLabel(), "Cardovex");
  EXPECT_EQ(workspace.StatusLabel(), "");
  EXPECT_EQ(workspace.WindowTitle(), "Cardovex");

  ASSERT_TRUE(workspace.Open(WritePeople()));
  EXPECT_EQ(workspace.TitleLabel(), "People (3/3)");
  EXPECT_EQ(workspace.StatusLabel(), "");
  Filter(*workspace.shown(), 0, "er");
  EXPECT_EQ(workspace.TitleLabel(), "People* (1/3)");
  EXPECT_EQ(workspace.StatusLabel(), "Filtered");
  EXPECT_EQ(workspace.WindowTitle(), "People* (1/3) - Cardovex");

  const std::string orders = WriteDatabase("Orders", {{"Item", FieldType::Text}, {"Owner", FieldType::Linked}},
                                           {{"Tea", "1"}, {"Cake", "2"}, {"Jam", "1"}});
  ASSERT_TRUE(workspace.PushLinked(Load(orders, 1, 1), LevelMode::Browse, 2));
  EXPECT_EQ(workspace.level(), 1);
  EXPECT_EQ(workspace.TitleLabel(), "Orders (2/3)");
  EXPECT_EQ(workspace.StatusLabel(), "Linked");
  EXPECT_EQ(workspace.shown()->StatusLabel(), "Linked");
  Filter(*workspace.shown(), 0, "j");
  EXPECT_EQ(workspace.TitleLabel(), "Orders* (1/3)");
  EXPECT_EQ(workspace.StatusLabel(), "Link+Filter");

  ASSERT_TRUE(workspace.PopLevel());
  EXPECT_EQ(workspace.StatusLabel(), "Filtered");
  EXPECT_EQ(events.log, (std::vector<std::string>{"opened People", "pushed 1", "popped 0"}));
  // The changed level was saved on its way out (auto save is on).
  EXPECT_TRUE(LoadFilterSettings(Reread(orders).schema()).filter[0].enabled);
}

TEST_F(LevelTest, PopReturnsToTheRecordTheLinkWasFollowedFrom) {
  const std::string path = WritePeople();
  ASSERT_TRUE(workspace.Open(path));
  workspace.shown()->SetCurrentRecord(2);
  ASSERT_TRUE(workspace.PushLinked(Load(path, -1, 0), LevelMode::Choose, 1));
  // The same file is not loaded twice: the level shares the open database.
  EXPECT_EQ(&workspace.documentAt(1)->db(), &workspace.documentAt(0)->db());
  EXPECT_EQ(workspace.shown()->rowCount(), 3u);
  workspace.shown()->SetCurrentRecord(1);
  ASSERT_TRUE(workspace.Close());
  EXPECT_EQ(workspace.level(), 0);
  EXPECT_EQ(workspace.shown()->currentRecord(), 2u);
  EXPECT_FALSE(workspace.PopLevel());
}

TEST_F(LevelTest, AtMostTwentyLevels) {
  const std::string path = WritePeople();
  ASSERT_TRUE(workspace.Open(path));
  for (int n = 1; n < 20; ++n) ASSERT_TRUE(workspace.PushLinked(Load(path, -1, 0), LevelMode::Browse, 1)) << n;
  EXPECT_EQ(workspace.level(), 19);
  EXPECT_FALSE(workspace.PushLinked(Load(path, -1, 0), LevelMode::Browse, 1));
  EXPECT_EQ(workspace.documentAt(20), nullptr);
  // Opening another database releases every level.
  ASSERT_TRUE(workspace.Open(WritePeople("Other")));
  EXPECT_EQ(workspace.level(), 0);
  EXPECT_EQ(workspace.documentAt(1), nullptr);
}

TEST_F(LevelTest, CancelledDecisionKeepsTheLevel) {
  preferences.flags.autoSave = false;
  const std::string path = WritePeople();
  ASSERT_TRUE(workspace.Open(path));
  const std::string orders = WriteDatabase("Orders", {{"Item", FieldType::Text}}, {{"Tea"}});
  ASSERT_TRUE(workspace.PushLinked(Load(orders, 0, 0), LevelMode::Browse, 1));
  workspace.shown()->MarkChanged();
  ui.yesNoCancelAnswers = {Answer::Cancel};
  EXPECT_FALSE(workspace.PopLevel());
  EXPECT_EQ(workspace.level(), 1);
  EXPECT_EQ(QuestionTexts(), std::vector<std::string>{With(kChanged, "Orders")});
}

}  // namespace
}  // namespace cx::testing
