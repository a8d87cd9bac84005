#include <gtest/gtest.h>

#include <cstdint>
#include <random>

#include "framework/pixels/CPixGrid.h"
#include "framework/pixels/CPixState.h"

namespace Tarsa {
namespace {

struct AxisCount {
  std::uint32_t count, first, last;
};

AxisCount Across(const CPixGrid& grid) {
  return {grid.Columns(), grid.FirstWidth(), grid.LastWidth()};
}
AxisCount Down(const CPixGrid& grid) {
  return {grid.Rows(), grid.FirstHeight(), grid.LastHeight()};
}
bool operator==(const AxisCount& a, const AxisCount& b) {
  return a.count == b.count && a.first == b.first && a.last == b.last;
}

CRect Cell(const CPixGrid& grid, std::int32_t col, std::int32_t row) {
  CRect r{-1, -1, -1, -1};
  grid.CellRect(col, row, r);
  return r;
}

TEST(CPixGrid, CellsFollowTheLatticeWhereverTheRectangleLies) {
  CPixGrid grid;
  // Lines at x = 128k and y = 32k. Across 10..310: [10,128) [128,256)
  // [256,310); down -5..65: [-5,0) [0,32) [32,64) [64,65).
  grid.Layout(CRect{10, -5, 310, 65}, CRect{0, 0, 128, 32});
  EXPECT_EQ(Across(grid), (AxisCount{3, 118, 54}));
  EXPECT_EQ(Down(grid), (AxisCount{4, 5, 1}));
  EXPECT_EQ(Cell(grid, 0, 0), (CRect{10, -5, 128, 0}));
  EXPECT_EQ(Cell(grid, 1, 2), (CRect{128, 32, 256, 64}));
  EXPECT_EQ(Cell(grid, 2, 3), (CRect{256, 64, 310, 65}));
  CRect untouched{7, 7, 7, 7};
  EXPECT_FALSE(grid.CellRect(3, 0, untouched));
  EXPECT_FALSE(grid.CellRect(0, -1, untouched));
  EXPECT_EQ(untouched, (CRect{7, 7, 7, 7}));

  // A sample cell away from the rectangle: 20 x 20 through (-7, 3), so lines
  // at x = 13, 33, ... 93 and y = 3, 23, ... 83 over (0, 0, 100, 100).
  grid.Layout(CRect{0, 0, 100, 100}, CRect{-7, 3, 13, 23});
  EXPECT_EQ(Across(grid), (AxisCount{6, 13, 7}));
  EXPECT_EQ(Down(grid), (AxisCount{6, 3, 17}));
  EXPECT_EQ(Cell(grid, 5, 5), (CRect{93, 83, 100, 100}));

  // On the lattice the first cell is whole; ending on a line makes the last
  // whole, with no empty cell after it; a span inside one cell is one cell.
  grid.Layout(CRect{0, 0, 256, 100}, CRect{0, 0, 128, 128});
  EXPECT_EQ(Across(grid), (AxisCount{2, 128, 128}));
  EXPECT_EQ(Down(grid), (AxisCount{1, 100, 0}));
  grid.Layout(CRect{130, 0, 140, 10}, CRect{0, 0, 128, 128});
  EXPECT_EQ(Across(grid), (AxisCount{1, 10, 0}));
  EXPECT_EQ(Cell(grid, 0, 0), (CRect{130, 0, 140, 10}));

  // Nothing to cover, and a cell of no size counts as 1 x 1.
  grid.Layout(CRect{0, 0, 0, 50}, CRect{0, 0, 16, 16});
  EXPECT_EQ(grid.Columns() * grid.Rows(), 0u);
  grid.Layout(CRect{0, 0, 3, 2}, CRect{});
  EXPECT_EQ(Across(grid), (AxisCount{3, 1, 1}));
}

// Every pixel lies in exactly one cell, the one CellAt() names, and
// CellSpan() is the box of the cells under a rectangle's pixels.
TEST(CPixGrid, CellsTileTheRectangleAndLookupsAgree) {
  std::mt19937 random(7);
  auto pick = [&](int lo, int hi) { return std::uniform_int_distribution<int>(lo, hi)(random); };
  for (int trial = 0; trial < 40; ++trial) {
    const CRect bounds{pick(-40, 40), pick(-40, 40), 0, 0};
    const CRect rect{bounds.left, bounds.top, bounds.left + pick(1, 60), bounds.top + pick(1, 60)};
    const CRect sample{pick(-50, 50), pick(-50, 50), 0, 0};
    CPixGrid grid;
    grid.Layout(
        rect, CRect{sample.left, sample.top, sample.left + pick(1, 17), sample.top + pick(1, 17)});
    for (std::int32_t y = rect.top; y < rect.bottom; ++y) {
      for (std::int32_t x = rect.left; x < rect.right; ++x) {
        int holders = 0;
        for (std::uint32_t r = 0; r < grid.Rows(); ++r) {
          for (std::uint32_t c = 0; c < grid.Columns(); ++c) {
            const CRect cell = Cell(grid, std::int32_t(c), std::int32_t(r));
            if (x >= cell.left && x < cell.right && y >= cell.top && y < cell.bottom) ++holders;
          }
        }
        ASSERT_EQ(holders, 1) << "pixel " << x << "," << y << " trial " << trial;
        std::int32_t col = 0;
        std::int32_t row = 0;
        ASSERT_TRUE(grid.CellAt(x, y, col, row));
        const CRect cell = Cell(grid, col, row);
        ASSERT_TRUE(x >= cell.left && x < cell.right && y >= cell.top && y < cell.bottom);
      }
    }
    const CRect probe{pick(-60, 60), pick(-60, 60), 0, 0};
    const CRect area{probe.left, probe.top, probe.left + pick(1, 50), probe.top + pick(1, 50)};
    std::int32_t minCol = INT32_MAX, minRow = INT32_MAX, maxCol = -1, maxRow = -1;
    for (std::int32_t y = area.top; y < area.bottom; ++y) {
      for (std::int32_t x = area.left; x < area.right; ++x) {
        std::int32_t col = 0;
        std::int32_t row = 0;
        if (!grid.CellAt(x, y, col, row)) continue;
        minCol = std::min(minCol, col);
        maxCol = std::max(maxCol, col);
        minRow = std::min(minRow, row);
        maxRow = std::max(maxRow, row);
      }
    }
    std::int32_t col = 0;
    std::int32_t row = 0;
    std::uint32_t columns = 9;
    std::uint32_t rows = 9;
    const bool touches = grid.CellSpan(area, col, row, columns, rows);
    ASSERT_EQ(touches, maxCol >= 0);
    if (touches) {
      EXPECT_EQ(col, minCol);
      EXPECT_EQ(row, minRow);
      EXPECT_EQ(columns, std::uint32_t(maxCol - minCol + 1));
      EXPECT_EQ(rows, std::uint32_t(maxRow - minRow + 1));
    } else {
      EXPECT_EQ(col, -1);
      EXPECT_EQ(row, -1);
      EXPECT_EQ(columns + rows, 0u);
    }
  }
}

TEST(CPixState, CountersAreZeroedByLayoutAndClearedUnderARectangle) {
  CPixState state(true);
  // Lines at 10k: cells [5,10) [10,20) [20,30) [30,35) across, [0,10)
  // [10,20) [20,25) down.
  state.Layout(CRect{5, 0, 35, 25}, CRect{0, 0, 10, 10});
  ASSERT_EQ(state.Columns(), 4u);
  ASSERT_EQ(state.Rows(), 3u);
  for (std::int32_t r = 0; r < 3; ++r) {
    for (std::int32_t c = 0; c < 4; ++c) {
      EXPECT_EQ(state.Count(c, r), 0u);
      for (std::int32_t k = 0; k <= c + r; ++k) state.RaiseCount(c, r);
      EXPECT_EQ(state.RectOf(c, r), Cell(state, c, r));
    }
  }
  state.RaiseCount(4, 0);  // outside: nothing happens
  EXPECT_EQ(state.Count(4, 0), 0u);

  // (12, 9)-(21, 11) touches columns 1 and 2 of rows 0 and 1.
  state.ClearCounts(CRect{12, 9, 21, 11});
  for (std::int32_t r = 0; r < 3; ++r) {
    for (std::int32_t c = 0; c < 4; ++c) {
      const bool cleared = (c == 1 || c == 2) && r < 2;
      EXPECT_EQ(state.Count(c, r), cleared ? 0u : std::uint32_t(c + r + 1)) << c << "," << r;
    }
  }
  state.Layout(CRect{5, 0, 35, 25}, CRect{0, 0, 10, 10});
  EXPECT_EQ(state.Count(3, 2), 0u);
  state.Clear();
  EXPECT_EQ(state.CellCount(), 0u);
  EXPECT_EQ(state.RectOf(0, 0), CRect{});
}

}  // namespace
}  // namespace Tarsa
