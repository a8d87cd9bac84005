#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "framework/pixels/CBasicPixmap.h"

namespace Tarsa {

// A memory surface for the screen and for drawing into: whole pixels of 8,
// 24 or 32 bits, interleaved, in rows of RowBytes() (a multiple of 4), at
// (0, 0, width, height). Each byte of a pixel is a plane of 8-bit samples,
// in memory order, so the stages can fill it like any pixmap and a drawing
// library or graphics context can take Data() as it is. Owns its bytes; a
// fresh surface is all zeros. Putting it on screen belongs to the ports that
// draw, not to the pixmap.
class CDisplayPixmap : public CBasicPixmap {
 public:
  // CError for another depth, the out-of-memory CError when the bytes
  // cannot be had; negative sizes count as 0.
  CDisplayPixmap(std::uint32_t depth, std::int32_t width, std::int32_t height);

  std::uint32_t PixelBits() const { return Planes() * 8; }
  std::uint8_t* Data() { return bytes_.data(); }
  const std::uint8_t* Data() const { return bytes_.data(); }

 private:
  std::vector<std::uint8_t> bytes_;
};

}  // namespace Tarsa
