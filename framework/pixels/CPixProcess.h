#pragma once

#include <cstdint>
#include <vector>

#include "framework/pixels/CPixState.h"

namespace Tarsa {

// A lazily computed image stage: a grid whose cells are advanced one step
// at a time, a cell being complete when its counter reaches StepsOf(). A
// derived stage does the work of a step in Advance() and, when a cell needs
// the cells of the stages below it, runs those first from there, so that one
// call may run steps in several stages; the counts returned include them.
// An answer of 0 from Advance() is a failed step and stops every loop here;
// a user's cancel travels as CAbort. The stages below are known by address
// only, for the step totals: whoever owns the stages keeps them alive.
class CPixProcess : public CPixState {
 public:
  explicit CPixProcess(bool keepRects = false) : CPixState(keepRects) {}

  std::uint32_t StepsPerCell() const { return stepsPerCell_; }
  void SetStepsPerCell(std::uint32_t steps) { stepsPerCell_ = steps; }

  // One step of one cell, adding the steps run to stepCount; answers 0 when
  // the step failed. The base steps the counter up to StepsOf() and calls
  // StepDone(); a complete cell answers 1 and does nothing.
  virtual int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
                      std::intptr_t arg1, std::intptr_t arg2);
  // Advance() until the cell is complete; 0 when a step failed or made no
  // headway (a stage that would have to wait, called without wait).
  virtual int RunCell(std::int32_t col, std::int32_t row, bool wait, std::intptr_t arg1,
                      std::intptr_t arg2);
  // One Advance(); the steps it ran.
  virtual std::uint32_t RunCellCounted(std::int32_t col, std::int32_t row, bool wait);
  // The steps it took to complete the cell, those below included.
  virtual std::uint32_t RunCellToEnd(std::int32_t col, std::int32_t row);
  virtual std::uint32_t Counter(std::int32_t col, std::int32_t row) const;
  virtual std::uint32_t StepsLeft(std::int32_t col, std::int32_t row) const;
  // The steps that complete a cell: StepsPerCell() unless a stage knows
  // better; 0 outside the grid.
  virtual std::uint32_t StepsOf(std::int32_t col, std::int32_t row) const;
  // RunCell() over a block of cells (clipped to the grid), row by row,
  // until one answers 0; the last answer.
  virtual int RunRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                       std::uint32_t rows, bool wait, std::intptr_t arg1, std::intptr_t arg2);
  // One step in the first cell of the block, row by row, that has one left;
  // the steps it ran, 0 when no cell had work.
  virtual std::uint32_t NextStepInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                        std::uint32_t rows);
  // Sums of Counter(), StepsLeft() and StepsOf() over a block of cells.
  virtual std::uint64_t DoneInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                    std::uint32_t rows) const;
  virtual std::uint64_t LeftInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                    std::uint32_t rows) const;
  virtual std::uint64_t TotalInRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                                     std::uint32_t rows) const;
  // RunRange() over the whole grid, then AfterAll() when it completed.
  virtual int RunAll(bool wait, std::intptr_t arg1, std::intptr_t arg2);
  // The whole grid's steps plus those of the stages below.
  virtual std::uint64_t TotalSteps() const;
  virtual std::uint64_t DoneSteps() const;
  // Makes the cells under area stale. Stages that feed others pass the area
  // on to them.
  virtual void Invalidate(const CRect& area);

  // The stages this one reads from, for TotalSteps() and DoneSteps().
  void AddInput(CPixProcess& input) { inputs_.push_back(&input); }
  void ClearInputs() { inputs_.clear(); }

 protected:
  // Called by the base Advance() after it stepped a cell.
  virtual void StepDone(std::int32_t /*col*/, std::int32_t /*row*/) {}
  // Called by RunAll() once the grid is complete.
  virtual void AfterAll() {}

 private:
  // The block clipped to the grid; false when nothing is left.
  bool ClipRange(std::int32_t& col, std::int32_t& row, std::uint32_t& columns,
                 std::uint32_t& rows) const;
  template <typename Sum>
  std::uint64_t SumRange(std::int32_t col, std::int32_t row, std::uint32_t columns,
                         std::uint32_t rows, Sum sum) const;

  std::uint32_t stepsPerCell_ = 0;
  std::vector<CPixProcess*> inputs_;
};

}  // namespace Tarsa
