// export-sqlite FILE... OUT: databases as tables of one SQLite file, for
// users who take their data to tools that speak SQL.
#include <sqlite3.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <map>
#include <memory>
#include <optional>
#include <ostream>
#include <set>
#include <variant>

#include "cli/command.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "engine/dates.h"
#include "engine/field_types.h"
#include "engine/format.h"
#include "engine/record.h"
#include "engine/value_text.h"
#include "ops/text_sink.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

// One value on its way into SQLite: NULL, INTEGER, REAL, TEXT or BLOB.
struct Blob {
  ByteView bytes;
};
using SqlValue = std::variant<std::monostate, int64_t, double, std::string, Blob>;

// A Calculated field's stored text is read by its result format.
enum CalcFormat { kFourPlaces = 0, kInteger = 1, kTime = 2, kDate = 3, kThreePlaces = 4, kOnePlace = 6 };

bool DecimalFormat(uint8_t f) { return f == kFourPlaces || (f >= kThreePlaces && f <= kOnePlace); }

const char* SqlType(const FieldDef& field) {
  switch (field.type()) {
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Linked:
    case FieldType::CheckBox:
      return "INTEGER";
    case FieldType::Float:
      return "REAL";
    case FieldType::Image:
      return "BLOB";
    case FieldType::Calculated:
      if (DecimalFormat(field.resultFormat())) return "REAL";
      if (field.resultFormat() == kInteger || field.resultFormat() == kTime) return "INTEGER";
      return "TEXT";
    default:
      return "TEXT";
  }
}

// Headings hold nothing and Not-Used slots are not fields.
bool HasColumn(const FieldDef& field) {
  return field.type() != FieldType::NotUsed && field.type() != FieldType::Heading;
}

std::string IsoDate(uint32_t dayNumber) {
  const CalendarDate d = DayNumberToDate(dayNumber);
  char text[32];
  std::snprintf(text, sizeof text, "%04d-%02d-%02d", static_cast<int>(d.year), static_cast<int>(d.month),
                static_cast<int>(d.day));
  return text;
}

// "NO DATE" is stored as day 0 and shown for anything up to 1 January 1904.
bool NoDate(uint32_t dayNumber) {
  const CalendarDate d = DayNumberToDate(dayNumber);
  return d.month <= 1 && d.day <= 1 && d.year <= 1904;
}

// A decimal number typed under either convention ("2.50" or "2,50");
// anything else keeps its text, so no value is lost on the way.
SqlValue DecimalValue(const std::string& stored) {
  if (stored.empty()) return std::monostate{};
  std::string text = stored;
  std::replace(text.begin(), text.end(), ',', '.');
  errno = 0;
  char* end = nullptr;
  const double v = std::strtod(text.c_str(), &end);
  if (errno == 0 && end != text.c_str() && *end == '\0') return v;
  return Cp1252ToUtf8(stored);
}

// Leading digits, as the program reads a whole-number result.
SqlValue WholeValue(const std::string& stored) {
  if (stored.empty()) return std::monostate{};
  return static_cast<int64_t>(static_cast<int32_t>(std::strtol(stored.c_str(), nullptr, 10)));
}

SqlValue ValueOf(const Database& db, int slot, std::optional<ByteView> value) {
  if (!value) return std::monostate{};
  const FieldDef& field = db.schema().field[slot];
  switch (field.type()) {
    case FieldType::Text:
    case FieldType::Note:
    case FieldType::DBPopup:
      return Cp1252ToUtf8(ValueString(*value));
    case FieldType::Float:
      return DecimalValue(ValueString(*value));
    case FieldType::Integer:
    case FieldType::Unique:
    case FieldType::Link:
    case FieldType::Linked:
      return static_cast<int64_t>(static_cast<int32_t>(ValueNumber(*value)));
    case FieldType::CheckBox:
      return static_cast<int64_t>(!value->empty() && (*value)[0] != 0);
    case FieldType::PopUp: {
      const int item = value->empty() ? format::kNoPopupValue : (*value)[0];
      const auto& items = db.popups()[slot].items;
      if (item == format::kNoPopupValue || static_cast<size_t>(item) >= items.size()) return std::monostate{};
      return Cp1252ToUtf8(PopupText(db.popups()[slot], item));
    }
    case FieldType::Date: {
      const uint32_t day = ValueNumber(*value);
      if (NoDate(day)) return std::monostate{};
      return IsoDate(day);
    }
    case FieldType::Time: {
      uint8_t b[3] = {0, 0, 0};
      for (size_t i = 0; i < value->size() && i < 3; ++i) b[i] = (*value)[i];
      if (b[2] == format::kNoTimeHours) return std::monostate{};
      char text[16];
      std::snprintf(text, sizeof text, "%02d:%02d:%02d", b[2], b[1], b[0]);
      return std::string(text);
    }
    case FieldType::Image:
      if (value->empty() || (*value)[0] == 0) return std::monostate{};
      return Blob{*value};
    case FieldType::Calculated: {
      const std::string stored = ValueString(*value);
      const uint8_t f = field.resultFormat();
      if (DecimalFormat(f)) return DecimalValue(stored);
      if (f == kInteger || f == kTime) return WholeValue(stored);
      if (f == kDate) {
        if (stored.empty()) return std::monostate{};
        const long day = std::strtol(stored.c_str(), nullptr, 10);
        if (day < 0 || NoDate(static_cast<uint32_t>(day))) return std::monostate{};
        return IsoDate(static_cast<uint32_t>(day));
      }
      return stored.empty() ? SqlValue{} : SqlValue{Cp1252ToUtf8(stored)};
    }
    default:
      return std::monostate{};
  }
}

