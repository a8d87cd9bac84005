#include "solver/constraints/TraceConstraint.h"

#include <cmath>

#include "solver/constraints/LineConstraint.h"
#include "solver/frame/Solver.h"

namespace Project {

namespace {

// The point of the view as the mode's space: photograph fractions (mode 0)
// or the result plane (mode 1).
Point2f ToPlane(const Solver& solver, Point2f p, std::int32_t mode) {
  const float in[2] = {p.x, p.y};
  float out[2];
  solver.ViewToPlane(in, out, mode);
  return {out[0], out[1]};
}

}  // namespace

const LineRecord* FindLineRecord(const Solver& solver, std::int32_t id) {
  const auto& lines = solver.GetLines();
  if (!lines) return nullptr;
  for (const LineRecord& record : lines->GetLines()) {
    if (record.id == id) return &record;
  }
  return nullptr;
}

LineRecord* FindLineRecord(Solver& solver, std::int32_t id) {
  return const_cast<LineRecord*>(FindLineRecord(static_cast<const Solver&>(solver), id));
}

const LineRecord& LineRecordOf(const Solver& solver, std::int32_t id) {
  static const LineRecord kBlank;
  const LineRecord* record = FindLineRecord(solver, id);
  return record != nullptr ? *record : kBlank;
}

LineRecord FindLine(const Solver& solver, std::int32_t id) { return LineRecordOf(solver, id); }

void SetLineNormal(Solver& solver, std::int32_t id, std::array<float, 2> normal) {
  LineRecord* record = FindLineRecord(solver, id);
  if (record == nullptr) return;
  record->fixedNormal = normal;
  record->hasFixedNormal = normal[0] != 0.0f || normal[1] != 0.0f;
}

void TraceConstraint(const Solver& solver, const LineConstraint& line, LineRecord& record,
                     std::int32_t kind) {
  const Point2f p0 = ToPlane(solver, line.GetStart(), 0);
  const Point2f p1 = ToPlane(solver, line.GetEnd(), 0);
  record.id = line.GetId();
  const float from[2] = {p0.x, p0.y};
  const float to[2] = {p1.x, p1.y};
  solver.GetLines()->TraceArc(record, record, from, to, kind, 0);
  float angle = 0.0f;
  const std::int32_t orientation = line.GetOrientation(&angle);
  record.hasFixedNormal = LineConstraint::OrientationNormal(orientation, angle, record.fixedNormal);
}

bool RetraceConstraint(Solver& solver, const LineConstraint& line, std::int32_t kind) {
  const auto& lines = solver.GetLines();
  if (!lines) return false;
  LineRecord* record = FindLineRecord(solver, line.GetId());
  if (record == nullptr) {
    record = &lines->GetLines().emplace_back();
  }
  TraceConstraint(solver, line, *record, kind);
  return record->active;
}

bool SnapToArc(const Solver& solver, const LineConstraint& line, Point2f point, bool inWarpedView,
               Point2f& outPoint) {
  const auto& lines = solver.GetLines();
  if (!lines) return false;
  const std::int32_t mode = inWarpedView ? 1 : 0;
  const Point2f a = ToPlane(solver, inWarpedView ? line.GetDisplayStart() : line.GetStart(), mode);
  const Point2f b = ToPlane(solver, inWarpedView ? line.GetDisplayEnd() : line.GetEnd(), mode);
  const Point2f p = ToPlane(solver, point, mode);
  // The view's pixels per unit of the mode's space, read off the inverse
  // map: both maps are a scale and a shift per axis.
  const float origin[2] = {0.0f, 0.0f}, unit[2] = {1.0f, 1.0f};
  float v0[2], v1[2];
  solver.PlaneToView(origin, v0, mode);
  solver.PlaneToView(unit, v1, mode);
  const float pixelsPerUnit[2] = {std::abs(v1[0] - v0[0]), std::abs(v1[1] - v0[1])};
  const float pa[2] = {a.x, a.y}, pb[2] = {b.x, b.y}, pp[2] = {p.x, p.y};
  float snapped[2];
  if (!lines->SnapToArc(pp, pa, pb, mode, pixelsPerUnit, snapped)) return false;
  float view[2];
  solver.PlaneToView(snapped, view, mode);
  outPoint = {view[0], view[1]};
  return true;
}

}  // namespace Project
