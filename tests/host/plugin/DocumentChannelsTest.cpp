#include <gtest/gtest.h>

#include <algorithm>
#include <vector>

#include "host/plugin/DocumentChannels.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

TEST(DocumentChannelsTest, ReadPixelsFillsAnInterleavedRectClippedToTheImage) {
  auto document = testing::RandomDocument(9, 6, ImageMode::kRgb48, true, 2);
  DocumentChannels channels(*document);
  const Tarsa::HostDocumentInfo* info = channels.Info();
  EXPECT_EQ(info->targetTransparency, channels.Node(3));
  EXPECT_EQ(info->targetMask, nullptr);
  EXPECT_EQ(info->alphaChannels, nullptr);
  // Rows -1..3 and columns 2..11 of the 9 x 6 image, the colour planes
  // interleaved, read along the target list: what lies outside keeps the marker.
  const int width = 10, height = 5;
  std::vector<uint16_t> memory(width * height * 3, 0xbeef);
  const Tarsa::HostRect32 asked = {-1, 2, 4, 12};
  int p = 0;
  for (auto* node = info->targetCompositeChannels; node != nullptr; node = node->next, ++p) {
    Tarsa::HostPixelMemoryDesc desc = {memory.data() + p, width * 3 * 16, 3 * 16, 0, 16};
    Tarsa::HostRect32 wrote = {};
    ASSERT_EQ(DocumentChannels::Procs()->readPixels(node->port, nullptr, &asked, &desc, &wrote), 0);
    EXPECT_TRUE(wrote.top == 0 && wrote.left == 2 && wrote.bottom == 4 && wrote.right == 9);
  }
  ASSERT_EQ(p, 3);
  for (int i = 0; i < width * height * 3; ++i) {
    const int dx = i / 3 % width + 2, dy = i / 3 / width - 1;
    const bool inside = dy >= 0 && dx < 9;
    ASSERT_EQ(memory[i], inside ? document->Sample(i % 3, dx, dy) : 0xbeef) << i;
  }
}

TEST(DocumentChannelsTest, PortsSuiteReadsLevelZeroAtTheDocumentsDepthOnly) {
  auto document = testing::RandomDocument(5, 5, ImageMode::kGray, false, 3);
  DocumentChannels channels(*document);
  const auto* suite = DocumentChannels::PortsSuite();
  std::vector<uint8_t> plane(25);
  Tarsa::HostPixelMemoryDesc desc = {plane.data(), 5 * 8, 8, 0, 8};
  const Tarsa::HostRect32 all = {0, 0, 5, 5};
  ASSERT_EQ(suite->readPixelsFromLevel(channels.Node(0)->port, 0, &desc, &all), 0);
  EXPECT_TRUE(std::equal(plane.begin(), plane.end(), document->Plane8(0).begin()));
  EXPECT_NE(suite->readPixelsFromLevel(channels.Node(0)->port, 1, &desc, &all), 0);
  desc.depth = 16;
  EXPECT_NE(suite->readPixelsFromLevel(channels.Node(0)->port, 0, &desc, &all), 0);
}

}  // namespace
}  // namespace Host
