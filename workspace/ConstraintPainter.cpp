#include "workspace/ConstraintPainter.h"

#include <cmath>
#include <numbers>

#include "solver/constraints/LineConstraint.h"
#include "solver/constraints/PlaneConstraint.h"
#include "solver/constraints/TraceConstraint.h"
#include "solver/frame/Solver.h"
#include "workspace/OverlayCanvas.h"

namespace Project {

namespace {

constexpr std::uint32_t kWhite = 0xFFFFFFFF;
constexpr std::uint32_t kBlack = 0xFF000000;
// The rotation gadget's circle and short axis: grey at 0.85.
constexpr std::uint32_t kGadgetGrey = 0xD9808080;
// A failed trace's dashes and gaps, and the focal joint's, in window
// pixels.
constexpr double kInvalidDash = 4.0;
constexpr double kInvalidGap = 2.0;
constexpr double kJointDash = 4.0;
// Twice the signed area below which the live focal handle and the line's
// ends count as collinear, and the arc through them as straight.
constexpr double kCollinear = 1e-6;

Tarsa::CPointF At(Point2f p) { return {p.x, p.y}; }

Tarsa::CPath Segment(Point2f a, Point2f b) {
  Tarsa::CPath path;
  path.MoveTo(At(a));
  path.LineTo(At(b));
  return path;
}

// The arc from a through b to c, about the circle through the three; false
// when they are collinear.
bool ArcThrough(Point2f a, Point2f b, Point2f c, Tarsa::CPath& out) {
  const double bx = b.x - a.x, by = b.y - a.y, cx = c.x - a.x, cy = c.y - a.y;
  const double area2 = bx * cy - by * cx;
  if (std::fabs(area2) < kCollinear) return false;
  const double b2 = bx * bx + by * by, c2 = cx * cx + cy * cy;
  const double ux = (cy * b2 - by * c2) / (2 * area2), uy = (bx * c2 - cx * b2) / (2 * area2);
  const Tarsa::CPointF centre{a.x + ux, a.y + uy};
  const auto angle = [&](Point2f p) { return std::atan2(p.y - centre.y, p.x - centre.x); };
  const auto turn = [](double from, double to) {
    const double d = std::fmod(to - from, 2 * std::numbers::pi);
    return d < 0 ? d + 2 * std::numbers::pi : d;
  };
  const double from = angle(a);
  const double toEnd = turn(from, angle(c));
  // The way round that meets b before c.
  const double to =
      turn(from, angle(b)) < toEnd ? from + toEnd : from - (2 * std::numbers::pi - toEnd);
  out.MoveTo(At(a));
  out.Arc(centre, std::hypot(ux, uy), from, to);
  return true;
}

}  // namespace

ConstraintPainter::ConstraintPainter(ConstraintList& list, const ScreenTransform& screen)
    : list_(list), env_(list.Env()), screen_(screen) {}

void ConstraintPainter::Draw(Tarsa::CPort& port, bool bandActive) {
  OverlayCanvas canvas(&port);
  PaintList(bandActive, canvas);
}

void ConstraintPainter::PaintList(bool bandActive, OverlayCanvas& canvas) {
  for (const auto& item : list_.Items()) Paint(*item, HighlightOf(*item), canvas);
  if (bandActive) PaintBand(canvas);
}

ScreenBounds ConstraintPainter::Measure(bool selectedOnly, bool bandActive) {
  OverlayCanvas canvas(nullptr);
  if (selectedOnly) {
    if (const Constraint* first = list_.FirstSelected()) Paint(*first, HighlightOf(*first), canvas);
    return canvas.Bounds();
  }
  PaintList(bandActive, canvas);
  return canvas.Bounds();
}

ScreenBounds ConstraintPainter::DrawOne(const Constraint& constraint, const Highlight& highlight,
                                        Tarsa::CPort* port) {
  OverlayCanvas canvas(port);
  Paint(constraint, highlight, canvas);
  return canvas.Bounds();
}

Highlight ConstraintPainter::HighlightOf(const Constraint& constraint) const {
  return {list_.IsSelected(constraint), constraint.GetId() == list_.HoverId(), list_.LiveRotation(),
          list_.LiveFocalHandle(), list_.LiveFocalMoved()};
}

void ConstraintPainter::Paint(const Constraint& constraint, const Highlight& highlight,
                              OverlayCanvas& canvas) {
  if (const auto* line = dynamic_cast<const LineConstraint*>(&constraint)) {
    PaintLine(*line, highlight, canvas);
  } else if (const auto* plane = dynamic_cast<const PlaneConstraint*>(&constraint)) {
    PaintPlane(*plane, highlight, canvas);
  }
}

std::uint32_t ConstraintPainter::ColourOf(const LineRecord& record) const {
  const PSettings& settings = list_.Context().Settings();
  if (!record.active) return settings.colorInvalid;
  if (!record.hasFixedNormal) return settings.colorUnfixed;
  if (record.fixedNormal[0] == 0.0f && record.fixedNormal[1] == 1.0f) {
    return settings.colorHorizontal;
  }
  if (record.fixedNormal[0] == 1.0f && record.fixedNormal[1] == 0.0f) {
    return settings.colorVertical;
  }
  return settings.colorFixed;
}

Point2f ConstraintPainter::ShownPoint(Point2f source) const {
  if (!env_.ShowsResult()) return source;
  const float in[2] = {source.x, source.y};
  float out[2];
  env_.solver.SourceToPreview(in, out);
  return {out[0], out[1]};
}

void ConstraintPainter::PaintCurve(const std::vector<Point2f>& viewCurve, std::uint32_t colour,
                                   OverlayCanvas& canvas) {
  if (viewCurve.size() < 2) return;
  Tarsa::CPath path;
  path.MoveTo(At(screen_.Apply(viewCurve.front())));
  for (std::size_t k = 1; k < viewCurve.size(); ++k) path.LineTo(At(screen_.Apply(viewCurve[k])));
  canvas.Stroke(path, {colour, 1.0, {}, 0.0});
}

void ConstraintPainter::PaintInvalidSegment(Point2f a, Point2f b, OverlayCanvas& canvas) {
  canvas.Stroke(Segment(a, b),
                {list_.Context().Settings().colorInvalid, 1.0, {kInvalidDash, kInvalidGap}, 0.0});
}

void ConstraintPainter::PaintLine(const LineConstraint& line, const Highlight& highlight,
                                  OverlayCanvas& canvas) {
  const bool shown = env_.ShowsResult();
  const LineRecord& record = LineRecordOf(env_.solver, line.GetId());
  const std::uint32_t colour = ColourOf(record);
  const Point2f first = screen_.Apply(shown ? line.GetDisplayStart() : line.GetStart());
  const Point2f second = screen_.Apply(shown ? line.GetDisplayEnd() : line.GetEnd());
  if (record.active) {
    PaintCurve(line.GetCurve(), colour, canvas);
  } else {
    PaintInvalidSegment(first, second, canvas);
  }
  if (!highlight.selected && !highlight.hovered) return;

  // The gadget goes under the handles, so that its axis does not cross them.
  if (highlight.selected && record.active) PaintGadget(line, highlight, colour, canvas);
  const float opacity = highlight.selected ? 1.0f : 0.5f;
  canvas.Handle(first, opacity);
  canvas.Handle(second, opacity);
  const Point2f along = line.GetPointAlong(env_, 0.5f);
  if (along == Point2f{-1.0f, -1.0f}) return;
  const Point2f middle = screen_.Apply(along);
  if (line.HasFocalHandle(env_)) canvas.Handle(middle, opacity);
  if (highlight.selected && highlight.liveFocalHandle != Point2f{-1.0f, -1.0f}) {
    PaintLiveFocal(highlight, middle, first, second, colour, canvas);
  }
}

void ConstraintPainter::PaintGadget(const LineConstraint& line, const Highlight& highlight,
                                    std::uint32_t colour, OverlayCanvas& canvas) {
  float axis = 0.0f;
  const std::int32_t orientation = line.GetOrientation(&axis);
  const float live = highlight.liveRotation;
  RotationGadget gadget;
  if (!line.GetRotationGadget(env_, screen_.zoom, live >= 0.0f ? live : axis, gadget)) return;
  const Point2f middle = screen_.Apply(gadget.middle);
  const float radius = gadget.radius * screen_.zoom;
  // The circle stands at 0.6 L from the middle.
  const float length = radius / 0.6f;
  Tarsa::CPath circle;
  circle.AddCircle(At(middle), radius);
  canvas.Stroke(circle, {kGadgetGrey, 1.0, {}, 0.0});

  const auto drawAxis = [&](float degrees) {
    const double a = degrees * std::numbers::pi / 180.0;
    const auto out = [&](double r) {
      return Tarsa::CPointF{middle.x + r * std::cos(a), middle.y + r * std::sin(a)};
    };
    Tarsa::CPath path;
    if (gadget.shortForm) {
      for (const double side : {-1.0, 1.0}) {
        path.MoveTo(out(side * 0.5 * length));
        path.LineTo(out(side * 0.7 * length));
      }
      canvas.Stroke(path, {kGadgetGrey, 1.0, {}, 0.0});
    } else if (orientation != LineConstraint::kUnfixed && !env_.ShowsResult()) {
      path.MoveTo(out(-length));
      path.LineTo(out(length));
      canvas.Stroke(path, {OverlayCanvas::WithOpacity(colour, 0.5f), 1.0, {}, 0.0});
    }
  };
  drawAxis(axis);
  if (live >= 0.0f) drawAxis(live);
  for (const Point2f& grip : gadget.grips) canvas.Grip(screen_.Apply(grip));
}

void ConstraintPainter::PaintLiveFocal(const Highlight& highlight, Point2f middle, Point2f first,
                                       Point2f second, std::uint32_t colour,
                                       OverlayCanvas& canvas) {
  const Point2f view =
      highlight.liveFocalMoved ? ShownPoint(highlight.liveFocalHandle) : highlight.liveFocalHandle;
  const Point2f handle = screen_.Apply(view);
  // White and black dashes in turn, so that the joint shows on any picture.
  const Tarsa::CPath joint = Segment(middle, handle);
  canvas.Stroke(joint, {kWhite, 1.0, {kJointDash, kJointDash}, 0.0});
  canvas.Stroke(joint, {kBlack, 1.0, {kJointDash, kJointDash}, kJointDash});
  Tarsa::CPath arc;
  if (ArcThrough(first, handle, second, arc)) {
    canvas.Stroke(arc, {colour, 1.0, {}, 0.0});
  } else {
    canvas.Stroke(Segment(first, second),
                  {OverlayCanvas::WithOpacity(colour, 0.75f), 1.0, {}, 0.0});
  }
  canvas.Handle(handle, 1.0f);
}

void ConstraintPainter::PaintPlane(const PlaneConstraint& plane, const Highlight& highlight,
                                   OverlayCanvas& canvas) {
  // The selection wins over the hover; a plain polygon has no handles.
  const float opacity = highlight.selected ? 1.0f : (highlight.hovered ? 0.5f : 0.0f);
  const bool handles = opacity > 0.4f;
  const std::vector<PlaneCorner>& shown =
      env_.ShowsResult() ? plane.GetDisplayCorners() : plane.GetCorners();
  const auto corner = [&](std::size_t k) { return screen_.Apply({shown[k].x, shown[k].y}); };
  if (!plane.IsValid(env_.solver)) {
    const std::size_t n = shown.size();
    for (std::size_t k = 0; k < n; ++k) {
      PaintInvalidSegment(corner(k), corner((k + 1) % n), canvas);
      if (handles && k > 0) canvas.Handle(corner(k), opacity);
    }
    // The first corner last, on top of the closing edge.
    if (handles && n > 0) canvas.Handle(corner(0), opacity);
    return;
  }
  const auto& lines = env_.solver.GetLines();
  if (!lines) return;
  for (const PlaneRecord& record : lines->GetPlanes()) {
    if (record.id != plane.GetId()) continue;
    const auto& curves = plane.GetEdgeCurves();
    for (std::size_t k = 0; k < record.edges.size() && k < curves.size(); ++k) {
      PaintCurve(curves[k], ColourOf(record.edges[k]), canvas);
    }
    if (handles) {
      for (std::size_t k = 0; k < shown.size(); ++k) canvas.Handle(corner(k), opacity);
    }
    return;
  }
}

void ConstraintPainter::PaintBand(OverlayCanvas& canvas) {
  const auto& lines = env_.solver.GetLines();
  if (!lines) return;
  const PlaneRecord& draft = lines->GetDraftPlane();
  const std::int32_t mode = env_.ShowsResult() ? 1 : 0;
  // A corner is a photograph fraction.
  const auto corner = [&](std::size_t k) {
    const float fraction[2] = {draft.corners[k].x, draft.corners[k].y};
    float preview[2];
    env_.solver.PlaneToView(fraction, preview, 0);
    return screen_.Apply(ShownPoint({preview[0], preview[1]}));
  };
  const std::size_t n = draft.corners.size();
  for (std::size_t k = 0; k < draft.edges.size(); ++k) {
    const LineRecord& edge = draft.edges[k];
    if (!edge.active) {
      if (n > 0) PaintInvalidSegment(corner(k % n), corner((k + 1) % n), canvas);
      continue;
    }
    std::vector<Point2f> curve;
    for (const Point2f& p : lines->TraceSamples(edge, mode)) {
      const float in[2] = {p.x, p.y};
      float out[2];
      env_.solver.PlaneToView(in, out, mode);
      curve.push_back({out[0], out[1]});
    }
    PaintCurve(curve, ColourOf(edge), canvas);
  }
}

}  // namespace Project
