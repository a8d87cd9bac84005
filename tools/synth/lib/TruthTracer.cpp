#include "tools/synth/lib/TruthTracer.h"

#include <cmath>
#include <utility>

namespace Synth {
namespace {

// Coarse samples along an edge before refinement: fine enough that no visible
// stretch of an edge hides between two of them in the scenes built here.
constexpr int kCoarseSamples = 256;
// Edge parameters closer than this are one point: used to stop bisection and
// to tell a jump in the image (a seam) from a steep stretch of a curve.
constexpr double kParameterHair = 1e-12;
// A surface nearer than this fraction of the distance hides a point; the
// point's own surfaces meet the ray at the same distance up to rounding.
constexpr double kHiddenFraction = 1.0 - 1e-7;

double Distance(const Point2& a, const Point2& b) { return std::hypot(a.x - b.x, a.y - b.y); }

}  // namespace

// The runs of one edge as they are built.
struct TruthTracer::Walk {
  std::vector<std::vector<Sample>> runs;
  std::vector<Sample> current;

  void Close() {
    if (current.size() >= 2) runs.push_back(std::move(current));
    current.clear();
  }
};

bool TruthTracer::Visible(const Edge& edge, double s, Point2* out) const {
  const Vec3 point = edge.start + s * (edge.end - edge.start);
  if (!camera_.Project(point, out)) return false;
  const Vec3 offset = point - camera_.Position();
  const double distance = Length(offset);
  double hit = 0.0;
  return !scene_.NearestHit(camera_.Position(), (1.0 / distance) * offset, &hit) ||
         hit >= distance * kHiddenFraction;
}

// Appends the curve from a (already in the run when valid) to b.
void TruthTracer::Step(const Edge& edge, Walk* walk, Sample a, bool aValid, Sample b,
                       bool bValid) const {
  if (aValid && bValid) {
    Bridge(edge, walk, a, b);
    return;
  }
  if (!aValid && !bValid) return;
  // One end visible: bisect for the boundary, keeping the visible side.
  Sample inside = aValid ? a : b;
  double outside = aValid ? b.s : a.s;
  while (std::abs(outside - inside.s) > kParameterHair) {
    Sample middle{0.5 * (inside.s + outside), {}};
    if (Visible(edge, middle.s, &middle.point)) {
      inside = middle;
    } else {
      outside = middle.s;
    }
  }
  if (aValid) {
    if (inside.s != a.s) Bridge(edge, walk, a, inside);
    walk->Close();
  } else {
    walk->current.push_back(inside);
    if (inside.s != b.s) Bridge(edge, walk, inside, b);
  }
}

// Both ends visible: halve until neighbours are close enough in the image.
void TruthTracer::Bridge(const Edge& edge, Walk* walk, Sample a, Sample b) const {
  if (Distance(a.point, b.point) <= kMaxStep) {
    walk->current.push_back(b);
    return;
  }
  if (b.s - a.s <= kParameterHair) {
    // The image jumps between two points of the edge that are one: a seam.
    walk->Close();
    walk->current.push_back(b);
    return;
  }
  Sample middle{0.5 * (a.s + b.s), {}};
  const bool valid = Visible(edge, middle.s, &middle.point);
  Step(edge, walk, a, true, middle, valid);
  Step(edge, walk, middle, valid, b, true);
}

std::vector<TruthSegment> TruthTracer::Trace() const {
  std::vector<TruthSegment> segments;
  for (const Edge& edge : scene_.Edges()) {
    Walk walk;
    Sample previous{0.0, {}};
    bool previousValid = Visible(edge, 0.0, &previous.point);
    if (previousValid) walk.current.push_back(previous);
    for (int i = 1; i <= kCoarseSamples; ++i) {
      Sample next{static_cast<double>(i) / kCoarseSamples, {}};
      const bool nextValid = Visible(edge, next.s, &next.point);
      Step(edge, &walk, previous, previousValid, next, nextValid);
      previous = next;
      previousValid = nextValid;
    }
    walk.Close();
    for (size_t k = 0; k < walk.runs.size(); ++k) {
      const std::vector<Sample>& run = walk.runs[k];
      TruthSegment segment;
      segment.id = walk.runs.size() == 1 ? edge.id : edge.id + "#" + std::to_string(k + 1);
      segment.start = edge.start + run.front().s * (edge.end - edge.start);
      segment.end = edge.start + run.back().s * (edge.end - edge.start);
      segment.points.reserve(run.size());
      for (const Sample& sample : run) segment.points.push_back(sample.point);
      segments.push_back(std::move(segment));
    }
  }
  return segments;
}

}  // namespace Synth
