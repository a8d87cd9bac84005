// The module's display conversion against the host program's suite: the
// blocks it hands over, what comes back, and its own formulas for a host
// that has no suite or declines a block.

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <random>
#include <vector>

#include "framework/core/CException.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "host/plugin/DisplayColour.h"
#include "tests/framework/plugin/ProbeFilter.h"
#include "tests/support/RealHost.h"

namespace Tarsa::testing {
namespace {

// The host's suite behind a table that notes each block's size, or declines
// every block when told to.
struct SuiteSpy {
  static SuiteSpy& Live() {
    static SuiteSpy spy;
    return spy;
  }
  static HostStatus Convert(std::int16_t mode, std::int32_t width, std::int32_t height,
                            const HostSampleBlock* source, const HostSampleBlock* destination) {
    Live().blocks.push_back({width, height});
    if (Live().decline) return -1;
    return Host::DisplayColour::Suite()->convertToDisplay(mode, width, height, source, destination);
  }
  std::vector<CSize> blocks;
  bool decline = false;
  HostDisplayColourSuite table{&Convert};
};

class DisplayConversion : public PluginRunTest {
 protected:
  void SetUp() override {
    PluginRunTest::SetUp();
    SuiteSpy::Live() = SuiteSpy{};
    filter = std::make_unique<ProbeFilter>();
  }
  void TearDown() override {
    filter.reset();
    PluginRunTest::TearDown();
  }

