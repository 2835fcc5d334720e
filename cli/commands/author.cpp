// author FILE [--author TEXT] [--comments TEXT]: the Author Information.
#include <ostream>

#include "cli/argument_text.h"
#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "design/properties.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class AuthorCommand : public Command {
 public:
  std::string name() const override { return "author"; }
  std::string summary() const override { return "show or set the author and comments"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .About("Without options, shows the author and comments (with --json as an object).\n")
        .Option("--author", "TEXT", "at most 39 characters")
        .Option("--comments", "TEXT", "at most 69 characters")
        .Notes("Changes need the \"DB Properties\" access.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    AuthorInfo info;
    if (!args.has("--author") && !args.has("--comments")) {
      DatabaseHead head;
      if (!OpenHeadForCommand(ctx, args.positional()[0], head)) return kExitFailed;
      info = LoadAuthorInfo(head.schema);
    } else {
      Database db;
      if (!OpenForCommand(ctx, args.positional()[0], db)) return kExitFailed;
      info = LoadAuthorInfo(db.schema());
      std::string error;
      if (auto a = args.value("--author"); a && !ToStoredText(*a, "--author", info.author, error)) {
        return UsageError(ctx, *this, error);
      }
      if (auto c = args.value("--comments");
          c && !ToStoredText(*c, "--comments", info.comments, error)) {
        return UsageError(ctx, *this, error);
      }
      if (info.author.size() > 39) return UsageError(ctx, *this, "--author takes at most 39 characters");
      if (info.comments.size() > 69) return UsageError(ctx, *this, "--comments takes at most 69 characters");
      if (!PassAccessCheck(ctx, db, secured::kDBProperties)) return kExitFailed;
      ApplyAuthorInfo(db, info);
      if (!SaveForCommand(ctx, db)) return kExitFailed;
    }
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginObject();
      j.Key("author").String(Cp1252ToUtf8(info.author));
      j.Key("comments").String(Cp1252ToUtf8(info.comments));
      j.EndObject();
      j.Finish();
    } else {
      ctx.out << "Author: " << Cp1252ToUtf8(info.author) << "\nComments: "
              << Cp1252ToUtf8(info.comments) << "\n";
    }
    return kExitOk;
  }
};

CX_REGISTER_COMMAND(AuthorCommand);

}  // namespace
}  // namespace cx::cli
