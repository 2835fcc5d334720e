// Linked work under the access check: the services that the link and
// transfer operations use, bound to this database's security rules.
#pragma once

#include <functional>
#include <string>

#include "ops/links.h"

namespace cx {

// The link services with the access check of each database: "Open
// Database" by the open rule when a linked database is loaded, and the
// operation that the linked work stands for. `findOpen` tells which
// databases are already open (the view levels); empty: none. With a
// `locale`, a database loaded for linked work first does the work its file
// still owes (re-sorting, recalculating).
LinkServices SecuredLinkServices(UiPort& ui, const LocaleInfo* locale = nullptr,
                                 std::function<Database*(const std::string&)> findOpen = {});

}  // namespace cx
