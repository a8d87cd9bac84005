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

// A view point to the window: point * zoom + origin - scroll, per axis.
struct ScreenTransform {
  float zoom = 1.0f;
  float originX = 0.0f;
  float originY = 0.0f;
  float scrollX = 0.0f;
  float scrollY = 0.0f;

  Point2f Apply(Point2f p) const {
    return {originX + p.x * zoom - scrollX, originY + p.y * zoom - scrollY};
  }
};

// How the list marks a constraint when it is shown.
struct Highlight {
  bool selected = false;
  bool hovered = false;
  // Degrees; the angle shown while a line is being rotated, or below 0.
  float liveRotation = -1.0f;
};

// A rectangle of the window. It counts as empty when it has neither width
// nor height, so the starting boxes (10000, 10000, 0, 0) and (0, 0, 0, 0)
// are both empty while the box of a straight horizontal edge is not.
struct ScreenBounds {
  float left = 0.0f;
  float top = 0.0f;
  float right = 0.0f;
  float bottom = 0.0f;

  bool IsEmpty() const { return !(right > left) && !(bottom > top); }
  // Widens the box by a point, min and max on each side.
  void Widen(Point2f p) {
    left = p.x < left ? p.x : left;
    top = p.y < top ? p.y : top;
    right = p.x > right ? p.x : right;
    bottom = p.y > bottom ? p.y : bottom;
  }
  // The union, an empty box giving way to the other one.
  void Merge(const ScreenBounds& other);
};

// The colour a traced record is shown in.
enum class ConstraintLook { kOrdinary, kHorizontal, kVertical, kFixed, kInvalid };

// By the record: invalid when tracing failed, else by its pinned normal,
// exactly (0, 1) horizontal and exactly (1, 0) vertical.
ConstraintLook LookOf(const LineRecord& record);

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
  // The window's box of everything the constraint shows, handles included.
  virtual ScreenBounds Measure(const ConstraintEnv& env, const ScreenTransform& screen,
                               const Highlight& highlight) const = 0;
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
