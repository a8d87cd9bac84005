#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <random>
#include <vector>

#include "lens/sphere/PhotoToSphere.h"
#include "solver/geodesic/LineRecords.h"
#include "solver/geodesic/Vec3.h"
#include "solver/grid/OctaMap.h"
#include "solver/warp/SphereWarp.h"

namespace Project {

// The store of constraint geometry on the mesh, and the toolbox that moves
// points between the photograph, the sphere and the result plane.
//
// A straight line of the world is a great circle of the sphere. It is kept
// here as the walk of that circle across the cells of the OctaMap: one
// sample per cell crossed plus the two ends, each a point of its cell given
// by weights on the cell's four corners. Each sample is thus a fixed linear
// combination of vertices, which is what lets the mesh solve write a line's
// straightness as linear rows. Polygons are kept as the grid vertices inside
// them, with plane coordinates, and their traced edges.
//
// Points live in one of two spaces, named by a mode: mode 0 is the
// photograph, a corner being the texture coordinate of its vertex's stored
// direction; mode 1 is the result plane, a corner being the warp's position
// of the vertex. A corner's sphere point is the stored point in mode 0 and
// the rotated point in mode 1.
//
// Ownership: the grid and the image model are shared with the Solver and
// the warps; the warp is borrowed, set by the Solver and replaced as the
// solver changes it, and must outlive its use here. The records are owned
// here; callers edit them through the accessors. One store is built per
// warp build and lives until the next.
class GeodesicLines {
 public:
  using Cell = OctaMap::Cell;

  // useTriangles: cells are split into two triangles when mapping points,
  // and traced samples lie on cell edges and diagonals.
  GeodesicLines(std::shared_ptr<const OctaMap> octaMap,
                std::shared_ptr<const PhotoToSphere> imageModel, bool useTriangles);
  GeodesicLines(const GeodesicLines&) = delete;
  GeodesicLines& operator=(const GeodesicLines&) = delete;

  // Borrowed; may be null until the first warp is built, and then nothing
  // is found on the mesh.
  void SetWarp(const SphereWarp* warp) { warp_ = warp; }
  void SetImageModel(std::shared_ptr<const PhotoToSphere> imageModel);
  const std::shared_ptr<const OctaMap>& GetOctaMap() const { return octaMap_; }

  std::vector<LineRecord>& GetLines() { return lines_; }
  const std::vector<LineRecord>& GetLines() const { return lines_; }
  std::vector<PlaneRecord>& GetPlanes() { return planes_; }
  const std::vector<PlaneRecord>& GetPlanes() const { return planes_; }
  PlaneRecord& GetDraftPlane() { return draftPlane_; }
  const PlaneRecord& GetDraftPlane() const { return draftPlane_; }
  // Copies of the polygon edges that carry a fixed normal, in polygon order:
  // the edges that count as line constraints.
  std::vector<LineRecord> CollectEdgeLines() const;

  // --- Cells and points ---

  // The texture coordinate of vertex (i, j)'s stored direction, worked out
  // once per image model.
  void TexCoord(std::int32_t i, std::int32_t j, float out[2]) const {
    const std::size_t at = (std::size_t(j) * std::size_t(octaMap_->Width()) + std::size_t(i)) * 2;
    out[0] = texCoords_[at];
    out[1] = texCoords_[at + 1];
  }
  // The four corners of cell (i, j) in the mode's space, x0, y0 to x3, y3.
  void GetCellCorners(std::int32_t i, std::int32_t j, std::int32_t mode, float out[8]) const;
  // The corners' sphere points, in the same order.
  void GetCellSpherePoints(std::int32_t i, std::int32_t j, std::int32_t mode, float out[12]) const;
  // The cell of the mesh that holds the point, searched in parallel. A point
  // on the border of two cells may give either. False, with (-1, -1), when
  // none holds it, and always on grids of fewer than 16 cell rows.
  bool FindCell(const float point[2], Cell& outCell, std::int32_t mode) const;
  // The finder's test of one cell, whether or not the cell is in the mesh.
  bool IsPointInCell(const float point[2], Cell cell, std::int32_t mode) const;
  // Weights of the point on the cell's corners: the inverse bilinear map, or
  // the triangle form when the store uses triangles.
  void CellWeights(const float point[2], Cell cell, std::int32_t mode, float outWeights[4]) const;
  // The same weights on the corners' sphere points: a direction, not
  // normalised.
  void SpherePoint(const float point[2], Cell cell, std::int32_t mode, float out[3]) const;
  // Photograph fraction to result plane point, and back. False when no cell
  // holds the point.
  bool FindResultPoint(const float fraction[2], float outPoint[2]) const;
  bool FindSourcePoint(const float point[2], float outFraction[2]) const;
  // In the mesh, and at least one corner on the photograph.
  bool IsCellVisible(std::int32_t i, std::int32_t j) const;

  // --- Tracing ---

