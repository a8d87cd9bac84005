#pragma once

#include <cstdint>
#include <memory>

struct SDL_Cursor;

namespace Tarsa {

class CDisplayPixmap;

// One mouse cursor of the window layer: a colour cursor made from a 32-bit
// display pixmap (R, G, B, A, straight alpha) and its hot spot, or the
// system's arrow. The cursor owns its SDL cursor and frees it when it goes.
// It needs the window layer's video part running when it is made; made
// without it, it holds nothing and Set() does nothing. Cursors belong to the
// thread that runs the windows.
class CNativeCursor {
 public:
  // A colour cursor, the hot spot clamped into the image; the system arrow
  // when pixels is null or the window layer cannot make the colour cursor.
  CNativeCursor(const CDisplayPixmap* pixels, std::int32_t hotX, std::int32_t hotY);
  ~CNativeCursor();
  CNativeCursor(const CNativeCursor&) = delete;
  CNativeCursor& operator=(const CNativeCursor&) = delete;

  // Makes this the pointer's cursor.
  void Set() const;
  // Whether an SDL cursor was made at all, and whether it is the image's.
  bool IsMade() const { return cursor_ != nullptr; }
  bool IsColour() const { return colour_; }

  // The icon resolution for the main display: 1 (double size) at 144 dots
  // an inch or more, else 0; 0 without a running window layer.
  static std::uint32_t DisplayIconResolution();

 private:
  SDL_Cursor* cursor_ = nullptr;
  bool colour_ = false;
};

}  // namespace Tarsa
