#include "gpu/POpenGLImage.h"

#define EGL_NO_X11
#include <EGL/egl.h>

#include "framework/core/CException.h"

namespace Project {

POpenGLImage::POpenGLImage(void* display, void* config, int width, int height)
    : display_(display), surface_(EGL_NO_SURFACE), width_(width), height_(height) {
  const EGLint attributes[] = {EGL_WIDTH, width, EGL_HEIGHT, height, EGL_NONE};
  surface_ = eglCreatePbufferSurface(static_cast<EGLDisplay>(display),
                                     static_cast<EGLConfig>(config), attributes);
  if (surface_ == EGL_NO_SURFACE) {
    throw Tarsa::CError(
        "$$$/Archway/GPU/Error/NoSurface=The off-screen drawing surface could not be made.");
  }
}

POpenGLImage::~POpenGLImage() {
  eglDestroySurface(static_cast<EGLDisplay>(display_), static_cast<EGLSurface>(surface_));
}

}  // namespace Project
