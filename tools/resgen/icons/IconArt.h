#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

typedef struct _cairo cairo_t;

namespace Project {

// How one state of a control looks: the colours a piece is drawn in. The
// states themselves are the framework's (framework/icons/IconStates.h).
struct IconLook {
  std::uint32_t state = 0;
  std::uint32_t face = 0;    // 0xRRGGBB of the control's surface
  std::uint32_t border = 0;  // its outline
  std::uint32_t ink = 0;     // glyphs: arrows, check marks
  std::uint32_t accent = 0;  // the one accent blue, shaded for the state
  bool focused = false;      // draw the focus ring
};

// One image of the icon resources, drawn by code. Sizes and the hot spot are
// at resolution 0, in pixels; Draw() paints in those units and is called
// once a state and resolution, already scaled for the resolution, on a
// cleared transparent surface. The skin parts list the states they have;
// every image has state 0.
struct IconArt {
  std::string name;
  int width = 0;
  int height = 0;
  int hotX = 0;
  int hotY = 0;
  std::vector<std::uint32_t> states;
  std::function<void(cairo_t*, const IconLook&)> draw;
};

// The look of a state.
IconLook LookFor(std::uint32_t state);

// The skin parts of the framework's controls, and the workspace's cursors.
std::vector<IconArt> SkinArt();
std::vector<IconArt> CursorArt();

// Colour helpers for the art: 0xRRGGBB with an alpha of 0 to 1.
void SetColour(cairo_t* cr, std::uint32_t rgb, double alpha = 1.0);

}  // namespace Project
