#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

namespace Project {

class POpenGLImage;

// The rendering stages' private OpenGL context (desktop OpenGL, compatibility
// profile, on EGL) with a 128 x 128 off-screen target, and what it can do.
//
// Two ways to a target. The framebuffer path, tried first: a context made
// current without a surface (or on a 1 x 1 pixel buffer where the display
// cannot do without one), drawing into a framebuffer object whose colour
// attachment is a render buffer of `surfaceFormat`; the fragment shader is
// loaded on this path only. The fallback path, for drivers without
// framebuffer objects or below OpenGL 2.1: a context drawing into a
// POpenGLImage, a 128 x 128 pixel buffer.
//
// The context is current only between MakeCurrent and ReleaseCurrent.
// MakeCurrent notes what was current on the thread (display, surfaces,
// context; the host may have its own) and ReleaseCurrent puts it back, so the
// host's drawing is left as it was.
//
// `FailureStage` says where the last path built stopped:
//   0 none;
//   1 no EGL display could be had and initialised, or OpenGL could not be
//     bound as its API;
//   2 the surface could not be made (the window path's 1 x 1 pixel buffer,
//     or the fallback path's POpenGLImage);
//   3 no configuration draws RGBA 8-bit with OpenGL into pixel buffers;
//   4 never: EGL binds a configuration when a surface or context is made
//     from it, there is no separate step;
//   6 the context could not be made, or not made current;
//   7 one of the eight framebuffer functions is missing;
//   8 the framebuffer is incomplete.
// The fallback path clears it when it starts, so after a successful fallback
// it is 0; `WindowPathStage` keeps why the framebuffer path was given up.
//
// The EGL display, once initialised, is never terminated: a display is shared
// by the whole process and EGL keeps no count of its users, so terminating it
// could pull it from under the host or another manager. Main thread only:
// contexts are tied to their thread.
class POpenGLManager {
 public:
  // Resolves an OpenGL function by name; null when the driver lacks it.
  using FunctionLoader = std::function<void*(const char*)>;
  // The GL_VERSION text, asked while the context is current.
  using VersionSource = std::function<std::string()>;

  static constexpr int kSurfaceSize = 128;

  // surfaceFormat: the render buffer's internal format (GL_RGBA8, GL_RGBA16,
  // ...). logDirectory: where "Shader Result.log" is written; empty for no log.
  explicit POpenGLManager(std::uint32_t surfaceFormat, std::string logDirectory = {});
  ~POpenGLManager();

  POpenGLManager(const POpenGLManager&) = delete;
  POpenGLManager& operator=(const POpenGLManager&) = delete;

  // Replace eglGetProcAddress and glGetString(GL_VERSION), e.g. to stand for
  // an older driver. Set before Initialize.
  void SetFunctionLoader(FunctionLoader loader);
  void SetVersionSource(VersionSource source);
  // The fragment shader's file; by default it is found beside the host
  // executable (ShaderPathFromExecutable). Set before Initialize.
  void SetShaderPath(std::string path);

  // Builds the framebuffer path, or the fallback path when that fails or the
  // version is below 2.1. False when neither could be built. What was current
  // before is current again afterwards.
  bool Initialize();
  // Frees the context, its surfaces and objects, and puts back what was
  // current if the context still is. Safe to call more than once.
  void Shutdown();

  void MakeCurrent();
  void ReleaseCurrent();

  // The context's OpenGL version; 0.0 when there is no context.
  void GetVersion(int& major, int& minor);
  bool HasVersion21();

  bool FramebufferPath() const { return framebufferPath_; }
  int FailureStage() const { return failureStage_; }
  int WindowPathStage() const { return windowPathStage_; }
  bool MadeCurrent() const { return madeCurrent_; }
  bool ShaderReady() const { return shaderReady_; }
  // Draws into the surface so far: a tile drawn ahead is still there to be
  // read back only while no other draw has followed it.
  std::uint64_t DrawCount() const { return drawCount_; }
  // The largest texture side the context takes, asked once; call with the
  // context current.
  int MaxTextureSize();
  void CountDraw() { ++drawCount_; }

  // With the shader ready: use it, and set its uniforms "texelSize",
  // "textureSize" and "pictureTexels" (the first and last texel, x and y,
  // that hold the picture's pixels). Call with the context current.
  void UseShader();
  void SetShaderSizes(float texelWidth, float texelHeight, float width, float height,
                      const float pictureTexels[4]);
  // The shader's anti-aliased edge: "coverCircle" (centre x, y and radius
  // in texels, radius 0 for none) and "coverScale" (per channel, 1 where
  // the covered share scales it).
  void SetShaderCover(const float circle[4], const float scale[4]);

 private:
  struct Functions;

  bool CreateWindowPath();
  bool CreateFallbackPath();
  // Display, API and configuration: stages 1 and 3.
  bool OpenDisplay();
  bool CreateContext();
  void LoadFunctions();
  void LoadShader();
  std::string ShaderPath() const;

  std::uint32_t surfaceFormat_;
  unsigned framebuffer_ = 0;
  unsigned renderbuffer_ = 0;
  unsigned shaderProgram_ = 0;
  bool shaderReady_ = false;
  bool framebufferPath_ = false;

  // EGL handles (EGLDisplay, EGLConfig, EGLSurface, EGLContext).
  void* display_ = nullptr;
  void* config_ = nullptr;
  void* windowSurface_ = nullptr;  // only where the display needs a surface
  void* renderContext_ = nullptr;
  void* savedDisplay_ = nullptr;
  void* savedDrawSurface_ = nullptr;
  void* savedReadSurface_ = nullptr;
  void* savedRenderContext_ = nullptr;
  unsigned savedApi_ = 0;  // EGLenum

  std::unique_ptr<Functions> functions_;
  std::unique_ptr<POpenGLImage> fallbackImage_;
  bool madeCurrent_ = false;
  std::uint64_t drawCount_ = 0;
  int maxTextureSize_ = 0;  // 0 until asked
  int failureStage_ = 0;
  int windowPathStage_ = 0;

  std::string logDirectory_;
  std::string shaderPath_;
  FunctionLoader loader_;
  VersionSource versionSource_;
};

}  // namespace Project
