#include "framework/native/CPNGDecoder.h"

#include <limits>

#include <png.h>

#include "framework/core/CException.h"

namespace Tarsa {
namespace {

constexpr const char* kDamaged = "$$$/Tarsa/PNG/Error/Damaged=The PNG image data is damaged.";

}  // namespace

// libpng's simplified reader: it reports failure by its result rather than
// by a long jump, so no C++ frame is ever skipped.
struct CPNGDecoder::Reader {
  png_image image{};
  bool read = false;
  ~Reader() { png_image_free(&image); }
};

CPNGDecoder::CPNGDecoder(std::span<const std::uint8_t> bytes)
    : reader_(std::make_unique<Reader>()) {
  reader_->image.version = PNG_IMAGE_VERSION;
  if (bytes.empty() ||
      png_image_begin_read_from_memory(&reader_->image, bytes.data(), bytes.size()) == 0) {
    throw CError(kDamaged);
  }
  width_ = reader_->image.width;
  height_ = reader_->image.height;
  if (width_ == 0 || height_ == 0) throw CError(kDamaged);
}

CPNGDecoder::~CPNGDecoder() = default;

void CPNGDecoder::Decode(std::uint8_t* pixels, std::size_t rowBytes) {
  if (reader_->read || rowBytes < std::size_t{width_} * 4 ||
      rowBytes > static_cast<std::size_t>(std::numeric_limits<png_int_32>::max())) {
    throw CError(kDamaged);
  }
  reader_->read = true;
  reader_->image.format = PNG_FORMAT_RGBA;
  // The stride counts components, which are bytes at this depth.
  if (png_image_finish_read(&reader_->image, nullptr, pixels, static_cast<png_int_32>(rowBytes),
                            nullptr) == 0) {
    throw CError(kDamaged);
  }
}

}  // namespace Tarsa
