#include "gpu/POpenGLManager.h"

#define EGL_NO_X11
#include <EGL/egl.h>
#include <EGL/eglext.h>
#include <GL/gl.h>
#include <GL/glext.h>
#include <unistd.h>

#include <climits>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string_view>
#include <type_traits>

#include "framework/core/CException.h"
#include "gpu/OpenGLText.h"
#include "gpu/POpenGLImage.h"

namespace Project {

// The functions loaded by name, in the order they are loaded.
struct POpenGLManager::Functions {
  PFNGLGENFRAMEBUFFERSEXTPROC glGenFramebuffersEXT = nullptr;
  PFNGLBINDFRAMEBUFFEREXTPROC glBindFramebufferEXT = nullptr;
  PFNGLGENRENDERBUFFERSEXTPROC glGenRenderbuffersEXT = nullptr;
  PFNGLBINDRENDERBUFFEREXTPROC glBindRenderbufferEXT = nullptr;
  PFNGLDELETERENDERBUFFERSEXTPROC glDeleteRenderbuffersEXT = nullptr;
  PFNGLRENDERBUFFERSTORAGEEXTPROC glRenderbufferStorageEXT = nullptr;
  PFNGLFRAMEBUFFERRENDERBUFFEREXTPROC glFramebufferRenderbufferEXT = nullptr;
  PFNGLCHECKFRAMEBUFFERSTATUSEXTPROC glCheckFramebufferStatusEXT = nullptr;
  PFNGLDELETEFRAMEBUFFERSEXTPROC glDeleteFramebuffersEXT = nullptr;
  PFNGLUSEPROGRAMPROC glUseProgram = nullptr;
  PFNGLDELETEPROGRAMPROC glDeleteProgram = nullptr;
  PFNGLGETUNIFORMLOCATIONPROC glGetUniformLocation = nullptr;
  PFNGLUNIFORM2FPROC glUniform2f = nullptr;
  PFNGLUNIFORM4FPROC glUniform4f = nullptr;
  PFNGLCREATEPROGRAMPROC glCreateProgram = nullptr;
  PFNGLLINKPROGRAMPROC glLinkProgram = nullptr;
  PFNGLVALIDATEPROGRAMPROC glValidateProgram = nullptr;
  PFNGLGETPROGRAMIVPROC glGetProgramiv = nullptr;
  PFNGLGETPROGRAMINFOLOGPROC glGetProgramInfoLog = nullptr;
  PFNGLCREATESHADERPROC glCreateShader = nullptr;
  PFNGLSHADERSOURCEPROC glShaderSource = nullptr;
  PFNGLCOMPILESHADERPROC glCompileShader = nullptr;
  PFNGLGETSHADERIVPROC glGetShaderiv = nullptr;
  PFNGLGETSHADERINFOLOGPROC glGetShaderInfoLog = nullptr;
  PFNGLATTACHSHADERPROC glAttachShader = nullptr;
  PFNGLDELETESHADERPROC glDeleteShader = nullptr;

  // glDeleteRenderbuffersEXT is not required: without it the render buffer
  // goes with the context.
  bool HasFramebuffer() const {
    return glGenFramebuffersEXT && glBindFramebufferEXT && glGenRenderbuffersEXT &&
           glBindRenderbufferEXT && glRenderbufferStorageEXT && glFramebufferRenderbufferEXT &&
           glCheckFramebufferStatusEXT && glDeleteFramebuffersEXT;
  }

