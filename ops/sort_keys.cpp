#include "ops/sort_keys.h"

#include <algorithm>
#include <string>
#include <string_view>
#include <thread>

#include "ops/database_settings.h"
#include "ops/field_values.h"

namespace cx {
namespace {

template <typename T>
int Sign(T a, T b) {
  return a < b ? -1 : (a > b ? 1 : 0);
}

// Lower-cased texts and their ranks: equal texts (ignoring case) share a
// rank, and ranks order as the case-insensitive comparison does. The first
// eight bytes of each text, packed most significant first, decide most
// comparisons without looking at the texts.
class TextRanks {
 public:
  void Add(uint32_t row, std::string_view text) {
    uint64_t prefix = 0;
    for (size_t i = 0; i < 8; ++i) {
      prefix = (prefix << 8) | (i < text.size() ? static_cast<unsigned char>(LowerAscii(text[i])) : 0);
    }
    at_.push_back({prefix, row, static_cast<uint32_t>(buffer_.size()), static_cast<uint32_t>(text.size())});
    for (char c : text) buffer_.push_back(LowerAscii(c));
  }
  void Reserve(size_t texts) { at_.reserve(texts); }
  size_t size() const { return at_.size(); }
  // Calls set(row, rank) for every text added.
  template <typename Set>
  void Assign(Set set) {
    auto view = [&](const Entry& e) { return std::string_view(buffer_.data() + e.offset, e.length); };
    auto less = [&](const Entry& a, const Entry& b) {
      if (a.prefix != b.prefix) return a.prefix < b.prefix;
      return (a.length > 8 || b.length > 8) && view(a) < view(b);
    };
    std::sort(at_.begin(), at_.end(), less);
    int64_t rank = 0;
    for (size_t i = 0; i < at_.size(); ++i) {
      if (i > 0 && less(at_[i - 1], at_[i])) ++rank;
      set(at_[i].row, rank);
    }
  }

 private:
  struct Entry {
    uint64_t prefix;
    uint32_t row, offset, length;
  };
  std::vector<Entry, LargePageAllocator<Entry>> at_;
  std::string buffer_;
};

// Below this many texts a key's ranking is done sooner than a thread is
// started for it.
constexpr size_t kTextsRankedAside = 8192;

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

  void Read(ByteView value, int k, SortKeyTable::Row& row) {
    row.state[k] = 1;
    const uint8_t firstByte = value.empty() ? 0 : value[0];
    switch (type_) {
      case FieldType::Text:
      case FieldType::Note:
      case FieldType::DBPopup:
        texts_.Add(row.record, ValueView(value));
        break;
      case FieldType::Linked:
        if (std::optional<std::string_view> text = LinkedText(value)) {
          texts_.Add(row.record, *text);
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
  // bytes are at hand.
  const size_t count = db.recordCount();
  for (SortKeyReader& reader : readers) reader.Reserve(count);
  rows_.resize(count);
  for (size_t i = 0; i < count; ++i) {
    Row& row = rows_[i];
    const ByteView record = db.record(i);
    row.record = static_cast<uint32_t>(i);
    row.noData = record.empty();
    for (int k = 0; k < keys_; ++k) {
      if (std::optional<ByteView> value = FieldValue(record, readers[k].field())) readers[k].Read(*value, k, row);
    }
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
  std::thread helper;
  if (aside >= 0 && std::thread::hardware_concurrency() > 1) {
    helper = std::thread([&readers, aside, this] { readers[aside].Finish(aside, rows_); });
  }
  for (int k = 0; k < keys_; ++k) {
    if (k != aside || !helper.joinable()) readers[k].Finish(k, rows_);
  }
  if (helper.joinable()) helper.join();
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

}  // namespace cx
