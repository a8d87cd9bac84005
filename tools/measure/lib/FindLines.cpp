#include "tools/measure/lib/FindLines.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <numbers>

#include "tools/measure/lib/DarkMap.h"

namespace Measure {
namespace {

// Steps of the cross-section sampling, and how far beyond the blob's dark
// pixels it reaches to take in the anti-aliased fringe.
constexpr double kCrossStep = 0.25;
constexpr double kFringe = 2.5;

struct Blob {
  std::vector<std::int32_t> pixels;  // indices y * width + x
  bool cut = false;                  // touches the border or the outside
};

// The principal axis of weighted points: centroid, unit direction.
struct Axis {
  Point centre;
  Point along;
};

Axis PrincipalAxis(const std::vector<Point>& points, const std::vector<double>& weights) {
  double sum = 0.0, mx = 0.0, my = 0.0;
  for (std::size_t i = 0; i < points.size(); ++i) {
    sum += weights[i];
    mx += weights[i] * points[i].x;
    my += weights[i] * points[i].y;
  }
  mx /= sum;
  my /= sum;
  double xx = 0.0, xy = 0.0, yy = 0.0;
  for (std::size_t i = 0; i < points.size(); ++i) {
    const double dx = points[i].x - mx, dy = points[i].y - my;
    xx += weights[i] * dx * dx;
    xy += weights[i] * dx * dy;
    yy += weights[i] * dy * dy;
  }
  const double theta = 0.5 * std::atan2(2.0 * xy, xx - yy);
  return {{mx, my}, {std::cos(theta), std::sin(theta)}};
}

// The image's dark pixels grouped into 8-connected blobs, each pixel
// remembering its blob's number (0 for none).
class Labelling {
 public:
  explicit Labelling(const DarkMap& map)
      : map_(map), labels_(static_cast<std::size_t>(map.Width()) * map.Height(), 0) {}

  std::vector<Blob> Find() {
    std::vector<Blob> blobs;
    const int w = map_.Width(), h = map_.Height();
    std::vector<std::int32_t> stack;
    for (int y = 0; y < h; ++y) {
      for (int x = 0; x < w; ++x) {
        if (labels_[Index(x, y)] != 0 || !map_.Dark(x, y)) continue;
        Blob blob;
        const std::int32_t label = static_cast<std::int32_t>(blobs.size()) + 1;
        labels_[Index(x, y)] = label;
        stack.push_back(static_cast<std::int32_t>(Index(x, y)));
        while (!stack.empty()) {
          const std::int32_t at = stack.back();
          stack.pop_back();
          blob.pixels.push_back(at);
          const int px = at % w, py = at / w;
          for (int dy = -1; dy <= 1; ++dy) {
            for (int dx = -1; dx <= 1; ++dx) {
              const int nx = px + dx, ny = py + dy;
              if (nx < 0 || ny < 0 || nx >= w || ny >= h) {
                blob.cut = true;
                continue;
              }
              if (map_.Outside(nx, ny)) blob.cut = true;
              std::int32_t& mark = labels_[Index(nx, ny)];
              if (mark != 0 || !map_.Dark(nx, ny)) continue;
              mark = label;
              stack.push_back(static_cast<std::int32_t>(Index(nx, ny)));
            }
          }
        }
        blobs.push_back(std::move(blob));
      }
    }
    return blobs;
  }

  std::int32_t Label(int x, int y) const { return labels_[Index(x, y)]; }

 private:
  std::size_t Index(int x, int y) const { return static_cast<std::size_t>(y) * map_.Width() + x; }

