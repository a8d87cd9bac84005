#include "framework/pixels/CPixProcess.h"

#include <algorithm>

namespace Tarsa {

int CPixProcess::Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount,
                         bool /*wait*/, std::intptr_t /*arg1*/, std::intptr_t /*arg2*/) {
  if (Counter(col, row) >= StepsOf(col, row)) return 1;
  RaiseCount(col, row);
  ++stepCount;
  StepDone(col, row);
  return 1;
}

int CPixProcess::RunCell(std::int32_t col, std::int32_t row, bool wait, std::intptr_t arg1,
                         std::intptr_t arg2) {
  while (StepsLeft(col, row) > 0) {
    const std::uint32_t before = Counter(col, row);
    std::uint32_t count = 0;
    if (Advance(col, row, count, wait, arg1, arg2) == 0) return 0;
    // A stage that may not wait for its inputs answers without stepping;
    // looping on would spin.
    if (Counter(col, row) == before) return 0;
  }
  return 1;
}

std::uint32_t CPixProcess::RunCellCounted(std::int32_t col, std::int32_t row, bool wait) {
  std::uint32_t count = 0;
  Advance(col, row, count, wait, 0, 0);
  return count;
}

std::uint32_t CPixProcess::RunCellToEnd(std::int32_t col, std::int32_t row) {
  std::uint32_t total = 0;
  while (StepsLeft(col, row) > 0) {
    const std::uint32_t before = Counter(col, row);
    if (Advance(col, row, total, true, 0, 0) == 0 || Counter(col, row) == before) break;
  }
  return total;
}

std::uint32_t CPixProcess::Counter(std::int32_t col, std::int32_t row) const {
  return Count(col, row);
}

std::uint32_t CPixProcess::StepsLeft(std::int32_t col, std::int32_t row) const {
  const std::uint32_t total = StepsOf(col, row);
  const std::uint32_t done = Counter(col, row);
  return done < total ? total - done : 0;
}

std::uint32_t CPixProcess::StepsOf(std::int32_t col, std::int32_t row) const {
  return HasCell(col, row) ? stepsPerCell_ : 0;
}

bool CPixProcess::ClipRange(std::int32_t& col, std::int32_t& row, std::uint32_t& columns,
                            std::uint32_t& rows) const {
  const std::int64_t left = std::max<std::int64_t>(col, 0);
  const std::int64_t top = std::max<std::int64_t>(row, 0);
  const std::int64_t right = std::min<std::int64_t>(std::int64_t(col) + columns, Columns());
  const std::int64_t bottom = std::min<std::int64_t>(std::int64_t(row) + rows, Rows());
  if (right <= left || bottom <= top) return false;
  col = std::int32_t(left);
  row = std::int32_t(top);
  columns = std::uint32_t(right - left);
  rows = std::uint32_t(bottom - top);
  return true;
}

int CPixProcess::RunRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                          std::uint32_t rows, bool wait, std::intptr_t arg1, std::intptr_t arg2) {
  if (!ClipRange(col, row, columns, rows)) return 1;
  for (std::uint32_t r = 0; r < rows; ++r) {
    for (std::uint32_t c = 0; c < columns; ++c) {
      if (RunCell(col + std::int32_t(c), row + std::int32_t(r), wait, arg1, arg2) == 0) return 0;
    }
  }
  return 1;
}

std::uint32_t CPixProcess::NextStepInRange(std::int32_t col, std::int32_t row,
                                           std::uint32_t columns, std::uint32_t rows) {
  if (!ClipRange(col, row, columns, rows)) return 0;
  for (std::uint32_t r = 0; r < rows; ++r) {
    for (std::uint32_t c = 0; c < columns; ++c) {
      const std::int32_t x = col + std::int32_t(c);
      const std::int32_t y = row + std::int32_t(r);
      if (StepsLeft(x, y) > 0) return RunCellCounted(x, y, true);
    }
  }
  return 0;
}

template <typename Sum>
std::uint64_t CPixProcess::SumRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                    std::uint32_t rows, Sum sum) const {
  if (!ClipRange(col, row, columns, rows)) return 0;
  std::uint64_t total = 0;
  for (std::uint32_t r = 0; r < rows; ++r) {
    for (std::uint32_t c = 0; c < columns; ++c) {
      total += sum(col + std::int32_t(c), row + std::int32_t(r));
    }
  }
  return total;
}

std::uint64_t CPixProcess::DoneInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                       std::uint32_t rows) const {
  return SumRange(col, row, columns, rows,
                  [this](std::int32_t x, std::int32_t y) { return Counter(x, y); });
}

std::uint64_t CPixProcess::LeftInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                       std::uint32_t rows) const {
  return SumRange(col, row, columns, rows,
                  [this](std::int32_t x, std::int32_t y) { return StepsLeft(x, y); });
}

std::uint64_t CPixProcess::TotalInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                        std::uint32_t rows) const {
  return SumRange(col, row, columns, rows,
                  [this](std::int32_t x, std::int32_t y) { return StepsOf(x, y); });
}

int CPixProcess::RunAll(bool wait, std::intptr_t arg1, std::intptr_t arg2) {
  const int answer = RunRange(0, 0, Columns(), Rows(), wait, arg1, arg2);
  if (answer != 0) AfterAll();
  return answer;
}

std::uint64_t CPixProcess::TotalSteps() const {
  std::uint64_t total = TotalInRange(0, 0, Columns(), Rows());
  for (const CPixProcess* input : inputs_) total += input->TotalSteps();
  return total;
}

std::uint64_t CPixProcess::DoneSteps() const {
  std::uint64_t done = DoneInRange(0, 0, Columns(), Rows());
  for (const CPixProcess* input : inputs_) done += input->DoneSteps();
  return done;
}

void CPixProcess::Invalidate(const CRect& area) { ClearCounts(area); }

}  // namespace Tarsa
