#pragma once

#define EGL_NO_X11
#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <GL/gl.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

namespace Project::testing {

// The shader the project ships, in the source tree.
inline const std::string kShaderFile =
    std::string(ARCHWAY_REQUIRED_DIR) + "/ArchwayFragmentShader.fsh";

// RGBA bytes of a width x height block at the origin of the read target.
inline std::vector<std::uint8_t> ReadPixels(int width, int height) {
  std::vector<std::uint8_t> pixels(static_cast<std::size_t>(width) * height * 4);
  glPixelStorei(GL_PACK_ALIGNMENT, 1);
  glReadPixels(0, 0, width, height, GL_RGBA, GL_UNSIGNED_BYTE, pixels.data());
  return pixels;
}

// The host's own OpenGL context on the surfaceless display, current while
// the object lives. The display is left initialised, as the manager leaves
// it: terminating unloads Mesa's driver, whose unfreed memory then shows as
// leaks.
class ForeignContext {
 public:
  ForeignContext() {
    const auto platformDisplay = reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(
        eglGetProcAddress("eglGetPlatformDisplayEXT"));
    display_ = platformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
    eglInitialize(display_, nullptr, nullptr);
    eglBindAPI(EGL_OPENGL_API);
    context_ = eglCreateContext(display_, EGL_NO_CONFIG_KHR, EGL_NO_CONTEXT, nullptr);
    eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, context_);
  }
  ~ForeignContext() {
    eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
    eglDestroyContext(display_, context_);
  }
  ForeignContext(const ForeignContext&) = delete;
  ForeignContext& operator=(const ForeignContext&) = delete;

  EGLContext Context() const { return context_; }

 private:
  EGLDisplay display_ = EGL_NO_DISPLAY;
  EGLContext context_ = EGL_NO_CONTEXT;
};

}  // namespace Project::testing
