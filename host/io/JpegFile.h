#pragma once

#include <memory>
#include <string>

#include "host/io/HostDocument.h"

namespace Host {

// Reads and writes JPEG files with libjpeg; a namespace of two operations.
// JPEG holds 8-bit gray, RGB and CMYK without transparency. CMYK is written
// as most tools write it, with the Adobe marker and samples counting paper
// (255 no ink), which is the host's own convention; CMYK files without that
// marker count ink and are turned round on reading. A file that ends before
// its image does is refused rather than completed with gray. libjpeg's errors
// jump out of the library with longjmp; the jumps land in small C-style
// functions that keep no C++ object alive across them, and every error
// becomes a HostError naming the file; warnings are dropped.
class JpegFile {
 public:
  JpegFile() = delete;

  static std::unique_ptr<HostDocument> Read(const std::string& path);
  // Writes to `path` directly; ImageFile adds the temporary-name protection.
  // `quality` runs from 1 to 100.
  static void Write(const HostDocument& document, const std::string& path, int quality);
};

}  // namespace Host
