// ReadPixmap and WritePixmap against the test host's document: what is read
// must be the document's samples, and what is written must land in it.

#include <memory>
#include <vector>

#include <gtest/gtest.h>

#include "framework/core/CException.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "tests/framework/plugin/ProbeFilter.h"
#include "tests/framework/plugin/TestHost.h"

namespace Tarsa::testing {
namespace {

class PixmapTransfer : public ::testing::Test {
 protected:
  void SetUp() override {
    CPluginEntry::TearDown();
    filter = std::make_unique<ProbeFilter>();
  }
  void TearDown() override {
    filter.reset();
    CPluginEntry::TearDown();
  }
  void Enter() { ASSERT_EQ(filter->HandleParameters(&host.record, nullptr), 0); }

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

  TestHost host;
  std::unique_ptr<ProbeFilter> filter;
};

TEST_F(PixmapTransfer, AllEightModesRoundTripWithTransparency) {
  const HostChannelPortsSuite ports{{}, &TestHost::ReadPixelsFromLevel};
  const std::int16_t modes[] = {kHostModeGray,   kHostModeRGB,   kHostModeCMYK,  kHostModeLab,
                                kHostModeGray16, kHostModeRGB48, kHostModeLab48, kHostModeCMYK64};
  bool usePorts = false;
  for (std::int16_t mode : modes) {
    SCOPED_TRACE(mode);
    // Half the modes read through the channel ports suite, half through the
    // record's callback.
    usePorts = !usePorts;
    filter.reset();
    host.suites.clear();
    if (usePorts) host.AddSuite(kChannelPortsSuite, 3, &ports);
    filter = std::make_unique<ProbeFilter>();
    host.MakeDocument(mode, 7, 5, /*transparency=*/true, false, 100 + mode);
    Enter();
    const std::uint32_t planes = filter->ColorPlanes() + 1;
    CMemoryPixmap pixmap(filter->ImageRect(), planes, filter->Depth());
    filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
    EXPECT_EQ(host.readCalls, int(planes));
    EXPECT_TRUE(MatchesDocument(pixmap));

    // Inverted samples go back through the host's interleaved buffer.
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
    EXPECT_EQ(host.record.outRect16.right, 0) << "requests are cleared afterwards";
    EXPECT_TRUE(MatchesDocument(pixmap));
    host.readCalls = 0;
  }
}

TEST_F(PixmapTransfer, WideImageUsesOnlyThe32BitCoordinates) {
  host.MakeDocument(kHostModeRGB48, 40000, 3, true, /*use32=*/true);
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
  EXPECT_EQ(host.record.outRect16.left, 0) << "the 16-bit request stays unused";
}

TEST_F(PixmapTransfer, FloatingSelectionReadsFromItsPlaceInTheDocument) {
  host.MakeDocument(kHostModeRGB, 30, 20, false);
  host.record.imageWidth16 = 10;
  host.record.imageHeight16 = 8;
  host.record.floatsOverImage = 1;
  host.record.floatOrigin16 = HostPoint16{3, 5};  // y, x
  Enter();
  CMemoryPixmap pixmap(filter->ImageRect(), 3, 8);
  ASSERT_EQ(pixmap.Bounds(), (CRect{-5, -3, 25, 17}));
  filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_TRUE(MatchesDocument(pixmap, CPoint{5, 3}));

  // Writing goes to the layer's own rectangle only.
  host.advanceCalls = 0;
  const std::uint32_t outside = host.At(0, 12, 9);
  filter->WritePixmap(pixmap, pixmap.Bounds(), 3);
  EXPECT_EQ(host.At(0, 0, 0), pixmap.Sample(0, 0, 0));
  EXPECT_EQ(host.At(2, 9, 7), pixmap.Sample(2, 9, 7));
  EXPECT_EQ(host.At(0, 12, 9), outside);
}

TEST_F(PixmapTransfer, ExtraPlaneIsOpaqueWithoutATransparencyNode) {
  for (std::int16_t mode : {kHostModeLab, kHostModeLab48}) {
    host.MakeDocument(mode, 4, 3, /*transparency=*/false);
    Enter();
    CMemoryPixmap pixmap(filter->ImageRect(), 4, filter->Depth());
    filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
    EXPECT_TRUE(MatchesDocument(pixmap, {}, 3));
    const std::uint32_t opaque = mode == kHostModeLab ? 255 : 32768;
    EXPECT_EQ(pixmap.Sample(3, 0, 0), opaque);
    EXPECT_EQ(pixmap.Sample(3, 3, 2), opaque);
  }
}

TEST_F(PixmapTransfer, MarginsAreFilledRepeatedOrLeftToTheFallback) {
  host.MakeDocument(kHostModeGray, 6, 4, true);
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
  host.MakeDocument(kHostModeGray, 3, 3, true);
  // The document's second plane stands for an alpha channel.
  HostAlphaChannel alpha{};
  alpha.channel = &host.nodes[1];
  host.info.alphaChannels = &alpha;
  Enter();
  CMemoryPixmap pixmap(CRect{0, 0, 3, 3}, 1, 8);
  filter->ReadPixmap(pixmap, 0, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_EQ(pixmap.Sample(0, 2, 1), host.At(1, 2, 1));
  // No second alpha channel: the fallback, here the target.
  filter->ReadPixmap(pixmap, 1, CQuillmarkFilter::kReadTarget, 0);
  EXPECT_EQ(pixmap.Sample(0, 2, 1), host.At(0, 2, 1));
  // An unreadable target gives way to a readable target mask.
  host.nodes[0].readable = 0;
  host.info.targetMask = &host.nodes[1];
  filter->ReadPixmap(pixmap, CQuillmarkFilter::kReadTarget, CQuillmarkFilter::kReadNothing, 0);
  EXPECT_EQ(pixmap.Sample(0, 1, 1), host.At(1, 1, 1));
}

TEST_F(PixmapTransfer, HostRefusalsStopTheTransfer) {
  host.MakeDocument(kHostModeRGB, 4, 4, false);
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
