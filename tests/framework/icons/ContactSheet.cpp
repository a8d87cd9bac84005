#include "tests/framework/icons/ContactSheet.h"

#include <png.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>

namespace Tarsa::testing {

ContactSheet::ContactSheet(int width, int height, std::uint32_t background)
    : width_(width), height_(height), rgb_(static_cast<std::size_t>(width) * height * 3) {
  Fill(0, 0, width, height, background);
}

void ContactSheet::Fill(int x, int y, int width, int height, std::uint32_t rgb) {
  for (int row = std::max(y, 0); row < std::min(y + height, height_); ++row) {
    for (int column = std::max(x, 0); column < std::min(x + width, width_); ++column) {
      std::uint8_t* at = &rgb_[(static_cast<std::size_t>(row) * width_ + column) * 3];
      at[0] = static_cast<std::uint8_t>(rgb >> 16);
      at[1] = static_cast<std::uint8_t>(rgb >> 8);
      at[2] = static_cast<std::uint8_t>(rgb);
    }
  }
}

void ContactSheet::Blend(const CDisplayPixmap& image, int x, int y, int width, int height) {
  const CRect bounds = image.Bounds();
  for (int row = 0; row < std::min<std::int64_t>(bounds.Height(), height); ++row) {
    for (int column = 0; column < std::min<std::int64_t>(bounds.Width(), width); ++column) {
      const int sx = x + column;
      const int sy = y + row;
      if (sx < 0 || sy < 0 || sx >= width_ || sy >= height_) continue;
      const std::uint8_t* in = image.Data() + row * image.RowBytes() + column * 4;
      std::uint8_t* out = &rgb_[(static_cast<std::size_t>(sy) * width_ + sx) * 3];
      for (int c = 0; c < 3; ++c) {
        out[c] = static_cast<std::uint8_t>((in[c] * in[3] + out[c] * (255 - in[3]) + 127) / 255);
      }
    }
  }
}

bool ContactSheet::Save(const std::string& path) const {
  std::error_code ignored;
  std::filesystem::create_directories(std::filesystem::path(path).parent_path(), ignored);
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  image.width = static_cast<png_uint_32>(width_);
  image.height = static_cast<png_uint_32>(height_);
  image.format = PNG_FORMAT_RGB;
  return png_image_write_to_file(&image, path.c_str(), 0, rgb_.data(), width_ * 3, nullptr) != 0;
}

std::vector<std::uint8_t> PngOfRgba(int width, int height, const std::vector<std::uint8_t>& rgba) {
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  image.width = static_cast<png_uint_32>(width);
  image.height = static_cast<png_uint_32>(height);
  image.format = PNG_FORMAT_RGBA;
  png_alloc_size_t size = 0;
  if (png_image_write_get_memory_size(image, size, 0, rgba.data(), 0, nullptr) == 0) return {};
  std::vector<std::uint8_t> png(size);
  if (png_image_write_to_memory(&image, png.data(), &size, 0, rgba.data(), 0, nullptr) == 0) {
    return {};
  }
  png.resize(size);
  return png;
}

std::string ArtefactFolder() {
  const char* folder = std::getenv("ARCHWAY_ARTEFACTS");
  if (folder != nullptr && folder[0] != '\0') return folder;
  return ARCHWAY_BUILD_ARTEFACTS;
}

}  // namespace Tarsa::testing
