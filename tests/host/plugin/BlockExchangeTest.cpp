// What the module's tests through the host's record do not reach: blocks of
// some planes only, 16-bit samples above full scale, requests outside.

#include <gtest/gtest.h>

#include "framework/plugin/HostFilterRecord.h"
#include "host/plugin/BlockExchange.h"
#include "host/plugin/HostCodes.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

using testing::RandomDocument;

// The sample of plane p at (x, y) in the handed-out block, as the module sees it.
template <typename Sample>
Sample& Cell(const Tarsa::HostFilterRecord& record, int planes, int x, int y, int p) {
  auto* row = static_cast<uint8_t*>(record.outData) + y * record.outRowBytes;
  return reinterpret_cast<Sample*>(row)[x * planes + p];
}

TEST(BlockExchangeTest, APlaneRangeGoesBackAtTheNextAdvanceOnly) {
  auto document = RandomDocument(7, 5, ImageMode::kRgb, true, 11);
  const auto original = RandomDocument(7, 5, ImageMode::kRgb, true, 11);
  Tarsa::HostFilterRecord record = {};
  BlockExchange exchange(*document, record);
  // Columns 2..5, rows 1..3, planes 1 to 3 (green, blue, transparency).
  record.outRect16 = {1, 2, 4, 6};
  record.outFirstPlane = 1;
  record.outLastPlane = 3;
  ASSERT_EQ(exchange.Advance(), 0);
  EXPECT_EQ(record.outRowBytes, 4 * 3);
  for (int i = 0; i < 4 * 3 * 3; ++i) {
    uint8_t& cell = Cell<uint8_t>(record, 3, i / 3 % 4, i / 12, i % 3);
    ASSERT_EQ(cell, original->Sample(1 + i % 3, 2 + i / 3 % 4, 1 + i / 12)) << i;
    cell = static_cast<uint8_t>(i);
  }
  EXPECT_EQ(document->Sample(1, 2, 1), original->Sample(1, 2, 1)) << "not yet taken back";
  record.outRect16 = {};
  ASSERT_EQ(exchange.Advance(), 0);
  EXPECT_EQ(record.outData, nullptr);
  for (int p = 0; p < 4; ++p) {
    for (int y = 0; y < 5; ++y) {
      for (int x = 0; x < 7; ++x) {
        const bool inside = p >= 1 && x >= 2 && x < 6 && y >= 1 && y < 4;
        const int written = (y - 1) * 12 + (x - 2) * 3 + (p - 1);
        ASSERT_EQ(document->Sample(p, x, y), inside ? written : original->Sample(p, x, y))
            << p << " " << x << " " << y;
      }
    }
  }
}

TEST(BlockExchangeTest, SixteenBitSamplesAreClampedAndRequestsOutsideRefused) {
  auto document = RandomDocument(40, 3, ImageMode::kGray16, false, 5);
  Tarsa::HostFilterRecord record = {};
  Tarsa::HostCoordinates32 wide = {};
  record.coordinates32 = &wide;
  BlockExchange exchange(*document, record);
  wide.enabled = 1;
  wide.outRect = {0, 30, 3, 40};
  record.outRect16 = {0, 0, 1, 1};  // ignored once the block is enabled
  ASSERT_EQ(exchange.Advance(), 0);
  EXPECT_EQ(record.outRowBytes, 10 * 2);
  Cell<uint16_t>(record, 1, 0, 0, 0) = 40000;
  Cell<uint16_t>(record, 1, 9, 2, 0) = 123;
  exchange.Commit();  // as at the end of a selector
  EXPECT_EQ(document->Sample(0, 30, 0), 32768);
  EXPECT_EQ(document->Sample(0, 39, 2), 123);

  // A row past the end, a plane past the last, a range that runs backwards.
  for (const auto& [rect, first, last] :
       {std::tuple{Tarsa::HostRect32{0, 0, 4, 40}, 0, 0}, std::tuple{wide.outRect, 0, 1},
        std::tuple{wide.outRect, 1, 0}}) {
    wide.outRect = rect;
    record.outFirstPlane = static_cast<int16_t>(first);
    record.outLastPlane = static_cast<int16_t>(last);
    EXPECT_EQ(exchange.Advance(), HostCodes::kParamErr);
    EXPECT_EQ(record.outData, nullptr);
  }
}

}  // namespace
}  // namespace Host
