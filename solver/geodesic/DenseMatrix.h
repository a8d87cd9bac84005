#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace Project {

// A small dense matrix, row by row, for the few fixed-size problems of the
// constraint store: the 8 x 8 normal equations of a polygon's homography and
// the 3 x 3 rotations of the sphere. A value: copied and compared freely.
// Sizes 2, 3 and 4 invert by closed forms, larger ones by Gauss-Jordan
// elimination with full pivoting; a singular matrix is not caught and gives
// infinities or NaNs, as the callers add no regularisation of their own.
template <typename T>
class DenseMatrix {
 public:
  DenseMatrix() = default;
  // rows x cols of zeros.
  DenseMatrix(std::int32_t rows, std::int32_t cols);

  static DenseMatrix Identity(std::int32_t n);
  // The 3 x 3 turn by angle about axis 0, 1 or 2: with p the next axis and q
  // the one after, [p][p] = [q][q] = cos, [p][q] = sin, [q][p] = -sin. Any
  // other axis throws std::invalid_argument.
  static DenseMatrix Rotation(std::int32_t axis, T angle);

  std::int32_t Rows() const { return rows_; }
  T& operator()(std::int32_t r, std::int32_t c) { return values_[Index(r, c)]; }
  const T& operator()(std::int32_t r, std::int32_t c) const { return values_[Index(r, c)]; }
  const T* Data() const { return values_.data(); }

  // Throws std::invalid_argument when the inner sizes differ.
  DenseMatrix operator*(const DenseMatrix& other) const;
  // The inverse of a square matrix; throws std::invalid_argument for any
  // other shape.
  DenseMatrix Inverse() const;

  friend bool operator==(const DenseMatrix&, const DenseMatrix&) = default;

 private:
  std::size_t Index(std::int32_t r, std::int32_t c) const {
    return static_cast<std::size_t>(r) * static_cast<std::size_t>(cols_) +
           static_cast<std::size_t>(c);
  }
  DenseMatrix InverseBySize2() const;
  DenseMatrix InverseBySize3() const;
  DenseMatrix InverseBySize4() const;
  DenseMatrix InverseByGaussJordan() const;

  std::int32_t rows_ = 0;
  std::int32_t cols_ = 0;
  std::vector<T> values_;
};

extern template class DenseMatrix<float>;
extern template class DenseMatrix<double>;

}  // namespace Project
