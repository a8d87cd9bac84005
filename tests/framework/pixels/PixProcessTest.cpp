#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "framework/memory/CVirtualHeap.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/pixels/CPixProcess.h"
#include "framework/pixels/CVirtualPixmap.h"
#include "tests/support/TestSupport.h"

namespace Tarsa {
namespace {

const CRect kImage{-3, 2, 77, 53};

std::uint32_t Pattern(std::int32_t x, std::int32_t y) {
  return std::uint32_t((x * 37 + y * 11 + (x * y) % 13) & 0xFF);
}

// The first stage: one step a cell writes the pattern into tiles on a heap
// too small for the image, so that a run swaps as it goes.
class PatternStage : public CPixProcess {
 public:
  explicit PatternStage(CVirtualHeap& heap)
      : pixels(3, std::int32_t(kImage.Width()), std::int32_t(kImage.Height()), 1, 0, {}, false,
               false, &heap) {
    pixels.SetOrigin(CPoint{kImage.left, kImage.top});
    Layout(kImage, CRect{0, 0, 16, 16});
    SetStepsPerCell(1);
  }
  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool, std::intptr_t,
              std::intptr_t) override {
    if (StepsLeft(col, row) == 0) return 1;
    const CRect cell = RectOf(col, row);
    for (std::int32_t y = cell.top; y < cell.bottom; ++y) {
      for (std::int32_t x = cell.left; x < cell.right; ++x)
        pixels.SetSample(0, x, y, Pattern(x, y));
    }
    RaiseCount(col, row);
    ++stepCount;
    return 1;
  }
  CVirtualPixmap pixels;
};

// The stage above it: a 3 x 3 box sum over a grid of its own, not aligned
// with the first. Step 1 of a cell brings in the input cells it reads,
// step 2 sums. Without wait it reports what is missing below and waits.
class BoxStage : public CPixProcess {
 public:
  explicit BoxStage(PatternStage& input) : input_(input), sums(kImage, 1, 16) {
    AddInput(input);
    Layout(kImage, CRect{5, 1, 29, 21});
    SetStepsPerCell(2);
  }
  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t, std::intptr_t) override {
    if (StepsLeft(col, row) == 0) return 1;
    const CRect cell = RectOf(col, row);
    if (Counter(col, row) == 0) {
      const CRect reach{cell.left - 1, cell.top - 1, cell.right + 1, cell.bottom + 1};
      std::int32_t c0 = 0, r0 = 0;
      std::uint32_t columns = 0, rows = 0;
      input_.CellSpan(reach, c0, r0, columns, rows);
      if (!wait) {
        const std::uint64_t missing = input_.LeftInRange(c0, r0, columns, rows);
        if (missing > 0) {
          stepCount += std::uint32_t(missing);
          return 1;
        }
      }
      for (std::uint32_t r = 0; r < rows; ++r) {
        for (std::uint32_t c = 0; c < columns; ++c) {
          stepCount += input_.RunCellToEnd(c0 + std::int32_t(c), r0 + std::int32_t(r));
        }
      }
    } else {
      for (std::int32_t y = cell.top; y < cell.bottom; ++y) {
        for (std::int32_t x = cell.left; x < cell.right; ++x) {
          std::uint32_t sum = 0;
          for (std::int32_t dy = -1; dy <= 1; ++dy) {
            for (std::int32_t dx = -1; dx <= 1; ++dx) {
              const std::int32_t sx = x + dx, sy = y + dy;
              if (sx >= kImage.left && sx < kImage.right && sy >= kImage.top && sy < kImage.bottom)
                sum += input_.pixels.Sample(0, sx, sy);
            }
          }
          sums.SetSample(0, x, y, sum);
        }
      }
    }
    RaiseCount(col, row);
    ++stepCount;
    return 1;
  }
  void AfterAll() override { ++afterAll; }

  PatternStage& input_;
  CMemoryPixmap sums;
  int afterAll = 0;
};

// The box sums computed at once from the pattern itself.
std::uint32_t WholeSum(std::int32_t x, std::int32_t y) {
  std::uint32_t sum = 0;
  for (std::int32_t sy = std::max(y - 1, kImage.top); sy <= std::min(y + 1, kImage.bottom - 1);
       ++sy)
    for (std::int32_t sx = std::max(x - 1, kImage.left); sx <= std::min(x + 1, kImage.right - 1);
         ++sx)
      sum += Pattern(sx, sy);
  return sum;
}

::testing::AssertionResult MatchesWhole(const CMemoryPixmap& sums) {
  for (std::int32_t y = kImage.top; y < kImage.bottom; ++y) {
    for (std::int32_t x = kImage.left; x < kImage.right; ++x) {
      if (sums.Sample(0, x, y) != WholeSum(x, y)) {
        return ::testing::AssertionFailure() << "differs at " << x << "," << y;
      }
    }
  }
  return ::testing::AssertionSuccess();
}