std::string Quoted(const std::string& identifier) {
  std::string out = "\"";
  for (char c : identifier) {
    out.push_back(c);
    if (c == '"') out.push_back('"');
  }
  return out + "\"";
}

// SQLite compares identifiers without regard to ASCII case.
std::string Folded(const std::string& name) {
  std::string out = name;
  for (char& c : out) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return out;
}

// `wanted`, or "wanted (2)", "wanted (3)"... whichever is still free.
std::string FreeName(const std::string& wanted, std::set<std::string>& taken) {
  std::string name = wanted;
  for (int n = 2; taken.count(Folded(name)); ++n) name = wanted + " (" + std::to_string(n) + ")";
  taken.insert(Folded(name));
  return name;
}

std::string FileStem(const std::string& path) {
  std::string name = path.substr(path.find_last_of('/') + 1);
  if (name.size() > 4 && Folded(name.substr(name.size() - 4)) == ".pdb") name.resize(name.size() - 4);
  return name;
}

struct Column {
  int slot;
  std::string name;
};

struct Table {
  std::string path;
  std::unique_ptr<Database> db;
  std::string name;
  std::vector<Column> columns;
};

class Writer {
 public:
  ~Writer() { sqlite3_close(db_); }

  bool Open() { return sqlite3_open(":memory:", &db_) == SQLITE_OK; }
  sqlite3* handle() const { return db_; }
  std::string error() const { return db_ ? sqlite3_errmsg(db_) : "out of memory"; }

  bool Exec(const std::string& sql) { return sqlite3_exec(db_, sql.c_str(), nullptr, nullptr, nullptr) == SQLITE_OK; }

  // One prepared statement run once per row of values.
  class Insert {
   public:
    Insert(sqlite3* db, const std::string& sql) { sqlite3_prepare_v2(db, sql.c_str(), -1, &stmt_, nullptr); }
    ~Insert() { sqlite3_finalize(stmt_); }
    bool ok() const { return stmt_ != nullptr; }
    bool Run(const std::vector<SqlValue>& values) {
      sqlite3_reset(stmt_);
      for (size_t i = 0; i < values.size(); ++i) {
        const int at = static_cast<int>(i + 1);
        const SqlValue& v = values[i];
        int rc = SQLITE_OK;
        if (const auto* n = std::get_if<int64_t>(&v)) {
          rc = sqlite3_bind_int64(stmt_, at, *n);
        } else if (const auto* d = std::get_if<double>(&v)) {
          rc = sqlite3_bind_double(stmt_, at, *d);
        } else if (const auto* s = std::get_if<std::string>(&v)) {
          rc = sqlite3_bind_text(stmt_, at, s->data(), static_cast<int>(s->size()), SQLITE_TRANSIENT);
        } else if (const auto* b = std::get_if<Blob>(&v)) {
          rc = sqlite3_bind_blob(stmt_, at, b->bytes.data(), static_cast<int>(b->bytes.size()),
                                 SQLITE_TRANSIENT);
        } else {
          rc = sqlite3_bind_null(stmt_, at);
        }
        if (rc != SQLITE_OK) return false;
      }
      return sqlite3_step(stmt_) == SQLITE_DONE;
    }

   private:
    sqlite3_stmt* stmt_ = nullptr;
  };

