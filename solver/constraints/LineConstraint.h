#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <vector>

#include "solver/constraints/Constraint.h"

namespace Project {

// The rotation gadget of a line: a circle about the middle of its curve
// with two round grips on it, 0.6 L out along an angle either way. L is the
// distance from the shown first end to the middle, or 120 window pixels when
// the line shows 60 or less.
struct RotationGadget {
  Point2f middle{};
  float radius = 0.0f;  // 0.6 L
  bool shortForm = false;
  std::array<Point2f, 2> grips{};
};

// A line constraint: the user asserts that the pixels between two end points
// lie on a straight line of the world. Only the ends are the user's; the
// great-circle arc between their sphere directions is traced into a record
// of the solver's GeodesicLines, under this constraint's id. The line keeps
// its orientation kind and, from Update, its ends and its arc as the view
// shows them (the preview's pixels, warped or not).
//
// Orientation kinds: 1 Unfixed, 2 Horizontal, 3 Vertical, 4 fixed at an
// angle; the last three pin the normal of the line in the result plane.
class LineConstraint final : public Constraint {
 public:
  static constexpr std::int32_t kUnfixed = 1;
  static constexpr std::int32_t kHorizontal = 2;
  static constexpr std::int32_t kVertical = 3;
  static constexpr std::int32_t kArbitrary = 4;
  // PickLine's answers.
  static constexpr std::int32_t kPickNone = 1;
  static constexpr std::int32_t kPickStart = 2;
  static constexpr std::int32_t kPickEnd = 3;
  static constexpr std::int32_t kPickFocal = 4;
  static constexpr std::int32_t kPickLine = 5;
  static constexpr std::size_t kSerializedSize = 28;

  // All zero, Unfixed, no id.
  LineConstraint() = default;
  // Unfixed, no id, shown where it lies until the first Update.
  LineConstraint(Point2f start, Point2f end);

  // The ends, the shown ends, the id and the orientation; an Unfixed line's
  // angle is the one computed now. The curve is left for Update.
  std::unique_ptr<Constraint> Clone() const override;
  std::unique_ptr<LineConstraint> CloneLine() const;
  std::size_t GetSerializedSize() const override { return kSerializedSize; }
  bool IsValid(const Solver& solver) const override;
  bool HitTest(const ConstraintEnv& env, Point2f point, bool inWarpedView,
               float tolerance) const override;
  void Update(const ConstraintEnv& env) override;
  bool Register(Solver& solver) override;
  void Unregister(Solver& solver) const override;

  // The kind, and when asked the angle it reports, in degrees: for Unfixed
  // the direction of the shown chord (y grows downwards, so a rising line
  // has a negative angle), 0 Horizontal, 90 Vertical, the stored angle for 4.
  std::int32_t GetOrientation(float* outAngle = nullptr) const;
  // Stores the kind (and for 4 the angle) and pins the record's normal to
  // match. A kind outside 1 to 4 is stored and nothing more.
  void SetOrientation(Solver& solver, std::int32_t orientation, float angle);
  // Stores the kind and angle only, for a line not yet traced.
  void StoreOrientation(std::int32_t orientation, float angle);
  // The normal a kind pins in the result plane; false, with (0, 0), for
  // Unfixed and unknown kinds.
  static bool OrientationNormal(std::int32_t orientation, float angle,
                                std::array<float, 2>& outNormal);

  // The point at that fraction of the curve's length. A failed trace gives
  // the ends' sum times the fraction (the midpoint at 0.5 only); a curve of
  // fewer than two points gives (-1, -1).
  Point2f GetPointAlong(const ConstraintEnv& env, float fraction) const;
  // kPickStart or kPickEnd on a square about an end, kPickFocal on one about
  // the focal handle, kPickLine within the tolerance of the line, else
  // kPickNone. The traced curve governs when there is one.
  std::int32_t PickLine(const ConstraintEnv& env, Point2f point, bool inWarpedView,
                        float tolerance) const;
  // A fisheye photo, both ends in the image, and with the result shown a
  // valid trace: the line can calibrate the focal length.
  bool HasFocalHandle(const ConstraintEnv& env) const;
  // The gadget in the view's coordinates, for a view shown at zoom window
  // pixels per unit, its grips along angleDegrees; false when the line has
  // no middle.
  bool GetRotationGadget(const ConstraintEnv& env, float zoom, float angleDegrees,
                         RotationGadget& out) const;
  // The rotation cursor's resource id for a line at that angle (degrees)
  // and a pointer offset (dx, dy) from the line's middle.
  static std::int32_t RotationCursor(float angleDegrees, float dx, float dy);

  Point2f GetStart() const { return start_; }
  Point2f GetEnd() const { return end_; }
  Point2f GetDisplayStart() const { return displayStart_; }
  Point2f GetDisplayEnd() const { return displayEnd_; }
  void SetStart(Point2f p) { start_ = p; }
  void SetEnd(Point2f p) { end_ = p; }
  void SetDisplayStart(Point2f p) { displayStart_ = p; }
  void SetDisplayEnd(Point2f p) { displayEnd_ = p; }
  // The arc in the view's coordinates, from the last Update.
  const std::vector<Point2f>& GetCurve() const { return curve_; }

 private:
  Point2f start_{};
  Point2f end_{};
  float angle_ = 0.0f;
  std::int32_t orientation_ = kUnfixed;
  Point2f displayStart_{};
  Point2f displayEnd_{};
  std::vector<Point2f> curve_;
};

}  // namespace Project
