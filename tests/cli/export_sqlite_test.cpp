// export-sqlite read back by the sqlite3 program, as a user's script would.
#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <sstream>

#include "cli/global_options.h"
#include "engine/record.h"
#include "engine/record_store.h"
#include "platform/file_io.h"
#include "tests/cli/run_in_process.h"
#include "tests/support/test_support.h"

namespace cx::cli {
namespace {

Result Cli(std::vector<std::string> args) { return RunInProcess(std::move(args)); }

// The rows sqlite3 prints for `sql`, "|" between columns.
std::string Sql(const testing::TempDir& dir, const std::string& db, const std::string& sql) {
  const std::string script = dir.File("query.sql");
  std::ofstream(script) << sql << "\n";
  const std::string command = "sqlite3 -batch -noheader -separator '|' '" + db + "' < '" + script + "' 2>&1";
  std::string text;
  if (FILE* pipe = ::popen(command.c_str(), "r")) {
    char buffer[4096];
    for (size_t n; (n = std::fread(buffer, 1, sizeof buffer, pipe)) > 0;) text.append(buffer, n);
    ::pclose(pipe);
  }
  return text;
}

std::string Sample(const std::string& name) { return std::string(CARDOVEX_SAMPLES) + "/" + name + ".PDB"; }

class ExportSqlite : public ::testing::Test {
 protected:
  void SetUp() override {
    out_ = dir_.File("all.sqlite");
    Result r = Cli({"--password", "secret", "export-sqlite", Sample("Contacts"), Sample("Orders"),
                    Sample("Vault"), out_});
    ASSERT_EQ(r.code, 0) << r.err;
  }
  std::string Q(const std::string& sql) { return Sql(dir_, out_, sql); }

