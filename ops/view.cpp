#include "ops/view.h"

namespace cx {

// Placeholder until the filters land: every record is in view.
int RecordInView(const Database& db, size_t index, const LinkRestriction* link) {
  (void)link;
  return index < db.recordCount() ? 1 : 0;
}

std::vector<uint32_t> RebuildView(const Database& db, const LinkRestriction* link) {
  std::vector<uint32_t> view;
  view.reserve(db.recordCount());
  for (size_t i = 0; i < db.recordCount(); ++i) {
    if (RecordInView(db, i, link)) view.push_back(static_cast<uint32_t>(i));
  }
  return view;
}

}  // namespace cx
