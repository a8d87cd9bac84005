#include "filter/PPreview.h"

#include <algorithm>

#include "filter/PImageHub.h"
#include "filter/PPreviewTarget.h"
#include "filter/PRenderContext.h"
#include "filter/PResult.h"
#include "filter/PSource.h"
#include "filter/PSourceScaled.h"
#include "framework/pixels/CBasicPixmap.h"
#include "framework/pixels/CMemoryPixmap.h"
#include "framework/plugin/CQuillmarkFilter.h"
#include "params/PSettings.h"

namespace Project {

namespace {

constexpr std::int32_t kTile = 128;

}  // namespace

PPreview::PPreview(PImageHub& hub, PRenderContext& run) : hub_(hub), run_(run) {}

void PPreview::SetRects(const Tarsa::CRect& view, const Tarsa::CRect& content) {
  if (view == viewRect_ && content == contentRect_) return;
  viewRect_ = view;
  contentRect_ = content;
  tiles_.clear();
  if (view.IsEmpty()) {
    Clear();
    return;
  }
  scaled_ = view.Width() != content.Width() || view.Height() != content.Height();
  Layout(view, TileRect({view.left, view.top}, 0, 0));
  SetStepsPerCell(1);
  tiles_.resize(std::size_t(Columns()) * Rows());
}

const std::uint8_t* PPreview::TilePixels(std::int32_t col, std::int32_t row) const {
  if (col < 0 || row < 0 || col >= std::int32_t(Columns()) || row >= std::int32_t(Rows()))
    return nullptr;
  const std::vector<std::uint8_t>& tile = tiles_[std::size_t(row) * Columns() + col];
  return tile.empty() ? nullptr : tile.data();
}

int PPreview::Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
                      std::intptr_t /*arg1*/, std::intptr_t /*arg2*/) {
  if (Counter(col, row) >= StepsOf(col, row)) return 1;
  const Tarsa::CRect area =
      TileRect({viewRect_.left, viewRect_.top}, col, row).Intersect(viewRect_);
  if (area.IsEmpty()) {
    SetCount(col, row, StepsOf(col, row));
    ++stepCount;
    return 1;
  }
  // At the image's size the display's coordinates are the image's, moved.
  const Tarsa::CPoint shift =
      scaled_ ? Tarsa::CPoint{0, 0}
              : Tarsa::CPoint{contentRect_.left - viewRect_.left, contentRect_.top - viewRect_.top};
  const Tarsa::CRect stageArea = area.Offset(shift.x, shift.y);
  const bool result = run_.RenderSettings().previewResult != 0;
  Tarsa::CPixProcess* stage = nullptr;
  const Tarsa::CPixmap* pixels = nullptr;
  if (result) {
    PResult& from = scaled_ ? hub_.ResultDirect() : hub_.ResultFull();
    stage = &from;
    if (!BringUpToDate(*stage, stageArea, wait, stepCount)) return 1;
    pixels = from.Pixels();
  } else if (scaled_) {
    PSourceScaled& from = hub_.SourceScaled();
    stage = &from;
    if (!BringUpToDate(*stage, stageArea, wait, stepCount)) return 1;
    pixels = from.Pixels();
  } else {
    PSource& from = hub_.Source();
    stage = &from;
    if (!BringUpToDate(*stage, stageArea, wait, stepCount)) return 1;
    pixels = from.Pixels();
  }
  std::vector<std::uint8_t>& tile = tiles_[std::size_t(row) * Columns() + col];
  tile.assign(std::size_t(kTile) * kTile * 4, 0);
  const Tarsa::CRect cell = TileRect({viewRect_.left, viewRect_.top}, col, row);
  DisplayInto(
      *pixels, stageArea,
      tile.data() +
          (std::size_t(area.top - cell.top) * kTile + std::size_t(area.left - cell.left)) * 4,
      kTile);
  SetCount(col, row, StepsOf(col, row));
  ++stepCount;
  if (target_ != nullptr) target_->PreviewChanged(area);
  return 1;
}

