#pragma once

#include <cstddef>
#include <span>

#include "solver/sparse/CompressedMatrix.h"
#include "solver/sparse/EliminationOrder.h"

namespace Project {

// What one solve cost, for diagnostics and benchmarks.
struct SparseSolveStats {
  std::size_t peakBytes = 0;    // the factorisation library's peak allocation
  double factorNonzeros = 0.0;  // entries of the Cholesky factor L
  double factorFlops = 0.0;     // floating-point operations of the factorisation
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

}  // namespace Project
