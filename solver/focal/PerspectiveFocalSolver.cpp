#include "solver/focal/PerspectiveFocalSolver.h"

#include <cmath>

namespace Project {

double PerspectiveFocalSolver::GetFocal(std::int32_t corner, const Solver& shown) const {
  if (corner < 0 || corner >= kNoCorner) return 0.0;
  const float w = static_cast<float>(context_.PreviewWidth());
  const float h = static_cast<float>(context_.PreviewHeight());
  const float cornerX[4] = {0.0f, w, w, 0.0f};
  const float cornerY[4] = {0.0f, 0.0f, h, h};
  const float source[2] = {cornerX[corner], cornerY[corner]};
  float shownAt[2];
  shown.SourceToPreview(source, shownAt);

  const double focal = context_.Settings().focalLength;
  const float ex = shownAt[0] - static_cast<float>(targetX_);
  const float ey = shownAt[1] - static_cast<float>(targetY_);
  const double drag = static_cast<double>(std::sqrt(ex * ex + ey * ey)) * kDragScale;
  const double a = source[0] - static_cast<float>(targetX_) >= 0.0f ? 1.0 : -1.0;
  const double b = ex >= 0.0f ? 1.0 : -1.0;
  return a == b ? focal - drag : focal + drag;
}

}  // namespace Project
