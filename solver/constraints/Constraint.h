#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "solver/geodesic/LineRecords.h"

namespace Project {

class Solver;
class SolverContext;

// What a constraint reads to show and pick itself: the solver that holds
// its traced record, and the filter's side of that solver for the settings
// (whether the preview shows the warped result, the projection model) and
// the preview's size. Both are borrowed for the length of one call.
struct ConstraintEnv {
  Solver& solver;
  SolverContext& context;

  bool ShowsResult() const;
};

// The squared distance from p to the segment a to b, measured to the foot of
// the perpendicular clamped to the segment; a zero-length segment is a.
float SegmentDistanceSquared(Point2f p, Point2f a, Point2f b);
// Whether p lies in the square of half side tolerance about centre.
bool InSquare(Point2f p, Point2f centre, float tolerance);

// One assertion of the user about the photograph: a run of pixels that is
// straight in the world, or a polygon that is flat. A constraint keeps only
// what the user gave (points of the photograph) and its on-screen form; its
// traced record lives in the solver's GeodesicLines and is found by id, the
// only thing the two share. The list gives the id once and never reuses it.
//
// Owned by the ConstraintList, or by a tool or undo task while it is out of
// the list. Not copyable: Clone gives the copy each kind means.
class Constraint {
 public:
  Constraint(const Constraint&) = delete;
  Constraint& operator=(const Constraint&) = delete;
  virtual ~Constraint() = default;

  virtual std::unique_ptr<Constraint> Clone() const = 0;
  // Bytes of its record in the stored blob.
  virtual std::size_t GetSerializedSize() const = 0;
  std::int32_t GetId() const { return id_; }
  void SetId(std::int32_t id) { id_ = id; }
  // Whether its trace succeeded, as the solve will see it.
  virtual bool IsValid(const Solver& solver) const = 0;
  // Whether the point, in the view's coordinates, picks it.
  virtual bool HitTest(const ConstraintEnv& env, Point2f point, bool inWarpedView,
                       float tolerance) const = 0;
  // Recomputes the on-screen form from the solver's current mesh.
  virtual void Update(const ConstraintEnv& env) = 0;
  // Puts its traced record into the solver's store, replacing any with the
  // same id; answers whether the trace succeeded.
  virtual bool Register(Solver& solver) = 0;
  // Takes its record out of the solver's store, the others keeping order.
  virtual void Unregister(Solver& solver) const = 0;

 protected:
  Constraint() = default;

 private:
  std::int32_t id_ = -1;
};

}  // namespace Project
