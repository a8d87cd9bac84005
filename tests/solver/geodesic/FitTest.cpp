#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "lens/sphere/PerspectiveImage.h"
#include "solver/geodesic/DenseMatrix.h"
#include "tests/solver/geodesic/GeodesicScene.h"

namespace Project {
namespace {

using Cell = OctaMap::Cell;

// A sample standing at a point of the result plane.
LineSample PlaneSampleAt(const GeodesicScene& scene, double x, double y) {
  const float p[2] = {static_cast<float>(x), static_cast<float>(y)};
  Cell cell;
  EXPECT_TRUE(scene.lines->FindCell(p, cell, 1));
  LineSample sample;
  sample.cellI = cell.i;
  sample.cellJ = cell.j;
  scene.lines->CellWeights(p, cell, 1, sample.weights.data());
  return sample;
}

// Samples on a known line of the result plane, unevenly spaced: the fit
// must give the line's normal and each sample's share of the way along.
TEST(FitTest, FitLinesRecoversAKnownLine) {
  GeodesicScene scene(6, false, WideFisheye());
  const double angle = 0.7, dx = std::cos(angle), dy = std::sin(angle);
  const double shares[] = {0.0, 0.1, 0.35, 0.4, 0.8, 1.0};
  LineRecord line;
  for (double share : shares) {
    const double along = 0.9 * share - 0.45;
    line.samples.push_back(PlaneSampleAt(scene, 0.1 + along * dx, -0.2 + along * dy));
  }
  scene.lines->GetLines().push_back(line);
  scene.lines->FitLines();
  const LineRecord& fitted = scene.lines->GetLines().front();
  // Samples reproduce their points to float rounding (1e-7) over a line
  // 0.9 long.
  EXPECT_NEAR(fitted.normal[0] * dx + fitted.normal[1] * dy, 0.0, 1e-6);
  EXPECT_NEAR(std::hypot(fitted.normal[0], fitted.normal[1]), 1.0, 1e-6);
  for (std::size_t k = 0; k < fitted.samples.size(); ++k) {
    EXPECT_NEAR(fitted.samples[k].position, shares[k], 1e-6) << k;
  }
}

// Plane coordinates made from the mesh by a known homography's inverse:
// eight Gauss-Newton rounds from the identity must find it again.
TEST(FitTest, FitHomographiesRecoversAKnownHomography) {
  GeodesicScene scene(6, false, WideFisheye());
  DenseMatrix<double> h0(3, 3);
  const double truth[9] = {1.1, 0.05, 0.02, -0.03, 0.95, -0.01, 0.04, -0.02, 1.0};
  for (int k = 0; k < 9; ++k) h0(k / 3, k % 3) = truth[k];
  const DenseMatrix<double> inverse = h0.Inverse();
  PlaneRecord plane;
  const int h = scene.map->Half();
  for (int j = h - 8; j <= h + 8; j += 2) {
    for (int i = h - 8; i <= h + 8; i += 2) {
      DenseMatrix<double> uv(3, 1);
      float u, v;
      scene.warp->GetVertexPosition(i, j, u, v);
      uv(0, 0) = u;
      uv(1, 0) = v;
      uv(2, 0) = 1.0;
      const DenseMatrix<double> st = inverse * uv;
      plane.samples.push_back(
          {i, j, static_cast<float>(st(0, 0) / st(2, 0)), static_cast<float>(st(1, 0) / st(2, 0))});
    }
  }
  scene.lines->GetPlanes().push_back(plane);
  scene.lines->FitHomographies();
  const auto& fitted = scene.lines->GetPlanes().front().homography;
  // (s, t) are rounded to float: 1e-7 relative on coordinates below 1.
  for (int k = 0; k < 9; ++k) EXPECT_NEAR(fitted[k], truth[k], 1e-6) << k;
}

// Lines that are vertical in a world tilted against the camera: after the
// automatic rotation each one's end directions span a plane through the z
// axis, and the world's vertical, seen from the camera, turns to z.
TEST(FitTest, AutoRotationMakesVerticalsVertical) {
  GeodesicScene scene(6, false, WideFisheye());
  const DenseMatrix<double> tilt =
      DenseMatrix<double>::Rotation(0, 0.25) * DenseMatrix<double>::Rotation(1, -0.15);
  auto fraction = [&](double lon, double lat) {
    // The world direction, in the camera's frame: tilt^T w.
    const Vec3 w = Direction(lon, lat);
    Vec3 p;
    for (int r = 0; r < 3; ++r) {
      const double value = tilt(0, r) * w.x + tilt(1, r) * w.y + tilt(2, r) * w.z;
      (r == 0 ? p.x : r == 1 ? p.y : p.z) = value;
    }
    const double plon = std::atan2(p.y, p.x), plat = std::asin(p.z);
    return scene.Fraction(plon, plat);
  };
  auto addVertical = [&](double lon) {
    const Point2f a = fraction(lon, -0.5), b = fraction(lon, 0.45);
    const float from[2] = {a.x, a.y}, to[2] = {b.x, b.y};
    LineRecord line;
    scene.lines->TraceArc(line, line, from, to, 2, 0);
    ASSERT_TRUE(line.active);
    line.hasFixedNormal = true;
    line.fixedNormal = {1.0f, 0.0f};
    scene.lines->GetLines().push_back(line);
  };
  auto check = [&](double tolerance) {
    float r[9];
    scene.lines->ComputeAutoRotation(r);
    auto rotate = [&](Vec3 p) {
      return Vec3{r[0] * p.x + r[1] * p.y + r[2] * p.z, r[3] * p.x + r[4] * p.y + r[5] * p.z,
                  r[6] * p.x + r[7] * p.y + r[8] * p.z};
    };
    // A rotation: its rows orthonormal. Single precision.
    for (int a = 0; a < 3; ++a) {
      for (int b = 0; b < 3; ++b) {
        const double dot =
            r[3 * a] * r[3 * b] + r[3 * a + 1] * r[3 * b + 1] + r[3 * a + 2] * r[3 * b + 2];
        EXPECT_NEAR(dot, a == b ? 1.0 : 0.0, 1e-6);
      }
    }
    for (const LineRecord& line : scene.lines->GetLines()) {
      const Vec3 n = Cross(rotate(scene.SampleDirection(line.samples.front(), 0)),
                           rotate(scene.SampleDirection(line.samples.back(), 0)));
      EXPECT_NEAR(n.z / Length(n), 0.0, tolerance);
    }
    return rotate(Vec3{tilt(2, 0), tilt(2, 1), tilt(2, 2)});
  };
  float identity[9];
  scene.lines->ComputeAutoRotation(identity);
  EXPECT_EQ(identity[0] + identity[4] + identity[8], 3.0f);

  // One line: exact up to single precision.
  addVertical(-0.6);
  check(1e-6);
  // Three lines fit in the least-squares sense; their traced ends carry the
  // mesh's interpolation error, some 1e-5 of a radian at level 6.
  addVertical(0.1);
  addVertical(0.7);
  const Vec3 vertical = check(1e-4);
  EXPECT_NEAR(vertical.x, 0.0, 1e-4);  // as above
  EXPECT_NEAR(vertical.y, 0.0, 1e-4);
}

// Under a pinhole camera great circles are straight lines of the picture, so
// a polygon of the picture holds exactly the vertices whose texture
// coordinates lie inside it. Vertices within a hair of an edge are left out
// of the comparison: the corners reach the sphere through the mesh.
TEST(FitTest, SamplePlaneTakesTheVerticesInside) {
  GeodesicScene scene(6, false,
                      std::make_shared<PerspectiveImage>(std::make_shared<const Image>(1000, 750),
                                                         500.0f, 500.0f, 375.0f));
  PlaneRecord plane;
  plane.corners = {{0.3f, 0.3f}, {0.7f, 0.35f}, {0.65f, 0.7f}, {0.35f, 0.6f}};
  ASSERT_TRUE(scene.lines->SamplePlane(plane));
  EXPECT_EQ(plane.spherePoints.size(), 4u);
  std::vector<bool> sampled(static_cast<std::size_t>(scene.map->Width() * scene.map->Width()));
  for (const PlaneSample& s : plane.samples) {
    sampled[static_cast<std::size_t>(s.j * scene.map->Width() + s.i)] = true;
  }
  int inside = 0;
  for (int j = 0; j < scene.map->Width(); ++j) {
    for (int i = 0; i < scene.map->Width(); ++i) {
      if (!scene.warp->IsVertexInside(i, j)) continue;
      float lat, lon, uv[2];
      scene.map->GetDirection(i, j, lat, lon);
      scene.model->GetTexCoord(lon, lat, uv);
      // Signed distances to the edges of the counter-clockwise polygon.
      double nearest = 1.0;
      for (std::size_t k = 0; k < 4; ++k) {
        const Point2f a = plane.corners[k], b = plane.corners[(k + 1) % 4];
        const double cross = (b.x - a.x) * (uv[1] - a.y) - (b.y - a.y) * (uv[0] - a.x);
        nearest = std::min(nearest, cross / std::hypot(b.x - a.x, b.y - a.y));
      }
      // The corners' interpolation moves an edge by well under 1e-4 of the
      // picture.
      if (std::fabs(nearest) < 1e-4) continue;
      EXPECT_EQ(sampled[static_cast<std::size_t>(j * scene.map->Width() + i)], nearest > 0.0)
          << i << " " << j;
      inside += nearest > 0.0;
    }
  }
  EXPECT_GT(inside, 100);
}

}  // namespace
}  // namespace Project
