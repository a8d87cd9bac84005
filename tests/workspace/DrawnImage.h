#pragma once

#include <gtest/gtest.h>
#include <algorithm>

#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "framework/view/CNativeWindow.h"

namespace Project::testing {

// An off-screen image to draw on, and what a test reads from it: pixels by
// place and the box of every pixel drawn at all.
class DrawnImage {
 public:
  struct Pixel {
    std::uint8_t r = 0, g = 0, b = 0, a = 0;
    std::uint32_t Rgb() const { return (std::uint32_t(r) << 16) | (std::uint32_t(g) << 8) | b; }
  };
  // Half-open pixel ranges; empty when nothing is drawn.
  struct Box {
    int left = 0, top = 0, right = 0, bottom = 0;
    bool empty = true;
  };

  DrawnImage(int width, int height)
      : image_(Tarsa::CreateOffscreenImage({width, height})), width_(width), height_(height) {}

  Tarsa::CPort& Port() { return image_->Port(); }
  // Reads the pixels back; call after drawing, before the checks.
  void Read() { rgba_ = image_->ReadPixels(); }
  Pixel At(int x, int y) const {
    if (x < 0 || y < 0 || x >= width_ || y >= height_) return {};
    const std::uint8_t* p = &rgba_[(std::size_t(y) * width_ + x) * 4];
    return {p[0], p[1], p[2], p[3]};
  }
  // The most covered pixel within reach of a point, where a 1-pixel pen
  // through the point shows best.
  Pixel Strongest(float x, float y, int reach) const {
    Pixel best;
    for (int dy = -reach; dy <= reach; ++dy) {
      for (int dx = -reach; dx <= reach; ++dx) {
        const Pixel q = At(int(std::floor(x)) + dx, int(std::floor(y)) + dy);
        if (q.a > best.a) best = q;
      }
    }
    return best;
  }
  Box DrawnBox() const {
    Box box;
    for (int y = 0; y < height_; ++y) {
      for (int x = 0; x < width_; ++x) {
        if (At(x, y).a == 0) continue;
        if (box.empty) box = {x, y, x + 1, y + 1, false};
        box.left = std::min(box.left, x);
        box.top = std::min(box.top, y);
        box.right = std::max(box.right, x + 1);
        box.bottom = std::max(box.bottom, y + 1);
      }
    }
    return box;
  }
  // Into the build's artefacts, or the folder ARCHWAY_ARTEFACTS names.
  bool SaveArtefact(const std::string& name) const {
    const char* folder = std::getenv("ARCHWAY_ARTEFACTS");
    const std::string dir =
        folder != nullptr && folder[0] != '\0' ? folder : ARCHWAY_BUILD_ARTEFACTS;
    std::filesystem::create_directories(dir);
    return image_->SavePng(dir + "/" + name);
  }
  int Width() const { return width_; }
  int Height() const { return height_; }

 private:
  std::unique_ptr<Tarsa::COffscreenImage> image_;
  int width_;
  int height_;
  std::vector<std::uint8_t> rgba_;
};

// Colours read back from premultiplied storage: each channel within 2 of
// what was drawn, for pixels at least 40 % covered.
inline void ExpectColour(const DrawnImage::Pixel& p, std::uint32_t argb) {
  ASSERT_GE(p.a, 100) << "nothing drawn";
  EXPECT_NEAR(p.r, (argb >> 16) & 0xFF, 2);
  EXPECT_NEAR(p.g, (argb >> 8) & 0xFF, 2);
  EXPECT_NEAR(p.b, argb & 0xFF, 2);
}

}  // namespace Project::testing
