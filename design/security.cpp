#include "design/security.h"

#include <cctype>
#include <optional>

#include "engine/field_types.h"
#include "engine/record_reader.h"

namespace cx {
namespace {

constexpr std::array<std::string_view, secured::kCount> kOperationLabels = {
    "Open Database", "Add Records",     "Edit Records", "Delete Records",
    "DB Properties", "Delete Database", "Edit Popups",  "Beam Data"};

constexpr std::array<std::string_view, access_level::kCount> kLevelLabels = {
    "Full Access", "Password Required", "No Access", "View Records Only"};

}  // namespace

std::string_view OperationLabel(int op) {
  return op >= 0 && op < secured::kCount ? kOperationLabels[op] : std::string_view();
}

std::string_view AccessLevelLabel(int level) {
  return level >= 0 && level < access_level::kCount ? kLevelLabels[level] : std::string_view();
}

int LevelsOffered(int op) { return op == secured::kEditRecords ? 4 : 3; }

int OperationFromName(std::string_view name) {
  const std::string key = SimplifiedLabel(name);
  for (int op = 0; op < secured::kCount; ++op) {
    if (SimplifiedLabel(kOperationLabels[op]) == key) return op;
  }
  return -1;
}

int AccessLevelFromName(std::string_view name) {
  const std::string key = SimplifiedLabel(name);
  for (int level = 0; level < access_level::kCount; ++level) {
    if (SimplifiedLabel(kLevelLabels[level]) == key) return level;
  }
  if (key == "full") return access_level::kFull;
  if (key == "password") return access_level::kPassword;
  if (key == "none") return access_level::kNone;
  if (key == "viewonly") return access_level::kViewOnly;
  return -1;
}

int ReadLevel(const Schema& schema, int op) {
  if (op < 0 || 2 * op >= 32) return 0;
  const uint32_t word = schema.securityLevels;
  return static_cast<int>((word >> (2 * op)) & 3u);
}

void SetLevel(Schema& schema, int op, int level) {
  if (op < 0 || 2 * op >= 32) return;
  uint32_t word = schema.securityLevels;
  word &= ~(3u << (2 * op));
  word |= (static_cast<uint32_t>(level) & 3u) << (2 * op);
  // The stored word has 16 bits; operations above 7 have nowhere to go.
  schema.securityLevels = static_cast<uint16_t>(word);
}

bool AskForPassword(UiPort& ui, const std::string& expected) {
  // The user may try as often as they like; only Cancel ends the prompt.
  for (int attempt = 0;; ++attempt) {
    std::optional<std::string> typed = ui.PromptPassword(attempt);
    if (!typed) return false;
    if (*typed == expected) return true;
    ui.ShowMessage(security_messages::kInvalidPassword, "ERROR", MessageIcon::Error);
  }
}

Access CheckAccess(const Schema& schema, int op, UiPort& ui, bool showMessage) {
  const int level = ReadLevel(schema, op);
  if (level == access_level::kFull) return Access::Granted;
  if (level == access_level::kViewOnly) return Access::ViewOnly;
  if (level == access_level::kPassword) {
    ui.SetBusy(false);
    if (AskForPassword(ui, schema.password.str())) return Access::Granted;
  }
  if (showMessage) {
    ui.ShowMessage(security_messages::kDenied, security_messages::kDeniedCaption,
                   MessageIcon::None);
  }
  return Access::Refused;
}

Access CheckAccess(const Database& db, int op, UiPort& ui, bool showMessage) {
  return CheckAccess(db.schema(), op, ui, showMessage);
}

int OpenLevel(const Schema& schema) {
  const int level = ReadLevel(schema, secured::kOpenDatabase);
  if (level == access_level::kFull) return 0;
  if (level == access_level::kPassword) return 1;
  return -1;
}

int OpenLevel(const std::string& path, Schema* schema) {
  DatabaseHead head;
  if (!ReadDatabaseHead(path, head)) return -2;
  const int level = OpenLevel(head.schema);
  if (schema) *schema = head.schema;
  return level;
}

bool CheckOpenAccess(const Schema& schema, UiPort& ui) {
  const int level = OpenLevel(schema);
  if (level == 0) return true;
  if (level == 1) {
    ui.SetBusy(false);
    return AskForPassword(ui, schema.password.str());
  }
  ui.ShowMessage(security_messages::kOpenDenied, security_messages::kDeniedCaption,
                 MessageIcon::Warning);
  return false;
}

bool CheckOpenAccess(const std::string& path, UiPort& ui) {
  DatabaseHead head;
  if (Status read = ReadDatabaseHead(path, head); !read) {
    // Without the schema the level is unknown: nothing may be let through.
    ui.SetBusy(false);
    ui.ShowMessage(read.message(), "Error", MessageIcon::Error);
    return false;
  }
  return CheckOpenAccess(head.schema, ui);
}

SecuritySettings LoadSecuritySettings(const Schema& schema) {
  SecuritySettings s;
  s.password = schema.password.str();
  for (int op = 0; op < secured::kCount; ++op) s.levels[op] = ReadLevel(schema, op);
  return s;
}

void ApplySecuritySettings(Database& db, const SecuritySettings& settings) {
  Schema& schema = db.schema();
  schema.password.set(settings.password);
  for (int op = 0; op < secured::kCount; ++op) SetLevel(schema, op, settings.levels[op]);
  db.MarkChanged();
}

}  // namespace cx
