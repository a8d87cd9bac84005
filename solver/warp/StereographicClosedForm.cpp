#include "solver/warp/StereographicClosedForm.h"

namespace Project {

bool StereographicClosedForm::IsInDomain(std::int32_t i, std::int32_t j) const {
  const std::int32_t c = gridSize_ / 2;
  const std::int32_t di = i > c ? i - c : c - i;
  const std::int32_t dj = j > c ? j - c : c - j;
  return di + dj <= c;
}

void StereographicClosedForm::Project(std::int32_t i, std::int32_t j, float& outU,
                                      float& outV) const {
  float lat, lon;
  octaMap_->GetRotatedDirection(i, j, lat, lon);
  const float cosLat = Cos(lat);
  const float k = 2.0f / (Cos(lon) * cosLat + 1.0f);
  outU = Sin(lon) * cosLat * k;
  outV = Sin(lat) * k;
}

}  // namespace Project
