#include "framework/icons/CPNGFormat.h"

#include <algorithm>
#include <array>

#include "framework/core/CException.h"
#include "framework/native/CPNGDecoder.h"

namespace Tarsa {
namespace {

constexpr std::array<std::uint8_t, 8> kSignature = {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'};
constexpr const char* kNotPNG = "$$$/Tarsa/PNG/Error/NotPNG=The image data is not a PNG file.";
constexpr const char* kTooLarge =
    "$$$/Tarsa/PNG/Error/TooLarge=The PNG image is larger than the program accepts.";

}  // namespace

bool CPNGFormat::HasSignature(std::span<const std::uint8_t> bytes) {
  return bytes.size() >= kSignature.size() &&
         std::equal(kSignature.begin(), kSignature.end(), bytes.begin());
}

std::unique_ptr<CDisplayPixmap> CPNGFormat::Decode(std::span<const std::uint8_t> bytes,
                                                   std::uint32_t maxSide) {
  if (!HasSignature(bytes)) throw CError(kNotPNG);
  CPNGDecoder decoder(bytes);
  if (decoder.Width() > maxSide || decoder.Height() > maxSide) throw CError(kTooLarge);
  auto pixmap = std::make_unique<CDisplayPixmap>(32, static_cast<std::int32_t>(decoder.Width()),
                                                 static_cast<std::int32_t>(decoder.Height()));
  decoder.Decode(pixmap->Data(), pixmap->RowBytes());
  return pixmap;
}

}  // namespace Tarsa
