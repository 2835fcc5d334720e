// A workspace with everything it needs in memory: a scratch data folder, a
// settings store, the preferences and recent files over it, and a scripted
// user. Databases for the tests are written into the data folder.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "app/document.h"
#include "app/preferences.h"
#include "engine/database_folder.h"
#include "platform/file_io.h"
#include "tests/design/design_db.h"
#include "tests/support/test_support.h"

namespace cx::testing {

class AppFixture : public ::testing::Test {
 protected:
  AppFixture()
      : preferences(settings),
        recent(settings),
        context{ui, locale, preferences, recent, dir.path()},
        workspace(context) {}

  // A database file `name`.PDB in the data folder with the fields of the
  // "Name" (Text) / "Age" (Integer) kind given, and records of values.
  std::string WriteDatabase(const std::string& name, const std::vector<FieldLine>& fields,
                            const std::vector<std::vector<std::string>>& records) {
    const std::string path = DatabasePath(dir.path(), name + ".PDB");
    Database db = MakeDatabase(path, fields, name);
    for (const auto& r : records) AddRecord(db, r);
    EXPECT_TRUE(db.Save().ok());
    return path;
  }
  std::string WritePeople(const std::string& name = "People") {
    return WriteDatabase(name, {{"Name", FieldType::Text}, {"Age", FieldType::Integer}},
                         {{"Carla", "31"}, {"Anna", "52"}, {"Bert", "19"}});
  }
  static std::string Sample(const std::string& name) {
    return std::string(CARDOVEX_SAMPLE_DIR) + "/" + name + ".PDB";
  }

  // The question texts asked so far, in order.
  std::vector<std::string> QuestionTexts() const {
    std::vector<std::string> texts;
    for (const auto& q : ui.questions) texts.push_back(q.text);
    return texts;
  }

  TempDir dir;
  MemorySettings settings;
  Preferences preferences;
  RecentFiles recent;
  ScriptedUi ui;
  LocaleInfo locale;
  AppContext context;
  Workspace workspace;
};

}  // namespace cx::testing
