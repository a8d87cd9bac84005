#pragma once

#include <cstdint>

#include "host/io/HostDocument.h"
#include "tools/synth/lib/Geometry.h"

namespace Synth {

// Writes colours into a host document in its mode. Gray is the luma of the
// colour (0.299, 0.587, 0.114); CMYK is the plain complement with full black
// generation; Lab treats the colour as sRGB and takes D65 as white. These
// are stand-ins good enough for test pictures, not colour management.
// Different pixels may be written from different threads.
class PixelEncoder {
 public:
  explicit PixelEncoder(Host::HostDocument* document);

  PixelEncoder(const PixelEncoder&) = delete;
  PixelEncoder& operator=(const PixelEncoder&) = delete;

  void Put(int32_t x, int32_t y, const Rgb& colour);

 private:
  // Stores channel values, each 0 to 1 of the full scale.
  void Store(size_t index, const double* values);

  Host::HostDocument* document_;
  Host::ColourModel model_;
  int maxSample_;
};

}  // namespace Synth
