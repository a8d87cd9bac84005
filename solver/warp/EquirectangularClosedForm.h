#pragma once

#include "solver/warp/ClosedFormWarp.h"

namespace Project {

// The equirectangular projection: longitude and latitude in radians, a plane
// of 2 pi by pi.
class EquirectangularClosedForm : public ClosedFormWarp {
 public:
  using ClosedFormWarp::ClosedFormWarp;

  bool IsInDomain(std::int32_t i, std::int32_t j) const override;
  void Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const override;
};

}  // namespace Project
