#pragma once

#include <cstdint>
#include <memory>

#include "lens/sphere/Image.h"
#include "solver/frame/Solver.h"
#include "solver/frame/SolverContext.h"
#include "solver/geodesic/LineRecords.h"

namespace Project {

// Calibrates the focal length of a fisheye photograph from three points of
// one straight line of the world: its two ends and a third point on it. A
// straight line is a great circle of the sphere; for a wrong focal length
// the circle through the two ends misses the third point. Start searches
// for the focal length, in pixels of the source, at which it passes within
// half a pixel of it.
//
// The points are pixels of the source, the unit of the focal length itself:
// the first guess and the floor of the search are taken from their distance
// to the centre, and a first guess in another unit can leave every trial
// trace off the sphere. A caller holding preview positions scales them
// first. The centre serves only to tell on which side of the third point the
// arc runs.
//
// Owns a private Solver, built once by Initialize, so that a search never
// touches the solver the dialog shows, nor the constraint list. Each round
// gives that solver's line store a fresh fisheye model of the trial focal
// length; the grid and the warp stay as built. The context is borrowed and
// must outlive this object. Runs on the dialog's thread.
class FocalSolver {
 public:
  explicit FocalSolver(SolverContext& context);
  FocalSolver(const FocalSolver&) = delete;
  FocalSolver& operator=(const FocalSolver&) = delete;
  virtual ~FocalSolver();

  // The caller sets all four before Start.
  void SetLineStart(Point2f point) { lineStart_ = {point.x, point.y}; }
  void SetLineEnd(Point2f point) { lineEnd_ = {point.x, point.y}; }
  void SetTarget(Point2f point) { target_ = {point.x, point.y}; }
  void SetCenter(Point2f point) { center_ = {point.x, point.y}; }

  // The focal length in pixels, or -1.0 when the search failed: no answer
  // within kMaxRounds rounds, or a guess that ran away.
  double Start();

  static constexpr std::int32_t kMaxRounds = 20;
  // How near the arc must pass to the third point, in pixels.
  static constexpr double kTolerance = 0.5;
  // The search gives up on a guess longer than this many times the
  // picture's longer side: about half a degree across it.
  static constexpr double kMaxFocalRatio = 100.0;

 private:
  struct Point2d {
    double x = 0.0;
    double y = 0.0;
  };

  // The signed miss of the arc traced for focal, or false when the trace
  // failed. Negative while the arc runs beyond the third point as seen from
  // the centre; positive once it passes between the two.
  bool Measure(double focal, double& outError) const;

  std::shared_ptr<const Image> image_;
  std::unique_ptr<Solver> solver_;
  Point2d lineStart_;
  Point2d lineEnd_;
  Point2d target_;
  Point2d center_;
  // Trial focal lengths below this are raised to it; a failed trace raises
  // it to the focal length that failed.
  double minFocal_ = 0.0;
};

}  // namespace Project
