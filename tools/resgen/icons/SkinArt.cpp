// The skin of the framework's controls. A control that stretches is cut into
// pieces: a left cap, a middle that tiles and a right cap (or top, middle and
// bottom; or nine pieces for a frame). Each set of pieces is drawn as one
// whole control and cut, so the pieces always meet. Framed controls that take
// keyboard focus keep a transparent margin of 2 pixels around their frame,
// where the focus ring is drawn; a control lays its images out so that the
// margin overhangs its own rectangle.

#include <cairo.h>

#include <cmath>
#include <numbers>
#include <utility>

#include "tools/resgen/icons/IconArt.h"

namespace Project {
namespace {

using States = std::vector<std::uint32_t>;
// Draws a whole control of the given size.
using Whole = std::function<void(cairo_t*, const IconLook&, double, double)>;

const States kAllStates = {0, 1, 2, 4, 6};
const States kNoPress = {0, 2, 4, 6};
const States kPressable = {0, 1, 2, 4};
const States kPlain = {0, 4};

constexpr double kMargin = 2.0;  // room for the focus ring
constexpr double kFocusAlpha = 0.45;
constexpr double kPi = std::numbers::pi;

constexpr std::uint32_t kWhite = 0xFFFFFF;
constexpr std::uint32_t kTrack = 0xD6D6D6;
constexpr std::uint32_t kTrackDisabled = 0xE8E8E8;
constexpr std::uint32_t kScrollBack = 0xF1F1F1;

bool Disabled(const IconLook& look) { return look.state == 4; }

void RoundedRect(cairo_t* cr, double x, double y, double w, double h, double r) {
  cairo_new_sub_path(cr);
  cairo_arc(cr, x + w - r, y + r, r, -kPi / 2, 0);
  cairo_arc(cr, x + w - r, y + h - r, r, 0, kPi / 2);
  cairo_arc(cr, x + r, y + h - r, r, kPi / 2, kPi);
  cairo_arc(cr, x + r, y + r, r, kPi, 3 * kPi / 2);
  cairo_close_path(cr);
}

void Stroke(cairo_t* cr, std::uint32_t rgb, double width, double alpha = 1.0) {
  SetColour(cr, rgb, alpha);
  cairo_set_line_width(cr, width);
  cairo_stroke(cr);
}

// A frame of w by h inside the focus margin: face, 1-pixel border, and the
// ring outside the border when the look has focus.
void Frame(cairo_t* cr, const IconLook& look, double w, double h, double radius, std::uint32_t face,
           std::uint32_t border) {
  if (look.focused) {
    RoundedRect(cr, 1, 1, w - 2, h - 2, radius + 1.5);
    Stroke(cr, look.accent, 2, kFocusAlpha);
  }
  const double m = kMargin + 0.5;
  RoundedRect(cr, m, m, w - 2 * m, h - 2 * m, radius);
  SetColour(cr, face);
  cairo_fill_preserve(cr);
  Stroke(cr, border, 1);
}

// The pieces of one whole, cut along its length: cap, middle, cap.
std::vector<IconArt> ThreeSlice(const std::string& name, bool vertical, int cap, int middle,
                                int thickness, const States& states, const Whole& whole) {
  const int length = 2 * cap + middle;
  const std::pair<const char*, std::pair<int, int>> parts[] = {
      {vertical ? ".Top" : ".Left", {0, cap}},
      {".Middle", {cap, middle}},
      {vertical ? ".Bottom" : ".Right", {cap + middle, cap}},
  };
  std::vector<IconArt> pieces;
  for (const auto& [suffix, span] : parts) {
    const int at = span.first;
    IconArt art;
    art.name = name + suffix;
    art.width = vertical ? thickness : span.second;
    art.height = vertical ? span.second : thickness;
    art.states = states;
    art.draw = [=](cairo_t* cr, const IconLook& look) {
      cairo_translate(cr, vertical ? 0 : -at, vertical ? -at : 0);
      whole(cr, look, vertical ? thickness : length, vertical ? length : thickness);
    };
    pieces.push_back(std::move(art));
  }
  return pieces;
}

// The nine pieces of a frame: corners of corner by corner, edges that tile.
std::vector<IconArt> NineSlice(const std::string& name, int corner, int middle,
                               const States& states, const Whole& whole) {
  const int size = 2 * corner + middle;
  const char* rows[] = {"Top", "", "Bottom"};
  const char* columns[] = {"Left", "", "Right"};
  const int at[] = {0, corner, corner + middle};
  const int extent[] = {corner, middle, corner};
  std::vector<IconArt> pieces;
  for (int row = 0; row < 3; ++row) {
    for (int column = 0; column < 3; ++column) {
      std::string part = std::string(rows[row]) + columns[column];
      if (part.empty()) part = "Center";
      IconArt art;
      art.name = name + "." + part;
      art.width = extent[column];
      art.height = extent[row];
      art.states = states;
      const int x = at[column];
      const int y = at[row];
      art.draw = [=](cairo_t* cr, const IconLook& look) {
        cairo_translate(cr, -x, -y);
        whole(cr, look, size, size);
      };
      pieces.push_back(std::move(art));
    }
  }
  return pieces;
}

IconArt Single(const std::string& name, int width, int height, const States& states,
               const Whole& whole) {
  IconArt art;
  art.name = name;
  art.width = width;
  art.height = height;
  art.states = states;
  art.draw = [=](cairo_t* cr, const IconLook& look) { whole(cr, look, width, height); };
  return art;
}

void Append(std::vector<IconArt>& to, std::vector<IconArt> more) {
  for (auto& art : more) to.push_back(std::move(art));
}

// A chevron pointing up, centred on (cx, cy), half as tall as it is wide.
void Chevron(cairo_t* cr, double cx, double cy, double halfWidth) {
  cairo_move_to(cr, cx - halfWidth, cy + halfWidth / 2);
  cairo_line_to(cr, cx, cy - halfWidth / 2);
  cairo_line_to(cr, cx + halfWidth, cy + halfWidth / 2);
}

void ChevronStroke(cairo_t* cr, std::uint32_t rgb, double width) {
  cairo_set_line_cap(cr, CAIRO_LINE_CAP_ROUND);
  cairo_set_line_join(cr, CAIRO_LINE_JOIN_ROUND);
  Stroke(cr, rgb, width);
}

// --- the controls, each drawn whole --------------------------------------

void PushButton(cairo_t* cr, const IconLook& look, double w, double h) {
  Frame(cr, look, w, h, 4, look.face, look.border);
}

// The default button: the accent border, doubled inside, says that Enter
// presses it; the face and the label stay those of any button.
void DefaultButton(cairo_t* cr, const IconLook& look, double w, double h) {
  const bool disabled = Disabled(look);
  Frame(cr, look, w, h, 4, look.face, disabled ? look.border : look.accent);
  if (disabled) return;
  const double m = kMargin + 1.5;
  RoundedRect(cr, m, m, w - 2 * m, h - 2 * m, 3);
  Stroke(cr, look.accent, 1, 0.55);
}

void EditField(cairo_t* cr, const IconLook& look, double w, double h) {
  Frame(cr, look, w, h, 3, Disabled(look) ? look.face : kWhite, look.border);
}

void CheckBox(cairo_t* cr, const IconLook& look, double w, double h, int mark) {
  const bool on = mark != 0;
  Frame(cr, look, w, h, 3, on ? look.accent : (Disabled(look) ? look.face : kWhite),
        on ? look.accent : look.border);
  if (!on) return;
  cairo_set_line_cap(cr, CAIRO_LINE_CAP_ROUND);
  cairo_set_line_join(cr, CAIRO_LINE_JOIN_ROUND);
  if (mark == 1) {
    cairo_move_to(cr, 5.6, 9.3);
    cairo_line_to(cr, 8.0, 11.7);
    cairo_line_to(cr, 12.5, 6.4);
  } else {
    cairo_move_to(cr, 5.5, 9);
    cairo_line_to(cr, 12.5, 9);
  }
  Stroke(cr, kWhite, mark == 1 ? 1.8 : 2.0);
}

void RadioButton(cairo_t* cr, const IconLook& look, double w, double h, bool on) {
  const double cx = w / 2;
  const double cy = h / 2;
  if (look.focused) {
    cairo_arc(cr, cx, cy, cx - 1, 0, 2 * kPi);
    Stroke(cr, look.accent, 2, kFocusAlpha);
  }
  cairo_arc(cr, cx, cy, cx - kMargin - 0.5, 0, 2 * kPi);
  SetColour(cr, on ? look.accent : (Disabled(look) ? look.face : kWhite));
  cairo_fill_preserve(cr);
  Stroke(cr, on ? look.accent : look.border, 1);
  if (on) {
    cairo_arc(cr, cx, cy, 2.6, 0, 2 * kPi);
    SetColour(cr, kWhite);
    cairo_fill(cr);
  }
}

void SliderTrack(cairo_t* cr, const IconLook& look, double w, double h, bool fill) {
  // The fill's right end lies under the thumb, so only its left end is round.
  RoundedRect(cr, 0, 0, fill ? w + h : w, h, h / 2);
  SetColour(cr, fill ? look.accent : (Disabled(look) ? kTrackDisabled : kTrack));
  cairo_fill(cr);
}

void SliderThumb(cairo_t* cr, const IconLook& look, double w, double h) {
  const double cx = w / 2;
  const double cy = h / 2;
  const double r = cx - kMargin - 0.5;
  if (look.focused) {
    cairo_arc(cr, cx, cy, cx - 1, 0, 2 * kPi);
    Stroke(cr, look.accent, 2, kFocusAlpha);
  } else if (!Disabled(look)) {
    // A faint shadow below lifts the thumb off the track.
    cairo_arc(cr, cx, cy + 0.8, r + 0.3, 0, 2 * kPi);
    SetColour(cr, 0x000000, 0.14);
    cairo_fill(cr);
  }
  cairo_arc(cr, cx, cy, r, 0, 2 * kPi);
  SetColour(cr, look.state == 1 ? 0xEDEDED : (Disabled(look) ? look.face : kWhite));
  cairo_fill_preserve(cr);
  Stroke(cr, look.border, 1);
}

void PopupArrow(cairo_t* cr, const IconLook& look, double w, double h) {
  Chevron(cr, w / 2, h / 2 - 2.5, 2.75);
  cairo_save(cr);
  cairo_translate(cr, w / 2, h / 2 + 2.5);
  cairo_scale(cr, 1, -1);
  Chevron(cr, 0, 0, 2.75);
  cairo_restore(cr);
  ChevronStroke(cr, look.ink, 1.5);
}

void ComboArrow(cairo_t* cr, const IconLook& look, double w, double h) {
  cairo_save(cr);
  cairo_translate(cr, w / 2, h / 2);
  cairo_scale(cr, 1, -1);
  Chevron(cr, 0, 0, 3.25);
  cairo_restore(cr);
  ChevronStroke(cr, look.ink, 1.5);
}

// A scroll bar button: the bar's own ground, darker under the pointer, and a
// chevron turned to its direction (0 up, 1 right, 2 down, 3 left).
void ScrollArrow(cairo_t* cr, const IconLook& look, double w, double h, int direction) {
  std::uint32_t ground = kScrollBack;
  std::uint32_t ink = 0x606060;
  if (look.state == 1) {
    ground = 0xC8C8C8;
    ink = 0x202020;
  } else if (look.state == 2) {
    ground = 0xE2E2E2;
    ink = 0x303030;
  } else if (Disabled(look)) {
    ink = 0xC0C0C0;
  }
  cairo_rectangle(cr, 0, 0, w, h);
  SetColour(cr, ground);
  cairo_fill(cr);
  cairo_save(cr);
  cairo_translate(cr, w / 2, h / 2);
  cairo_rotate(cr, direction * kPi / 2);
  Chevron(cr, 0, 0, 3.25);
  cairo_restore(cr);
  ChevronStroke(cr, ink, 1.5);
}

void ScrollTrack(cairo_t* cr, const IconLook&, double w, double h) {
  cairo_rectangle(cr, 0, 0, w, h);
  SetColour(cr, kScrollBack);
  cairo_fill(cr);
}

// The thumb: a pill 8 pixels thick in the middle of the 14-pixel bar.
void ScrollThumb(cairo_t* cr, const IconLook& look, double w, double h, bool vertical) {
  std::uint32_t colour = 0xC1C1C1;
  if (look.state == 1) colour = 0x8A8A8A;
  if (look.state == 2) colour = 0xA6A6A6;
  if (vertical) {
    RoundedRect(cr, 3, 1, w - 6, h - 2, (w - 6) / 2);
  } else {
    RoundedRect(cr, 1, 3, w - 2, h - 6, (h - 6) / 2);
  }
  SetColour(cr, colour);
  cairo_fill(cr);
}

// A tab: rounded at the top, open at the bottom, where it meets its pane.
// The chosen tab is the pane's colour with an accent bar along its top.
void Tab(cairo_t* cr, const IconLook& look, double w, double h, bool chosen) {
  const double r = 4;
  const auto outline = [&] {
    cairo_new_path(cr);
    cairo_move_to(cr, 0.5, h + 1);
    cairo_arc(cr, 0.5 + r, 0.5 + r, r, kPi, 3 * kPi / 2);
    cairo_arc(cr, w - 0.5 - r, 0.5 + r, r, 3 * kPi / 2, 2 * kPi);
    cairo_line_to(cr, w - 0.5, h + 1);
  };
  std::uint32_t face = 0xE6E6E6;
  if (chosen) {
    face = Disabled(look) ? 0xF6F6F6 : 0xFAFAFA;
  } else if (look.state == 1) {
    face = 0xD9D9D9;
  } else if (look.state == 2) {
    face = 0xEFEFEF;
  } else if (Disabled(look)) {
    face = 0xEEEEEE;
  }
  outline();
  cairo_close_path(cr);
  SetColour(cr, face);
  cairo_fill(cr);
  if (chosen) {
    cairo_save(cr);
    outline();
    cairo_close_path(cr);
    cairo_clip(cr);
    cairo_rectangle(cr, 0, 0, w, 3);
    SetColour(cr, look.accent);
    cairo_fill(cr);
    cairo_restore(cr);
  }
  outline();
  Stroke(cr, Disabled(look) ? 0xD4D4D4 : 0xB3B3B3, 1);
  if (look.focused) {
    RoundedRect(cr, 3, chosen ? 4.5 : 3, w - 6, h - (chosen ? 7.5 : 6), 2.5);
    Stroke(cr, look.accent, 1.5, 0.7);
  }
}

void ProgressBar(cairo_t* cr, const IconLook& look, double w, double h, bool fill) {
  RoundedRect(cr, 0, 0, w, h, h / 2);
  SetColour(cr, fill ? look.accent : (Disabled(look) ? kTrackDisabled : 0xDDDDDD));
  cairo_fill(cr);
}

void GroupBox(cairo_t* cr, const IconLook& look, double w, double h) {
  RoundedRect(cr, 0.5, 0.5, w - 1, h - 1, 4);
  SetColour(cr, 0x000000, 0.025);
  cairo_fill_preserve(cr);
  Stroke(cr, Disabled(look) ? 0xE0E0E0 : 0xC6C6C6, 1);
}

}  // namespace

std::vector<IconArt> SkinArt() {
  using namespace std::placeholders;
  std::vector<IconArt> art;
  // Buttons, popups and the combo box's button: a 22-pixel frame.
  Append(art, ThreeSlice("Button", false, 8, 4, 26, kAllStates, PushButton));
  Append(art, ThreeSlice("DefaultButton", false, 8, 4, 26, kAllStates, DefaultButton));
  Append(art, ThreeSlice("EditField", false, 8, 4, 26, kNoPress, EditField));
  art.push_back(Single("CheckBox.Off", 18, 18, kAllStates, std::bind(CheckBox, _1, _2, _3, _4, 0)));
  art.push_back(Single("CheckBox.On", 18, 18, kAllStates, std::bind(CheckBox, _1, _2, _3, _4, 1)));
  art.push_back(
      Single("CheckBox.Mixed", 18, 18, kAllStates, std::bind(CheckBox, _1, _2, _3, _4, 2)));
  art.push_back(
      Single("RadioButton.Off", 18, 18, kAllStates, std::bind(RadioButton, _1, _2, _3, _4, false)));
  art.push_back(
      Single("RadioButton.On", 18, 18, kAllStates, std::bind(RadioButton, _1, _2, _3, _4, true)));
  Append(art, ThreeSlice("Slider.Track", false, 3, 4, 4, kPlain,
                         std::bind(SliderTrack, _1, _2, _3, _4, false)));
  auto fill = ThreeSlice("Slider.Fill", false, 3, 4, 4, kPlain,
                         std::bind(SliderTrack, _1, _2, _3, _4, true));
  fill.pop_back();  // no right end: the thumb covers it
  Append(art, std::move(fill));
  art.push_back(Single("Slider.Thumb", 20, 20, kAllStates, SliderThumb));
  art.push_back(Single("Popup.Arrow", 8, 14, kPlain, PopupArrow));
  art.push_back(Single("Combo.Arrow", 10, 8, kPlain, ComboArrow));
  const char* directions[] = {"Up", "Right", "Down", "Left"};
  for (int d = 0; d < 4; ++d) {
    art.push_back(Single(std::string("ScrollBar.Arrow.") + directions[d], 14, 14, kPressable,
                         std::bind(ScrollArrow, _1, _2, _3, _4, d)));
  }
  art.push_back(Single("ScrollBar.Track.Vertical", 14, 4, {0}, ScrollTrack));
  art.push_back(Single("ScrollBar.Track.Horizontal", 4, 14, {0}, ScrollTrack));
  Append(art, ThreeSlice("ScrollBar.Thumb.Vertical", true, 5, 4, 14, {0, 1, 2},
                         std::bind(ScrollThumb, _1, _2, _3, _4, true)));
  Append(art, ThreeSlice("ScrollBar.Thumb.Horizontal", false, 5, 4, 14, {0, 1, 2},
                         std::bind(ScrollThumb, _1, _2, _3, _4, false)));
  Append(art,
         ThreeSlice("Tab", false, 6, 4, 24, kAllStates, std::bind(Tab, _1, _2, _3, _4, false)));
  Append(art, ThreeSlice("Tab.Selected", false, 6, 4, 24, kNoPress,
                         std::bind(Tab, _1, _2, _3, _4, true)));
  Append(art, ThreeSlice("ProgressBar.Track", false, 4, 4, 8, kPlain,
                         std::bind(ProgressBar, _1, _2, _3, _4, false)));
  Append(art, ThreeSlice("ProgressBar.Fill", false, 4, 4, 8, kPlain,
                         std::bind(ProgressBar, _1, _2, _3, _4, true)));
  Append(art, NineSlice("GroupBox", 6, 4, kPlain, GroupBox));
  return art;
}

}  // namespace Project
