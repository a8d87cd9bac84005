#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <ostream>
#include <string>

#include "tools/synth/lib/Render.h"

namespace Synth {
namespace {

struct Shot {
  const char* name;
  SceneKind scene;
  ProjectionKind projection;
  double focalMm;
  double yaw, pitch, roll;
  int width, height;
};

void PrintTo(const Shot& shot, std::ostream* out) { *out << shot.name; }

// The gray level at a position, bilinear between pixel centres.
double Level(const Host::HostDocument& image, double x, double y) {
  const double fx = x - 0.5;
  const double fy = y - 0.5;
  const int ix = static_cast<int>(std::floor(fx));
  const int iy = static_cast<int>(std::floor(fy));
  const double ax = fx - ix;
  const double ay = fy - iy;
  auto at = [&](int px, int py) { return static_cast<double>(image.Sample(0, px, py)); };
  return (1 - ay) * ((1 - ax) * at(ix, iy) + ax * at(ix + 1, iy)) +
         ay * ((1 - ax) * at(ix, iy + 1) + ax * at(ix + 1, iy + 1));
}

class TruthOnEdges : public testing::TestWithParam<Shot> {};

// Across each truth point the rendered image steps from one paint to the
// other, and the step's midpoint lies on the point: the truth and the
// picture agree about where the scene's edges are.
TEST_P(TruthOnEdges, PointsSitOnTheRenderedTransitions) {
  const Shot& shot = GetParam();
  CameraSpec camera;
  camera.projection = shot.projection;
  camera.focalMm = shot.focalMm;
  camera.yaw = shot.yaw;
  camera.pitch = shot.pitch;
  camera.roll = shot.roll;
  camera.width = shot.width;
  camera.height = shot.height;
  camera.colour = Host::ColourModel::kGray;
  const RenderResult photo = Render({shot.scene}, camera);
  const Host::HostDocument& image = *photo.document;
  ASSERT_GT(photo.truth.size(), 10u);

  // A profile reaches kReach along the normal; it is clean when no other
  // edge comes within kClear of its middle.
  constexpr double kReach = 2.5;
  constexpr double kClear = 5.0;
  int checked = 0;
  for (size_t s = 0; s < photo.truth.size(); ++s) {
    const std::vector<Point2>& points = photo.truth[s].points;
    for (size_t i = 1; i + 1 < points.size(); i += 7) {
      const Point2 p = points[i];
      if (p.x < kClear || p.y < kClear || p.x > shot.width - kClear || p.y > shot.height - kClear) {
        continue;
      }
      // Other edges, and this one's own ends, must keep their distance.
      auto near = [&](const Point2& q) {
        return (q.x - p.x) * (q.x - p.x) + (q.y - p.y) * (q.y - p.y) < kClear * kClear;
      };
      bool crowded = near(points.front()) || near(points.back());
      for (size_t o = 0; o < photo.truth.size() && !crowded; ++o) {
        if (o == s) continue;
        for (const Point2& q : photo.truth[o].points) crowded = crowded || near(q);
      }
      if (crowded) continue;
      const Point2 a = points[i - 1];
      const Point2 b = points[i + 1];
      const double length = std::hypot(b.x - a.x, b.y - a.y);
      const double nx = -(b.y - a.y) / length;
      const double ny = (b.x - a.x) / length;
      const double low = Level(image, p.x - kReach * nx, p.y - kReach * ny);
      const double high = Level(image, p.x + kReach * nx, p.y + kReach * ny);
      // Neighbouring paints differ by at least 0.1 of full scale.
      ASSERT_GT(std::abs(high - low), 20.0) << photo.truth[s].id << " at " << p.x << ", " << p.y;
      const double middle = 0.5 * (low + high);
      double crossing = -kReach;
      for (double t = -kReach; t <= kReach; t += 0.01) {
        const double level = Level(image, p.x + t * nx, p.y + t * ny);
        if ((level - middle) * (high - low) >= 0.0) {
          crossing = t;
          break;
        }
      }
      // Sixteen rays a pixel place a rendered edge within 1/8 pixel; the
      // rest is room for curvature over the profile.
      EXPECT_LE(std::abs(crossing), 0.5) << photo.truth[s].id << " at " << p.x << ", " << p.y;
      ++checked;
    }
  }
  EXPECT_GT(checked, 100) << "points checked";  // many points, not a few
}

INSTANTIATE_TEST_SUITE_P(
    Shots, TruthOnEdges,
    testing::Values(Shot{"CheckerRectilinear", SceneKind::kChecker, ProjectionKind::kRectilinear,
                         24.0, 8.0, -5.0, 12.0, 480, 320},
                    Shot{"CheckerEquisolid", SceneKind::kChecker, ProjectionKind::kFisheyeEquisolid,
                         12.0, 20.0, 10.0, -7.0, 480, 320},
                    Shot{"CheckerTangential", SceneKind::kChecker, ProjectionKind::kTangential,
                         16.0, -12.0, 6.0, 3.0, 480, 320},
                    Shot{"CheckerFisheyePoly", SceneKind::kChecker, ProjectionKind::kFisheyePoly,
                         10.0, 0.0, 0.0, 0.0, 480, 320},
                    Shot{"RoomEquirectangular", SceneKind::kRoom, ProjectionKind::kEquirectangular,
                         24.0, 0.0, 0.0, 0.0, 640, 320},
                    Shot{"FacadeCylindrical", SceneKind::kFacade, ProjectionKind::kCylindrical,
                         12.0, 10.0, 5.0, 0.0, 640, 320}),
    [](const testing::TestParamInfo<Shot>& info) { return std::string(info.param.name); });

// An edge across a full panorama's seam leaves at one side and comes back at
// the other: two runs, each ending on its border of the image.
TEST(Truth, SplitsAtThePanoramaSeam) {
  CameraSpec camera;
  camera.projection = ProjectionKind::kEquirectangular;
  camera.width = 400;
  camera.height = 200;
  camera.samplesPerAxis = 1;
  const RenderResult photo = Render({SceneKind::kRoom}, camera);
  // The back wall's bottom runs behind the camera, across longitude 180.
  int runs = 0;
  for (const TruthSegment& segment : photo.truth) {
    if (segment.id.rfind("back-wall.bottom#", 0) != 0) continue;
    ++runs;
    const double x0 = segment.points.front().x;
    const double x1 = segment.points.back().x;
    // Bisection ends the run within a hair of the border.
    EXPECT_TRUE(std::min({x0, x1, 400.0 - x0, 400.0 - x1}) < 1e-6) << x0 << " " << x1;
  }
  EXPECT_EQ(runs, 2);
}

}  // namespace
}  // namespace Synth