  bool HasShader() const {
    return glUseProgram && glDeleteProgram && glGetUniformLocation && glUniform2f && glUniform4f &&
           glCreateProgram && glLinkProgram && glValidateProgram && glGetProgramiv &&
           glGetProgramInfoLog && glCreateShader && glShaderSource && glCompileShader &&
           glGetShaderiv && glGetShaderInfoLog && glAttachShader && glDeleteShader;
  }
};

namespace {

constexpr const char* kLogName = "Shader Result.log";
constexpr std::size_t kInfoLogSize = 1024;

// Whether a space-separated EGL list holds token.
bool HasToken(const char* list, std::string_view token) {
  if (list == nullptr) return false;
  std::string_view rest(list);
  while (!rest.empty()) {
    const std::size_t end = rest.find(' ');
    if (rest.substr(0, end) == token) return true;
    if (end == std::string_view::npos) break;
    rest.remove_prefix(end + 1);
  }
  return false;
}

// A display that is initialised and offers OpenGL, or EGL_NO_DISPLAY. Only a
// display this call initialised in vain is terminated again.
EGLDisplay UsableDisplay(EGLDisplay display) {
  if (display == EGL_NO_DISPLAY) return EGL_NO_DISPLAY;
  // Answers only on an initialised display.
  const bool already = eglQueryString(display, EGL_VERSION) != nullptr;
  EGLint major = 0;
  EGLint minor = 0;
  if (!already && eglInitialize(display, &major, &minor) != EGL_TRUE) return EGL_NO_DISPLAY;
  if (!HasToken(eglQueryString(display, EGL_CLIENT_APIS), "OpenGL")) {
    if (!already) eglTerminate(display);
    return EGL_NO_DISPLAY;
  }
  return display;
}

// The first hardware device's display. Mesa lists its software renderer as a
// device too; that one is no better than the surfaceless platform.
EGLDisplay DeviceDisplay(const char* clientExtensions) {
  if (!HasToken(clientExtensions, "EGL_EXT_platform_device")) return EGL_NO_DISPLAY;
  const auto queryDevices =
      reinterpret_cast<PFNEGLQUERYDEVICESEXTPROC>(eglGetProcAddress("eglQueryDevicesEXT"));
  const auto queryDeviceString = reinterpret_cast<PFNEGLQUERYDEVICESTRINGEXTPROC>(
      eglGetProcAddress("eglQueryDeviceStringEXT"));
  const auto platformDisplay = reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(
      eglGetProcAddress("eglGetPlatformDisplayEXT"));
  if (!queryDevices || !queryDeviceString || !platformDisplay) return EGL_NO_DISPLAY;
  EGLDeviceEXT devices[16];
  EGLint count = 0;
  if (queryDevices(16, devices, &count) != EGL_TRUE) return EGL_NO_DISPLAY;
  for (EGLint i = 0; i < count; ++i) {
    if (HasToken(queryDeviceString(devices[i], EGL_EXTENSIONS), "EGL_MESA_device_software")) {
      continue;
    }
    const EGLDisplay display =
        UsableDisplay(platformDisplay(EGL_PLATFORM_DEVICE_EXT, devices[i], nullptr));
    if (display != EGL_NO_DISPLAY) return display;
  }
  return EGL_NO_DISPLAY;
}

// A GPU's device display, else Mesa's surfaceless platform (llvmpipe where
// there is no GPU), else the default display.
EGLDisplay AcquireDisplay() {
  const char* clientExtensions = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
  EGLDisplay display = DeviceDisplay(clientExtensions);
  if (display != EGL_NO_DISPLAY) return display;
  if (HasToken(clientExtensions, "EGL_MESA_platform_surfaceless")) {
    const auto platformDisplay = reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(
        eglGetProcAddress("eglGetPlatformDisplayEXT"));
    if (platformDisplay) {
      display = UsableDisplay(
          platformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr));
      if (display != EGL_NO_DISPLAY) return display;
    }
  }
  return UsableDisplay(eglGetDisplay(EGL_DEFAULT_DISPLAY));
}

std::string ExecutablePath() {
  char buffer[PATH_MAX];
  const ssize_t length = readlink("/proc/self/exe", buffer, sizeof buffer);
  if (length <= 0 || static_cast<std::size_t>(length) >= sizeof buffer) return {};
  return std::string(buffer, static_cast<std::size_t>(length));
}

std::string CurrentVersionText() {
  const GLubyte* text = glGetString(GL_VERSION);
  return text != nullptr ? std::string(reinterpret_cast<const char*>(text)) : std::string();
}

}  // namespace

