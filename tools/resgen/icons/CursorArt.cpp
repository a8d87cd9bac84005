// The workspace's cursors, 32 by 32 pixels at resolution 0. Each is dark ink
// with a white outline, so it reads on light and dark photographs alike; the
// hands are white with a dark outline, as users know them. The numbered ones
// are stored as "Alpha_" and the number, which is how the provider finds a
// name that starts with a digit.

#include <cairo.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>
#include <string>
#include <utility>
#include <vector>

#include "tools/resgen/icons/IconArt.h"

namespace Project {
namespace {

constexpr double kPi = std::numbers::pi;
constexpr std::uint32_t kInk = 0x1C1C1C;
constexpr std::uint32_t kPaper = 0xFFFFFF;
constexpr int kSize = 32;

using Painter = std::function<void(cairo_t*)>;

IconArt Cursor(const std::string& name, int hotX, int hotY, Painter paint) {
  IconArt art;
  art.name = name;
  art.width = kSize;
  art.height = kSize;
  art.hotX = hotX;
  art.hotY = hotY;
  art.states = {0};
  art.draw = [paint = std::move(paint)](cairo_t* cr, const IconLook&) {
    cairo_set_line_join(cr, CAIRO_LINE_JOIN_ROUND);
    cairo_set_line_cap(cr, CAIRO_LINE_CAP_ROUND);
    paint(cr);
  };
  return art;
}

IconArt Numbered(int number, int hotX, int hotY, Painter paint) {
  return Cursor("Alpha_" + std::to_string(number), hotX, hotY, std::move(paint));
}

// Fills the path in ink over a white outline of the given width.
void InkShape(cairo_t* cr, double outline = 1.2) {
  SetColour(cr, kPaper);
  cairo_set_line_width(cr, 2 * outline);
  cairo_stroke_preserve(cr);
  SetColour(cr, kInk);
  cairo_fill(cr);
}

// The system's pointer: the tip at (x, y).
void ArrowPath(cairo_t* cr, double x, double y) {
  const double points[][2] = {{0, 0},      {0, 16.5},   {4, 12.8}, {6.9, 19.3},
                              {9.5, 18.2}, {6.7, 11.8}, {12, 11.8}};
  cairo_new_path(cr);
  for (const auto& p : points) cairo_line_to(cr, x + p[0], y + p[1]);
  cairo_close_path(cr);
}

void Arrow(cairo_t* cr) {
  ArrowPath(cr, 4, 3);
  InkShape(cr);
}

// A white disc with an ink rim at the lower right, for what the pointer adds.
void Badge(cairo_t* cr, double cx, double cy) {
  cairo_new_path(cr);
  cairo_arc(cr, cx, cy, 5.6, 0, 2 * kPi);
  SetColour(cr, kPaper);
  cairo_fill_preserve(cr);
  SetColour(cr, kInk);
  cairo_set_line_width(cr, 1.3);
  cairo_stroke(cr);
}

void InkLine(cairo_t* cr, double x0, double y0, double x1, double y1, double width) {
  cairo_move_to(cr, x0, y0);
  cairo_line_to(cr, x1, y1);
  SetColour(cr, kInk);
  cairo_set_line_width(cr, width);
  cairo_stroke(cr);
}

// The path of an arrowhead: a triangle with its tip at (x, y), pointing
// along the unit direction (dx, dy).
void HeadPath(cairo_t* cr, double x, double y, double dx, double dy, double length,
              double halfWidth) {
  cairo_move_to(cr, x, y);
  cairo_line_to(cr, x - dx * length - dy * halfWidth, y - dy * length + dx * halfWidth);
  cairo_line_to(cr, x - dx * length + dy * halfWidth, y - dy * length - dx * halfWidth);
  cairo_close_path(cr);
}

// A line with an arrowhead at each end, ink on a white outline. Heads are
// filled triangles whose tips lie at the line's ends.
void DoubleArrow(cairo_t* cr, double x0, double y0, double x1, double y1, double head = 4.5,
                 double halfWidth = 3.6) {
  const double length = std::hypot(x1 - x0, y1 - y0);
  const double ux = (x1 - x0) / length;
  const double uy = (y1 - y0) / length;
  const auto heads = [&] {
    cairo_new_path(cr);
    HeadPath(cr, x0, y0, -ux, -uy, head, halfWidth);
    HeadPath(cr, x1, y1, ux, uy, head, halfWidth);
  };
  const auto shaft = [&] {
    cairo_new_path(cr);
    cairo_move_to(cr, x0 + ux * head, y0 + uy * head);
    cairo_line_to(cr, x1 - ux * head, y1 - uy * head);
  };
  // White first, all of it, so that crossing arrows do not cut each other.
  SetColour(cr, kPaper);
  heads();
  cairo_set_line_width(cr, 2.4);
  cairo_stroke_preserve(cr);
  cairo_fill(cr);
  shaft();
  cairo_set_line_width(cr, 4.4);
  cairo_stroke(cr);
}

void DoubleArrowInk(cairo_t* cr, double x0, double y0, double x1, double y1, double head = 4.5,
                    double halfWidth = 3.6) {
  const double length = std::hypot(x1 - x0, y1 - y0);
  const double ux = (x1 - x0) / length;
  const double uy = (y1 - y0) / length;
  SetColour(cr, kInk);
  cairo_new_path(cr);
  HeadPath(cr, x0, y0, -ux, -uy, head, halfWidth);
  HeadPath(cr, x1, y1, ux, uy, head, halfWidth);
  cairo_fill(cr);
  InkLine(cr, x0 + ux * (head - 0.5), y0 + uy * (head - 0.5), x1 - ux * (head - 0.5),
          y1 - uy * (head - 0.5), 1.8);
}

void Arrows(cairo_t* cr, const std::vector<std::array<double, 4>>& lines) {
  for (const auto& l : lines) DoubleArrow(cr, l[0], l[1], l[2], l[3]);
  for (const auto& l : lines) DoubleArrowInk(cr, l[0], l[1], l[2], l[3]);
}

// The magnifier: lens centred at (12, 12); sign 1 plus, -1 minus, 0 none.
void Magnifier(cairo_t* cr, int sign) {
  const double c = 12;
  const double r = 6.6;
  SetColour(cr, kPaper);
  cairo_arc(cr, c, c, r, 0, 2 * kPi);
  cairo_set_line_width(cr, 4.6);
  cairo_stroke(cr);
  cairo_move_to(cr, c + 4.9, c + 4.9);
  cairo_line_to(cr, 24.5, 24.5);
  cairo_set_line_width(cr, 6.2);
  cairo_stroke(cr);
  cairo_arc(cr, c, c, r, 0, 2 * kPi);
  SetColour(cr, kPaper, 0.9);
  cairo_fill_preserve(cr);
  SetColour(cr, kInk);
  cairo_set_line_width(cr, 2);
  cairo_stroke(cr);
  InkLine(cr, c + 5.2, c + 5.2, 24.5, 24.5, 3.6);
  if (sign != 0) InkLine(cr, c - 3.2, c, c + 3.2, c, 1.8);
  if (sign > 0) InkLine(cr, c, c - 3.2, c, c + 3.2, 1.8);
}

// A hand, white with an ink outline; open with the fingers spread up, or
// closed round what it holds.
void Hand(cairo_t* cr, bool open) {
  struct Finger {
    double x, top, bottom;
  };
  const double width = 3.3;
  const Finger fingers[] = {
      {10.0, open ? 5.0 : 11.0, 16},
      {13.4, open ? 3.0 : 10.0, 16},
      {16.8, open ? 4.0 : 10.5, 16},
      {20.2, open ? 6.5 : 11.5, 17},
  };
  const auto shapes = [&] {
    cairo_new_path(cr);
    for (const auto& f : fingers) {
      const double r = width / 2;
      cairo_new_sub_path(cr);
      cairo_arc(cr, f.x + r, f.top + r, r, kPi, 2 * kPi);
      cairo_line_to(cr, f.x + width, f.bottom);
      cairo_line_to(cr, f.x, f.bottom);
      cairo_close_path(cr);
    }
    // The palm, narrowing to the wrist.
    cairo_new_sub_path(cr);
    cairo_move_to(cr, 10.0, 13.5);
    cairo_line_to(cr, 23.5, 13.5);
    cairo_curve_to(cr, 23.5, 20, 22.5, 23, 20.5, 26.5);
    cairo_line_to(cr, 12.5, 26.5);
    cairo_curve_to(cr, 11.5, 24.5, 10.0, 23, 10.0, 20);
    cairo_close_path(cr);
  };
  const auto thumb = [&] {
    cairo_new_path(cr);
    if (open) {
      cairo_move_to(cr, 11.5, 21.5);
      cairo_line_to(cr, 6.2, 14.8);
    } else {
      cairo_move_to(cr, 11.5, 20.5);
      cairo_line_to(cr, 8.6, 16.8);
    }
  };
  // Outline under everything, then the white over the inner outlines.
  SetColour(cr, kInk);
  shapes();
  cairo_set_line_width(cr, 2.4);
  cairo_stroke(cr);
  thumb();
  cairo_set_line_width(cr, 3.4 + 2.4);
  cairo_stroke(cr);
  SetColour(cr, kPaper);
  shapes();
  cairo_fill(cr);
  thumb();
  cairo_set_line_width(cr, 3.4);
  cairo_stroke(cr);
  // The gaps between the fingers.
  for (int i = 1; i < 4; ++i) {
    const double x = fingers[i].x - 0.05;
    const double top = std::max(fingers[i - 1].top, fingers[i].top) + width / 2 + 0.6;
    InkLine(cr, x, top, x, open ? 14.5 : 14.0, 1.0);
  }
}

// A thin crosshair centred on pixel (15, 15), with a gap at its middle.
void Crosshair(cairo_t* cr) {
  const double c = 15.5;
  const double segments[][4] = {
      {c, 3.5, c, 12}, {c, 19, c, 27.5}, {3.5, c, 12, c}, {19, c, 27.5, c}};
  cairo_set_line_cap(cr, CAIRO_LINE_CAP_SQUARE);
  SetColour(cr, kPaper);
  for (const auto& s : segments) {
    cairo_move_to(cr, s[0], s[1]);
    cairo_line_to(cr, s[2], s[3]);
  }
  cairo_set_line_width(cr, 3);
  cairo_stroke(cr);
  cairo_set_line_cap(cr, CAIRO_LINE_CAP_BUTT);
  for (const auto& s : segments) InkLine(cr, s[0], s[1], s[2], s[3], 1);
  // The aim point itself.
  cairo_rectangle(cr, 14, 14, 3, 3);
  SetColour(cr, kPaper);
  cairo_fill(cr);
  cairo_rectangle(cr, 15, 15, 1, 1);
  SetColour(cr, kInk);
  cairo_fill(cr);
}

// A curved double arrow round a pivot to the left of (16, 16), turned so that
// the pivot lies opposite the given direction (0 east, 90 south, in degrees).
void Rotation(cairo_t* cr, double degrees) {
  cairo_translate(cr, 16, 16);
  cairo_rotate(cr, degrees * kPi / 180);
  const double radius = 12;
  const double span = 30 * kPi / 180;
  const double head = 5.6;
  const double halfWidth = 3.7;
  const auto arc = [&] {
    cairo_new_path(cr);
    cairo_arc(cr, -radius, 0, radius, -span, span);
  };
  // Each head sits on an end of the arc and points on along it.
  const auto heads = [&] {
    cairo_new_path(cr);
    for (const double sign : {-1.0, 1.0}) {
      const double a = sign * span;
      const double dx = -std::sin(a) * sign;
      const double dy = std::cos(a) * sign;
      const double ex = -radius + radius * std::cos(a);
      const double ey = radius * std::sin(a);
      HeadPath(cr, ex + dx * head, ey + dy * head, dx, dy, head, halfWidth);
    }
  };
  SetColour(cr, kPaper);
  arc();
  cairo_set_line_width(cr, 4.6);
  cairo_stroke(cr);
  heads();
  cairo_set_line_width(cr, 2.4);
  cairo_stroke_preserve(cr);
  cairo_fill(cr);
  SetColour(cr, kInk);
  arc();
  cairo_set_line_width(cr, 2);
  cairo_stroke(cr);
  heads();
  cairo_fill(cr);
}

}  // namespace

std::vector<IconArt> CursorArt() {
  std::vector<IconArt> art;
  art.push_back(Numbered(26000, 4, 3, Arrow));
  art.push_back(Numbered(26005, 16, 15, [](cairo_t* cr) { Hand(cr, true); }));
  art.push_back(Numbered(26006, 16, 17, [](cairo_t* cr) { Hand(cr, false); }));
  art.push_back(Numbered(26008, 12, 12, [](cairo_t* cr) { Magnifier(cr, 1); }));
  art.push_back(Numbered(26009, 12, 12, [](cairo_t* cr) { Magnifier(cr, -1); }));
  art.push_back(Numbered(26010, 12, 12, [](cairo_t* cr) { Magnifier(cr, 0); }));
  // Dragging a frame corner: top left and bottom right, then the others.
  art.push_back(Numbered(26019, 16, 16, [](cairo_t* cr) { Arrows(cr, {{8, 8, 24, 24}}); }));
  art.push_back(Numbered(26020, 16, 16, [](cairo_t* cr) { Arrows(cr, {{24, 8, 8, 24}}); }));
  // Moving the view: at rest, and while it moves, with the centre held.
  art.push_back(Numbered(26030, 16, 16, [](cairo_t* cr) {
    Arrows(cr, {{16, 4.5, 16, 27.5}, {4.5, 16, 27.5, 16}});
  }));
  art.push_back(Numbered(26029, 16, 16, [](cairo_t* cr) {
    Arrows(cr, {{16, 4.5, 16, 27.5}, {4.5, 16, 27.5, 16}});
    cairo_arc(cr, 16, 16, 3.4, 0, 2 * kPi);
    InkShape(cr, 1.2);
  }));
  // The arrow with what a click will do: delete, or change the type.
  art.push_back(Numbered(26053, 4, 3, [](cairo_t* cr) {
    Arrow(cr);
    Badge(cr, 21.5, 21.5);
    InkLine(cr, 19.2, 19.2, 23.8, 23.8, 1.6);
    InkLine(cr, 23.8, 19.2, 19.2, 23.8, 1.6);
  }));
  art.push_back(Numbered(26054, 4, 3, [](cairo_t* cr) {
    Arrow(cr);
    Badge(cr, 21.5, 21.5);
    // Level and plumb: the two types a line is switched between.
    InkLine(cr, 18.6, 23.6, 24.4, 23.6, 1.5);
    InkLine(cr, 21.5, 18.6, 21.5, 23.6, 1.5);
  }));
  // Rotating a line by its grip; the grip lies north, west, south, east,
  // north-west, north-east, south-west or south-east of the line's middle.
  const std::pair<int, double> rotations[] = {{26056, 270}, {26057, 180}, {26058, 90},
                                              {26059, 0},   {26060, 225}, {26061, 315},
                                              {26062, 135}, {26063, 45}};
  for (const auto& rotation : rotations) {
    // A copy, not the pair's binding: clang 14 cannot capture a binding.
    const double degrees = rotation.second;
    art.push_back(
        Numbered(rotation.first, 16, 16, [degrees](cairo_t* cr) { Rotation(cr, degrees); }));
  }
  // Over a point that can be dragged: a ring with four ways out.
  art.push_back(Numbered(26070, 16, 16, [](cairo_t* cr) {
    const double ways[][2] = {{0, -1}, {1, 0}, {0, 1}, {-1, 0}};
    const auto heads = [&] {
      cairo_new_path(cr);
      for (const auto& w : ways) HeadPath(cr, 16 + 11 * w[0], 16 + 11 * w[1], w[0], w[1], 4.6, 3.8);
    };
    SetColour(cr, kPaper);
    heads();
    cairo_set_line_width(cr, 2.4);
    cairo_stroke_preserve(cr);
    cairo_fill(cr);
    cairo_arc(cr, 16, 16, 2.8, 0, 2 * kPi);
    cairo_set_line_width(cr, 4.2);
    cairo_stroke(cr);
    SetColour(cr, kInk);
    heads();
    cairo_fill(cr);
    cairo_arc(cr, 16, 16, 2.8, 0, 2 * kPi);
    cairo_set_line_width(cr, 1.6);
    cairo_stroke(cr);
  }));
  // Drawing a polygon: add a corner, or close the shape on its first one.
  art.push_back(Numbered(14000, 15, 15, [](cairo_t* cr) {
    Crosshair(cr);
    Badge(cr, 24.5, 24.5);
    InkLine(cr, 21.6, 24.5, 27.4, 24.5, 1.5);
    InkLine(cr, 24.5, 21.6, 24.5, 27.4, 1.5);
  }));
  art.push_back(Numbered(14001, 15, 15, [](cairo_t* cr) {
    Crosshair(cr);
    Badge(cr, 24.5, 24.5);
    cairo_new_path(cr);
    cairo_move_to(cr, 24.5, 21.6);
    cairo_line_to(cr, 27.3, 26.6);
    cairo_line_to(cr, 21.7, 26.6);
    cairo_close_path(cr);
    SetColour(cr, kInk);
    cairo_set_line_width(cr, 1.3);
    cairo_stroke(cr);
  }));
  // Adding a line.
  art.push_back(Cursor("Crosshair", 15, 15, Crosshair));
  return art;
}

}  // namespace Project
