#include "lens/sphere/Image.h"

namespace Project {

Image::Image(std::int32_t width, std::int32_t height, const std::uint8_t* pixels)
    : width(width), height(height), halfWidth(width / 2), halfHeight(height / 2), pixels(pixels) {}

}  // namespace Project
