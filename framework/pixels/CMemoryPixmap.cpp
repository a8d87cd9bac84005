#include "framework/pixels/CMemoryPixmap.h"

#include <limits>
#include <new>
#include <stdexcept>

#include "framework/core/CException.h"

namespace Tarsa {

namespace {
constexpr const char* kOutOfMemoryText =
    "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";

CRect Collapsed(const CRect& bounds) {
  return bounds.IsEmpty() ? CRect{bounds.left, bounds.top, bounds.left, bounds.top} : bounds;
}
}  // namespace

CMemoryPixmap::CMemoryPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth)
    : CBasicPixmap(Collapsed(bounds), planes, depth) {
  if (bounds.IsEmpty()) return;
  const std::uint64_t rowBytes = (std::uint64_t(bounds.Width()) * (depth / 8) + 3) & ~3ull;
  const std::uint64_t height = std::uint64_t(bounds.Height());
  if (rowBytes > std::numeric_limits<std::size_t>::max() / height) throw CError(kOutOfMemoryText);
  std::vector<std::uint8_t*> origins;
  try {
    planeData_.resize(planes);
    for (auto& plane : planeData_) {
      plane.assign(std::size_t(rowBytes * height), 0);
      origins.push_back(plane.data());
    }
  } catch (const std::bad_alloc&) {
    throw CError(kOutOfMemoryText);
  } catch (const std::length_error&) {
    throw CError(kOutOfMemoryText);
  }
  SetLayout(std::move(origins), std::size_t(rowBytes), depth / 8);
}

}  // namespace Tarsa
