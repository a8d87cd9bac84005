#pragma once

#include <cstddef>
#include <cstdint>

#include "framework/core/CRect.h"

namespace Tarsa {

// An image of one or more planes over a rectangle of some 32-bit
// coordinate space, samples of Depth() bits each, addressed in the
// rectangle's own coordinates. This is what the pixel stages read and write
// without caring where the samples live: in memory the pixmap owns, in
// memory someone else owns, or in tiles on the virtual heap. Rows pass
// through caller buffers, one sample after another at BytesPerSample()
// (one byte a sample for depths below 8); 32-bit samples go as their bits.
// Moving the origin keeps the samples.
class CPixmap {
 public:
  virtual ~CPixmap() = default;
  CPixmap(const CPixmap&) = delete;
  CPixmap& operator=(const CPixmap&) = delete;

  const CRect& Bounds() const { return bounds_; }
  std::uint32_t Planes() const { return planes_; }
  std::uint32_t Depth() const { return depth_; }
  // 0 for depths below 8.
  std::uint32_t BytesPerSample() const { return depth_ / 8; }
  // The room one sample takes in a row buffer.
  std::size_t RowSampleBytes() const { return depth_ < 8 ? 1 : depth_ / 8; }

  virtual void MoveTo(CPoint origin);

  // The point must lie in Bounds() and the plane below Planes().
  virtual std::uint32_t Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const = 0;
  virtual void SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y,
                         std::uint32_t value) = 0;
  // count samples of a row from (x, y) rightwards; the run must lie in
  // Bounds(), else the CError for an area outside the pixmap.
  virtual void ReadRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                       void* out) const;
  virtual void WriteRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                        const void* in);
  // Sets every sample of area (clipped to Bounds()) of one plane to value.
  virtual void Fill(std::uint32_t plane, const CRect& area, std::uint32_t value);

  // Copies area (clipped to both rectangles) of the planes both pixmaps
  // have, in this pixmap's coordinates; CError when the depths differ.
  void CopyFrom(const CPixmap& source, const CRect& area);

 protected:
  CPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth);
  void SetBounds(const CRect& bounds) { bounds_ = bounds; }
  // CError unless the run of a row lies in the pixmap.
  void CheckRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count) const;
  // One sample of 1, 2 or 4 bytes in memory, in the machine's order.
  static std::uint32_t LoadBytes(const std::uint8_t* at, std::size_t bytes);
  static void StoreBytes(std::uint8_t* at, std::size_t bytes, std::uint32_t value);

 private:
  CRect bounds_;
  std::uint32_t planes_;
  std::uint32_t depth_;
};

}  // namespace Tarsa
