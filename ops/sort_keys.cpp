#include "ops/sort_keys.h"

#include <algorithm>
#include <array>
#include <bit>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "ops/database_settings.h"
#include "ops/field_values.h"
#include "ops/position_sort.h"
#include "platform/run_beside.h"

namespace cx {
namespace {

template <typename T>
int Sign(T a, T b) {
  return a < b ? -1 : (a > b ? 1 : 0);
}

// Lower-cased texts and their ranks: equal texts (ignoring case) share a
// rank, and ranks order as the case-insensitive comparison does. A key's
// texts repeat a lot (towns, names), so each different text is kept and
// sorted once, found again through a hash table. The first eight bytes of
// each text, packed most significant first, decide most comparisons
// without looking at the texts.
class TextRanks {
 public:
  void Add(uint32_t row, std::string_view text) {
    lowered_.resize(text.size());
    std::transform(text.begin(), text.end(), lowered_.begin(), [](char c) { return LowerAscii(c); });
    rows_.push_back({row, Find(lowered_, std::hash<std::string_view>{}(lowered_))});
  }
  void Reserve(size_t texts) { rows_.reserve(texts); }
  // Takes over the texts of `other`, added for other rows.
  void Append(const TextRanks& other) {
    std::vector<uint32_t> same(other.distinct_.size());
    for (size_t d = 0; d < other.distinct_.size(); ++d) {
      same[d] = Find(other.View(other.distinct_[d]), other.distinct_[d].hash);
    }
    rows_.reserve(rows_.size() + other.rows_.size());
    for (const RowText& r : other.rows_) rows_.push_back({r.row, same[r.text]});
  }
  size_t size() const { return rows_.size(); }
  // Calls set(row, rank) for every text added.
  template <typename Set>
  void Assign(Set set) {
    auto less = [&](uint32_t x, uint32_t y) {
      const Distinct& a = distinct_[x];
      const Distinct& b = distinct_[y];
      if (a.prefix != b.prefix) return a.prefix < b.prefix;
      if (a.length <= 8 && b.length <= 8) return false;
      // The prefixes hold the first eight bytes of both.
      if (a.length >= 8 && b.length >= 8) return View(a).substr(8) < View(b).substr(8);
      return View(a) < View(b);
    };
    std::vector<uint32_t> order(distinct_.size());
    for (uint32_t d = 0; d < order.size(); ++d) order[d] = d;
    std::sort(order.begin(), order.end(), less);
    std::vector<int64_t> rank(distinct_.size());
    int64_t next = 0;
    for (size_t i = 0; i < order.size(); ++i) {
      if (i > 0 && less(order[i - 1], order[i])) ++next;
      rank[order[i]] = next;
    }
    for (const RowText& r : rows_) set(r.row, rank[r.text]);
  }

 private:
  struct Distinct {
    uint64_t prefix;
    size_t hash;
    uint32_t offset, length;
  };
  struct RowText {
    uint32_t row, text;  // the row and its text's place in distinct_
  };

  std::string_view View(const Distinct& d) const { return std::string_view(buffer_.data() + d.offset, d.length); }

  // The place of a lower-cased text in distinct_, added when new.
  uint32_t Find(std::string_view text, size_t hash) {
    if (2 * (distinct_.size() + 1) > slots_.size()) Grow();
    const size_t mask = slots_.size() - 1;
    for (size_t at = hash & mask;; at = (at + 1) & mask) {
      const uint32_t slot = slots_[at];
      if (slot == 0) {
        slots_[at] = Keep(text, hash) + 1;
        return slots_[at] - 1;
      }
      const Distinct& d = distinct_[slot - 1];
      if (d.hash == hash && View(d) == text) return slot - 1;
    }
  }
  uint32_t Keep(std::string_view text, size_t hash) {
    uint64_t prefix = 0;
    for (size_t i = 0; i < 8; ++i) prefix = (prefix << 8) | (i < text.size() ? static_cast<unsigned char>(text[i]) : 0);
    distinct_.push_back({prefix, hash, static_cast<uint32_t>(buffer_.size()), static_cast<uint32_t>(text.size())});
    buffer_ += text;
    return static_cast<uint32_t>(distinct_.size() - 1);
  }
  // Twice the room, the texts placed again (the table stays at most half
  // full, so that a search ends soon).
  void Grow() {
    slots_.assign(std::max<size_t>(64, slots_.size() * 2), 0);
    const size_t mask = slots_.size() - 1;
    for (uint32_t d = 0; d < distinct_.size(); ++d) {
      size_t at = distinct_[d].hash & mask;
      while (slots_[at] != 0) at = (at + 1) & mask;
      slots_[at] = d + 1;
    }
  }

