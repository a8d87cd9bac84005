#include "framework/native/CairoOffscreenImage.h"

#include <algorithm>

#include "framework/view/CNativeWindow.h"

namespace Tarsa {

std::unique_ptr<COffscreenImage> CreateOffscreenImage(CSize size) {
  return std::make_unique<Native::CairoOffscreenImage>(size);
}

namespace Native {

CairoOffscreenImage::CairoOffscreenImage(CSize size)
    : size_{std::max(1, size.width), std::max(1, size.height)},
      surface_(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, size_.width, size_.height)),
      cairo_(cairo_create(surface_)),
      port_(std::make_unique<CairoPort>(cairo_)) {}

CairoOffscreenImage::~CairoOffscreenImage() {
  port_.reset();
  cairo_destroy(cairo_);
  cairo_surface_destroy(surface_);
}

std::vector<std::uint8_t> CairoOffscreenImage::ReadPixels() const {
  cairo_surface_flush(surface_);
  const unsigned char* data = cairo_image_surface_get_data(surface_);
  const int stride = cairo_image_surface_get_stride(surface_);
  std::vector<std::uint8_t> rgba(std::size_t(size_.width) * std::size_t(size_.height) * 4);
  std::uint8_t* to = rgba.data();
  for (std::int32_t y = 0; y < size_.height; ++y) {
    // cairo keeps premultiplied native-endian ARGB words.
    const auto* row = reinterpret_cast<const std::uint32_t*>(data + std::size_t(y) * stride);
    for (std::int32_t x = 0; x < size_.width; ++x, to += 4) {
      const std::uint32_t word = row[x];
      const std::uint32_t a = word >> 24;
      const auto straight = [a](std::uint32_t c) {
        return std::uint8_t(a == 0 ? 0 : std::min<std::uint32_t>(255, (c * 255 + a / 2) / a));
      };
      to[0] = straight((word >> 16) & 0xFF);
      to[1] = straight((word >> 8) & 0xFF);
      to[2] = straight(word & 0xFF);
      to[3] = std::uint8_t(a);
    }
  }
  return rgba;
}

bool CairoOffscreenImage::SavePng(const std::string& path) const {
  cairo_surface_flush(surface_);
  return cairo_surface_write_to_png(surface_, path.c_str()) == CAIRO_STATUS_SUCCESS;
}

}  // namespace Native
}  // namespace Tarsa
