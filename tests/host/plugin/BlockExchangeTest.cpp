#include <gtest/gtest.h>

#include <cstring>

#include "framework/plugin/HostFilterRecord.h"
#include "host/plugin/BlockExchange.h"
#include "host/plugin/HostCodes.h"
#include "tests/host/io/TestImages.h"

namespace Host {
namespace {

using Testing::RandomDocument;

// A module's view: the sample of plane p at (x, y) inside a handed-out block.
int Cell(const Tarsa::HostFilterRecord& record, int planes, int bytes, int x, int y, int p) {
  const auto* at = static_cast<const uint8_t*>(record.outData) + y * record.outRowBytes +
                   (x * planes + p) * bytes;
  if (bytes == 1) return *at;
  uint16_t value;
  std::memcpy(&value, at, 2);
  return value;
}

void SetCell(Tarsa::HostFilterRecord& record, int planes, int bytes, int x, int y, int p, int v) {
  auto* at =
      static_cast<uint8_t*>(record.outData) + y * record.outRowBytes + (x * planes + p) * bytes;
  if (bytes == 1) {
    *at = static_cast<uint8_t>(v);
  } else {
    const auto value = static_cast<uint16_t>(v);
    std::memcpy(at, &value, 2);
  }
}

TEST(BlockExchangeTest, HandsOutABlockAndTakesTheModulesChangesBack) {
  auto document = RandomDocument(7, 5, ImageMode::kRgb, true, 11);
  const auto original = RandomDocument(7, 5, ImageMode::kRgb, true, 11);
  Tarsa::HostFilterRecord record = {};
  BlockExchange exchange(*document, record);

  // Columns 2..5, rows 1..3, planes 1 to 3 (green, blue, transparency).
  record.outRect16 = {1, 2, 4, 6};
  record.outFirstPlane = 1;
  record.outLastPlane = 3;
  ASSERT_TRUE(exchange.HasRequest());
  ASSERT_EQ(exchange.Advance(), 0);
  ASSERT_NE(record.outData, nullptr);
  EXPECT_EQ(record.outRowBytes, 4 * 3);
  for (int y = 0; y < 3; ++y) {
    for (int x = 0; x < 4; ++x) {
      for (int p = 0; p < 3; ++p) {
        ASSERT_EQ(Cell(record, 3, 1, x, y, p), original->Sample(1 + p, 2 + x, 1 + y));
        SetCell(record, 3, 1, x, y, p, (x * 7 + y * 3 + p) & 0xff);
      }
    }
  }
  // Nothing reaches the document until the next advance.
  EXPECT_EQ(document->Sample(1, 2, 1), original->Sample(1, 2, 1));
  record.outRect16 = {};
  ASSERT_EQ(exchange.Advance(), 0);
  EXPECT_EQ(record.outData, nullptr);

  for (int p = 0; p < 4; ++p) {
    for (int y = 0; y < 5; ++y) {
      for (int x = 0; x < 7; ++x) {
        const bool inside = p >= 1 && x >= 2 && x < 6 && y >= 1 && y < 4;
        const int expected =
            inside ? ((x - 2) * 7 + (y - 1) * 3 + (p - 1)) & 0xff : original->Sample(p, x, y);
        ASSERT_EQ(document->Sample(p, x, y), expected) << p << " " << x << " " << y;
      }
    }
  }
}

TEST(BlockExchangeTest, ThirtyTwoBitRequestsAndClampingAtTheEndOfASelector) {
  auto document = RandomDocument(40, 3, ImageMode::kGray16, false, 5);
  Tarsa::HostFilterRecord record = {};
  Tarsa::HostCoordinates32 wide = {};
  record.coordinates32 = &wide;
  BlockExchange exchange(*document, record);

  // Once enabled, the 16-bit fields are ignored.
  wide.enabled = 1;
  wide.outRect = {0, 30, 3, 40};
  record.outRect16 = {0, 0, 1, 1};
  ASSERT_EQ(exchange.Advance(), 0);
  EXPECT_EQ(record.outRowBytes, 10 * 2);
  SetCell(record, 1, 2, 0, 0, 0, 40000);
  SetCell(record, 1, 2, 9, 2, 0, 123);
  exchange.Commit();
  EXPECT_EQ(document->Sample(0, 30, 0), 32768);
  EXPECT_EQ(document->Sample(0, 39, 2), 123);
}

TEST(BlockExchangeTest, RequestsOutsideTheDocumentAreRefused) {
  auto document = RandomDocument(8, 8, ImageMode::kCmyk, false, 3);
  Tarsa::HostFilterRecord record = {};
  BlockExchange exchange(*document, record);
  record.outRect16 = {0, 0, 9, 8};
  EXPECT_EQ(exchange.Advance(), HostCodes::kParamErr);
  EXPECT_EQ(record.outData, nullptr);
  record.outRect16 = {0, 0, 8, 8};
  record.outFirstPlane = 2;
  record.outLastPlane = 4;  // CMYK has planes 0 to 3
  EXPECT_EQ(exchange.Advance(), HostCodes::kParamErr);
  record.outLastPlane = 1;
  EXPECT_EQ(exchange.Advance(), HostCodes::kParamErr);
}

}  // namespace
}  // namespace Host
