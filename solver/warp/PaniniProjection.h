#pragma once

#include "solver/warp/ClosedFormWarp.h"

namespace Project {

// The Panini projection. The constants 2.001 and 1.001 keep it finite at
// longitude pi, where cos(lon) + 1 vanishes; the tangent of the latitude is
// left unguarded and grows very large at the poles.
class PaniniProjection : public ClosedFormWarp {
 public:
  using ClosedFormWarp::ClosedFormWarp;

  bool IsInDomain(std::int32_t i, std::int32_t j) const override;
  void Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const override;
};

}  // namespace Project
