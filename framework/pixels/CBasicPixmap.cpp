#include "framework/pixels/CBasicPixmap.h"

#include <cstring>
#include <utility>

#include "framework/core/CException.h"

namespace Tarsa {

namespace {
constexpr const char* kBadDepthText =
    "$$$/Tarsa/Pixmap/Error/Depth=The image has a sample depth the program cannot handle.";

std::uint32_t CheckedDepth(std::uint32_t depth) {
  if (depth != 8 && depth != 16 && depth != 32) throw CError(kBadDepthText);
  return depth;
}
}  // namespace

CBasicPixmap::CBasicPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth)
    : CPixmap(bounds, planes, CheckedDepth(depth)) {}

CBasicPixmap::CBasicPixmap(const CRect& bounds, std::uint32_t depth,
                           std::vector<std::uint8_t*> planeOrigins, std::size_t rowBytes,
                           std::size_t columnBytes)
    : CPixmap(bounds, std::uint32_t(planeOrigins.size()), CheckedDepth(depth)) {
  SetLayout(std::move(planeOrigins), rowBytes, columnBytes);
}

void CBasicPixmap::SetLayout(std::vector<std::uint8_t*> planeOrigins, std::size_t rowBytes,
                             std::size_t columnBytes) {
  planeOrigins_ = std::move(planeOrigins);
  rowBytes_ = rowBytes;
  columnBytes_ = columnBytes;
}

std::uint8_t* CBasicPixmap::Address(std::uint32_t plane, std::int32_t x, std::int32_t y) {
  return planeOrigins_[plane] + std::size_t(std::int64_t(y) - Bounds().top) * rowBytes_ +
         std::size_t(std::int64_t(x) - Bounds().left) * columnBytes_;
}

const std::uint8_t* CBasicPixmap::Address(std::uint32_t plane, std::int32_t x,
                                          std::int32_t y) const {
  return const_cast<CBasicPixmap*>(this)->Address(plane, x, y);
}

std::uint32_t CBasicPixmap::Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const {
  return LoadBytes(Address(plane, x, y), BytesPerSample());
}

void CBasicPixmap::SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y,
                             std::uint32_t value) {
  StoreBytes(Address(plane, x, y), BytesPerSample(), value);
}

void CBasicPixmap::ReadRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                           void* out) const {
  CheckRow(plane, x, y, count);
  if (count == 0) return;
  const std::size_t size = BytesPerSample();
  const std::uint8_t* from = Address(plane, x, y);
  auto* to = static_cast<std::uint8_t*>(out);
  if (columnBytes_ == size) {
    std::memcpy(to, from, count * size);
    return;
  }
  for (std::uint32_t i = 0; i < count; ++i)
    std::memcpy(to + i * size, from + i * columnBytes_, size);
}

void CBasicPixmap::WriteRow(std::uint32_t plane, std::int32_t x, std::int32_t y,
                            std::uint32_t count, const void* in) {
  CheckRow(plane, x, y, count);
  if (count == 0) return;
  const std::size_t size = BytesPerSample();
  std::uint8_t* to = Address(plane, x, y);
  const auto* from = static_cast<const std::uint8_t*>(in);
  if (columnBytes_ == size) {
    std::memcpy(to, from, count * size);
    return;
  }
  for (std::uint32_t i = 0; i < count; ++i)
    std::memcpy(to + i * columnBytes_, from + i * size, size);
}

void CBasicPixmap::Fill(std::uint32_t plane, const CRect& area, std::uint32_t value) {
  const CRect r = area.Intersect(Bounds());
  if (r.IsEmpty() || plane >= Planes()) return;
  if (Depth() == 8 && columnBytes_ == 1) {
    for (std::int32_t y = r.top; y < r.bottom; ++y) {
      std::memset(Address(plane, r.left, y), int(value & 0xFF), std::size_t(r.Width()));
    }
    return;
  }
  for (std::int32_t y = r.top; y < r.bottom; ++y) {
    for (std::int32_t x = r.left; x < r.right; ++x) SetSample(plane, x, y, value);
  }
}

}  // namespace Tarsa
