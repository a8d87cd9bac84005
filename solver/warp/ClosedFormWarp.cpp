#include "solver/warp/ClosedFormWarp.h"

#include <cmath>
#include <utility>

#include "solver/warp/EquirectangularClosedForm.h"
#include "solver/warp/MercatorClosedForm.h"
#include "solver/warp/PaniniProjection.h"
#include "solver/warp/StereographicClosedForm.h"

namespace Project {

ClosedFormWarp::ClosedFormWarp(std::shared_ptr<const OctaMap> octaMap,
                               std::shared_ptr<const PhotoToSphere> imageModel)
    : gridSize_(octaMap->Width()),
      octaMap_(std::move(octaMap)),
      imageModel_(std::move(imageModel)) {}

bool ClosedFormWarp::IsVertexInside(std::int32_t i, std::int32_t j) const {
  float lat, lon;
  octaMap_->GetDirection(i, j, lat, lon);
  return imageModel_->Contains(lon, lat);
}

bool ClosedFormWarp::IsQuadInside(std::int32_t i, std::int32_t j) const {
  return AllCornersInside(i, j);
}

void ClosedFormWarp::GetVertexPosition(std::int32_t i, std::int32_t j, float& outU,
                                       float& outV) const {
  if (IsInDomain(i, j)) {
    Project(i, j, outU, outV);
  } else {
    outU = 0.0f;
    outV = 0.0f;
  }
}

float ClosedFormWarp::Sin(float a) { return static_cast<float>(std::sin(static_cast<double>(a))); }
float ClosedFormWarp::Cos(float a) { return static_cast<float>(std::cos(static_cast<double>(a))); }
float ClosedFormWarp::Tan(float a) { return static_cast<float>(std::tan(static_cast<double>(a))); }
float ClosedFormWarp::Log(float a) { return static_cast<float>(std::log(static_cast<double>(a))); }

std::unique_ptr<ClosedFormWarp> MakeClosedFormWarp(
    std::int32_t warpModel, std::shared_ptr<const OctaMap> octaMap,
    std::shared_ptr<const PhotoToSphere> imageModel) {
  switch (warpModel) {
    case 2:
      return std::make_unique<MercatorClosedForm>(std::move(octaMap), std::move(imageModel));
    case 3:
      return std::make_unique<PaniniProjection>(std::move(octaMap), std::move(imageModel));
    case 1000:
      return std::make_unique<EquirectangularClosedForm>(std::move(octaMap), std::move(imageModel));
    default:
      return std::make_unique<StereographicClosedForm>(std::move(octaMap), std::move(imageModel));
  }
}

}  // namespace Project
