// Popup lists (records 1 to 30): one list of up to 60 item texts per field
// slot.
#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "engine/format.h"

namespace cx {

struct PopupList {
  std::vector<std::string> items;  // 8-bit texts, at most 79 characters each
  uint8_t attributes = 0;          // the record entry's, kept as read
  uint32_t uniqueID = 0;
  // The record as read, with the items it decoded to. A list that is still
  // those items is written back as these bytes, so a record that another
  // program laid out differently (more than 60 items, texts longer than 79
  // characters, other padding) survives a save unchanged.
  std::vector<uint8_t> original;
  std::vector<std::string> originalItems;
  bool fromFile = false;

  // The record to write for this list.
  std::vector<uint8_t> Encode() const;
  size_t EncodedSize() const;
  bool operator==(const PopupList&) const = default;
};

using PopupLists = std::array<PopupList, format::kPopupRecords>;

// Decodes a popup record: items separated by single zero bytes, two zero
// bytes in a row (or the end of the record) end the list; at most 60 items
// are kept. Texts are kept whole; displays cut them to 79 characters.
std::vector<std::string> ReadPopupItems(std::span<const uint8_t> record);

// Encodes a list: each non-empty item and a zero byte, then three zero
// bytes.
std::vector<uint8_t> WritePopupItems(const std::vector<std::string>& items);
// The size WritePopupItems will produce.
size_t PopupRecordSize(const std::vector<std::string>& items);

// Decodes a record into a list, remembering the original bytes.
PopupList DecodePopupList(std::span<const uint8_t> record, uint8_t attributes, uint32_t uniqueID);

// The text of item `itemIndex` of list `list`, cut to 79 characters; 255
// (or -1) is "No Value", an index past the end gives an empty text.
std::string PopupText(const PopupList& list, int itemIndex);
// The same text as a view into `list` (or a constant), valid while the
// list is unchanged.
std::string_view PopupTextView(const PopupList& list, int itemIndex);

// PopupItemText: reads the list of `fieldSlot` from a database file that is
// not loaded. 0 when the item was found (or is "No Value"), -1 otherwise
// (then `text` is empty). The text is cut to `maxLength` characters.
int PopupItemText(const std::string& databasePath, int fieldSlot, int itemIndex,
                  std::string& text, size_t maxLength = format::kMaxPopupText);

}  // namespace cx
