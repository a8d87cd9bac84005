#include "filter/PScaledStage.h"

#include <cmath>

#include "filter/PSource.h"

namespace Project {

namespace {

constexpr std::int32_t kTile = 128;
constexpr std::uint32_t kMostSubBlocks = 64;

// Sub-blocks per tile along an axis: enough that each reads about a tile's
// worth of the input.
std::uint32_t SubBlocks(std::int32_t mode, std::int64_t originExtent, std::int64_t targetExtent) {
  std::uint32_t steps = 1;
  if (mode != Tarsa::CPixScaler::kShrink || targetExtent <= 0) return steps;
  const double ratio = double(originExtent) / double(targetExtent);
  while (ratio > double(steps) && steps < kMostSubBlocks) steps *= 2;
  return steps;
}

// One axis of a mapping between the spaces.
double MapCoordinate(std::int32_t c, std::int32_t fromOrigin, std::int64_t fromExtent,
                     std::int32_t toOrigin, std::int64_t toExtent) {
  const double ratio = fromExtent == 0 ? 1.0 : double(toExtent) / double(fromExtent);
  return double(std::int64_t(c) - fromOrigin) * ratio + toOrigin;
}

Tarsa::CRect MapRect(const Tarsa::CRect& area, const Tarsa::CRect& from, const Tarsa::CRect& to) {
  auto low = [](double v) { return Tarsa::CRect::Saturate(std::int64_t(std::floor(v))); };
  auto high = [](double v) { return Tarsa::CRect::Saturate(std::int64_t(std::ceil(v))); };
  return Tarsa::CRect{
      low(MapCoordinate(area.left, from.left, from.Width(), to.left, to.Width())),
      low(MapCoordinate(area.top, from.top, from.Height(), to.top, to.Height())),
      high(MapCoordinate(area.right, from.left, from.Width(), to.left, to.Width())),
      high(MapCoordinate(area.bottom, from.top, from.Height(), to.top, to.Height()))};
}

}  // namespace

PScaledStage::PScaledStage(std::uint32_t planes, std::uint32_t depth)
    : planes_(planes), depth_(depth) {}

void PScaledStage::SetRects(const Tarsa::CRect& target, const Tarsa::CRect& origin) {
  if (target.IsEmpty() || origin.IsEmpty()) {
    CPixScaler::SetRects({}, {});
    pixels_.reset();
    return;
  }
  if (!CPixScaler::SetRects(target, origin) && pixels_ != nullptr) return;
  PlaceStagePixels(pixels_, target, depth_, planes_);
  Layout(target, TileRect({target.left, target.top}, 0, 0));
  stepsX_ = SubBlocks(ModeX(), origin.Width(), target.Width());
  stepsY_ = SubBlocks(ModeY(), origin.Height(), target.Height());
  SetStepsPerCell(stepsX_ * stepsY_);
}

int PScaledStage::Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
                          std::intptr_t /*arg1*/, std::intptr_t /*arg2*/) {
  const std::uint32_t state = Counter(col, row);
  if (state >= StepsOf(col, row)) return 1;
  const Tarsa::CRect tile = TileRect({Destination().left, Destination().top}, col, row);
  const std::int32_t blockWidth = kTile / std::int32_t(stepsX_);
  const std::int32_t blockHeight = kTile / std::int32_t(stepsY_);
  const std::int32_t left = tile.left + std::int32_t(state % stepsX_) * blockWidth;
  const std::int32_t top = tile.top + std::int32_t(state / stepsX_) * blockHeight;
  const Tarsa::CRect block =
      Tarsa::CRect{left, top, left + blockWidth, top + blockHeight}.Intersect(Destination());
  Tarsa::CRect needed;
  if (!block.IsEmpty() && SourceRectFor(block, needed)) {
    if (!BringUpToDate(Input(), needed, wait, stepCount)) return 1;
    const Tarsa::CPixmap* input = InputPixels();
    if (input != nullptr) Scale(*input, *pixels_, block);
  }
  SetCount(col, row, state + 1);
  ++stepCount;
  return 1;
}

void PScaledStage::InputChanged(const Tarsa::CRect& inputArea) {
  if (pixels_ == nullptr || inputArea.IsEmpty()) return;
  using Tarsa::CRect;
  const CRect widened{CRect::Saturate(std::int64_t(inputArea.left) - 1),
                      CRect::Saturate(std::int64_t(inputArea.top) - 1),
                      CRect::Saturate(std::int64_t(inputArea.right) + 1),
                      CRect::Saturate(std::int64_t(inputArea.bottom) + 1)};
  const Tarsa::CRect stale = ToTarget(widened).Intersect(Destination());
  if (!stale.IsEmpty()) ClearCounts(stale);
}

Tarsa::CRect PScaledStage::ToTarget(const Tarsa::CRect& area) const {
  return MapRect(area, Source(), Destination());
}

Tarsa::CRect PScaledStage::ToOrigin(const Tarsa::CRect& area) const {
  return MapRect(area, Destination(), Source());
}

}  // namespace Project
