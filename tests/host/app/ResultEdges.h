#pragma once

// Measures taken on a corrected picture's pixels: where a photograph point
// lands in the result, and where an edge lies across a short profile. The
// result's geometry comes from a CPU rendering of the solved mesh (which
// result pixel shows which photograph point); the edges come from the
// pixels alone. How straight the edges found lie is FitStraightLine's.

#include <array>
#include <optional>
#include <vector>

#include "host/io/HostDocument.h"
#include "tests/support/ReferenceRender.h"
#include "tools/synth/lib/Geometry.h"

namespace Host::testing {

using Synth::Point2;

// A colour with every channel 0..1.
using Colour = std::array<double, 3>;

// The colour at a point of an RGB document, bilinear between pixel centres,
// the border pixels repeated beyond the edge.
Colour ColourAt(const HostDocument& document, Point2 at);

// The photograph-to-result map that a mesh rendering holds inverted: the
// rendering knows, per result pixel, the photograph point it shows.
class ResultMap {
 public:
  explicit ResultMap(const Project::testing::ReferenceImage& reference) : reference_(reference) {}

  // The result point showing the photograph point; nothing where no drawn
  // cell shows it. Successive calls along a curve search near the last
  // answer first.
  std::optional<Point2> Place(Point2 photo);

 private:
  // The photograph point at a result point, bilinear between pixel centres;
  // false where a pixel around it is not drawn.
  bool SourceAt(Point2 result, Point2& photo) const;

  const Project::testing::ReferenceImage& reference_;
  std::optional<Point2> last_;
};

// The edge across a profile through `at` along the unit `normal`: about the
// strongest rise in the direction of `step` (the colour across the edge,
// far side less near side) within `reach` pixels, the centroid of that rise,
// to a hundredth of a pixel wherever the edge falls within a pixel. Nothing
// when no rise reaches half of the step's size.
std::optional<Point2> FindEdge(const HostDocument& image, Point2 at, Point2 normal,
                               const Colour& step, double reach);

}  // namespace Host::testing
