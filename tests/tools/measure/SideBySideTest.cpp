#include "tools/measure/lib/SideBySide.h"

#include <gtest/gtest.h>

#include "tests/support/TestImages.h"
#include "tools/measure/lib/MeasureError.h"

namespace Measure {
namespace {

// The left image as it was, the right one scaled to the shorter height, a
// light gap between; gray comes out as equal RGB.
TEST(SideBySide, PutsBothAtTheShorterHeight) {
  auto left = Host::HostDocument::Create(30, 20, Host::ImageMode::kRgb);
  Host::testing::FillDetail(*left);
  auto right = Host::HostDocument::Create(20, 40, Host::ImageMode::kGray16);
  for (int y = 0; y < 40; ++y) {
    for (int x = 0; x < 20; ++x) right->SetSample(0, x, y, x < 10 ? 0 : Host::kMax16);
  }
  const auto both = SideBySide::Compose(*left, *right);
  ASSERT_EQ(both->Height(), 20);
  ASSERT_EQ(both->Width(), 30 + SideBySide::kGap + 10);
  for (int p = 0; p < 3; ++p) {
    EXPECT_EQ(both->Sample(p, 17, 11), left->Sample(p, 17, 11));
    EXPECT_GT(both->Sample(p, 30 + SideBySide::kGap / 2, 5), 200);
    EXPECT_EQ(both->Sample(p, 30 + SideBySide::kGap + 2, 9), 0);
    EXPECT_EQ(both->Sample(p, 30 + SideBySide::kGap + 7, 9), 255);
  }
  const auto cmyk = Host::HostDocument::Create(4, 4, Host::ImageMode::kCmyk);
  EXPECT_THROW(SideBySide::Compose(*left, *cmyk), MeasureError);
}

}  // namespace
}  // namespace Measure
