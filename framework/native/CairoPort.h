#pragma once

#include <cairo.h>

#include "framework/view/CPort.h"

namespace Tarsa::Native {

// A drawing port over a cairo context: shapes with cairo, text laid out by
// pango in the framework's UI font. Borrows the context; whoever made it
// (the window's paint) destroys it after the port.
class CairoPort : public CPort {
 public:
  explicit CairoPort(cairo_t* cairo);
  ~CairoPort() override = default;
  CairoPort(const CairoPort&) = delete;
  CairoPort& operator=(const CairoPort&) = delete;

  void Save() override;
  void Restore() override;
  void Translate(std::int32_t dx, std::int32_t dy) override;
  void Clip(const CRect& rect) override;

  void FillRect(const CRect& rect, std::uint32_t argb) override;
  void FrameRect(const CRect& rect, std::uint32_t argb, double width) override;
  void FillRoundRect(const CRect& rect, double radius, std::uint32_t argb) override;
  void FrameRoundRect(const CRect& rect, double radius, std::uint32_t argb, double width) override;
  void FillEllipse(const CRect& rect, std::uint32_t argb) override;
  void FrameEllipse(const CRect& rect, std::uint32_t argb, double width) override;
  void Line(CPointF from, CPointF to, std::uint32_t argb, double width) override;
  void FillPolygon(std::span<const CPointF> points, std::uint32_t argb) override;
  void FocusRect(const CRect& rect, std::uint32_t argb) override;
  void StrokePath(const CPath& path, const CStrokeStyle& style) override;
  void FillPath(const CPath& path, std::uint32_t argb) override;
  void SetAntialias(bool on) override;

  CSize MeasureText(std::string_view text, EFont font) override;
  void DrawText(std::string_view text, const CRect& box, EFont font, std::uint32_t argb,
                EAlign horizontal, EAlign vertical) override;
  void DrawWrappedText(std::string_view text, const CRect& box, EFont font,
                       std::uint32_t argb) override;
  std::int32_t WrappedTextHeight(std::string_view text, std::int32_t width, EFont font) override;

  void DrawImage(const std::uint8_t* rgba, std::int32_t width, std::int32_t height,
                 std::int32_t rowBytes, const CRect& dest) override;

 private:
  void SetColor(std::uint32_t argb);
  void RoundRectPath(double x, double y, double w, double h, double r);
  // Replaces cairo's current path by the path.
  void SetPath(const CPath& path);

  cairo_t* cairo_;
};

}  // namespace Tarsa::Native
