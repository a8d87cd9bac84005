#include <gtest/gtest.h>

#include "tests/framework/icons/IconTestIndex.h"

namespace Tarsa::testing {
namespace {

// One image, "Knob", with states 0 and 1 at resolution 0 (5 and 3 bytes of
// a 12-byte block) and state 0 at resolution 1.
struct KnobIndex {
  KnobIndex() {
    index.Block(0, "Low.dat").Block(1, "High.dat");
    index.Entry("Knob").Size(0, 7, 9).Size(1, 14, 18).HotSpot(0, 3, 4).HotSpot(1, 6, 8);
    index.State(0, 0, 4, 5).State(0, 1, 9, 3).State(1, 0, 4, 8);
    provider.blocks["Low.dat"] = DataBlock({1, 2, 3, 4, 5, 6, 7, 8});
    provider.blocks["High.dat"] = DataBlock({9, 9, 9, 9, 9, 9, 9, 9});
  }
  IndexBuilder index;
  MapProvider provider;
};

TEST(ResourceDataProvider, IndexSizeMustBeTheHeaderAndWholeEntries) {
  MapProvider provider;
  Bytes index = IndexBuilder().bytes();
  ASSERT_EQ(index.size(), 546u);
  EXPECT_TRUE(provider.Parse(index));
  EXPECT_EQ(provider.Count(), 0u);

  index.push_back(0);
  EXPECT_FALSE(provider.Parse(index));
  index.resize(546 + 368, 0);
  EXPECT_TRUE(provider.Parse(index));
  EXPECT_EQ(provider.Count(), 1u);
  index.resize(545);
  EXPECT_FALSE(provider.Parse(index));
  EXPECT_FALSE(provider.Parse({}));
}

TEST(ResourceDataProvider, SignatureIsComparedExactly) {
  MapProvider provider;
  Bytes index = IndexBuilder().Entry("Knob").bytes();
  index[33] = '\r';  // the final newline
  EXPECT_FALSE(provider.Parse(index));
  EXPECT_EQ(provider.Count(), 0u) << "a refused index leaves no entries behind";
}

TEST(ResourceDataProvider, AnswersForTheStatesAnImageHas) {
  KnobIndex knob;
  ASSERT_TRUE(knob.provider.Parse(knob.index.bytes()));
  std::size_t size = 0;
  const std::uint8_t* data = nullptr;
  ASSERT_TRUE(knob.provider.GetData("Knob", 0, 1, size, data));
  EXPECT_EQ(size, 3u);
  EXPECT_EQ(Bytes(data, data + size), (Bytes{6, 7, 8}));
  ASSERT_TRUE(knob.provider.GetData("Knob", 1, 0, size, data));
  EXPECT_EQ(data[0], 9);

  std::uint32_t width = 0;
  std::uint32_t height = 0;
  ASSERT_TRUE(knob.provider.GetSize("Knob", 1, 0, width, height));
  EXPECT_EQ(width, 14u);
  EXPECT_EQ(height, 18u);

  // A state the image lacks, and indexes out of range, clear the answer.
  for (const auto& [resolution, state] : {std::pair{0u, 3u}, {1u, 1u}, {4u, 0u}, {0u, 8u}}) {
    size = 99;
    data = reinterpret_cast<const std::uint8_t*>(&size);
    EXPECT_FALSE(knob.provider.GetData("Knob", resolution, state, size, data));
    EXPECT_EQ(size, 0u);
    EXPECT_EQ(data, nullptr);
    EXPECT_FALSE(knob.provider.GetSize("Knob", resolution, state, width, height));
    EXPECT_EQ(width, 0u);
  }
  EXPECT_FALSE(knob.provider.GetData("Dial", 0, 0, size, data));
}

TEST(ResourceDataProvider, HotSpotIsResolutionZerosAndUnknownNamesAnswerZero) {
  KnobIndex knob;
  ASSERT_TRUE(knob.provider.Parse(knob.index.bytes()));
  std::int32_t x = -1;
  std::int32_t y = -1;
  ASSERT_TRUE(knob.provider.GetHotSpot("Knob", x, y));
  EXPECT_EQ(x, 3);
  EXPECT_EQ(y, 4);
  EXPECT_FALSE(knob.provider.GetHotSpot("Dial", x, y));
  EXPECT_EQ(x, 0);
  EXPECT_EQ(y, 0);
}

TEST(ResourceDataProvider, NamesStartingWithADigitAreFoundUnderThePrefix) {
  IndexBuilder index;
  index.Block(0, "Low.dat");
  index.Entry("Alpha_26019").Size(0, 1, 1).HotSpot(0, 5, 6).State(0, 0, 4, 1);
  index.Entry("26020").Size(0, 1, 1).State(0, 0, 4, 1);
  MapProvider provider;
  provider.blocks["Low.dat"] = DataBlock({0});
  ASSERT_TRUE(provider.Parse(index.bytes()));

  std::int32_t x = 0;
  std::int32_t y = 0;
  EXPECT_TRUE(provider.GetHotSpot("26019", x, y));
  EXPECT_EQ(x, 5);
  EXPECT_TRUE(provider.GetHotSpot("Alpha_26019", x, y));
  // An entry stored under the bare number can never be asked for.
  EXPECT_FALSE(provider.GetHotSpot("26020", x, y));
  EXPECT_EQ(ResourceDataProvider::IndexKey("Tab.Left"), "Tab.Left");
  EXPECT_EQ(ResourceDataProvider::IndexKey(""), "");
}

TEST(ResourceDataProvider, ALaterEntryOfTheSameNameReplacesTheFormer) {
  IndexBuilder index;
  index.Entry("Knob").HotSpot(0, 1, 1);
  index.Entry("Knob").HotSpot(0, 2, 2);
  MapProvider provider;
  ASSERT_TRUE(provider.Parse(index.bytes()));
  EXPECT_EQ(provider.Count(), 1u);
  std::int32_t x = 0;
  std::int32_t y = 0;
  provider.GetHotSpot("Knob", x, y);
  EXPECT_EQ(x, 2);
}

TEST(ResourceDataProvider, BlocksAreLoadedOnFirstNeedAndOnce) {
  KnobIndex knob;
  ASSERT_TRUE(knob.provider.Parse(knob.index.bytes()));
  EXPECT_EQ(knob.provider.loads, 0);
  std::size_t size = 0;
  const std::uint8_t* data = nullptr;
  knob.provider.GetData("Knob", 0, 0, size, data);
  knob.provider.GetData("Knob", 0, 1, size, data);
  EXPECT_EQ(knob.provider.loads, 1);
  // A new index forgets the old blocks.
  ASSERT_TRUE(knob.provider.Parse(knob.index.bytes()));
  knob.provider.GetData("Knob", 0, 0, size, data);
  EXPECT_EQ(knob.provider.loads, 2);
}

// Entries that point outside their block, or state absurd sizes, answer
// false instead of handing out memory past the block.
TEST(ResourceDataProvider, DamagedEntriesAnswerFalse) {
  IndexBuilder index;
  index.Block(0, "Low.dat").Block(1, "Missing.dat");
  index.Entry("PastEnd").Size(0, 1, 1).State(0, 0, 4, 9);
  index.Entry("Wraps").Size(0, 1, 1).State(0, 0, 0xFFFFFFFF, 2);
  index.Entry("Huge").Size(0, 100000, 1).State(0, 0, 4, 1);
  index.Entry("NoBlock").Size(1, 1, 1).State(1, 0, 4, 1);
  index.Entry("Fits").Size(0, 1, 1).State(0, 0, 4, 8);
  MapProvider provider;
  provider.blocks["Low.dat"] = DataBlock({1, 2, 3, 4, 5, 6, 7, 8});
  ASSERT_TRUE(provider.Parse(index.bytes()));

  std::size_t size = 0;
  const std::uint8_t* data = nullptr;
  EXPECT_FALSE(provider.GetData("PastEnd", 0, 0, size, data));
  EXPECT_FALSE(provider.GetData("Wraps", 0, 0, size, data));
  EXPECT_FALSE(provider.GetData("NoBlock", 1, 0, size, data));
  EXPECT_TRUE(provider.GetData("Fits", 0, 0, size, data));
  std::uint32_t width = 0;
  std::uint32_t height = 0;
  EXPECT_FALSE(provider.GetSize("Huge", 0, 0, width, height));

  // A block that does not start with the magic is no block.
  provider.blocks["Low.dat"][0] = 'x';
  ASSERT_TRUE(provider.Parse(index.bytes()));
  EXPECT_FALSE(provider.GetData("Fits", 0, 0, size, data));
}

}  // namespace
}  // namespace Tarsa::testing
