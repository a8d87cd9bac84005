#pragma once

#include <string>
#include <vector>

#include "tools/synth/lib/Camera.h"
#include "tools/synth/lib/Geometry.h"
#include "tools/synth/lib/Scene.h"

namespace Synth {

// One visible run of a straight scene edge: its 3-D end points and its image
// curve, sampled no more than kMaxStep pixels apart.
struct TruthSegment {
  std::string id;
  Vec3 start;
  Vec3 end;
  std::vector<Point2> points;
};

// Traces every straight edge of a scene through a camera into image curves.
// A point counts when it lies in the projection's domain, on the image, and
// nothing nearer hides it. An edge that leaves the image, passes behind
// something or jumps across a panorama's seam comes out as several runs,
// numbered "#1", "#2" after its id; the ends of each run are found by
// bisection to a hair of the true boundary.
class TruthTracer {
 public:
  static constexpr double kMaxStep = 1.0;

  TruthTracer(const Scene& scene, const Camera& camera) : scene_(scene), camera_(camera) {}

  TruthTracer(const TruthTracer&) = delete;
  TruthTracer& operator=(const TruthTracer&) = delete;

  std::vector<TruthSegment> Trace() const;

 private:
  struct Sample {
    double s;
    Point2 point;
  };
  struct Walk;

  bool Visible(const Edge& edge, double s, Point2* out) const;
  void Step(const Edge& edge, Walk* walk, Sample a, bool aValid, Sample b, bool bValid) const;
  void Bridge(const Edge& edge, Walk* walk, Sample a, Sample b) const;

  const Scene& scene_;
  const Camera& camera_;
};

}  // namespace Synth