 private:
  sqlite3* db_ = nullptr;
};

std::string InsertSql(const std::string& table, size_t count) {
  std::string sql = "INSERT INTO " + Quoted(table) + " VALUES (";
  for (size_t i = 0; i < count; ++i) sql += i ? ",?" : "?";
  return sql + ")";
}

class ExportSqliteCommand : public Command {
 public:
  std::string name() const override { return "export-sqlite"; }
  std::string summary() const override { return "write databases as tables of one SQLite file"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FILE", kOneOrMore)
        .Positional("OUT")
        .About("Writes every record of each FILE into a table of the SQLite database OUT,\n"
               "named after the database, in table order (rowid 1 is record 0). Each used\n"
               "field but a Heading is a column, in display order, named after the field:\n"
               "  Integer, Unique, Link, Linked   INTEGER\n"
               "  Float                           REAL\n"
               "  Check-Box                       INTEGER 0 or 1\n"
               "  Text, Note, DB Popup            TEXT as stored\n"
               "  Pop-Up                          TEXT, the entry's text\n"
               "  Date                            TEXT YYYY-MM-DD\n"
               "  Time                            TEXT HH:MM:SS\n"
               "  Image                           BLOB, the picture's bytes\n"
               "  Calculated                      REAL (decimal results), INTEGER (whole\n"
               "                                  numbers; a time as seconds), TEXT\n"
               "                                  YYYY-MM-DD (a date)\n"
               "No value (\"No Value\", \"NO DATE\", \"No Time\", no picture, an empty\n"
               "number) is NULL; a number that does not read as one keeps its text.\n"
               "Two more tables describe the data: cardovexSchema, one row per column\n"
               "(tableName, columnName, position, sourceFile, databaseName, slot,\n"
               "fieldName, fieldType, sqlType, refTable, refColumn) and cardovexPopups\n"
               "(tableName, columnName, slot, position, item) with each Pop-Up list.\n"
               "A Link, Linked or DB Popup column's refTable and refColumn name the table\n"
               "and column it refers to when that database is exported too: a Link's\n"
               "linked records are those whose refColumn equals its value, e.g.\n"
               "  SELECT * FROM Contacts JOIN Orders ON Orders.Customer = Contacts.Orders\n"
               "Where the Link's values are distinct and every linked record has its\n"
               "parent, the column is also declared as a foreign key (REFERENCES) to it.\n"
               "OUT is replaced only once it is complete.\n")
        .Flag("--force", "write OUT even when it is a database or one of the FILEs")
        .Notes("With --json: {\"tables\": [{\"table\", \"file\", \"records\", \"columns\"}]}.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    const std::string out = p.back();
    const std::vector<std::string> files(p.begin(), p.end() - 1);
    if (out == "-") return UsageError(ctx, *this, "OUT must be a file: an SQLite database is not text");
    if (!args.has("--force")) {
      if (Status s = CheckTextTarget(out, files); !s) {
        return Failure(ctx, s.message() + " (--force writes it anyway)");
      }
    }
    if (!LockDatabases(ctx, files, FileLock::Kind::kShared)) return kExitFailed;

    std::vector<Table> tables;
    std::set<std::string> taken = {"cardovexschema", "cardovexpopups"};
    for (const std::string& path : files) {
      Table t;
      t.path = path;
      t.db = std::make_unique<Database>();
      if (!OpenForReading(ctx, path, *t.db)) return kExitFailed;
      std::string wanted = Cp1252ToUtf8(t.db->Name());
      if (wanted.empty()) wanted = FileStem(path);
      // SQLite keeps names beginning "sqlite_" for itself.
      if (Folded(wanted).rfind("sqlite_", 0) == 0) wanted = "db " + wanted;
      t.name = FreeName(wanted, taken);
      std::set<std::string> columnsTaken;
      for (uint8_t slot : t.db->schema().fieldOrder) {
        const FieldDef& field = t.db->schema().field[slot];
        if (!HasColumn(field)) continue;
        std::string name = Cp1252ToUtf8(field.name.str());
        if (name.empty()) name = "Field " + std::to_string(slot + 1);
        t.columns.push_back({slot, FreeName(name, columnsTaken)});
      }
      tables.push_back(std::move(t));
    }

    Writer w;
    if (!w.Open()) return Failure(ctx, "SQLite could not start: " + w.error());
    std::string problem;
    if (!Fill(w, tables, problem)) return Failure(ctx, "Could not write " + out + ": " + problem);

    sqlite3_int64 size = 0;
    unsigned char* image = sqlite3_serialize(w.handle(), "main", &size, 0);
    if (!image) return Failure(ctx, "Could not write " + out + ": out of memory");
    const Status saved = WriteFileSafely(out, image, static_cast<size_t>(size));
    sqlite3_free(image);
    if (!saved) return Failure(ctx, saved.message());

    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginObject();
      j.Key("tables").BeginArray();
      for (const Table& t : tables) {
        j.BeginObject();
        j.Key("table").String(t.name);
        j.Key("file").String(t.path);
        j.Key("records").Number(static_cast<int64_t>(t.db->recordCount()));
        j.Key("columns").Number(static_cast<int64_t>(t.columns.size()));
        j.EndObject();
      }
      j.EndArray();
      j.EndObject();
      j.Finish();
    } else {
      for (const Table& t : tables) {
        ctx.out << t.name << ": " << t.db->recordCount() << (t.db->recordCount() == 1 ? " record" : " records")
                << "\n";
      }
    }
    return kExitOk;
  }

