#include "solver/sparse/SparseSolve.h"

#include <cholmod.h>

#include <algorithm>
#include <cstdint>
#include <vector>

namespace Project {

namespace {

static_assert(sizeof(int) == sizeof(std::int32_t), "the orders are handed over as int");

// What tells the two roads apart: which orderings the library may choose
// from when it orders by itself. Both factor supernodally; a column-by-column
// factorisation was 6 times slower on the default grid and 16 times on the
// next.
enum class Road { kLibraryChoice, kMinimumDegree };

// One library session: its common block and the factor, both released when
// the call ends, whatever way it ends.
class CholmodCall {
 public:
  CholmodCall() {
    cholmod_start(&common_);
    common_.print = 0;  // failures are answered, never printed
  }
  ~CholmodCall() {
    if (factor_ != nullptr) cholmod_free_factor(&factor_, &common_);
    cholmod_finish(&common_);
  }
  CholmodCall(const CholmodCall&) = delete;
  CholmodCall& operator=(const CholmodCall&) = delete;

  cholmod_common& Common() { return common_; }
  cholmod_factor*& Factor() { return factor_; }

 private:
  cholmod_common common_{};
  cholmod_factor* factor_ = nullptr;
};

bool IsPermutation(const std::vector<std::int32_t>& order) {
  std::vector<bool> seen(order.size(), false);
  for (const std::int32_t entry : order) {
    if (entry < 1 || static_cast<std::size_t>(entry) > order.size() || seen[entry - 1]) {
      return false;
    }
    seen[entry - 1] = true;
  }
  return true;
}

bool Solve(Road road, const CompressedMatrix& matrix, std::span<const double> rhs,
           std::span<double> solution, EliminationOrder& order, SparseSolveStats* stats) {
  const std::int32_t n = matrix.Rows();
  const auto size = static_cast<std::size_t>(n);
  if (matrix.Columns() != n || !matrix.IsComplete() || rhs.size() != size ||
      solution.size() != size) {
    return false;
  }
  const bool reuseOrder = order.cachePermutation && order.hasPermutation;
  if (reuseOrder && (order.permutation.size() != size || !IsPermutation(order.permutation))) {
    return false;
  }

  // Rows of the upper triangle are the columns of the lower one: the same
  // arrays read as compressed columns, less one on every index.
  const std::int32_t entries = matrix.FilledEntries();
  std::vector<int> columnStart(size + 1);
  std::vector<int> rowIndex(static_cast<std::size_t>(entries));
  std::transform(matrix.RowStart(), matrix.RowStart() + n + 1, columnStart.begin(),
                 [](std::int32_t k) { return k - 1; });
  std::transform(matrix.Column(), matrix.Column() + entries, rowIndex.begin(),
                 [](std::int32_t c) { return c - 1; });

  cholmod_sparse a{};
  a.nrow = size;
  a.ncol = size;
  a.nzmax = static_cast<std::size_t>(entries);
  a.p = columnStart.data();
  a.i = rowIndex.data();
  // The library only reads the values and the right side.
  a.x = const_cast<double*>(matrix.Value());
  a.stype = -1;
  a.itype = CHOLMOD_INT;
  a.xtype = CHOLMOD_REAL;
  a.dtype = CHOLMOD_DOUBLE;
  a.sorted = true;
  a.packed = true;

  cholmod_dense b{};
  b.nrow = size;
  b.ncol = 1;
  b.nzmax = size;
  b.d = size;
  b.x = const_cast<double*>(rhs.data());
  b.xtype = CHOLMOD_REAL;
  b.dtype = CHOLMOD_DOUBLE;

  CholmodCall call;
  cholmod_common& common = call.Common();
  common.supernodal = CHOLMOD_SUPERNODAL;
  if (road == Road::kMinimumDegree) {
    common.nmethods = 1;
    common.method[0].ordering = CHOLMOD_AMD;
  }

  cholmod_factor*& factor = call.Factor();
  if (reuseOrder) {
    // Only the given order, not the best of it and the library's own.
    common.nmethods = 1;
    common.method[0].ordering = CHOLMOD_GIVEN;
    std::vector<int> given(size);
    std::transform(order.permutation.begin(), order.permutation.end(), given.begin(),
                   [](std::int32_t k) { return k - 1; });
    factor = cholmod_analyze_p(&a, given.data(), nullptr, 0, &common);
  } else {
    factor = cholmod_analyze(&a, &common);
  }
  if (factor == nullptr) return false;

  if (order.cachePermutation && !order.hasPermutation) {
    const int* computed = static_cast<const int*>(factor->Perm);
    order.permutation.assign(size, 0);
    std::transform(computed, computed + n, order.permutation.begin(), [](int k) { return k + 1; });
    order.hasPermutation = true;
  }

  const bool factored = cholmod_factorize(&a, factor, &common) != 0 &&
                        common.status == CHOLMOD_OK && factor->minor == factor->n;
  if (stats != nullptr) {
    stats->factorNonzeros = common.lnz;
    stats->factorFlops = common.fl;
  }
  if (!factored) {
    if (stats != nullptr) stats->peakBytes = common.memory_usage;
    return false;
  }

  cholmod_dense* x = cholmod_solve(CHOLMOD_A, factor, &b, &common);
  if (stats != nullptr) stats->peakBytes = common.memory_usage;
  if (x == nullptr) return false;
  const double* values = static_cast<const double*>(x->x);
  std::copy(values, values + n, solution.begin());
  cholmod_free_dense(&x, &common);
  return common.status == CHOLMOD_OK;
}

}  // namespace

bool SolveWithDss(const CompressedMatrix& matrix, std::span<const double> rhs,
                  std::span<double> solution, EliminationOrder& order, SparseSolveStats* stats) {
  return Solve(Road::kLibraryChoice, matrix, rhs, solution, order, stats);
}

bool SolveWithPardiso(const CompressedMatrix& matrix, std::span<const double> rhs,
                      std::span<double> solution, EliminationOrder& order,
                      SparseSolveStats* stats) {
  return Solve(Road::kMinimumDegree, matrix, rhs, solution, order, stats);
}

}  // namespace Project
