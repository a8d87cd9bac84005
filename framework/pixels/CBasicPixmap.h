#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "framework/pixels/CPixmap.h"

namespace Tarsa {

// A pixmap whose samples lie in plain memory at fixed strides: each plane
// has the address of its top left sample, rows lie RowBytes() apart and
// samples ColumnBytes() apart, so planar and interleaved layouts alike can
// be described. Samples are 8, 16 or 32 bits. Constructed from addresses,
// it wraps memory that someone else owns and must keep alive; derived
// pixmaps own their memory and describe it through SetLayout().
class CBasicPixmap : public CPixmap {
 public:
  // CError for a depth other than 8, 16 or 32.
  CBasicPixmap(const CRect& bounds, std::uint32_t depth, std::vector<std::uint8_t*> planeOrigins,
               std::size_t rowBytes, std::size_t columnBytes);

  std::size_t RowBytes() const { return rowBytes_; }
  std::size_t ColumnBytes() const { return columnBytes_; }

  // The sample at (x, y) of a plane; the point must lie in Bounds().
  std::uint8_t* Address(std::uint32_t plane, std::int32_t x, std::int32_t y);
  const std::uint8_t* Address(std::uint32_t plane, std::int32_t x, std::int32_t y) const;

  std::uint32_t Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const override;
  void SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t value) override;
  void ReadRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
               void* out) const override;
  void WriteRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                const void* in) override;
  void Fill(std::uint32_t plane, const CRect& area, std::uint32_t value) override;

 protected:
  // Checks the depth; the layout follows through SetLayout().
  CBasicPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth);
  void SetLayout(std::vector<std::uint8_t*> planeOrigins, std::size_t rowBytes,
                 std::size_t columnBytes);

 private:
  std::vector<std::uint8_t*> planeOrigins_;
  std::size_t rowBytes_ = 0;
  std::size_t columnBytes_ = 0;
};

}  // namespace Tarsa
