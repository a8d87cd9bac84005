#pragma once

#include <cstdint>

namespace Project {

// A warp of the whole sphere onto the result plane, defined on the vertices
// of an OctaMap: for each vertex inside the mesh, the (u, v) of the plane
// where it lands. The result image is the mesh drawn with the photograph as
// texture, so a warp is consulted vertex by vertex and cell by cell only.
//
// Subclasses own whatever state their solve needs; the grid and the sphere
// image model they read are shared with the Solver that builds them.
class SphereWarp {
 public:
  SphereWarp() = default;
  SphereWarp(const SphereWarp&) = delete;
  SphereWarp& operator=(const SphereWarp&) = delete;
  virtual ~SphereWarp() = default;

  // Whether the vertex belongs to the mesh.
  virtual bool IsVertexInside(std::int32_t i, std::int32_t j) const = 0;
  // Whether the cell with corners (i, j) to (i + 1, j + 1) belongs to it.
  virtual bool IsQuadInside(std::int32_t i, std::int32_t j) const = 0;
  virtual void GetVertexPosition(std::int32_t i, std::int32_t j, float& outU,
                                 float& outV) const = 0;
  // Computes the warp.
  virtual void Solve() = 0;
  virtual bool Succeeded() const { return true; }
  // Forgets what depended on the grid's rotation.
  virtual void Reset() {}

 protected:
  // The cell test shared by every concrete warp: all four corners inside,
  // tried in the order (i, j), (i + 1, j), (i, j + 1), (i + 1, j + 1).
  bool AllCornersInside(std::int32_t i, std::int32_t j) const {
    return IsVertexInside(i, j) && IsVertexInside(i + 1, j) && IsVertexInside(i, j + 1) &&
           IsVertexInside(i + 1, j + 1);
  }
};

}  // namespace Project
