#include "design/receive_access.h"

#include "design/security.h"

namespace cx {

bool AccessCheckedReceiveHooks::AllowAdd(Database& db, UiPort& ui) {
  return Allowed(CheckAccess(db, secured::kAddRecords, ui));
}

bool AccessCheckedReceiveHooks::AllowOpen(const std::string& path, UiPort& ui) {
  return CheckOpenAccess(path, ui);
}

}  // namespace cx
