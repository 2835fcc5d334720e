// The ".cxm" payload: several data records in one object. docs/file-format.md
// describes the layout.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace cx::obex {

constexpr uint8_t kRecordSetSignature[4] = {'C', 'X', 'M', '1'};
constexpr size_t kRecordSetHeaderSize = 6;  // signature, u16 record count

// Packs `records` (each at most 65529 bytes) into as few ".cxm" bodies as
// the 16-bit object size allows, keeping their order. False when a record
// is too large to travel at all.
bool PackRecordSets(const std::vector<std::span<const uint8_t>>& records,
                    std::vector<std::vector<uint8_t>>& bodies);

// Reads a ".cxm" body. False, with `records` empty, unless the signature
// is right, the count is at least 1, every size fits in what is left and
// nothing follows the last record.
bool UnpackRecordSet(std::span<const uint8_t> body, std::vector<std::vector<uint8_t>>& records);

}  // namespace cx::obex
