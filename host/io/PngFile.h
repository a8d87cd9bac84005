#pragma once

#include <memory>
#include <string>

#include "host/io/HostDocument.h"

namespace Host {

// Reads and writes PNG files with libpng; a namespace of two operations.
// Reading gives gray or RGB, 8 or 16 bits, with transparency when the file
// has an alpha channel or a transparent colour; palettes and depths below 8
// are expanded. Writing takes gray and RGB documents, 8 or 16 bits, with or
// without transparency. libpng's errors jump out of the library with
// longjmp; the jumps land in small C-style functions that keep no C++ object
// alive across them, and every error becomes a HostError naming the file.
class PngFile {
 public:
  PngFile() = delete;

  static std::unique_ptr<HostDocument> Read(const std::string& path);
  // Writes to `path` directly; ImageFile adds the temporary-name protection.
  static void Write(const HostDocument& document, const std::string& path);
};

}  // namespace Host
