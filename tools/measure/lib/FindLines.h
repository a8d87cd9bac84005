#pragma once

#include <vector>

#include "host/io/HostDocument.h"
#include "tools/measure/lib/MeasuredLine.h"

namespace Measure {

// What counts as a line.
struct FindOptions {
  // Blobs with fewer dark pixels, or shorter along their axis, are specks.
  int minimumPixels = 40;
  double minimumLength = 20.0;
};

// Every dark line of an image on a plain light ground, measured (see
// DarkMap for what is dark and what is outside the picture). A line is an
// 8-connected blob of dark pixels that touches neither the image's border
// nor the outside, since there it may be cut. Its centreline is traced at
// every pixel along the blob's principal axis: across the blob there, the
// ink-weighted centroid of the image sampled every quarter pixel, which
// finds the middle of an anti-aliased bar to a small fraction of a pixel
// wherever its edges fall. A straight line is fitted to those points by
// total least squares. Lines come in the order of their topmost pixel.
// Throws MeasureError for an image it cannot judge.
std::vector<MeasuredLine> FindLines(const Host::HostDocument& image,
                                    const FindOptions& options = {});

}  // namespace Measure