 private:
  // The table (and column) another database's field stands for, when that
  // database is among the ones written: the program finds it as
  // "<name>.PDB" beside the database that names it.
  static const Table* TableFor(const std::vector<Table>& tables, const std::string& databaseName) {
    for (const Table& t : tables) {
      if (FileStem(t.path) == databaseName) return &t;
    }
    for (const Table& t : tables) {
      if (t.db->Name() == databaseName) return &t;
    }
    return nullptr;
  }

  // A child column that SQLite may be told refers to a parent's Link
  // column, keyed by the child's table and slot.
  struct Reference {
    const Table* parent;
    std::string column;
  };
  using References = std::map<std::pair<const Table*, int>, Reference>;

  // Link values need not be unique, nor need every linked record have its
  // parent; a foreign key stated where they are not would make SQLite
  // refuse every change once its checks are on. So the reference is stated
  // only where the data bear it out (cardovexSchema names it either way).
  static References DeclarableReferences(const std::vector<Table>& tables) {
    References found;
    auto number = [](const SqlValue& v) { return std::get_if<int64_t>(&v); };
    for (const Table& parent : tables) {
      for (const Column& link : parent.columns) {
        const FieldDef& field = parent.db->schema().field[link.slot];
        if (field.type() != FieldType::Link) continue;
        const Table* child = TableFor(tables, field.text.str());
        if (!child || !std::any_of(child->columns.begin(), child->columns.end(),
                                   [&](const Column& c) { return c.slot == field.otherField; })) {
          continue;
        }
        std::set<int64_t> keys;
        bool usable = true;
        for (size_t r = 0; usable && r < parent.db->recordCount(); ++r) {
          const SqlValue v = ValueOf(*parent.db, link.slot, FieldValue(parent.db->record(r), link.slot));
          if (std::holds_alternative<std::monostate>(v)) continue;
          usable = number(v) && keys.insert(*number(v)).second;
        }
        for (size_t r = 0; usable && r < child->db->recordCount(); ++r) {
          const SqlValue v =
              ValueOf(*child->db, field.otherField, FieldValue(child->db->record(r), field.otherField));
          if (std::holds_alternative<std::monostate>(v)) continue;
          usable = number(v) && keys.count(*number(v));
        }
        if (usable) found.emplace(std::make_pair(child, int(field.otherField)), Reference{&parent, link.name});
      }
    }
    return found;
  }

