#include "solver/warp/MercatorClosedForm.h"

namespace Project {

bool MercatorClosedForm::IsInDomain(std::int32_t i, std::int32_t j) const {
  (void)i;
  return j >= 1 && j < gridSize_ - 1;
}

void MercatorClosedForm::Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const {
  float lat, lon;
  octaMap_->GetRotatedDirection(i, j, lat, lon);
  outU = lon;
  outV = Log(Tan(0.5f * lat + 0.78539816f));
}

}  // namespace Project
