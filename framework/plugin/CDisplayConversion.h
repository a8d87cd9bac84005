#pragma once

#include <cstdint>

#include "framework/core/CRect.h"
#include "framework/pixels/CBasicPixmap.h"
#include "framework/plugin/HostSuites.h"

namespace Tarsa {

// Turns 8-bit samples of a host image mode into 8-bit sRGB for the screen.
// The host knows the document's colours (its profile, its Lab), so its
// display colour suite does the work, in blocks of at most 512 x 512. A host
// without the suite, or one that declines a block, gets the module's own
// plain formulas instead: RGB as it is, gray repeated, Lab by the CIE
// formulas (D50, adapted to sRGB's D65), CMYK as inks that take light away
// from white. Holds the host's suite table (or null), which the caller
// acquires and releases; borrows the pixmaps of each call.
class CDisplayConversion {
 public:
  explicit CDisplayConversion(const HostDisplayColourSuite* suite) : suite_(suite) {}

  // Converts area of source's colour planes, in mode's order (the 16-bit
  // modes stand for their 8-bit twins), into planes 0, 1 and 2 of
  // destination, area's top left going to `to`. A transparency plane is not
  // touched. CError unless both are 8-bit, have the planes and cover their
  // areas.
  void Convert(std::int32_t mode, const CBasicPixmap& source, const CRect& area,
               CBasicPixmap& destination, CPoint to) const;

  // The module's own formulas, for one block of any size.
  static void ConvertPlainly(std::int32_t mode, std::int32_t width, std::int32_t height,
                             const HostSampleBlock& source, const HostSampleBlock& destination);

 private:
  const HostDisplayColourSuite* suite_;
};

}  // namespace Tarsa
