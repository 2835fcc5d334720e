// The sort keys of every record, read out of the records once per sort.
// Each record becomes one small row holding a number per key (texts are
// replaced by their rank among the key's texts), and the sort moves these
// rows instead of comparing records: a comparison then touches two rows
// instead of walking both records' slots for each of up to three keys.
// Compare() gives exactly the sign CompareRecords gives for the same two
// records.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "engine/record_store.h"

namespace cx {

class SortKeyTable {
 public:
  struct Row {
    uint32_t record = 0;  // index in the table the keys were read from
    uint8_t noData = 0;   // a record without bytes compares equal to all
    std::array<uint8_t, 3> state{};  // per key: 0 no slot, 1 value, 2 empty Linked value
    // Per key a number (texts as their rank) or, for decimal values, a real.
    union Value {
      int64_t number = 0;
      double real;
    };
    std::array<Value, 3> value{};
  };

  // Reads the keys of the schema's sort keys (up to the first -1) for
  // every record of the table.
  explicit SortKeyTable(const Database& db);

  using Rows = std::vector<Row, LargePageAllocator<Row>>;
  Rows& rows() { return rows_; }
  int Compare(const Row& a, const Row& b) const;

  // Puts the records in the order SortPositions gives them (a large table
  // on two threads); RecordAt(position) then names the record at each
  // position.
  void Sort();
  uint32_t RecordAt(size_t position) const {
    return packed_.empty() ? rows_[position].record : packed_[position].record;
  }

 private:
  // All keys of a row in one number that compares as Compare() does.
  struct PackedRow {
    uint64_t key;
    uint32_t record;
  };
  bool Pack();

  // How one key's values compare, after the missing-slot rule.
  enum class Rule : uint8_t { Equal, Wrapped, Ordered, Real, LinkedRank };
  friend class SortKeyReader;

  Rows rows_;
  std::vector<PackedRow, LargePageAllocator<PackedRow>> packed_;
  int keys_ = 0;
  std::array<Rule, 3> rule_{};
  std::array<bool, 3> reverse_{};
};

}  // namespace cx
