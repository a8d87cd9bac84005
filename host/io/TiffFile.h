#pragma once

#include <memory>
#include <string>

#include "host/io/HostDocument.h"
#include "host/io/WriteOptions.h"

namespace Host {

// Reads and writes TIFF files with libtiff; a namespace of two operations.
// Reading takes the first image of a file: gray (black- or white-is-zero),
// RGB, CMYK (separated, CMYK ink set) and CIELab or ICC Lab, 8 or 16 bits,
// strips or tiles, interleaved or separate planes, and the first extra
// sample as transparency when it is marked as alpha (premultiplied alpha is
// divided out). Palette, low-depth gray and YCbCr images are read as 8-bit
// RGB or gray. Writing stores any host document interleaved, with
// unpremultiplied alpha. Every libtiff error becomes a HostError naming the
// file; warnings are dropped.
class TiffFile {
 public:
  TiffFile() = delete;

  static std::unique_ptr<HostDocument> Read(const std::string& path);
  // Writes to `path` directly; ImageFile adds the temporary-name protection.
  static void Write(const HostDocument& document, const std::string& path,
                    const WriteOptions& options);
};

}  // namespace Host