  static bool Fill(Writer& w, const std::vector<Table>& tables, std::string& problem) {
    auto fail = [&] {
      problem = w.error();
      return false;
    };
    const References references = DeclarableReferences(tables);
    if (!w.Exec("BEGIN")) return fail();
    if (!w.Exec("CREATE TABLE cardovexSchema (tableName TEXT NOT NULL, columnName TEXT NOT NULL, "
                "position INTEGER NOT NULL, sourceFile TEXT NOT NULL, databaseName TEXT NOT NULL, "
                "slot INTEGER NOT NULL, fieldName TEXT NOT NULL, fieldType TEXT NOT NULL, "
                "sqlType TEXT NOT NULL, refTable TEXT, refColumn TEXT, "
                "PRIMARY KEY (tableName, columnName))") ||
        !w.Exec("CREATE TABLE cardovexPopups (tableName TEXT NOT NULL, columnName TEXT NOT NULL, "
                "slot INTEGER NOT NULL, position INTEGER NOT NULL, item TEXT NOT NULL, "
                "PRIMARY KEY (tableName, columnName, position))")) {
      return fail();
    }
    Writer::Insert schemaRow(w.handle(), InsertSql("cardovexSchema", 11));
    Writer::Insert popupRow(w.handle(), InsertSql("cardovexPopups", 5));
    if (!schemaRow.ok() || !popupRow.ok()) return fail();

    for (const Table& t : tables) {
      const Schema& schema = t.db->schema();
      std::string create = "CREATE TABLE " + Quoted(t.name) + " (";
      for (size_t c = 0; c < t.columns.size(); ++c) {
        create += (c ? ", " : "") + Quoted(t.columns[c].name) + " " + SqlType(schema.field[t.columns[c].slot]);
        if (auto ref = references.find({&t, t.columns[c].slot}); ref != references.end()) {
          create += " REFERENCES " + Quoted(ref->second.parent->name) + " (" + Quoted(ref->second.column) + ")";
        }
      }
      if (t.columns.empty()) create += "\"rowid\" INTEGER PRIMARY KEY";
      if (!w.Exec(create + ")")) return fail();

      for (size_t c = 0; c < t.columns.size(); ++c) {
        const int slot = t.columns[c].slot;
        const FieldDef& field = schema.field[slot];
        SqlValue refTable, refColumn;
        const FieldType type = field.type();
        if (type == FieldType::Link || type == FieldType::Linked || type == FieldType::DBPopup) {
          if (const Table* other = TableFor(tables, field.text.str())) {
            refTable = other->name;
            for (const Column& oc : other->columns) {
              if (oc.slot == field.otherField) refColumn = oc.name;
            }
          } else {
            refTable = Cp1252ToUtf8(field.text.str());
          }
        }
        const std::vector<SqlValue> row = {t.name,
                                           t.columns[c].name,
                                           static_cast<int64_t>(c),
                                           t.path,
                                           Cp1252ToUtf8(t.db->Name()),
                                           static_cast<int64_t>(slot),
                                           Cp1252ToUtf8(field.name.str()),
                                           std::string(FieldTypeLabel(type)),
                                           std::string(SqlType(field)),
                                           refTable,
                                           refColumn};
        if (!schemaRow.Run(row)) return fail();
        if (type == FieldType::PopUp) {
          const auto& items = t.db->popups()[slot].items;
          for (size_t i = 0; i < items.size(); ++i) {
            if (!popupRow.Run({t.name, t.columns[c].name, static_cast<int64_t>(slot),
                               static_cast<int64_t>(i), Cp1252ToUtf8(items[i])})) {
              return fail();
            }
          }
        }
      }

      // A database of headings alone still has its records: one empty row each.
      if (t.columns.empty()) {
        Writer::Insert empty(w.handle(), "INSERT INTO " + Quoted(t.name) + " DEFAULT VALUES");
        if (!empty.ok()) return fail();
        for (size_t r = 0; r < t.db->recordCount(); ++r) {
          if (!empty.Run({})) return fail();
        }
        continue;
      }
      Writer::Insert insert(w.handle(), InsertSql(t.name, t.columns.size()));
      if (!insert.ok()) return fail();
      std::vector<SqlValue> values(t.columns.size());
      for (size_t r = 0; r < t.db->recordCount(); ++r) {
        const auto slots = FieldValues(t.db->record(r));
        for (size_t c = 0; c < t.columns.size(); ++c) {
          values[c] = ValueOf(*t.db, t.columns[c].slot, slots[t.columns[c].slot]);
        }
        if (!insert.Run(values)) return fail();
      }
    }
    // A key that is referred to must be unique for SQLite to accept it.
    std::set<std::pair<const Table*, std::string>> keys;
    for (const auto& [child, ref] : references) keys.emplace(ref.parent, ref.column);
    std::set<std::string> taken = {"cardovexschema", "cardovexpopups"};
    for (const Table& t : tables) taken.insert(Folded(t.name));
    for (const auto& [parent, column] : keys) {
      const std::string index = FreeName(parent->name + " " + column + " key", taken);
      if (!w.Exec("CREATE UNIQUE INDEX " + Quoted(index) + " ON " + Quoted(parent->name) + " (" +
                  Quoted(column) + ")")) {
        return fail();
      }
    }
    if (!w.Exec("COMMIT")) return fail();
    return true;
  }
};

CX_REGISTER_COMMAND(ExportSqliteCommand);

}  // namespace
}  // namespace cx::cli
