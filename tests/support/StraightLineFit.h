#pragma once

#include <cmath>
#include <cstddef>

namespace Project::testing {

// The total least-squares line through a set of points (anything with x and
// y), and the points' perpendicular distances to it: how straight the
// tests find a line that should be.
struct StraightLineFit {
  double centerX = 0.0;
  double centerY = 0.0;
  double angle = 0.0;  // radians, of the direction to the x axis, in (-pi/2, pi/2]
  double maxDeviation = 0.0;
  double rms = 0.0;
  std::size_t points = 0;
};

template <typename Points>
StraightLineFit FitStraightLine(const Points& points) {
  StraightLineFit fit;
  fit.points = points.size();
  if (points.size() < 2) return fit;
  for (const auto& p : points) {
    fit.centerX += p.x;
    fit.centerY += p.y;
  }
  fit.centerX /= double(points.size());
  fit.centerY /= double(points.size());
  double sxx = 0.0, sxy = 0.0, syy = 0.0;
  for (const auto& p : points) {
    const double dx = p.x - fit.centerX, dy = p.y - fit.centerY;
    sxx += dx * dx;
    sxy += dx * dy;
    syy += dy * dy;
  }
  // The direction of largest spread: the major axis of the scatter.
  fit.angle = 0.5 * std::atan2(2.0 * sxy, sxx - syy);
  const double nx = -std::sin(fit.angle), ny = std::cos(fit.angle);
  double sum = 0.0;
  for (const auto& p : points) {
    const double d = std::fabs((p.x - fit.centerX) * nx + (p.y - fit.centerY) * ny);
    if (d > fit.maxDeviation) fit.maxDeviation = d;
    sum += d * d;
  }
  fit.rms = std::sqrt(sum / double(points.size()));
  return fit;
}

}  // namespace Project::testing
