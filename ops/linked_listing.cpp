#include "ops/linked_listing.h"

namespace cx {

bool LinkedRecordsListing::WriteLinkedRecords(const Database& db, size_t index, int fieldSlot,
                                              TextSink& out, int level) {
  const ListingContext ctx{locale_, this};
  return ForEachLinkedRecord(index, db, fieldSlot, services_,
                             [&](const Database& linked, size_t i) {
                               WriteRecordListing(i, linked, out, level, ctx);
                             });
}

}  // namespace cx
