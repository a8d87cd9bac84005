#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstring>
#include <random>
#include <vector>

#include "framework/pixels/CMemoryPixmap.h"
#include "framework/pixels/CPixScaler.h"

namespace Tarsa {
namespace {

using Entry = CPixScaler::AxisEntry;

TEST(CPixScaler, ShrinkingThreeToTwoSplitsTheMiddleSample) {
  const std::vector<Entry> table = CPixScaler::ShrinkTable(10, 3, 2);
  ASSERT_EQ(table.size(), 2u);
  EXPECT_EQ(table[0].firstSample, 10);
  EXPECT_EQ(table[0].firstWeight, 1.0f);
  EXPECT_EQ(table[0].lastSample, 11);
  EXPECT_EQ(table[0].lastWeight, 0.5f);
  EXPECT_EQ(table[1].firstSample, 11);
  EXPECT_EQ(table[1].firstWeight, 0.5f);
  EXPECT_EQ(table[1].lastSample, 12);
  EXPECT_EQ(table[1].lastWeight, 1.0f);

  CPixScaler scaler;
  EXPECT_TRUE(scaler.SetRects(CRect{0, 0, 2, 5}, CRect{10, 0, 13, 5}));
  EXPECT_EQ(scaler.ModeX(), CPixScaler::kShrink);
  EXPECT_EQ(scaler.ModeY(), CPixScaler::kSame);
  EXPECT_EQ(scaler.NormX(), 2.0f / 3.0f);
  const Entry* kept = scaler.TableX().data();
  EXPECT_FALSE(scaler.SetRects(CRect{0, 0, 2, 5}, CRect{10, 0, 13, 5}));
  EXPECT_EQ(scaler.TableX().data(), kept);
  scaler.Layout(CRect{0, 0, 2, 5}, CRect{0, 0, 1, 1});
  EXPECT_TRUE(scaler.SetRects(CRect{}, CRect{10, 0, 13, 5}));
  EXPECT_EQ(scaler.CellCount(), 0u);
  EXPECT_TRUE(scaler.TableX().empty());
  EXPECT_FALSE(scaler.SetRects(CRect{}, CRect{}));
}

// Each destination position as weights over the source, computed from the
// geometry: the share of each source sample in the position's box when
// shrinking, linear interpolation between the corners when enlarging.
std::vector<std::vector<double>> Weights(std::uint32_t source, std::uint32_t size) {
  std::vector<std::vector<double>> w(size, std::vector<double>(source, 0.0));
  for (std::uint32_t i = 0; i < size; ++i) {
    if (size == source) {
      w[i][i] = 1;
    } else if (size < source) {
      const double box = double(source) / size;
      const double lo = i * box, hi = (i + 1) * box;
      for (std::uint32_t k = 0; k < source; ++k) {
        w[i][k] = std::max(0.0, std::min(hi, k + 1.0) - std::max(lo, double(k))) / box;
      }
    } else {
      const double x = double(i) * (source - 1) / (size - 1);
      const auto n = std::uint32_t(x);
      w[i][n] += 1 - (x - n);
      if (x > n) w[i][n + 1] += x - n;
    }
  }
  return w;
}

double Get(const CPixmap& p, std::int32_t x, std::int32_t y) {
  const std::uint32_t v = p.Sample(0, x, y);
  if (p.Depth() != 32) return v;
  float f;
  std::memcpy(&f, &v, 4);
  return f;
}

void Put(CPixmap& p, std::int32_t x, std::int32_t y, double value) {
  std::uint32_t v = std::uint32_t(value);
  if (p.Depth() == 32) {
    const auto f = float(value);
    std::memcpy(&v, &f, 4);
  }
  p.SetSample(0, x, y, v);
}

TEST(CPixScaler, ScalingMatchesADirectResamplingAtEachDepth) {
  struct Case {
    CRect destination, source;
  };
  const Case cases[] = {
      {CRect{10, 20, 20, 27}, CRect{-5, 7, 32, 30}},  // shrinking 37 x 23 to 10 x 7
      {CRect{0, 0, 17, 4}, CRect{3, 3, 9, 14}},       // enlarging 6 to 17, shrinking 11 to 4
  };
  for (const std::uint32_t depth : {8u, 16u, 32u}) {
    const double top = depth == 8 ? 255 : depth == 16 ? 32768 : 1;
    std::mt19937 random(depth);
    std::uniform_real_distribution<double> value(0, top);
    for (const Case& c : cases) {
      CMemoryPixmap source(c.source, 1, depth);
      for (std::int32_t y = c.source.top; y < c.source.bottom; ++y) {
        for (std::int32_t x = c.source.left; x < c.source.right; ++x) {
          Put(source, x, y, depth == 32 ? value(random) : std::floor(value(random)));
        }
      }
      CPixScaler scaler;
      scaler.SetRects(c.destination, c.source);
      CMemoryPixmap whole(c.destination, 1, depth);
      scaler.Scale(source, whole, c.destination);

      const auto wx =
          Weights(std::uint32_t(c.source.Width()), std::uint32_t(c.destination.Width()));
      const auto wy =
          Weights(std::uint32_t(c.source.Height()), std::uint32_t(c.destination.Height()));
      // Integers are rounded to the nearest sample; the tables' float
      // weights are good to about 1e-7 of the value.
      const double tolerance = depth == 32 ? 1e-5 : 0.5 + 1e-3;
      for (std::int32_t j = 0; j < c.destination.Height(); ++j) {
        for (std::int32_t i = 0; i < c.destination.Width(); ++i) {
          double expected = 0;
          for (std::int32_t l = 0; l < c.source.Height(); ++l) {
            for (std::int32_t k = 0; k < c.source.Width(); ++k) {
              expected += wx[i][k] * wy[j][l] * Get(source, c.source.left + k, c.source.top + l);
            }
          }
          ASSERT_NEAR(Get(whole, c.destination.left + i, c.destination.top + j), expected,
                      tolerance)
              << "depth " << depth << " at " << i << "," << j;
        }
      }

      // Tile by tile, each tile reading no more than SourceRectFor() gives:
      // the same samples as the whole.
      CMemoryPixmap tiled(c.destination, 1, depth);
      for (std::int32_t y = c.destination.top; y < c.destination.bottom; y += 3) {
        for (std::int32_t x = c.destination.left; x < c.destination.right; x += 4) {
          const CRect tile{x, y, x + 4, y + 3};
          CRect needed;
          ASSERT_TRUE(scaler.SourceRectFor(tile, needed));
          CMemoryPixmap part(needed, 1, depth);
          part.CopyFrom(source, needed);
          scaler.Scale(part, tiled, tile);
        }
      }
      for (std::int32_t y = c.destination.top; y < c.destination.bottom; ++y) {
        for (std::int32_t x = c.destination.left; x < c.destination.right; ++x) {
          ASSERT_EQ(tiled.Sample(0, x, y), whole.Sample(0, x, y)) << x << "," << y;
        }
      }
    }
  }
}

TEST(CPixScaler, TheSameSizeCopiesShifted) {
  const CRect from{100, 200, 110, 207};
  CMemoryPixmap source(from, 2, 16);
  for (std::uint32_t k = 0; k < 2; ++k) {
    for (std::int32_t y = from.top; y < from.bottom; ++y) {
      for (std::int32_t x = from.left; x < from.right; ++x) {
        source.SetSample(k, x, y, std::uint32_t(x * 7 + y * 3 + k * 1000));
      }
    }
  }
  CPixScaler scaler;
  scaler.SetRects(CRect{5, 5, 15, 12}, from);
  CRect needed;
  ASSERT_TRUE(scaler.SourceRectFor(CRect{0, 6, 8, 8}, needed));
  EXPECT_EQ(needed, (CRect{100, 201, 103, 203}));
  CMemoryPixmap copy(scaler.Destination(), 2, 16);
  scaler.Scale(source, copy, CRect{-100, -100, 100, 100});
  for (std::uint32_t k = 0; k < 2; ++k) {
    for (std::int32_t y = 5; y < 12; ++y) {
      for (std::int32_t x = 5; x < 15; ++x) {
        ASSERT_EQ(copy.Sample(k, x, y), source.Sample(k, x + 95, y + 195));
      }
    }
  }
}

}  // namespace
}  // namespace Tarsa
