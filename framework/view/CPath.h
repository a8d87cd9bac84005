#pragma once

#include <span>
#include <vector>

#include "framework/view/CPort.h"

namespace Tarsa {

// A shape for a port to stroke or fill: subpaths of straight pieces and
// circular arcs, in the port's coordinates. A value, built up by its owner
// and only read by the port that draws it.
//
// Angles are radians measured from +x towards +y, so on the screen (y
// downwards) a growing angle turns clockwise.
class CPath {
 public:
  enum class EVerb { kMove, kLine, kArc, kClose };
  struct CElement {
    EVerb verb = EVerb::kMove;
    // The point moved or drawn to; an arc's centre.
    CPointF point;
    double radius = 0.0;
    double from = 0.0;
    double to = 0.0;
  };

  // Starts a new subpath at p.
  void MoveTo(CPointF p);
  // A straight piece from the current point to p.
  void LineTo(CPointF p);
  // The arc about centre from angle `from` to angle `to`, turning the way
  // from `from` to `to` goes (a full turn needs to = from +- 2 pi). It is
  // joined to the current point by a straight piece, when there is one.
  void Arc(CPointF centre, double radius, double from, double to);
  // Joins the current point back to its subpath's start.
  void Close();

  // Convenience forms: an open or closed polyline (nothing for an empty
  // span), a closed axis-aligned rectangle, a closed circle.
  void AddPolyline(std::span<const CPointF> points, bool closed);
  void AddRectangle(CPointF topLeft, CPointF bottomRight);
  void AddCircle(CPointF centre, double radius);

  bool IsEmpty() const { return elements_.empty(); }
  const std::vector<CElement>& Elements() const { return elements_; }
  // The box of every point the path passes through, arcs by their true
  // extent, without any pen width; false, with the box untouched, for an
  // empty path.
  bool Bounds(CPointF& outMin, CPointF& outMax) const;

 private:
  std::vector<CElement> elements_;
};

}  // namespace Tarsa
