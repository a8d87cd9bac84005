#pragma once

#include <cstdint>
#include <memory>
#include <span>

#include "framework/pixels/CDisplayPixmap.h"

namespace Tarsa {

// PNG files as the framework's pixmaps: the icon resources' images, and any
// other PNG the program holds in memory. The result is a 32-bit display
// pixmap whose bytes are R, G, B, A with straight alpha; a drawing port that
// wants premultiplied pixels converts as it copies. The decoding itself is
// the native layer's (CPNGDecoder); this side bounds what a file may state
// before a byte of pixels is allocated.
class CPNGFormat {
 public:
  // Larger than any image of the interface; a larger side is refused.
  static constexpr std::uint32_t kMaxSide = 4096;

  // Whether the bytes start with the PNG signature.
  static bool HasSignature(std::span<const std::uint8_t> bytes);

  // The decoded image. CError when the bytes are no PNG, are damaged or
  // truncated, or state a side above maxSide.
  static std::unique_ptr<CDisplayPixmap> Decode(std::span<const std::uint8_t> bytes,
                                                std::uint32_t maxSide = kMaxSide);
};

}  // namespace Tarsa
