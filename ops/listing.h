// Text listings of records: one "name: value" line per listed field, a line
// of 40 dashes after each record. Written to a file the user names or to
// the temporary file the print program reads.
#pragma once

#include <cstddef>
#include <string>

#include "engine/record_store.h"
#include "ops/text_sink.h"
#include "ops/view.h"
#include "platform/locale_info.h"
#include "platform/status.h"
#include "platform/ui_port.h"

namespace cx {

// Lists the records that a Link field of a record leads to. Whoever can
// open linked databases implements it: open the other database restricted
// to this record's link, filters off for the moment, and write each record
// in view with WriteRecordListing at `level`; then restore and close.
class LinkedListing {
 public:
  virtual ~LinkedListing() = default;
  // False when the linked database cannot be opened (the field is then
  // left out of the listing).
  virtual bool WriteLinkedRecords(const Database& db, size_t index, int fieldSlot, TextSink& out,
                                  int level) = 0;
};

struct ListingContext {
  const LocaleInfo& locale;
  // Without one, Link fields are left out as if their database could not
  // be opened.
  LinkedListing* linked = nullptr;
};

// WriteRecordListing: record `index` of `db`, each line indented by three
// blanks per `level`. Lists the fields of the display order that are used
// and marked "Export/Print"; a Link field lists its linked records one
// level deeper in its place.
void WriteRecordListing(size_t index, const Database& db, TextSink& out, int level,
                        const ListingContext& ctx);

// The records a listing command covers: with `all` every record in view in
// table order, else the record at `current` (nothing when there is no
// such record).
void WriteListing(const Database& db, bool all, size_t current, TextSink& out,
                  const ListingContext& ctx, const LinkRestriction* link = nullptr);

// The same into a file, replaced only once complete.
Status WriteListingFile(const Database& db, bool all, size_t current, const std::string& path,
                        const ListingContext& ctx, const LinkRestriction* link = nullptr);

// ExportRecordsText: asks for a file (".TXT" added to a name without an
// extension), writes the listing and tells "File Exported OK" ("Update")
// or "ERROR: Unable to open file for writing." ("Error"). False when
// cancelled or failed.
bool ExportRecordsText(const Database& db, bool all, size_t current, UiPort& ui,
                       const ListingContext& ctx, const LinkRestriction* link = nullptr);

}  // namespace cx
