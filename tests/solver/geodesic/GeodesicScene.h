#pragma once

#include <cmath>
#include <memory>

#include "lens/sphere/FisheyeImage.h"
#include "solver/geodesic/GeodesicLines.h"
#include "solver/geodesic/Vec3.h"
#include "solver/warp/ClosedFormWarp.h"

namespace Project {

// A grid, an image model, a closed-form warp and a store of lines on them,
// as the solver wires them.
struct GeodesicScene {
  std::shared_ptr<OctaMap> map;
  std::shared_ptr<const PhotoToSphere> model;
  std::unique_ptr<ClosedFormWarp> warp;
  std::unique_ptr<GeodesicLines> lines;

  GeodesicScene(int level, bool triangles, std::shared_ptr<const PhotoToSphere> imageModel,
                int warpModel = 1)
      : map(std::make_shared<OctaMap>(level, false)), model(std::move(imageModel)) {
    warp = MakeClosedFormWarp(warpModel, map, model);
    lines = std::make_unique<GeodesicLines>(map, model, triangles);
    lines->SetWarp(warp.get());
  }

  // The photograph fraction of a direction.
  Point2f Fraction(double lon, double lat) const {
    float uv[2];
    model->GetTexCoord(static_cast<float>(lon), static_cast<float>(lat), uv);
    return {uv[0], uv[1]};
  }
  // A sample's direction: its weights on the corners' sphere points.
  Vec3 SampleDirection(const LineSample& s, int mode) const {
    float corners[12];
    lines->GetCellSpherePoints(s.cellI, s.cellJ, mode, corners);
    Vec3 p;
    for (int k = 0; k < 4; ++k)
      p = p + static_cast<double>(s.weights[k]) * Vec3::From(corners + 3 * k);
    return (1.0 / Length(p)) * p;
  }
};

// A wide equisolid fisheye of 1000 x 750 pixels: the front half sphere
// lands on a circle of radius 424 pixels.
inline std::shared_ptr<const PhotoToSphere> WideFisheye() {
  return std::make_shared<FisheyeImage>(std::make_shared<const Image>(1000, 750), 300.0f, 500.0f,
                                        375.0f);
}

inline Vec3 Direction(double lon, double lat) {
  return {std::cos(lat) * std::cos(lon), std::cos(lat) * std::sin(lon), std::sin(lat)};
}

}  // namespace Project
