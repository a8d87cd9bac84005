// The edge finder the end-to-end tests judge straightness and lean by, on
// pictures whose edge is known exactly: an area-sampled step between two
// colours, as a renderer that covers each pixel draws it.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <memory>
#include <optional>

#include "host/io/HostDocument.h"
#include "tests/host/app/ResultEdges.h"

namespace Host::testing {
namespace {

constexpr Colour kDark{0.2, 0.25, 0.3}, kLight{0.8, 0.7, 0.6};

// Dark left of x = edge(y + 0.5), light right of it; each pixel is the
// share of its area on either side, the edge taken as straight over a row.
template <typename Edge>
std::unique_ptr<HostDocument> StepPicture(int32_t width, int32_t height, Edge edge) {
  auto picture = HostDocument::Create(width, height, ImageMode::kRgb);
  for (int32_t y = 0; y < height; ++y) {
    const double x0 = edge(y + 0.5);
    for (int32_t x = 0; x < width; ++x) {
      const double light = std::clamp(x + 1 - x0, 0.0, 1.0);
      for (int p = 0; p < 3; ++p) {
        const double value = (1 - light) * kDark[size_t(p)] + light * kLight[size_t(p)];
        picture->SetSample(p, x, y, int(std::lround(value * picture->MaxSample())));
      }
    }
  }
  return picture;
}

const Colour kStep{kLight[0] - kDark[0], kLight[1] - kDark[1], kLight[2] - kDark[2]};

// Every phase of an edge within its pixel, its centre included, where the
// rise across the edge is flat for a whole pixel; and an edge leaning by a
// pixel over the picture's height, which passes through all of them row by
// row and would come out as a staircase if the finder snapped to pixels.
TEST(FindEdge, FindsAnEdgeWhereverItFallsWithinAPixel) {
  // Eight-bit samples round each pixel's share by 1/255 of the step; the
  // position moves by about as much.
  constexpr double kTolerance = 0.01;
  for (const double phase : {0.0, 0.125, 0.25, 0.5, 0.625, 0.875}) {
    SCOPED_TRACE(phase);
    const double truth = 20 + phase;
    const auto picture = StepPicture(40, 8, [&](double) { return truth; });
    // Looked for from where a mesh might put it, a pixel or so off.
    for (const double from : {truth - 1.2, truth, truth + 0.7}) {
      const std::optional<Point2> found = FindEdge(*picture, {from, 4.5}, {1, 0}, kStep, 3.0);
      ASSERT_TRUE(found.has_value());
      EXPECT_NEAR(found->x, truth, kTolerance) << "from " << from;
      EXPECT_DOUBLE_EQ(found->y, 4.5);
    }
  }

  const auto leaning = [](double y) { return 20.3 + y / 100; };
  const auto picture = StepPicture(40, 100, leaning);
  for (int32_t y = 0; y < 100; ++y) {
    const double truth = leaning(y + 0.5);
    const std::optional<Point2> found =
        FindEdge(*picture, {std::round(truth), y + 0.5}, {1, 0}, kStep, 3.0);
    ASSERT_TRUE(found.has_value()) << y;
    EXPECT_NEAR(found->x, truth, kTolerance) << "row " << y;
  }

  // A rise of the other colour, or none at all, is no edge.
  const Colour reversed{-kStep[0], -kStep[1], -kStep[2]};
  EXPECT_FALSE(FindEdge(*picture, {20.5, 50.5}, {1, 0}, reversed, 3.0).has_value());
  EXPECT_FALSE(FindEdge(*picture, {5.5, 50.5}, {1, 0}, kStep, 3.0).has_value());
}

}  // namespace
}  // namespace Host::testing