  const DarkMap& map_;
  std::vector<std::int32_t> labels_;
};

// The ink at an image position, interpolated between pixel centres; pixels
// of other blobs count as none.
double InkAt(const DarkMap& map, const Labelling& labels, std::int32_t label, double x, double y) {
  const double fx = x - 0.5, fy = y - 0.5;
  const int x0 = static_cast<int>(std::floor(fx)), y0 = static_cast<int>(std::floor(fy));
  const double ax = fx - x0, ay = fy - y0;
  double sum = 0.0;
  for (int j = 0; j <= 1; ++j) {
    for (int i = 0; i <= 1; ++i) {
      const int px = x0 + i, py = y0 + j;
      if (px < 0 || py < 0 || px >= map.Width() || py >= map.Height()) continue;
      const std::int32_t other = labels.Label(px, py);
      if (other != 0 && other != label) continue;
      sum += (i ? ax : 1.0 - ax) * (j ? ay : 1.0 - ay) * map.Ink(px, py);
    }
  }
  return sum;
}

MeasuredLine Measure(const DarkMap& map, const Labelling& labels, std::int32_t label,
                     const Blob& blob) {
  const int w = map.Width();
  std::vector<Point> centres;
  std::vector<double> inks;
  centres.reserve(blob.pixels.size());
  for (const std::int32_t at : blob.pixels) {
    const int x = at % w, y = at / w;
    centres.push_back({x + 0.5, y + 0.5});
    inks.push_back(std::max<double>(map.Ink(x, y), 1e-6));
  }
  const Axis axis = PrincipalAxis(centres, inks);
  const Point normal{-axis.along.y, axis.along.x};

  // The blob in the axis's frame: t along, s across.
  double tMin = std::numeric_limits<double>::max(), tMax = -tMin;
  std::vector<double> ts(centres.size()), ss(centres.size());
  for (std::size_t i = 0; i < centres.size(); ++i) {
    const double dx = centres[i].x - axis.centre.x, dy = centres[i].y - axis.centre.y;
    ts[i] = dx * axis.along.x + dy * axis.along.y;
    ss[i] = dx * normal.x + dy * normal.y;
    tMin = std::min(tMin, ts[i]);
    tMax = std::max(tMax, ts[i]);
  }
  MeasuredLine line;
  line.pixels = static_cast<int>(blob.pixels.size());
  line.length = tMax - tMin + 1.0;
  line.width = line.pixels / line.length;

  // Per station a pixel apart, the range of the blob's pixels across it.
  const int stations = static_cast<int>(std::floor(tMax - tMin)) + 1;
  std::vector<double> low(stations, std::numeric_limits<double>::max());
  std::vector<double> high(stations, -std::numeric_limits<double>::max());
  for (std::size_t i = 0; i < ts.size(); ++i) {
    const int k = std::clamp(static_cast<int>(std::lround(ts[i] - tMin)), 0, stations - 1);
    low[k] = std::min(low[k], ss[i]);
    high[k] = std::max(high[k], ss[i]);
  }
  // The end caps cut the cross-section within half a width of each end.
  const double trim = 0.5 * line.width + 0.5;
  for (int k = 0; k < stations; ++k) {
    const double t = tMin + k;
    if (low[k] > high[k] || t < tMin + trim || t > tMax - trim) continue;
    double sum = 0.0, moment = 0.0;
    for (double s = low[k] - kFringe; s <= high[k] + kFringe; s += kCrossStep) {
      const double x = axis.centre.x + t * axis.along.x + s * normal.x;
      const double y = axis.centre.y + t * axis.along.y + s * normal.y;
      const double ink = InkAt(map, labels, label, x, y);
      sum += ink;
      moment += ink * s;
    }
    if (sum <= 0.0) continue;
    const double s = moment / sum;
    line.centreline.push_back({axis.centre.x + t * axis.along.x + s * normal.x,
                               axis.centre.y + t * axis.along.y + s * normal.y});
  }
  if (line.centreline.size() < 2) line.centreline = {centres.front(), centres.back()};

  // The fitted line, and the points' distances from it.
  const Axis fit = PrincipalAxis(line.centreline, std::vector<double>(line.centreline.size(), 1.0));
  const Point fitNormal{-fit.along.y, fit.along.x};
  double lowest = std::numeric_limits<double>::max(), highest = -lowest, squares = 0.0;
  for (const Point& p : line.centreline) {
    const double d = (p.x - fit.centre.x) * fitNormal.x + (p.y - fit.centre.y) * fitNormal.y;
    lowest = std::min(lowest, d);
    highest = std::max(highest, d);
    squares += d * d;
  }
  line.spread = highest - lowest;
  line.rms = std::sqrt(squares / line.centreline.size());
  // Image y runs down; the angle turns anticlockwise as seen.
  double angle = std::atan2(-fit.along.y, fit.along.x) * 180.0 / std::numbers::pi;
  angle = std::fmod(angle + 360.0, 180.0);
  line.angle = angle >= 180.0 ? 0.0 : angle;

  // The centre: the middle of the blob's extent, on the fitted line.
  double fMin = std::numeric_limits<double>::max(), fMax = -fMin;
  for (const Point& c : centres) {
    const double t = (c.x - fit.centre.x) * fit.along.x + (c.y - fit.centre.y) * fit.along.y;
    fMin = std::min(fMin, t);
    fMax = std::max(fMax, t);
  }
  const double middle = 0.5 * (fMin + fMax);
  line.centre = {fit.centre.x + middle * fit.along.x, fit.centre.y + middle * fit.along.y};
  line.length = fMax - fMin + 1.0;
  line.width = line.pixels / line.length;
  return line;
}

}  // namespace

std::vector<MeasuredLine> FindLines(const Host::HostDocument& image, const FindOptions& options) {
  const DarkMap map(image);
  Labelling labels(map);
  const std::vector<Blob> blobs = labels.Find();
  std::vector<MeasuredLine> lines;
  for (std::size_t b = 0; b < blobs.size(); ++b) {
    const Blob& blob = blobs[b];
    if (blob.cut || static_cast<int>(blob.pixels.size()) < options.minimumPixels) continue;
    MeasuredLine line = Measure(map, labels, static_cast<std::int32_t>(b) + 1, blob);
    if (line.length >= options.minimumLength) lines.push_back(std::move(line));
  }
  return lines;
}

}  // namespace Measure
