#include "solver/geodesic/DenseMatrix.h"

#include <cmath>
#include <stdexcept>
#include <utility>

namespace Project {

namespace {

const char kIncompatibleSizes[] = "expressions have incompatible sizes.";

}  // namespace

template <typename T>
DenseMatrix<T>::DenseMatrix(std::int32_t rows, std::int32_t cols)
    : rows_(rows),
      cols_(cols),
      values_(static_cast<std::size_t>(rows) * static_cast<std::size_t>(cols), T(0)) {}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::Identity(std::int32_t n) {
  DenseMatrix m(n, n);
  for (std::int32_t k = 0; k < n; ++k) m(k, k) = T(1);
  return m;
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::Rotation(std::int32_t axis, T angle) {
  if (axis < 0 || axis > 2) throw std::invalid_argument("invalid function argument");
  DenseMatrix m = Identity(3);
  const std::int32_t p = (axis + 1) % 3;
  const std::int32_t q = (p + 1) % 3;
  const T c = std::cos(angle);
  const T s = std::sin(angle);
  m(p, p) = c;
  m(q, q) = c;
  m(p, q) = s;
  m(q, p) = -s;
  return m;
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::operator*(const DenseMatrix& other) const {
  if (cols_ != other.rows_) throw std::invalid_argument(kIncompatibleSizes);
  DenseMatrix result(rows_, other.cols_);
  for (std::int32_t r = 0; r < rows_; ++r) {
    for (std::int32_t k = 0; k < cols_; ++k) {
      const T a = (*this)(r, k);
      for (std::int32_t c = 0; c < other.cols_; ++c) result(r, c) += a * other(k, c);
    }
  }
  return result;
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::Inverse() const {
  if (rows_ != cols_) throw std::invalid_argument(kIncompatibleSizes);
  switch (rows_) {
    case 2:
      return InverseBySize2();
    case 3:
      return InverseBySize3();
    case 4:
      return InverseBySize4();
    default:
      return InverseByGaussJordan();
  }
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::InverseBySize2() const {
  const T* a = values_.data();
  const T invDet = T(1) / (a[0] * a[3] - a[1] * a[2]);
  DenseMatrix m(2, 2);
  m(0, 0) = a[3] * invDet;
  m(0, 1) = -a[1] * invDet;
  m(1, 0) = -a[2] * invDet;
  m(1, 1) = a[0] * invDet;
  return m;
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::InverseBySize3() const {
  const T* a = values_.data();
  // Cofactors times one over the determinant.
  const T c00 = a[4] * a[8] - a[5] * a[7];
  const T c01 = a[5] * a[6] - a[3] * a[8];
  const T c02 = a[3] * a[7] - a[4] * a[6];
  const T invDet = T(1) / (a[0] * c00 + a[1] * c01 + a[2] * c02);
  DenseMatrix m(3, 3);
  m(0, 0) = c00 * invDet;
  m(0, 1) = (a[2] * a[7] - a[1] * a[8]) * invDet;
  m(0, 2) = (a[1] * a[5] - a[2] * a[4]) * invDet;
  m(1, 0) = c01 * invDet;
  m(1, 1) = (a[0] * a[8] - a[2] * a[6]) * invDet;
  m(1, 2) = (a[2] * a[3] - a[0] * a[5]) * invDet;
  m(2, 0) = c02 * invDet;
  m(2, 1) = (a[1] * a[6] - a[0] * a[7]) * invDet;
  m(2, 2) = (a[0] * a[4] - a[1] * a[3]) * invDet;
  return m;
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::InverseBySize4() const {
  const T* a = values_.data();
  // Laplace expansion by the 2 x 2 minors of the top two rows (s) and the
  // bottom two rows (c).
  const T s0 = a[0] * a[5] - a[4] * a[1];
  const T s1 = a[0] * a[6] - a[4] * a[2];
  const T s2 = a[0] * a[7] - a[4] * a[3];
  const T s3 = a[1] * a[6] - a[5] * a[2];
  const T s4 = a[1] * a[7] - a[5] * a[3];
  const T s5 = a[2] * a[7] - a[6] * a[3];
  const T c5 = a[10] * a[15] - a[14] * a[11];
  const T c4 = a[9] * a[15] - a[13] * a[11];
  const T c3 = a[9] * a[14] - a[13] * a[10];
  const T c2 = a[8] * a[15] - a[12] * a[11];
  const T c1 = a[8] * a[14] - a[12] * a[10];
  const T c0 = a[8] * a[13] - a[12] * a[9];
  const T invDet = T(1) / (s0 * c5 - s1 * c4 + s2 * c3 + s3 * c2 - s4 * c1 + s5 * c0);
  DenseMatrix m(4, 4);
  T* b = m.values_.data();
  b[0] = (a[5] * c5 - a[6] * c4 + a[7] * c3) * invDet;
  b[1] = (-a[1] * c5 + a[2] * c4 - a[3] * c3) * invDet;
  b[2] = (a[13] * s5 - a[14] * s4 + a[15] * s3) * invDet;
  b[3] = (-a[9] * s5 + a[10] * s4 - a[11] * s3) * invDet;
  b[4] = (-a[4] * c5 + a[6] * c2 - a[7] * c1) * invDet;
  b[5] = (a[0] * c5 - a[2] * c2 + a[3] * c1) * invDet;
  b[6] = (-a[12] * s5 + a[14] * s2 - a[15] * s1) * invDet;
  b[7] = (a[8] * s5 - a[10] * s2 + a[11] * s1) * invDet;
  b[8] = (a[4] * c4 - a[5] * c2 + a[7] * c0) * invDet;
  b[9] = (-a[0] * c4 + a[1] * c2 - a[3] * c0) * invDet;
  b[10] = (a[12] * s4 - a[13] * s2 + a[15] * s0) * invDet;
  b[11] = (-a[8] * s4 + a[9] * s2 - a[11] * s0) * invDet;
  b[12] = (-a[4] * c3 + a[5] * c1 - a[6] * c0) * invDet;
  b[13] = (a[0] * c3 - a[1] * c1 + a[2] * c0) * invDet;
  b[14] = (-a[12] * s3 + a[13] * s1 - a[14] * s0) * invDet;
  b[15] = (a[8] * s3 - a[9] * s1 + a[10] * s0) * invDet;
  return m;
}

template <typename T>
DenseMatrix<T> DenseMatrix<T>::InverseByGaussJordan() const {
  const std::int32_t n = rows_;
  DenseMatrix m = *this;
  // Where each pivot was found, to undo the column exchanges at the end.
  std::vector<std::int32_t> pivotRow(static_cast<std::size_t>(n));
  std::vector<std::int32_t> pivotCol(static_cast<std::size_t>(n));
  std::vector<bool> used(static_cast<std::size_t>(n), false);
  for (std::int32_t step = 0; step < n; ++step) {
    // The largest entry among the rows and columns not yet pivoted on.
    T largest = T(-1);
    std::int32_t row = 0;
    std::int32_t col = 0;
    for (std::int32_t r = 0; r < n; ++r) {
      if (used[static_cast<std::size_t>(r)]) continue;
      for (std::int32_t c = 0; c < n; ++c) {
        if (used[static_cast<std::size_t>(c)]) continue;
        if (std::fabs(m(r, c)) > largest) {
          largest = std::fabs(m(r, c));
          row = r;
          col = c;
        }
      }
    }
    used[static_cast<std::size_t>(col)] = true;
    if (row != col) {
      for (std::int32_t c = 0; c < n; ++c) std::swap(m(row, c), m(col, c));
    }
    pivotRow[static_cast<std::size_t>(step)] = row;
    pivotCol[static_cast<std::size_t>(step)] = col;
    // In place: the pivot's slot takes the inverse's entry.
    const T invPivot = T(1) / m(col, col);
    m(col, col) = T(1);
    for (std::int32_t c = 0; c < n; ++c) m(col, c) *= invPivot;
    for (std::int32_t r = 0; r < n; ++r) {
      if (r == col) continue;
      const T factor = m(r, col);
      m(r, col) = T(0);
      for (std::int32_t c = 0; c < n; ++c) m(r, c) -= m(col, c) * factor;
    }
  }
  for (std::int32_t step = n - 1; step >= 0; --step) {
    const std::int32_t row = pivotRow[static_cast<std::size_t>(step)];
    const std::int32_t col = pivotCol[static_cast<std::size_t>(step)];
    if (row == col) continue;
    for (std::int32_t r = 0; r < n; ++r) std::swap(m(r, row), m(r, col));
  }
  return m;
}

template class DenseMatrix<float>;
template class DenseMatrix<double>;

}  // namespace Project