POpenGLManager::POpenGLManager(std::uint32_t surfaceFormat, std::string logDirectory)
    : surfaceFormat_(surfaceFormat),
      functions_(std::make_unique<Functions>()),
      logDirectory_(std::move(logDirectory)) {}

POpenGLManager::~POpenGLManager() { Shutdown(); }

void POpenGLManager::SetFunctionLoader(FunctionLoader loader) { loader_ = std::move(loader); }

void POpenGLManager::SetVersionSource(VersionSource source) { versionSource_ = std::move(source); }

void POpenGLManager::SetShaderPath(std::string path) { shaderPath_ = std::move(path); }

bool POpenGLManager::Initialize() {
  Shutdown();
  framebufferPath_ = true;
  const bool built = CreateWindowPath();
  windowPathStage_ = failureStage_;
  if (!built || !HasVersion21()) {
    Shutdown();
    framebufferPath_ = false;
    return CreateFallbackPath();
  }
  return true;
}

bool POpenGLManager::CreateWindowPath() {
  failureStage_ = 0;
  if (!OpenDisplay()) return false;
  // No surface where the display lets a context be current without one,
  // else the smallest pixel buffer. Drawing goes to the framebuffer object
  // either way.
  const EGLDisplay display = display_;
  if (!HasToken(eglQueryString(display, EGL_EXTENSIONS), "EGL_KHR_surfaceless_context")) {
    const EGLint attributes[] = {EGL_WIDTH, 1, EGL_HEIGHT, 1, EGL_NONE};
    windowSurface_ = eglCreatePbufferSurface(display, config_, attributes);
    if (windowSurface_ == EGL_NO_SURFACE) {
      windowSurface_ = nullptr;
      failureStage_ = 2;
      return false;
    }
  }
  if (!CreateContext()) return false;
  LoadFunctions();

  const Functions& f = *functions_;
  if (!f.HasFramebuffer()) {
    ReleaseCurrent();
    failureStage_ = 7;
    return false;
  }
  // The target is a fixed 128 x 128: a context that takes no buffer or
  // viewport that large is refused here rather than handed one.
  GLint mostBuffer = 0;
  GLint mostViewport[2] = {0, 0};
  glGetIntegerv(GL_MAX_RENDERBUFFER_SIZE_EXT, &mostBuffer);
  glGetIntegerv(GL_MAX_VIEWPORT_DIMS, mostViewport);
  if (mostBuffer < kSurfaceSize || mostViewport[0] < kSurfaceSize ||
      mostViewport[1] < kSurfaceSize) {
    ReleaseCurrent();
    failureStage_ = 8;
    return false;
  }
  f.glGenFramebuffersEXT(1, &framebuffer_);
  f.glBindFramebufferEXT(GL_FRAMEBUFFER_EXT, framebuffer_);
  f.glGenRenderbuffersEXT(1, &renderbuffer_);
  f.glBindRenderbufferEXT(GL_RENDERBUFFER_EXT, renderbuffer_);
  f.glRenderbufferStorageEXT(GL_RENDERBUFFER_EXT, surfaceFormat_, kSurfaceSize, kSurfaceSize);
  f.glFramebufferRenderbufferEXT(GL_FRAMEBUFFER_EXT, GL_COLOR_ATTACHMENT0_EXT, GL_RENDERBUFFER_EXT,
                                 renderbuffer_);
  if (f.glCheckFramebufferStatusEXT(GL_FRAMEBUFFER_EXT) != GL_FRAMEBUFFER_COMPLETE_EXT) {
    ReleaseCurrent();
    failureStage_ = 8;
    return false;
  }
  f.glBindFramebufferEXT(GL_FRAMEBUFFER_EXT, 0);

  // A shader that cannot be had leaves plain texturing; the path stands.
  if (f.HasShader()) LoadShader();
  ReleaseCurrent();
  return true;
}

bool POpenGLManager::CreateFallbackPath() {
  failureStage_ = 0;
  if (!OpenDisplay()) return false;
  try {
    fallbackImage_ = std::make_unique<POpenGLImage>(display_, config_, kSurfaceSize, kSurfaceSize);
  } catch (const Tarsa::CException&) {
    failureStage_ = 2;
    return false;
  }
  if (!CreateContext()) return false;
  ReleaseCurrent();
  return true;
}

