#include "gpu/POpenGLManager.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "gpu/POpenGLTile.h"
#include "tests/gpu/GpuTestSupport.h"
#include "tests/support/TestSupport.h"

namespace Project {
namespace {

using Tarsa::testing::ReadBytes;
using testing::ForeignContext;
using testing::kShaderFile;
using testing::ReadPixels;

constexpr int kSize = POpenGLManager::kSurfaceSize;

// A loader standing for a driver that lacks one function.
POpenGLManager::FunctionLoader Without(std::string missing) {
  return [missing](const char* name) {
    return missing == name ? nullptr : reinterpret_cast<void*>(eglGetProcAddress(name));
  };
}

// Clears what is current to an RGBA colour and reads the corner back.
std::vector<std::uint8_t> ClearAndRead(std::uint8_t r, std::uint8_t g, std::uint8_t b,
                                       std::uint8_t a, int size) {
  glViewport(0, 0, kSize, kSize);
  glClearColor(r / 255.0f, g / 255.0f, b / 255.0f, a / 255.0f);
  glClear(GL_COLOR_BUFFER_BIT);
  return ReadPixels(size, size);
}

TEST(POpenGLManager, FramebufferPathRendersIntoItsSurface) {
  // Both formats the hub asks for: 8 and 16 bits a channel.
  for (const std::uint32_t format : {GL_RGBA8, GL_RGBA16}) {
    SCOPED_TRACE(format);
    POpenGLManager manager(format);
    ASSERT_TRUE(manager.Initialize());
    EXPECT_TRUE(manager.FramebufferPath());
    EXPECT_EQ(manager.FailureStage(), 0);
    EXPECT_TRUE(manager.HasVersion21());
    EXPECT_EQ(eglGetCurrentContext(), EGL_NO_CONTEXT);  // nothing was current before

    manager.MakeCurrent();
    std::vector<std::uint8_t> expected;
    for (int i = 0; i < kSize * kSize; ++i) expected.insert(expected.end(), {51, 102, 204, 153});
    EXPECT_EQ(ClearAndRead(51, 102, 204, 153, kSize), expected);
    manager.ReleaseCurrent();
    EXPECT_EQ(eglGetCurrentContext(), EGL_NO_CONTEXT);
  }
}

// A texture larger on a side than the context takes, or an empty one, is
// refused in words before the GL is asked for it; one at the limit is made.
TEST(POpenGLManager, TexturesBeyondTheContextsLimitAreRefused) {
  POpenGLManager manager(GL_RGBA8);
  ASSERT_TRUE(manager.Initialize());
  manager.MakeCurrent();
  const int most = manager.MaxTextureSize();
  ASSERT_GE(most, 1024);  // what any OpenGL 2.1 context offers
  POpenGLTilePass pass;
  pass.textureFormat = GL_RGBA8;
  pass.pixelFormat = GL_RGBA;
  pass.pixelType = GL_UNSIGNED_BYTE;
  for (const auto& [width, height] : {std::pair{most + 1, 1}, {1, most + 1}, {0, 16}, {16, -1}}) {
    SCOPED_TRACE(::testing::Message() << width << " x " << height);
    pass.textureWidth = width;
    pass.textureHeight = height;
    std::uint32_t texture = 0;
    EXPECT_THROW(DefineTileTexture(manager, texture, pass), Tarsa::CError);
    EXPECT_EQ(texture, 0u);
  }
  EXPECT_EQ(glGetError(), GLenum(GL_NO_ERROR));
  pass.textureWidth = most;
  pass.textureHeight = 1;
  std::uint32_t texture = 0;
  EXPECT_NO_THROW(DefineTileTexture(manager, texture, pass));
  EXPECT_NE(texture, 0u);
  // A region reaching outside the texture, or rows shorter than the region,
  // is refused before the GL reads the texels.
  const std::vector<std::uint8_t> texels(std::size_t(most) * 4);
  EXPECT_THROW(FillTileTexture(texture, pass, 1, 0, most, 1, texels.data(), most), Tarsa::CError);
  EXPECT_THROW(FillTileTexture(texture, pass, 0, 0, 2, 2, texels.data(), 2), Tarsa::CError);
  EXPECT_THROW(FillTileTexture(texture, pass, 0, 0, 2, 1, texels.data(), 1), Tarsa::CError);
  EXPECT_NO_THROW(FillTileTexture(texture, pass, 0, 0, most, 1, texels.data(), most));
  const GLuint name = texture;
  glDeleteTextures(1, &name);
  EXPECT_EQ(glGetError(), GLenum(GL_NO_ERROR));
  manager.ReleaseCurrent();
}

TEST(POpenGLManager, MissingFramebufferFunctionFallsBackToAPixelBuffer) {
  for (const char* name :
       {"glGenFramebuffersEXT", "glBindFramebufferEXT", "glGenRenderbuffersEXT",
        "glBindRenderbufferEXT", "glRenderbufferStorageEXT", "glFramebufferRenderbufferEXT",
        "glCheckFramebufferStatusEXT", "glDeleteFramebuffersEXT"}) {
    SCOPED_TRACE(name);
    POpenGLManager manager(GL_RGBA8);
    manager.SetFunctionLoader(Without(name));
    manager.SetShaderPath(kShaderFile);
    ASSERT_TRUE(manager.Initialize());
    EXPECT_FALSE(manager.FramebufferPath());
    EXPECT_EQ(manager.WindowPathStage(), 7);
    EXPECT_EQ(manager.FailureStage(), 0);  // the fallback succeeded
    EXPECT_FALSE(manager.ShaderReady());

    manager.MakeCurrent();  // the pixel buffer is a working target
    EXPECT_EQ(ClearAndRead(255, 0, 0, 255, 1), (std::vector<std::uint8_t>{255, 0, 0, 255}));
    manager.ReleaseCurrent();
  }

  // Deleting render buffers is not required.
  POpenGLManager lenient(GL_RGBA8);
  lenient.SetFunctionLoader(Without("glDeleteRenderbuffersEXT"));
  ASSERT_TRUE(lenient.Initialize());
  EXPECT_TRUE(lenient.FramebufferPath());
}

TEST(POpenGLManager, IncompleteFramebufferOrOldVersionTakesTheFallback) {
  POpenGLManager incomplete(GL_DEPTH_COMPONENT24);  // no colour attachment format
  ASSERT_TRUE(incomplete.Initialize());
  EXPECT_EQ(incomplete.WindowPathStage(), 8);
  EXPECT_FALSE(incomplete.FramebufferPath());

  POpenGLManager old(GL_RGBA8);
  old.SetVersionSource([] { return std::string("2.0.1"); });
  old.SetShaderPath(kShaderFile);
  ASSERT_TRUE(old.Initialize());
  EXPECT_FALSE(old.FramebufferPath());
  EXPECT_EQ(old.WindowPathStage(), 0);
  EXPECT_FALSE(old.ShaderReady());
}

TEST(POpenGLManager, LeavesTheHostsContextCurrent) {
  ForeignContext host;
  POpenGLManager manager(GL_RGBA8);
  ASSERT_TRUE(manager.Initialize());
  EXPECT_EQ(eglGetCurrentContext(), host.Context());

  manager.MakeCurrent();
  EXPECT_NE(eglGetCurrentContext(), host.Context());
  manager.MakeCurrent();  // again: what it puts back stays the host's
  manager.ReleaseCurrent();
  EXPECT_EQ(eglGetCurrentContext(), host.Context());

  manager.MakeCurrent();  // shut down while current
  manager.Shutdown();
  EXPECT_EQ(eglGetCurrentContext(), host.Context());
}

TEST(POpenGLManager, ShaderResultIsLogged) {
  Tarsa::testing::ScratchFolder folder;
  const std::string log = folder.File("Shader Result.log");
  POpenGLManager manager(GL_RGBA8, folder.Dir());
  manager.SetShaderPath(kShaderFile);
  ASSERT_TRUE(manager.Initialize());
  EXPECT_TRUE(manager.ShaderReady());
  EXPECT_EQ(ReadBytes(log), "Shader Linked Success.\n");

  folder.Put("broken.fsh", "#version 120\nvoid main() { gl_FragColor = undefinedThing; }\n");
  manager.SetShaderPath(folder.File("broken.fsh"));
  ASSERT_TRUE(manager.Initialize());
  EXPECT_TRUE(manager.FramebufferPath());
  EXPECT_FALSE(manager.ShaderReady());
  EXPECT_NE(ReadBytes(log).find("undefinedThing"), std::string::npos) << ReadBytes(log);

  // No file: no shader and no log, the path still stands.
  std::filesystem::remove(log);
  manager.SetShaderPath(folder.File("absent.fsh"));
  ASSERT_TRUE(manager.Initialize());
  EXPECT_TRUE(manager.FramebufferPath());
  EXPECT_FALSE(manager.ShaderReady());
  EXPECT_FALSE(std::filesystem::exists(log));
}

}  // namespace
}  // namespace Project
