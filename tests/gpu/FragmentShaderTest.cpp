#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "gpu/POpenGLManager.h"
#include "tests/gpu/GpuTestSupport.h"

namespace Project {
namespace {

using GpuTest::kShaderFile;
using GpuTest::ReadPixels;

constexpr int kWidth = 4;
constexpr int kHeight = 4;

// Draws the texture through the shader into a viewport of width x height,
// the quad's texture coordinates running from (u0, v0) to (u1, v1).
class FragmentShader : public testing::Test {
 protected:
  void SetUp() override {
    manager_.SetShaderPath(kShaderFile);
    ASSERT_TRUE(manager_.Initialize());
    ASSERT_TRUE(manager_.ShaderReady());
    manager_.MakeCurrent();

    std::mt19937 random(20240611);  // fixed: the same texels every run
    std::uniform_int_distribution<int> byte(0, 255);
    texels_.resize(kWidth * kHeight * 4);
    for (std::uint8_t& value : texels_) value = static_cast<std::uint8_t>(byte(random));

    glGenTextures(1, &texture_);
    glBindTexture(GL_TEXTURE_2D, texture_);
    glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
    glTexImage2D(GL_TEXTURE_2D, 0, GL_RGBA8, kWidth, kHeight, 0, GL_RGBA, GL_UNSIGNED_BYTE,
                 texels_.data());
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MIN_FILTER, GL_NEAREST);
    glTexParameteri(GL_TEXTURE_2D, GL_TEXTURE_MAG_FILTER, GL_NEAREST);
    // Wrapping stays GL_REPEAT: the shader must keep to the texture itself.
    manager_.UseShader();
    manager_.SetShaderSizes(1.0f / kWidth, 1.0f / kHeight, kWidth, kHeight);
  }

  void TearDown() override {
    glDeleteTextures(1, &texture_);
    manager_.ReleaseCurrent();
  }

  std::vector<std::uint8_t> Draw(int width, int height, float u0, float v0, float u1, float v1) {
    glViewport(0, 0, width, height);
    glClearColor(0.5f, 0.5f, 0.5f, 1.0f);  // anything the draw fails to cover shows
    glClear(GL_COLOR_BUFFER_BIT);
    glBegin(GL_QUADS);
    const float corners[4][2] = {{0, 0}, {1, 0}, {1, 1}, {0, 1}};
    for (const auto& c : corners) {
      glTexCoord2f(c[0] != 0 ? u1 : u0, c[1] != 0 ? v1 : v0);
      glVertex2f(2 * c[0] - 1, 2 * c[1] - 1);
    }
    glEnd();
    return ReadPixels(width, height);
  }

  int Texel(int x, int y, int channel) const {
    x = std::clamp(x, 0, kWidth - 1);
    y = std::clamp(y, 0, kHeight - 1);
    return texels_[(y * kWidth + x) * 4 + channel];
  }

  POpenGLManager manager_{GL_RGBA8};
  GLuint texture_ = 0;
  std::vector<std::uint8_t> texels_;
};

TEST_F(FragmentShader, ReproducesTexelsAtTheirCentresAndIsClearOutside) {
  // Texture coordinates from -0.5 to 1.5 over twice the texture's size: the
  // middle pixels fall on texel centres, the outer ring outside the texture.
  const int width = 2 * kWidth;
  const int height = 2 * kHeight;
  const std::vector<std::uint8_t> pixels = Draw(width, height, -0.5f, -0.5f, 1.5f, 1.5f);
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      const int tx = x - kWidth / 2;
      const int ty = y - kHeight / 2;
      const bool inside = tx >= 0 && tx < kWidth && ty >= 0 && ty < kHeight;
      for (int c = 0; c < 4; ++c) {
        const int expected = inside ? Texel(tx, ty, c) : 0;
        EXPECT_EQ(pixels[(y * width + x) * 4 + c], expected) << x << "," << y << " channel " << c;
      }
    }
  }
}

TEST_F(FragmentShader, MidpointsFollowCatmullRom) {
  // Pixels halfway between neighbouring texel centres along x, on the centres
  // along y. There the kernel's weights are -1/16, 9/16, 9/16, -1/16; beyond
  // the edge the edge texel stands in.
  const int width = kWidth - 1;
  const float u0 = 0.5f / kWidth;
  const float u1 = (kWidth - 0.5f) / kWidth;
  const std::vector<std::uint8_t> pixels = Draw(width, kHeight, u0, 0.0f, u1, 1.0f);
  for (int y = 0; y < kHeight; ++y) {
    for (int x = 0; x < width; ++x) {
      for (int c = 0; c < 4; ++c) {
        const double value = (-Texel(x - 1, y, c) + 9.0 * Texel(x, y, c) +
                              9.0 * Texel(x + 1, y, c) - Texel(x + 2, y, c)) /
                             16.0;
        const int expected = static_cast<int>(std::lround(std::clamp(value, 0.0, 255.0)));
        // One step: the shader works in float and the result is rounded once
        // more into 8 bits.
        EXPECT_NEAR(pixels[(y * width + x) * 4 + c], expected, 1)
            << x << "," << y << " channel " << c;
      }
    }
  }
}

}  // namespace
}  // namespace Project