  std::vector<RowText, LargePageAllocator<RowText>> rows_;
  std::vector<Distinct> distinct_;
  std::string buffer_;           // the different texts, lower-cased
  std::vector<uint32_t> slots_;  // hash table: a place in distinct_ + 1, 0 when empty
  std::string lowered_;          // the text being added
};

// Below this many texts a key's ranking is done sooner than a thread is
// started for it.
constexpr size_t kTextsRankedAside = 8192;
// Below this many records the keys are read, and the rows sorted, sooner
// than a thread is started for half of them.
constexpr size_t kRowsReadAside = 16384;

}  // namespace

// Reads one key's value out of a record into a row.
class SortKeyReader {
 public:
  using Rule = SortKeyTable::Rule;

  SortKeyReader(const Database& db, int field) : field_(field) {
    const FieldDef* def = field >= 0 && field < format::kFieldCount ? &db.schema().field[field] : nullptr;
    type_ = def ? def->type() : FieldType::NotUsed;
    const CalcKind calc = def ? CalcKindOf(*def) : CalcKind::Unknown;
    decimal_ = calc == CalcKind::Decimal;
    switch (type_) {
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
      case FieldType::CheckBox:
      case FieldType::Time:
      case FieldType::PopUp:
        rule_ = Rule::Ordered;
        break;
      case FieldType::Linked:
        rule_ = Rule::LinkedRank;
        break;
      case FieldType::Integer:
      case FieldType::Unique:
      case FieldType::Date:
        rule_ = Rule::Wrapped;
        break;
      case FieldType::Float:
        rule_ = Rule::Real;
        break;
      case FieldType::Calculated:
        rule_ = decimal_ ? Rule::Real : (calc == CalcKind::Unknown ? Rule::Equal : Rule::Wrapped);
        break;
      default:
        rule_ = Rule::Equal;
        break;
    }
    // A pop-up sorted by its texts has at most 256 different values: rank
    // those once.
    popupTexts_ = type_ == FieldType::PopUp && SortPopupsOn(db.schema(), field);
    if (popupTexts_) {
      TextRanks ranks;
      for (uint32_t item = 0; item < 256; ++item) ranks.Add(item, PopupText(db.popups()[field], int(item)));
      ranks.Assign([&](uint32_t item, int64_t rank) { popupRank_[item] = rank; });
    }
  }

  int field() const { return field_; }
  Rule rule() const { return rule_; }
  // Room for the texts of `records` records, taken at once.
  void Reserve(size_t records) {
    if (type_ == FieldType::Text || type_ == FieldType::Note || type_ == FieldType::DBPopup ||
        type_ == FieldType::Linked) {
      texts_.Reserve(records);
    }
  }

  // Reads the key into `row`, its text (if any) into `texts`: this
  // reader's own or those of another part of the table.
  void Read(ByteView value, int k, SortKeyTable::Row& row, TextRanks& texts) {
    row.state[k] = 1;
    const uint8_t firstByte = value.empty() ? 0 : value[0];
    switch (type_) {
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
        texts.Add(row.record, ValueView(value));
        break;
      case FieldType::Linked:
        if (std::optional<std::string_view> text = LinkedText(value)) {
          texts.Add(row.record, *text);
        } else {
          row.state[k] = 2;
        }
        break;
      case FieldType::Integer:
      case FieldType::Unique:
      case FieldType::Date:
        row.value[k].number = ValueNumber(value);
        break;
      case FieldType::Float:
        row.value[k].real = ParseDouble(ValueView(value));
        break;
      case FieldType::PopUp:
        row.value[k].number = popupTexts_ ? popupRank_[firstByte] : firstByte;
        break;
      case FieldType::CheckBox:
        row.value[k].number = firstByte;
        break;
      case FieldType::Time:
        row.value[k].number = Time24(value);
        break;
      case FieldType::Calculated:
        if (decimal_) {
          row.value[k].real = ParseDouble(ValueView(value));
        } else {
          row.value[k].number = static_cast<uint32_t>(ParseLong(ValueView(value)));
        }
        break;
      default:
        break;
    }
  }