  testing::TempDir dir_;
  std::string out_;
};

TEST_F(ExportSqlite, EveryRecordOfEveryDatabaseArrives) {
  for (const char* name : {"Contacts", "Orders", "Vault"}) {
    Database db;
    SilentUi ui;
    ASSERT_TRUE(db.Open(Sample(name), ui).ok());
    EXPECT_EQ(Q(std::string("SELECT count(*) FROM \"") + name + "\";"), std::to_string(db.recordCount()) + "\n")
        << name;
  }
  EXPECT_EQ(Q("SELECT count(*) FROM cardovexSchema WHERE tableName = 'Contacts';"), "10\n");
  EXPECT_EQ(Q("SELECT group_concat(item, ',') FROM cardovexPopups WHERE tableName = 'Contacts';"),
            "Family,Friends,Work,Club\n");
}

TEST_F(ExportSqlite, ValuesHaveNaturalTypes) {
  // Text outside ASCII, a date, a pop-up's text, a check box, a Unique and a time.
  EXPECT_EQ(Q("SELECT Name, Birthday, Category, Favorite, \"Contact#\", \"Call at\", typeof(\"Contact#\") "
              "FROM Contacts WHERE rowid = 1;"),
            "Ana Müller|1985-03-14|Family|1|1|18:30:00|integer\n");
  // "NO DATE", "No Time" and a missing picture are NULL.
  EXPECT_EQ(Q("SELECT typeof(Birthday), typeof(\"Call at\"), typeof(Photo) FROM Contacts "
              "WHERE Name LIKE 'Chlo%';"),
            "null|null|null\n");
  // A Float, decimal and date results of calculations, a time result in seconds.
  EXPECT_EQ(Q("SELECT Price, typeof(Price), Total, typeof(Total), Due, \"Packed in\", typeof(Quantity) "
              "FROM Orders WHERE \"Order#\" = 1;"),
            "18.5|real|37.0|real|2024-02-04|180|integer\n");
  EXPECT_EQ(Q("SELECT fieldType, sqlType FROM cardovexSchema WHERE tableName = 'Orders' AND "
              "columnName = 'Due';"),
            "Calculated|TEXT\n");
}

TEST_F(ExportSqlite, LinksJoinAcrossTables) {
  EXPECT_EQ(Q("SELECT refTable, refColumn FROM cardovexSchema WHERE tableName = 'Contacts' AND "
              "columnName = 'Orders';"),
            "Orders|Customer\n");
  EXPECT_EQ(Q("SELECT c.Name, count(*) FROM Contacts c JOIN Orders o ON o.Customer = c.Orders "
              "GROUP BY c.Name ORDER BY c.Name;"),
            "Ana Müller|3\nBob O'Neil|1\nChloé Dubois|1\n");
  // Every order has its contact, and contacts' link values are distinct, so
  // SQLite is told of the reference and holds to it.
  EXPECT_EQ(Q("SELECT \"table\", \"from\", \"to\" FROM pragma_foreign_key_list('Orders');"),
            "Contacts|Customer|Orders\n");
  EXPECT_EQ(Q("PRAGMA foreign_key_check;"), "");
  EXPECT_NE(Q("PRAGMA foreign_keys = ON; INSERT INTO Orders (Customer) VALUES (99);")
                .find("FOREIGN KEY constraint failed"),
            std::string::npos);
}

TEST(ExportSqliteLinks, AReferenceTheDataDoNotBearIsOnlyNamed) {
  testing::TempDir dir;
  std::vector<uint8_t> contacts;
  ASSERT_TRUE(ReadWholeFile(Sample("Contacts"), contacts));
  ASSERT_TRUE(WriteFileSafely(dir.File("Contacts.PDB"), contacts.data(), contacts.size()).ok());
  const std::string orders = dir.File("Orders.PDB"), csv = dir.File("orders.csv");
  ASSERT_EQ(Cli({"new", orders, "--name", "Orders", "--field", "Item:Text", "--field", "Note:Text",
                 "--field", "Customer:Integer"})
                .code,
            0);
  std::ofstream(csv) << "Tea,,1\nCups,,99\n";
  ASSERT_EQ(Cli({"import-csv", orders, csv}).code, 0);
  const std::string out = dir.File("out.sqlite");
  Result r = Cli({"export-sqlite", dir.File("Contacts.PDB"), orders, out});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(Sql(dir, out, "SELECT count(*) FROM pragma_foreign_key_list('Orders');"), "0\n");
  EXPECT_EQ(Sql(dir, out, "SELECT refTable || '.' || refColumn FROM cardovexSchema WHERE columnName = 'Orders';"),
            "Orders.Customer\n");
  EXPECT_EQ(Sql(dir, out, "SELECT o.Item FROM Contacts c JOIN Orders o ON o.Customer = c.Orders;"), "Tea\n");
}

TEST(ExportSqliteNames, CollisionsGetFreeNamesAndInputsAreProtected) {
  testing::TempDir dir;
  const std::string a = dir.File("A.PDB"), b = dir.File("B.PDB"), out = dir.File("out.sqlite");
  ASSERT_EQ(Cli({"new", a, "--name", "sqlite_master", "--field", "X:Text", "--field", "x:Integer"}).code, 0);
  ASSERT_EQ(Cli({"new", b, "--name", "sqlite_master", "--field", "Y:Float"}).code, 0);

  const Bytes before = [&] {
    Bytes bytes;
    ReadWholeFile(a, bytes);
    return bytes;
  }();
  Result swapped = Cli({"export-sqlite", b, a});
  EXPECT_EQ(swapped.code, 1);
  EXPECT_NE(swapped.err.find("--force"), std::string::npos) << swapped.err;
  Bytes after;
  ReadWholeFile(a, after);
  EXPECT_EQ(after, before);

  std::ofstream(out) << "not a database";
  Result r = Cli({"export-sqlite", a, b, out});
  ASSERT_EQ(r.code, 0) << r.err;
  EXPECT_EQ(Sql(dir, out, "SELECT tableName || '.' || columnName FROM cardovexSchema ORDER BY 1;"),
            "db sqlite_master (2).Y\ndb sqlite_master.X\ndb sqlite_master.x (2)\n");

  // Headings alone give no column, yet every record is a row.
  const std::string heads = dir.File("Heads.PDB");
  ASSERT_EQ(Cli({"new", heads, "--name", "Heads", "--field", "Top:Heading"}).code, 0);
  {
    Database db;
    SilentUi ui;
    ASSERT_TRUE(db.Open(heads, ui).ok());
    for (int i = 0; i < 2; ++i) db.AppendRecord(Compact(NewEditingRecord(db.schema()), db.schema()));
    ASSERT_TRUE(db.Save().ok());
  }
  ASSERT_EQ(Cli({"export-sqlite", heads, out}).code, 0);
  EXPECT_EQ(Sql(dir, out, "SELECT count(*) FROM Heads;"), "2\n");

  EXPECT_EQ(Cli({"export-sqlite", a, "-"}).code, 2);
  EXPECT_EQ(Cli({"export-sqlite", out}).code, 2);
}

}  // namespace
}  // namespace cx::cli
