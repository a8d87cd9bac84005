#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "gpu/POpenGLManager.h"
#include "tests/gpu/GpuTestSupport.h"
#include "tests/support/MesaUnderSanitizers.h"

namespace Project {
namespace {

using testing::kShaderFile;
using testing::ReadPixels;

constexpr int kWidth = 4;
constexpr int kHeight = 4;

// Draws the texture through the shader into a viewport of width x height,
// the quad's texture coordinates running from (u0, v0) to (u1, v1).
class FragmentShader : public ::testing::Test {
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
    SetPicture(0, 0, kWidth - 1, kHeight - 1);
  }

  // The texels that hold the picture, first and last on each axis; the
  // rest of the texture is margin.
  void SetPicture(int x0, int y0, int x1, int y1) {
    picture_[0] = x0;
    picture_[1] = y0;
    picture_[2] = x1;
    picture_[3] = y1;
    const float texels[4] = {float(x0), float(y0), float(x1), float(y1)};
    manager_.SetShaderSizes(1.0f / kWidth, 1.0f / kHeight, kWidth, kHeight, texels);
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

  // Draws the midpoints between the picture's neighbouring texel centres
  // along x, on its centres along y, and checks each against the kernel.
  void CheckMidpoints() {
    const int x0 = picture_[0], y0 = picture_[1];
    const int width = picture_[2] - x0;
    const int height = picture_[3] - y0 + 1;
    const std::vector<std::uint8_t> pixels =
        Draw(width, height, (x0 + 0.5f) / kWidth, float(y0) / kHeight, (x0 + width + 0.5f) / kWidth,
             float(y0 + height) / kHeight);
    for (int y = 0; y < height; ++y) {
      for (int x = 0; x < width; ++x) {
        const int tx = x0 + x, ty = y0 + y;
        for (int c = 0; c < 4; ++c) {
          const double value = (-Texel(tx - 1, ty, c) + 9.0 * Texel(tx, ty, c) +
                                9.0 * Texel(tx + 1, ty, c) - Texel(tx + 2, ty, c)) /
                               16.0;
          const int expected = static_cast<int>(std::lround(std::clamp(value, 0.0, 255.0)));
          // One step: the shader works in float and the result is rounded
          // once more into 8 bits.
          EXPECT_NEAR(pixels[(y * width + x) * 4 + c], expected, 1)
              << tx << "," << ty << " channel " << c;
        }
      }
    }
  }

  // The texel the kernel takes for (x, y): the nearest of the picture's.
  int Texel(int x, int y, int channel) const {
    x = std::clamp(x, picture_[0], picture_[2]);
    y = std::clamp(y, picture_[1], picture_[3]);
    return texels_[(y * kWidth + x) * 4 + channel];
  }

  POpenGLManager manager_{GL_RGBA8};
  GLuint texture_ = 0;
  std::vector<std::uint8_t> texels_;
  int picture_[4] = {0, 0, 0, 0};
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

// Pixels halfway between neighbouring texel centres along x, on the centres
// along y. There the kernel's weights are -1/16, 9/16, 9/16, -1/16; beyond
// the picture's edge its edge texel stands in, whether the texture ends
// there or holds a margin (which has texels of its own, never to be read).
TEST_F(FragmentShader, MidpointsFollowCatmullRom) {
  for (const bool margin : {false, true}) {
    SCOPED_TRACE(margin ? "picture inside a margin" : "picture fills the texture");
    if (margin) SetPicture(1, 1, kWidth - 2, kHeight - 2);
    CheckMidpoints();
  }
}

// The picture inside a margin of texels: over the whole texture and beyond,
// pixels on the picture's texel centres show them and everything past the
// picture's edge is clear.
TEST_F(FragmentShader, MarginsAroundThePictureAreClear) {
  SetPicture(1, 1, kWidth - 2, kHeight - 2);
  const int width = 2 * kWidth;
  const int height = 2 * kHeight;
  const std::vector<std::uint8_t> pixels = Draw(width, height, -0.5f, -0.5f, 1.5f, 1.5f);
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x < width; ++x) {
      const int tx = x - kWidth / 2;
      const int ty = y - kHeight / 2;
      const bool inside = tx >= 1 && tx <= kWidth - 2 && ty >= 1 && ty <= kHeight - 2;
      for (int c = 0; c < 4; ++c) {
        const int expected = inside ? Texel(tx, ty, c) : 0;
        EXPECT_EQ(pixels[(y * width + x) * 4 + c], expected) << x << "," << y << " channel " << c;
      }
    }
  }
}

}  // namespace
}  // namespace Project
