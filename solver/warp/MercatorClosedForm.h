#pragma once

#include "solver/warp/ClosedFormWarp.h"

namespace Project {

// The Mercator projection: longitude across, the Mercator latitude up. The
// first and last rows, which hold the poles, are outside its domain; the
// folded columns are not.
class MercatorClosedForm : public ClosedFormWarp {
 public:
  using ClosedFormWarp::ClosedFormWarp;

  bool IsInDomain(std::int32_t i, std::int32_t j) const override;
  void Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const override;
};

}  // namespace Project
