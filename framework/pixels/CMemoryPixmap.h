#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "framework/pixels/CBasicPixmap.h"

namespace Tarsa {

// A planar image in memory that owns its samples: each plane in a buffer of
// its own, with rows of RowBytes() bytes (the row's samples rounded up to a
// multiple of 4 bytes), samples of 8, 16 or 32 bits. A fresh pixmap is all
// zeros unless it is made with its contents unset. This is the pixmap that goes to and from the
// host, one tile at a time.
class CMemoryPixmap : public CBasicPixmap {
 public:
  // Throws CError for a depth other than 8, 16 or 32, and the out-of-memory
  // CError when the planes cannot be had. An empty rectangle holds nothing.
  CMemoryPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth);

  // Whether the samples start as zeros. A pixmap that is written whole
  // before it is read skips the clearing.
  enum class Contents { kZeros, kUnset };
  CMemoryPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth, Contents contents);

 private:
  std::vector<std::unique_ptr<std::uint8_t[]>> planeData_;
};

}  // namespace Tarsa
