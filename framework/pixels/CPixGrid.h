#pragma once

#include <cstdint>

#include "framework/core/CRect.h"

namespace Tarsa {

// A rectangle cut into cells on a lattice. The lattice comes from a sample
// cell that need not lie inside the rectangle, so that grids of different
// rectangles over the same image share their cell lines; the first and last
// cell of a row or column may therefore be partial. Holds numbers only.
// Columns and rows are indexed from 0; an index outside the grid is a cell
// that does not exist, and the queries say so by their result.
class CPixGrid {
 public:
  CPixGrid() = default;
  virtual ~CPixGrid() = default;
  CPixGrid(const CPixGrid&) = delete;
  CPixGrid& operator=(const CPixGrid&) = delete;

  // Covers bounds with cells of firstCell's size (at least 1 x 1) on the
  // lattice through firstCell's top left corner.
  virtual void Layout(const CRect& bounds, const CRect& firstCell);
  // No rectangle, no cells.
  virtual void Clear();

  // The cell's rectangle; false, with out untouched, for a cell outside.
  bool CellRect(std::int32_t col, std::int32_t row, CRect& out) const;
  // The cell holding the pixel (x, y); false, with -1, -1, outside.
  bool CellAt(std::int32_t x, std::int32_t y, std::int32_t& outCol, std::int32_t& outRow) const;
  // The block of cells that rect touches; false, with -1, -1 and 0, 0, when
  // it touches none.
  bool CellSpan(const CRect& rect, std::int32_t& outCol, std::int32_t& outRow,
                std::uint32_t& outColumns, std::uint32_t& outRows) const;

  CRect Bounds() const;
  std::int32_t Left() const { return left_; }
  std::int32_t Top() const { return top_; }
  std::uint32_t Width() const { return width_; }
  std::uint32_t Height() const { return height_; }
  std::uint32_t Columns() const { return columns_; }
  std::uint32_t Rows() const { return rows_; }
  std::uint32_t CellCount() const { return columns_ * rows_; }
  std::uint32_t CellWidth() const { return cellWidth_; }
  std::uint32_t CellHeight() const { return cellHeight_; }
  std::uint32_t FirstWidth() const { return firstWidth_; }
  std::uint32_t FirstHeight() const { return firstHeight_; }
  std::uint32_t LastWidth() const { return lastWidth_; }
  std::uint32_t LastHeight() const { return lastHeight_; }
  bool HasCell(std::int32_t col, std::int32_t row) const {
    return col >= 0 && row >= 0 && std::uint32_t(col) < columns_ && std::uint32_t(row) < rows_;
  }

 private:
  std::int32_t left_ = 0;
  std::int32_t top_ = 0;
  std::uint32_t width_ = 0;
  std::uint32_t height_ = 0;
  std::uint32_t columns_ = 0;
  std::uint32_t rows_ = 0;
  std::uint32_t cellWidth_ = 1;
  std::uint32_t cellHeight_ = 1;
  std::uint32_t firstWidth_ = 0;
  std::uint32_t firstHeight_ = 0;
  std::uint32_t lastWidth_ = 0;
  std::uint32_t lastHeight_ = 0;
};

}  // namespace Tarsa
