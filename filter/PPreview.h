#pragma once

#include <cstdint>
#include <vector>

#include "framework/core/CRect.h"
#include "framework/pixels/CPixProcess.h"

namespace Tarsa {
class CPixmap;
class CVirtualPixmap;
}  // namespace Tarsa

namespace Project {

class PImageHub;
class PPreviewTarget;
class PRenderContext;

// What the preview pane shows: the picture at the display's scale as 8-bit
// RGBA with straight alpha, in 128 x 128 tiles made on demand. A tile is
// the result (or, with Preview off, the source) over its area, reduced to 8
// bits and turned into display colours by the host. When the display is
// smaller than the image the stages below are the reduced source and the
// result drawn straight from it at the display's size; at the image's size
// they are the full source and the full result. The hub owns this stage
// and the stages it reads; the tiles' pixels are its own.
class PPreview : public Tarsa::CPixProcess {
 public:
  PPreview(PImageHub& hub, PRenderContext& run);

  // view: the display picture's rectangle; content: the image's. An empty
  // view clears the stage.
  void SetRects(const Tarsa::CRect& view, const Tarsa::CRect& content);
  const Tarsa::CRect& ViewRect() const { return viewRect_; }
  bool Scaled() const { return scaled_; }
  void SetTarget(PPreviewTarget* target) { target_ = target; }

  // The RGBA rows of a complete tile (128 pixels a row), or null.
  const std::uint8_t* TilePixels(std::int32_t col, std::int32_t row) const;

  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t arg1, std::intptr_t arg2) override;
  // Tiles over area (view coordinates) are made again; the old pixels stay
  // shown until then.
  void Invalidate(const Tarsa::CRect& area) override;
  // Everything is made again: a new mesh, or Preview switched.
  void InvalidateAll();

  // The picture at full size over area (image coordinates, inside the
  // image) as RGBA rows of area's width: the result with Preview on, else
  // (or with source set) the photograph. For the loupes, which show 100 %.
  void ReadDetail(const Tarsa::CRect& area, bool source, std::vector<std::uint8_t>& rgba);

 private:
  // Area of the stage's pixels in display colours into RGBA rows of
  // rowPixels pixels, from rgba.
  void DisplayInto(const Tarsa::CPixmap& pixels, const Tarsa::CRect& area, std::uint8_t* rgba,
                   std::size_t rowPixels);
  // Turns the colour planes and the transparency of area into RGBA.
  void ToDisplay(const Tarsa::CPixmap& pixels, const Tarsa::CRect& area, std::uint8_t* rgba);

  PImageHub& hub_;
  PRenderContext& run_;
  PPreviewTarget* target_ = nullptr;
  Tarsa::CRect viewRect_;
  Tarsa::CRect contentRect_;
  bool scaled_ = false;
  std::vector<std::vector<std::uint8_t>> tiles_;
  std::vector<std::uint8_t> samples_;
};

}  // namespace Project