  // Traces the great circle between two points of the mode's space into
  // line.samples. kind says which end moved since previous was traced: 0
  // keeps previous's first sample (its cell and position), 1 its last, 2
  // searches both. line and previous may be the same record. Failure is
  // reported through line.active.
  void TraceArc(LineRecord& line, const LineRecord& previous, const float from[2],
                const float to[2], std::int32_t kind, std::int32_t mode) const;
  // The walk from cell to cell, appending to line.samples: one sample per
  // cell at the middle of the circle's chord through it, plus the ends.
  void WalkCells(LineRecord& line, const float from[2], const float to[2], Cell cellFrom,
                 Cell cellTo, std::int32_t mode) const;
  // The same walk with samples on cell edges and diagonals, for triangles.
  void WalkCellsTriangles(LineRecord& line, const float from[2], const float to[2], Cell cellFrom,
                          Cell cellTo, std::int32_t mode) const;
  // The samples' positions in the mode's space; mode 2 is mode 1 for the
  // first and last samples only.
  std::vector<Point2f> TraceSamples(const LineRecord& line, std::int32_t mode) const;

  // --- The polygon being drawn ---

  // Adds a corner; from the second on, traces the edge from the last corner
  // to it (or, when closing, to the first corner, adding no corner). kind 1
  // fixes the edge horizontal, 2 vertical. Answers whether the new edge
  // traced (true when none was traced).
  bool AddDraftPoint(const float point[2], bool closing, std::int32_t kind);
  // Takes back the last edge and the last corner.
  void RemoveLastDraftEdge();
  void ClearDraftPlane();

  // --- Fits ---

  // For each active line: the total least-squares normal of its samples in
  // the result plane, and each sample's place along it.
  void FitLines();
  // For each polygon: eight Gauss-Newton rounds on its homography from
  // plane coordinates to the current mesh.
  void FitHomographies();
  // Collects the grid vertices inside the polygon, from its corners, with
  // plane coordinates about its centre. False when a corner is off the mesh
  // or there are fewer than three.
  bool SamplePlane(PlaneRecord& plane);
  // A rotation of the sphere, row by row, that makes the vertical
  // constraints vertical; the identity when there are none.
  void ComputeAutoRotation(float out[9]) const;

  // --- Snapping ---

  // The mesh point, in the mode's space, whose sphere point lies on the ray
  // from the centre through the direction, by an exhaustive scan of the
  // mesh's cells, each split as OctaMap::SplitsAlongMainDiagonal says.
  bool FindSpherePoint(const float direction[3], std::int32_t mode, float outPoint[2]) const;
  // The point of the great circle through a and b nearest to point, all in
  // the mode's space, on the side of the circle nearer the ends' middle.
  // pixelsPerUnit scales the mode's units to pixels on each axis: a snap
  // that moves the point more than kMaxSnapPixels is refused.
  bool SnapToArc(const float point[2], const float a[2], const float b[2], std::int32_t mode,
                 const float pixelsPerUnit[2], float outPoint[2]) const;
  static constexpr float kMaxSnapPixels = 100.0f;

 private:
  // The great circle through a line's two ends: the far end, the circle's
  // normal and the angle between the ends.
  struct Arc {
    Vec3 endB;
    Vec3 normal;
    double total = 0.0;
  };
  Arc ArcBetween(const float from[2], const float to[2], Cell cellFrom, Cell cellTo,
                 std::int32_t mode) const;
  // Fills texCoords_ from the image model.
  void CacheTexCoords();
  // FindCell's parallel search, for one point.
  bool SearchCell(const float point[2], Cell& outCell, std::int32_t mode) const;
  // How far FindCell moves a point that no cell claims: some float steps of
  // a coordinate near 1, far below a pixel of any photograph.
  static constexpr float kLevelNudge = 1e-6f;
  // A cell's four corners on the sphere, in this mode.
  void CellSphereCorners(Cell cell, std::int32_t mode, Vec3 out[4]) const;
  bool QuadInside(Cell cell) const {
    return warp_ != nullptr && warp_->IsQuadInside(cell.i, cell.j);
  }
  void CornerPosition(std::int32_t i, std::int32_t j, std::int32_t mode, float out[2]) const;
  void CornerSpherePoint(std::int32_t i, std::int32_t j, std::int32_t mode, float out[3]) const;
  // A sample's position: its weights on the corners in the mode's space.
  Point2f SamplePosition(const LineSample& sample, std::int32_t mode) const;
  // A sample of the point in the cell, with the weights of CellWeights.
  LineSample EndSample(const float point[2], Cell cell, std::int32_t mode, bool triangles,
                       float position) const;
  std::array<float, 9> AutoRotation() const;
  void FitLine(LineRecord& line) const;
  void FitHomography(PlaneRecord& plane) const;

  const std::shared_ptr<const OctaMap> octaMap_;
  std::shared_ptr<const PhotoToSphere> imageModel_;
  const SphereWarp* warp_ = nullptr;
  const bool useTriangles_;
  // Every vertex's texture coordinate, two floats at (j * N + i) * 2: the
  // cell finder and the tracing read corners in the photograph far more
  // often than the model could be asked.
  std::vector<float> texCoords_;
  std::vector<LineRecord> lines_;
  std::vector<PlaneRecord> planes_;
  PlaneRecord draftPlane_;
  // The ray directions of SamplePlane's inside test.
  std::mt19937 random_{20240611u};
};

}  // namespace Project
