#include "cli/field_spec.h"

#include <algorithm>
#include <cctype>

#include "cli/argument_text.h"
#include "platform/text_codec.h"

namespace cx::cli {

const char* const kFieldSpecHelp =
    R"(Field options (after the type, separated by commas):
  size=N        Text, DB Popup: maximum characters (at most 254)
  places=N      Float: places after the decimal point (0-4)
  width=N       column width in the list, in stored units (pixels / 1.5; at most 160;
                0 hides the column)
  hidden        not shown in the list        noexport  left out of export and printing
  items=A|B|C   Pop-Up: the popup list       default=N Pop-Up: default item (0-based)
  append        Pop-Up: "Popups Append"      behavior=N Date, Time: the behaviour index
  db=NAME       Link, Linked, DB Popup: the other database's name
  other=N       Link, Linked, DB Popup: "Other Field #" (1-30)
  show=N        Link: slot of the other database's field that is shown
  number=N      DB Popup: the number entered with the field
  op=OP         Calculated: + - * / min max avg
  v1=X, v2=X    Calculated: operand X is a field (name or slot) or #CONSTANT
  prev1, prev2  Calculated: take operand 1 / 2 from the previous record
  format=F      Calculated: 4dp int time date 3dp 2dp 1dp (or 0-6)
)";

namespace {

std::vector<std::string> Split(const std::string& s, char sep) {
  std::vector<std::string> parts;
  size_t start = 0;
  for (;;) {
    size_t end = s.find(sep, start);
    parts.push_back(s.substr(start, end == std::string::npos ? std::string::npos : end - start));
    if (end == std::string::npos) break;
    start = end + 1;
  }
  return parts;
}

bool Number(const std::string& key, const std::string& value, long low, long high, long& out,
            std::string& error) {
  auto n = ParseNumber(value);
  if (!n || *n < low || *n > high) {
    error = key + " must be a number from " + std::to_string(low) + " to " + std::to_string(high);
    return false;
  }
  out = *n;
  return true;
}

int OperationIndex(std::string op) {
  std::transform(op.begin(), op.end(), op.begin(), [](unsigned char c) { return std::tolower(c); });
  const char* ops[] = {"+", "-", "*", "/", "min", "max", "avg"};
  for (int i = 0; i < 7; ++i) {
    if (op == ops[i]) return i;
  }
  if (op == "average") return 6;
  return -1;
}

int FormatIndex(std::string f) {
  std::transform(f.begin(), f.end(), f.begin(), [](unsigned char c) { return std::tolower(c); });
  const char* names[] = {"4dp", "int", "time", "date", "3dp", "2dp", "1dp"};
  for (int i = 0; i < 7; ++i) {
    if (f == names[i] || f == std::to_string(i)) return i;
  }
  if (f == "integer") return 1;
  return -1;
}

}  // namespace