void PPreview::ToDisplay(const Tarsa::CPixmap& pixels, const Tarsa::CRect& area,
                         std::uint8_t* rgba) {
  const auto width = std::uint32_t(area.Width());
  const auto height = std::uint32_t(area.Height());
  const std::uint32_t planes = pixels.Planes();
  const std::uint32_t colorPlanes = planes - 1;  // the last plane is the transparency
  const std::size_t count = std::size_t(width) * height;
  // 8-bit planar samples of the colour planes, as the host's conversion
  // takes them; 16-bit samples (0 to 32768) are rounded down to 8 bits.
  samples_.resize(count * colorPlanes);
  std::vector<std::uint8_t> alpha(count);
  std::vector<std::uint32_t> row(width);
  for (std::uint32_t p = 0; p < planes; ++p) {
    std::uint8_t* plane = p < colorPlanes ? samples_.data() + count * p : alpha.data();
    for (std::uint32_t y = 0; y < height; ++y) {
      for (std::uint32_t x = 0; x < width; ++x) {
        const std::uint32_t s =
            pixels.Sample(p, area.left + std::int32_t(x), area.top + std::int32_t(y));
        plane[std::size_t(y) * width + x] =
            pixels.Depth() == 16
                ? std::uint8_t(std::min<std::uint32_t>(255, (s * 255 + 16384) >> 15))
                : std::uint8_t(s);
      }
    }
  }
  // The host turns the document's colours into the display's, straight
  // into the RGBA rows; the transparency goes in beside them.
  std::vector<std::uint8_t*> planeOrigins;
  for (std::uint32_t p = 0; p < colorPlanes; ++p)
    planeOrigins.push_back(samples_.data() + count * p);
  const Tarsa::CRect bounds{0, 0, std::int32_t(width), std::int32_t(height)};
  const Tarsa::CBasicPixmap source(bounds, 8, std::move(planeOrigins), width, 1);
  Tarsa::CBasicPixmap destination(bounds, 8, {rgba, rgba + 1, rgba + 2, rgba + 3},
                                  std::size_t(width) * 4, 4);
  const Tarsa::HostFilterRecord* record = run_.RenderHost().FilterRecord();
  run_.RenderHost().ConvertToDisplay(record != nullptr ? record->imageMode : 0, source, bounds,
                                     destination, {0, 0});
  for (std::size_t i = 0; i < count; ++i) rgba[i * 4 + 3] = alpha[i];
}

void PPreview::ReadDetail(const Tarsa::CRect& area, bool source, std::vector<std::uint8_t>& rgba) {
  const Tarsa::CRect wanted = area.Intersect(contentRect_);
  rgba.assign(std::size_t(area.Width()) * area.Height() * 4, 0);
  if (wanted.IsEmpty()) return;
  std::uint32_t steps = 0;
  const Tarsa::CPixmap* pixels = nullptr;
  if (!source && run_.RenderSettings().previewResult != 0) {
    PResult& from = hub_.ResultFull();
    BringUpToDate(from, wanted, true, steps);
    pixels = from.Pixels();
  } else {
    PSource& from = hub_.Source();
    BringUpToDate(from, wanted, true, steps);
    pixels = from.Pixels();
  }
  DisplayInto(*pixels, wanted,
              rgba.data() + (std::size_t(wanted.top - area.top) * area.Width() +
                             std::size_t(wanted.left - area.left)) *
                                4,
              std::size_t(area.Width()));
}

void PPreview::DisplayInto(const Tarsa::CPixmap& pixels, const Tarsa::CRect& area,
                           std::uint8_t* rgba, std::size_t rowPixels) {
  Tarsa::CMemoryPixmap copy(area, pixels.Planes(), pixels.Depth());
  copy.CopyFrom(pixels, area);
  std::vector<std::uint8_t> part(std::size_t(area.Width()) * area.Height() * 4);
  ToDisplay(copy, area, part.data());
  const std::size_t rowBytes = std::size_t(area.Width()) * 4;
  for (std::int32_t y = 0; y < std::int32_t(area.Height()); ++y)
    std::copy_n(part.data() + std::size_t(y) * rowBytes, rowBytes, rgba + y * rowPixels * 4);
}

void PPreview::Invalidate(const Tarsa::CRect& area) {
  const Tarsa::CRect stale = area.Intersect(viewRect_);
  if (stale.IsEmpty()) return;
  ClearCounts(stale);
  hub_.RequestRecount();
}

void PPreview::InvalidateAll() { Invalidate(viewRect_); }

}  // namespace Project
