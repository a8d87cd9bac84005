#pragma once

#include <cstdint>
#include <vector>

#include "host/io/HostDocument.h"

namespace Measure {

// An image as the line meter sees it: each pixel's lightness, whether it
// lies outside the picture, and how much ink (darkness below the plain
// background) it holds. Outside are transparent pixels and the near-black
// region joined to the image's border that a corrected image has where the
// photograph did not reach, widened by a few pixels to take in the blurred
// rim between it and the picture. The background's lightness is the median
// over the picture: the images measured are mostly plain light ground.
// Reads gray, RGB and Lab images of either depth; throws MeasureError for
// CMYK. A value, built once per image.
class DarkMap {
 public:
  // Pixels darker than this fraction of the background's lightness are
  // dark: halfway between the ground and ink about a tenth as light.
  static constexpr double kDarkFraction = 0.55;

  explicit DarkMap(const Host::HostDocument& image);

  int Width() const { return width_; }
  int Height() const { return height_; }
  double Background() const { return background_; }

  bool Outside(int x, int y) const { return outside_[Index(x, y)] != 0; }
  float Lightness(int x, int y) const { return lightness_[Index(x, y)]; }
  // Not outside and darker than kDarkFraction of the background.
  bool Dark(int x, int y) const;
  // The background's lightness less the pixel's, less a little for sample
  // rounding; 0 outside and where the pixel is as light as the ground.
  float Ink(int x, int y) const;

 private:
  std::size_t Index(int x, int y) const { return static_cast<std::size_t>(y) * width_ + x; }
  void MarkOutside(const Host::HostDocument& image);

  int width_;
  int height_;
  std::vector<float> lightness_;
  std::vector<std::uint8_t> outside_;
  double background_ = 1.0;
};

}  // namespace Measure
