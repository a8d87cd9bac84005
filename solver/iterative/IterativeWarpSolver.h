#pragma once

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <span>
#include <vector>

#include "lens/sphere/PhotoToSphere.h"
#include "solver/grid/OctaMap.h"
#include "solver/sparse/CompressedMatrix.h"
#include "solver/sparse/EliminationOrder.h"
#include "solver/sparse/SparseBuilder.h"
#include "solver/sparse/SparseSolve.h"
#include "solver/warp/ClosedFormWarp.h"
#include "solver/warp/SphereWarp.h"

namespace Project {

// The settings an iterative warp is built with, in one place.
struct IterativeWarpSettings {
  float regularWeight = 0.001f;
  std::int32_t iterationCount = 8;
  bool cachePermutation = false;
  bool highCenterWeight = false;
  std::int32_t warpModel = 3;
  std::int32_t borderExpand = 1;
  bool anchorBorderOnly = true;
  bool useGaussNewton = true;
  bool usePardiso = true;
  bool isLimited = false;
  float latMin = 0.0f;
  float latMax = 0.0f;
  float lonMin = 0.0f;
  float lonMax = 0.0f;
  // The iterations stop once ConvergenceMeasure falls below this.
  double convergedMeasure = 0.001;
};

// Where the time of the solves went, summed until cleared; for benchmarks
// and diagnostics. Seconds of wall-clock time.
struct SolveProfile {
  double constantSeconds = 0.0;     // assembling the constant part (construction, Reset)
  double prepareSeconds = 0.0;      // the Gauss-Newton preparation of each Solve
  double assemblySeconds = 0.0;     // iteration terms, A0 + M, the right side, convergence
  double analyseSeconds = 0.0;      // ordering and symbolic analysis
  double factorSeconds = 0.0;       // numeric factorisation
  double solveSeconds = 0.0;        // triangular solves
  std::int32_t iterations = 0;      // systems solved
  std::size_t peakBytes = 0;        // the sparse library's largest peak of one solve
  double factorNonzeros = 0.0;      // of the last factor
  double factorFlops = 0.0;         // of the last factorisation
  std::int32_t factorizations = 0;  // numeric factorisations, failed ones included
  std::int32_t gradientSteps = 0;   // conjugate-gradient steps on a kept factor
};

// How the warp's sparse systems are solved. The defaults are the shipped
// road; each part can be turned off to compare with the road before it.
struct SolveChoices {
  // The Gauss-Newton road keeps its session and last factor between
  // solves, and solves an unchanged system on that factor; off, every
  // system is factored afresh in a session of its solve.
  bool keepFactor = true;
  // The sparse library's own OpenMP loops run on the solving thread alone.
  bool serialLibraryLoops = true;
  // Where the iteration rows add no coupling between vertices (see
  // IterationRowsStayInCells), the elimination order is the constant
  // part's vertex block by nested dissection, found once, with the other
  // unknowns last; off, the library orders each new pattern itself. A
  // cached order (the settings' cachePermutation) is kept either way.
  bool vertexBlockOrder = true;
};

// The warp as the minimum of a quadratic energy over the (u, v) of every
// grid vertex. The constant part (anchors to a closed-form regulariser, and
// whatever conformal and smoothness terms a subclass adds) is assembled once;
// a subclass adds the iteration part afresh each iteration, and each
// iteration solves one sparse symmetric positive-definite system.
//
// On the Gauss-Newton road the systems of successive iterations, and of
// successive solves after small edits, differ little: the last factor is
// kept and each system is first tried by conjugate gradients preconditioned
// with it, and factored afresh only when that does not converge quickly.
//
// Owns its two builders, the compressed constant part, the solution, the
// cached elimination order and the sparse session with its kept factor;
// shares the grid and the image model with the Solver, and owns the
// regulariser it builds from the model value.
class IterativeWarpSolver : public SphereWarp {
 public:
  IterativeWarpSolver(std::shared_ptr<const OctaMap> octaMap,
                      std::shared_ptr<const PhotoToSphere> imageModel,
                      const IterativeWarpSettings& settings);

  bool IsVertexInside(std::int32_t i, std::int32_t j) const override;
  bool IsQuadInside(std::int32_t i, std::int32_t j) const override;
  void GetVertexPosition(std::int32_t i, std::int32_t j, float& outU, float& outV) const override;
  void Solve() override;
  bool Succeeded() const override { return succeeded_; }
  // Reassembles the constant part, whose frames follow the grid's rotation.
  void Reset() override;

  // The half of a folded border that has no unknowns of its own is mapped to
  // its twin.
  void FoldVertex(std::int32_t& i, std::int32_t& j) const;
  // One step across the grid, over the fold.
  void StepVertex(std::int32_t& i, std::int32_t& j, std::int32_t di, std::int32_t dj) const;
  // The index of the vertex's u unknown (v follows), after folding.
  std::int32_t UnknownOf(std::int32_t i, std::int32_t j) const;

  // Reporting aids: the anchors' energy at the current solution, and the
  // constraint terms' (zero here).
  virtual double TotalEnergy();
  virtual double ConstraintEnergy() const { return 0.0; }

