// Texels made from a pixmap's planes, and planes made back from texels,
// against the plain per-sample answer on random samples: every plane layout
// a pass carries, both depths, 16-bit samples as integers and as half
// floats, rows whose length leaves the vector loops a tail, and windows of a
// texture that reach past the picture into its border of zeros.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <random>
#include <utility>
#include <vector>

#include "framework/pixels/CMemoryPixmap.h"
#include "framework/pixels/CTexelPacker.h"

namespace Tarsa::testing {
namespace {

struct Layout {
  std::uint32_t planes;
  std::uint32_t pass;
};

// Gray with transparency, RGB with transparency, CMYK with transparency in
// its two passes.
constexpr Layout kLayouts[] = {{2, 0}, {4, 0}, {5, 0}, {5, 1}};

// The planes that fill R, G, B and A, written out rather than derived.
std::array<std::uint32_t, 4> PlanesOf(Layout layout) {
  if (layout.planes == 2) return {0, 0, 0, 1};
  if (layout.pass == 1) return {0, 0, 0, 4};
  return {0, 1, 2, 3};
}

std::uint16_t Widened(std::uint32_t s) {
  return std::uint16_t(std::min<std::uint32_t>(2 * s, 65535));
}

// The half float nearest f (0 to 1), ties to even, subnormals included.
std::uint16_t HalfOf(float f) {
  if (f == 0) return 0;
  int e = 0;
  const double m = std::frexp(double(f), &e);  // f = m 2^e, m in [0.5, 1)
  int exponent = e - 1;
  if (exponent < -14) return std::uint16_t(std::nearbyint(std::ldexp(double(f), 24)));
  double fraction = std::nearbyint((2 * m - 1) * 1024);
  if (fraction == 1024) fraction = 0, ++exponent;
  return std::uint16_t(((exponent + 15) << 10) | int(fraction));
}

// The texel channel value a sample becomes.
std::uint32_t Expected(std::uint32_t sample, std::uint32_t depth, bool halves) {
  if (depth == 8) return sample;
  if (!halves) return Widened(sample);
  return HalfOf(float(Widened(sample)) * (1.0f / 65535.0f));
}

std::uint32_t Channel(const std::uint8_t* texel, std::uint32_t depth, std::size_t c) {
  if (depth == 8) return texel[c];
  std::uint16_t v;
  std::memcpy(&v, texel + c * 2, 2);
  return v;
}

// Random samples throughout; 16-bit ones over their whole range, so that
// the widening's saturation is reached.
void FillRandom(CMemoryPixmap& pixmap, std::mt19937& random) {
  const CRect bounds = pixmap.Bounds();
  for (std::uint32_t p = 0; p < pixmap.Planes(); ++p) {
    for (std::int32_t y = bounds.top; y < bounds.bottom; ++y) {
      for (std::int32_t x = bounds.left; x < bounds.right; ++x)
        pixmap.SetSample(p, x, y, random() & (pixmap.Depth() == 8 ? 0xFF : 0xFFFF));
    }
  }
}

std::vector<bool> HalvesFor(std::uint32_t depth) {
  if (depth == 8) return {false};
  if (!CTexelPacker::CanMakeHalves()) return {false};
  return {false, true};
}

TEST(TexelPacker, RowsOfTexelsHoldEachChannelsPlaneAsThePlainLoopSays) {
  std::mt19937 random(29);
  const CRect bounds{-5, 10, 40, 13};
  std::vector<std::uint8_t> texels, scratch;
  for (const Layout layout : kLayouts) {
    for (const std::uint32_t depth : {8u, 16u}) {
      CMemoryPixmap source(bounds, layout.planes, depth);
      FillRandom(source, random);
      for (const bool halves : HalvesFor(depth)) {
        const CTexelPacker packer(layout.planes, layout.pass, depth, halves);
        ASSERT_EQ(packer.TexelBytes(), depth == 8 ? 4u : 8u);
        // Whole runs of eight, a tail, and a run shorter than any.
        for (const std::size_t width : {1u, 7u, 8u, 19u, 45u}) {
          SCOPED_TRACE(::testing::Message()
                       << layout.planes << " planes, pass " << layout.pass << ", depth " << depth
                       << ", halves " << halves << ", width " << width);
          texels.assign(width * packer.TexelBytes(), 0xEE);
          const std::int32_t x0 = bounds.right - std::int32_t(width), y = bounds.top + 1;
          packer.Read(source, x0, y, width, texels.data(), scratch);
          for (std::size_t x = 0; x < width; ++x) {
            for (std::size_t c = 0; c < 4; ++c) {
              const std::uint32_t sample =
                  source.Sample(PlanesOf(layout)[c], x0 + std::int32_t(x), y);
              ASSERT_EQ(Channel(texels.data() + x * packer.TexelBytes(), depth, c),
                        Expected(sample, depth, halves))
                  << "texel " << x << " channel " << c << " sample " << sample;
            }
          }
        }
      }
    }
  }
}

// A window of a texture that holds picture at texel (at.x, at.y): the
// picture's pixels where it lies, zeros all around, whichever way the
// window overlaps it.
TEST(TexelPacker, AWindowHoldsThePictureWithZerosAroundIt) {
  std::mt19937 random(31);
  const CRect bounds{100, 200, 160, 240};
  const CRect picture{110, 205, 131, 222};  // 21 x 17 of the source
  const CPoint at{6, 3};
  CMemoryPixmap source(bounds, 4, 16);
  FillRandom(source, random);
  const CTexelPacker packer(4, 0, 16, false);
  std::vector<std::uint8_t> texels, scratch;
  struct Window {
    std::int32_t x0, y0, x1, y1;
  };
  // The whole texture; one cut across the picture's left and bottom edges;
  // one inside it; one wholly in the border.
  for (const Window w :
       {Window{0, 0, 33, 24}, Window{2, 10, 16, 24}, Window{8, 5, 20, 9}, Window{28, 0, 33, 24}}) {
    SCOPED_TRACE(::testing::Message()
                 << "window " << w.x0 << "," << w.y0 << " to " << w.x1 << "," << w.y1);
    texels.assign(3, 0xEE);
    packer.Pack(source, picture, at, w.x0, w.y0, w.x1, w.y1, texels, scratch);
    ASSERT_EQ(texels.size(), std::size_t(w.x1 - w.x0) * std::size_t(w.y1 - w.y0) * 8);
    for (std::int32_t y = w.y0; y < w.y1; ++y) {
      for (std::int32_t x = w.x0; x < w.x1; ++x) {
        const std::int32_t sx = picture.left + x - at.x, sy = picture.top + y - at.y;
        const bool inside =
            sx >= picture.left && sx < picture.right && sy >= picture.top && sy < picture.bottom;
        const std::uint8_t* texel =
            texels.data() + (std::size_t(y - w.y0) * std::size_t(w.x1 - w.x0) + (x - w.x0)) * 8;
        for (std::size_t c = 0; c < 4; ++c) {
          const std::uint32_t expected = inside ? Widened(source.Sample(c, sx, sy)) : 0;
          ASSERT_EQ(Channel(texel, 16, c), expected) << "texel " << x << "," << y;
        }
      }
    }
  }
}

// What a pass drew, as rows of RGBA texels wider than the pixmap, back into
// the planes that pass carries; the other planes keep what they held.
TEST(TexelPacker, DrawnTexelsGoBackIntoThePlanesTheirPassCarries) {
  std::mt19937 random(37);
  constexpr std::size_t kStride = 64;
  const CPoint origin{-20, 30};
  const CRect area{-17, 32, 20, 36};  // 37 pixels a row, 3 texels in
  for (const Layout layout : kLayouts) {
    for (const std::uint32_t depth : {8u, 16u}) {
      SCOPED_TRACE(::testing::Message()
                   << layout.planes << " planes, pass " << layout.pass << ", depth " << depth);
      const std::size_t texelBytes = depth == 8 ? 4 : 8;
      std::vector<std::uint8_t> texels(kStride * 8 * texelBytes);
      for (std::uint8_t& byte : texels) byte = std::uint8_t(random());
      // Some texels at the top of the range, which narrows to 32768.
      for (std::size_t k = 2; k < 8 * kStride; k += 5)
        std::memset(texels.data() + k * texelBytes, 0xFF, texelBytes);
      CMemoryPixmap before(area, layout.planes, depth);
      FillRandom(before, random);
      CMemoryPixmap dest(area, layout.planes, depth);
      dest.CopyFrom(before, area);
      CTexelPacker(layout.planes, layout.pass, depth, false)
          .Unpack(texels.data(), kStride, origin, dest);

      // (plane, channel) pairs a pass brings back.
      std::vector<std::pair<std::uint32_t, std::size_t>> back;
      if (layout.planes == 2) {
        back = {{0, 0}, {1, 3}};
      } else if (layout.pass == 1) {
        back = {{4, 3}};
      } else {
        back = {{0, 0}, {1, 1}, {2, 2}, {3, 3}};
      }
      for (std::uint32_t p = 0; p < layout.planes; ++p) {
        const auto from = std::find_if(back.begin(), back.end(),
                                       [p](const auto& pair) { return pair.first == p; });
        for (std::int32_t y = area.top; y < area.bottom; ++y) {
          for (std::int32_t x = area.left; x < area.right; ++x) {
            std::uint32_t expected = before.Sample(p, x, y);
            if (from != back.end()) {
              const std::size_t at =
                  (std::size_t(y - origin.y) * kStride + std::size_t(x - origin.x)) * texelBytes;
              const std::uint32_t value = Channel(texels.data() + at, depth, from->second);
              expected = depth == 8 ? value : value == 65535 ? 32768 : value / 2;
            }
            ASSERT_EQ(dest.Sample(p, x, y), expected) << "plane " << p << " at " << x << "," << y;
          }
        }
      }
    }
  }
}

}  // namespace
}  // namespace Tarsa::testing
