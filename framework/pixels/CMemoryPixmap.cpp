#include "framework/pixels/CMemoryPixmap.h"

#include <cstring>
#include <limits>
#include <new>
#include <stdexcept>

#include "framework/core/CException.h"

namespace Tarsa {

namespace {
constexpr const char* kOutOfMemoryText =
    "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";
constexpr const char* kBadDepthText =
    "$$$/Tarsa/Pixmap/Error/Depth=The image has a sample depth the program cannot handle.";
}  // namespace

CMemoryPixmap::CMemoryPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth)
    : bounds_(bounds), planes_(planes), depth_(depth) {
  if (depth != 8 && depth != 16 && depth != 32) throw CError(kBadDepthText);
  if (bounds.IsEmpty()) {
    bounds_ = CRect{bounds.left, bounds.top, bounds.left, bounds.top};
    return;
  }
  const std::uint64_t rowBytes = (std::uint64_t(bounds.Width()) * (depth / 8) + 3) & ~3ull;
  const std::uint64_t height = std::uint64_t(bounds.Height());
  if (rowBytes > std::numeric_limits<std::size_t>::max() / height) throw CError(kOutOfMemoryText);
  rowBytes_ = std::size_t(rowBytes);
  try {
    planeData_.resize(planes);
    for (auto& plane : planeData_) plane.assign(rowBytes_ * height, 0);
  } catch (const std::bad_alloc&) {
    throw CError(kOutOfMemoryText);
  } catch (const std::length_error&) {
    throw CError(kOutOfMemoryText);
  }
}

void CMemoryPixmap::MoveTo(CPoint origin) {
  bounds_ = bounds_.Offset(origin.x - bounds_.left, origin.y - bounds_.top);
}

std::uint8_t* CMemoryPixmap::Address(std::uint32_t plane, std::int32_t x, std::int32_t y) {
  return planeData_[plane].data() + std::size_t(std::int64_t(y) - bounds_.top) * rowBytes_ +
         std::size_t(std::int64_t(x) - bounds_.left) * BytesPerSample();
}

const std::uint8_t* CMemoryPixmap::Address(std::uint32_t plane, std::int32_t x,
                                           std::int32_t y) const {
  return const_cast<CMemoryPixmap*>(this)->Address(plane, x, y);
}

std::uint32_t CMemoryPixmap::Sample(std::uint32_t plane, std::int32_t x, std::int32_t y) const {
  const std::uint8_t* at = Address(plane, x, y);
  switch (depth_) {
    case 8:
      return *at;
    case 16: {
      std::uint16_t v;
      std::memcpy(&v, at, 2);
      return v;
    }
    default: {
      std::uint32_t v;
      std::memcpy(&v, at, 4);
      return v;
    }
  }
}

void CMemoryPixmap::SetSample(std::uint32_t plane, std::int32_t x, std::int32_t y,
                              std::uint32_t value) {
  std::uint8_t* at = Address(plane, x, y);
  switch (depth_) {
    case 8:
      *at = std::uint8_t(value);
      break;
    case 16: {
      const auto v = std::uint16_t(value);
      std::memcpy(at, &v, 2);
      break;
    }
    default:
      std::memcpy(at, &value, 4);
      break;
  }
}

void CMemoryPixmap::Fill(std::uint32_t plane, const CRect& area, std::uint32_t value) {
  const CRect r = area.Intersect(bounds_);
  if (r.IsEmpty() || plane >= planes_) return;
  for (std::int32_t y = r.top; y < r.bottom; ++y) {
    if (depth_ == 8) {
      std::memset(Address(plane, r.left, y), int(value & 0xFF), std::size_t(r.Width()));
      continue;
    }
    for (std::int32_t x = r.left; x < r.right; ++x) SetSample(plane, x, y, value);
  }
}

}  // namespace Tarsa
