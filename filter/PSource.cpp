#include "filter/PSource.h"

#include "filter/PImageHub.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/plugin/CQuillmarkFilter.h"

namespace Project {

namespace {

constexpr std::int32_t kTile = 128;
// Tiles of 128 x 128 pixels at every depth, the stages' own tile size.
constexpr std::int32_t kTileClass = -2;

}  // namespace

Tarsa::CRect TileRect(Tarsa::CPoint origin, std::int32_t col, std::int32_t row) {
  const std::int64_t left = std::int64_t(origin.x) + std::int64_t(col) * kTile;
  const std::int64_t top = std::int64_t(origin.y) + std::int64_t(row) * kTile;
  return Tarsa::CRect{Tarsa::CRect::Saturate(left), Tarsa::CRect::Saturate(top),
                      Tarsa::CRect::Saturate(left + kTile), Tarsa::CRect::Saturate(top + kTile)};
}

void PlaceStagePixels(std::unique_ptr<Tarsa::CVirtualPixmap>& pixels, const Tarsa::CRect& rect,
                      std::uint32_t depth, std::uint32_t planes) {
  const auto width = std::int32_t(rect.Width());
  const auto height = std::int32_t(rect.Height());
  if (pixels == nullptr) {
    pixels = std::make_unique<Tarsa::CVirtualPixmap>(depth == 16 ? 4 : 3, width, height, planes,
                                                     kTileClass, Tarsa::CPoint{1, 1});
  } else if (pixels->Width() != std::uint32_t(width) || pixels->Height() != std::uint32_t(height)) {
    pixels->Resize(width, height);
  }
  pixels->SetOrigin({rect.left, rect.top});
}

bool BringUpToDate(Tarsa::CPixProcess& stage, const Tarsa::CRect& area, bool wait,
                   std::uint32_t& stepCount) {
  std::int32_t col = 0, row = 0;
  std::uint32_t columns = 0, rows = 0;
  if (!stage.CellSpan(area, col, row, columns, rows)) return true;
  if (!wait) return stage.LeftInRange(col, row, columns, rows) == 0;
  for (std::uint32_t r = 0; r < rows; ++r) {
    for (std::uint32_t c = 0; c < columns; ++c)
      stepCount += stage.RunCellToEnd(col + std::int32_t(c), row + std::int32_t(r));
  }
  return true;
}

PSource::PSource(PImageHub& hub, Tarsa::CQuillmarkFilter& host)
    : hub_(hub),
      host_(host),
      colorPlanes_(host.ColorPlanes()),
      depth_(host.Depth()),
      hasAlpha_(host.HasTransparency()),
      planes_(colorPlanes_ + 1) {}

void PSource::SetRect(const Tarsa::CRect& rect) {
  if (rect == rect_ && pixels_ != nullptr) return;
  if (rect.IsEmpty()) {
    pixels_.reset();
    rect_ = {};
    Clear();
    return;
  }
  PlaceStagePixels(pixels_, rect, depth_, planes_);
  rect_ = rect;
  Layout(rect, TileRect({rect.left, rect.top}, 0, 0));
  SetStepsPerCell(1);
}

int PSource::Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool /*wait*/,
                     std::intptr_t /*arg1*/, std::intptr_t /*arg2*/) {
  if (Counter(col, row) >= StepsOf(col, row)) return 1;
  const Tarsa::CRect area = TileRect({rect_.left, rect_.top}, col, row).Intersect(rect_);
  if (!area.IsEmpty()) {
    Tarsa::CMemoryPixmap tile(area, planes_, depth_);
    host_.ReadPixmap(tile, Tarsa::CQuillmarkFilter::kReadTarget,
                     Tarsa::CQuillmarkFilter::kReadNothing, 0);
    pixels_->CopyFrom(tile, area);
  }
  SetCount(col, row, StepsOf(col, row));
  ++stepCount;
  return 1;
}

void PSource::Invalidate(const Tarsa::CRect& area) {
  const Tarsa::CRect stale = area.Intersect(rect_);
  if (stale.IsEmpty()) return;
  ClearCounts(stale);
  hub_.SourceChanged(stale);
}

}  // namespace Project