struct Stages {
  Tarsa::testing::ScratchFolder scratch;
  // Room for 8 tiles of 16 x 16; the image takes 20.
  CVirtualHeap heap{8 * 256, {scratch.Dir()}};
  PatternStage pattern{heap};
  BoxStage box{pattern};
};

TEST(CPixProcess, AStageRunTileByTileEqualsTheWholeComputation) {
  Stages s;
  const std::uint64_t total = s.box.TotalSteps();
  // Hand count: the box grid has 4 x 3 cells of 2 steps (lines at x = 5,
  // 29, 53 and y = 21, 41), the pattern grid 6 x 4 (lines at x = 0, 16, ...
  // 64 and y = 16, 32, 48).
  ASSERT_EQ(total, 4u * 3 * 2 + 6 * 4);
  std::uint64_t counted = 0;
  while (std::uint32_t steps = s.box.NextStepInRange(0, 0, s.box.Columns(), s.box.Rows())) {
    counted += steps;
  }
  EXPECT_EQ(counted, total);
  EXPECT_EQ(s.box.DoneSteps(), total);
  EXPECT_EQ(s.box.LeftInRange(0, 0, 99, 99), 0u);
  EXPECT_TRUE(MatchesWhole(s.box.sums));
  EXPECT_GT(s.heap.SwapOuts(), 0u);

  // (10, 25)-(12, 27) lies in box cell (1, 1) only.
  s.box.sums.Fill(0, kImage, 0);
  s.box.Invalidate(CRect{10, 25, 12, 27});
  EXPECT_EQ(s.box.LeftInRange(0, 0, 4, 3), 2u);
  EXPECT_EQ(s.box.StepsLeft(1, 1), 2u);
  s.box.Invalidate(kImage);
  EXPECT_EQ(s.box.DoneInRange(0, 0, 4, 3), 0u);
  EXPECT_EQ(s.box.RunAll(true, 0, 0), 1);
  EXPECT_EQ(s.box.afterAll, 1);
  EXPECT_TRUE(MatchesWhole(s.box.sums));
}

TEST(CPixProcess, WithoutWaitAStageReportsWhatIsMissingBelow) {
  Stages s;
  // Box cell (0, 0) is (-3, 2)-(5, 21); with its border it reaches pattern
  // columns 0 (to x = 0) and 1, rows 0 (to y = 16) and 1: four cells.
  EXPECT_EQ(s.box.RunCellCounted(0, 0, false), 4u);
  EXPECT_EQ(s.box.Counter(0, 0), 0u);
  EXPECT_EQ(s.box.RunCell(0, 0, false, 0, 0), 0);
  EXPECT_EQ(s.pattern.DoneSteps(), 0u);

  EXPECT_EQ(s.pattern.RunRange(0, 0, 2, 2, true, 0, 0), 1);
  EXPECT_EQ(s.box.RunCell(0, 0, false, 0, 0), 1);
  EXPECT_EQ(s.box.Counter(0, 0), 2u);
  EXPECT_EQ(s.box.RunCellToEnd(0, 0), 0u);
  EXPECT_EQ(s.box.DoneSteps(), 2u + 4u);
}

// A stage whose steps fail in one cell: loops stop there.
class FailingStage : public CPixProcess {
 public:
  FailingStage() {
    Layout(CRect{0, 0, 30, 20}, CRect{0, 0, 10, 10});
    SetStepsPerCell(3);
  }
  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t arg1, std::intptr_t arg2) override {
    if (col == 1 && row == 0 && Counter(col, row) == 1) return 0;
    return CPixProcess::Advance(col, row, stepCount, wait, arg1, arg2);
  }
  void StepDone(std::int32_t, std::int32_t) override { ++stepsDone; }
  int stepsDone = 0;
};

TEST(CPixProcess, AFailedStepStopsTheRangeWhereItFailed) {
  FailingStage stage;
  EXPECT_EQ(stage.TotalSteps(), 6u * 3);
  EXPECT_EQ(stage.RunRange(0, 0, 3, 2, true, 0, 0), 0);
  // Cell (0, 0) complete, (1, 0) stuck after one step, nothing beyond.
  EXPECT_EQ(stage.DoneSteps(), 3u + 1);
  EXPECT_EQ(stage.stepsDone, 4);
  EXPECT_EQ(stage.LeftInRange(1, 0, 5, 5), 2u + 3 * 3);
  EXPECT_EQ(stage.RunAll(true, 0, 0), 0);
  // The next cell with work is (1, 0), which fails: no step, count 0.
  EXPECT_EQ(stage.NextStepInRange(0, 0, 3, 2), 0u);
  EXPECT_EQ(stage.NextStepInRange(2, 0, 1, 2), 1u);
  EXPECT_EQ(stage.RunCellToEnd(2, 1), 3u);
  EXPECT_EQ(stage.StepsOf(3, 0), 0u);  // outside the grid
}

}  // namespace
}  // namespace Tarsa
