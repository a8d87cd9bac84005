#pragma once

#include <cstdint>
#include <memory>

#include "framework/core/CRect.h"
#include "framework/pixels/CPixScaler.h"
#include "framework/pixels/CVirtualPixmap.h"

namespace Project {

// A reduced copy of a full-size stage for a display area smaller than the
// image: the target is the display's rectangle, the origin the area of the
// input it shows. Each 128 x 128 tile is filled in sub-blocks, more of them
// the more the picture shrinks, so that one step asks the input for a
// bounded area. A step maps its sub-block onto the input with the scaler's
// own tables, brings the input up to date there and lets the scaler reduce
// it. The stage owns its pixels; the input belongs to the image hub.
class PScaledStage : public Tarsa::CPixScaler {
 public:
  PScaledStage(std::uint32_t planes, std::uint32_t depth);
  PScaledStage(const PScaledStage&) = delete;
  PScaledStage& operator=(const PScaledStage&) = delete;

  // New rectangles make or resize the pixels and lay the tiles out from the
  // target's origin; an empty one clears the stage; the same ones do
  // nothing.
  void SetRects(const Tarsa::CRect& target, const Tarsa::CRect& origin);
  std::uint32_t StepsX() const { return stepsX_; }
  std::uint32_t StepsY() const { return stepsY_; }
  // Null until the rectangles are set.
  Tarsa::CVirtualPixmap* Pixels() { return pixels_.get(); }

  int Advance(std::int32_t col, std::int32_t row, std::uint32_t& stepCount, bool wait,
              std::intptr_t arg1, std::intptr_t arg2) override;
  // An area of the input changed: the tiles that show it, with a pixel's
  // margin around it for the reduction's partial weights, are made again.
  void InputChanged(const Tarsa::CRect& inputArea);

  // A rectangle between the two spaces, low edges rounded down and high
  // edges up: origin to target, and back.
  Tarsa::CRect ToTarget(const Tarsa::CRect& area) const;
  Tarsa::CRect ToOrigin(const Tarsa::CRect& area) const;

 protected:
  // The full-size stage read from, and its pixels (null until it has a
  // rectangle).
  virtual Tarsa::CPixProcess& Input() = 0;
  virtual const Tarsa::CPixmap* InputPixels() = 0;

 private:
  std::unique_ptr<Tarsa::CVirtualPixmap> pixels_;
  std::uint32_t planes_;
  std::uint32_t depth_;
  std::uint32_t stepsX_ = 1;
  std::uint32_t stepsY_ = 1;
};

}  // namespace Project
