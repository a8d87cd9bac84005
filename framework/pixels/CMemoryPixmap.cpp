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
    : CMemoryPixmap(bounds, planes, depth, Contents::kZeros) {}

CMemoryPixmap::CMemoryPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth,
                             Contents contents)
    : CBasicPixmap(Collapsed(bounds), planes, depth) {
  if (bounds.IsEmpty()) return;
  const std::uint64_t rowBytes = (std::uint64_t(bounds.Width()) * (depth / 8) + 3) & ~3ull;
  const std::uint64_t height = std::uint64_t(bounds.Height());
  if (rowBytes > std::numeric_limits<std::size_t>::max() / height) throw CError(kOutOfMemoryText);
  const auto size = std::size_t(rowBytes * height);
  std::vector<std::uint8_t*> origins;
  try {
    planeData_.reserve(planes);
    for (std::uint32_t k = 0; k < planes; ++k) {
      planeData_.push_back(contents == Contents::kZeros
                               ? std::make_unique<std::uint8_t[]>(size)
                               : std::make_unique_for_overwrite<std::uint8_t[]>(size));
      origins.push_back(planeData_.back().get());
    }
  } catch (const std::bad_alloc&) {
    throw CError(kOutOfMemoryText);
  } catch (const std::length_error&) {
    throw CError(kOutOfMemoryText);
  }
  SetLayout(std::move(origins), std::size_t(rowBytes), depth / 8);
}

}  // namespace Tarsa
