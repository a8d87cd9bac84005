#include <gtest/gtest.h>

#include <random>
#include <stdexcept>

#include "solver/geodesic/DenseMatrix.h"

namespace Project {
namespace {

// Sizes 2 to 4 take closed forms and the rest Gauss-Jordan elimination:
// each must give A inv(A) = I. The random matrices are diagonally weighted
// so they are well conditioned; one has a zero leading entry and rows out of
// order, so the elimination must pivot.
TEST(DenseMatrixTest, InverseTimesMatrixIsIdentity) {
  std::mt19937 random(7);
  std::uniform_real_distribution<double> entry(-1.0, 1.0);
  for (int n = 1; n <= 8; ++n) {
    DenseMatrix<double> a(n, n);
    for (int r = 0; r < n; ++r) {
      for (int c = 0; c < n; ++c) a(r, c) = entry(random) + (r == c ? 2.0 : 0.0);
    }
    const DenseMatrix<double> product = a * a.Inverse();
    for (int r = 0; r < n; ++r) {
      for (int c = 0; c < n; ++c) {
        // Conditioning below 10 keeps the error near double rounding.
        EXPECT_NEAR(product(r, c), r == c ? 1.0 : 0.0, 1e-12) << n << " " << r << " " << c;
      }
    }
  }
  // A cyclic permutation with a scale: its first pivot is off the diagonal.
  DenseMatrix<double> p(6, 6);
  for (int r = 0; r < 6; ++r) p(r, (r + 1) % 6) = r + 1.0;
  const DenseMatrix<double> product = p.Inverse() * p;
  for (int r = 0; r < 6; ++r) {
    // Exact: each step divides and multiplies by the same small integer.
    for (int c = 0; c < 6; ++c) EXPECT_NEAR(product(r, c), r == c ? 1.0 : 0.0, 1e-15);
  }
}

TEST(DenseMatrixTest, MisuseThrows) {
  try {
    (void)DenseMatrix<float>::Rotation(3, 0.1f);
    FAIL() << "axis 3 accepted";
  } catch (const std::invalid_argument& e) {
    EXPECT_STREQ(e.what(), "invalid function argument");
  }
  try {
    (void)(DenseMatrix<double>(2, 3) * DenseMatrix<double>(2, 3));
    FAIL() << "2 x 3 times 2 x 3 accepted";
  } catch (const std::invalid_argument& e) {
    EXPECT_STREQ(e.what(), "expressions have incompatible sizes.");
  }
}

}  // namespace
}  // namespace Project
