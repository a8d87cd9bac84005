#pragma once

#include <cstdint>

#include "framework/view/CPort.h"
#include "solver/constraints/ConstraintList.h"
#include "workspace/ScreenGeometry.h"

namespace Project {

class LineConstraint;
class OverlayCanvas;
class PlaneConstraint;

// Draws the constraints of the list over the preview, or measures what that
// drawing covers, for damage: lines as their traced curves in the colour of
// their orientation (a failed trace as a dashed segment in the invalid
// colour), polygons edge by edge, with the handles, rotation gadget and
// focal handles of the selected and hovered ones, and while a tool's band
// is shown the polygon being drawn. Colours come from the run's settings;
// what is shown, the warped result or the photograph, from the list's
// context.
//
// Made for one paint or one measure: it borrows the list, whose solver it
// creates when there is none yet.
class ConstraintPainter {
 public:
  ConstraintPainter(ConstraintList& list, const ScreenTransform& screen);

  // Every constraint in list order, then the band while bandActive.
  void Draw(Tarsa::CPort& port, bool bandActive);
  // The window's box of what Draw paints; with selectedOnly, of the first
  // selected constraint alone (empty when none is). Empty when nothing is
  // drawn.
  ScreenBounds Measure(bool selectedOnly, bool bandActive);
  // One constraint, in the list or not (a tool's line being drawn), marked
  // as the highlight says, on the port or, when it is null, only measured;
  // answers its box.
  ScreenBounds DrawOne(const Constraint& constraint, const Highlight& highlight,
                       Tarsa::CPort* port);

 private:
  // How the list marks the constraint: selection, hover, live rotation and
  // the dragged focal handle.
  Highlight HighlightOf(const Constraint& constraint) const;
  // Every constraint in list order, then the band while bandActive.
  void PaintList(bool bandActive, OverlayCanvas& canvas);
  void Paint(const Constraint& constraint, const Highlight& highlight, OverlayCanvas& canvas);
  void PaintLine(const LineConstraint& line, const Highlight& highlight, OverlayCanvas& canvas);
  void PaintGadget(const LineConstraint& line, const Highlight& highlight, std::uint32_t colour,
                   OverlayCanvas& canvas);
  void PaintLiveFocal(const Highlight& highlight, Point2f middle, Point2f first, Point2f second,
                      std::uint32_t colour, OverlayCanvas& canvas);
  void PaintPlane(const PlaneConstraint& plane, const Highlight& highlight, OverlayCanvas& canvas);
  // The draft polygon of the solver's line store.
  void PaintBand(OverlayCanvas& canvas);
  // A traced curve of the view, solid in the colour; a failed one as the
  // dashed straight segment between the two window points.
  void PaintCurve(const std::vector<Point2f>& viewCurve, std::uint32_t colour,
                  OverlayCanvas& canvas);
  void PaintInvalidSegment(Point2f a, Point2f b, OverlayCanvas& canvas);
  // The colour a traced record is drawn in, by its pinned normal.
  std::uint32_t ColourOf(const LineRecord& record) const;
  // A point of the photograph's preview in the view that is shown.
  Point2f ShownPoint(Point2f source) const;

  ConstraintList& list_;
  ConstraintEnv env_;
  ScreenTransform screen_;
};

}  // namespace Project
