#include "solver/focal/FocalSolver.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "lens/sphere/FisheyeImage.h"

namespace Project {

namespace {

// -1, 0 or +1; a zero is a sign of its own, so a point lying on the other
// segment counts as a crossing.
int Sign(double v) { return (v > 0.0) - (v < 0.0); }

// (a - o) x (b - o)
double Cross(double ox, double oy, double ax, double ay, double bx, double by) {
  return (ax - ox) * (by - oy) - (ay - oy) * (bx - ox);
}

// Whether segment p-q meets segment r-s: each segment's ends lie on
// different sides of the other's line.
bool SegmentsCross(double px, double py, double qx, double qy, double rx, double ry, double sx,
                   double sy) {
  return Sign(Cross(px, py, rx, ry, qx, qy)) != Sign(Cross(px, py, sx, sy, qx, qy)) &&
         Sign(Cross(rx, ry, px, py, sx, sy)) != Sign(Cross(rx, ry, qx, qy, sx, sy));
}

// Distance from p to segment a-b, in single precision like the points the
// trace gives: the foot of the perpendicular clamped to the segment, and a
// segment of no length taken as its first end.
float DistanceToSegment(float px, float py, Point2f a, Point2f b) {
  const float dx = b.x - a.x, dy = b.y - a.y;
  const float length2 = dx * dx + dy * dy;
  float t = 0.0f;
  if (length2 > 0.0f) t = std::clamp(((px - a.x) * dx + (py - a.y) * dy) / length2, 0.0f, 1.0f);
  const float ex = px - (a.x + t * dx), ey = py - (a.y + t * dy);
  return std::sqrt(ex * ex + ey * ey);
}

}  // namespace

FocalSolver::FocalSolver(SolverContext& context)
    : image_(std::make_shared<Image>(context.SourceWidth(), context.SourceHeight())),
      solver_(std::make_unique<Solver>(context)) {
  solver_->Initialize();
}

FocalSolver::~FocalSolver() = default;

double FocalSolver::Start() {
  const double r = std::max({std::hypot(lineStart_.x - center_.x, lineStart_.y - center_.y),
                             std::hypot(lineEnd_.x - center_.x, lineEnd_.y - center_.y),
                             std::hypot(target_.x - center_.x, target_.y - center_.y)});
  minFocal_ = r * 0.5;
  // A secant search on the signed miss. The first step has no slope yet and
  // takes one pixel of focal length per pixel of miss; the slope enters by
  // its size alone, so a positive miss always lowers the guess.
  double focal = r;
  double previousError = 0.0, previousFocal = 0.0;
  for (std::int32_t round = 1; round <= kMaxRounds; ++round) {
    focal = std::max(focal, minFocal_);
    double error;
    if (!Measure(focal, error)) {
      // The guess that failed becomes the floor. With no previous guess the
      // halved one is raised back to it, and the search runs out.
      minFocal_ = focal;
      focal = (focal + previousFocal) * 0.5;
      continue;
    }
    if (std::abs(error) < kTolerance) return focal;
    const double slope = round == 1 ? 1.0 : (error - previousError) / (focal - previousFocal);
    const double next = focal - error / std::abs(slope);
    // A flat or undefined slope sends the guess nowhere useful, and a guess
    // this long means the three points look collinear: the trace would only
    // measure single-precision noise from here on.
    if (!std::isfinite(next) || next > kMaxFocalRatio * image_->LongerSide()) return -1.0;
    previousError = error;
    previousFocal = focal;
    focal = next;
  }
  return -1.0;
}

bool FocalSolver::Measure(double focal, double& outError) const {
  const auto model =
      std::make_shared<FisheyeImage>(image_, static_cast<float>(focal),
                                     static_cast<float>(center_.x), static_cast<float>(center_.y));
  GeodesicLines& lines = *solver_->GetLines();
  lines.SetImageModel(model);

  // Traced in the photograph's texture fractions, (x / W, 1 - y / H).
  const float w = static_cast<float>(image_->width), h = static_cast<float>(image_->height);
  const float from[2] = {static_cast<float>(lineStart_.x) / w,
                         1.0f - static_cast<float>(lineStart_.y) / h};
  const float to[2] = {static_cast<float>(lineEnd_.x) / w,
                       1.0f - static_cast<float>(lineEnd_.y) / h};
  LineRecord record;
  lines.TraceArc(record, record, from, to, 2, 0);
  if (!record.active) return false;

  // The nearest approach of the arc's polyline to the third point, no
  // farther than the chord's length, and whether the arc crosses the way
  // from the centre to the point.
  double d = std::hypot(lineEnd_.x - lineStart_.x, lineEnd_.y - lineStart_.y);
  double side = -1.0;
  const float tx = static_cast<float>(target_.x), ty = static_cast<float>(target_.y);
  const std::vector<Point2f> fractions = lines.TraceSamples(record, 0);
  std::vector<Point2f> view(fractions.size());
  for (std::size_t k = 0; k < fractions.size(); ++k) {
    view[k] = {fractions[k].x * w, (1.0f - fractions[k].y) * h};
  }
  for (std::size_t k = 0; k + 1 < view.size(); ++k) {
    const Point2f a = view[k], b = view[k + 1];
    const double e = DistanceToSegment(tx, ty, a, b);
    if (e < d) d = e;
    if (side < 0.0 &&
        SegmentsCross(a.x, a.y, b.x, b.y, center_.x, center_.y, target_.x, target_.y)) {
      side = 1.0;
    }
  }
  outError = side * d;
  return true;
}

}  // namespace Project
