#include "framework/pixels/CPixState.h"

#include <algorithm>

namespace Tarsa {

void CPixState::Layout(const CRect& bounds, const CRect& firstCell) {
  CPixGrid::Layout(bounds, firstCell);
  counters_.assign(CellCount(), 0);
  cellRects_.clear();
  if (!keepRects_) return;
  cellRects_.resize(CellCount());
  for (std::uint32_t row = 0; row < Rows(); ++row) {
    for (std::uint32_t col = 0; col < Columns(); ++col) {
      CellRect(std::int32_t(col), std::int32_t(row),
               cellRects_[IndexOf(std::int32_t(col), std::int32_t(row))]);
    }
  }
}

void CPixState::Clear() {
  CPixGrid::Clear();
  counters_.clear();
  cellRects_.clear();
}

std::uint32_t CPixState::Count(std::int32_t col, std::int32_t row) const {
  return HasCell(col, row) ? counters_[IndexOf(col, row)] : 0;
}

void CPixState::SetCount(std::int32_t col, std::int32_t row, std::uint32_t value) {
  if (HasCell(col, row)) counters_[IndexOf(col, row)] = value;
}

void CPixState::RaiseCount(std::int32_t col, std::int32_t row) {
  if (HasCell(col, row)) ++counters_[IndexOf(col, row)];
}

void CPixState::ClearCounts(const CRect& area) {
  std::int32_t col = 0;
  std::int32_t row = 0;
  std::uint32_t columns = 0;
  std::uint32_t rows = 0;
  if (!CellSpan(area, col, row, columns, rows)) return;
  for (std::uint32_t r = 0; r < rows; ++r) {
    const auto begin = counters_.begin() + std::ptrdiff_t(IndexOf(col, row + std::int32_t(r)));
    std::fill(begin, begin + std::ptrdiff_t(columns), 0u);
  }
}

void CPixState::ClearAllCounts() { std::fill(counters_.begin(), counters_.end(), 0u); }

CRect CPixState::RectOf(std::int32_t col, std::int32_t row) const {
  if (!HasCell(col, row)) return CRect{};
  if (keepRects_) return cellRects_[IndexOf(col, row)];
  CRect rect;
  CellRect(col, row, rect);
  return rect;
}

}  // namespace Tarsa
