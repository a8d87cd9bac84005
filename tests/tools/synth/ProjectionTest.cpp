#include "tools/synth/lib/Projection.h"

#include <gtest/gtest.h>

#include <cmath>
#include <numbers>
#include <random>

#include "tools/synth/lib/Camera.h"

namespace Synth {
namespace {

constexpr double kPi = std::numbers::pi;
const Point2 kCentre{600.0, 400.0};

Distortion CoefficientsFor(ProjectionKind kind) {
  switch (kind) {
    case ProjectionKind::kRadial:
      return {-0.1, 0.01, 0.0, 0.0, 0.0};
    case ProjectionKind::kTangential:
      return {-0.1, 0.01, 0.0, 0.01, 0.02};
    case ProjectionKind::kFisheyePoly:
      return {-0.05, 0.01, 0.0, 0.0, 0.0};
    default:
      return {};
  }
}

class ProjectionRoundTrip : public testing::TestWithParam<ProjectionKind> {};

// Direction -> pixel -> direction over random directions, and pixel ->
// direction -> pixel over the image; the distorted kinds exercise the
// numerical inverse.
TEST_P(ProjectionRoundTrip, MapsBackWhereItCameFrom) {
  const Projection projection(GetParam(), 500.0, kCentre, CoefficientsFor(GetParam()));
  std::mt19937 random(20240611);
  std::normal_distribution<double> normal;
  int inside = 0;
  for (int i = 0; i < 3000; ++i) {
    const Vec3 direction = Normalised({normal(random), normal(random), normal(random)});
    Point2 pixel;
    if (!projection.ToImage(direction, &pixel)) continue;
    ++inside;
    Vec3 back;
    ASSERT_TRUE(projection.ToDirection(pixel, &back)) << pixel.x << ", " << pixel.y;
    // Inversion converges to 1e-15; rounding grows near the domain's rim.
    EXPECT_LT(Length(back - direction), 1e-9) << pixel.x << ", " << pixel.y;
  }
  EXPECT_GT(inside, 600);  // every kind sees at least a hemisphere's quarter

  std::uniform_real_distribution<double> across(0.0, 1200.0);
  std::uniform_real_distribution<double> down(0.0, 800.0);
  for (int i = 0; i < 2000; ++i) {
    const Point2 pixel{across(random), down(random)};
    Vec3 direction;
    if (!projection.ToDirection(pixel, &direction)) continue;
    Point2 back;
    ASSERT_TRUE(projection.ToImage(direction, &back));
    // Pixel positions of a few hundred carry about 1e-13 of rounding.
    EXPECT_NEAR(back.x, pixel.x, 1e-8);
    EXPECT_NEAR(back.y, pixel.y, 1e-8);
  }
}

INSTANTIATE_TEST_SUITE_P(EveryKind, ProjectionRoundTrip,
                         testing::Values(ProjectionKind::kRectilinear,
                                         ProjectionKind::kFisheyeEquisolid,
                                         ProjectionKind::kFisheyeEquidistant,
                                         ProjectionKind::kCylindrical,
                                         ProjectionKind::kEquirectangular, ProjectionKind::kRadial,
                                         ProjectionKind::kTangential, ProjectionKind::kFisheyePoly),
                         [](const testing::TestParamInfo<ProjectionKind>& info) {
                           std::string name = ProjectionName(info.param);
                           std::erase(name, '-');
                           return name;
                         });

// The lens formulas worked by hand: x grows with longitude (to the right),
// y with falling latitude (downwards), about the centre (600, 400), f = 500.
TEST(Projection, PlacesDirectionsByTheLensFormulas) {
  struct Case {
    ProjectionKind kind;
    Vec3 direction;
    double x, y;
  };
  const Case cases[] = {
      {ProjectionKind::kRectilinear, {1.0, 0.2, 0.1}, 700.0, 350.0},
      {ProjectionKind::kFisheyeEquisolid, DirectionOf(0.0, kPi / 3), 600.0, -100.0},
      {ProjectionKind::kFisheyeEquidistant, DirectionOf(0.5, 0.0), 850.0, 400.0},
      {ProjectionKind::kCylindrical, DirectionOf(1.0, 0.5), 1100.0, 400.0 - 500.0 * std::tan(0.5)},
      {ProjectionKind::kEquirectangular, DirectionOf(-2.0, 0.4), -400.0, 200.0},
      // 0.2 (1 - 0.1 * 0.04 + 0.01 * 0.0016)
      {ProjectionKind::kRadial, {1.0, 0.2, 0.0}, 600.0 + 500.0 * 0.1992032, 400.0},
      // u = 0.2 + 2 t1 u v + t2 (r2 + 2 u^2), v = 0.1 + t1 (r2 + 2 v^2) + 2 t2 u v
      {ProjectionKind::kTangential, {1.0, 0.2, 0.1}, 600.0 + 500.0 * 0.203, 400.0 - 500.0 * 0.1015},
      // 0.5 (1 - 0.05 * 0.25 + 0.01 * 0.0625)
      {ProjectionKind::kFisheyePoly, DirectionOf(0.5, 0.0), 600.0 + 500.0 * 0.4940625, 400.0},
  };
  for (const Case& c : cases) {
    Distortion d = CoefficientsFor(c.kind);
    if (c.kind == ProjectionKind::kTangential) d.k1 = d.k2 = 0.0;
    const Projection projection(c.kind, 500.0, kCentre, d);
    Point2 pixel;
    ASSERT_TRUE(projection.ToImage(Normalised(c.direction), &pixel)) << ProjectionName(c.kind);
    // Hand-worked decimals are exact; only double rounding remains.
    EXPECT_NEAR(pixel.x, c.x, 1e-9) << ProjectionName(c.kind);
    EXPECT_NEAR(pixel.y, c.y, 1e-9) << ProjectionName(c.kind);
  }
}

TEST(Projection, FisheyeFieldEndsAtItsAngle) {
  const Projection fisheye(ProjectionKind::kFisheyeEquisolid, 500.0, kCentre);
  Point2 pixel;
  EXPECT_TRUE(fisheye.ToImage(DirectionOf(89.0 * kPi / 180, 0.0), &pixel));
  EXPECT_FALSE(fisheye.ToImage(DirectionOf(91.0 * kPi / 180, 0.0), &pixel));
  Vec3 direction;
  // The 90 degree circle has radius f sqrt(2) = 707.1 pixels.
  EXPECT_TRUE(fisheye.ToDirection({600.0 + 707.0, 400.0}, &direction));
  EXPECT_FALSE(fisheye.ToDirection({600.0 + 708.0, 400.0}, &direction));
}

// Turns by hand: the view axis after yaw and pitch, and roll's sense.
TEST(Camera, TurnsAsItsAnglesSay) {
  const Projection lens(ProjectionKind::kRectilinear, 500.0, kCentre);
  const double yaw = 30.0 * kPi / 180;
  const double pitch = 20.0 * kPi / 180;
  const Camera turned({1.0, 2.0, 3.0}, yaw, pitch, 0.4, lens, 1200, 800);
  Point2 pixel;
  const Vec3 ahead{std::cos(pitch) * std::cos(yaw), std::cos(pitch) * std::sin(yaw),
                   std::sin(pitch)};
  ASSERT_TRUE(turned.Project(Vec3{1.0, 2.0, 3.0} + 5.0 * ahead, &pixel));
  // Distances of 5 m carry rounding of about 1e-15 m.
  EXPECT_NEAR(pixel.x, 600.0, 1e-9);
  EXPECT_NEAR(pixel.y, 400.0, 1e-9);

  // Rolled a quarter turn to the right, the world's right is the image's top.
  const Camera rolled({0, 0, 0}, 0.0, 0.0, kPi / 2, lens, 1200, 800);
  ASSERT_TRUE(rolled.Project({5.0, 1.0, 0.0}, &pixel));
  EXPECT_NEAR(pixel.x, 600.0, 1e-9);  // as above
  EXPECT_NEAR(pixel.y, 300.0, 1e-9);
  EXPECT_FALSE(rolled.Project({-5.0, 1.0, 0.0}, &pixel));  // behind
}

}  // namespace
}  // namespace Synth
