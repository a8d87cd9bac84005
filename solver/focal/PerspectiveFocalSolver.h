#pragma once

#include <cstdint>

#include "solver/frame/Solver.h"
#include "solver/frame/SolverContext.h"

namespace Project {

// Calibrates the focal length of a perspective photograph from the warped
// result: the user drags a corner of the picture's frame as the preview
// shows it, and the length of the drag turns into a new focal length. There
// is no fit; five pixels of focal length per pixel of drag is the whole
// model.
//
// Corners are numbered 0 at (0, 0), 1 at (W, 0), 2 at (W, H), 3 at (0, H) of
// the photograph, in the pixels that Solver::SourceToPreview takes; kNoCorner
// stands for none. Holds the drag's latest point and a borrowed context that
// must outlive it; the solver it measures with is the caller's.
class PerspectiveFocalSolver {
 public:
  static constexpr std::int32_t kNoCorner = 4;
  // Focal pixels per preview pixel of drag.
  static constexpr double kDragScale = 5.0;

  explicit PerspectiveFocalSolver(SolverContext& context) : context_(context) {}
  PerspectiveFocalSolver(const PerspectiveFocalSolver&) = delete;
  PerspectiveFocalSolver& operator=(const PerspectiveFocalSolver&) = delete;
  virtual ~PerspectiveFocalSolver() = default;

  // Where the dragged corner has been brought, in preview coordinates.
  void SetTarget(std::int32_t x, std::int32_t y) {
    targetX_ = x;
    targetY_ = y;
  }

  // The new focal length in pixels for a drag of the corner, measured on
  // the solver that shows the result; 0.0 for kNoCorner. A corner pulled
  // inwards, still on its own side of where it is shown, shortens the focal
  // length; pulled past that, it lengthens it. Only x decides which.
  double GetFocal(std::int32_t corner, const Solver& shown) const;

 private:
  SolverContext& context_;
  std::int32_t targetX_ = 0;
  std::int32_t targetY_ = 0;
};

}  // namespace Project
