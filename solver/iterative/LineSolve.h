#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "solver/geodesic/GeodesicLines.h"
#include "solver/iterative/IterativeWarpSolver.h"

namespace Project {

// How the Gauss-Newton road holds a line's samples on one straight line.
// kFromFirstSample: each sample's distance, along the line's normal, from
// its first sample, which couples every sample with the first one's cell.
// kOffset: each sample's distance from the line n . p = d, with the offset d
// an unknown of its own beside the angle: only those two are shared.
enum class LineForm { kFromFirstSample, kOffset };

// The weights of the line solve's own terms.
struct LineSolveWeights {
  double lineWeight = 30.0;
  double conformalWeight = 1.0;
  double smoothnessWeight = 3.0;
};

// The warp that Solver builds: the iterative warp with all its energy but
// the anchors. Every cell keeps its shape as on the sphere (conformal rows),
// every vertex keeps its two opposite edges in ratio and angle (smoothness
// rows), every line constraint's samples lie on one straight line, and every
// polygon's vertices follow one homography.
//
// Two roads: Gauss-Newton, with one angle unknown per line (and one offset
// in the offset form, the default) and eight homography unknowns per
// polygon, solving for a step each iteration; and the alternating road,
// which refits each line from the mesh and pulls it alternately to its chord
// and to its fitted line. Polygons need the first.
//
// Shares the constraint store with the Solver; owns the ends it remembers
// between solves to measure convergence.
class LineSolve : public IterativeWarpSolver {
 public:
  LineSolve(std::shared_ptr<const OctaMap> octaMap, std::shared_ptr<const PhotoToSphere> imageModel,
            std::shared_ptr<GeodesicLines> lines, const IterativeWarpSettings& settings,
            const LineSolveWeights& weights);

  double ConstraintEnergy() const override;
  // Half the squared residuals of one line's rows, with the angle unknown at
  // angleIndex on the Gauss-Newton road (and, in the offset form, the
  // offset that goes with it).
  double LineEnergy(const LineRecord& line, std::int32_t angleIndex) const;
  double ConvergenceMeasure() override;
  // The form of the Gauss-Newton road's line rows; takes effect at the next
  // Solve.
  void SetLineForm(LineForm form) { lineForm_ = form; }
  LineForm GetLineForm() const { return lineForm_; }

 protected:
  void AddConformalQuad(std::int32_t i, std::int32_t j) override;
  void AddSmoothnessVertex(std::int32_t i, std::int32_t j) override;
  void AddIterationTerms(std::int32_t iteration) override;
  void PrepareGaussNewton() override;
  // On the Gauss-Newton road in the offset form: a line row reaches the
  // corners of its sample's cell and the line's own angle and offset, a
  // polygon row one vertex and the homography.
  bool IterationRowsStayInCells() const override;

 private:
  struct Vertex {
    std::int32_t i, j;
  };
  // (b - a) relates to (c - a) by a rotation and scale, as on the sphere.
  void AddSimilarityRows(double weight, Vertex a, Vertex b, Vertex c);
  void AddChordRows(const LineRecord& line);
  void AddNormalRows(const LineRecord& line);
  void AddLineRowsNewton(const LineRecord& line, std::int32_t k);
  // The offset form's rows, with the angle at k and the offset at d.
  void AddLineRowsOffset(const LineRecord& line, std::int32_t k, std::int32_t d);
  // Adds a line row of `count` entries in q and c (which have room for one
  // more) and residual r, whose residual is n . e up to a constant: with the
  // angle's column, the derivative of n . e by the angle, when the direction
  // is free, else with the fixed line's reserved angle held by a unit
  // diagonal.
  void AddLineRow(const LineRecord& line, std::int32_t k, double ex, double ey, std::int32_t* q,
                  double* c, std::int32_t count, double r);
  // The line's normal at the current solution, its angle at k.
  void LineNormal(const LineRecord& line, std::int32_t k, double& nx, double& ny) const;
  void AddPlaneRows(const PlaneRecord& plane, std::int32_t k);

  // The four unknowns of a sample's corners (u; v follows each) and its
  // position at the current solution.
  void SampleUnknowns(const LineSample& sample, std::int32_t out[4]) const;
  void SamplePoint(const LineSample& sample, double& u, double& v) const;
  // The normal a line's rows hold it to, outside the Gauss-Newton road.
  static std::array<float, 2> HeldNormal(const LineRecord& line);
  // The residual of one homography row pair at a polygon sample.
  void PlaneResiduals(const PlaneSample& sample, std::int32_t k, double& ru, double& rv) const;
  std::vector<LineRecord> ActiveLines() const;
  std::vector<std::vector<Point2f>> CurrentEnds(const std::vector<LineRecord>& lines) const;

  const std::shared_ptr<GeodesicLines> lines_;
  const LineSolveWeights weights_;
  std::vector<std::vector<Point2f>> lastLineEnds_;
  std::vector<std::vector<Point2f>> lastPlaneEnds_;
  LineForm lineForm_ = LineForm::kOffset;
  // The offset form's first offset unknown, after the angles and the
  // polygons' homographies; as of the last PrepareGaussNewton.
  std::int32_t firstOffset_ = 0;
};

}  // namespace Project