bool ParseFieldSpec(const std::string& text, FieldSpec& plan, std::string& error) {
  std::string cp;
  if (!ToStoredText(text, "the field " + text, cp, error)) return false;
  size_t c1 = cp.find(':');
  if (c1 == std::string::npos || c1 == 0) {
    error = "a field is NAME:TYPE[:options]";
    return false;
  }
  size_t c2 = cp.find(':', c1 + 1);
  std::string name = cp.substr(0, c1);
  std::string typeText = cp.substr(c1 + 1, c2 == std::string::npos ? std::string::npos : c2 - c1 - 1);
  std::string options = c2 == std::string::npos ? "" : cp.substr(c2 + 1);
  auto type = FieldTypeFromLabel(typeText);
  if (!type || *type == FieldType::NotUsed) {
    error = "unknown field type '" + Cp1252ToUtf8(typeText) + "'";
    return false;
  }
  if (name.size() > 19) {
    error = "a field name has at most 19 characters";
    return false;
  }
  FieldDef& d = plan.def;
  d = FieldDef();
  d.name.set(name);
  d.typeNumber = static_cast<int16_t>(*type);
  if (*type == FieldType::Float) d.size = 2;
  if (*type == FieldType::PopUp) d.param1 = 255;
  if (*type == FieldType::Calculated) {
    d.param1 = 255;
    d.param2 = 255;
  }
  if (options.empty()) return true;
  for (const std::string& option : Split(options, ',')) {
    size_t eq = option.find('=');
    std::string key = option.substr(0, eq);
    std::string value = eq == std::string::npos ? "" : option.substr(eq + 1);
    long n = 0;
    if (key == "size") {
      if (!Number(key, value, 1, 254, n, error)) return false;
      d.size = static_cast<int16_t>(n);
    } else if (key == "places") {
      if (!Number(key, value, 0, 4, n, error)) return false;
      d.size = static_cast<int16_t>(n);
    } else if (key == "width") {
      if (!Number(key, value, 0, 160, n, error)) return false;
      d.width = static_cast<int16_t>(n);
    } else if (key == "hidden") {
      d.visible = 0;
    } else if (key == "noexport") {
      d.exportPrint = 0;
    } else if (key == "items") {
      plan.popupItems = Split(value, '|');
      if (plan.popupItems.size() > 60) {
        error = "a popup list holds at most 60 items";
        return false;
      }
    } else if (key == "default") {
      if (!Number(key, value, 0, 255, n, error)) return false;
      d.param1 = static_cast<uint8_t>(n);
    } else if (key == "append") {
      d.popupsAppend = 1;
    } else if (key == "behavior") {
      if (!Number(key, value, 0, 255, n, error)) return false;
      d.behavior = static_cast<uint8_t>(n);
    } else if (key == "db") {
      if (value.size() > 19) {
        error = "a database name has at most 19 characters";
        return false;
      }
      d.text.set(value);
    } else if (key == "other") {
      if (!Number(key, value, 1, 30, n, error)) return false;
      d.otherField = static_cast<uint8_t>(n - 1);
    } else if (key == "show") {
      if (!Number(key, value, 0, 29, n, error)) return false;
      d.param1 = static_cast<uint8_t>(n);
    } else if (key == "number") {
      if (!Number(key, value, 0, 255, n, error)) return false;
      d.param3 = static_cast<uint8_t>(n);
    } else if (key == "op") {
      int op = OperationIndex(value);
      if (op < 0) {
        error = "op is one of + - * / min max avg";
        return false;
      }
      d.calcOperation = static_cast<uint8_t>(op);
    } else if (key == "v1" || key == "v2") {
      bool first = key == "v1";
      if (!value.empty() && value[0] == '#') {
        if (value.size() - 1 > 8) {
          error = "a constant has at most 8 characters";
          return false;
        }
        (first ? d.param1 : d.param2) = 255;
        if (first) {
          d.SetConstant1(value.substr(1));
        } else {
          d.SetConstant2(value.substr(1));
        }
      } else {
        (first ? plan.operand1Field : plan.operand2Field) = value;
      }
    } else if (key == "prev1") {
      d.calcFlags |= 1;
    } else if (key == "prev2") {
      d.calcFlags |= 2;
    } else if (key == "format") {
      int f = FormatIndex(value);
      if (f < 0) {
        error = "format is one of 4dp int time date 3dp 2dp 1dp";
        return false;
      }
      d.setResultFormat(static_cast<uint8_t>(f));
    } else {
      error = "unknown field option '" + Cp1252ToUtf8(key) + "'";
      return false;
    }
  }
  return true;
}

bool ResolveOperands(FieldSpec& plan, const Schema& schema, std::string& error) {
  auto resolve = [&](const std::string& text, uint8_t& param) {
    if (text.empty()) return true;
    if (auto n = ParseNumber(text); n && *n >= 0 && *n < format::kFieldCount) {
      param = static_cast<uint8_t>(*n);
      return true;
    }
    for (int slot = 0; slot < format::kFieldCount; ++slot) {
      if (schema.field[slot].type() != FieldType::NotUsed && schema.field[slot].name.str() == text) {
        param = static_cast<uint8_t>(slot);
        return true;
      }
    }
    error = "no field named '" + Cp1252ToUtf8(text) + "'";
    return false;
  };
  return resolve(plan.operand1Field, plan.def.param1) && resolve(plan.operand2Field, plan.def.param2);
}

}  // namespace cx::cli
