#pragma once

#include <cstdint>
#include <memory>

#include "framework/core/CRect.h"
#include "framework/pixels/CPixProcess.h"
#include "framework/pixels/CVirtualPixmap.h"

namespace Tarsa {
class CQuillmarkFilter;
}

namespace Project {

class PImageHub;

// The front of the pipeline: the host's pixels of the layer, pulled tile by
// tile into a virtual pixmap only when a stage above asks for them. Planes
// are the colour planes and a transparency plane (opaque where the host has
// none). One step per 128 x 128 tile.
class PSource : public Tarsa::CPixProcess {
 public:
  PSource(PImageHub& hub, Tarsa::CQuillmarkFilter& host);

  // A new rectangle makes or resizes the pixels and lays out the tiles from
  // its origin; an empty one clears the stage; the same one does nothing.
  void SetRect(const Tarsa::CRect& rect);
  const Tarsa::CRect& Rect() const { return rect_; }
  std::uint32_t Planes() const { return planes_; }
  std::uint32_t PixelDepth() const { return depth_; }
  bool HasAlpha() const { return hasAlpha_; }
  // Null until a rectangle is set.
  Tarsa::CVirtualPixmap* Pixels() { return pixels_.get(); }

  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t arg1, std::intptr_t arg2) override;
  // Stale tiles are read again; the stages above hear of it through the hub.
  void Invalidate(const Tarsa::CRect& area) override;

 private:
  PImageHub& hub_;
  Tarsa::CQuillmarkFilter& host_;
  std::unique_ptr<Tarsa::CVirtualPixmap> pixels_;
  Tarsa::CRect rect_;
  std::uint32_t colorPlanes_;
  std::uint32_t depth_;
  bool hasAlpha_;
  std::uint32_t planes_;
};

// Brings a stage up to date over area (in its coordinates), adding the steps
// run to stepCount. Without wait nothing runs when work is left, and the
// answer is false.
bool BringUpToDate(Tarsa::CPixProcess& stage, const Tarsa::CRect& area, bool wait,
                   std::uint32_t& stepCount);

// Makes pixels a stage's pixmap over rect: a virtual pixmap of 128 x 128
// tiles with a pixel's margin, of the kind for depth, or resizes the one
// there when rect's size differs (contents then go); its origin is rect's.
void PlaceStagePixels(std::unique_ptr<Tarsa::CVirtualPixmap>& pixels, const Tarsa::CRect& rect,
                      std::uint32_t depth, std::uint32_t planes);

// The 128 x 128 tile (col, row) of a lattice through origin, unclipped.
Tarsa::CRect TileRect(Tarsa::CPoint origin, std::int32_t col, std::int32_t row);

}  // namespace Project
