#include "host/io/HostDocument.h"

#include <gtest/gtest.h>

#include <string>

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

// A limit set lower holds every document to it, and says so; unset, the
// machine's memory is the limit again.
TEST(HostDocumentTest, MemoryLimitRefusesLargerDocuments) {
  HostDocument::SetMemoryLimit(64 << 10);
  EXPECT_NO_THROW(HostDocument::Create(256, 256, ImageMode::kGray));  // 64 KiB
  try {
    HostDocument::CreateUnfilled(256, 256, ImageMode::kRgb, false);
    ADD_FAILURE() << "a 192 KiB document was made under a 64 KiB limit";
  } catch (const HostError& error) {
    EXPECT_NE(std::string(error.what()).find("a document may take"), std::string::npos)
        << error.what();
  }
  HostDocument::SetMemoryLimit(0);
  EXPECT_GT(HostDocument::MemoryLimit(), uint64_t{64} << 10);
  EXPECT_NO_THROW(HostDocument::Create(256, 256, ImageMode::kRgb));
}

}  // namespace
}  // namespace Host
