#pragma once

#include <algorithm>
#include <cstdint>

namespace Tarsa {

// Plain integer geometry of the framework: a point, a size and a rectangle
// (left, top, right, bottom; right and bottom exclusive, y downwards). Values,
// freely copied; all operations are inline and never allocate.
struct CPoint {
  std::int32_t x = 0;
  std::int32_t y = 0;
  friend bool operator==(const CPoint&, const CPoint&) = default;
};

struct CSize {
  std::int32_t width = 0;
  std::int32_t height = 0;
  friend bool operator==(const CSize&, const CSize&) = default;
};

struct CRect {
  std::int32_t left = 0;
  std::int32_t top = 0;
  std::int32_t right = 0;
  std::int32_t bottom = 0;

  // Widths in 64 bits: a rectangle may span the whole 32-bit range.
  std::int64_t Width() const { return std::int64_t(right) - left; }
  std::int64_t Height() const { return std::int64_t(bottom) - top; }
  bool IsEmpty() const { return right <= left || bottom <= top; }
  bool Contains(const CRect& inner) const {
    return inner.left >= left && inner.top >= top && inner.right <= right && inner.bottom <= bottom;
  }
  // The common part; an empty rectangle when there is none.
  CRect Intersect(const CRect& other) const {
    CRect r{std::max(left, other.left), std::max(top, other.top), std::min(right, other.right),
            std::min(bottom, other.bottom)};
    if (r.IsEmpty()) return CRect{};
    return r;
  }
  // Moved by (dx, dy); coordinates saturate at the ends of the 32-bit range,
  // so that a host's wild values cannot overflow.
  CRect Offset(std::int32_t dx, std::int32_t dy) const {
    return CRect{Saturate(std::int64_t(left) + dx), Saturate(std::int64_t(top) + dy),
                 Saturate(std::int64_t(right) + dx), Saturate(std::int64_t(bottom) + dy)};
  }
  static std::int32_t Saturate(std::int64_t v) {
    return std::int32_t(std::clamp<std::int64_t>(v, INT32_MIN, INT32_MAX));
  }
  friend bool operator==(const CRect&, const CRect&) = default;
};

}  // namespace Tarsa
