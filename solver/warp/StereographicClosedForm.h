#pragma once

#include "solver/warp/ClosedFormWarp.h"

namespace Project {

// The stereographic projection from the antipode of the view axis. Only the
// front hemisphere, the diamond of the map's four inner triangles, is in its
// domain: behind it the formula diverges towards the antipode.
class StereographicClosedForm : public ClosedFormWarp {
 public:
  using ClosedFormWarp::ClosedFormWarp;

  bool IsInDomain(std::int32_t i, std::int32_t j) const override;
  void Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const override;
};

}  // namespace Project
