#pragma once

#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

#include "framework/core/CRect.h"

namespace Tarsa {

// The framework's fonts for its controls.
enum class EFont { kUISmall, kUIMedium, kUIBold, kUILarge };

// Where text sits in its box on each axis.
enum class EAlign { kStart, kCenter, kEnd };

struct CPointF {
  double x = 0.0;
  double y = 0.0;
};

class CPath;

// How a path is stroked: the colour, whose alpha is the opacity, the pen
// width, and a dash pattern of lengths drawn and skipped in turn, entered
// dashOffset along; no dashes draw a solid line.
struct CStrokeStyle {
  std::uint32_t argb = 0xFF000000;
  double width = 1.0;
  std::vector<double> dashes;
  double dashOffset = 0.0;
};

// A drawing port: what views draw with, in the coordinates of the view being
// drawn (the window moves the origin and clips for each view). Colours are
// 0xAARRGGBB words. Lines are centred on their path; FrameRect's 1-pixel
// lines fall inside the rectangle, on whole pixels. The window that paints
// owns its port; views only borrow it for the length of a draw.
class CPort {
 public:
  virtual ~CPort() = default;

  // A saved state: origin, clip and anti-aliasing. Every Save is matched by
  // a Restore.
  virtual void Save() = 0;
  virtual void Restore() = 0;
  virtual void Translate(std::int32_t dx, std::int32_t dy) = 0;
  // Narrows the clip to the rectangle.
  virtual void Clip(const CRect& rect) = 0;

  virtual void FillRect(const CRect& rect, std::uint32_t argb) = 0;
  virtual void FrameRect(const CRect& rect, std::uint32_t argb, double width = 1.0) = 0;
  virtual void FillRoundRect(const CRect& rect, double radius, std::uint32_t argb) = 0;
  virtual void FrameRoundRect(const CRect& rect, double radius, std::uint32_t argb,
                              double width = 1.0) = 0;
  virtual void FillEllipse(const CRect& rect, std::uint32_t argb) = 0;
  virtual void FrameEllipse(const CRect& rect, std::uint32_t argb, double width = 1.0) = 0;
  virtual void Line(CPointF from, CPointF to, std::uint32_t argb, double width = 1.0) = 0;
  virtual void FillPolygon(std::span<const CPointF> points, std::uint32_t argb) = 0;
  // A dotted rectangle, one pixel inside rect: the keyboard focus.
  virtual void FocusRect(const CRect& rect, std::uint32_t argb) = 0;

  // Any shape: all its subpaths in one stroke, so that dashes run on along
  // a path and overlapping translucent pieces are not darkened twice.
  virtual void StrokePath(const CPath& path, const CStrokeStyle& style) = 0;
  // The inside of all its subpaths (non-zero winding), open ones closed.
  virtual void FillPath(const CPath& path, std::uint32_t argb) = 0;
  // Whether shapes get soft, anti-aliased edges (the default) or hard ones
  // on whole pixels; kept and put back by Save and Restore.
  virtual void SetAntialias(bool on) = 0;

  // The text's size in the font, one line.
  virtual CSize MeasureText(std::string_view text, EFont font) = 0;
  // One line of text, placed in the box by the alignments and cut off with
  // an ellipsis when it does not fit.
  virtual void DrawText(std::string_view text, const CRect& box, EFont font, std::uint32_t argb,
                        EAlign horizontal = EAlign::kStart, EAlign vertical = EAlign::kCenter) = 0;
  // Text wrapped at word boundaries to the box's width, from its top.
  virtual void DrawWrappedText(std::string_view text, const CRect& box, EFont font,
                               std::uint32_t argb) = 0;
  // The height wrapped text takes at a width.
  virtual std::int32_t WrappedTextHeight(std::string_view text, std::int32_t width, EFont font) = 0;

  // An image of 8-bit RGBA rows (straight alpha), scaled into dest.
  virtual void DrawImage(const std::uint8_t* rgba, std::int32_t width, std::int32_t height,
                         std::int32_t rowBytes, const CRect& dest) = 0;
};

}  // namespace Tarsa
