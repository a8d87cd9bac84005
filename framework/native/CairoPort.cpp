#include "framework/native/CairoPort.h"

#include "framework/view/CPath.h"

#include <pango/pangocairo.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <numbers>
#include <string>
#include <vector>

namespace Tarsa::Native {

namespace {

const char* FontDescription(EFont font) {
  switch (font) {
    case EFont::kUISmall:
      return "DejaVu Sans 8";
    case EFont::kUIBold:
      return "DejaVu Sans Bold 9";
    case EFont::kUILarge:
      return "DejaVu Sans 11";
    case EFont::kUIMedium:
      break;
  }
  return "DejaVu Sans 9";
}

struct LayoutDeleter {
  void operator()(PangoLayout* layout) const { g_object_unref(layout); }
};
using Layout = std::unique_ptr<PangoLayout, LayoutDeleter>;

Layout MakeLayout(cairo_t* cairo, std::string_view text, EFont font) {
  Layout layout(pango_cairo_create_layout(cairo));
  PangoFontDescription* description = pango_font_description_from_string(FontDescription(font));
  pango_layout_set_font_description(layout.get(), description);
  pango_font_description_free(description);
  pango_layout_set_text(layout.get(), text.data(), static_cast<int>(text.size()));
  return layout;
}

}  // namespace

CairoPort::CairoPort(cairo_t* cairo) : cairo_(cairo) {}

void CairoPort::Save() { cairo_save(cairo_); }

void CairoPort::Restore() { cairo_restore(cairo_); }

void CairoPort::Translate(std::int32_t dx, std::int32_t dy) { cairo_translate(cairo_, dx, dy); }

void CairoPort::Clip(const CRect& rect) {
  cairo_rectangle(cairo_, rect.left, rect.top, double(rect.Width()), double(rect.Height()));
  cairo_clip(cairo_);
}

void CairoPort::SetColor(std::uint32_t argb) {
  cairo_set_source_rgba(cairo_, ((argb >> 16) & 0xFF) / 255.0, ((argb >> 8) & 0xFF) / 255.0,
                        (argb & 0xFF) / 255.0, ((argb >> 24) & 0xFF) / 255.0);
}

void CairoPort::FillRect(const CRect& rect, std::uint32_t argb) {
  SetColor(argb);
  cairo_rectangle(cairo_, rect.left, rect.top, double(rect.Width()), double(rect.Height()));
  cairo_fill(cairo_);
}

void CairoPort::FrameRect(const CRect& rect, std::uint32_t argb, double width) {
  SetColor(argb);
  const double h = width / 2;
  cairo_set_line_width(cairo_, width);
  cairo_rectangle(cairo_, rect.left + h, rect.top + h, double(rect.Width()) - width,
                  double(rect.Height()) - width);
  cairo_stroke(cairo_);
}

void CairoPort::RoundRectPath(double x, double y, double w, double h, double r) {
  r = std::max(0.0, std::min({r, w / 2, h / 2}));
  constexpr double kQuarter = std::numbers::pi / 2;
  cairo_new_sub_path(cairo_);
  cairo_arc(cairo_, x + w - r, y + r, r, -kQuarter, 0);
  cairo_arc(cairo_, x + w - r, y + h - r, r, 0, kQuarter);
  cairo_arc(cairo_, x + r, y + h - r, r, kQuarter, 2 * kQuarter);
  cairo_arc(cairo_, x + r, y + r, r, 2 * kQuarter, 3 * kQuarter);
  cairo_close_path(cairo_);
}

void CairoPort::FillRoundRect(const CRect& rect, double radius, std::uint32_t argb) {
  SetColor(argb);
  RoundRectPath(rect.left, rect.top, double(rect.Width()), double(rect.Height()), radius);
  cairo_fill(cairo_);
}

void CairoPort::FrameRoundRect(const CRect& rect, double radius, std::uint32_t argb, double width) {
  SetColor(argb);
  const double h = width / 2;
  cairo_set_line_width(cairo_, width);
  RoundRectPath(rect.left + h, rect.top + h, double(rect.Width()) - width,
                double(rect.Height()) - width, radius - h);
  cairo_stroke(cairo_);
}

void CairoPort::FillEllipse(const CRect& rect, std::uint32_t argb) {
  SetColor(argb);
  cairo_save(cairo_);
  cairo_translate(cairo_, rect.left + rect.Width() / 2.0, rect.top + rect.Height() / 2.0);
  cairo_scale(cairo_, rect.Width() / 2.0, rect.Height() / 2.0);
  cairo_arc(cairo_, 0, 0, 1, 0, 2 * std::numbers::pi);
  cairo_restore(cairo_);
  cairo_fill(cairo_);
}

void CairoPort::FrameEllipse(const CRect& rect, std::uint32_t argb, double width) {
  SetColor(argb);
  const double h = width / 2;
  cairo_save(cairo_);
  cairo_translate(cairo_, rect.left + rect.Width() / 2.0, rect.top + rect.Height() / 2.0);
  cairo_scale(cairo_, rect.Width() / 2.0 - h, rect.Height() / 2.0 - h);
  cairo_arc(cairo_, 0, 0, 1, 0, 2 * std::numbers::pi);
  cairo_restore(cairo_);
  cairo_set_line_width(cairo_, width);
  cairo_stroke(cairo_);
}

void CairoPort::Line(CPointF from, CPointF to, std::uint32_t argb, double width) {
  SetColor(argb);
  cairo_set_line_width(cairo_, width);
  cairo_move_to(cairo_, from.x, from.y);
  cairo_line_to(cairo_, to.x, to.y);
  cairo_stroke(cairo_);
}

void CairoPort::FillPolygon(std::span<const CPointF> points, std::uint32_t argb) {
  if (points.size() < 3) return;
  SetColor(argb);
  cairo_move_to(cairo_, points[0].x, points[0].y);
  for (const CPointF& p : points.subspan(1)) cairo_line_to(cairo_, p.x, p.y);
  cairo_close_path(cairo_);
  cairo_fill(cairo_);
}

void CairoPort::FocusRect(const CRect& rect, std::uint32_t argb) {
  SetColor(argb);
  const double dashes[] = {1.0, 1.0};
  cairo_save(cairo_);
  cairo_set_dash(cairo_, dashes, 2, 0);
  cairo_set_line_width(cairo_, 1.0);
  cairo_rectangle(cairo_, rect.left + 0.5, rect.top + 0.5, double(rect.Width()) - 1,
                  double(rect.Height()) - 1);
  cairo_stroke(cairo_);
  cairo_restore(cairo_);
}

void CairoPort::SetPath(const CPath& path) {
  cairo_new_path(cairo_);
  for (const CPath::CElement& e : path.Elements()) {
    switch (e.verb) {
      case CPath::EVerb::kMove:
        cairo_move_to(cairo_, e.point.x, e.point.y);
        break;
      case CPath::EVerb::kLine:
        cairo_line_to(cairo_, e.point.x, e.point.y);
        break;
      case CPath::EVerb::kArc:
        if (e.to >= e.from) {
          cairo_arc(cairo_, e.point.x, e.point.y, e.radius, e.from, e.to);
        } else {
          cairo_arc_negative(cairo_, e.point.x, e.point.y, e.radius, e.from, e.to);
        }
        break;
      case CPath::EVerb::kClose:
        cairo_close_path(cairo_);
        break;
    }
  }
}

void CairoPort::StrokePath(const CPath& path, const CStrokeStyle& style) {
  if (path.IsEmpty()) return;
  cairo_save(cairo_);
  SetColor(style.argb);
  cairo_set_line_width(cairo_, style.width);
  cairo_set_dash(cairo_, style.dashes.data(), static_cast<int>(style.dashes.size()),
                 style.dashOffset);
  SetPath(path);
  cairo_stroke(cairo_);
  cairo_restore(cairo_);
}

void CairoPort::FillPath(const CPath& path, std::uint32_t argb) {
  if (path.IsEmpty()) return;
  SetColor(argb);
  SetPath(path);
  cairo_fill(cairo_);
}

void CairoPort::SetAntialias(bool on) {
  cairo_set_antialias(cairo_, on ? CAIRO_ANTIALIAS_DEFAULT : CAIRO_ANTIALIAS_NONE);
}

CSize CairoPort::MeasureText(std::string_view text, EFont font) {
  const Layout layout = MakeLayout(cairo_, text, font);
  int width = 0, height = 0;
  pango_layout_get_pixel_size(layout.get(), &width, &height);
  return {width, height};
}

void CairoPort::DrawText(std::string_view text, const CRect& box, EFont font, std::uint32_t argb,
                         EAlign horizontal, EAlign vertical) {
  const Layout layout = MakeLayout(cairo_, text, font);
  pango_layout_set_width(layout.get(), int(box.Width()) * PANGO_SCALE);
  pango_layout_set_ellipsize(layout.get(), PANGO_ELLIPSIZE_END);
  pango_layout_set_single_paragraph_mode(layout.get(), TRUE);
  pango_layout_set_alignment(layout.get(), horizontal == EAlign::kCenter ? PANGO_ALIGN_CENTER
                                           : horizontal == EAlign::kEnd  ? PANGO_ALIGN_RIGHT
                                                                         : PANGO_ALIGN_LEFT);
  int width = 0, height = 0;
  pango_layout_get_pixel_size(layout.get(), &width, &height);
  double y = box.top;
  if (vertical == EAlign::kCenter) y = box.top + std::floor((double(box.Height()) - height) / 2);
  if (vertical == EAlign::kEnd) y = double(box.bottom) - height;
  SetColor(argb);
  cairo_move_to(cairo_, box.left, y);
  pango_cairo_show_layout(cairo_, layout.get());
}

void CairoPort::DrawWrappedText(std::string_view text, const CRect& box, EFont font,
                                std::uint32_t argb) {
  const Layout layout = MakeLayout(cairo_, text, font);
  pango_layout_set_width(layout.get(), int(box.Width()) * PANGO_SCALE);
  pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
  SetColor(argb);
  cairo_move_to(cairo_, box.left, box.top);
  pango_cairo_show_layout(cairo_, layout.get());
}

std::int32_t CairoPort::WrappedTextHeight(std::string_view text, std::int32_t width, EFont font) {
  const Layout layout = MakeLayout(cairo_, text, font);
  pango_layout_set_width(layout.get(), width * PANGO_SCALE);
  pango_layout_set_wrap(layout.get(), PANGO_WRAP_WORD_CHAR);
  int w = 0, h = 0;
  pango_layout_get_pixel_size(layout.get(), &w, &h);
  return h;
}

void CairoPort::DrawImage(const std::uint8_t* rgba, std::int32_t width, std::int32_t height,
                          std::int32_t rowBytes, const CRect& dest) {
  if (width <= 0 || height <= 0 || dest.IsEmpty()) return;
  // cairo takes premultiplied native-endian ARGB.
  cairo_surface_t* image = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height);
  unsigned char* data = cairo_image_surface_get_data(image);
  const int stride = cairo_image_surface_get_stride(image);
  for (std::int32_t y = 0; y < height; ++y) {
    const std::uint8_t* from = rgba + std::size_t(y) * std::size_t(rowBytes);
    auto* to = reinterpret_cast<std::uint32_t*>(data + std::size_t(y) * std::size_t(stride));
    for (std::int32_t x = 0; x < width; ++x, from += 4) {
      const std::uint32_t a = from[3];
      const auto pre = [a](std::uint32_t c) { return (c * a + 127) / 255; };
      to[x] = (a << 24) | (pre(from[0]) << 16) | (pre(from[1]) << 8) | pre(from[2]);
    }
  }
  cairo_surface_mark_dirty(image);
  cairo_save(cairo_);
  cairo_translate(cairo_, dest.left, dest.top);
  cairo_scale(cairo_, double(dest.Width()) / width, double(dest.Height()) / height);
  cairo_set_source_surface(cairo_, image, 0, 0);
  cairo_paint(cairo_);
  cairo_restore(cairo_);
  cairo_surface_destroy(image);
}

}  // namespace Tarsa::Native
