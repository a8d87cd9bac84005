#pragma once

#include <cstdint>
#include <vector>

namespace Project {

// The grid every warp lives on: an octahedron unfolded into a square of
// N x N vertices, N = 2^(level + 1) + 1, each vertex a unit direction of the
// sphere. With h = (N - 1) / 2, vertex (h, h) is the view axis +x, the edge
// midpoints (h, 0), (h, 2h), (0, h), (2h, h) are +z, -z, -y, +y and the four
// corners are all -x; the outer border folds shut, (i, 0) being the same
// direction as (2h - i, 0) and likewise on the other sides.
//
// The vertices are computed once, at construction, and never change. A
// rotation of the sphere is kept beside them and applied by every reader
// that asks for it, so setting one costs nine floats. The map is shared by
// the solver, its warps and its constraint lines.
class OctaMap {
 public:
  // useEliminationSolve picks Gaussian elimination with pivoting over the
  // closed-form inverse for each vertex's 3 x 3 system; the two differ only
  // in rounding.
  OctaMap(std::int32_t level, bool useEliminationSolve);
  OctaMap(const OctaMap&) = delete;
  OctaMap& operator=(const OctaMap&) = delete;

  std::int32_t Width() const { return size_; }
  std::int32_t Height() const { return size_; }
  std::int32_t Level() const { return level_; }
  // h: half the vertex count less one.
  std::int32_t Half() const { return (size_ - 1) / 2; }

  // The stored direction's latitude and longitude, ignoring the rotation.
  void GetDirection(std::int32_t i, std::int32_t j, float& outLat, float& outLon) const;
  // The same after the rotation, when one is set.
  void GetRotatedDirection(std::int32_t i, std::int32_t j, float& outLat, float& outLon) const;
  void GetPoint(std::int32_t i, std::int32_t j, float out[3]) const;
  void GetRotatedPoint(std::int32_t i, std::int32_t j, float out[3]) const;
  // East and north at the rotated point.
  void GetTangentFrame(std::int32_t i, std::int32_t j, float outEast[3], float outNorth[3]) const;

  // Nine floats, row by row. Once set, the map counts as rotated for good.
  void SetRotation(const float rotation[9]);
  const float* Rotation() const { return rotation_; }
  bool HasRotation() const { return hasRotation_; }

  // A cell is named by its corner (i, j) with the lowest indices. Sides:
  // 0 is j - 1, 1 is i + 1, 2 is j + 1, 3 is i - 1. Across the outer border
  // the step comes back in through the fold.
  struct Cell {
    std::int32_t i = -1;
    std::int32_t j = -1;
    bool operator==(const Cell&) const = default;
  };
  Cell NeighbourCell(Cell cell, std::int32_t side) const;

  // The diagonal that cuts cell (i, j) into two triangles, wherever a cell
  // is taken as triangles: traced lines, point weights and the drawn mesh
  // all use this one, so a line straight through the traced triangles is
  // straight through the drawn ones. It is the shorter diagonal on the
  // sphere, the stored points deciding so that no rotation flips it. True
  // for the main diagonal, from corner (i, j) to (i + 1, j + 1): triangles
  // (i, j), (i + 1, j), (i + 1, j + 1) and (i, j), (i + 1, j + 1), (i, j + 1).
  // False for the other: (i, j), (i + 1, j), (i, j + 1) and (i + 1, j),
  // (i + 1, j + 1), (i, j + 1).
  bool SplitsAlongMainDiagonal(std::int32_t i, std::int32_t j) const;

  // Directions from unit vectors, in the grid's own conventions.
  static void PointToDirection(const float p[3], float& outLat, float& outLon);

 private:
  void BuildVertex(std::int32_t i, std::int32_t j, float out[3]) const;
  void Rotate(const float in[3], float out[3]) const;

  const std::int32_t level_;
  const std::int32_t size_;
  const bool useEliminationSolve_;
  std::vector<float> points_;  // size_ * size_ triples, index j * size_ + i
  float rotation_[9] = {1, 0, 0, 0, 1, 0, 0, 0, 1};
  bool hasRotation_ = false;
};

}  // namespace Project
