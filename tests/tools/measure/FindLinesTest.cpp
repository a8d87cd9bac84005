#include "tools/measure/lib/FindLines.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <memory>
#include <numbers>
#include <random>
#include <vector>

#include "tools/measure/lib/MeasureError.h"

namespace Measure {
namespace {

constexpr double kDegree = std::numbers::pi / 180.0;

// A dark bar: the points within half a width of a polyline.
struct Bar {
  std::vector<Point> path;
  double width = 5.5;
};

double DistanceToPath(const Bar& bar, double x, double y) {
  double best = 1e30;
  for (std::size_t i = 0; i + 1 < bar.path.size(); ++i) {
    const Point a = bar.path[i], b = bar.path[i + 1];
    const double dx = b.x - a.x, dy = b.y - a.y;
    const double t = std::clamp(((x - a.x) * dx + (y - a.y) * dy) / (dx * dx + dy * dy), 0.0, 1.0);
    best = std::min(best, std::hypot(x - a.x - t * dx, y - a.y - t * dy));
  }
  return best;
}

// A straight bar of the given length through a centre, at an angle turning
// anticlockwise as seen.
Bar StraightBar(Point centre, double length, double angleDegrees, double width = 5.5) {
  const double cx = std::cos(angleDegrees * kDegree), cy = -std::sin(angleDegrees * kDegree);
  return {{{centre.x - 0.5 * length * cx, centre.y - 0.5 * length * cy},
           {centre.x + 0.5 * length * cx, centre.y + 0.5 * length * cy}},
          width};
}

// An 8-bit RGB picture of bars on a light ground, each pixel the average of
// 8 x 8 samples as a renderer's would be; where `inside` says no, the
// samples are the black of a corrected image's outside.
std::unique_ptr<Host::HostDocument> Paint(
    int width, int height, const std::vector<Bar>& bars,
    const std::function<bool(double, double)>& inside = [](double, double) { return true; }) {
  constexpr int kSamples = 8;
  const double ground[3] = {230, 232, 235}, ink[3] = {36, 41, 56};
  auto image = Host::HostDocument::Create(width, height, Host::ImageMode::kRgb);
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      double sum[3] = {0, 0, 0};
      for (int j = 0; j < kSamples; ++j) {
        for (int i = 0; i < kSamples; ++i) {
          const double sx = x + (i + 0.5) / kSamples, sy = y + (j + 0.5) / kSamples;
          if (!inside(sx, sy)) continue;
          const bool dark = std::any_of(bars.begin(), bars.end(), [&](const Bar& bar) {
            return DistanceToPath(bar, sx, sy) <= 0.5 * bar.width;
          });
          for (int p = 0; p < 3; ++p) sum[p] += dark ? ink[p] : ground[p];
        }
      }
      for (int p = 0; p < 3; ++p) {
        image->SetSample(p, x, y, static_cast<int>(std::lround(sum[p] / (kSamples * kSamples))));
      }
    }
  }
  return image;
}

// Straight bars at every kind of slope, placed off the pixel grid, come out
// straight, at their angle, where they were drawn.
TEST(FindLines, StraightBarsMeasureStraightAtTheirAngle) {
  std::mt19937 random(20240611);
  std::uniform_real_distribution<double> offset(0.0, 1.0);
  for (const double angle : {0.0, 0.7, 14.0, 30.0, 45.0, 63.0, 89.6, 90.0, 118.0, 179.2}) {
    SCOPED_TRACE(angle);
    const Point centre{150.0 + offset(random), 150.0 + offset(random)};
    const double width = 4.0 + 3.0 * offset(random);
    const auto image = Paint(300, 300, {StraightBar(centre, 240.0, angle, width)});
    const std::vector<MeasuredLine> lines = FindLines(*image);
    ASSERT_EQ(lines.size(), 1u);
    const MeasuredLine& line = lines[0];
    // Anti-aliasing in 1/64 steps and 8-bit rounding move the cross-section
    // centroids by a few hundredths of a pixel.
    EXPECT_LT(line.spread, 0.25);
    EXPECT_LT(AngleDifference(line.angle, angle), 0.05);
    // Round caps add a width; the ends are found to the pixel whose ink
    // passes the threshold.
    EXPECT_NEAR(line.length, 240.0 + width, 1.5);
    EXPECT_NEAR(line.centre.x, centre.x, 0.5);  // the same half pixel at either end
    EXPECT_NEAR(line.centre.y, centre.y, 0.5);
    EXPECT_NEAR(line.width, width, 1.0);  // the dark pixels' count over the length
  }
}

// A bar whose end turns aside by 3 pixels shows that bend as its spread,
// whichever way it lies.
TEST(FindLines, ABentEndShowsAsSpread) {
  for (const double angle : {0.0, 25.0, 90.0, 140.0}) {
    SCOPED_TRACE(angle);
    // Along (c, -s), across (s, c): 240 px straight, a 30 px slope to 3 px
    // aside, then 15 px on.
    const double c = std::cos(angle * kDegree), s = std::sin(angle * kDegree);
    const auto at = [&](double along, double across) {
      return Point{150.3 + along * c + across * s, 150.6 - along * s + across * c};
    };
    const Bar hooked{{at(-140, 0), at(100, 0), at(130, 3), at(145, 3)}, 5.0};
    const std::vector<MeasuredLine> lines = FindLines(*Paint(300, 300, {hooked}));
    ASSERT_EQ(lines.size(), 1u);
    // The fitted line leans a little towards the hook, which takes a few
    // tenths of a pixel off the 3 at the extremes.
    EXPECT_NEAR(lines[0].spread, 3.0, 0.35);
  }
}

// Separate bars are separate lines; the black outside of a corrected
// picture is not a line, and neither is a bar cut by it or by the border.
TEST(FindLines, FindsEachWholeBarAndNotTheOutside) {
  const auto inDisc = [](double x, double y) { return std::hypot(x - 200, y - 150) < 140; };
  const std::vector<Bar> bars = {
      StraightBar({150, 150}, 150, 90),  // whole
      StraightBar({250, 140}, 120, 35),  // whole, 100 px away
      StraightBar({200, 20}, 100, 0),    // cut by the outside
      StraightBar({395, 250}, 60, 90)};  // cut by the border, outside the disc anyway
  const std::vector<MeasuredLine> lines = FindLines(*Paint(400, 300, bars, inDisc));
  ASSERT_EQ(lines.size(), 2u);
  // Listed by their topmost pixel: the vertical one reaches higher.
  EXPECT_NEAR(lines[0].angle, 90.0, 0.05);  // as above
  EXPECT_NEAR(lines[1].angle, 35.0, 0.05);
  for (const MeasuredLine& line : lines) EXPECT_LT(line.spread, 0.25);  // as above

  EXPECT_TRUE(FindLines(*Paint(200, 100, {}, inDisc)).empty());
  EXPECT_TRUE(FindLines(*Paint(200, 100, {})).empty());
  // Specks are not lines.
  EXPECT_TRUE(FindLines(*Paint(200, 100, {StraightBar({100, 50}, 8, 0)})).empty());
}

TEST(FindLines, RefusesCmyk) {
  const auto image = Host::HostDocument::Create(20, 20, Host::ImageMode::kCmyk);
  EXPECT_THROW(FindLines(*image), MeasureError);
}

}  // namespace
}  // namespace Measure
