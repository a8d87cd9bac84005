#pragma once

#include <cstdint>
#include <vector>

#include "framework/pixels/CPixGrid.h"

namespace Tarsa {

// A grid with one counter per cell, row after row, that says how far the
// cell has come; laying the grid out again zeroes them all. With keepRects
// the cells' rectangles are computed once per layout and kept beside the
// counters, for stages that ask for them on every step. Owns both arrays.
class CPixState : public CPixGrid {
 public:
  explicit CPixState(bool keepRects = false) : keepRects_(keepRects) {}

  void Layout(const CRect& bounds, const CRect& firstCell) override;
  void Clear() override;

  bool KeepsRects() const { return keepRects_; }

  // The counter of a cell; 0 for a cell outside the grid.
  std::uint32_t Count(std::int32_t col, std::int32_t row) const;
  // Outside the grid these do nothing.
  void SetCount(std::int32_t col, std::int32_t row, std::uint32_t value);
  void RaiseCount(std::int32_t col, std::int32_t row);
  // Zeroes the counters of the cells that area touches.
  void ClearCounts(const CRect& area);
  void ClearAllCounts();

  // The cell's rectangle, from the kept ones when there are; an empty
  // rectangle for a cell outside the grid.
  CRect RectOf(std::int32_t col, std::int32_t row) const;

 private:
  std::size_t IndexOf(std::int32_t col, std::int32_t row) const {
    return std::size_t(row) * Columns() + std::size_t(col);
  }

  std::vector<std::uint32_t> counters_;
  std::vector<CRect> cellRects_;
  bool keepRects_;
};

}  // namespace Tarsa