bool POpenGLManager::OpenDisplay() {
  if (display_ == nullptr) {
    display_ = AcquireDisplay();
    if (display_ == EGL_NO_DISPLAY) {
      display_ = nullptr;
      failureStage_ = 1;
      return false;
    }
  }
  // What the surfaces need: RGBA of 8 bits each, OpenGL, pixel buffers.
  // Depth and stencil are not asked for; all drawing goes to a colour-only
  // target.
  // clang-format off
  const EGLint attributes[] = {EGL_SURFACE_TYPE, EGL_PBUFFER_BIT,
                               EGL_RENDERABLE_TYPE, EGL_OPENGL_BIT,
                               EGL_RED_SIZE, 8, EGL_GREEN_SIZE, 8,
                               EGL_BLUE_SIZE, 8, EGL_ALPHA_SIZE, 8,
                               EGL_NONE};
  // clang-format on
  EGLConfig config = nullptr;
  EGLint count = 0;
  if (eglChooseConfig(display_, attributes, &config, 1, &count) != EGL_TRUE || count < 1) {
    failureStage_ = 3;
    return false;
  }
  config_ = config;
  return true;
}

bool POpenGLManager::CreateContext() {
  // The API is the thread's state: bound only for the creation, then the
  // caller's is back.
  const EGLenum api = eglQueryAPI();
  EGLContext context = EGL_NO_CONTEXT;
  if (eglBindAPI(EGL_OPENGL_API) == EGL_TRUE) {
    const EGLint compatibility[] = {EGL_CONTEXT_OPENGL_PROFILE_MASK,
                                    EGL_CONTEXT_OPENGL_COMPATIBILITY_PROFILE_BIT, EGL_NONE};
    context = eglCreateContext(display_, config_, EGL_NO_CONTEXT, compatibility);
    // EGL before 1.5 knows no profile attribute; its contexts are
    // compatibility contexts anyway.
    if (context == EGL_NO_CONTEXT) {
      context = eglCreateContext(display_, config_, EGL_NO_CONTEXT, nullptr);
    }
  }
  eglBindAPI(api);
  if (context == EGL_NO_CONTEXT) {
    failureStage_ = 6;
    return false;
  }
  renderContext_ = context;
  MakeCurrent();
  if (!madeCurrent_) {
    eglDestroyContext(display_, context);
    renderContext_ = nullptr;
    failureStage_ = 6;
    return false;
  }
  return true;
}

void POpenGLManager::LoadFunctions() {
  const FunctionLoader loader = loader_ ? loader_ : [](const char* name) {
    return reinterpret_cast<void*>(eglGetProcAddress(name));
  };
  Functions& f = *functions_;
  const auto load = [&loader](auto& function, const char* name) {
    function = reinterpret_cast<std::remove_reference_t<decltype(function)>>(loader(name));
  };
  load(f.glGenFramebuffersEXT, "glGenFramebuffersEXT");
  load(f.glBindFramebufferEXT, "glBindFramebufferEXT");
  load(f.glGenRenderbuffersEXT, "glGenRenderbuffersEXT");
  load(f.glBindRenderbufferEXT, "glBindRenderbufferEXT");
  load(f.glDeleteRenderbuffersEXT, "glDeleteRenderbuffersEXT");
  load(f.glRenderbufferStorageEXT, "glRenderbufferStorageEXT");
  load(f.glFramebufferRenderbufferEXT, "glFramebufferRenderbufferEXT");
  load(f.glCheckFramebufferStatusEXT, "glCheckFramebufferStatusEXT");
  load(f.glDeleteFramebuffersEXT, "glDeleteFramebuffersEXT");
  load(f.glUseProgram, "glUseProgram");
  load(f.glDeleteProgram, "glDeleteProgram");
  load(f.glGetUniformLocation, "glGetUniformLocation");
  load(f.glUniform2f, "glUniform2f");
  load(f.glUniform4f, "glUniform4f");
  load(f.glCreateProgram, "glCreateProgram");
  load(f.glLinkProgram, "glLinkProgram");
  load(f.glValidateProgram, "glValidateProgram");
  load(f.glGetProgramiv, "glGetProgramiv");
  load(f.glGetProgramInfoLog, "glGetProgramInfoLog");
  load(f.glCreateShader, "glCreateShader");
  load(f.glShaderSource, "glShaderSource");
  load(f.glCompileShader, "glCompileShader");
  load(f.glGetShaderiv, "glGetShaderiv");
  load(f.glGetShaderInfoLog, "glGetShaderInfoLog");
  load(f.glAttachShader, "glAttachShader");
  load(f.glDeleteShader, "glDeleteShader");
}

