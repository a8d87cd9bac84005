// ReadPixmap and WritePixmap against the host program's document: what is
// read must be the document's samples, and what is written must land in it.

#include <memory>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "tests/framework/plugin/ProbeFilter.h"
#include "tests/support/RealHost.h"

namespace Tarsa::testing {
namespace {

class PixmapTransfer : public PluginRunTest {
 protected:
  void SetUp() override {
    PluginRunTest::SetUp();
    filter = std::make_unique<ProbeFilter>();
  }
  void TearDown() override {
    filter.reset();
    PluginRunTest::TearDown();
  }
  void Enter() { ASSERT_EQ(filter->HandleParameters(host.Record(), nullptr), 0); }

  // Every sample of pixmap equals the document's at the same point moved by
  // offset; plane k of the pixmap against plane k of the document.
  ::testing::AssertionResult MatchesDocument(const CMemoryPixmap& pixmap, CPoint offset = {},
                                             std::uint32_t planes = 0) {
    if (planes == 0) planes = pixmap.Planes();
    const CRect b = pixmap.Bounds();
    for (std::uint32_t k = 0; k < planes; ++k) {
      for (std::int32_t y = b.top; y < b.bottom; ++y) {
        for (std::int32_t x = b.left; x < b.right; ++x) {
          const std::uint32_t want = host.At(int(k), x + offset.x, y + offset.y);
          if (pixmap.Sample(k, x, y) != want) {
            return ::testing::AssertionFailure() << "plane " << k << " at " << x << "," << y << ": "
                                                 << pixmap.Sample(k, x, y) << " != " << want;
          }
        }
      }
    }
    return ::testing::AssertionSuccess();
  }

