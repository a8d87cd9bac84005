#include "workspace/ScreenGeometry.h"

#include <algorithm>

namespace Project {

void ScreenBounds::Widen(Point2f p) {
  if (empty) {
    *this = {p.x, p.y, p.x, p.y, false};
    return;
  }
  left = std::min(left, p.x);
  top = std::min(top, p.y);
  right = std::max(right, p.x);
  bottom = std::max(bottom, p.y);
}

void ScreenBounds::Merge(const ScreenBounds& other) {
  if (other.empty) return;
  Widen({other.left, other.top});
  Widen({other.right, other.bottom});
}

}  // namespace Project
