// Searching the records in view for a text: the field test, the search
// itself, and the two entry points "Search Database" and "Repeat the
// current Find".
#pragma once

#include <string>

#include "engine/record_store.h"
#include "ops/database_settings.h"
#include "ops/session.h"
#include "ops/view.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx {

// FieldMatches: 1 when field `field` of `record`, turned into text by its
// type's rule, contains `needle` (at its start with `beginsWith`). Unless
// `caseSensitive`, `needle` must already be lower-cased; the value's text
// is lower-cased where the type's rule says so.
int FieldMatches(const Database& db, ByteView record, int field, const std::string& needle,
                 bool caseSensitive, bool beginsWith, const LocaleInfo& locale);

// FindRecord: the index of the first record in view, from `startIndex` on,
// with a match in the search field (or in any field, from `startField` on
// in the first record examined); -1 when there is none, after showing "Not
// Found in Database!" in the error box when `report` is given. Never wraps
// around to the first record. On a match `hit` receives the record, field
// and list column; otherwise it is left as it was.
int FindRecord(const Database& db, const SearchSettings& search, int startIndex, int startField,
               FindHit* hit, const LinkRestriction* link, UiPort* report, const LocaleInfo& locale);

// The list column that shows `field`: its position among the fields of the
// display order that have a width; -1 when it has none.
int ListColumnOfField(const Schema& schema, int field);

// "Search Database": stores the settings (the database is marked changed)
// and searches from record 0, field 0. Returns the index found or -1; the
// hit is remembered in the session.
int SearchDatabase(DataSession& session, const SearchSettings& search);

// "Repeat the current Find": nothing (-1, no message) while the stored
// search text is empty; otherwise searches from the record after the last
// hit (record 0 when there is none), field 0.
int RepeatFind(DataSession& session);

}  // namespace cx
