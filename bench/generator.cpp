#include "bench/generator.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <string_view>

#include "engine/record.h"

namespace cx::bench {
namespace {

constexpr std::array<std::string_view, 16> kFirstNames = {
    "Anna", "Bruno", "Chloé", "Dmitri", "Emma", "Farid", "Greta", "Hugo",
    "Ines", "Jonas", "Kira", "Lars", "Mónica", "Nils", "Olga", "Pavel"};
constexpr std::array<std::string_view, 16> kLastNames = {
    "Albers", "Brandt", "Castillo", "Dufresne", "Eriksen", "Fontaine", "García", "Hoffmann",
    "Ivanova", "Jansen", "Kowalski", "Lindqvist", "Moreau", "Novak", "O'Brien", "Petrov"};
constexpr std::array<std::string_view, 12> kColors = {
    "Red", "Orange", "Yellow", "Green", "Teal", "Blue", "Indigo", "Violet", "Black", "White",
    "Grey", "Brown"};
constexpr std::array<std::string_view, 10> kCities = {
    "Aachen", "Bergen", "Cork", "Dijon", "Esbjerg", "Faro", "Graz", "Haarlem", "Izmir", "Jena"};
constexpr std::array<std::string_view, 8> kSuppliers = {
    "Acme", "Borealis Ltd", "Cobalt & Sons", "Delta, Inc.", "Ember", "Fjord", "Granite", "Helix"};
constexpr std::array<std::string_view, 24> kWords = {
    "order",  "shipped", "late",   "call",   "back",   "invoice", "paid",  "\"rush\"",
    "fragile", "box",    "pallet", "notes:", "see",    "attached", "and",  "the",
    "with",   "price,",  "agreed", "crate",  "spare",  "parts",   "urgent", "ok"};

// The Windows-1252 form of the few non-ASCII letters the lists use.
std::string Cp1252(std::string_view utf8) {
  std::string out;
  for (size_t i = 0; i < utf8.size(); ++i) {
    unsigned char c = static_cast<unsigned char>(utf8[i]);
    if (c == 0xC3 && i + 1 < utf8.size()) {
      out.push_back(static_cast<char>(static_cast<unsigned char>(utf8[++i]) + 0x40));
    } else {
      out.push_back(static_cast<char>(c));
    }
  }
  return out;
}

template <typename List>
std::string_view Pick(const List& list, std::mt19937& rng) {
  return list[rng() % list.size()];
}

FieldDef Field(FieldType type, const char* name, int16_t size = 40) {
  FieldDef f;
  f.typeNumber = static_cast<int16_t>(type);
  f.size = size;
  f.name.set(name);
  return f;
}

std::string NoteText(std::mt19937& rng, size_t maxLength) {
  if (maxLength == 0) return "";
  size_t length = rng() % (maxLength + 1);
  std::string text;
  while (text.size() < length) {
    if (!text.empty()) text += (rng() % 12 == 0) ? "\r\n" : " ";
    text += Pick(kWords, rng);
  }
  text.resize(std::min(text.size(), length));
  return text;
}

}  // namespace

Schema GeneratedSchema(bool extension) {
  Schema s = InitSchema();
  s.field[kName] = Field(FieldType::Text, "Name", 40);
  s.field[kQuantity] = Field(FieldType::Integer, "Quantity");
  s.field[kPrice] = Field(FieldType::Float, "Price", 2);
  s.field[kColor] = Field(FieldType::PopUp, "Color");
  s.field[kColor].param1 = format::kNoPopupValue;
  s.field[kPaid] = Field(FieldType::CheckBox, "Paid");
  s.field[kId] = Field(FieldType::Unique, "Id");
  s.field[kPhoto] = Field(FieldType::Image, "Photo");
  s.field[kBorn] = Field(FieldType::Date, "Born");
  s.field[kAt] = Field(FieldType::Time, "At");
  s.field[kCustomer] = Field(FieldType::Link, "Customer");
  s.field[kCustomer].text.set("Customers");
  s.field[kCustomer].otherField = 0;
  s.field[kOrder] = Field(FieldType::Linked, "Order");
  s.field[kOrder].text.set("Orders");
  s.field[kOrder].otherField = 0;
  s.field[kNotes] = Field(FieldType::Note, "Notes");
  s.field[kDetails] = Field(FieldType::Heading, "Details");
  s.field[kSupplier] = Field(FieldType::DBPopup, "Supplier", 30);
  s.field[kSupplier].text.set("Suppliers");
  s.field[kSupplier].otherField = 0;
  s.field[kTotal] = Field(FieldType::Calculated, "Total");
  s.field[kTotal].calcOperation = 2;  // *
  s.field[kTotal].param1 = kQuantity;
  s.field[kTotal].param2 = kPrice;
  s.field[kTotal].setResultFormat(5);  // two places
  s.field[kRunning] = Field(FieldType::Calculated, "Running");
  s.field[kRunning].calcOperation = 0;  // +
  s.field[kRunning].calcFlags = 1;      // value 1 from the previous record
  s.field[kRunning].param1 = kRunning;
  s.field[kRunning].param2 = kQuantity;
  s.field[kRunning].setResultFormat(1);  // whole number
  s.field[kCity] = Field(FieldType::Text, "City", 30);
  s.field[kRating] = Field(FieldType::Integer, "Rating");
  s.recordExtension = extension ? 1 : 0;
  return s;
}

PopupLists GeneratedPopups() {
  PopupLists lists{};
  for (std::string_view c : kColors) lists[kColor].items.emplace_back(c);
  return lists;
}

Bytes GenerateRecord(const Schema& schema, size_t index, std::mt19937& rng,
                     const GeneratorOptions& options, int64_t& runningTotal) {
  Bytes r = NewEditingRecord(schema);
  std::string name = Cp1252(std::string(Pick(kFirstNames, rng)) + " " +
                            std::string(Pick(kLastNames, rng)));
  if (rng() % 20 == 0) name += ", Jr.";
  SetEditingText(r, kName, name, schema);

  const int32_t quantity = static_cast<int32_t>(rng() % 101000) - 1000;
  SetEditingNumber(r, kQuantity, static_cast<uint32_t>(quantity), schema);
  const uint32_t cents = rng() % 1000000;
  char price[32];
  std::snprintf(price, sizeof price, "%u.%02u", cents / 100, cents % 100);
  SetEditingText(r, kPrice, price, schema);

  SetEditingByte(r, kColor, rng() % 20 == 0 ? format::kNoPopupValue : rng() % kColors.size(), schema);
  SetEditingByte(r, kPaid, rng() % 2, schema);
  SetEditingNumber(r, kId, static_cast<uint32_t>(index + 1), schema);

  if (options.pictureEvery != 0 && index % options.pictureEvery == options.pictureEvery - 1) {
    std::span<uint8_t> picture = EditingSlot(r, kPhoto);
    for (size_t i = 0; i < picture.size(); ++i) picture[i] = static_cast<uint8_t>(rng());
    if (!picture.empty()) picture[0] = 1;
  }

  SetEditingNumber(r, kBorn, rng() % 30 == 0 ? 0 : 20000 + rng() % 25000, schema);
  std::span<uint8_t> at = EditingSlot(r, kAt);
  at[0] = static_cast<uint8_t>(rng() % 60);
  at[1] = static_cast<uint8_t>(rng() % 60);
  at[2] = rng() % 30 == 0 ? format::kNoTimeHours : static_cast<uint8_t>(rng() % 24);
  at[3] = 0;

  SetEditingNumber(r, kCustomer, 1 + rng() % 1000, schema);
  std::span<uint8_t> order = EditingSlot(r, kOrder);
  const uint32_t orderNumber = 1 + rng() % 5000;
  for (int i = 0; i < 4; ++i) order[i] = static_cast<uint8_t>(orderNumber >> (8 * i));
  SetEditingText(r, kOrder, "Order " + std::to_string(orderNumber), schema);

  SetEditingText(r, kNotes, NoteText(rng, options.maxNoteLength), schema);
  SetEditingText(r, kSupplier, std::string(Pick(kSuppliers, rng)), schema);

  char total[32];
  std::snprintf(total, sizeof total, "%.2f", quantity * (cents / 100.0));
  SetEditingText(r, kTotal, total, schema);
  runningTotal += quantity;
  SetEditingText(r, kRunning, std::to_string(runningTotal), schema);

  SetEditingText(r, kCity, std::string(Pick(kCities, rng)), schema);
  SetEditingNumber(r, kRating, 1 + rng() % 5, schema);
  return Compact(r, schema);
}

Database GenerateDatabase(const std::string& path, const GeneratorOptions& options) {
  Database db = Database::CreateNew(path, "Generated");
  db.schema() = GeneratedSchema(options.extension);
  db.popups() = GeneratedPopups();
  std::mt19937 rng(options.seed);
  int64_t running = 0;
  const size_t count = std::min(options.records, static_cast<size_t>(format::kMaxDataRecords));
  db.table().reserve(count);
  for (size_t i = 0; i < count; ++i) {
    db.AppendRecord(GenerateRecord(db.schema(), i, rng, options, running), 0,
                    static_cast<uint32_t>((i + 1) & 0xFFFFFF));
  }
  db.ClearChanged();
  return db;
}

Status GenerateFile(const std::string& path, const GeneratorOptions& options, const Clock& clock) {
  Database db = GenerateDatabase(path, options);
  return db.SaveAs(path, clock);
}

}  // namespace cx::bench
