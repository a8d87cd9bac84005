// Planes to pixels and back against the plain per-sample answer, for every
// plane count the host's modes use, both sample sizes, rows of any length
// (the vector loops take whole runs of 16 and leave a tail), a pixel wider
// than its planes, and the cap.
#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <span>
#include <vector>

#include "framework/pixels/SampleInterleave.h"

namespace Tarsa {
namespace {

template <typename Sample>
void CheckRoundTrip(std::size_t planeCount, std::size_t stride, std::size_t count) {
  SCOPED_TRACE(::testing::Message() << sizeof(Sample) << " bytes, " << planeCount << " of "
                                    << stride << " samples, " << count << " pixels");
  std::mt19937 random(17);
  std::vector<std::vector<Sample>> planes(planeCount, std::vector<Sample>(count));
  for (auto& plane : planes) {
    for (Sample& s : plane) s = Sample(random());
  }
  std::vector<const Sample*> from;
  for (const auto& plane : planes) from.push_back(plane.data());

  // Samples past a pixel's planes keep what they held.
  constexpr Sample kUntouched = 0x5A;
  std::vector<Sample> pixels(count * stride, kUntouched);
  PlanesToPixels<Sample>(from, count, stride, pixels.data());
  for (std::size_t x = 0; x < count; ++x) {
    for (std::size_t k = 0; k < stride; ++k) {
      const Sample expected = k < planeCount ? planes[k][x] : kUntouched;
      ASSERT_EQ(pixels[x * stride + k], expected) << "pixel " << x << " sample " << k;
    }
  }

  // Back, capped a little below the largest sample.
  const Sample cap = Sample(Sample(~Sample(0)) - 3);
  std::vector<std::vector<Sample>> back(planeCount, std::vector<Sample>(count));
  std::vector<Sample*> to;
  for (auto& plane : back) to.push_back(plane.data());
  PixelsToPlanes<Sample>(pixels.data(), stride, count, to, cap);
  for (std::size_t k = 0; k < planeCount; ++k) {
    for (std::size_t x = 0; x < count; ++x)
      ASSERT_EQ(back[k][x], std::min(planes[k][x], cap)) << "plane " << k << " pixel " << x;
  }
}

TEST(SampleInterleave, RoundTripsEveryPlaneCountAndLength) {
  for (std::size_t planes = 1; planes <= 5; ++planes) {
    for (std::size_t count : {0u, 1u, 15u, 16u, 17u, 47u, 128u, 131u}) {
      CheckRoundTrip<std::uint8_t>(planes, planes, count);
      CheckRoundTrip<std::uint16_t>(planes, planes, count);
    }
  }
  // Fewer planes than samples a pixel, and more than the unrolled loops take.
  CheckRoundTrip<std::uint8_t>(3, 4, 37);
  CheckRoundTrip<std::uint16_t>(2, 5, 37);
  CheckRoundTrip<std::uint8_t>(7, 7, 33);
}

}  // namespace
}  // namespace Tarsa
