// The picture an Image field holds (2001 bytes): a header byte that is
// nonzero when a picture is present, then a 160 x 100 one-bit bitmap, rows
// from the top, 20 bytes a row, the leftmost pixel in the high bit of each
// byte, a set bit drawn in ink. docs/file-format.md describes the layout.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engine/record.h"

namespace cx {

inline constexpr int kPictureWidth = 160;
inline constexpr int kPictureHeight = 100;
inline constexpr size_t kPictureRowBytes = kPictureWidth / 8;
inline constexpr size_t kPictureBytes = 1 + kPictureRowBytes * kPictureHeight;  // 2001

// A present, empty picture (header byte 1, no ink).
Bytes NewPicture();
// Pixels outside the bitmap read as no ink and are not written.
bool PictureInk(const Bytes& picture, int x, int y);
void SetPictureInk(Bytes& picture, int x, int y, bool ink);
// Every pixel on the line from (x0, y0) to (x1, y1), ends included.
void DrawPictureLine(Bytes& picture, int x0, int y0, int x1, int y1, bool ink);
// True when no pixel holds ink.
bool PictureIsBlank(const Bytes& picture);

}  // namespace cx
