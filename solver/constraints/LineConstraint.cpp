#include "solver/constraints/LineConstraint.h"

#include <cmath>
#include <numbers>

#include "params/PSettings.h"
#include "solver/constraints/TraceConstraint.h"
#include "solver/frame/Solver.h"

namespace Project {

namespace {

// The stored angles were made with this rounded constant, not pi; kept so
// that an angle reads back as it was written.
constexpr double kStoredPi = 3.1416;
// A line shorter than this on screen shows its rotation gadget at a fixed
// size instead, so that the grips stay apart.
constexpr float kShortLine = 60.0f;
constexpr float kShortLineLength = 120.0f;
constexpr float kGripRadiusFactor = 0.6f;

float Distance(Point2f a, Point2f b) { return std::hypot(a.x - b.x, a.y - b.y); }

}  // namespace

LineConstraint::LineConstraint(Point2f start, Point2f end)
    : start_(start), end_(end), displayStart_(start), displayEnd_(end) {}

std::unique_ptr<Constraint> LineConstraint::Clone() const { return CloneLine(); }

std::unique_ptr<LineConstraint> LineConstraint::CloneLine() const {
  auto clone = std::make_unique<LineConstraint>(start_, end_);
  clone->displayStart_ = displayStart_;
  clone->displayEnd_ = displayEnd_;
  clone->SetId(GetId());
  clone->orientation_ = GetOrientation(&clone->angle_);
  return clone;
}

bool LineConstraint::IsValid(const Solver& solver) const {
  return LineRecordOf(solver, GetId()).active;
}

bool LineConstraint::HitTest(const ConstraintEnv& env, Point2f point, bool inWarpedView,
                             float tolerance) const {
  return PickLine(env, point, inWarpedView, tolerance) != kPickNone;
}

void LineConstraint::Update(const ConstraintEnv& env) {
  const LineRecord& record = LineRecordOf(env.solver, GetId());
  const std::int32_t mode = env.ShowsResult() ? 1 : 0;
  std::vector<Point2f> samples;
  if (const auto& lines = env.solver.GetLines()) samples = lines->TraceSamples(record, mode);
  const float start[2] = {start_.x, start_.y}, end[2] = {end_.x, end_.y};
  float out[2];
  env.solver.SourceToPreview(start, out);
  displayStart_ = {out[0], out[1]};
  env.solver.SourceToPreview(end, out);
  displayEnd_ = {out[0], out[1]};
  curve_.clear();
  curve_.reserve(samples.size());
  for (const Point2f& p : samples) {
    const float in[2] = {p.x, p.y};
    env.solver.PlaneToView(in, out, mode);
    curve_.push_back({out[0], out[1]});
  }
}

bool LineConstraint::Register(Solver& solver) { return RetraceConstraint(solver, *this, 2); }

void LineConstraint::Unregister(Solver& solver) const {
  const auto& lines = solver.GetLines();
  if (!lines) return;
  std::erase_if(lines->GetLines(), [&](const LineRecord& r) { return r.id == GetId(); });
}

std::int32_t LineConstraint::GetOrientation(float* outAngle) const {
  if (outAngle == nullptr) return orientation_;
  switch (orientation_) {
    case kHorizontal:
      *outAngle = 0.0f;
      break;
    case kVertical:
      *outAngle = 90.0f;
      break;
    case kArbitrary:
      *outAngle = angle_;
      break;
    default: {
      const float dx = displayEnd_.x - displayStart_.x;
      const float dy = displayEnd_.y - displayStart_.y;
      if (std::fabs(dx) < 1e-6) {
        *outAngle = dy > 0.0f ? 90.0f : -90.0f;
      } else {
        *outAngle = static_cast<float>(std::atan(dy / dx) / kStoredPi * 180.0);
      }
      break;
    }
  }
  return orientation_;
}

void LineConstraint::SetOrientation(Solver& solver, std::int32_t orientation, float angle) {
  StoreOrientation(orientation, angle);
  if (orientation < kUnfixed || orientation > kArbitrary) return;
  std::array<float, 2> normal;
  OrientationNormal(orientation_, angle_, normal);
  SetLineNormal(solver, GetId(), normal);
}

void LineConstraint::StoreOrientation(std::int32_t orientation, float angle) {
  orientation_ = orientation;
  if (orientation == kArbitrary) angle_ = angle;
}

bool LineConstraint::OrientationNormal(std::int32_t orientation, float angle,
                                       std::array<float, 2>& outNormal) {
  switch (orientation) {
    case kHorizontal:
      outNormal = {0.0f, 1.0f};
      return true;
    case kVertical:
      outNormal = {1.0f, 0.0f};
      return true;
    case kArbitrary: {
      const double a = (static_cast<double>(angle) + 180.0) / 180.0 * kStoredPi;
      outNormal = {static_cast<float>(std::sin(a)), static_cast<float>(std::cos(a))};
      return true;
    }
    default:
      outNormal = {0.0f, 0.0f};
      return false;
  }
}

Point2f LineConstraint::GetPointAlong(const ConstraintEnv& env, float fraction) const {
  if (!IsValid(env.solver)) {
    // Not a point of the line except at 0.5: the tools ask only for the
    // middle of a line whose trace failed.
    const bool shown = env.ShowsResult();
    const Point2f a = shown ? displayStart_ : start_;
    const Point2f b = shown ? displayEnd_ : end_;
    return {(a.x + b.x) * fraction, (a.y + b.y) * fraction};
  }
  if (curve_.size() < 2) return {-1.0f, -1.0f};
  float total = 0.0f;
  for (std::size_t k = 1; k < curve_.size(); ++k) total += Distance(curve_[k - 1], curve_[k]);
  const float target = total * fraction;
  float walked = 0.0f;
  for (std::size_t k = 1; k < curve_.size(); ++k) {
    const Point2f a = curve_[k - 1], b = curve_[k];
    const float piece = Distance(a, b);
    if (walked + piece >= target) {
      const float t = piece > 0.0f ? (target - walked) / piece : 0.0f;
      return {a.x + (b.x - a.x) * t, a.y + (b.y - a.y) * t};
    }
    walked += piece;
  }
  return {-1.0f, -1.0f};
}

std::int32_t LineConstraint::PickLine(const ConstraintEnv& env, Point2f point, bool inWarpedView,
                                      float tolerance) const {
  const bool traced = IsValid(env.solver) && curve_.size() > 1;
  Point2f a = inWarpedView ? displayStart_ : start_;
  Point2f b = inWarpedView ? displayEnd_ : end_;
  if (traced) {
    a = curve_.front();
    b = curve_.back();
  }
  if (InSquare(point, a, tolerance)) return kPickStart;
  if (InSquare(point, b, tolerance)) return kPickEnd;
  if (HasFocalHandle(env) && InSquare(point, GetPointAlong(env, 0.5f), tolerance)) {
    return kPickFocal;
  }
  const float limit = tolerance * tolerance;
  if (!traced) return SegmentDistanceSquared(point, a, b) <= limit ? kPickLine : kPickNone;
  for (std::size_t k = 1; k < curve_.size(); ++k) {
    if (SegmentDistanceSquared(point, curve_[k - 1], curve_[k]) <= limit) return kPickLine;
  }
  return kPickNone;
}

bool LineConstraint::HasFocalHandle(const ConstraintEnv& env) const {
  if (env.context.Settings().projectionModel != PSettings::kModelFisheye) return false;
  const float width = static_cast<float>(env.context.PreviewWidth());
  const float height = static_cast<float>(env.context.PreviewHeight());
  auto inImage = [&](Point2f p) { return p.x >= 0 && p.x <= width && p.y >= 0 && p.y <= height; };
  if (!inImage(start_) || !inImage(end_)) return false;
  return !env.ShowsResult() || IsValid(env.solver);
}

bool LineConstraint::GetRotationGadget(const ConstraintEnv& env, float zoom, float angleDegrees,
                                       RotationGadget& out) const {
  const Point2f middle = GetPointAlong(env, 0.5f);
  if (middle.x == -1.0f && middle.y == -1.0f) return false;
  const Point2f end = env.ShowsResult() ? displayStart_ : start_;
  float length = Distance(end, middle);
  out.middle = middle;
  out.shortForm = length * zoom <= kShortLine;
  if (out.shortForm) length = kShortLineLength / zoom;
  out.radius = kGripRadiusFactor * length;
  const double a = angleDegrees * std::numbers::pi / 180.0;
  const float dx = static_cast<float>(std::cos(a)) * out.radius;
  const float dy = static_cast<float>(std::sin(a)) * out.radius;
  out.grips = {Point2f{middle.x + dx, middle.y + dy}, Point2f{middle.x - dx, middle.y - dy}};
  return true;
}

std::int32_t LineConstraint::RotationCursor(float angle, float dx, float dy) {
  if ((angle >= -22.5f && angle < 22.5f) || angle >= 157.5f || angle < -157.5f) {
    return dx >= 0.0f ? 26059 : 26057;
  }
  if ((angle >= 22.5f && angle < 67.5f) || (angle >= -157.5f && angle < -112.5f)) {
    return dx >= 0.0f ? 26063 : 26060;
  }
  if ((angle >= 67.5f && angle < 112.5f) || (angle >= -112.5f && angle < -67.5f)) {
    return dy >= 0.0f ? 26058 : 26056;
  }
  return dx < 0.0f ? 26062 : 26061;
}

}  // namespace Project
