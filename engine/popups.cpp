#include "engine/popups.h"

#include "engine/record_reader.h"

namespace cx {

std::vector<std::string> ReadPopupItems(std::span<const uint8_t> record) {
  std::vector<std::string> items;
  size_t i = 0;
  while (i < record.size() && items.size() < format::kMaxPopupItems) {
    if (record[i] == 0) break;  // an empty text here is the second zero in a row
    size_t start = i;
    while (i < record.size() && record[i] != 0) ++i;
    items.emplace_back(reinterpret_cast<const char*>(record.data() + start), i - start);
    ++i;  // the separator (or the end of an unterminated last text)
  }
  return items;
}

size_t PopupRecordSize(const std::vector<std::string>& items) {
  size_t size = 3;
  for (const auto& item : items) {
    if (!item.empty()) size += item.size() + 1;
  }
  return size;
}

std::vector<uint8_t> WritePopupItems(const std::vector<std::string>& items) {
  std::vector<uint8_t> out;
  out.reserve(PopupRecordSize(items));
  for (const auto& item : items) {
    if (item.empty()) continue;
    out.insert(out.end(), item.begin(), item.end());
    out.push_back(0);
  }
  out.insert(out.end(), 3, 0);
  return out;
}

PopupList DecodePopupList(std::span<const uint8_t> record, uint8_t attributes, uint32_t uniqueID) {
  PopupList list;
  list.items = ReadPopupItems(record);
  list.attributes = attributes;
  list.uniqueID = uniqueID;
  list.original.assign(record.begin(), record.end());
  list.originalItems = list.items;
  list.fromFile = true;
  return list;
}

std::vector<uint8_t> PopupList::Encode() const {
  if (fromFile && items == originalItems) return original;
  return WritePopupItems(items);
}

size_t PopupList::EncodedSize() const {
  if (fromFile && items == originalItems) return original.size();
  return PopupRecordSize(items);
}

std::string PopupText(const PopupList& list, int itemIndex) {
  return std::string(PopupTextView(list, itemIndex));
}

std::string_view PopupTextView(const PopupList& list, int itemIndex) {
  if (itemIndex == format::kNoPopupValue || itemIndex == -1) return "No Value";
  if (itemIndex < 0 || static_cast<size_t>(itemIndex) >= list.items.size()) return {};
  return std::string_view(list.items[itemIndex]).substr(0, format::kMaxPopupText);
}

int PopupItemText(const std::string& databasePath, int fieldSlot, int itemIndex,
                  std::string& text, size_t maxLength) {
  text.clear();
  if (itemIndex == format::kNoPopupValue || itemIndex == -1) {
    text = std::string("No Value").substr(0, maxLength);
    return 0;
  }
  if (fieldSlot < 0 || fieldSlot >= format::kPopupRecords || itemIndex < 0) return -1;
  std::vector<uint8_t> record;
  if (!ReadRecordAt(databasePath, 1 + fieldSlot, record)) return -1;
  std::vector<std::string> items = ReadPopupItems(record);
  if (static_cast<size_t>(itemIndex) >= items.size()) return -1;
  text = items[itemIndex].substr(0, maxLength);
  return 0;
}

}  // namespace cx
