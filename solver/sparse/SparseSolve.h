#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <vector>

#include "solver/sparse/CompressedMatrix.h"
#include "solver/sparse/EliminationOrder.h"

namespace Project {

// What one solve cost, for diagnostics and benchmarks.
struct SparseSolveStats {
  std::size_t peakBytes = 0;    // the factorisation library's peak allocation
  double factorNonzeros = 0.0;  // entries of the Cholesky factor L
  double factorFlops = 0.0;     // floating-point operations of the factorisation
  // Wall-clock seconds of the three stages: ordering and symbolic analysis,
  // numeric factorisation, and the triangular solves.
  double analyseSeconds = 0.0;
  double factorSeconds = 0.0;
  double solveSeconds = 0.0;
  // Conjugate-gradient steps of SolvePreconditioned, whether or not they
  // converged; 0 for a direct solve.
  std::int32_t gradientSteps = 0;
};

// When SolvePreconditioned takes a matrix on: when it has the kept factor's
// pattern and no entry has moved by more than `maxChange` times the largest
// of the factor's. When it stops: once the residual is at most `tolerance`
// times the right side's (Euclidean norms), or gives up after `maxSteps`.
struct PreconditionedLimits {
  double maxChange = 1e-6;
  double tolerance = 1e-8;
  std::int32_t maxSteps = 4;
};

// Solves A x = rhs for a symmetric positive-definite A given by its upper
// triangle in `matrix`, writing x into `solution`; rhs and solution are as
// long as the matrix is square. The answer is false when the factorisation
// meets a non-positive pivot, when the sizes disagree, when a cached order
// has the wrong length or is not a permutation, or when the library fails;
// `solution` is then unspecified.
//
// The ordering follows `order`: without cachePermutation the library orders
// by itself; the first solve with it stores the computed order and sets
// hasPermutation (even when the factorisation then fails); later solves
// eliminate in the stored order. Nothing else outlives the call.
//
// Two roads with the same contract, both a supernodal Cholesky factorisation.
// They differ in how the order is found when none is given: SolveWithDss
// lets the library choose (minimum degree, and nested dissection when that
// fills too much), SolveWithPardiso uses minimum degree alone.
bool SolveWithDss(const CompressedMatrix& matrix, std::span<const double> rhs,
                  std::span<double> solution, EliminationOrder& order,
                  SparseSolveStats* stats = nullptr);
bool SolveWithPardiso(const CompressedMatrix& matrix, std::span<const double> rhs,
                      std::span<double> solution, EliminationOrder& order,
                      SparseSolveStats* stats = nullptr);

// A fill-reducing order for a system whose first `leading` unknowns are the
// bulk of it, a mesh, and whose others are few and reach far (the warp's
// line and polygon unknowns): nested dissection of the leading block alone,
// then the others last in their own order. One-based, as EliminationOrder
// holds it. False when the sizes disagree or the library fails.
bool OrderLeadingBlock(const CompressedMatrix& matrix, std::int32_t leading,
                       std::vector<std::int32_t>& permutation);

// The two roads, for a session.
enum class SparseRoad { kDss, kPardiso };

// A run of solves on one road that keeps the ordering and symbolic analysis
// of the last factorisation while the matrices keep its pattern and its
// order: each solve then only refactors. The answers are those of the free
// functions above, which start afresh every time: the order they would
// compute again is the one already in hand. A pattern or an order that
// differs from the last one, or a failed factorisation, analyses anew.
//
// The last good factor also stays in hand for SolvePreconditioned, which
// solves a matrix of the same pattern and nearly the same values by
// conjugate gradients with that factor as the preconditioner: a few
// triangular solves instead of a factorisation.
// Owns the library's state and the factor; released with the session.
class SparseSession {
 public:
  explicit SparseSession(SparseRoad road);
  ~SparseSession();
  SparseSession(const SparseSession&) = delete;
  SparseSession& operator=(const SparseSession&) = delete;

  // As SolveWithDss or SolveWithPardiso, by the session's road.
  bool Solve(const CompressedMatrix& matrix, std::span<const double> rhs,
             std::span<double> solution, EliminationOrder& order,
             SparseSolveStats* stats = nullptr);
  // Whether the last Solve reused the analysis of the one before.
  bool Reused() const { return reused_; }

  // Solves matrix x = rhs, the matrix given as for Solve, by conjugate
  // gradients from x = 0 preconditioned with the factor of the last good
  // Solve. Answers false when there is no factor, the matrix is not near the
  // factor's (see the limits), it shows a direction of non-positive
  // curvature, or the residual has not fallen within the limits; `solution`
  // is then unspecified and the caller factors afresh. Keeps the factor
  // either way.
  bool SolvePreconditioned(const CompressedMatrix& matrix, std::span<const double> rhs,
                           std::span<double> solution, const PreconditionedLimits& limits,
                           SparseSolveStats* stats = nullptr);
  // Whether the library's own OpenMP loops run on the calling thread alone
  // (the default), or take the threads the library asks for.
  void SetSerialLibraryLoops(bool serial) { serialLoops_ = serial; }
  // Whether a factor is in hand, and forgetting it (the pattern's analysis
  // goes with it).
  bool HasFactor() const;
  void DropFactor();

 private:
  struct State;
  std::unique_ptr<State> state_;
  bool reused_ = false;
  bool serialLoops_ = true;
};

}  // namespace Project
