// order FILE [up FIELD | down FIELD]... [--set LIST]: the display order of
// the fields.
#include <ostream>
#include <sstream>

#include "cli/command.h"
#include "cli/commands/design_common.h"
#include "cli/database_access.h"
#include "cli/json.h"
#include "design/properties.h"
#include "platform/text_codec.h"

namespace cx::cli {
namespace {

class OrderCommand : public Command {
 public:
  std::string name() const override { return "order"; }
  std::string summary() const override { return "show or change the display order of the fields"; }
  void Declare(Syntax& syntax) const override {
    syntax.Globals({"--password"})
        .Positional("FILE")
        .Positional("MOVE", kAnyNumber)
        .Form({"FILE", "[up FIELD | down FIELD ...]"})
        .Form({"FILE", "(--set)"})
        .About("Without changes, shows the 30 positions: position, slot and field name (with\n"
               "--json an array of {\"position\", \"slot\", \"name\"}). Each \"up FIELD\" or\n"
               "\"down FIELD\" swaps the field with its neighbour above or below, in the order\n"
               "given; the first position cannot move up nor the last (29) down.\n")
        .Option("--set", "LIST",
                "the whole order: all 30 slots (numbers or names), comma-separated, each once")
        .Notes("FIELD is a slot number (0-29) or a field name. Changes need the \"DB\n"
               "Properties\" access.\n");
  }


  int Run(Context& ctx, const Arguments& args) override {
    const auto& p = args.positional();
    if (p.empty() || p.size() % 2 == 0) return UsageError(ctx, *this, "expected FILE [up|down FIELD ...]");
    if (p.size() > 1 && args.has("--set")) return UsageError(ctx, *this, "--set replaces the moves");
    if (p.size() == 1 && !args.has("--set")) {
      DatabaseHead head;
      if (!OpenHeadForCommand(ctx, p[0], head)) return kExitFailed;
      Show(ctx, FieldOrderEditor(head.schema));
      return kExitOk;
    }
    Database db;
    if (!OpenForCommand(ctx, p[0], db)) return kExitFailed;

    FieldOrderEditor editor(db.schema());
    std::array<uint8_t, format::kFieldCount> order = editor.order();
    if (auto list = args.value("--set")) {
      std::stringstream in(*list);
      std::string item;
      size_t n = 0;
      while (std::getline(in, item, ',')) {
        const int slot = ResolveField(db, item);
        if (slot < 0) return UsageError(ctx, *this, "no field " + item);
        if (n >= order.size()) return UsageError(ctx, *this, "more than 30 fields in --set");
        order[n++] = static_cast<uint8_t>(slot);
      }
      if (n != order.size() || !IsValidFieldOrder(order)) {
        return UsageError(ctx, *this, "--set must name each of the 30 slots once");
      }
    }
    for (size_t i = 1; i + 1 < p.size(); i += 2) {
      const int slot = ResolveField(db, p[i + 1]);
      if (slot < 0) return UsageError(ctx, *this, "no field " + p[i + 1]);
      int position = 0;
      while (position + 1 < format::kFieldCount && editor.order()[position] != slot) ++position;
      editor.Select(position);
      bool moved;
      if (p[i] == "up") {
        moved = editor.MoveUp();
      } else if (p[i] == "down") {
        moved = editor.MoveDown();
      } else {
        return UsageError(ctx, *this, "expected up or down, not " + p[i]);
      }
      if (!moved) {
        return UsageError(ctx, *this, p[i + 1] + " is at position " + std::to_string(position) +
                                          " and cannot move " + p[i]);
      }
      order = editor.order();
    }
    if (!PassAccessCheck(ctx, db, secured::kDBProperties)) return kExitFailed;
    db.schema().fieldOrder = order;
    db.MarkChanged();
    if (!SaveForCommand(ctx, db)) return kExitFailed;
    Show(ctx, FieldOrderEditor(db.schema()));
    return kExitOk;
  }

 private:
  static void Show(Context& ctx, const FieldOrderEditor& editor) {
    const auto names = editor.ListTexts();
    if (ctx.json) {
      JsonWriter j(ctx.out);
      j.BeginArray();
      for (int pos = 0; pos < format::kFieldCount; ++pos) {
        j.BeginObject();
        j.Key("position").Number(pos);
        j.Key("slot").Number(editor.order()[pos]);
        j.Key("name").String(Cp1252ToUtf8(names[pos]));
        j.EndObject();
      }
      j.EndArray();
      j.Finish();
      return;
    }
    for (int pos = 0; pos < format::kFieldCount; ++pos) {
      ctx.out << pos << "\t" << int(editor.order()[pos]) << "\t" << Cp1252ToUtf8(names[pos]) << "\n";
    }
  }
};

CX_REGISTER_COMMAND(OrderCommand);

}  // namespace
}  // namespace cx::cli
