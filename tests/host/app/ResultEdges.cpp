#include "tests/host/app/ResultEdges.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Host::testing {

namespace {

double Dot(const Colour& a, const Colour& b) { return a[0] * b[0] + a[1] * b[1] + a[2] * b[2]; }

}  // namespace

Colour ColourAt(const HostDocument& document, Point2 at) {
  // Pixel centres at half-pixels.
  const double px = at.x - 0.5, py = at.y - 0.5;
  const double fx = std::floor(px), fy = std::floor(py);
  const double wx = px - fx, wy = py - fy;
  const auto clampX = [&](double x) {
    return int32_t(std::clamp(x, 0.0, double(document.Width() - 1)));
  };
  const auto clampY = [&](double y) {
    return int32_t(std::clamp(y, 0.0, double(document.Height() - 1)));
  };
  const int32_t x0 = clampX(fx), x1 = clampX(fx + 1), y0 = clampY(fy), y1 = clampY(fy + 1);
  const double max = document.MaxSample();
  Colour colour{};
  for (int p = 0; p < 3; ++p) {
    const double top = (1 - wx) * document.Sample(p, x0, y0) + wx * document.Sample(p, x1, y0);
    const double bottom = (1 - wx) * document.Sample(p, x0, y1) + wx * document.Sample(p, x1, y1);
    colour[p] = ((1 - wy) * top + wy * bottom) / max;
  }
  return colour;
}

bool ResultMap::SourceAt(Point2 result, Point2& photo) const {
  const double px = result.x - 0.5, py = result.y - 0.5;
  const double fx = std::floor(px), fy = std::floor(py);
  if (fx < 0 || fy < 0 || fx + 1 >= reference_.width || fy + 1 >= reference_.height) return false;
  const auto x0 = int32_t(fx), y0 = int32_t(fy);
  for (int32_t dy = 0; dy <= 1; ++dy) {
    for (int32_t dx = 0; dx <= 1; ++dx) {
      if (!reference_.Covered(x0 + dx, y0 + dy)) return false;
    }
  }
  const double wx = px - fx, wy = py - fy;
  const auto blend = [&](const std::vector<double>& map) {
    const double top =
        (1 - wx) * map[reference_.Index(x0, y0)] + wx * map[reference_.Index(x0 + 1, y0)];
    const double bottom =
        (1 - wx) * map[reference_.Index(x0, y0 + 1)] + wx * map[reference_.Index(x0 + 1, y0 + 1)];
    return (1 - wy) * top + wy * bottom;
  };
  photo = {blend(reference_.sourceX), blend(reference_.sourceY)};
  return true;
}

std::optional<Point2> ResultMap::Place(Point2 photo) {
  // The nearest drawn pixel by what it shows: about the last answer when
  // there is one, else over the whole result.
  int32_t xFrom = 0, xTo = reference_.width - 1, yFrom = 0, yTo = reference_.height - 1;
  if (last_) {
    constexpr int32_t kNear = 8;  // pixels; successive curve points are about one apart
    xFrom = std::max(xFrom, int32_t(last_->x) - kNear);
    xTo = std::min(xTo, int32_t(last_->x) + kNear);
    yFrom = std::max(yFrom, int32_t(last_->y) - kNear);
    yTo = std::min(yTo, int32_t(last_->y) + kNear);
  }
  double nearest = std::numeric_limits<double>::infinity();
  Point2 guess;
  for (int32_t y = yFrom; y <= yTo; ++y) {
    for (int32_t x = xFrom; x <= xTo; ++x) {
      if (!reference_.Covered(x, y)) continue;
      const double d = std::hypot(reference_.sourceX[reference_.Index(x, y)] - photo.x,
                                  reference_.sourceY[reference_.Index(x, y)] - photo.y);
      if (d < nearest) {
        nearest = d;
        guess = {x + 0.5, y + 0.5};
      }
    }
  }
  if (!std::isfinite(nearest)) {
    last_.reset();
    return std::nullopt;
  }
  // Newton's steps on the blended map, its derivatives by differences.
  Point2 at = guess;
  for (int round = 0; round < 8; ++round) {
    Point2 s, sx, sy;
    constexpr double kStep = 0.25;  // pixels
    if (!SourceAt(at, s) || !SourceAt({at.x + kStep, at.y}, sx) ||
        !SourceAt({at.x, at.y + kStep}, sy)) {
      last_.reset();
      return std::nullopt;
    }
    const double a = (sx.x - s.x) / kStep, b = (sy.x - s.x) / kStep;
    const double c = (sx.y - s.y) / kStep, d = (sy.y - s.y) / kStep;
    const double det = a * d - b * c;
    if (det == 0) {
      last_.reset();
      return std::nullopt;
    }
    const double ex = photo.x - s.x, ey = photo.y - s.y;
    at.x += (d * ex - b * ey) / det;
    at.y += (a * ey - c * ex) / det;
    constexpr double kConverged = 1e-3;  // pixels, far below what is measured
    if (std::hypot(ex, ey) < kConverged) break;
  }
  last_ = at;
  return at;
}

std::optional<Point2> FindEdge(const HostDocument& image, Point2 at, Point2 normal,
                               const Colour& step, double reach) {
  const double size = std::sqrt(Dot(step, step));
  if (size == 0) return std::nullopt;
  const Colour unit{step[0] / size, step[1] / size, step[2] / size};
  // The rise over one pixel, every quarter pixel along the profile.
  constexpr double kSpacing = 0.25;
  const int count = int(std::floor(reach / kSpacing));
  std::vector<double> rise;
  for (int k = -count; k <= count; ++k) {
    const double t = k * kSpacing;
    const Colour ahead =
        ColourAt(image, {at.x + (t + 0.5) * normal.x, at.y + (t + 0.5) * normal.y});
    const Colour behind =
        ColourAt(image, {at.x + (t - 0.5) * normal.x, at.y + (t - 0.5) * normal.y});
    rise.push_back(Dot({ahead[0] - behind[0], ahead[1] - behind[1], ahead[2] - behind[2]}, unit));
  }
  const auto peak = std::max_element(rise.begin(), rise.end());
  if (*peak < 0.5 * size) return std::nullopt;
  const auto k = std::distance(rise.begin(), peak);
  // The rise between bilinear samples is piecewise linear with its corners
  // a pixel apart, so its peak sits on a corner or is flat between two: an
  // edge on a pixel centre gives a plateau a pixel wide, and the peak alone
  // snaps to either end of it. The rise's centroid over two pixels each way
  // covers both corners either side of the edge and finds it wherever it
  // falls within a pixel.
  constexpr std::ptrdiff_t kHalfWindow = 8;  // quarter pixels
  double weight = 0, moment = 0;
  for (std::ptrdiff_t m = std::max<std::ptrdiff_t>(0, k - kHalfWindow);
       m <= std::min<std::ptrdiff_t>(std::ssize(rise) - 1, k + kHalfWindow); ++m) {
    const double w = std::max(0.0, rise[size_t(m)]);
    weight += w;
    moment += w * double(m - count);
  }
  const double t = moment / weight * kSpacing;
  return Point2{at.x + t * normal.x, at.y + t * normal.y};
}

}  // namespace Host::testing
