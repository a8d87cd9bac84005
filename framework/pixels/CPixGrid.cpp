#include "framework/pixels/CPixGrid.h"

#include <algorithm>

namespace Tarsa {

namespace {

struct Axis {
  std::uint32_t count = 0;
  std::uint32_t first = 0;
  std::uint32_t last = 0;
};

// One axis of the layout: the lattice runs through `lattice` with step
// `cell`; the covered span starts at `start` and has `length` pixels.
Axis LayOutAxis(std::int64_t start, std::uint32_t length, std::int64_t lattice,
                std::uint32_t cell) {
  Axis axis;
  if (length == 0) return axis;
  // The distance to the next lattice line, 1 to cell: a span that starts on
  // a line has a whole first cell, never an empty one.
  std::int64_t d = (lattice - start) % cell;
  if (d < 1) d += cell;
  if (length <= d) {
    axis.count = 1;
    axis.first = length;
    return axis;
  }
  axis.first = std::uint32_t(d);
  const std::uint64_t rest = length - std::uint64_t(d);
  const std::uint64_t q = rest / cell;
  const std::uint64_t r = rest % cell;
  axis.count = std::uint32_t(r < 1 ? q + 1 : q + 2);
  axis.last = r < 1 ? cell : std::uint32_t(r);
  return axis;
}

// Start and size of cell `index` of an axis laid out as above.
void CellOnAxis(std::int32_t origin, std::uint32_t count, std::uint32_t cell, std::uint32_t first,
                std::uint32_t last, std::uint32_t index, std::int64_t& start, std::uint32_t& size) {
  if (index == 0) {
    start = origin;
    size = first;
    return;
  }
  start = std::int64_t(origin) + first + std::int64_t(index - 1) * cell;
  size = index == count - 1 ? last : cell;
}

// The cell of an axis that holds offset `at` (0 <= at < length).
std::uint32_t IndexOnAxis(std::uint64_t at, std::uint32_t cell, std::uint32_t first) {
  return at < first ? 0 : std::uint32_t(1 + (at - first) / cell);
}

}  // namespace

void CPixGrid::Layout(const CRect& bounds, const CRect& firstCell) {
  left_ = bounds.left;
  top_ = bounds.top;
  width_ = std::uint32_t(std::clamp<std::int64_t>(bounds.Width(), 0, UINT32_MAX));
  height_ = std::uint32_t(std::clamp<std::int64_t>(bounds.Height(), 0, UINT32_MAX));
  cellWidth_ = std::uint32_t(std::clamp<std::int64_t>(firstCell.Width(), 1, UINT32_MAX));
  cellHeight_ = std::uint32_t(std::clamp<std::int64_t>(firstCell.Height(), 1, UINT32_MAX));
  const Axis x = LayOutAxis(left_, width_, firstCell.left, cellWidth_);
  const Axis y = LayOutAxis(top_, height_, firstCell.top, cellHeight_);
  // A grid without one of its dimensions has no cells at all.
  columns_ = y.count == 0 ? 0 : x.count;
  rows_ = x.count == 0 ? 0 : y.count;
  firstWidth_ = x.first;
  lastWidth_ = x.last;
  firstHeight_ = y.first;
  lastHeight_ = y.last;
}

void CPixGrid::Clear() {
  left_ = top_ = 0;
  width_ = height_ = 0;
  columns_ = rows_ = 0;
  cellWidth_ = cellHeight_ = 1;
  firstWidth_ = firstHeight_ = lastWidth_ = lastHeight_ = 0;
}

CRect CPixGrid::Bounds() const {
  return CRect{left_, top_, CRect::Saturate(std::int64_t(left_) + width_),
               CRect::Saturate(std::int64_t(top_) + height_)};
}

bool CPixGrid::CellRect(std::int32_t col, std::int32_t row, CRect& out) const {
  if (!HasCell(col, row)) return false;
  std::int64_t x = 0;
  std::int64_t y = 0;
  std::uint32_t w = 0;
  std::uint32_t h = 0;
  CellOnAxis(left_, columns_, cellWidth_, firstWidth_, lastWidth_, std::uint32_t(col), x, w);
  CellOnAxis(top_, rows_, cellHeight_, firstHeight_, lastHeight_, std::uint32_t(row), y, h);
  out =
      CRect{CRect::Saturate(x), CRect::Saturate(y), CRect::Saturate(x + w), CRect::Saturate(y + h)};
  return true;
}

bool CPixGrid::CellAt(std::int32_t x, std::int32_t y, std::int32_t& outCol,
                      std::int32_t& outRow) const {
  outCol = -1;
  outRow = -1;
  const std::int64_t dx = std::int64_t(x) - left_;
  const std::int64_t dy = std::int64_t(y) - top_;
  if (columns_ == 0 || dx < 0 || dy < 0 || dx >= width_ || dy >= height_) return false;
  outCol = std::int32_t(IndexOnAxis(std::uint64_t(dx), cellWidth_, firstWidth_));
  outRow = std::int32_t(IndexOnAxis(std::uint64_t(dy), cellHeight_, firstHeight_));
  return true;
}

bool CPixGrid::CellSpan(const CRect& rect, std::int32_t& outCol, std::int32_t& outRow,
                        std::uint32_t& outColumns, std::uint32_t& outRows) const {
  outCol = outRow = -1;
  outColumns = outRows = 0;
  const CRect area = rect.Intersect(Bounds());
  if (columns_ == 0 || area.IsEmpty()) return false;
  std::int32_t lastCol = 0;
  std::int32_t lastRow = 0;
  CellAt(area.left, area.top, outCol, outRow);
  CellAt(area.right - 1, area.bottom - 1, lastCol, lastRow);
  outColumns = std::uint32_t(lastCol - outCol + 1);
  outRows = std::uint32_t(lastRow - outRow + 1);
  return true;
}

}  // namespace Tarsa
