#pragma once

namespace Project {

// The memory surface of the OpenGL manager's fallback path: an EGL pixel
// buffer of a fixed size that a context made from the same configuration can
// draw into. It owns the surface only; the display and the configuration stay
// the manager's, and the display must outlive the image. The handles are EGL's
// (EGLDisplay, EGLConfig, EGLSurface), kept opaque here so that this header
// pulls in no platform headers.
class POpenGLImage {
 public:
  // Throws Tarsa::CError when the surface cannot be made.
  POpenGLImage(void* display, void* config, int width, int height);
  ~POpenGLImage();

  POpenGLImage(const POpenGLImage&) = delete;
  POpenGLImage& operator=(const POpenGLImage&) = delete;

  void* Surface() const { return surface_; }
  int Width() const { return width_; }
  int Height() const { return height_; }

 private:
  void* display_;
  void* surface_;
  int width_;
  int height_;
};

}  // namespace Project
