#include <gtest/gtest.h>

#include <vector>

#include "host/plugin/DocumentChannels.h"
#include "tests/host/io/TestImages.h"

namespace Host {
namespace {

TEST(DocumentChannelsTest, ListsColourPlanesInOrderAndTheTransparencyApart) {
  auto document = Testing::RandomDocument(6, 4, ImageMode::kCmyk, true, 1);
  DocumentChannels channels(*document);
  Tarsa::HostDocumentInfo* info = channels.Info();
  int count = 0;
  for (auto* node = info->targetCompositeChannels; node != nullptr; node = node->next, ++count) {
    EXPECT_EQ(node, channels.Node(count));
    EXPECT_EQ(node->bounds.bottom, 4);
    EXPECT_EQ(node->bounds.right, 6);
    EXPECT_TRUE(node->readable);
  }
  EXPECT_EQ(count, 4);
  EXPECT_EQ(info->mergedCompositeChannels, info->targetCompositeChannels);
  EXPECT_EQ(info->targetTransparency, channels.Node(4));
  EXPECT_EQ(info->targetMask, nullptr);
  EXPECT_EQ(info->alphaChannels, nullptr);
}

TEST(DocumentChannelsTest, ReadPixelsFillsAnInterleavedRectClippedToTheImage) {
  auto document = Testing::RandomDocument(9, 6, ImageMode::kRgb48, false, 2);
  DocumentChannels channels(*document);
  // Asked for rows -1..3 and columns 2..11 of a 9 x 6 image, three planes
  // interleaved: what lies outside keeps the marker.
  const int width = 10, height = 5;
  std::vector<uint16_t> memory(width * height * 3, 0xbeef);
  const Tarsa::HostRect32 asked = {-1, 2, 4, 12};
  for (int p = 0; p < 3; ++p) {
    Tarsa::HostPixelMemoryDesc desc = {memory.data() + p, width * 3 * 16, 3 * 16, 0, 16};
    Tarsa::HostRect32 wrote = {};
    ASSERT_EQ(DocumentChannels::Procs()->readPixels(channels.Node(p)->port, nullptr, &asked, &desc,
                                                    &wrote),
              0);
    EXPECT_EQ(wrote.top, 0);
    EXPECT_EQ(wrote.left, 2);
    EXPECT_EQ(wrote.bottom, 4);
    EXPECT_EQ(wrote.right, 9);
  }
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      for (int p = 0; p < 3; ++p) {
        const int dx = x + 2, dy = y - 1;
        const bool inside = dy >= 0 && dx < 9;
        ASSERT_EQ(memory[(y * width + x) * 3 + p], inside ? document->Sample(p, dx, dy) : 0xbeef)
            << x << " " << y << " " << p;
      }
    }
  }
}

TEST(DocumentChannelsTest, PortsSuiteReadsLevelZeroOnly) {
  auto document = Testing::RandomDocument(5, 5, ImageMode::kGray, false, 3);
  DocumentChannels channels(*document);
  const auto* suite = DocumentChannels::PortsSuite();
  std::vector<uint8_t> plane(25);
  Tarsa::HostPixelMemoryDesc desc = {plane.data(), 5 * 8, 8, 0, 8};
  const Tarsa::HostRect32 all = {0, 0, 5, 5};
  ASSERT_EQ(suite->readPixelsFromLevel(channels.Node(0)->port, 0, &desc, &all), 0);
  EXPECT_TRUE(std::equal(plane.begin(), plane.end(), document->Plane8(0).begin()));
  EXPECT_NE(suite->readPixelsFromLevel(channels.Node(0)->port, 1, &desc, &all), 0);
  desc.depth = 16;  // not the document's depth
  EXPECT_NE(suite->readPixelsFromLevel(channels.Node(0)->port, 0, &desc, &all), 0);
}

}  // namespace
}  // namespace Host