  // A document of that mode and its colour planes read as the module reads
  // them.
  std::unique_ptr<CMemoryPixmap> Open(Host::ImageMode mode, std::int32_t width,
                                      std::int32_t height) {
    host.MakeDocument(mode, width, height, false, 5);
    host.AddSuite(kDisplayColourSuite, kDisplayColourSuiteVersion, &SuiteSpy::Live().table);
    EXPECT_EQ(filter->HandleParameters(host.Record(), nullptr), 0);
    auto pixmap = std::make_unique<CMemoryPixmap>(filter->ImageRect(), filter->ColorPlanes(), 8);
    filter->ReadPixmap(*pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
    return pixmap;
  }

  // RGB plus a fourth plane the conversion must leave alone.
  static std::unique_ptr<CMemoryPixmap> Screen(const CRect& bounds) {
    auto screen = std::make_unique<CMemoryPixmap>(bounds, 4, 8);
    screen->Fill(3, bounds, 77);
    return screen;
  }

  RealHost host;
  std::unique_ptr<ProbeFilter> filter;
};

TEST_F(DisplayConversion, LargeAreasGoToTheHostInBlocksAndComeBackAsAWhole) {
  for (Host::ImageMode mode : {Host::ImageMode::kLab, Host::ImageMode::kCmyk}) {
    SCOPED_TRACE(int(mode));
    SuiteSpy::Live().blocks.clear();
    auto source = Open(mode, 1100, 600);
    // The area lands at (10, 20) of a screen that starts at (5, 5).
    auto screen = Screen(CRect{5, 5, 1115, 625});
    filter->ConvertToDisplay(std::int32_t(mode), *source, source->Bounds(), *screen, {10, 20});

    // The same pixels converted by the host in one piece.
    std::vector<std::uint8_t> whole(std::size_t(1100) * 600 * 3);
    HostSampleBlock from{};
    for (std::uint32_t k = 0; k < source->Planes(); ++k) from.planes[k] = source->Address(k, 0, 0);
    from.rowBytes = std::int32_t(source->RowBytes());
    from.columnBytes = 1;
    const HostSampleBlock into{
        {whole.data(), whole.data() + 1, whole.data() + 2, nullptr}, 1100 * 3, 3};
    Host::DisplayColour reference;
    ASSERT_TRUE(reference.Convert(std::int16_t(mode), 1100, 600, from, into));
    int wrong = 0;
    for (std::int32_t y = 0; y < 600; ++y) {
      for (std::int32_t x = 0; x < 1100; ++x) {
        for (std::uint32_t k = 0; k < 3; ++k) {
          wrong += screen->Sample(k, x + 10, y + 20) != whole[(std::size_t(y) * 1100 + x) * 3 + k];
        }
      }
    }
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(screen->Sample(3, 500, 300), 77u);
    EXPECT_EQ(screen->Sample(0, 7, 7), 0u) << "outside the area's place";

    // Three columns of blocks by two rows, none larger than the limit.
    const std::vector<CSize> blocks = SuiteSpy::Live().blocks;
    ASSERT_EQ(blocks.size(), 6u);
    std::int64_t covered = 0;
    for (const CSize& b : blocks) {
      EXPECT_LE(std::max(b.width, b.height), kDisplayBlockSide);
      covered += std::int64_t(b.width) * b.height;
    }
    EXPECT_EQ(covered, 1100 * 600);
  }
}

TEST_F(DisplayConversion, WithoutTheHostsHelpTheModulesOwnFormulasServe) {
  auto lab = Open(Host::ImageMode::kLab, 64, 4);
  auto byHost = Screen(lab->Bounds());
  filter->ConvertToDisplay(kHostModeLab, *lab, lab->Bounds(), *byHost, {});
  // A host that declines every block, then one without the suite.
  SuiteSpy::Live().decline = true;
  auto declined = Screen(lab->Bounds());
  filter->ConvertToDisplay(kHostModeLab, *lab, lab->Bounds(), *declined, {});
  EXPECT_EQ(SuiteSpy::Live().blocks.size(), 2u);
  host.AddSuite(kDisplayColourSuite, kDisplayColourSuiteVersion, nullptr);
  auto alone = Screen(lab->Bounds());
  filter->ConvertToDisplay(kHostModeLab, *lab, lab->Bounds(), *alone, {});
  EXPECT_EQ(SuiteSpy::Live().blocks.size(), 2u);
  // The CIE formulas in double precision against LittleCMS's 16.16 fixed
  // point: a rounding apart. Random Lab reaches far out of sRGB, where both
  // clip alike.
  for (std::int32_t y = 0; y < 4; ++y) {
    for (std::int32_t x = 0; x < 64; ++x) {
      for (std::uint32_t k = 0; k < 4; ++k) {
        const int want = int(byHost->Sample(k, x, y));
        EXPECT_NEAR(int(alone->Sample(k, x, y)), want, 1) << x << "," << y << " plane " << k;
        EXPECT_EQ(declined->Sample(k, x, y), alone->Sample(k, x, y));
      }
    }
  }

  // CMYK counts paper: inks take their share of light from white.
  auto cmyk = Open(Host::ImageMode::kCmyk, 4, 1);
  host.AddSuite(kDisplayColourSuite, kDisplayColourSuiteVersion, nullptr);
  const std::uint32_t inks[4][4] = {
      {255, 255, 255, 255}, {255, 255, 255, 0}, {0, 255, 255, 255}, {128, 255, 51, 204}};
  for (std::int32_t x = 0; x < 4; ++x) {
    for (std::uint32_t k = 0; k < 4; ++k) cmyk->SetSample(k, x, 0, inks[x][k]);
  }
  auto screen = Screen(cmyk->Bounds());
  filter->ConvertToDisplay(kHostModeCMYK, *cmyk, cmyk->Bounds(), *screen, {});
  // Worked by hand: (128 x 204) / 255 = 102.4, 204, (51 x 204) / 255 = 40.8.
  const std::uint32_t rgb[4][3] = {{255, 255, 255}, {0, 0, 0}, {0, 255, 255}, {102, 204, 41}};
  for (std::int32_t x = 0; x < 4; ++x) {
    for (std::uint32_t k = 0; k < 3; ++k) EXPECT_EQ(screen->Sample(k, x, 0), rgb[x][k]) << x;
  }

  // RGB as it is, gray in all three.
  for (Host::ImageMode mode : {Host::ImageMode::kRgb, Host::ImageMode::kGray}) {
    auto source = Open(mode, 9, 7);
    host.AddSuite(kDisplayColourSuite, kDisplayColourSuiteVersion, nullptr);
    auto shown = Screen(source->Bounds());
    filter->ConvertToDisplay(std::int32_t(mode), *source, source->Bounds(), *shown, {});
    for (std::int32_t y = 0; y < 7; ++y) {
      for (std::int32_t x = 0; x < 9; ++x) {
        for (std::uint32_t k = 0; k < 3; ++k) {
          EXPECT_EQ(shown->Sample(k, x, y),
                    source->Sample(std::min(k, source->Planes() - 1), x, y));
        }
      }
    }
  }
}

TEST_F(DisplayConversion, RefusesPixmapsItCannotFill) {
  auto rgb = Open(Host::ImageMode::kRgb, 8, 8);
  auto screen = Screen(CRect{0, 0, 8, 8});
  EXPECT_THROW(filter->ConvertToDisplay(kHostModeRGB, *rgb, CRect{0, 0, 9, 8}, *screen, {}),
               CError);
  EXPECT_THROW(filter->ConvertToDisplay(kHostModeRGB, *rgb, CRect{0, 0, 8, 8}, *screen, {1, 0}),
               CError);
  CMemoryPixmap deep(CRect{0, 0, 8, 8}, 3, 16);
  EXPECT_THROW(filter->ConvertToDisplay(kHostModeRGB48, deep, CRect{0, 0, 8, 8}, *screen, {}),
               CError);
  CMemoryPixmap gray(CRect{0, 0, 8, 8}, 1, 8);
  EXPECT_THROW(filter->ConvertToDisplay(kHostModeRGB, gray, CRect{0, 0, 8, 8}, *screen, {}),
               CError);
  // An empty area asks nothing of anyone.
  filter->ConvertToDisplay(kHostModeRGB, *rgb, CRect{}, *screen, {});
  EXPECT_TRUE(SuiteSpy::Live().blocks.empty());
}

}  // namespace
}  // namespace Tarsa::testing
