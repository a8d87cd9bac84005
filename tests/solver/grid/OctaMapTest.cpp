#include "solver/grid/OctaMap.h"

#include <gtest/gtest.h>

#include <cmath>

namespace Project {
namespace {

constexpr double kPi = 3.14159265358979323846;

double Dot(const float a[3], const float b[3]) { return a[0] * b[0] + a[1] * b[1] + a[2] * b[2]; }

class OctaMapLevels : public ::testing::TestWithParam<int> {};

// Every vertex is a unit vector, and the octant weights recomputed from it
// by the inverse formulas are the vertex's barycentric place in its
// triangle: sum to one, and agree between the two 3 x 3 solve roads.
TEST_P(OctaMapLevels, VerticesAreUnitAndInvertTheirWeights) {
  const OctaMap map(GetParam(), false);
  const OctaMap eliminated(GetParam(), true);
  const int n = map.Width();
  ASSERT_EQ(n, (1 << (GetParam() + 1)) + 1);
  for (int j = 0; j < n; ++j) {
    for (int i = 0; i < n; ++i) {
      float p[3], q[3];
      map.GetPoint(i, j, p);
      eliminated.GetPoint(i, j, q);
      // Single-precision solve of a well-conditioned 3 x 3 system.
      EXPECT_NEAR(Dot(p, p), 1.0, 2e-6) << i << "," << j;
      for (int k = 0; k < 3; ++k) EXPECT_NEAR(p[k], q[k], 1e-6) << i << "," << j;
      const double x = std::fabs(p[0]), y = std::fabs(p[1]), z = std::fabs(p[2]);
      const double wx = 4 / kPi * std::atan(x / (1 + y + z));
      const double wy = 4 / kPi * std::atan(y / (1 + x + z));
      const double wz = 4 / kPi * std::atan(z / (1 + x + y));
      // Float rounding of the tangents and the solve, about 1e-7 each.
      EXPECT_NEAR(wx + wy + wz, 1.0, 1e-6);
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Levels, OctaMapLevels, ::testing::Values(1, 3, 6));

// The named vertices, the linear weight along an edge of the square, and
// the fold: (i, 0) and (2h - i, 0) are one direction, on all four sides.
TEST(OctaMap, LandmarksAndFoldedBorder) {
  const OctaMap map(1, false);  // N = 5, h = 2
  const int h = map.Half();
  ASSERT_EQ(h, 2);
  struct Landmark {
    int i, j;
    float x, y, z;
  };
  const Landmark marks[] = {{h, h, 1, 0, 0},      {h, 0, 0, 0, 1},      {h, 2 * h, 0, 0, -1},
                            {0, h, 0, -1, 0},     {2 * h, h, 0, 1, 0},  {0, 0, -1, 0, 0},
                            {2 * h, 0, -1, 0, 0}, {0, 2 * h, -1, 0, 0}, {2 * h, 2 * h, -1, 0, 0}};
  for (const Landmark& m : marks) {
    float p[3];
    map.GetPoint(m.i, m.j, p);
    // Exact up to the rounding of tan(pi / 4) in single precision.
    EXPECT_NEAR(p[0], m.x, 1e-6) << m.i << "," << m.j;
    EXPECT_NEAR(p[1], m.y, 1e-6) << m.i << "," << m.j;
    EXPECT_NEAR(p[2], m.z, 1e-6) << m.i << "," << m.j;
  }
  // Halfway from +x to +z along the square's edge: weight 1/2 on each, so
  // x = z = tan(pi / 8) (1 + x), the 45-degree direction.
  float mid[3];
  map.GetPoint(h, h / 2, mid);
  EXPECT_NEAR(mid[0], std::sqrt(0.5), 1e-6);  // float solve rounding
  EXPECT_NEAR(mid[2], std::sqrt(0.5), 1e-6);

  const OctaMap big(4, false);
  const int n = big.Width(), hb = big.Half();
  for (int k = 0; k < n; ++k) {
    float a[3], b[3];
    const std::pair<int, int> pairs[4][2] = {{{k, 0}, {2 * hb - k, 0}},
                                             {{k, n - 1}, {2 * hb - k, n - 1}},
                                             {{0, k}, {0, 2 * hb - k}},
                                             {{n - 1, k}, {n - 1, 2 * hb - k}}};
    for (const auto& pr : pairs) {
      big.GetPoint(pr[0].first, pr[0].second, a);
      big.GetPoint(pr[1].first, pr[1].second, b);
      // The two sides of the fold are computed from mirrored triangles.
      EXPECT_GT(Dot(a, b), 1.0 - 1e-6) << pr[0].first << "," << pr[0].second;
    }
  }
}

// Crossing any side of any cell lands in a cell that shares that side's two
// corner directions: across the border that is the mirrored cell, entered
// through the same side.
TEST(OctaMap, NeighbourCellSharesTheCrossedEdge) {
  for (int level : {1, 3}) {
    const OctaMap map(level, false);
    const int cells = map.Width() - 1;
    // Corner offsets of each side, in the order (i, j), (i + 1, j),
    // (i + 1, j + 1), (i, j + 1).
    const int cornerI[4] = {0, 1, 1, 0}, cornerJ[4] = {0, 0, 1, 1};
    for (int j = 0; j < cells; ++j) {
      for (int i = 0; i < cells; ++i) {
        for (int side = 0; side < 4; ++side) {
          const OctaMap::Cell next = map.NeighbourCell({i, j}, side);
          ASSERT_GE(next.i, 0);
          ASSERT_LT(next.i, cells);
          ASSERT_GE(next.j, 0);
          ASSERT_LT(next.j, cells);
          // Both ends of the crossed edge must be corners of the neighbour.
          for (int e = 0; e < 2; ++e) {
            const int k = (side + e) % 4;
            float p[3];
            map.GetPoint(i + cornerI[k], j + cornerJ[k], p);
            bool shared = false;
            for (int c = 0; c < 4; ++c) {
              float q[3];
              map.GetPoint(next.i + cornerI[c], next.j + cornerJ[c], q);
              shared = shared || Dot(p, q) > 1.0 - 1e-6;  // same direction up to rounding
            }
            EXPECT_TRUE(shared) << "cell " << i << "," << j << " side " << side;
          }
          // Stepping back returns to the cell: through the opposite side
          // inside the square, through the same side across the fold.
          const bool folded = (side == 0 && j == 0) || (side == 1 && i == cells - 1) ||
                              (side == 2 && j == cells - 1) || (side == 3 && i == 0);
          EXPECT_EQ(map.NeighbourCell(next, folded ? side : (side + 2) % 4), (OctaMap::Cell{i, j}));
        }
      }
    }
  }
}

// Directions, the rotation that every reader applies and the tangent frame.
TEST(OctaMap, RotationAndTangentFrame) {
  OctaMap map(3, false);
  const int h = map.Half();
  float lat, lon;
  map.GetDirection(h, 0, lat, lon);
  EXPECT_NEAR(lat, kPi / 2, 1e-6);  // acos near 1 in single precision
  EXPECT_EQ(lon, 0.0f);             // the pole's longitude is pinned to 0
  map.GetDirection(2 * h, h, lat, lon);
  EXPECT_NEAR(lon, kPi / 2, 1e-6);

  // A quarter turn about z takes +x to +y.
  const float r[9] = {0, -1, 0, 1, 0, 0, 0, 0, 1};
  map.SetRotation(r);
  EXPECT_TRUE(map.HasRotation());
  float p[3];
  map.GetPoint(h, h, p);
  EXPECT_FLOAT_EQ(p[0], 1.0f);  // the stored point is untouched
  map.GetRotatedPoint(h, h, p);
  EXPECT_NEAR(p[1], 1.0, 1e-6);
  map.GetRotatedDirection(h, h, lat, lon);
  EXPECT_NEAR(lon, kPi / 2, 1e-6);

  // East and north are unit, orthogonal to each other and to the point.
  for (int j = 1; j < map.Width() - 1; j += 3) {
    for (int i = 1; i < map.Width() - 1; i += 3) {
      float east[3], north[3], q[3];
      map.GetTangentFrame(i, j, east, north);
      map.GetRotatedPoint(i, j, q);
      // Float trigonometry and the rotation product.
      EXPECT_NEAR(Dot(east, east), 1.0, 1e-6);
      EXPECT_NEAR(Dot(north, north), 1.0, 1e-6);
      EXPECT_NEAR(Dot(east, north), 0.0, 1e-6);
      EXPECT_NEAR(Dot(east, q), 0.0, 1e-5);
      EXPECT_NEAR(Dot(north, q), 0.0, 1e-5);
    }
  }
}

}  // namespace
}  // namespace Project