  RealHost host;
  std::unique_ptr<ProbeFilter> filter;
};

TEST_F(PixmapTransfer, AllEightModesRoundTripWithTransparency) {
  using Host::ImageMode;
  bool usePorts = false;
  for (ImageMode mode :
       {ImageMode::kGray, ImageMode::kRgb, ImageMode::kCmyk, ImageMode::kLab, ImageMode::kGray16,
        ImageMode::kRgb48, ImageMode::kLab48, ImageMode::kCmyk64}) {
    SCOPED_TRACE(int(mode));
    // Half the modes read through the channel ports suite, half through the
    // record's callback.
    usePorts = !usePorts;
    filter.reset();
    host.suites.clear();
    if (!usePorts) host.AddSuite(kChannelPortsSuite, 3, nullptr);
    filter = std::make_unique<ProbeFilter>();
    host.MakeDocument(mode, 7, 5, /*transparency=*/true, 100 + int(mode));
    host.readCalls = 0;
    Enter();
    const std::uint32_t planes = filter->ColorPlanes() + 1;
    CMemoryPixmap pixmap(filter->ImageRect(), planes, filter->Depth());
    filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
    EXPECT_EQ(host.readCalls, int(planes));
    EXPECT_TRUE(MatchesDocument(pixmap));

    // Inverted samples go back through the host's interleaved, padded block.
    const std::uint32_t full = filter->Depth() == 16 ? 32768 : 255;
    const CRect b = pixmap.Bounds();
    for (std::uint32_t k = 0; k < planes; ++k) {
      for (std::int32_t y = b.top; y < b.bottom; ++y) {
        for (std::int32_t x = b.left; x < b.right; ++x) {
          pixmap.SetSample(k, x, y, full - pixmap.Sample(k, x, y));
        }
      }
    }
    host.advanceCalls = 0;
    filter->WritePixmap(pixmap, b, 0);
    EXPECT_EQ(host.advanceCalls, 2) << "one for the block, one to finish";
    EXPECT_EQ(host.Record()->outRect16.right, 0) << "requests are cleared afterwards";
    EXPECT_TRUE(MatchesDocument(pixmap));
  }
}

TEST_F(PixmapTransfer, WideImageUsesOnlyThe32BitCoordinates) {
  host.MakeDocument(Host::ImageMode::kRgb48, 40000, 3, true);
  host.Coords().enabled = 1;
  host.Record()->imageWidth16 = host.Record()->imageHeight16 = -7;  // nonsense, never read
  host.Record()->filterRect16 = HostRect16{-7, -7, -7, -7};
  Enter();
  const CRect tile{39990, 0, 40000, 3};
  CMemoryPixmap pixmap(tile, 4, 16);
  filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_TRUE(MatchesDocument(pixmap));

  for (std::uint32_t k = 0; k < 4; ++k) pixmap.Fill(k, tile, 1000 + k);
  const std::uint32_t before = host.At(0, 39989, 1);
  filter->WritePixmap(pixmap, tile, 4);
  EXPECT_TRUE(MatchesDocument(pixmap));
  EXPECT_EQ(host.At(0, 39989, 1), before) << "nothing left of the block";
  EXPECT_EQ(host.Record()->outRect16.left, 0) << "the 16-bit request stays unused";
}

TEST_F(PixmapTransfer, FloatingSelectionReadsFromItsPlaceInTheDocument) {
  host.MakeDocument(Host::ImageMode::kRgb, 30, 20, false);
  host.Record()->imageWidth16 = 10;
  host.Record()->imageHeight16 = 8;
  host.Record()->floatsOverImage = 1;
  host.Record()->floatOrigin16 = HostPoint16{3, 5};  // y, x
  Enter();
  ASSERT_EQ(filter->ImageRect(), (CRect{-5, -3, 25, 17}));
  EXPECT_EQ(filter->TileOffset(), (CPoint{5, 3}));
  EXPECT_EQ(filter->LayerRect(), (CRect{0, 0, 10, 8}));
  CMemoryPixmap pixmap(filter->ImageRect(), 3, 8);
  filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_TRUE(MatchesDocument(pixmap, CPoint{5, 3}));

  // Writing goes to the layer's own rectangle only.
  host.advanceCalls = 0;
  const std::uint32_t outside = host.At(0, 12, 9);
  filter->WritePixmap(pixmap, pixmap.Bounds(), 3);
  EXPECT_EQ(host.At(0, 0, 0), pixmap.Sample(0, 0, 0));
  EXPECT_EQ(host.At(2, 9, 7), pixmap.Sample(2, 9, 7));
  EXPECT_EQ(host.At(0, 12, 9), outside);

  // Not floating: the image is at the origin, and the channels are offset by
  // the float origin less the filtered area's corner.
  host.Record()->floatsOverImage = 0;
  host.Record()->floatOrigin16 = HostPoint16{0, 0};
  host.Record()->filterRect16 = HostRect16{1, 2, 8, 10};
  EXPECT_EQ(filter->ImageRect(), (CRect{0, 0, 10, 8}));
  EXPECT_EQ(filter->TileOffset(), (CPoint{-2, -1}));
}

TEST_F(PixmapTransfer, ExtraPlaneIsOpaqueWithoutATransparencyNode) {
  for (Host::ImageMode mode : {Host::ImageMode::kLab, Host::ImageMode::kLab48}) {
    host.MakeDocument(mode, 4, 3, /*transparency=*/false);
    Enter();
    CMemoryPixmap pixmap(filter->ImageRect(), 4, filter->Depth());
    filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
    EXPECT_TRUE(MatchesDocument(pixmap, {}, 3));
    const std::uint32_t opaque = mode == Host::ImageMode::kLab ? 255 : 32768;
    EXPECT_EQ(pixmap.Sample(3, 0, 0), opaque);
    EXPECT_EQ(pixmap.Sample(3, 3, 2), opaque);
  }
}

TEST_F(PixmapTransfer, MarginsAreFilledRepeatedOrLeftToTheFallback) {
  host.MakeDocument(Host::ImageMode::kGray, 6, 4, true);
  Enter();
  const CRect wide{-2, -1, 8, 5};  // one to two pixels beyond each edge
  const std::uint32_t fill[] = {10, 20};

  CMemoryPixmap filled(wide, 2, 8);
  filter->ReadPixmap(filled, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing,
                     CQuillmarkFilter::kMarginsFill, fill);
  EXPECT_EQ(filled.Sample(0, -2, -1), 10u);
  EXPECT_EQ(filled.Sample(1, 7, 4), 20u);
  EXPECT_EQ(filled.Sample(0, 6, 2), 10u);
  EXPECT_EQ(filled.Sample(0, 5, 3), host.At(0, 5, 3));

  CMemoryPixmap repeated(wide, 2, 8);
  filter->ReadPixmap(repeated, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing,
                     CQuillmarkFilter::kMarginsRepeat);
  EXPECT_EQ(repeated.Sample(0, -2, -1), host.At(0, 0, 0));  // corner
  EXPECT_EQ(repeated.Sample(0, 7, 2), host.At(0, 5, 2));    // right edge
  EXPECT_EQ(repeated.Sample(1, 3, 4), host.At(1, 3, 3));    // bottom edge
  EXPECT_EQ(repeated.Sample(1, 3, 1), host.At(1, 3, 1));    // inside

  // Mode 0: the fallback (nothing to read: zeros) lies under the read.
  CMemoryPixmap underlaid(wide, 2, 8);
  underlaid.Fill(0, wide, 99);
  filter->ReadPixmap(underlaid, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing,
                     CQuillmarkFilter::kMarginsFromFallback);
  EXPECT_EQ(underlaid.Sample(0, -1, 0), 0u);
  EXPECT_EQ(underlaid.Sample(0, 2, 2), host.At(0, 2, 2));
}

TEST_F(PixmapTransfer, SelectorsPickTheirChannelOrFallBack) {
  host.MakeDocument(Host::ImageMode::kGray, 3, 3, true);
  // The document's second plane stands for an alpha channel.
  HostChannelNode* second = host.Info().targetTransparency;
  HostAlphaChannel alpha{};
  alpha.channel = second;
  host.Info().alphaChannels = &alpha;
  Enter();
  CMemoryPixmap pixmap(CRect{0, 0, 3, 3}, 1, 8);
  filter->ReadPixmap(pixmap, 0, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_EQ(pixmap.Sample(0, 2, 1), host.At(1, 2, 1));
  // No second alpha channel: the fallback, here the target.
  filter->ReadPixmap(pixmap, 1, CQuillmarkFilter::kReadTarget, 0);
  EXPECT_EQ(pixmap.Sample(0, 2, 1), host.At(0, 2, 1));
  // An unreadable target gives way to a readable target mask.
  host.Info().targetCompositeChannels->readable = 0;
  host.Info().targetMask = second;
  filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_EQ(pixmap.Sample(0, 1, 1), host.At(1, 1, 1));
}

TEST_F(PixmapTransfer, HostRefusalsStopTheTransfer) {
  host.MakeDocument(Host::ImageMode::kRgb, 4, 4, false);
  Enter();
  CMemoryPixmap pixmap(CRect{0, 0, 4, 4}, 3, 8);
  host.readAnswer = -36;
  EXPECT_THROW(
      filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0),
      CAbort);
  for (std::int16_t cancel : {std::int16_t(-128), std::int16_t(1000)}) {
    host.advanceAnswer = cancel;
    try {
      filter->WritePixmap(pixmap, pixmap.Bounds(), 3);
      ADD_FAILURE() << "no cancel for " << cancel;
    } catch (const CAbort& abort) {
      EXPECT_TRUE(abort.IsSilent());
    }
  }
  host.advanceAnswer = -36;
  try {
    filter->WritePixmap(pixmap, pixmap.Bounds(), 3);
    ADD_FAILURE() << "no failure";
  } catch (const CSystemError& error) {
    EXPECT_EQ(error.Code(), -36);
  }
  // A pixmap of another depth is refused before the host is asked.
  CMemoryPixmap deep(CRect{0, 0, 4, 4}, 3, 16);
  host.advanceAnswer = 0;
  host.advanceCalls = 0;
  EXPECT_THROW(filter->WritePixmap(deep, deep.Bounds(), 3), CError);
  EXPECT_EQ(host.advanceCalls, 0);
}

}  // namespace
}  // namespace Tarsa::testing
