#pragma once

#include <cmath>
#include <vector>

namespace Measure {

// A position in an image, in pixels: x to the right, y downwards, the pixel
// (i, j) covering [i, i + 1) x [j, j + 1).
struct Point {
  double x = 0.0;
  double y = 0.0;
};

// One dark line found in an image: where it lies and how straight it is.
struct MeasuredLine {
  // The middle of the fitted centreline, and the dark blob's extent along
  // it, end caps included.
  Point centre;
  double length = 0.0;
  // Of the fitted line, in degrees from the image's horizontal, turning
  // anticlockwise as seen: 0 horizontal, 90 vertical, in [0, 180).
  double angle = 0.0;
  // The blob's mean width across the line: its dark pixels over its length.
  double width = 0.0;
  // Of the centreline points' signed distances from the fitted line: the
  // largest less the smallest, and their root mean square.
  double spread = 0.0;
  double rms = 0.0;
  // The centreline, one point a pixel along the line, less half a width at
  // each end where the end cap cuts the cross-section.
  std::vector<Point> centreline;
  // Dark pixels in the blob.
  int pixels = 0;
};

// The difference of two line angles in degrees, 0 to 90: lines have no
// direction, so 179.9 and 0.1 are 0.2 apart.
inline double AngleDifference(double a, double b) {
  const double d = std::fmod(std::fabs(a - b), 180.0);
  return d > 90.0 ? 180.0 - d : d;
}

}  // namespace Measure
