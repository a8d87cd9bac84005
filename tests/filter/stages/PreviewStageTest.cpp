// The preview's display tiles, as the image hub's idle work makes them for
// a pane: against the full result reduced afterwards (the other road to
// the same picture), against the full result itself at the image's size,
// and only where the pane looks.

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <utility>

#include "filter/PImageHub.h"
#include "filter/PPreview.h"
#include "filter/PPreviewTarget.h"
#include "filter/PResult.h"
#include "filter/PResultScaled.h"
#include "tests/support/FilterFixture.h"

namespace Project::testing {
namespace {

using Host::ImageMode;

constexpr std::int32_t kTile = 128;

// The pane as the hub sees it: what it was told, kept.
class RecordingPane : public PPreviewTarget {
 public:
  void PreviewChanged(const Tarsa::CRect& area) override {
    ++changes;
    last = area;
  }
  void PreviewProgress(std::uint64_t d, std::uint64_t t) override {
    done = d;
    total = t;
  }
  int changes = 0;
  Tarsa::CRect last;
  std::uint64_t done = 0;
  std::uint64_t total = 0;
};

class PreviewStage : public FilterRunTest {
 protected:
  void TearDown() override {
    if (filter_ != nullptr && filter_->HasImageHub()) filter_->ImageHub().ConnectPane(nullptr);
    filter_.reset();
    host_.reset();
    FilterRunTest::TearDown();
  }

  // A scripted run over a patterned picture, then the pane connected with
  // the display picture in sight.
  PImageHub& Show(std::int32_t width, std::int32_t height, const Tarsa::CRect& display) {
    host_ = std::make_unique<Tarsa::testing::RealHost>(ImageMode::kRgb, width, height, false);
    Host::testing::FillDetail(*host_->document);
    filter_ = std::make_unique<ShaderPFilter>();
    EXPECT_EQ(RunScripted(*host_, *filter_), 0);
    PImageHub& hub = filter_->ImageHub();
    hub.ConnectPane(&pane_);
    hub.SetDisplayRect(display);
    hub.SetVisibleRect(display);
    return hub;
  }

  // The display tile's pixel (x, y), in the display's coordinates.
  static const std::uint8_t* Pixel(const PPreview& preview, std::int32_t x, std::int32_t y) {
    const std::uint8_t* tile = preview.TilePixels(x / kTile, y / kTile);
    return tile == nullptr ? nullptr
                           : tile + (std::size_t(y % kTile) * kTile + std::size_t(x % kTile)) * 4;
  }

  std::unique_ptr<Tarsa::testing::RealHost> host_;
  std::unique_ptr<ShaderPFilter> filter_;
  RecordingPane pane_;
};

// A third of the picture's size: the result drawn straight from the
// reduced source against the full result reduced by its box average.
TEST_F(PreviewStage, DirectResultAgreesWithTheFullResultReduced) {
  PImageHub& hub = Show(420, 300, {0, 0, 140, 100});
  ASSERT_TRUE(hub.RunSteps(60.0));
  PPreview& preview = hub.Preview();
  EXPECT_TRUE(preview.Scaled());
  EXPECT_EQ(pane_.done, pane_.total);
  EXPECT_GT(pane_.changes, 0);

  PResultScaled& reduced = hub.ResultScaled();
  ASSERT_NE(reduced.RunAll(true, 0, 0), 0);
  // The mean difference with the reduction moved by (dx, dy), signed and
  // absolute, over the picture's inside.
  const auto compare = [&](std::int32_t dx, std::int32_t dy, double& mean, double& meanAbs) {
    double sum = 0, sumAbs = 0;
    std::size_t count = 0;
    for (std::int32_t y = 2; y < 98; ++y) {
      for (std::int32_t x = 2; x < 138; ++x) {
        const std::uint8_t* shown = Pixel(preview, x, y);
        if (shown == nullptr || shown[3] < 255 || reduced.Pixels()->Sample(3, x + dx, y + dy) < 255)
          continue;  // the picture's edge
        for (std::uint32_t c = 0; c < 3; ++c) {
          const int d = int(shown[c]) - int(reduced.Pixels()->Sample(c, x + dx, y + dy));
          sum += d;
          sumAbs += std::abs(d);
          ++count;
        }
      }
    }
    ASSERT_GT(count, 3u * 100u * 100u);
    mean = sum / double(count);
    meanAbs = sumAbs / double(count);
  };
  double mean = 0, meanAbs = 0;
  compare(0, 0, mean, meanAbs);
  // Reducing before the warp or after it blurs the pattern's fine detail
  // differently (6.6 levels in the mean here), but neither tints it nor
  // moves it: in place they agree better than a pixel off either way.
  EXPECT_LT(std::abs(mean), 0.5);
  EXPECT_LT(meanAbs, 8.0);
  for (const auto& [dx, dy] : {std::pair{1, 0}, {-1, 0}, {0, 1}, {0, -1}}) {
    double shiftedMean = 0, shiftedAbs = 0;
    compare(dx, dy, shiftedMean, shiftedAbs);
    EXPECT_LT(meanAbs, shiftedAbs) << "a better match " << dx << ", " << dy << " off";
  }
}

// At the image's size the tiles are the full result's pixels, in display
// colours (an RGB document's are its own), alpha included.
TEST_F(PreviewStage, AtTheImagesSizeTilesAreTheFullResult) {
  PImageHub& hub = Show(300, 200, {0, 0, 300, 200});
  ASSERT_TRUE(hub.RunSteps(60.0));
  PPreview& preview = hub.Preview();
  EXPECT_FALSE(preview.Scaled());
  const Tarsa::CPixmap& full = *hub.ResultFull().Pixels();
  for (std::int32_t y = 0; y < 200; y += 7) {
    for (std::int32_t x = 0; x < 300; x += 5) {
      const std::uint8_t* shown = Pixel(preview, x, y);
      ASSERT_NE(shown, nullptr);
      for (std::uint32_t c = 0; c < 4; ++c)
        ASSERT_EQ(shown[c], full.Sample(c, x, y)) << x << ", " << y << " plane " << c;
    }
  }
}

// The idle work makes the tiles in sight and no others; a new mesh makes
// them stale while their old pixels stay shown until they are made again.
TEST_F(PreviewStage, OnlyTheTilesInSightAreMade) {
  PImageHub& hub = Show(800, 600, {0, 0, 400, 300});
  hub.SetVisibleRect({10, 10, 100, 100});
  ASSERT_TRUE(hub.RunSteps(60.0));
  PPreview& preview = hub.Preview();
  EXPECT_EQ(pane_.total, 1u);
  EXPECT_NE(preview.TilePixels(0, 0), nullptr);
  EXPECT_EQ(preview.TilePixels(1, 0), nullptr);
  EXPECT_EQ(preview.TilePixels(3, 2), nullptr);

  hub.SetVisibleRect({0, 0, 400, 300});
  ASSERT_TRUE(hub.RunSteps(60.0));
  EXPECT_EQ(pane_.total, 12u);
  EXPECT_NE(preview.TilePixels(3, 2), nullptr);

  hub.RebuildResults();
  EXPECT_EQ(preview.Counter(0, 0), 0u);
  EXPECT_NE(preview.TilePixels(0, 0), nullptr) << "the old picture stays until the new one";
  ASSERT_TRUE(hub.RunSteps(60.0));
  EXPECT_EQ(preview.Counter(3, 2), preview.StepsOf(3, 2));
}

}  // namespace
}  // namespace Project::testing
