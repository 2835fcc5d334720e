#include "cli/record_output.h"

#include <ostream>

#include "cli/json.h"
#include "cli/typed_value.h"
#include "engine/value_text.h"
#include "platform/text_codec.h"

namespace cx::cli {

void WriteRecords(Context& ctx, const Database& db, const std::vector<size_t>& rows) {
  std::vector<int> slots;
  for (uint8_t slot : db.schema().fieldOrder) {
    if (db.schema().field[slot].type() != FieldType::NotUsed) slots.push_back(slot);
  }
  const ValueContext vc{db.schema(), db.popups(), ctx.locale};
  auto name = [&db](int slot) { return Cp1252ToUtf8(db.schema().field[slot].name.str()); };

  if (ctx.json) {
    JsonWriter j(ctx.out);
    j.BeginArray();
    for (size_t row : rows) {
      j.BeginObject();
      j.Key("index").Number(static_cast<int64_t>(row));
      j.Key("fields").BeginArray();
      for (int slot : slots) {
        j.BeginObject();
        j.Key("slot").Number(slot);
        j.Key("name").String(name(slot));
        j.Key("text").String(Cp1252ToUtf8(ValueText(vc, db.record(row), slot)));
        j.Key("value");
        WriteTypedValue(j, db.schema(), db.popups(), db.record(row), slot);
        j.EndObject();
      }
      j.EndArray();
      j.EndObject();
    }
    j.EndArray();
    j.Finish();
    return;
  }

  // The index leads, so that a row found here can be named to edit or delete.
  std::string line = "Index";
  for (size_t k = 0; k < slots.size(); ++k) {
    line.push_back('\t');
    line += name(slots[k]);
  }
  ctx.out << line << "\n";
  for (size_t row : rows) {
    line = std::to_string(row);
    for (size_t k = 0; k < slots.size(); ++k) {
      line.push_back('\t');
      std::string text = OneLine(ValueText(vc, db.record(row), slots[k]));
      for (char& c : text) {
        if (c == '\t') c = ' ';
      }
      line += Cp1252ToUtf8(text);
    }
    ctx.out << line << "\n";
  }
}

}  // namespace cx::cli
