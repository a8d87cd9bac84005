#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "framework/pixels/CDisplayPixmap.h"

namespace Tarsa::testing {

// An opaque RGB canvas that decoded icons are laid on, for a person to look
// at: images are blended by their alpha over whatever was filled below.
class ContactSheet {
 public:
  ContactSheet(int width, int height, std::uint32_t background);

  void Fill(int x, int y, int width, int height, std::uint32_t rgb);
  // Draws the image with its top left at (x, y), clipped to the sheet and
  // to at most width by height pixels of it.
  void Blend(const CDisplayPixmap& image, int x, int y, int width = 1 << 30, int height = 1 << 30);
  // Writes the sheet as a PNG file, making its folder; false on failure.
  bool Save(const std::string& path) const;

  int Width() const { return width_; }
  int Height() const { return height_; }

 private:
  int width_;
  int height_;
  std::vector<std::uint8_t> rgb_;
};

// A PNG file of 8-bit RGBA pixels, rows packed, through libpng itself.
std::vector<std::uint8_t> PngOfRgba(int width, int height, const std::vector<std::uint8_t>& rgba);

// The folder test artefacts go to: $ARCHWAY_ARTEFACTS, else the build's.
std::string ArtefactFolder();

}  // namespace Tarsa::testing
