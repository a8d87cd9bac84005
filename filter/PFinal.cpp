#include "filter/PFinal.h"

#include "filter/PResult.h"
#include "filter/PSource.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/plugin/CQuillmarkFilter.h"

namespace Project {

PFinal::PFinal(PResult& result, Tarsa::CQuillmarkFilter& host)
    : result_(result),
      host_(host),
      colorPlanes_(std::int32_t(host.ColorPlanes())),
      hasTransparency_(host.HasTransparency() ? 1 : 0),
      planesToWrite_(colorPlanes_ + std::int32_t(hasTransparency_)) {
  AddInput(result);
}

void PFinal::SetRect(const Tarsa::CRect& rect) {
  rect_ = rect;
  if (rect.IsEmpty()) {
    Clear();
    return;
  }
  Layout(rect, TileRect({rect.left, rect.top}, 0, 0));
  SetStepsPerCell(1);
}

int PFinal::Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
                    std::intptr_t /*arg1*/, std::intptr_t /*arg2*/) {
  if (Counter(col, row) >= StepsOf(col, row)) return 1;
  const Tarsa::CRect tile = TileRect({rect_.left, rect_.top}, col, row);
  if (!BringUpToDate(result_, tile, wait, stepCount)) return 1;
  const Tarsa::CRect area = tile.Intersect(rect_);
  if (!area.IsEmpty()) {
    // Every sample is copied in before it goes out.
    Tarsa::CMemoryPixmap pixmap(area, std::uint32_t(planesToWrite_), host_.Depth(),
                                Tarsa::CMemoryPixmap::Contents::kUnset);
    pixmap.CopyFrom(*result_.Pixels(), area);
    host_.WritePixmap(pixmap, area, planesToWrite_);
  }
  SetCount(col, row, StepsOf(col, row));
  ++stepCount;
  return 1;
}

}  // namespace Project
