#include "solver/warp/PaniniProjection.h"

namespace Project {

bool PaniniProjection::IsInDomain(std::int32_t i, std::int32_t j) const {
  (void)i;
  (void)j;
  return true;
}

void PaniniProjection::Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const {
  float lat, lon;
  octaMap_->GetRotatedDirection(i, j, lat, lon);
  const float d = 2.001f / (Cos(lon) + 1.001f);
  outU = Sin(lon) * d;
  outV = Tan(lat) * d;
}

}  // namespace Project
