#include "host/io/HostDocument.h"

#include <gtest/gtest.h>

#include "host/io/HostError.h"

namespace Host {
namespace {

TEST(HostDocumentTest, RefusesImpossibleSizesWithoutAllocating) {
  EXPECT_THROW(HostDocument::Create(0, 10, ImageMode::kRgb), HostError);
  EXPECT_THROW(HostDocument::Create(10, -1, ImageMode::kRgb), HostError);
  EXPECT_THROW(HostDocument::Create(HostDocument::kMaxSide + 1, 1, ImageMode::kGray), HostError);
  EXPECT_THROW(HostDocument::Create(1, 1, static_cast<ImageMode>(2)), HostError);
  // 1e6 x 1e6 in 16-bit CMYK with alpha is 10 TB: more than any machine here.
  EXPECT_THROW(HostDocument::CreateUnfilled(HostDocument::kMaxSide, HostDocument::kMaxSide,
                                            ImageMode::kCmyk64, true),
               HostError);
}

}  // namespace
}  // namespace Host
