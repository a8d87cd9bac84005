#pragma once

#include <cstddef>
#include <memory>
#include <span>

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

// The two roads, for a session.
enum class SparseRoad { kDss, kPardiso };

// A run of solves on one road that keeps the ordering and symbolic analysis
// of the last factorisation while the matrices keep its pattern and its
// order: each solve then only refactors. The answers are those of the free
// functions above, which start afresh every time: the order they would
// compute again is the one already in hand. A pattern or an order that
// differs from the last one, or a failed factorisation, analyses anew.
// Owns the library's state; released with the session.
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

 private:
  struct State;
  std::unique_ptr<State> state_;
  bool reused_ = false;
};

}  // namespace Project
