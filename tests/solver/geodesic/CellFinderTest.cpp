#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "lens/sphere/SphericalImage.h"
#include "solver/geodesic/CellGeometry.h"
#include "tests/solver/geodesic/GeodesicScene.h"

namespace Project {
namespace {

using Cell = OctaMap::Cell;

// The point at (s, t) of the bilinear patch on the corners.
void Bilinear(const float c[8], double s, double t, float out[2]) {
  for (int a = 0; a < 2; ++a) {
    out[a] = static_cast<float>((1 - s) * (1 - t) * c[a] + s * (1 - t) * c[2 + a] +
                                s * t * c[4 + a] + (1 - s) * t * c[6 + a]);
  }
}

std::vector<Cell> VisibleCells(const GeodesicLines& lines, int n) {
  std::vector<Cell> cells;
  for (int j = 0; j < n - 1; ++j) {
    for (int i = 0; i < n - 1; ++i) {
      if (lines.IsCellVisible(i, j)) cells.push_back({i, j});
    }
  }
  return cells;
}

// Points made inside known cells, by bilinear interpolation of the cell's
// corners at (s, t), in the photograph and in the result plane: the finder
// must name that cell, and the weights must give back (s, t), and in the
// triangle form the point itself.
TEST(CellFinderTest, FindsTheCellOfKnownPointsAtEveryLevel) {
  std::mt19937 random(3);
  std::uniform_real_distribution<double> inner(0.1, 0.9);
  for (int level = 3; level <= 7; ++level) {
    GeodesicScene scene(level, false, WideFisheye());
    GeodesicLines triangles(scene.map, scene.model, true);
    triangles.SetWarp(scene.warp.get());
    const std::vector<Cell> visible = VisibleCells(*scene.lines, scene.map->Width());
    ASSERT_FALSE(visible.empty());
    std::uniform_int_distribution<std::size_t> pick(0, visible.size() - 1);
    for (int mode : {0, 1}) {
      for (int trial = 0; trial < 6; ++trial) {
        const Cell cell = visible[pick(random)];
        // Half the points at the cell's centre, half anywhere inside.
        const double s = trial % 2 ? inner(random) : 0.5, t = trial % 2 ? inner(random) : 0.5;
        float corners[8], point[2];
        scene.lines->GetCellCorners(cell.i, cell.j, mode, corners);
        Bilinear(corners, s, t, point);
        Cell found;
        ASSERT_TRUE(scene.lines->FindCell(point, found, mode)) << level << " " << mode;
        EXPECT_EQ(found, cell) << level << " " << mode;

        float w[4];
        scene.lines->CellWeights(point, cell, mode, w);
        const double expected[4] = {(1 - s) * (1 - t), s * (1 - t), s * t, (1 - s) * t};
        // The point is rounded to float (6e-8) in cells down to 2e-3 across.
        for (int k = 0; k < 4; ++k) EXPECT_NEAR(w[k], expected[k], 1e-4) << k;

        triangles.CellWeights(point, cell, mode, w);
        float back[2] = {0, 0};
        for (int k = 0; k < 4; ++k) {
          EXPECT_GE(w[k], -1e-6f);  // float rounding of a zero weight
          back[0] += w[k] * corners[2 * k];
          back[1] += w[k] * corners[2 * k + 1];
        }
        // Float weights on coordinates below 2 in size.
        EXPECT_NEAR(back[0], point[0], 1e-6);
        EXPECT_NEAR(back[1], point[1], 1e-6);
      }
    }
  }
}

// Below 16 cell rows the bands are empty: nothing is ever found. A full
// panorama puts cells in the mesh even at level 1.
TEST(CellFinderTest, CoarseGridsFindNothing) {
  for (int level : {1, 2}) {
    GeodesicScene scene(level, false,
                        std::make_shared<SphericalImage>(std::make_shared<const Image>(800, 400),
                                                         400.0f / 3.1415927f, 400.0f, 200.0f));
    const std::vector<Cell> visible = VisibleCells(*scene.lines, scene.map->Width());
    ASSERT_FALSE(visible.empty());
    for (const Cell& cell : visible) {
      float corners[8], point[2];
      scene.lines->GetCellCorners(cell.i, cell.j, 0, corners);
      Bilinear(corners, 0.5, 0.5, point);
      Cell found{7, 7};
      EXPECT_FALSE(scene.lines->FindCell(point, found, 0));
      EXPECT_EQ(found, (Cell{-1, -1}));
    }
  }
}

// Two quads sharing a slanted edge: points on it (exact in binary) belong
// to the left one alone. A point level with a quad's top or bottom corner
// belongs to it only when it is that corner.
TEST(CellFinderTest, SharedEdgeIsClaimedOnce) {
  const float left[8] = {0, 0, 1, 0, 1.5f, 1, 0, 1};
  const float right[8] = {1, 0, 2, 0, 2, 1, 1.5f, 1};
  for (float f : {0.25f, 0.5f, 0.75f}) {
    EXPECT_TRUE(PointInQuad(left, 1 + 0.5f * f, f)) << f;
    EXPECT_FALSE(PointInQuad(right, 1 + 0.5f * f, f)) << f;
  }
  EXPECT_TRUE(PointInQuad(left, 0.0f, 0.0f));
  EXPECT_FALSE(PointInQuad(left, 0.5f, 0.0f));
  EXPECT_FALSE(PointInQuad(left, 0.5f, 1.0f));
  EXPECT_FALSE(PointInQuad(left, 0.5f, -0.01f));
}

// The cell test gives a point on a level edge to neither cell beside it.
// The photograph's middle row is such an edge (every vertex of the equator
// lands at v = 0.5); the finder still names a cell for points on it, one
// that holds the point within a hair, so that a line drawn along or ending
// on the middle row is traced.
TEST(CellFinderTest, PointsOnALevelEdgeAreFound) {
  GeodesicScene scene(6, false, WideFisheye());
  const std::int32_t h = scene.map->Half();
  float a[8];
  scene.lines->GetCellCorners(h + 3, h, 0, a);
  ASSERT_EQ(a[1], 0.5f) << "the equator row is level at v = 0.5";
  for (const float s : {0.25f, 0.5f, 0.75f}) {
    const float point[2] = {a[0] + s * (a[2] - a[0]), 0.5f};
    ASSERT_FALSE(PointInQuad(a, point[0], point[1]));
    Cell found;
    ASSERT_TRUE(scene.lines->FindCell(point, found, 0)) << s;
    EXPECT_EQ(found.i, h + 3);
    EXPECT_TRUE(found.j == h || found.j == h - 1) << found.j;
  }
}

// Photograph to result plane and back lands where it started.
TEST(CellFinderTest, ResultAndSourcePointsRoundTrip) {
  GeodesicScene scene(6, false, WideFisheye());
  std::mt19937 random(5);
  std::uniform_real_distribution<float> fraction(0.15f, 0.85f);
  for (int trial = 0; trial < 10; ++trial) {
    const float source[2] = {fraction(random), fraction(random)};
    float plane[2], back[2];
    ASSERT_TRUE(scene.lines->FindResultPoint(source, plane));
    ASSERT_TRUE(scene.lines->FindSourcePoint(plane, back));
    // Two float bilinear inversions in cells about 5e-3 across.
    EXPECT_NEAR(back[0], source[0], 1e-5);
    EXPECT_NEAR(back[1], source[1], 1e-5);
  }
}

}  // namespace
}  // namespace Project
