#pragma once

#include <cstdint>
#include <memory>

#include "lens/sphere/PhotoToSphere.h"
#include "solver/grid/OctaMap.h"
#include "solver/warp/SphereWarp.h"

namespace Project {

// A classic map projection of the sphere, one formula per vertex. It
// anchors the iterative warp as its regulariser, and stands alone where no
// constraints apply. A vertex's position depends on its rotated direction
// alone; whether it lies in the picture, on its unrotated direction (the
// picture never turns with the grid). A vertex outside the picture still has
// a position, so the regulariser anchors the whole grid; a vertex where the
// formula is undefined answers (0, 0).
//
// Shares the grid and the image model with its owner; holds nothing else.
class ClosedFormWarp : public SphereWarp {
 public:
  ClosedFormWarp(std::shared_ptr<const OctaMap> octaMap,
                 std::shared_ptr<const PhotoToSphere> imageModel);

  bool IsVertexInside(std::int32_t i, std::int32_t j) const override;
  bool IsQuadInside(std::int32_t i, std::int32_t j) const override;
  void GetVertexPosition(std::int32_t i, std::int32_t j, float& outU, float& outV) const override;
  void Solve() override {}

  // Whether the formula is defined at the vertex.
  virtual bool IsInDomain(std::int32_t i, std::int32_t j) const = 0;
  // The formula itself, at the vertex's rotated direction.
  virtual void Project(std::int32_t i, std::int32_t j, float& outU, float& outV) const = 0;

 protected:
  // Trigonometry in double on single arguments, rounded back at once.
  static float Sin(float a);
  static float Cos(float a);
  static float Tan(float a);
  static float Log(float a);

  const std::int32_t gridSize_;
  const std::shared_ptr<const OctaMap> octaMap_;
  const std::shared_ptr<const PhotoToSphere> imageModel_;
};

// The regulariser for a warp model value: 2 Mercator, 3 Panini, 1000
// equirectangular, anything else stereographic.
std::unique_ptr<ClosedFormWarp> MakeClosedFormWarp(std::int32_t warpModel,
                                                   std::shared_ptr<const OctaMap> octaMap,
                                                   std::shared_ptr<const PhotoToSphere> imageModel);

}  // namespace Project
