// The final rendering of a scripted run, through the real host library: the
// tiled GPU result against a CPU rendering of the same mesh, in every image
// mode, and the host's progress and abort callbacks.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <utility>
#include <vector>

#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PResult.h"
#include "framework/plugin/CPluginEntry.h"
#include "solver/frame/Solver.h"
#include "tests/support/FilterFixture.h"
#include "tests/support/MesaUnderSanitizers.h"
#include "tests/support/RealHost.h"
#include "tests/support/ReferenceRender.h"

namespace Project::testing {
namespace {

using Host::ImageMode;

// The real host, with a cancel at a chosen abort check and the progress kept.
class CallbackHost : public Tarsa::testing::RealHost {
 public:
  using RealHost::RealHost;
  int abortAtCheck = -1;  // 0: the first check answers yes
  int abortChecks = 0;
  std::vector<std::pair<std::int32_t, std::int32_t>> progress;

 private:
  bool AbortRequested() override { return abortChecks++ == abortAtCheck; }
  void Progress(std::int32_t done, std::int32_t total) override {
    progress.emplace_back(done, total);
  }
};

// A sample as the texture holds it, 0..1: 16-bit samples (0..32768) are
// doubled into the full 16-bit range first.
double Normalised(int sample, int depth) {
  if (depth == 8) return sample / 255.0;
  return (sample < 32768 ? 2.0 * sample : 65535.0) / 65535.0;
}

// A rendered 0..1 value as the host gets it back.
int HostSample(double value, int depth) {
  if (depth == 8) return int(std::lround(value * 255));
  const long full = std::lround(value * 65535);
  return full < 65535 ? int(full / 2) : 32768;
}

struct Tally {
  int compared = 0;
  int failed = 0;
};

class FinalRender : public FilterRunTest {
 protected:
  // Compares the host's document after the run with the CPU rendering of
  // the run's mesh over the document as it was.
  Tally Compare(const Host::HostDocument& before, const Host::HostDocument& after,
                const Solver& solver, int tolerance) {
    const int depth = before.Depth();
    const int planes = before.ColourPlanes() + 1;
    const int alpha = before.ColourPlanes();
    const ReferenceImage reference =
        RenderReference(solver, before.Width(), before.Height(), planes,
                        [&](std::int32_t p, std::int32_t x, std::int32_t y) {
                          // Without transparency the source is opaque.
                          if (p == alpha && !before.HasTransparency()) return 1.0;
                          return Normalised(before.Sample(p, x, y), depth);
                        });
    // The host takes a transparency plane back only with three or four
    // colour planes; a gray image keeps its own.
    const int written = before.ColourPlanes() + (before.HasTransparency() && alpha >= 3 ? 1 : 0);
    Tally tally;
    // Source points this close to the picture's edge are left out: the
    // kernel meets the edge there, which the tiles pad or clamp by position.
    constexpr double kEdge = 3.0;
    const double w = before.Width(), h = before.Height();
    for (std::int32_t y = 0; y < before.Height(); ++y) {
      for (std::int32_t x = 0; x < before.Width(); ++x) {
        if (!reference.Covered(x, y)) continue;
        const double sx = reference.sourceX[reference.Index(x, y)];
        const double sy = reference.sourceY[reference.Index(x, y)];
        if (sx < kEdge || sx > w - kEdge || sy < kEdge || sy > h - kEdge) continue;
        // The anti-aliased rim of the model's cover has a test of its own.
        if (reference.covered[reference.Index(x, y)] < 1.0) continue;
        ++tally.compared;
        for (int p = 0; p < written; ++p) {
          if (std::abs(after.Sample(p, x, y) - HostSample(reference.Value(p, x, y), depth)) >
              tolerance) {
            ++tally.failed;
            break;
          }
        }
      }
    }
    return tally;
  }
};

// Tiles of 128 pixels with partial ones at the right and bottom: a wrong
// tile offset, a seam or a flipped row order shows against the whole CPU
// rendering.
TEST_F(FinalRender, TiledResultMatchesTheMeshRenderedWhole) {
  CallbackHost host(ImageMode::kRgb, 333, 222, true);
  Host::testing::FillWaves(*host.document);
  const auto before = Host::testing::CopyDocument(*host.document);
  ShaderPFilter filter;
  ASSERT_EQ(RunScripted(host, filter), 0);
  const Tally tally = Compare(*before, *host.document, filter.Constraints().GetSolver(),
                              // float rounding on the GPU against double here: one step
                              // either way, and one for the texture coordinates' precision
                              2);
  ASSERT_GT(tally.compared, 333 * 222 / 2) << "most of the result shows the picture";
  // Pixel centres on a cell's edge may fall to the other triangle, which
  // samples a hair's breadth away: a few pixels per hundred cells.
  EXPECT_LE(tally.failed, tally.compared / 200) << tally.failed << " of " << tally.compared;
}

// A tile's texture holds only the source pixels its own pixels read, with
// the kernel's reach: every texel the bicubic kernel takes for a pixel of
// the tile (the CPU rendering's source point, 4 x 4 texels around it,
// clamped to the picture) must lie in the tile's source rectangle, or the
// tile would draw from a clamped edge instead. The texture must also be
// narrower than all its cells' source tiles, or the narrowing is gone.
TEST_F(FinalRender, EachTileTextureHoldsEveryTexelItsPixelsRead) {
  CallbackHost host(ImageMode::kRgb, 333, 222, false);
  Host::testing::FillWaves(*host.document);
  ShaderPFilter filter;
  ASSERT_EQ(RunScripted(host, filter), 0);
  const Solver& solver = filter.Constraints().GetSolver();
  const std::int32_t w = host.document->Width(), h = host.document->Height();
  const ReferenceImage reference = RenderReference(
      solver, w, h, 1, [](std::int32_t, std::int32_t, std::int32_t) { return 0.0; });
  PResult& result = filter.ImageHub().ResultFull();
  result.SetRect(filter.ImageHub().SourceRect());
  std::int64_t texels = 0, pixels = 0, outside = 0;
  for (std::int32_t row = 0; row < std::int32_t(result.Rows()); ++row) {
    for (std::int32_t col = 0; col < std::int32_t(result.Columns()); ++col) {
      Tarsa::CRect held;
      if (!result.PrepareTile(col, row, held)) continue;
      texels += std::int64_t(held.Width()) * held.Height();
      for (std::int32_t y = row * 128; y < std::min(h, (row + 1) * 128); ++y) {
        for (std::int32_t x = col * 128; x < std::min(w, (col + 1) * 128); ++x) {
          if (!reference.Covered(x, y)) continue;
          ++pixels;
          // Texel centres lie at whole numbers after taking off half a texel.
          const double px = reference.sourceX[reference.Index(x, y)] - 0.5;
          const double py = reference.sourceY[reference.Index(x, y)] - 0.5;
          const auto first = [](double p, std::int32_t size) {
            return std::clamp(std::int32_t(std::floor(p)) - 1, 0, size - 1);
          };
          const auto last = [](double p, std::int32_t size) {
            return std::clamp(std::int32_t(std::floor(p)) + 2, 0, size - 1);
          };
          const bool inside = first(px, w) >= held.left && last(px, w) < held.right &&
                              first(py, h) >= held.top && last(py, h) < held.bottom;
          if (!inside) ++outside;
        }
      }
    }
  }
  ASSERT_GT(pixels, w * h / 2);
  EXPECT_EQ(outside, 0) << "of " << pixels << " pixels";
  // Each tile's texture rounds up to whole source tiles of 129 pixels
  // without the narrowing: some 4 texels a pixel or more here.
  EXPECT_LT(double(texels) / double(pixels), 2.5);
}

// Every mode at both depths, with and without transparency: the planes are
// interleaved into the texture and back by mode (gray in R, G and B; CMYK's
// fifth plane in a second pass), and 16-bit samples go through the texture's
// full range.
TEST_F(FinalRender, EveryModeComesBackRight) {
  const ImageMode modes[] = {ImageMode::kGray,  ImageMode::kRgb,    ImageMode::kCmyk,
                             ImageMode::kLab,   ImageMode::kGray16, ImageMode::kRgb48,
                             ImageMode::kLab48, ImageMode::kCmyk64};
  for (const ImageMode mode : modes) {
    for (const bool transparency : {false, true}) {
      SCOPED_TRACE(::testing::Message()
                   << "mode " << int(mode) << " transparency " << transparency);
      Tarsa::CPluginEntry::TearDown();
      CallbackHost host(mode, 150, 100, transparency);
      Host::testing::FillWaves(*host.document);
      const auto before = Host::testing::CopyDocument(*host.document);
      ShaderPFilter filter;
      ASSERT_EQ(RunScripted(host, filter), 0);
      const int tolerance = Host::DepthOf(mode) == 8
                                // as in the whole-image comparison
                                ? 2
                                // half floats in the texture and the target: 11 bits of
                                // mantissa, rounded twice, in samples of 0..32768
                                : 24;
      const Tally tally =
          Compare(*before, *host.document, filter.Constraints().GetSolver(), tolerance);
      ASSERT_GT(tally.compared, 150 * 100 / 2);
      // Edge pixels of cells, as in the whole-image comparison.
      EXPECT_LE(tally.failed, tally.compared / 200) << tally.failed << " of " << tally.compared;
    }
  }
}

// The host's callbacks: progress from the first count to the total, and a
// cancel at the first check that leaves the image as it was.
TEST_F(FinalRender, ProgressRunsToTheTotalAndCancelWritesNothing) {
  {
    CallbackHost host(ImageMode::kRgb, 300, 200, false);
    ShaderPFilter filter;
    ASSERT_EQ(RunScripted(host, filter), 0);
    ASSERT_GE(host.progress.size(), 2u);
    const auto total = host.progress.front().second;
    EXPECT_GT(total, 6) << "six final tiles and the result and source tiles below them";
    EXPECT_EQ(host.progress.back(), std::make_pair(total, total));
    for (std::size_t i = 1; i < host.progress.size(); ++i)
      EXPECT_GE(host.progress[i].first, host.progress[i - 1].first);
  }
  {
    Tarsa::CPluginEntry::TearDown();
    CallbackHost host(ImageMode::kRgb, 300, 200, false);
    const auto before = Host::testing::CopyDocument(*host.document);
    host.abortAtCheck = 0;
    ShaderPFilter filter;
    EXPECT_EQ(RunScripted(host, filter), 1) << "a cancelled run answers 1";
    EXPECT_EQ(host.advanceCalls, 0) << "nothing went to the host";
    EXPECT_EQ(host.progress.size(), 1u);
    EXPECT_EQ(Host::testing::LargestDifference(*before, *host.document), 0);
  }
}

}  // namespace
}  // namespace Project::testing
