#include "solver/warp/EquirectangularClosedForm.h"

namespace Project {

bool EquirectangularClosedForm::IsInDomain(std::int32_t i, std::int32_t j) const {
  (void)i;
  (void)j;
  return true;
}

void EquirectangularClosedForm::Project(std::int32_t i, std::int32_t j, float& outU,
                                        float& outV) const {
  float lat, lon;
  octaMap_->GetRotatedDirection(i, j, lat, lon);
  outU = lon;
  outV = lat;
}

}  // namespace Project
