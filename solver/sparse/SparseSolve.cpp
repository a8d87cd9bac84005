#include "solver/sparse/SparseSolve.h"

#include <cholmod.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <vector>

namespace Project {

namespace {

static_assert(sizeof(int) == sizeof(std::int32_t), "the orders are handed over as int");

double SecondsSince(std::chrono::steady_clock::time_point start) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

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

}  // namespace

// The library's common block for the session's life, and the last factor
// with the pattern and the given order it was analysed for.
struct SparseSession::State {
  SparseRoad road;
  cholmod_common common{};
  cholmod_factor* factor = nullptr;
  // Rows of the upper triangle are the columns of the lower one: the same
  // arrays read as compressed columns, less one on every index.
  std::vector<int> columnStart;
  std::vector<int> rowIndex;
  std::vector<int> given;  // empty when the library ordered by itself

  explicit State(SparseRoad r) : road(r) { cholmod_start(&common); }
  ~State() {
    DropFactor();
    cholmod_finish(&common);
  }
  State(const State&) = delete;
  State& operator=(const State&) = delete;

  void DropFactor() {
    if (factor != nullptr) cholmod_free_factor(&factor, &common);
  }

  // What tells the two roads apart: which orderings the library may choose
  // from when it orders by itself. Both factor supernodally; a column-by-
  // column factorisation was 6 times slower on the default grid and 16
  // times on the next.
  void Configure(bool givenOrder) {
    cholmod_defaults(&common);
    common.print = 0;  // failures are answered, never printed
    common.supernodal = CHOLMOD_SUPERNODAL;
    if (givenOrder) {
      // Only the given order, not the best of it and the library's own.
      common.nmethods = 1;
      common.method[0].ordering = CHOLMOD_GIVEN;
    } else if (road == SparseRoad::kPardiso) {
      common.nmethods = 1;
      common.method[0].ordering = CHOLMOD_AMD;
    }
  }
};

SparseSession::SparseSession(SparseRoad road) : state_(std::make_unique<State>(road)) {}

SparseSession::~SparseSession() = default;

bool SparseSession::Solve(const CompressedMatrix& matrix, std::span<const double> rhs,
                          std::span<double> solution, EliminationOrder& order,
                          SparseSolveStats* stats) {
  reused_ = false;
  State& state = *state_;
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

  const std::int32_t entries = matrix.FilledEntries();
  std::vector<int> columnStart(size + 1);
  std::vector<int> rowIndex(static_cast<std::size_t>(entries));
  std::transform(matrix.RowStart(), matrix.RowStart() + n + 1, columnStart.begin(),
                 [](std::int32_t k) { return k - 1; });
  std::transform(matrix.Column(), matrix.Column() + entries, rowIndex.begin(),
                 [](std::int32_t c) { return c - 1; });
  std::vector<int> given;
  if (reuseOrder) {
    given.resize(size);
    std::transform(order.permutation.begin(), order.permutation.end(), given.begin(),
                   [](std::int32_t k) { return k - 1; });
  }
  // The analysis in hand is the one a fresh start would make when the
  // pattern is the same and the order is given alike: the library's own
  // orderings depend on the pattern alone.
  reused_ = state.factor != nullptr && columnStart == state.columnStart &&
            rowIndex == state.rowIndex && given == state.given;
  if (!reused_) {
    state.DropFactor();
    state.columnStart = std::move(columnStart);
    state.rowIndex = std::move(rowIndex);
    state.given = std::move(given);
  }

  cholmod_sparse a{};
  a.nrow = size;
  a.ncol = size;
  a.nzmax = static_cast<std::size_t>(entries);
  a.p = state.columnStart.data();
  a.i = state.rowIndex.data();
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

  cholmod_common& common = state.common;
  auto stageStart = std::chrono::steady_clock::now();
  if (!reused_) {
    state.Configure(reuseOrder);
    state.factor = reuseOrder ? cholmod_analyze_p(&a, state.given.data(), nullptr, 0, &common)
                              : cholmod_analyze(&a, &common);
  }
  if (stats != nullptr) stats->analyseSeconds = SecondsSince(stageStart);
  cholmod_factor* factor = state.factor;
  if (factor == nullptr) return false;

  if (order.cachePermutation && !order.hasPermutation) {
    const int* computed = static_cast<const int*>(factor->Perm);
    order.permutation.assign(size, 0);
    std::transform(computed, computed + n, order.permutation.begin(), [](int k) { return k + 1; });
    order.hasPermutation = true;
  }

  stageStart = std::chrono::steady_clock::now();
  const bool factored = cholmod_factorize(&a, factor, &common) != 0 &&
                        common.status == CHOLMOD_OK && factor->minor == factor->n;
  if (stats != nullptr) {
    stats->factorNonzeros = common.lnz;
    stats->factorFlops = common.fl;
    stats->factorSeconds = SecondsSince(stageStart);
  }
  if (!factored) {
    if (stats != nullptr) stats->peakBytes = common.memory_usage;
    // A factor left half done is no start for the next one.
    state.DropFactor();
    return false;
  }

  stageStart = std::chrono::steady_clock::now();
  cholmod_dense* x = cholmod_solve(CHOLMOD_A, factor, &b, &common);
  if (stats != nullptr) {
    stats->peakBytes = common.memory_usage;
    stats->solveSeconds = SecondsSince(stageStart);
  }
  if (x == nullptr) return false;
  const double* values = static_cast<const double*>(x->x);
  std::copy(values, values + n, solution.begin());
  cholmod_free_dense(&x, &common);
  return common.status == CHOLMOD_OK;
}

bool SolveWithDss(const CompressedMatrix& matrix, std::span<const double> rhs,
                  std::span<double> solution, EliminationOrder& order, SparseSolveStats* stats) {
  SparseSession session(SparseRoad::kDss);
  return session.Solve(matrix, rhs, solution, order, stats);
}

bool SolveWithPardiso(const CompressedMatrix& matrix, std::span<const double> rhs,
                      std::span<double> solution, EliminationOrder& order,
                      SparseSolveStats* stats) {
  SparseSession session(SparseRoad::kPardiso);
  return session.Solve(matrix, rhs, solution, order, stats);
}

}  // namespace Project
