#pragma once

namespace Host {

// How TIFF files are compressed; all are lossless.
enum class TiffCompression { kNone, kLzw, kDeflate };

// Choices a user makes when an image file is written.
struct WriteOptions {
  // JPEG quality, 1 to 100. From 90 on, colour is kept at full resolution
  // rather than halved, as the loss from halving it dominates there.
  int jpegQuality = 92;
  TiffCompression tiffCompression = TiffCompression::kDeflate;
};

}  // namespace Host
