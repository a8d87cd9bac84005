#include <cairo.h>

#include "framework/icons/IconStates.h"
#include "tools/resgen/icons/IconArt.h"

namespace Project {

// Greys for the controls, one blue for what is on or has focus. Disabled
// parts keep their shapes and lose their contrast.
IconLook LookFor(std::uint32_t state) {
  using Tarsa::IconState;
  using Tarsa::IconStateIndex;
  IconLook look;
  look.state = state;
  look.face = 0xFAFAFA;
  look.border = 0xABABAB;
  look.ink = 0x3A3A3A;
  look.accent = 0x2F7BDA;
  if (state == IconStateIndex(IconState::kPressed)) {
    look.face = 0xE1E1E1;
    look.border = 0x8C8C8C;
    look.ink = 0x222222;
    look.accent = 0x2364B6;
  } else if (state == IconStateIndex(IconState::kHover)) {
    look.face = 0xFFFFFF;
    look.border = 0x939393;
    look.accent = 0x4A8FE6;
  } else if (state == IconStateIndex(IconState::kDisabled)) {
    look.face = 0xF4F4F4;
    look.border = 0xD4D4D4;
    look.ink = 0xB8B8B8;
    look.accent = 0xAFCBEF;
  } else if (state == IconStateIndex(IconState::kFocused)) {
    look.border = look.accent;
    look.focused = true;
  }
  return look;
}

void SetColour(cairo_t* cr, std::uint32_t rgb, double alpha) {
  cairo_set_source_rgba(cr, ((rgb >> 16) & 0xFF) / 255.0, ((rgb >> 8) & 0xFF) / 255.0,
                        (rgb & 0xFF) / 255.0, alpha);
}

}  // namespace Project
