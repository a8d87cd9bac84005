#pragma once

#include <cstdint>

namespace Project {

// The photograph as the sphere image models see it: its size and, when there
// is one, a borrowed buffer of 3 bytes a pixel, row after row. The images that
// the solvers build carry the size alone. Shared between models through
// std::shared_ptr<const Image>; whoever supplies the pixels keeps them alive
// for as long as the image is in use.
class Image {
 public:
  Image(std::int32_t width, std::int32_t height, const std::uint8_t* pixels = nullptr);
  Image(const Image&) = delete;
  Image& operator=(const Image&) = delete;

  float LongerSide() const { return static_cast<float>(width > height ? width : height); }

  const std::int32_t width;
  const std::int32_t height;
  const std::int32_t halfWidth;   // width / 2, rounded down
  const std::int32_t halfHeight;  // height / 2, rounded down
  const std::uint8_t* const pixels;
};

}  // namespace Project
