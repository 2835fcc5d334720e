// Listings through linked databases: a Link field's records, found with the
// link services, written one level deeper.
#pragma once

#include "ops/links.h"
#include "ops/listing.h"

namespace cx {

class LinkedRecordsListing : public LinkedListing {
 public:
  LinkedRecordsListing(const LinkServices& services, const LocaleInfo& locale)
      : services_(services), locale_(locale) {}
  bool WriteLinkedRecords(const Database& db, size_t index, int fieldSlot, TextSink& out,
                          int level) override;

 private:
  const LinkServices& services_;
  const LocaleInfo& locale_;
};

}  // namespace cx
