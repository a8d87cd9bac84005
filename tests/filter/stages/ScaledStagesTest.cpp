// The display's reductions of the source and of the full result, each
// against a box average of the full-size pixels computed here.

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <memory>
#include <string>

#include "filter/PImageHub.h"
#include "filter/PResult.h"
#include "filter/PResultScaled.h"
#include "filter/PSource.h"
#include "filter/PSourceScaled.h"
#include "tests/support/FilterFixture.h"
#include "tests/support/MesaUnderSanitizers.h"

namespace Project::testing {
namespace {

using Host::ImageMode;

// The largest difference between the reduced pixmap over bounds and the
// mean of each factor x factor block of the full one, over the first
// `planes` planes.
double WorstBoxError(const Tarsa::CPixmap& full, const Tarsa::CPixmap& reduced,
                     const Tarsa::CRect& bounds, std::int32_t factor, std::uint32_t planes) {
  double worst = 0.0;
  for (std::uint32_t p = 0; p < planes; ++p) {
    for (std::int32_t y = bounds.top; y < bounds.bottom; ++y) {
      for (std::int32_t x = bounds.left; x < bounds.right; ++x) {
        double sum = 0.0;
        for (std::int32_t dy = 0; dy < factor; ++dy) {
          for (std::int32_t dx = 0; dx < factor; ++dx)
            sum += full.Sample(p, x * factor + dx, y * factor + dy);
        }
        worst = std::max(worst, std::fabs(sum / (factor * factor) - reduced.Sample(p, x, y)));
      }
    }
  }
  return worst;
}

class ScaledStages : public FilterRunTest {
 protected:
  void TearDown() override {
    filter_.reset();
    host_.reset();
    FilterRunTest::TearDown();
  }

  // A scripted run over a patterned picture of that size, its hub showing
  // the display rectangle.
  PImageHub& RunShowing(std::int32_t width, std::int32_t height, const Tarsa::CRect& display) {
    host_ = std::make_unique<Tarsa::testing::RealHost>(ImageMode::kRgb, width, height, false);
    Host::testing::FillDetail(*host_->document);
    filter_ = std::make_unique<ShaderPFilter>();
    EXPECT_EQ(RunScripted(*host_, *filter_), 0);
    PImageHub& hub = filter_->ImageHub();
    hub.SetDisplayRect(display);
    return hub;
  }

  std::unique_ptr<Tarsa::testing::RealHost> host_;
  std::unique_ptr<ShaderPFilter> filter_;
};

// A third of the picture's size: four sub-blocks a tile side (doubling
// while the ratio is above the count), and every display pixel the mean of
// its 3 x 3 block, in the source and in the solved result alike.
TEST_F(ScaledStages, SourceAndResultShrinkToTheDisplay) {
  PImageHub& hub = RunShowing(420, 300, {0, 0, 140, 100});

  PSourceScaled& source = hub.SourceScaled();
  EXPECT_EQ(source.StepsX(), 4u);
  EXPECT_EQ(source.StepsY(), 4u);
  ASSERT_NE(source.RunAll(true, 0, 0), 0);
  EXPECT_EQ(source.DoneSteps(), source.TotalSteps());
  // The reduction rounds its mean to the nearest sample.
  EXPECT_LE(WorstBoxError(*hub.Source().Pixels(), *source.Pixels(), source.Destination(), 3, 3),
            0.5 + 1e-6);

  PResultScaled& result = hub.ResultScaled();
  ASSERT_NE(result.RunAll(true, 0, 0), 0);
  EXPECT_LE(WorstBoxError(*hub.ResultFull().Pixels(), *result.Pixels(), result.Destination(), 3, 4),
            0.5 + 1e-6);

  // A changed source area makes again just the display tiles that show it
  // (with a pixel's margin), and the full result's tiles below them; the
  // source is read again there and reduced as before.
  hub.Source().Invalidate({0, 0, 30, 30});
  EXPECT_EQ(source.Counter(0, 0), 0u);
  EXPECT_EQ(source.Counter(1, 0), source.StepsPerCell());
  EXPECT_EQ(result.Counter(0, 0), 0u);
  EXPECT_EQ(result.Counter(1, 0), result.StepsPerCell());
  ASSERT_NE(source.RunAll(true, 0, 0), 0);
  EXPECT_EQ(source.Counter(0, 0), source.StepsPerCell());
  EXPECT_LE(WorstBoxError(*hub.Source().Pixels(), *source.Pixels(), source.Destination(), 3, 3),
            0.5 + 1e-6);
}

// A display as large as the picture: one block a tile, an exact copy.
TEST_F(ScaledStages, SameSizeCopies) {
  PImageHub& hub = RunShowing(200, 150, {0, 0, 200, 150});
  PSourceScaled& source = hub.SourceScaled();
  EXPECT_EQ(source.StepsPerCell(), 1u);
  ASSERT_NE(source.RunAll(true, 0, 0), 0);
  EXPECT_EQ(WorstBoxError(*hub.Source().Pixels(), *source.Pixels(), source.Destination(), 1, 4),
            0.0);
}

}  // namespace
}  // namespace Project::testing
