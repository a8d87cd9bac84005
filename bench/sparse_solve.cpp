// One factorisation and solve of a warp-shaped system, on both solve roads,
// with a fresh fill-reducing order and with one cached from an earlier
// solve. The cached runs also time a fresh solve of the same system in each
// iteration, side by side, and report their ratio to it ("vs_fresh").
//
// The system is the default mesh's shape at level 6 (N = 129, 2 N^2
// unknowns, u and v per vertex): per cell, rows coupling u and v of its four
// corners (the conformal term); per vertex, second differences along the
// row and the column (the smoothness term); and a small anchor on every
// diagonal that makes it positive definite. Levels 5 to 8 show the growth.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdint>
#include <random>
#include <span>
#include <vector>

#include "solver/sparse/CompressedMatrix.h"
#include "solver/sparse/EliminationOrder.h"
#include "solver/sparse/SparseBuilder.h"
#include "solver/sparse/SparseSolve.h"

namespace {

using Project::CompressedMatrix;
using Project::EliminationOrder;
using Project::SparseBuilder;
using Project::SparseSolveStats;

using SolveFunction = bool (*)(const CompressedMatrix&, std::span<const double>, std::span<double>,
                               EliminationOrder&, SparseSolveStats*);

// A least-squares row into the upper triangle, as the warp's terms add them.
void AddRow(SparseBuilder& builder, std::span<const std::int32_t> q, std::span<const double> c) {
  for (std::size_t a = 0; a < q.size(); ++a) {
    builder.Add(q[a], q[a], c[a] * c[a]);
    for (std::size_t b = a + 1; b < q.size(); ++b) {
      builder.Add(q[a], q[b], (q[a] == q[b] ? 2.0 : 1.0) * c[a] * c[b]);
    }
  }
}

struct System {
  CompressedMatrix matrix;
  std::vector<double> rhs;
};

System MakeSystem(std::int32_t n) {
  std::mt19937 rng(4242);
  std::uniform_real_distribution<double> coefficient(-1.0, 1.0);
  std::uniform_real_distribution<double> weight(0.5, 1.5);
  const std::int32_t unknowns = 2 * n * n;
  SparseBuilder builder(unknowns);
  auto u = [n](std::int32_t i, std::int32_t j) { return 2 * (j * n + i); };

  for (std::int32_t j = 0; j + 1 < n; ++j) {
    for (std::int32_t i = 0; i + 1 < n; ++i) {
      const std::int32_t corners[4] = {u(i, j), u(i + 1, j), u(i + 1, j + 1), u(i, j + 1)};
      std::int32_t q[8];
      for (int m = 0; m < 4; ++m) {
        q[2 * m] = corners[m];
        q[2 * m + 1] = corners[m] + 1;
      }
      for (int row = 0; row < 2; ++row) {
        double c[8];
        for (double& value : c) value = coefficient(rng);
        AddRow(builder, q, c);
      }
    }
  }
  for (std::int32_t j = 0; j < n; ++j) {
    for (std::int32_t i = 0; i < n; ++i) {
      for (std::int32_t axis = 0; axis < 2; ++axis) {
        const std::int32_t di = axis == 0 ? 1 : 0;
        const std::int32_t dj = 1 - di;
        if (i - di < 0 || i + di >= n || j - dj < 0 || j + dj >= n) continue;
        const double w = weight(rng);
        const double c[3] = {w, -2.0 * w, w};
        for (std::int32_t component = 0; component < 2; ++component) {
          const std::int32_t q[3] = {u(i - di, j - dj) + component, u(i, j) + component,
                                     u(i + di, j + dj) + component};
          AddRow(builder, q, c);
        }
      }
    }
  }
  std::vector<double> rhs(static_cast<std::size_t>(unknowns));
  for (std::int32_t k = 0; k < unknowns; ++k) {
    builder.Add(k, k, 1e-3);
    rhs[k] = coefficient(rng);
  }
  return {CompressedMatrix(builder), std::move(rhs)};
}

double Seconds(SolveFunction solve, const System& system, std::vector<double>& x,
               EliminationOrder& order, SparseSolveStats& stats) {
  const auto start = std::chrono::steady_clock::now();
  const bool solved = solve(system.matrix, system.rhs, x, order, &stats);
  const auto stop = std::chrono::steady_clock::now();
  if (!solved) return -1.0;
  return std::chrono::duration<double>(stop - start).count();
}

template <SolveFunction solve>
void BM_Solve(benchmark::State& state) {
  const auto level = static_cast<std::int32_t>(state.range(0));
  const bool cached = state.range(1) != 0;
  const std::int32_t n = (1 << (level + 1)) + 1;
  const System system = MakeSystem(n);
  std::vector<double> x(system.rhs.size());
  SparseSolveStats stats;

  EliminationOrder order;
  order.cachePermutation = cached;
  if (cached && Seconds(solve, system, x, order, stats) < 0.0) {
    state.SkipWithError("first solve failed");
    return;
  }
  double freshTotal = 0.0;
  double total = 0.0;
  for (auto _ : state) {
    if (cached) {
      EliminationOrder fresh;
      freshTotal += Seconds(solve, system, x, fresh, stats);
    }
    const double seconds = Seconds(solve, system, x, order, stats);
    if (seconds < 0.0) {
      state.SkipWithError("solve failed");
      return;
    }
    total += seconds;
    state.SetIterationTime(seconds);
  }
  state.counters["unknowns"] = static_cast<double>(system.rhs.size());
  state.counters["matrix_nnz"] = system.matrix.FilledEntries();
  state.counters["factor_nnz"] = stats.factorNonzeros;
  state.counters["peak_MiB"] = static_cast<double>(stats.peakBytes) / (1 << 20);
  if (cached) state.counters["vs_fresh"] = total / freshTotal;
}

void Arguments(benchmark::internal::Benchmark* b) {
  b->ArgNames({"level", "cached"});
  for (std::int64_t level = 5; level <= 8; ++level) {
    for (std::int64_t cached = 0; cached <= 1; ++cached) b->Args({level, cached});
  }
  b->UseManualTime()->Unit(benchmark::kMillisecond);
}

BENCHMARK(BM_Solve<Project::SolveWithDss>)->Name("BM_SolveDss")->Apply(Arguments);
BENCHMARK(BM_Solve<Project::SolveWithPardiso>)->Name("BM_SolvePardiso")->Apply(Arguments);

}  // namespace
