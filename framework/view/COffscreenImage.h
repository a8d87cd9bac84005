#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "framework/core/CRect.h"
#include "framework/view/CPort.h"

namespace Tarsa {

// An image in memory with a port that draws into it, instead of into a
// window: for drawing off screen (a loupe's buffer, composed before it is
// shown) and for checking drawing pixel by pixel. The image starts fully
// transparent. It owns its pixels and its port; the port lives as long as
// the image, and the owner reads the pixels back at any time.
class COffscreenImage {
 public:
  virtual ~COffscreenImage() = default;

  virtual CPort& Port() = 0;
  virtual CSize Size() const = 0;
  // The image as rows of 8-bit RGBA, 4 * width bytes each, straight alpha.
  virtual std::vector<std::uint8_t> ReadPixels() const = 0;
  // Writes the image to a PNG file; false on failure.
  virtual bool SavePng(const std::string& path) const = 0;
};

}  // namespace Tarsa
