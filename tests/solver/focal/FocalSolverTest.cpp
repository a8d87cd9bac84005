#include "solver/focal/FocalSolver.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "tests/solver/focal/FocalContext.h"
#include "tools/synth/lib/Render.h"

namespace Project {
namespace {

// Three points of one straight edge of the scene, in source pixels.
struct Triple {
  Point2f start, end, target;
  double sagitta = 0.0;  // the target's distance from the chord, pixels
};

double DistanceToLine(Point2f p, Point2f a, Point2f b) {
  const double dx = b.x - a.x, dy = b.y - a.y;
  return std::abs((p.x - a.x) * dy - (p.y - a.y) * dx) / std::hypot(dx, dy);
}

// The edges of the room photographed by an equisolid fisheye of the given
// focal length: for each edge with a long visible run, its ends pulled a
// little inside that run and a third point at a random place between them,
// all from the generator's exact projection. Kept only where the image
// bends enough for the focal length to show.
std::vector<Triple> RoomTriples(double focalMm, std::mt19937& random, double* focalPixels) {
  Synth::CameraSpec shot;
  shot.projection = Synth::ProjectionKind::kFisheyeEquisolid;
  shot.focalMm = focalMm;
  shot.cropFactor = 1.5;
  shot.width = FocalContext::kWidth;
  shot.height = FocalContext::kHeight;
  const Synth::Scene scene = Synth::Scene::Make(Synth::SceneKind::kRoom);
  const Synth::Camera camera = Synth::MakeCamera(scene, shot);
  *focalPixels = camera.Lens().Focal();

  std::uniform_real_distribution<double> place(0.25, 0.75);
  std::vector<Triple> triples;
  for (const Synth::Edge& edge : scene.Edges()) {
    auto at = [&](double t, Point2f* out) {
      Synth::Point2 p;
      if (!camera.Project(edge.start + t * (edge.end - edge.start), &p)) return false;
      *out = {static_cast<float>(p.x), static_cast<float>(p.y)};
      return true;
    };
    // The first visible run along the edge.
    constexpr int kSteps = 400;
    int first = -1, last = -1;
    Point2f unused;
    for (int k = 0; k <= kSteps; ++k) {
      if (at(static_cast<double>(k) / kSteps, &unused)) {
        if (first < 0) first = k;
        last = k;
      } else if (first >= 0) {
        break;
      }
    }
    if (first < 0 || last - first < 40) continue;
    const double t0 = static_cast<double>(first + 2) / kSteps;
    const double t1 = static_cast<double>(last - 2) / kSteps;
    Triple triple;
    if (!at(t0, &triple.start) || !at(t1, &triple.end) ||
        !at(t0 + place(random) * (t1 - t0), &triple.target)) {
      continue;
    }
    triple.sagitta = DistanceToLine(triple.target, triple.start, triple.end);
    if (triple.sagitta > 30.0) triples.push_back(triple);
  }
  return triples;
}

// The acceptance check: from three exact points of a straight scene edge,
// the search recovers the generator's focal length, over several edges and
// two lenses.
TEST(FocalSolver, RecoversTheGeneratorsFocalLength) {
  FocalContext context;
  FocalSolver solver(context);
  std::mt19937 random(20240611u);
  for (const double focalMm : {8.0, 11.0}) {
    double truth = 0.0;
    std::vector<Triple> triples = RoomTriples(focalMm, random, &truth);
    ASSERT_GE(triples.size(), 5u) << focalMm;
    std::shuffle(triples.begin(), triples.end(), random);
    triples.resize(5);
    for (const Triple& t : triples) {
      solver.SetCenter({600.0f, 400.0f});
      solver.SetLineStart(t.start);
      solver.SetLineEnd(t.end);
      solver.SetTarget(t.target);
      const double focal = solver.Start();
      // The acceptance bound; the arc is a polyline of one sample per grid
      // cell, which is most of what remains.
      EXPECT_NEAR(focal / truth, 1.0, 0.02)
          << focalMm << " mm, sagitta " << t.sagitta << ", found " << focal << " for " << truth;
    }
  }
}

// A third point on the centre's side of the chord bends the wrong way for
// any fisheye: the search must give up, not settle on some focal length.
TEST(FocalSolver, FailsWhenNoFocalLengthFits) {
  FocalContext context;
  FocalSolver solver(context);
  std::mt19937 random(7u);
  double truth = 0.0;
  std::vector<Triple> triples = RoomTriples(8.0, random, &truth);
  ASSERT_FALSE(triples.empty());
  std::sort(triples.begin(), triples.end(),
            [](const Triple& a, const Triple& b) { return a.sagitta > b.sagitta; });
  const Triple& t = triples.front();
  // The target mirrored across the chord.
  const double dx = t.end.x - t.start.x, dy = t.end.y - t.start.y;
  const double u =
      ((t.target.x - t.start.x) * dx + (t.target.y - t.start.y) * dy) / (dx * dx + dy * dy);
  const Point2f mirrored{static_cast<float>(2.0 * (t.start.x + u * dx) - t.target.x),
                         static_cast<float>(2.0 * (t.start.y + u * dy) - t.target.y)};
  solver.SetCenter({600.0f, 400.0f});
  solver.SetLineStart(t.start);
  solver.SetLineEnd(t.end);
  solver.SetTarget(mirrored);
  EXPECT_EQ(solver.Start(), -1.0);
}

}  // namespace
}  // namespace Project