std::string POpenGLManager::ShaderPath() const {
  if (!shaderPath_.empty()) return shaderPath_;
  return ShaderPathFromExecutable(ExecutablePath()).value_or(std::string());
}

void POpenGLManager::LoadShader() {
  shaderReady_ = false;
  const std::string path = ShaderPath();
  if (path.empty()) return;
  std::ifstream file(path, std::ios::binary);
  if (!file) return;
  // A log that cannot be opened is no failure of the shader.
  std::ofstream log;
  if (!logDirectory_.empty()) {
    log.open(std::filesystem::path(logDirectory_) / kLogName, std::ios::binary | std::ios::trunc);
  }
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  file.close();

  const Functions& f = *functions_;
  const GLuint program = f.glCreateProgram();
  const GLuint shader = f.glCreateShader(GL_FRAGMENT_SHADER);
  const GLchar* source = text.c_str();
  f.glShaderSource(shader, 1, &source, nullptr);
  f.glCompileShader(shader);
  GLint compiled = GL_FALSE;
  f.glGetShaderiv(shader, GL_COMPILE_STATUS, &compiled);

  char info[kInfoLogSize] = {};
  if (compiled == GL_TRUE) {
    f.glAttachShader(program, shader);
    f.glLinkProgram(program);
    f.glValidateProgram(program);
    f.glDeleteShader(shader);
    GLint valid = GL_FALSE;
    f.glGetProgramiv(program, GL_VALIDATE_STATUS, &valid);
    if (valid == GL_TRUE) {
      if (log.is_open()) log << "Shader Linked Success.\n";
      shaderProgram_ = program;
      shaderReady_ = true;
      return;
    }
    f.glGetProgramInfoLog(program, kInfoLogSize, nullptr, info);
  } else {
    f.glGetShaderInfoLog(shader, kInfoLogSize, nullptr, info);
    f.glDeleteShader(shader);
  }
  if (log.is_open()) log << info;
  f.glDeleteProgram(program);
}

void POpenGLManager::GetVersion(int& major, int& minor) {
  major = 0;
  minor = 0;
  if (failureStage_ != 0 || renderContext_ == nullptr) return;
  const bool wasCurrent = madeCurrent_;
  MakeCurrent();
  if (!madeCurrent_) return;
  ParseOpenGLVersion(versionSource_ ? versionSource_() : CurrentVersionText(), major, minor);
  if (!wasCurrent) ReleaseCurrent();
}

bool POpenGLManager::HasVersion21() {
  int major = 0;
  int minor = 0;
  GetVersion(major, minor);
  return major > 2 || (major == 2 && minor >= 1);
}

void POpenGLManager::MakeCurrent() {
  if (renderContext_ == nullptr) return;
  if (!madeCurrent_) {
    // What the thread had, to be put back by ReleaseCurrent. The current
    // context is asked for under OpenGL, the API this context is of.
    savedApi_ = eglQueryAPI();
    eglBindAPI(EGL_OPENGL_API);
    savedDisplay_ = eglGetCurrentDisplay();
    savedDrawSurface_ = eglGetCurrentSurface(EGL_DRAW);
    savedReadSurface_ = eglGetCurrentSurface(EGL_READ);
    savedRenderContext_ = eglGetCurrentContext();
  }
  EGLSurface surface = EGL_NO_SURFACE;
  if (fallbackImage_ != nullptr) {
    surface = fallbackImage_->Surface();
  } else if (windowSurface_ != nullptr) {
    surface = windowSurface_;
  }
  if (eglMakeCurrent(display_, surface, surface, renderContext_) != EGL_TRUE) {
    if (!madeCurrent_) eglBindAPI(savedApi_);
    return;
  }
  madeCurrent_ = true;
  if (framebufferPath_ && framebuffer_ != 0) {
    functions_->glBindFramebufferEXT(GL_FRAMEBUFFER_EXT, framebuffer_);
  }
}

