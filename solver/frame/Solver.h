#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "lens/sphere/PhotoToSphere.h"
#include "solver/frame/ConstraintSet.h"
#include "solver/frame/SolverContext.h"
#include "solver/geodesic/GeodesicLines.h"
#include "solver/grid/OctaMap.h"
#include "solver/warp/SphereWarp.h"

namespace Project {

// The result plane's extent of a mesh, or of the part of it in view.
struct ViewBox {
  float width = 0;
  float height = 0;
  float texWidth = 0;  // the mesh's extent in texture space, 0 to 1
  float texHeight = 0;
  float centerX = 0;
  float centerY = 0;
  float left = 0;
  float right = 0;
  float bottom = 0;
  float top = 0;
};

// A box fitted to the preview: widened to the plane size the whole picture
// would take, then to the preview's aspect.
struct BoxFit {
  float fitLeft = 0;
  float fitRight = 0;
  float fitBottom = 0;
  float fitTop = 0;
  float fitWidth = 0;
  float fitHeight = 0;
  bool isWideFit = false;
  float viewWidth = 0;
  float viewHeight = 0;
};

// The hub of the warp solve: it owns one grid, one sphere image model of the
// photograph, the traced constraint lines and the current warp (all shared,
// because the warp and the lines hold the grid and the model too), decides
// which warp is built, runs it and collects the mesh that everything else
// draws and hit-tests: result-plane positions and texture coordinates of
// every vertex, and a mask of cells. It also converts points between the
// preview, the result plane and the photograph.
//
// The filter's settings, photo and panes are reached through the context,
// which outlives the solver. Runs on the dialog's thread, without locks.
class Solver {
 public:
  explicit Solver(SolverContext& context);
  Solver(const Solver&) = delete;
  Solver& operator=(const Solver&) = delete;
  ~Solver();

  // A solver for trial projections: a fisheye model of the focal setting
  // and a Mercator warp, no constraints.
  void Initialize();
  // A new grid from the settings, then a new warp on it.
  void RebuildGrid(bool userChanged);
  void BuildWarp(bool userChanged);
  // The same for a new projection, focal length or constraint set on the
  // same grid: the mesh is solved before the constraints are traced on it.
  void RefreshWarp(bool userChanged);
  // After an edit: solve again, or rebuild after a failed solve.
  void Update(bool full, bool notify);
  // Solves and collects the mesh; see the .cpp for the order.
  void Solve(bool full, bool notify);

  // Copies the full box to the active one and fits it to the view.
  void ApplyView(bool keepLimits);
  // mode 0: the active box, 1: the full one.
  BoxFit FitBox(std::int32_t mode) const;
  void ComputeCenterLimits();

  // Preview to texture fractions (mode 0) or to the result plane (mode 1);
  // other modes leave out untouched. PlaneToView is the inverse, and writes
  // zero for other modes.
  void ViewToPlane(const float point[2], float out[2], std::int32_t mode) const;
  void PlaneToView(const float point[2], float out[2], std::int32_t mode) const;
  // The zoomed preview's rectangle to the window (mode 0) and back (mode 1).
  void PreviewToResult(const float point[2], float out[2], std::int32_t mode) const;
  // A point of the result preview to the photograph's position in the
  // preview's pixels, in place; see the .cpp for the answer.
  bool PreviewToSource(float point[2]) const;
  // A photograph position in the preview's pixels to the result preview.
  bool SourceToPreview(const float point[2], float out[2]) const;

  // The constraints to register on each new warp; borrowed, may be null.
  void SetConstraints(ConstraintSet* constraints) { constraints_ = constraints; }
  void UpdateConstraintDisplays(std::int32_t constraintId);

  bool IsCellVisible(std::int32_t i, std::int32_t j) const;
  bool IsCellInMask(std::int32_t i, std::int32_t j) const;

  const std::shared_ptr<OctaMap>& GetOctaMap() const { return octaMap_; }
  const std::shared_ptr<SphereWarp>& GetWarp() const { return warp_; }
  const std::shared_ptr<PhotoToSphere>& GetImageModel() const { return imageModel_; }
  const std::shared_ptr<GeodesicLines>& GetLines() const { return lines_; }
  // Vertex (i, j) at index j * N + i, two floats each.
  const std::vector<float>& Positions() const { return positions_; }
  const std::vector<float>& TexCoords() const { return texCoords_; }
  std::int32_t GridSize() const { return gridSize_; }
  std::int32_t CellCount() const { return cellCount_; }
  const ViewBox& FullBox() const { return fullBox_; }
  // minX, minY, maxX, maxY: how far the view centre may move.
  const float* CenterLimits() const { return centerLimits_; }
  std::int32_t WarpModel() const { return warpModel_; }
  bool IsWide() const { return isWide_; }
  bool IsLimited() const { return isLimited_; }
  void GetLimits(float& latMin, float& latMax, float& lonMin, float& lonMax) const;
  bool Solved() const { return solved_; }

 private:
  // The regulariser model the settings ask for, Auto resolved.
  void ChooseWarpModel();
  // Whether a usable image model was built.
  bool BuildImageModel();
  // Measures the mesh's angular extent and answers whether the warp must
  // fall back to the stereographic model.
  bool MeasureExtents();
  // Texture coordinates and cell mask of a freshly built warp.
  void LoadTexCoords();
  void CollectMesh();
  std::shared_ptr<SphereWarp> MakeWarp();
  // Steps shared by BuildWarp and RefreshWarp: the model, then the warp
  // rebuilt until its extents settle. keepLines keeps the constraint store.
  void PrepareWarp(bool userChanged, bool keepLines);
  bool HasConstraints() const { return constraints_ != nullptr && !constraints_->IsEmpty(); }
  // The view's half-size in preview fractions at the current scale.
  float ViewHalfSize() const;

  SolverContext& context_;
  ConstraintSet* constraints_ = nullptr;
  std::shared_ptr<OctaMap> octaMap_;
  std::shared_ptr<SphereWarp> warp_;
  std::shared_ptr<PhotoToSphere> imageModel_;
  std::shared_ptr<GeodesicLines> lines_;
  std::vector<float> positions_;
  std::vector<float> texCoords_;
  std::int32_t gridSize_ = 0;
  std::int32_t cellCount_ = 0;
  ViewBox activeBox_;
  ViewBox fullBox_;
  float centerLimits_[4] = {0, 0, 1, 1};
  std::vector<std::uint8_t> cellMask_;
  // Per vertex: whether the model covers its direction (the mesh may reach
  // a ring past that), as of the last LoadTexCoords.
  std::vector<std::uint8_t> covered_;
  bool isWide_ = false;
  std::int32_t warpModel_ = 3;
  bool userChanged_ = false;
  bool isLimited_ = false;
  float latMin_ = 0;
  float latMax_ = 0;
  float lonMin_ = 0;
  float lonMax_ = 0;
  bool clampCenter_ = true;
  bool solved_ = false;
};

}  // namespace Project
