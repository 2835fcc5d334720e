// list: the databases of the data folder, as a user would pick one.
#include <algorithm>
#include <ostream>

#include "cli/command.h"
#include "cli/json.h"
#include "engine/database_folder.h"
#include "engine/record_store.h"
#include "ops/field_values.h"
#include "platform/data_folder.h"
#include "platform/file_io.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

bool HasPdbExtension(const std::string& name) {
  return name.size() > 4 && LowerAscii(name.substr(name.size() - 4)) == ".pdb";
}

struct Entry {
  std::string file;
  DatabaseHead head;
  Status read;
};

class ListCommand : public Command {
 public:
  std::string name() const override { return "list"; }
  std::string summary() const override { return "list the databases in the data folder"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--json"})
        .Positional("FOLDER", kOptional)
        .About("Lists the .PDB files of the data folder (or of FOLDER): each database's\n"
               "name, file, number of records and whether a password protects it. A file\n"
               "that cannot be read as a database is listed with the reason. The data\n"
               "folder is ~/Documents/Cardovex, or the folder named by CARDOVEX_DATA_DIR;\n"
               "any command's FILE without a folder is also looked for there, with or\n"
               "without \".PDB\", when it is not a file where the command runs.\n"
               "With --json: {\"folder\": ..., \"databases\": [{\"name\", \"file\",\n"
               "\"records\", \"protected\"}]} (an unreadable file has \"error\" instead of\n"
               "\"name\", \"records\" and \"protected\").\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const std::string folder = args.positional().empty() ? DataFolder() : args.positional()[0];
    std::optional<FileState> state = StatFile(folder);
    if (!state) return Failure(ctx, "there is no folder " + folder);

    std::vector<std::string> names = ListFiles(folder);
    names.erase(std::remove_if(names.begin(), names.end(), [](const auto& n) { return !HasPdbExtension(n); }),
                names.end());
    std::sort(names.begin(), names.end());
    std::vector<Entry> entries;
    for (const std::string& name : names) {
      Entry e{name, {}, Status::Ok()};
      e.read = ReadDatabaseHead(DatabasePath(folder, name), e.head);
      entries.push_back(std::move(e));
    }
    if (ctx.json) {
      WriteJson(ctx, folder, entries);
    } else {
      WriteTable(ctx, entries);
    }
    return kExitOk;
  }

 private:
  static void WriteJson(Context& ctx, const std::string& folder, const std::vector<Entry>& entries) {
    JsonWriter j(ctx.out);
    j.BeginObject().Key("folder").String(folder).Key("databases").BeginArray();
    for (const Entry& e : entries) {
      j.BeginObject().Key("file").String(e.file);
      if (e.read) {
        j.Key("name").String(Cp1252ToUtf8(e.head.header.Name()));
        j.Key("records").Number(static_cast<int64_t>(e.head.dataRecords));
        j.Key("protected").Bool(!e.head.schema.password.empty());
      } else {
        j.Key("error").String(Cp1252ToUtf8(e.read.message()));
      }
      j.EndObject();
    }
    j.EndArray().EndObject();
    j.Finish();
  }

  static void WriteTable(Context& ctx, const std::vector<Entry>& entries) {
    ctx.out << "Name\tFile\tRecords\tProtected\n";
    for (const Entry& e : entries) {
      if (!e.read) {
        std::string why = Cp1252ToUtf8(e.read.message());
        std::replace(why.begin(), why.end(), '\n', ' ');
        ctx.out << "?\t" << e.file << "\t?\t" << why << "\n";
        continue;
      }
      ctx.out << Cp1252ToUtf8(e.head.header.Name()) << "\t" << e.file << "\t" << e.head.dataRecords << "\t"
              << (e.head.schema.password.empty() ? "no" : "yes") << "\n";
    }
  }
};

CX_REGISTER_COMMAND(ListCommand);

}  // namespace
}  // namespace cx::cli
