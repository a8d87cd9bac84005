#include <gtest/gtest.h>

#include <cmath>
#include <random>

#include "lens/sphere/SphericalImage.h"
#include "tests/solver/geodesic/GeodesicScene.h"

namespace Project {
namespace {

using Cell = OctaMap::Cell;

bool AreNeighbours(const OctaMap& map, Cell a, Cell b) {
  for (int side = 0; side < 4; ++side) {
    if (map.NeighbourCell(a, side) == b) return true;
  }
  return false;
}

// Checks a traced line: it reached its end, its cells form a chain of
// neighbours, t rises from 0 to 1, and every sample's direction lies on the
// great circle through the two end directions. Answers the largest distance
// from the circle's plane.
double CheckArc(const GeodesicScene& scene, const LineRecord& line, int mode) {
  EXPECT_TRUE(line.active);
  EXPECT_GE(line.samples.size(), 2u);
  if (line.samples.size() < 2) return 0.0;
  const Vec3 a = scene.SampleDirection(line.samples.front(), mode);
  const Vec3 b = scene.SampleDirection(line.samples.back(), mode);
  const Vec3 n = Cross(a, b);
  const Vec3 normal = (1.0 / Length(n)) * n;
  EXPECT_EQ(line.samples.front().position, 0.0f);
  EXPECT_EQ(line.samples.back().position, 1.0f);
  double worst = 0.0;
  for (std::size_t k = 0; k < line.samples.size(); ++k) {
    const LineSample& s = line.samples[k];
    worst = std::max(worst, std::fabs(Dot(normal, scene.SampleDirection(s, mode))));
    if (k == 0) continue;
    const LineSample& prev = line.samples[k - 1];
    EXPECT_GE(s.position, prev.position) << k;
    const Cell c0{prev.cellI, prev.cellJ}, c1{s.cellI, s.cellJ};
    EXPECT_TRUE(c0 == c1 || AreNeighbours(*scene.map, c0, c1)) << k;
  }
  return worst;
}

// Random arcs of up to 100 degrees across a wide fisheye, traced in the
// photograph and in the result plane, by both forms of the walk.
TEST(TraceTest, SamplesLieOnTheGreatCircle) {
  std::mt19937 random(11);
  std::uniform_real_distribution<double> angle(-0.9, 0.9);
  for (bool triangles : {false, true}) {
    GeodesicScene scene(6, triangles, WideFisheye());
    for (int mode : {0, 1}) {
      double worst = 0.0;
      for (int trial = 0; trial < 12; ++trial) {
        Point2f from = scene.Fraction(angle(random), angle(random));
        Point2f to = scene.Fraction(angle(random), angle(random));
        float f[2] = {from.x, from.y}, t[2] = {to.x, to.y};
        if (mode == 1) {
          ASSERT_TRUE(scene.lines->FindResultPoint(f, f));
          ASSERT_TRUE(scene.lines->FindResultPoint(t, t));
        }
        LineRecord line;
        scene.lines->TraceArc(line, line, f, t, 2, mode);
        worst = std::max(worst, CheckArc(scene, line, mode));
      }
      // A triangle-form sample lies on a chord that the circle's plane cuts:
      // float rounding only. A quad-form sample sits mid-chord in the mode's
      // plane, and the bilinear patch on the sphere bends away from the chord
      // by second order in the cell's size: (pi / 128)^2 / 8 = 7.5e-5.
      EXPECT_LT(worst, triangles ? 1e-6 : 1e-4) << mode;
    }
  }
}

// The map's right border, i = N - 1, is the half circle z = 0, x < 0, y > 0
// folded shut. A panorama strip from 90 to 180 degrees of longitude sees
// both sides of it; an arc from above the horizon to below it there must walk
// across the fold, into the cell of the same column with j mirrored.
TEST(TraceTest, WalkCrossesTheFold) {
  const float focal = 400.0f / 1.5707964f;  // 90 degrees across 400 pixels
  GeodesicScene scene(6, false,
                      std::make_shared<SphericalImage>(std::make_shared<const Image>(400, 400),
                                                       focal, -400.0f, 200.0f));
  const Point2f from = scene.Fraction(2.2, 0.35), to = scene.Fraction(2.6, -0.3);
  const float f[2] = {from.x, from.y}, t[2] = {to.x, to.y};
  LineRecord line;
  scene.lines->TraceArc(line, line, f, t, 2, 0);
  EXPECT_LT(CheckArc(scene, line, 0), 1e-4);  // as in the test above
  const int last = scene.map->Width() - 2, mirror = scene.map->Width() - 2;
  int folds = 0;
  for (std::size_t k = 1; k < line.samples.size(); ++k) {
    const LineSample& a = line.samples[k - 1];
    const LineSample& b = line.samples[k];
    if (a.cellI == last && b.cellI == last && b.cellJ == mirror - a.cellJ) ++folds;
  }
  EXPECT_EQ(folds, 1);
}

// Retracing keeps the end that did not move (its old cell stands even when
// the point handed in is off the mesh); an end off the mesh, or two equal
// ends, leave an inactive line of just the two end samples.
TEST(TraceTest, KeptEndsAndFailures) {
  GeodesicScene scene(6, false, WideFisheye());
  const Point2f a = scene.Fraction(-0.4, 0.2), b = scene.Fraction(0.5, -0.1);
  const Point2f c = scene.Fraction(0.3, 0.6);
  const float from[2] = {a.x, a.y}, to[2] = {b.x, b.y}, moved[2] = {c.x, c.y};
  const float off[2] = {5.0f, 5.0f};
  LineRecord line;
  scene.lines->TraceArc(line, line, from, to, 2, 0);
  ASSERT_TRUE(line.active);

  LineRecord retraced;
  scene.lines->TraceArc(retraced, line, off, moved, 0, 0);
  EXPECT_TRUE(retraced.active);
  EXPECT_EQ(retraced.samples.front().cellI, line.samples.front().cellI);
  EXPECT_EQ(retraced.samples.front().cellJ, line.samples.front().cellJ);
  scene.lines->TraceArc(retraced, line, moved, off, 1, 0);
  EXPECT_TRUE(retraced.active);
  EXPECT_EQ(retraced.samples.back().cellI, line.samples.back().cellI);
  EXPECT_EQ(retraced.samples.back().cellJ, line.samples.back().cellJ);

  LineRecord failed;
  scene.lines->TraceArc(failed, LineRecord{}, from, off, 2, 0);
  EXPECT_FALSE(failed.active);
  ASSERT_EQ(failed.samples.size(), 2u);
  EXPECT_EQ(failed.samples[1].cellI, -1);
  EXPECT_EQ(failed.samples[1].position, 0.0f);
  EXPECT_EQ(scene.lines->TraceSamples(failed, 0)[1], (Point2f{0.0f, 0.0f}));

  LineRecord point;
  scene.lines->TraceArc(point, LineRecord{}, from, from, 2, 0);
  EXPECT_FALSE(point.active);
  EXPECT_EQ(point.samples.size(), 2u);
}

// A line starting exactly on a cell edge (the meridian through the view
// axis is the grid column i = h) walks on from either cell holding that edge.
TEST(TraceTest, StartOnACellEdgeWalksFromEitherCell) {
  for (bool triangles : {false, true}) {
    GeodesicScene scene(6, triangles, WideFisheye());
    const Point2f a = scene.Fraction(0.0, 0.3), b = scene.Fraction(0.6, -0.2);
    ASSERT_EQ(a.x, 0.5f);
    const float from[2] = {a.x, a.y}, to[2] = {b.x, b.y};
    OctaMap::Cell found, cellTo;
    ASSERT_TRUE(scene.lines->FindCell(from, found, 0));
    ASSERT_TRUE(scene.lines->FindCell(to, cellTo, 0));
    const int h = scene.map->Half();
    for (int i : {h - 1, h}) {
      LineRecord line;
      const OctaMap::Cell start{i, found.j};
      if (triangles) {
        scene.lines->WalkCellsTriangles(line, from, to, start, cellTo, 0);
      } else {
        scene.lines->WalkCells(line, from, to, start, cellTo, 0);
      }
      EXPECT_TRUE(line.active) << triangles << " " << i;
      // About 0.7 rad at 2.5 degrees a cell: a couple of dozen cells.
      EXPECT_GT(line.samples.size(), 10u) << triangles << " " << i;
    }
  }
}

// A point near an arc snaps onto the great circle; one 200 pixels away is
// refused.
TEST(TraceTest, SnapToArcLandsOnTheCircle) {
  GeodesicScene scene(6, false, WideFisheye());
  const Point2f a = scene.Fraction(-0.5, 0.3), b = scene.Fraction(0.6, 0.1);
  const float from[2] = {a.x, a.y}, to[2] = {b.x, b.y};
  const float pixels[2] = {1000.0f, 750.0f};
  float near[2] = {0.5f * (a.x + b.x), 0.5f * (a.y + b.y) + 20.0f / 750.0f};
  float snapped[2];
  ASSERT_TRUE(scene.lines->SnapToArc(near, from, to, 0, pixels, snapped));
  auto direction = [&](const float p[2]) {
    OctaMap::Cell cell;
    EXPECT_TRUE(scene.lines->FindCell(p, cell, 0));
    float s[3];
    scene.lines->SpherePoint(p, cell, 0, s);
    const Vec3 v = Vec3::From(s);
    return (1.0 / Length(v)) * v;
  };
  const Vec3 n = Cross(direction(from), direction(to));
  // The mesh's interpolation error, as for traced samples.
  EXPECT_NEAR(Dot((1.0 / Length(n)) * n, direction(snapped)), 0.0, 1e-4);
  // The arc passes within 20 pixels of the point, give or take its bend.
  EXPECT_LT(std::hypot((snapped[0] - near[0]) * 1000.0f, (snapped[1] - near[1]) * 750.0f), 21.0f);

  float far[2] = {near[0], near[1] + 180.0f / 750.0f};
  EXPECT_FALSE(scene.lines->SnapToArc(far, from, to, 0, pixels, snapped));
}

// A polygon drawn corner by corner: one edge per corner once closed, kinds
// fixing their normals, only fixed edges counted as lines; an edge to a
// point off the mesh makes the draft inactive until it is taken back.
TEST(TraceTest, DraftPolygon) {
  GeodesicScene scene(6, false, WideFisheye());
  GeodesicLines& lines = *scene.lines;
  const float p0[2] = {0.3f, 0.3f}, p1[2] = {0.7f, 0.35f}, p2[2] = {0.6f, 0.7f};
  const float off[2] = {5.0f, 5.0f};
  EXPECT_TRUE(lines.AddDraftPoint(p0, false, 0));
  EXPECT_TRUE(lines.AddDraftPoint(p1, false, 1));
  EXPECT_FALSE(lines.AddDraftPoint(off, false, 0));
  EXPECT_FALSE(lines.GetDraftPlane().active);
  lines.RemoveLastDraftEdge();
  EXPECT_TRUE(lines.GetDraftPlane().active);
  EXPECT_TRUE(lines.AddDraftPoint(p2, false, 2));
  EXPECT_TRUE(lines.AddDraftPoint(p0, true, 0));
  const PlaneRecord& draft = lines.GetDraftPlane();
  ASSERT_EQ(draft.corners.size(), 3u);
  ASSERT_EQ(draft.edges.size(), 3u);
  EXPECT_EQ(draft.edges[0].fixedNormal, (std::array<float, 2>{0.0f, 1.0f}));
  EXPECT_EQ(draft.edges[1].fixedNormal, (std::array<float, 2>{1.0f, 0.0f}));
  EXPECT_FALSE(draft.edges[2].hasFixedNormal);
  lines.GetPlanes().push_back(draft);
  EXPECT_EQ(lines.CollectEdgeLines().size(), 2u);
  lines.ClearDraftPlane();
  EXPECT_TRUE(lines.GetDraftPlane().corners.empty());
  EXPECT_TRUE(lines.GetDraftPlane().edges.empty());
}

}  // namespace
}  // namespace Project
