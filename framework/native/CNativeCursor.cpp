#include "framework/native/CNativeCursor.h"

#include <algorithm>

#include <SDL.h>

#include "framework/pixels/CDisplayPixmap.h"

namespace Tarsa {
namespace {

// The dots an inch from which the double-size images are used.
constexpr float kHighResolutionDpi = 144.0f;

bool VideoRunning() { return SDL_WasInit(SDL_INIT_VIDEO) != 0; }

}  // namespace

CNativeCursor::CNativeCursor(const CDisplayPixmap* pixels, std::int32_t hotX, std::int32_t hotY) {
  if (!VideoRunning()) return;
  if (pixels != nullptr && pixels->Planes() == 4) {
    const CRect bounds = pixels->Bounds();
    const int width = bounds.right - bounds.left;
    const int height = bounds.bottom - bounds.top;
    // SDL only reads the bytes while it copies them into the cursor.
    SDL_Surface* surface = SDL_CreateRGBSurfaceWithFormatFrom(
        const_cast<std::uint8_t*>(pixels->Data()), width, height, 32,
        static_cast<int>(pixels->RowBytes()), SDL_PIXELFORMAT_RGBA32);
    if (surface != nullptr && width > 0 && height > 0) {
      cursor_ = SDL_CreateColorCursor(surface, std::clamp(hotX, 0, width - 1),
                                      std::clamp(hotY, 0, height - 1));
      colour_ = cursor_ != nullptr;
    }
    SDL_FreeSurface(surface);
  }
  if (cursor_ == nullptr) cursor_ = SDL_CreateSystemCursor(SDL_SYSTEM_CURSOR_ARROW);
}

CNativeCursor::~CNativeCursor() {
  // After the video part has ended SDL has freed its cursors and no longer
  // knows this one, and the call does nothing.
  if (cursor_ != nullptr) SDL_FreeCursor(cursor_);
}

void CNativeCursor::Set() const {
  if (cursor_ != nullptr && VideoRunning()) SDL_SetCursor(cursor_);
}

std::uint32_t CNativeCursor::DisplayIconResolution() {
  if (!VideoRunning()) return 0;
  float dpi = 0.0f;
  if (SDL_GetDisplayDPI(0, &dpi, nullptr, nullptr) != 0) return 0;
  return dpi >= kHighResolutionDpi ? 1 : 0;
}

}  // namespace Tarsa