  // Texts become their ranks once every row has been read; the rows are
  // still in record order, so a record index is a row index.
  void Finish(int k, SortKeyTable::Rows& rows) {
    texts_.Assign([&](uint32_t record, int64_t rank) { rows[record].value[k].number = rank; });
  }
  size_t texts() const { return texts_.size(); }
  TextRanks& ownTexts() { return texts_; }

 private:
  int field_;
  FieldType type_;
  Rule rule_;
  bool decimal_ = false;
  bool popupTexts_ = false;
  std::array<int64_t, 256> popupRank_{};
  TextRanks texts_;
};

SortKeyTable::SortKeyTable(const Database& db) {
  std::vector<SortKeyReader> readers;
  for (const SortKey& key : db.schema().sortKey) {
    if (key.Field() == -1) break;
    reverse_[readers.size()] = key.direction == 0;
    readers.emplace_back(db, key.Field());
    rule_[readers.size() - 1] = readers.back().rule();
  }
  keys_ = static_cast<int>(readers.size());

  // One pass over the records, reading every key from a record while its
  // bytes are at hand, in one walk over its slots. A large table is read
  // in two halves at once, the second half's texts kept apart and joined
  // to the first's before ranking.
  const size_t count = db.recordCount();
  for (SortKeyReader& reader : readers) reader.Reserve(count);
  rows_.resize(count);
  int lastSlot = -1;
  for (const SortKeyReader& reader : readers) {
    if (reader.field() < format::kFieldCount) lastSlot = std::max(lastSlot, reader.field());
  }
  auto readRows = [&](size_t from, size_t to, std::array<TextRanks*, 3> texts) {
    for (size_t i = from; i < to; ++i) {
      Row& row = rows_[i];
      const ByteView record = db.record(i);
      row.record = static_cast<uint32_t>(i);
      row.noData = record.empty();
      const SlotValues values = AllSlotValues(record, lastSlot);
      for (int k = 0; k < keys_; ++k) {
        const int field = readers[k].field();
        if (field >= 0 && field < format::kFieldCount && values[field]) {
          readers[k].Read(*values[field], k, row, *texts[k]);
        }
      }
    }
  };
  std::array<TextRanks*, 3> own{};
  for (int k = 0; k < keys_; ++k) own[k] = &readers[k].ownTexts();
  if (count >= kRowsReadAside && std::thread::hardware_concurrency() > 1) {
    std::array<TextRanks, 3> later;
    std::array<TextRanks*, 3> laterTexts{&later[0], &later[1], &later[2]};
    const size_t half = count / 2;
    RunBeside([&] { readRows(half, count, laterTexts); }, [&] { readRows(0, half, own); });
    for (int k = 0; k < keys_; ++k) own[k]->Append(later[k]);
  } else {
    readRows(0, count, own);
  }
  // Ranking a key's texts sorts them; of two such keys in a large file,
  // the first is ranked on a second thread. Each writes only its own key
  // of the rows.
  int aside = -1;
  for (int k = 0; k < keys_ && aside < 0; ++k) {
    if (readers[k].texts() < kTextsRankedAside) continue;
    for (int other = k + 1; other < keys_; ++other) {
      if (readers[other].texts() >= kTextsRankedAside) aside = k;
    }
  }
  if (aside < 0 || std::thread::hardware_concurrency() < 2) aside = -1;
  auto others = [&] {
    for (int k = 0; k < keys_; ++k) {
      if (k != aside) readers[k].Finish(k, rows_);
    }
  };
  if (aside < 0) {
    others();
  } else {
    RunBeside([&] { readers[aside].Finish(aside, rows_); }, others);
  }
}

int SortKeyTable::Compare(const Row& rowA, const Row& rowB) const {
  if (rowA.noData || rowB.noData) return 0;
  for (int k = 0; k < keys_; ++k) {
    if (rowA.state[k] == 0) return -1;
    if (rowB.state[k] == 0) return 1;
    const Row& a = reverse_[k] ? rowB : rowA;
    const Row& b = reverse_[k] ? rowA : rowB;
    int r = 0;
    switch (rule_[k]) {
      case Rule::Equal:
        break;
      case Rule::Wrapped:
        r = static_cast<int32_t>(static_cast<uint32_t>(a.value[k].number) - static_cast<uint32_t>(b.value[k].number));
        break;
      case Rule::Ordered:
        r = Sign(a.value[k].number, b.value[k].number);
        break;
      case Rule::Real:
        r = Sign(a.value[k].real, b.value[k].real);
        break;
      case Rule::LinkedRank:
        if (a.state[k] == 2 || b.state[k] == 2) {
          r = (a.state[k] == 2 ? 0 : 1) - (b.state[k] == 2 ? 0 : 1);
        } else {
          r = Sign(a.value[k].number, b.value[k].number);
        }
        break;
    }
    if (r != 0) return r;
  }
  return 0;
}

// Packing needs every row to hold every key (a missing slot or record
// makes Compare answer in ways no single number can), numbers that compare
// as plain integers (no reals; wrapped differences only when all values lie
// within 2^31 of each other, read as unsigned or as signed numbers) and at
// most 64 bits for all keys together.
bool SortKeyTable::Pack() {
  if (rows_.empty()) return false;
  // Per key, what each value is turned into before packing: an xor that
  // puts it in unsigned order, then the offset from the smallest.
  std::array<uint64_t, 3> flip{}, low{}, span{};
  std::array<bool, 3> any{};
  auto unsignedValue = [&](const Row& row, int k, uint64_t flipped) {
    return (rule_[k] == Rule::Wrapped ? static_cast<uint32_t>(row.value[k].number)
                                      : static_cast<uint64_t>(row.value[k].number)) ^ flipped;
  };
  for (int k = 0; k < keys_; ++k) {
    if (rule_[k] == Rule::Real) return false;
    // Ordered values compare as signed numbers; a wrapped difference as
    // either, whichever keeps the values closer together.
    const std::array<uint64_t, 2> flips = rule_[k] == Rule::Wrapped
                                              ? std::array<uint64_t, 2>{0, uint64_t{1} << 31}
                                              : std::array<uint64_t, 2>{uint64_t{1} << 63, uint64_t{1} << 63};
    std::array<uint64_t, 2> lo{UINT64_MAX, UINT64_MAX}, hi{};
    for (const Row& row : rows_) {
      if (row.noData || row.state[k] == 0) return false;
      if (rule_[k] == Rule::Equal || row.state[k] == 2) continue;
      for (int f = 0; f < 2; ++f) {
        const uint64_t v = unsignedValue(row, k, flips[f]);
        lo[f] = std::min(lo[f], v);
        hi[f] = std::max(hi[f], v);
      }
      any[k] = true;
    }
    if (!any[k]) continue;
    const int f = hi[1] - lo[1] < hi[0] - lo[0] ? 1 : 0;
    if (rule_[k] == Rule::Wrapped && hi[f] - lo[f] >= (uint64_t{1} << 31)) return false;
    flip[k] = flips[f];
    low[k] = lo[f];
    // A Linked value that is empty comes before all others: it takes 0.
    span[k] = hi[f] - lo[f] + (rule_[k] == Rule::LinkedRank ? 1 : 0);
  }
  std::array<int, 3> width{};
  int bits = 0;
  for (int k = 0; k < keys_; ++k) bits += width[k] = static_cast<int>(std::bit_width(span[k]));
  if (bits > 64) return false;

  packed_.resize(rows_.size());
  for (size_t i = 0; i < rows_.size(); ++i) {
    const Row& row = rows_[i];
    uint64_t key = 0;
    for (int k = 0; k < keys_; ++k) {
      uint64_t part = 0;
      if (any[k] && rule_[k] != Rule::Equal && row.state[k] != 2) {
        part = unsignedValue(row, k, flip[k]) - low[k] + (rule_[k] == Rule::LinkedRank ? 1 : 0);
      }
      if (reverse_[k]) part = span[k] - part;
      key = width[k] == 64 ? part : (key << width[k]) | part;
    }
    packed_[i] = {key, row.record};
  }
  return true;
}

void SortKeyTable::Sort() {
  const long count = static_cast<long>(rows_.size());
  // Both sorts only compare and swap the positions they are given.
  const bool two = rows_.size() >= kRowsReadAside && std::thread::hardware_concurrency() > 1;
  auto sort = [&](auto compare, auto swap) {
    if (two) {
      SortPositionsOnTwoThreads(count, compare, swap);
    } else {
      SortPositions(count, compare, swap);
    }
  };
  if (Pack()) {
    sort(
        [this](long x, long y) {
          const uint64_t a = packed_[x].key, b = packed_[y].key;
          return (a > b) - (a < b);
        },
        [this](long x, long y) { std::swap(packed_[x], packed_[y]); });
    return;
  }
  sort([this](long x, long y) { return Compare(rows_[x], rows_[y]); },
       [this](long x, long y) { std::swap(rows_[x], rows_[y]); });
}

}  // namespace cx
