#include "framework/pixels/CDisplayPixmap.h"

#include <algorithm>
#include <new>

#include "framework/core/CException.h"

namespace Tarsa {

namespace {
constexpr const char* kBadDepthText =
    "$$$/Tarsa/Pixmap/Error/Depth=The image has a sample depth the program cannot handle.";
constexpr const char* kOutOfMemoryText =
    "$$$/Tarsa/Memory/Error/OutOfMemory=There is not enough memory.";

std::uint32_t PlanesOf(std::uint32_t depth) {
  if (depth != 8 && depth != 24 && depth != 32) throw CError(kBadDepthText);
  return depth / 8;
}
}  // namespace

CDisplayPixmap::CDisplayPixmap(std::uint32_t depth, std::int32_t width, std::int32_t height)
    : CBasicPixmap(CRect{0, 0, std::max(width, 0), std::max(height, 0)}, PlanesOf(depth), 8) {
  const std::size_t pixelBytes = Planes();
  const std::size_t rowBytes = (std::size_t(Bounds().Width()) * pixelBytes + 3) & ~std::size_t(3);
  try {
    bytes_.assign(rowBytes * std::size_t(Bounds().Height()), 0);
  } catch (const std::bad_alloc&) {
    throw CError(kOutOfMemoryText);
  }
  std::vector<std::uint8_t*> origins(pixelBytes, nullptr);
  if (!bytes_.empty()) {
    for (std::size_t k = 0; k < pixelBytes; ++k) origins[k] = bytes_.data() + k;
  }
  SetLayout(std::move(origins), rowBytes, pixelBytes);
}

}  // namespace Tarsa
