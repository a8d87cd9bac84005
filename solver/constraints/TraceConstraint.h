#pragma once

#include <array>
#include <cstdint>

#include "solver/geodesic/LineRecords.h"

namespace Project {

class LineConstraint;
class Solver;

// The solver's side of line constraints: their traced records in the
// solver's GeodesicLines, found by the constraint's id. The records belong
// to the store; these functions read and rewrite them in place. A solver
// with no store yet (no warp built) holds no records.

// The record with that id, or null.
const LineRecord* FindLineRecord(const Solver& solver, std::int32_t id);
LineRecord* FindLineRecord(Solver& solver, std::int32_t id);
// The record with that id, or the blank record (id -1, active, no samples)
// that an untraced line counts as.
const LineRecord& LineRecordOf(const Solver& solver, std::int32_t id);
// A copy of LineRecordOf.
LineRecord FindLine(const Solver& solver, std::int32_t id);

// Pins the record's normal; (0, 0) unpins it. No record, nothing done.
void SetLineNormal(Solver& solver, std::int32_t id, std::array<float, 2> normal);

// Traces the great circle between the line's end directions into record,
// which also serves as the previous trace: kind 0 keeps its first end's
// cell, 1 its last, 2 searches both. Sets the id and the pinned normal of
// the line's orientation. Failure is told by record.active.
void TraceConstraint(const Solver& solver, const LineConstraint& line, LineRecord& record,
                     std::int32_t kind = 2);
// Traces the line again into its record, or into a new one appended to the
// store; answers record.active, false when there is no store.
bool RetraceConstraint(Solver& solver, const LineConstraint& line, std::int32_t kind);

// The point of the line's great circle nearest to point, both in the view's
// coordinates (the warped result when inWarpedView, else the photograph);
// false when an end or the point is off the mesh, or the snap would move
// the point too far.
bool SnapToArc(const Solver& solver, const LineConstraint& line, Point2f point, bool inWarpedView,
               Point2f& outPoint);

}  // namespace Project
