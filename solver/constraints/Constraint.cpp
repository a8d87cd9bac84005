#include "solver/constraints/Constraint.h"

#include <cmath>

#include "solver/frame/SolverContext.h"

namespace Project {

bool ConstraintEnv::ShowsResult() const { return context.Settings().previewResult != 0; }

float SegmentDistanceSquared(Point2f p, Point2f a, Point2f b) {
  const float dx = b.x - a.x, dy = b.y - a.y;
  const float length2 = dx * dx + dy * dy;
  const float s = (p.x - a.x) * dx + (p.y - a.y) * dy;
  Point2f foot = a;
  if (length2 == 0.0f || s <= 0.0f) {
    foot = a;
  } else if (s > length2) {
    foot = b;
  } else {
    foot = {a.x + dx * s / length2, a.y + dy * s / length2};
  }
  const float fx = foot.x - p.x, fy = foot.y - p.y;
  return fx * fx + fy * fy;
}

bool InSquare(Point2f p, Point2f centre, float tolerance) {
  return std::fabs(p.x - centre.x) <= tolerance && std::fabs(p.y - centre.y) <= tolerance;
}

}  // namespace Project
