#include "design/link_access.h"

#include "design/security.h"

namespace cx {

static_assert(static_cast<int>(LinkAccess::Open) == secured::kOpenDatabase);
static_assert(static_cast<int>(LinkAccess::Add) == secured::kAddRecords);
static_assert(static_cast<int>(LinkAccess::Edit) == secured::kEditRecords);
static_assert(static_cast<int>(LinkAccess::Delete) == secured::kDeleteRecords);

LinkServices SecuredLinkServices(UiPort& ui, const LocaleInfo* locale,
                                 std::function<Database*(const std::string&)> findOpen) {
  LinkServices services(ui);
  services.locale = locale;
  services.checkAccess = [&ui](const Database& db, LinkAccess kind) {
    return Allowed(CheckAccess(db, static_cast<int>(kind), ui));
  };
  services.checkOpen = [&ui](const Database& db) { return CheckOpenAccess(db.schema(), ui); };
  services.findOpen = std::move(findOpen);
  return services;
}

}  // namespace cx
