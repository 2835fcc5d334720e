// One open database as the data operations work on it: the database, the
// link restriction it was opened with, the view list built from it, the
// last find hit and the run-time state of recalculation. None of this is
// saved except through the database itself. The application keeps one per
// view level; the command-line tool makes one per command.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

#include "engine/format.h"
#include "engine/record_store.h"
#include "ops/view.h"
#include "platform/locale_info.h"
#include "platform/ui_port.h"

namespace cx {

struct RecalcState {
  // Set when a recalculation changed a Calculated field's text (and by the
  // record editor for the fields it edited); the record editor clears them.
  std::array<uint8_t, format::kFieldCount> fieldChanged{};
  // A sort that a recalculation pass still owes; survives from one pass to
  // the next until a sort clears it.
  bool resortPending = false;
  bool busy = false;  // a pass is running
};

// Where the last find matched: record index, field slot, list column (-1
// when the field has no column); index -1 when there is no hit.
struct FindHit {
  int index = -1;
  int field = -1;
  int column = -1;
};

struct DataSession {
  DataSession(Database& database, const LocaleInfo& localeInfo, UiPort& port,
              std::optional<LinkRestriction> restriction = std::nullopt)
      : db(database), locale(localeInfo), ui(port), link(restriction) {}

  Database& db;
  const LocaleInfo& locale;  // the device's regional settings, read once
  UiPort& ui;
  std::optional<LinkRestriction> link;
  std::vector<uint32_t> view;  // record indexes in view, in table order
  FindHit found;
  RecalcState calc;
  // A save writing the records while a recalculation finishes them
  // (Database::SaveAlong): the recalculation tells it how far it got.
  RecordsReady* savingAlong = nullptr;

  const LinkRestriction* Link() const { return link ? &*link : nullptr; }
};

}  // namespace cx
