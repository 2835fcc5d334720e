// Shared by the design and transfer commands: the access check at the start
// of a guarded command, and the small parsers their options need.
#pragma once

#include <optional>
#include <string>

#include "cli/command.h"
#include "design/security.h"
#include "engine/record_store.h"

namespace cx::cli {

// The access check for `op` on `db`; false when refused (the message has
// gone to stderr).
inline bool PassAccessCheck(Context& ctx, const Database& db, int op) {
  return Allowed(CheckAccess(db, op, ctx.ui));
}

// "yes"/"no", "on"/"off", "true"/"false", "1"/"0".
inline std::optional<bool> ParseSwitch(const std::string& text) {
  if (text == "yes" || text == "on" || text == "true" || text == "1") return true;
  if (text == "no" || text == "off" || text == "false" || text == "0") return false;
  return std::nullopt;
}

// After the work: a question left unanswered means nothing may be saved
// (the port has already said so when it refused the question).
inline bool QuestionsAnswered(Context& ctx) { return !ctx.ui.unanswered(); }

}  // namespace cx::cli
