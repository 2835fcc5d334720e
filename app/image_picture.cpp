#include "app/image_picture.h"

#include <algorithm>
#include <cstdlib>

namespace cx {
namespace {

bool Inside(const Bytes& picture, int x, int y) {
  return picture.size() >= kPictureBytes && x >= 0 && y >= 0 && x < kPictureWidth && y < kPictureHeight;
}

size_t ByteOf(int x, int y) { return 1 + static_cast<size_t>(y) * kPictureRowBytes + static_cast<size_t>(x) / 8; }
uint8_t BitOf(int x) { return static_cast<uint8_t>(0x80 >> (x % 8)); }

}  // namespace

Bytes NewPicture() {
  Bytes picture(kPictureBytes, 0);
  picture[0] = 1;
  return picture;
}

bool PictureInk(const Bytes& picture, int x, int y) {
  return Inside(picture, x, y) && (picture[ByteOf(x, y)] & BitOf(x)) != 0;
}

void SetPictureInk(Bytes& picture, int x, int y, bool ink) {
  if (!Inside(picture, x, y)) return;
  uint8_t& b = picture[ByteOf(x, y)];
  b = ink ? static_cast<uint8_t>(b | BitOf(x)) : static_cast<uint8_t>(b & ~BitOf(x));
}

void DrawPictureLine(Bytes& picture, int x0, int y0, int x1, int y1, bool ink) {
  // Bresenham: a fast stroke of the mouse still leaves a connected line.
  const int dx = std::abs(x1 - x0);
  const int dy = -std::abs(y1 - y0);
  const int sx = x0 < x1 ? 1 : -1;
  const int sy = y0 < y1 ? 1 : -1;
  int err = dx + dy;
  for (int steps = 0; steps <= dx - dy; ++steps) {
    SetPictureInk(picture, x0, y0, ink);
    if (x0 == x1 && y0 == y1) break;
    const int e2 = 2 * err;
    if (e2 >= dy) {
      err += dy;
      x0 += sx;
    }
    if (e2 <= dx) {
      err += dx;
      y0 += sy;
    }
  }
}

bool PictureIsBlank(const Bytes& picture) {
  if (picture.size() < kPictureBytes) return true;
  return std::all_of(picture.begin() + 1, picture.begin() + kPictureBytes, [](uint8_t b) { return b == 0; });
}

}  // namespace cx
