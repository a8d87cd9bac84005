#include "solver/sparse/SparseSolve.h"

#include <cholmod.h>
#include <omp.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <numeric>
#include <optional>
#include <vector>

namespace Project {

namespace {

static_assert(sizeof(int) == sizeof(std::int32_t), "the orders are handed over as int");

// A symmetric matrix as the library takes it: the lower triangle in
// compressed columns, sorted and packed, borrowing the arrays.
cholmod_sparse LowerTriangle(std::size_t size, std::size_t entries, int* columnStart, int* rowIndex,
                             double* values) {
  cholmod_sparse a{};
  a.nrow = a.ncol = size;
  a.nzmax = entries;
  a.p = columnStart;
  a.i = rowIndex;
  a.x = values;
  a.stype = -1;
  a.itype = CHOLMOD_INT;
  a.xtype = CHOLMOD_REAL;
  a.dtype = CHOLMOD_DOUBLE;
  a.sorted = true;
  a.packed = true;
  return a;
}

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

double Dot(std::span<const double> a, std::span<const double> b) {
  return std::inner_product(a.begin(), a.end(), b.begin(), 0.0);
}

// While alive, the OpenMP loops the library runs from this thread take this
// thread alone. The library asks its loops for a fixed four threads, far
// more than the machines it runs on have cores to spare: each loop is short
// (the scatter of one supernode), and starting and joining the threads cost
// more than they gained. Run alone, a factorisation of the default mesh
// took 52 ms instead of 76, and 58 instead of 83 with 40 lines. The BLAS
// threads of the dense updates are left as they are. Only this thread's
// settings change (dynamic threads bounded to one), and they are restored.
struct LibraryLoopsAlone {
  LibraryLoopsAlone() : dynamic(omp_get_dynamic()), threads(omp_get_max_threads()) {
    omp_set_dynamic(1);
    omp_set_num_threads(1);
  }
  ~LibraryLoopsAlone() {
    omp_set_dynamic(dynamic);
    omp_set_num_threads(threads);
  }
  LibraryLoopsAlone(const LibraryLoopsAlone&) = delete;
  LibraryLoopsAlone& operator=(const LibraryLoopsAlone&) = delete;
  const int dynamic;
  const int threads;
};

// A dense column the library reads in place.
cholmod_dense DenseView(std::span<const double> values) {
  cholmod_dense view{};
  view.nrow = values.size();
  view.ncol = 1;
  view.nzmax = values.size();
  view.d = values.size();
  view.x = const_cast<double*>(values.data());
  view.xtype = CHOLMOD_REAL;
  view.dtype = CHOLMOD_DOUBLE;
  return view;
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
  // The values the factor in hand was made of, to tell how far a later
  // matrix of the same pattern lies from it.
  std::vector<double> factoredValues;
  // The preconditioner's answer and the library's workspace for it, kept
  // between the steps of SolvePreconditioned.
  cholmod_dense* applied = nullptr;
  cholmod_dense* workY = nullptr;
  cholmod_dense* workE = nullptr;

  explicit State(SparseRoad r) : road(r) { cholmod_start(&common); }
  ~State() {
    DropFactor();
    cholmod_free_dense(&applied, &common);
    cholmod_free_dense(&workY, &common);
    cholmod_free_dense(&workE, &common);
    cholmod_finish(&common);
  }
  State(const State&) = delete;
  State& operator=(const State&) = delete;

  void DropFactor() {
    if (factor != nullptr) cholmod_free_factor(&factor, &common);
  }

  // Whether the matrix has the factor's pattern and its values lie within
  // `change` of the factor's, relative to the largest of them.
  bool IsNear(const CompressedMatrix& matrix, double change) const {
    const std::size_t entries = factoredValues.size();
    if (static_cast<std::size_t>(matrix.FilledEntries()) != entries ||
        columnStart.size() != static_cast<std::size_t>(matrix.Rows()) + 1) {
      return false;
    }
    for (std::size_t r = 0; r < columnStart.size(); ++r) {
      if (matrix.RowStart()[r] - 1 != columnStart[r]) return false;
    }
    double largest = 0.0, moved = 0.0;
    for (std::size_t k = 0; k < entries; ++k) {
      if (matrix.Column()[k] - 1 != rowIndex[k]) return false;
      largest = std::max(largest, std::fabs(factoredValues[k]));
      moved = std::max(moved, std::fabs(matrix.Value()[k] - factoredValues[k]));
    }
    return moved <= change * largest;
  }

  // out = (L L^T)^-1 in, with the factor in hand.
  bool ApplyFactor(std::span<const double> in, std::span<double> out) {
    cholmod_dense b = DenseView(in);
    if (cholmod_solve2(CHOLMOD_A, factor, &b, nullptr, &applied, nullptr, &workY, &workE,
                       &common) == 0) {
      return false;
    }
    const double* values = static_cast<const double*>(applied->x);
    std::copy(values, values + out.size(), out.begin());
    return true;
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

  // The library only reads the values and the right side.
  cholmod_sparse a =
      LowerTriangle(size, static_cast<std::size_t>(entries), state.columnStart.data(),
                    state.rowIndex.data(), const_cast<double*>(matrix.Value()));

  cholmod_dense b{};
  b.nrow = size;
  b.ncol = 1;
  b.nzmax = size;
  b.d = size;
  b.x = const_cast<double*>(rhs.data());
  b.xtype = CHOLMOD_REAL;
  b.dtype = CHOLMOD_DOUBLE;

  cholmod_common& common = state.common;
  std::optional<LibraryLoopsAlone> alone;
  if (serialLoops_) alone.emplace();
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
  state.factoredValues.assign(matrix.Value(), matrix.Value() + entries);

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

bool SparseSession::HasFactor() const { return state_->factor != nullptr; }

void SparseSession::DropFactor() { state_->DropFactor(); }

bool SparseSession::SolvePreconditioned(const CompressedMatrix& matrix, std::span<const double> rhs,
                                        std::span<double> solution,
                                        const PreconditionedLimits& limits,
                                        SparseSolveStats* stats) {
  State& state = *state_;
  const auto start = std::chrono::steady_clock::now();
  const std::size_t size = rhs.size();
  if (state.factor == nullptr || state.factor->n != size || !matrix.IsComplete() ||
      static_cast<std::size_t>(matrix.Rows()) != size || solution.size() != size ||
      !state.IsNear(matrix, limits.maxChange)) {
    return false;
  }
  std::optional<LibraryLoopsAlone> alone;
  if (serialLoops_) alone.emplace();
  std::vector<double> residual(rhs.begin(), rhs.end()), direction(size), product(size),
      preconditioned(size);
  std::fill(solution.begin(), solution.end(), 0.0);
  const double target = limits.tolerance * std::sqrt(Dot(rhs, rhs));
  bool converged = target == 0.0;
  std::int32_t steps = 0;
  if (!converged && state.ApplyFactor(residual, preconditioned)) {
    direction = preconditioned;
    double rz = Dot(residual, preconditioned);
    while (steps < limits.maxSteps) {
      ++steps;
      matrix.MultiplySymmetric(direction, product);
      const double curvature = Dot(direction, product);
      // Not positive definite, or not a number: no step to take.
      if (!(curvature > 0.0)) break;
      const double alpha = rz / curvature;
      for (std::size_t k = 0; k < size; ++k) {
        solution[k] += alpha * direction[k];
        residual[k] -= alpha * product[k];
      }
      if (std::sqrt(Dot(residual, residual)) <= target) {
        converged = true;
        break;
      }
      if (!state.ApplyFactor(residual, preconditioned)) break;
      const double next = Dot(residual, preconditioned);
      const double beta = next / rz;
      rz = next;
      for (std::size_t k = 0; k < size; ++k) {
        direction[k] = preconditioned[k] + beta * direction[k];
      }
    }
  }
  if (stats != nullptr) {
    stats->gradientSteps = steps;
    stats->solveSeconds = SecondsSince(start);
  }
  return converged;
}

bool OrderLeadingBlock(const CompressedMatrix& matrix, std::int32_t leading,
                       std::vector<std::int32_t>& permutation) {
  const std::int32_t n = matrix.Rows();
  if (matrix.Columns() != n || !matrix.IsComplete() || leading < 1 || leading > n) return false;
  // The leading block's upper triangle, read as the lower one by columns.
  std::vector<int> columnStart(static_cast<std::size_t>(leading) + 1, 0), rowIndex;
  std::vector<double> values;
  for (std::int32_t r = 0; r < leading; ++r) {
    for (std::int32_t k = matrix.RowStart()[r] - 1; k < matrix.RowStart()[r + 1] - 1; ++k) {
      if (matrix.Column()[k] - 1 >= leading) break;
      rowIndex.push_back(matrix.Column()[k] - 1);
      values.push_back(matrix.Value()[k]);
    }
    columnStart[r + 1] = static_cast<int>(rowIndex.size());
  }
  cholmod_common common{};
  cholmod_start(&common);
  common.print = 0;
  cholmod_sparse a = LowerTriangle(static_cast<std::size_t>(leading), rowIndex.size(),
                                   columnStart.data(), rowIndex.data(), values.data());
  std::vector<int> order(static_cast<std::size_t>(leading)), parent(order.size()),
      member(order.size());
  const bool ordered = cholmod_nested_dissection(&a, nullptr, 0, order.data(), parent.data(),
                                                 member.data(), &common) >= 0 &&
                       common.status == CHOLMOD_OK;
  cholmod_finish(&common);
  if (!ordered) return false;
  permutation.resize(static_cast<std::size_t>(n));
  std::transform(order.begin(), order.end(), permutation.begin(), [](int k) { return k + 1; });
  for (std::int32_t k = leading; k < n; ++k) permutation[k] = k + 1;
  return true;
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