  const std::vector<double>& Solution() const { return solution_; }
  std::int32_t UnknownCount() const { return unknownCount_; }
  const CompressedMatrix& ConstantMatrix() {
    EnsureConstantPart();
    return *constantMatrix_;
  }
  const std::vector<double>& ConstantRhs() {
    EnsureConstantPart();
    return constantRhs_;
  }
  const EliminationOrder& Order() const { return order_; }
  // Solves done by the last Solve(), for the benchmarks and tests.
  std::int32_t IterationsRun() const { return iterationsRun_; }
  const SolveProfile& Profile() const { return profile_; }
  void ClearProfile() { profile_ = SolveProfile{}; }
  // How the systems are solved; for comparing with the road before.
  void SetSolveChoices(const SolveChoices& choices);
  const SolveChoices& GetSolveChoices() const { return choices_; }

 protected:
  // The constant part, assembled when first needed (a solve, the accessors):
  // a warp built only to measure the mesh's extents, or replaced before it
  // solves, never assembles it. Subclasses' terms take part, so it waits
  // for their fields too.
  void EnsureConstantPart() {
    if (!constantAssembled_) AssembleConstantPart();
  }
  void AssembleConstantPart();
  // A least-squares row with coefficients c on unknowns q and residual r:
  // its normal-equation entries go to builder (upper triangle) and, when rhs
  // is given, -r c to rhs.
  static void AddRow(SparseBuilder& builder, const std::int32_t* q, const double* c, std::int32_t n,
                     double r, std::vector<double>* rhs);

  virtual void AddConformalQuad(std::int32_t /*i*/, std::int32_t /*j*/) {}
  virtual void AddSmoothnessVertex(std::int32_t /*i*/, std::int32_t /*j*/) {}
  virtual void AddIterationTerms(std::int32_t /*iteration*/) {}
  virtual void PrepareGaussNewton() {}
  // Below 0: not yet measurable; the loop stops once it is below the
  // settings' convergedMeasure.
  virtual double ConvergenceMeasure() { return -1.0; }

  // Resizes the system to unknowns, keeping what it holds.
  void ResizeUnknowns(std::int32_t unknowns);
  // Whether the iteration rows add no coupling between vertices beyond the
  // constant part's: each row's vertex unknowns are the corners of one
  // cell, which the conformal rows couple already (a cell off the mesh that
  // a line crosses is not, which costs some fill, never accuracy). No, here.
  virtual bool IterationRowsStayInCells() const { return false; }
  // Solves one system, first on the session's kept factor when asked, then
  // by a fresh factorisation in the given order; counts both in the profile.
  bool SolveSystem(SparseSession& sparse, bool tryKeptFactor, const CompressedMatrix& system,
                   std::span<const double> rhs, std::span<double> answer, EliminationOrder& order);
  // The order the systems of this solve are factored in: the settings'
  // cached order, or the vertex block's (made when first needed).
  EliminationOrder& SolveOrder(EliminationOrder& vertexFirst);
  // Whether the vertex is on the half of a folded border without unknowns.
  bool IsFoldedHalf(std::int32_t i, std::int32_t j) const;

  const std::shared_ptr<const OctaMap> octaMap_;
  const std::shared_ptr<const PhotoToSphere> imageModel_;
  const IterativeWarpSettings settings_;
  const std::unique_ptr<ClosedFormWarp> regularizer_;
  const std::int32_t gridSize_;
  const std::int32_t vertexCount_;
  const std::int32_t halfGrid_;
  std::int32_t unknownCount_;
  SparseBuilder constantBuilder_;
  SparseBuilder iterationBuilder_;
  std::unique_ptr<CompressedMatrix> constantMatrix_;
  std::vector<double> solution_;
  std::vector<double> constantRhs_;
  std::vector<double> iterationRhs_;
  EliminationOrder order_;
  bool succeeded_ = true;
  std::int32_t iterationsRun_ = 0;
  SolveProfile profile_;

 private:
  bool ComputeVertexInside(std::int32_t i, std::int32_t j, bool& cache) const;
  bool InsideLimits(float lat, float lon) const;
  bool TexCoordInPicture(std::int32_t i, std::int32_t j) const;
  // The walk to the map's centre of a vertex the model covers.
  bool WalksInside(std::int32_t i, std::int32_t j) const;
  // Whether test(i, j, lat, lon) holds for one of the up to eight grid
  // neighbours of (i, j).
  bool AnyNeighbour(
      std::int32_t i, std::int32_t j,
      const std::function<bool(std::int32_t, std::int32_t, float, float)>& test) const;

  // Per vertex, index i * N + j: 0 unknown, 1 inside, 2 outside. Written
  // from the quad finder's workers too; every writer stores the same value.
  mutable std::vector<std::atomic<std::uint8_t>> vertexState_;
  // The same for TexCoordInPicture, which every vertex's walk to the centre
  // asks of the vertices on its way: once each, not once per walk.
  mutable std::vector<std::atomic<std::uint8_t>> pictureState_;
  bool constantAssembled_ = false;
  SolveChoices choices_;
  // The constant part's vertex block by nested dissection, one-based, 2 V
  // long; its pattern never changes, so it is found once. Empty until
  // needed, or when the library could not order it.
  std::vector<std::int32_t> vertexOrder_;
  bool vertexOrderTried_ = false;
  // The Gauss-Newton road's session while factors are kept: its last factor
  // outlives the Solve that made it. Null until the first such solve.
  std::unique_ptr<SparseSession> sparse_;
};

}  // namespace Project
