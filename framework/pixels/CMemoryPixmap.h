#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "framework/core/CRect.h"

namespace Tarsa {

// A planar image in memory: a rectangle in some 32-bit coordinate space, a
// number of planes, and samples of 8, 16 or 32 bits, each plane in a buffer
// of its own with rows of RowBytes() bytes (the row's samples rounded up to
// a multiple of 4 bytes). Samples are addressed in the rectangle's own
// coordinates. The pixmap owns its buffers; moving its origin keeps them.
// This is the plain pixmap that the pixel stages build on.
class CMemoryPixmap {
 public:
  // Throws CError for a depth other than 8, 16 or 32, and the out-of-memory
  // CError when the planes cannot be had. An empty rectangle holds nothing.
  CMemoryPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth);
  CMemoryPixmap(const CMemoryPixmap&) = delete;
  CMemoryPixmap& operator=(const CMemoryPixmap&) = delete;

  const CRect& Bounds() const { return bounds_; }
  std::uint32_t Planes() const { return planes_; }
  std::uint32_t Depth() const { return depth_; }
  std::uint32_t BytesPerSample() const { return depth_ / 8; }
  std::size_t RowBytes() const { return rowBytes_; }

  // Keeps the samples, moves the rectangle's top left corner to origin.
  void MoveTo(CPoint origin);

  // The sample at (x, y) of a plane; the point must lie in Bounds().
  std::uint8_t* Address(std::uint32_t plane, std::int32_t x, std::int32_t y);
  const std::uint8_t* Address(std::uint32_t plane, std::int32_t x, std::int32_t y) const;

  // A sample as an integer (32-bit samples as their bits).
  std::uint32_t Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const;
  void SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t value);
  // Sets every sample of area (clipped to Bounds()) of one plane to value.
  void Fill(std::uint32_t plane, const CRect& area, std::uint32_t value);

 private:
  CRect bounds_;
  std::uint32_t planes_;
  std::uint32_t depth_;
  std::size_t rowBytes_ = 0;
  std::vector<std::vector<std::uint8_t>> planeData_;
};

}  // namespace Tarsa
