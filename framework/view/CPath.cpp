#include "framework/view/CPath.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace Tarsa {

void CPath::MoveTo(CPointF p) { elements_.push_back({.verb = EVerb::kMove, .point = p}); }

void CPath::LineTo(CPointF p) { elements_.push_back({.verb = EVerb::kLine, .point = p}); }

void CPath::Arc(CPointF centre, double radius, double from, double to) {
  elements_.push_back(
      {.verb = EVerb::kArc, .point = centre, .radius = radius, .from = from, .to = to});
}

void CPath::Close() { elements_.push_back({.verb = EVerb::kClose, .point = {}}); }

void CPath::AddPolyline(std::span<const CPointF> points, bool closed) {
  if (points.empty()) return;
  MoveTo(points.front());
  for (const CPointF& p : points.subspan(1)) LineTo(p);
  if (closed) Close();
}

void CPath::AddRectangle(CPointF topLeft, CPointF bottomRight) {
  const CPointF corners[] = {
      topLeft, {bottomRight.x, topLeft.y}, bottomRight, {topLeft.x, bottomRight.y}};
  AddPolyline(corners, true);
}

void CPath::AddCircle(CPointF centre, double radius) {
  // A subpath of its own, not joined to whatever came before.
  MoveTo({centre.x + radius, centre.y});
  Arc(centre, radius, 0.0, 2 * std::numbers::pi);
  Close();
}

bool CPath::Bounds(CPointF& outMin, CPointF& outMax) const {
  if (elements_.empty()) return false;
  CPointF lo{INFINITY, INFINITY}, hi{-INFINITY, -INFINITY};
  auto widen = [&](CPointF p) {
    lo = {std::min(lo.x, p.x), std::min(lo.y, p.y)};
    hi = {std::max(hi.x, p.x), std::max(hi.y, p.y)};
  };
  for (const CElement& e : elements_) {
    if (e.verb == EVerb::kMove || e.verb == EVerb::kLine) {
      widen(e.point);
    } else if (e.verb == EVerb::kArc) {
      auto at = [&](double a) {
        return CPointF{e.point.x + e.radius * std::cos(a), e.point.y + e.radius * std::sin(a)};
      };
      const double low = std::min(e.from, e.to), high = std::max(e.from, e.to);
      widen(at(low));
      widen(at(high));
      // The quarter-turn angles the sweep passes are its extremes.
      constexpr double kQuarter = std::numbers::pi / 2;
      for (double a = std::ceil(low / kQuarter) * kQuarter; a < high; a += kQuarter) widen(at(a));
    }
  }
  if (!(lo.x <= hi.x)) return false;  // only closes
  outMin = lo;
  outMax = hi;
  return true;
}

}  // namespace Tarsa
