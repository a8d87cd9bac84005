#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <random>
#include <span>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "solver/sparse/CompressedMatrix.h"
#include "solver/sparse/EliminationOrder.h"
#include "solver/sparse/SparseBuilder.h"
#include "solver/sparse/SparseSolve.h"

namespace Project {
namespace {

// A symmetric system kept twice: in a builder, and whole with the pattern of
// the upper entries ever touched.
struct TestSystem {
  explicit TestSystem(int n) : n(n), builder(n), dense(n * n), touched(n * n), rhs(n) {}
  void Add(int r, int c, double v) {
    builder.Add(r, c, v);
    dense[r * n + c] += v;
    if (r != c) dense[c * n + r] += v;
    touched[std::min(r, c) * n + std::max(r, c)] = true;
  }
  void AddRandom(std::mt19937& rng, int count) {
    std::uniform_int_distribution<int> index(0, n - 1);
    std::uniform_real_distribution<double> value(-1.0, 1.0);
    for (int k = 0; k < count; ++k) {
      const int r = index(rng), c = index(rng);  // either triangle
      Add(r, c, value(rng));
    }
  }
  int n;
  SparseBuilder builder;
  std::vector<double> dense;
  std::vector<bool> touched;
  std::vector<double> rhs;
};

// Least-squares rows on four random unknowns, as the warp adds its terms,
// plus a small diagonal: positive definite and about as sparse.
TestSystem LeastSquaresSystem(int n, std::uint32_t seed) {
  std::mt19937 rng(seed);
  std::uniform_int_distribution<int> index(0, n - 1);
  std::uniform_real_distribution<double> value(-1.0, 1.0);
  TestSystem s(n);
  for (int row = 0; row < 2 * n; ++row) {
    int q[4];
    double c[4];
    for (int a = 0; a < 4; ++a) {
      q[a] = index(rng);
      c[a] = value(rng);
    }
    for (int a = 0; a < 4; ++a) {
      s.Add(q[a], q[a], c[a] * c[a]);
      for (int b = a + 1; b < 4; ++b) s.Add(q[a], q[b], (q[a] == q[b] ? 2.0 : 1.0) * c[a] * c[b]);
    }
  }
  for (int i = 0; i < n; ++i) {
    s.Add(i, i, 0.05);
    s.rhs[i] = value(rng);
  }
  return s;
}

// Reference: dense Cholesky and two triangular solves.
std::vector<double> DenseSolve(const TestSystem& s) {
  const int n = s.n;
  std::vector<double> a = s.dense, b = s.rhs;
  for (int j = 0; j < n; ++j) {
    for (int k = 0; k < j; ++k) a[j * n + j] -= a[j * n + k] * a[j * n + k];
    a[j * n + j] = std::sqrt(a[j * n + j]);
    for (int i = j + 1; i < n; ++i) {
      for (int k = 0; k < j; ++k) a[i * n + j] -= a[i * n + k] * a[j * n + k];
      a[i * n + j] /= a[j * n + j];
    }
  }
  for (int i = 0; i < n; ++i) {
    for (int k = 0; k < i; ++k) b[i] -= a[i * n + k] * b[k];
    b[i] /= a[i * n + i];
  }
  for (int i = n - 1; i >= 0; --i) {
    for (int k = i + 1; k < n; ++k) b[i] -= a[k * n + i] * b[k];
    b[i] /= a[i * n + i];
  }
  return b;
}

// The compressed arrays hold exactly the touched upper entries, in order.
void ExpectCompressedEquals(const CompressedMatrix& m, const TestSystem& s) {
  ASSERT_TRUE(m.IsComplete());
  ASSERT_EQ(m.RowStart()[0], 1);
  for (int r = 0; r < s.n; ++r) {
    std::vector<std::pair<int, double>> stored, expected;
    for (int k = m.RowStart()[r] - 1; k < m.RowStart()[r + 1] - 1; ++k) {
      stored.emplace_back(m.Column()[k] - 1, m.Value()[k]);
    }
    for (int c = r; c < s.n; ++c) {
      if (s.touched[r * s.n + c]) expected.emplace_back(c, s.dense[r * s.n + c]);
    }
    // Sums of the same additions in the same order: bit-identical.
    EXPECT_EQ(stored, expected) << "row " << r;
  }
}

TEST(SparseBuilder, AssemblesLikeADenseMatrixGrowsByDoublingAndResizes) {
  std::mt19937 rng(20240611);
  const int n = 37;
  TestSystem s(n);
  s.AddRandom(rng, 900);
  s.builder.Set(5, 5, 2.5);  // assigns over what was added
  s.dense[5 * n + 5] = 2.5;
  s.touched[5 * n + 5] = true;
  for (int r = 0; r < n; ++r) {
    for (int c = 0; c < n; ++c) ASSERT_EQ(s.builder.Get(r, c), s.dense[r * n + c]) << r << "," << c;
    // Capacities run 0, 1, 2, 4, ... and stop at the column count.
    const auto count = static_cast<unsigned>(s.builder.RowEntryCount(r));
    EXPECT_EQ(s.builder.RowCapacity(r), std::min<int>(n, static_cast<int>(std::bit_ceil(count))));
  }
  ExpectCompressedEquals(CompressedMatrix(s.builder), s);

  // Growing keeps every entry; shrinking drops those past the new edge.
  s.builder.Resize(n + 4);
  EXPECT_EQ(s.builder.Get(3, 30), s.dense[3 * n + 30]);
  EXPECT_EQ(s.builder.RowEntryCount(n + 2), 0);
  s.builder.Resize(20);
  std::int64_t kept = 0;
  for (int r = 0; r < 20; ++r) {
    for (int c = r; c < 20; ++c) kept += s.touched[r * n + c];
  }
  EXPECT_EQ(s.builder.EntryCount(), kept);
  s.builder.Clear();
  EXPECT_EQ(s.builder.EntryCount(), 0);
}

TEST(CompressedMatrix, SumAndSymmetricProductMatchDenseArithmetic) {
  std::mt19937 rng(77);
  const int n = 29;
  TestSystem a0(n), m(n), sum(n);
  a0.AddRandom(rng, 300);
  m.AddRandom(rng, 25);  // most rows of M stay empty
  for (int k = 0; k < n * n; ++k) {
    if (a0.touched[k] || m.touched[k]) sum.Add(k / n, k % n, a0.dense[k] + m.dense[k]);
  }
  const CompressedMatrix a =
      CompressedMatrix::Sum(CompressedMatrix(a0.builder), CompressedMatrix(m.builder));
  ExpectCompressedEquals(a, sum);

  std::vector<double> x(n), y(n);
  for (int i = 0; i < n; ++i) x[i] = std::sin(i + 1.0);
  a.MultiplySymmetric(x, y);
  for (int r = 0; r < n; ++r) {
    double expected = 0.0;
    for (int c = 0; c < n; ++c) expected += sum.dense[r * n + c] * x[c];
    // The same ~30 products summed in another order: a few ulps.
    EXPECT_NEAR(y[r], expected, 1e-13);
  }
  // The sizing rule worked by hand: (rows, columns, hint) -> capacity.
  EXPECT_EQ(CompressedMatrix(10, 8, 3).Capacity(), 8);
  EXPECT_EQ(CompressedMatrix(10, 8, 50).Capacity(), 50);
  EXPECT_EQ(CompressedMatrix(10, 8, 85).Capacity(), 80);
}

// Observed agreement with the dense reference is ~1e-15; 1e-9 leaves room for
// other BLAS builds while a dropped entry or a wrong order misses by far more.
constexpr double kSolveTolerance = 1e-9;

void ExpectSolves(const std::vector<double>& x, const TestSystem& s,
                  double tolerance = kSolveTolerance) {
  const std::vector<double> expected = DenseSolve(s);
  for (int i = 0; i < s.n; ++i) EXPECT_NEAR(x[i], expected[i], tolerance) << i;
}

using SolveFunction = bool (*)(const CompressedMatrix&, std::span<const double>, std::span<double>,
                               EliminationOrder&, SparseSolveStats*);

class SparseSolve : public testing::TestWithParam<SolveFunction> {
 protected:
  bool Solve(const TestSystem& s, EliminationOrder& order, SparseSolveStats* stats = nullptr) {
    x.assign(s.n, 0.0);
    return GetParam()(CompressedMatrix(s.builder), s.rhs, x, order, stats);
  }
  std::vector<double> x;
};

TEST_P(SparseSolve, MatchesADenseSolveWithAFreshOrCachedOrder) {
  const TestSystem s = LeastSquaresSystem(60, 11);
  EliminationOrder fresh;
  ASSERT_TRUE(Solve(s, fresh));
  ExpectSolves(x, s);
  EXPECT_FALSE(fresh.hasPermutation);

  // The first cached solve stores a permutation of 1..n; the next one
  // reuses it and leaves it as it was.
  EliminationOrder cached;
  cached.cachePermutation = true;
  ASSERT_TRUE(Solve(s, cached));
  ExpectSolves(x, s);
  ASSERT_TRUE(cached.hasPermutation);
  std::vector<std::int32_t> sorted = cached.permutation;
  std::sort(sorted.begin(), sorted.end());
  for (int k = 0; k < s.n; ++k) ASSERT_EQ(sorted[k], k + 1);
  const std::vector<std::int32_t> stored = cached.permutation;
  ASSERT_TRUE(Solve(s, cached));
  ExpectSolves(x, s);
  EXPECT_EQ(cached.permutation, stored);
}

TEST_P(SparseSolve, ABadCachedOrderCostsFillButNotAccuracy) {
  // An arrow: unknown n - 1 is coupled to all others, and they to nothing
  // else. Eliminated last there is no fill (L has 2n - 1 entries);
  // eliminated first, as the reversed order does, L is full: n (n + 1) / 2.
  const int n = 40;
  TestSystem s(n);
  for (int i = 0; i < n - 1; ++i) {
    s.Add(i, i, 2.0 + 0.1 * i);
    s.Add(i, n - 1, 0.1);
  }
  s.Add(n - 1, n - 1, 1.0);
  for (int i = 0; i < n; ++i) s.rhs[i] = std::sin(i);
  EliminationOrder fresh;
  SparseSolveStats stats;
  ASSERT_TRUE(Solve(s, fresh, &stats));
  ExpectSolves(x, s);
  EXPECT_EQ(stats.factorNonzeros, 2 * n - 1);

  EliminationOrder reversed{{}, true, true};
  for (int k = n; k >= 1; --k) reversed.permutation.push_back(k);
  ASSERT_TRUE(Solve(s, reversed, &stats));
  ExpectSolves(x, s);
  EXPECT_EQ(stats.factorNonzeros, n * (n + 1) / 2);
}

TEST_P(SparseSolve, FailsOnAnIndefiniteMatrixOrAMalformedOrder) {
  // [[1, 2], [2, 1]] has eigenvalues 3 and -1: the second pivot is -3.
  TestSystem s(3);
  s.Add(0, 0, 1.0);
  s.Add(0, 1, 2.0);
  s.Add(1, 1, 1.0);
  s.Add(2, 2, 1.0);
  EliminationOrder order{{}, false, true};
  EXPECT_FALSE(Solve(s, order));
  // The order was computed before the factorisation failed, and is kept.
  EXPECT_TRUE(order.hasPermutation);
  EXPECT_EQ(order.permutation.size(), 3u);

  const TestSystem spd = LeastSquaresSystem(4, 3);
  EliminationOrder bad{{1, 2, 3}, true, true};  // one short
  EXPECT_FALSE(Solve(spd, bad));
  bad.permutation = {1, 2, 3, 3};  // not a permutation
  EXPECT_FALSE(Solve(spd, bad));
}

INSTANTIATE_TEST_SUITE_P(Roads, SparseSolve, testing::Values(&SolveWithDss, &SolveWithPardiso),
                         [](const testing::TestParamInfo<SolveFunction>& info) {
                           return std::string(info.param == &SolveWithDss ? "Dss" : "Pardiso");
                         });

TEST(EliminationOrder, RelabellingKeepsTheVertexOrderAndNumbersTheRest) {
  EliminationOrder order{{3, 1, 2}, true, true};
  RelabelPermutationTail(order, 3, 6);
  EXPECT_EQ(order.permutation, (std::vector<std::int32_t>{3, 1, 2, 4, 5, 6}));
  // An order computed with the extra unknowns among the vertex ones: those
  // leave the head, and what remains is still a permutation.
  order.permutation = {5, 2, 4, 1, 3};
  RelabelPermutationTail(order, 3, 4);
  EXPECT_EQ(order.permutation, (std::vector<std::int32_t>{2, 1, 3, 4}));

  // An order cached on a system with one extra unknown, relabelled for one
  // with three, still solves that one exactly.
  const int vertexUnknowns = 50;
  const TestSystem small = LeastSquaresSystem(vertexUnknowns + 1, 5);
  std::vector<double> x(small.n);
  EliminationOrder cached{{}, false, true};
  ASSERT_TRUE(SolveWithDss(CompressedMatrix(small.builder), small.rhs, x, cached));
  const TestSystem grown = LeastSquaresSystem(vertexUnknowns + 3, 6);
  RelabelPermutationTail(cached, vertexUnknowns, grown.n);
  x.assign(grown.n, 0.0);
  ASSERT_TRUE(SolveWithDss(CompressedMatrix(grown.builder), grown.rhs, x, cached));
  ExpectSolves(x, grown);
}

// A session refactors a matrix of the pattern it last analysed and analyses
// anew for another pattern or after a failed factorisation; every answer is
// the dense one.
TEST(SparseSession, KeepsItsAnalysisWhileThePatternHolds) {
  for (const SparseRoad road : {SparseRoad::kDss, SparseRoad::kPardiso}) {
    SparseSession session(road);
    EliminationOrder order;
    TestSystem s = LeastSquaresSystem(60, 21);
    std::vector<double> x(s.n);
    ASSERT_TRUE(session.Solve(CompressedMatrix(s.builder), s.rhs, x, order));
    EXPECT_FALSE(session.Reused());
    ExpectSolves(x, s);
    for (int i = 0; i < s.n; ++i) s.Add(i, i, 0.5 * (i % 3));  // new values, same entries
    ASSERT_TRUE(session.Solve(CompressedMatrix(s.builder), s.rhs, x, order));
    EXPECT_TRUE(session.Reused());
    ExpectSolves(x, s);

    TestSystem other = LeastSquaresSystem(60, 22);
    ASSERT_TRUE(session.Solve(CompressedMatrix(other.builder), other.rhs, x, order));
    EXPECT_FALSE(session.Reused());
    ExpectSolves(x, other);
    other.Add(0, 0, -100.0);  // indefinite
    EXPECT_FALSE(session.Solve(CompressedMatrix(other.builder), other.rhs, x, order));
    const TestSystem again = LeastSquaresSystem(60, 22);
    ASSERT_TRUE(session.Solve(CompressedMatrix(again.builder), again.rhs, x, order));
    EXPECT_FALSE(session.Reused());
    ExpectSolves(x, again);
  }
}

// A kept factor solves the matrix it was made of and one whose entries
// moved by less than the limit, to the dense answer, also when the matrix
// is nearly singular; it refuses a matrix moved further or of another
// pattern, and there is none after a failed factorisation.
TEST(SparseSession, SolvesANearbyMatrixOnItsKeptFactor) {
  SparseSession session(SparseRoad::kPardiso);
  EliminationOrder order;
  std::vector<double> x(60);
  const PreconditionedLimits limits;
  TestSystem s = LeastSquaresSystem(60, 23);
  EXPECT_FALSE(session.SolvePreconditioned(CompressedMatrix(s.builder), s.rhs, x, limits));
  ASSERT_TRUE(session.Solve(CompressedMatrix(s.builder), s.rhs, x, order));
  SparseSolveStats stats;
  ASSERT_TRUE(session.SolvePreconditioned(CompressedMatrix(s.builder), s.rhs, x, limits, &stats));
  EXPECT_LE(stats.gradientSteps, 1);  // the factor is the matrix's own
  ExpectSolves(x, s);
  for (int i = 0; i < s.n; i += 7) s.Add(i, i, 1e-7);  // within the default limit
  ASSERT_TRUE(session.SolvePreconditioned(CompressedMatrix(s.builder), s.rhs, x, limits));
  ExpectSolves(x, s);
  s.Add(3, 3, 1e-3);
  EXPECT_FALSE(session.SolvePreconditioned(CompressedMatrix(s.builder), s.rhs, x, limits));
  const TestSystem other = LeastSquaresSystem(60, 24);
  EXPECT_FALSE(session.SolvePreconditioned(CompressedMatrix(other.builder), other.rhs, x, limits));

  // Rows that leave a direction almost free, as the mesh's few weak anchors
  // do: u0 - u1 is held only by the diagonal's 1e-9, so A's condition is
  // near 1e10 and the answer large along that direction.
  TestSystem weak(40);
  for (int i = 0; i + 1 < weak.n; ++i) {
    weak.Add(i, i, 1.0);
    weak.Add(i + 1, i + 1, 1.0);
    weak.Add(i, i + 1, -1.0);
    weak.rhs[i] = std::sin(i);
  }
  for (int i = 0; i < weak.n; ++i) weak.Add(i, i, 1e-9);
  weak.rhs[weak.n - 1] = -[&] {
    double sum = 0.0;
    for (int i = 0; i + 1 < weak.n; ++i) sum += weak.rhs[i];
    return sum;
  }();  // the right side lies off the free direction
  x.assign(weak.n, 0.0);
  ASSERT_TRUE(session.Solve(CompressedMatrix(weak.builder), weak.rhs, x, order));
  for (int i = 0; i < weak.n; i += 5) weak.Add(i, i, 1e-8);
  ASSERT_TRUE(session.SolvePreconditioned(CompressedMatrix(weak.builder), weak.rhs, x, limits));
  // Rounding of order 1e-16 grows by the condition along the free
  // direction: 1e-6 of answers some 100 across.
  ExpectSolves(x, weak, 1e-4);

  weak.Add(0, 0, -10.0);
  EXPECT_FALSE(session.Solve(CompressedMatrix(weak.builder), weak.rhs, x, order));
  EXPECT_FALSE(session.HasFactor());
  EXPECT_FALSE(session.SolvePreconditioned(CompressedMatrix(weak.builder), weak.rhs, x, limits));
}

// The leading block's order is a permutation of it, the rest follow in
// their own order, and a solve in that order is the dense one; sizes that
// disagree are refused.
TEST(OrderLeadingBlock, OrdersTheBlockAndPutsTheRestLast) {
  const TestSystem s = LeastSquaresSystem(60, 25);
  const CompressedMatrix matrix(s.builder);
  std::vector<std::int32_t> order;
  ASSERT_TRUE(OrderLeadingBlock(matrix, 50, order));
  ASSERT_EQ(order.size(), 60u);
  std::vector<std::int32_t> head(order.begin(), order.begin() + 50);
  std::sort(head.begin(), head.end());
  for (int k = 0; k < 50; ++k) EXPECT_EQ(head[k], k + 1);
  for (int k = 50; k < 60; ++k) EXPECT_EQ(order[k], k + 1);
  EliminationOrder given{order, true, true};
  std::vector<double> x(s.n);
  ASSERT_TRUE(SolveWithPardiso(matrix, s.rhs, x, given));
  ExpectSolves(x, s);
  EXPECT_FALSE(OrderLeadingBlock(matrix, 61, order));
  EXPECT_FALSE(OrderLeadingBlock(matrix, 0, order));
}

}  // namespace
}  // namespace Project