void POpenGLManager::ReleaseCurrent() {
  if (!madeCurrent_) return;
  if (framebufferPath_ && framebuffer_ != 0)
    functions_->glBindFramebufferEXT(GL_FRAMEBUFFER_EXT, 0);
  if (savedRenderContext_ != EGL_NO_CONTEXT) {
    eglMakeCurrent(savedDisplay_, savedDrawSurface_, savedReadSurface_, savedRenderContext_);
  } else {
    eglMakeCurrent(display_, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
  }
  eglBindAPI(savedApi_);
  madeCurrent_ = false;
}

int POpenGLManager::MaxTextureSize() {
  if (maxTextureSize_ <= 0) {
    GLint size = 0;
    glGetIntegerv(GL_MAX_TEXTURE_SIZE, &size);
    maxTextureSize_ = size;
  }
  return maxTextureSize_;
}

void POpenGLManager::UseShader() {
  if (shaderReady_) functions_->glUseProgram(shaderProgram_);
}

void POpenGLManager::SetShaderSizes(float texelWidth, float texelHeight, float width, float height,
                                    const float pictureTexels[4]) {
  if (!shaderReady_) return;
  const Functions& f = *functions_;
  f.glUniform2f(f.glGetUniformLocation(shaderProgram_, "texelSize"), texelWidth, texelHeight);
  f.glUniform2f(f.glGetUniformLocation(shaderProgram_, "textureSize"), width, height);
  f.glUniform4f(f.glGetUniformLocation(shaderProgram_, "pictureTexels"), pictureTexels[0],
                pictureTexels[1], pictureTexels[2], pictureTexels[3]);
}

void POpenGLManager::SetShaderCover(const float circle[4], const float scale[4]) {
  if (!shaderReady_) return;
  const Functions& f = *functions_;
  f.glUniform4f(f.glGetUniformLocation(shaderProgram_, "coverCircle"), circle[0], circle[1],
                circle[2], circle[3]);
  f.glUniform4f(f.glGetUniformLocation(shaderProgram_, "coverScale"), scale[0], scale[1], scale[2],
                scale[3]);
}

void POpenGLManager::Shutdown() {
  // GL objects go while the context is current; the context takes the rest.
  if (renderContext_ != nullptr && (shaderReady_ || framebuffer_ != 0 || renderbuffer_ != 0)) {
    MakeCurrent();
    if (madeCurrent_) {
      const Functions& f = *functions_;
      if (shaderReady_) f.glDeleteProgram(shaderProgram_);
      if (framebuffer_ != 0) {
        f.glBindFramebufferEXT(GL_FRAMEBUFFER_EXT, 0);
        f.glDeleteFramebuffersEXT(1, &framebuffer_);
      }
      if (renderbuffer_ != 0 && f.glDeleteRenderbuffersEXT) {
        f.glDeleteRenderbuffersEXT(1, &renderbuffer_);
      }
      framebuffer_ = 0;
    }
  }
  shaderReady_ = false;
  shaderProgram_ = 0;
  framebuffer_ = 0;
  renderbuffer_ = 0;
  ReleaseCurrent();

  if (renderContext_ != nullptr) eglDestroyContext(display_, renderContext_);
  renderContext_ = nullptr;
  if (windowSurface_ != nullptr) eglDestroySurface(display_, windowSurface_);
  windowSurface_ = nullptr;
  fallbackImage_.reset();
  // The display stays initialised (see the class comment).
  display_ = nullptr;
  config_ = nullptr;
  *functions_ = Functions{};
}

}  // namespace Project
