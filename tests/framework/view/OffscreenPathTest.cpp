#include <gtest/gtest.h>

#include <cstdint>
#include <numbers>
#include <vector>

#include "framework/view/CNativeWindow.h"
#include "framework/view/CPath.h"

namespace Tarsa {
namespace {

constexpr double kPi = std::numbers::pi;

struct Box {
  CPointF min, max;
};

Box BoundsOf(const CPath& path) {
  Box box;
  EXPECT_TRUE(path.Bounds(box.min, box.max));
  return box;
}

// Arcs are boxed by their true extent: the ends plus the quarter-turn points
// the sweep passes, whichever way it turns.
TEST(CPath, BoundsFollowArcs) {
  CPath quarter;
  quarter.Arc({0, 0}, 10, 0, kPi / 2);
  const Box q = BoundsOf(quarter);
  EXPECT_NEAR(q.min.x, 0, 1e-12);
  EXPECT_NEAR(q.min.y, 0, 1e-12);
  EXPECT_NEAR(q.max.x, 10, 1e-12);
  EXPECT_NEAR(q.max.y, 10, 1e-12);

  // From the bottom back through +x to the top: the right half only.
  CPath back;
  back.Arc({5, 5}, 2, kPi / 2, -kPi / 2);
  const Box b = BoundsOf(back);
  EXPECT_NEAR(b.min.x, 5, 1e-12);
  EXPECT_NEAR(b.max.x, 7, 1e-12);
  EXPECT_NEAR(b.min.y, 3, 1e-12);
  EXPECT_NEAR(b.max.y, 7, 1e-12);

  CPath shapes;
  shapes.AddCircle({0, 0}, 3);
  shapes.AddRectangle({10, -1}, {12, 20});
  const Box s = BoundsOf(shapes);
  EXPECT_NEAR(s.min.x, -3, 1e-12);
  EXPECT_NEAR(s.min.y, -3, 1e-12);
  EXPECT_EQ(s.max.x, 12);
  EXPECT_EQ(s.max.y, 20);

  CPointF a{1, 1}, z{2, 2};
  EXPECT_FALSE(CPath().Bounds(a, z));
  EXPECT_EQ(a.x, 1);  // untouched
}

std::uint32_t Alpha(const std::vector<std::uint8_t>& rgba, CSize size, int x, int y) {
  return rgba[(std::size_t(y) * size.width + x) * 4 + 3];
}

// The image reads back in straight RGBA, translucent colours included, and
// starts transparent.
TEST(COffscreenImage, ReadsBackStraightColours) {
  const auto image = CreateOffscreenImage({8, 4});
  image->Port().FillRect({2, 1, 4, 3}, 0x80FF2000);
  const std::vector<std::uint8_t> rgba = image->ReadPixels();
  ASSERT_EQ(rgba.size(), 8u * 4u * 4u);
  const std::uint8_t* inside = &rgba[(1 * 8 + 2) * 4];
  // 0x20 premultiplied by 128/255 loses a little; back within one step.
  EXPECT_EQ(inside[0], 255);
  EXPECT_NEAR(inside[1], 0x20, 1);
  EXPECT_EQ(inside[2], 0);
  EXPECT_EQ(inside[3], 128);
  EXPECT_EQ(Alpha(rgba, image->Size(), 0, 0), 0u);
  EXPECT_EQ(Alpha(rgba, image->Size(), 4, 1), 0u);
}

// A hard-edged horizontal stroke on a pixel row's centre: dashes of 4 on and
// 2 off from x = 0, and the same pattern entered 4 along starting with its
// gap; a dashed stroke leaves the next one solid again.
TEST(COffscreenImage, StrokesDashesWithAnOffset) {
  const CSize size{24, 8};
  const auto image = CreateOffscreenImage(size);
  CPort& port = image->Port();
  port.SetAntialias(false);
  CPath row1, row3, row5;
  row1.AddPolyline(std::vector<CPointF>{{0, 1.5}, {24, 1.5}}, false);
  row3.AddPolyline(std::vector<CPointF>{{0, 3.5}, {24, 3.5}}, false);
  row5.AddPolyline(std::vector<CPointF>{{0, 5.5}, {24, 5.5}}, false);
  port.StrokePath(row1, {0xFF000000, 1.0, {4, 2}, 0});
  port.StrokePath(row3, {0xFF000000, 1.0, {4, 2}, 4});
  port.StrokePath(row5, {0xFF000000, 1.0, {}, 0});
  const std::vector<std::uint8_t> rgba = image->ReadPixels();
  for (int x = 0; x < size.width; ++x) {
    EXPECT_EQ(Alpha(rgba, size, x, 1), x % 6 < 4 ? 255u : 0u) << x;
    EXPECT_EQ(Alpha(rgba, size, x, 3), (x + 4) % 6 < 4 ? 255u : 0u) << x;
    EXPECT_EQ(Alpha(rgba, size, x, 5), 255u) << x;
    EXPECT_EQ(Alpha(rgba, size, x, 0), 0u) << x;
  }
}

// Hard edges give only opaque and empty pixels; Restore brings the soft
// edges back.
TEST(COffscreenImage, AntialiasingIsPartOfTheSavedState) {
  const CSize size{32, 32};
  auto countPartial = [&](bool hard) {
    const auto image = CreateOffscreenImage(size);
    CPort& port = image->Port();
    port.Save();
    port.SetAntialias(!hard);
    port.Restore();
    if (hard) port.SetAntialias(false);
    CPath disc;
    disc.AddCircle({16, 16}, 9.3);
    port.FillPath(disc, 0xFF000000);
    const std::vector<std::uint8_t> rgba = image->ReadPixels();
    int partial = 0;
    for (int y = 0; y < size.height; ++y) {
      for (int x = 0; x < size.width; ++x) {
        const std::uint32_t a = Alpha(rgba, size, x, y);
        partial += a != 0 && a != 255;
      }
    }
    return partial;
  };
  EXPECT_EQ(countPartial(true), 0);
  EXPECT_GT(countPartial(false), 0);
}

}  // namespace
}  // namespace Tarsa
