#pragma once

#include <cstdint>

#include "framework/view/CPath.h"
#include "framework/view/CPort.h"
#include "workspace/ScreenGeometry.h"

namespace Project {

// Where the preview's overlays (constraints, bands) are drawn: a port to
// paint on, or none to measure only. Each shape widens the box of the
// window it covers, pen width included, whether or not it is painted, so
// that one piece of drawing code both paints and measures, and the two
// cannot drift apart. The port is borrowed for the canvas's life.
class OverlayCanvas {
 public:
  // A handle's half side, and a rotation grip's radius, in window pixels.
  static constexpr float kHandleHalf = 3.5f;
  static constexpr float kGripHalf = 4.5f;

  explicit OverlayCanvas(Tarsa::CPort* port) : port_(port) {}

  // Anti-aliased.
  void Stroke(const Tarsa::CPath& path, const Tarsa::CStrokeStyle& style);
  // A square handle of half side kHandleHalf, hard-edged so that it stays
  // crisp, or a round grip of radius kGripHalf, anti-aliased: filled white
  // and outlined black with a pen of 1, both at the opacity.
  void Handle(Point2f centre, float opacity);
  void Grip(Point2f centre);

  bool IsPainting() const { return port_ != nullptr; }
  const ScreenBounds& Bounds() const { return bounds_; }

  // The colour with its alpha scaled by the opacity, 0 to 1.
  static std::uint32_t WithOpacity(std::uint32_t argb, float opacity);

 private:
  // Paints a handle: the inside filled white, the outline stroked black.
  void PaintHandle(const Tarsa::CPath& inside, const Tarsa::CPath& outline, float opacity);
  void Widen(const Tarsa::CPath& path, double margin);

  Tarsa::CPort* port_;
  ScreenBounds bounds_;
};

}  // namespace Project
