#pragma once

#include <cstdint>
#include <span>
#include <vector>

namespace Project {

class SparseBuilder;

// A sparse matrix in compressed rows with one-based indices: rowStart[r] is
// the one-based position in column/value where row r begins, rowStart[0]
// being 1, and column holds one-based column numbers. The symmetric systems
// of the warp solver are stored by their upper triangle. The sparse solve
// reads the values in place; the indices it copies, shifted to count from
// zero as the library does, and keeps them to tell a repeated pattern.
//
// Rows are written in order, one entry at a time; filledRows counts the
// rowStart entries written (one more than the rows finished) and
// filledEntries the entries. The arrays are sized by capacity, which a
// matrix outgrowing it doubles. The matrix owns its arrays; it moves but
// does not copy, since a copy of a whole system is never meant.
class CompressedMatrix {
 public:
  // An empty matrix of rows x columns with room for about capacityHint
  // entries: the larger of the hint and the smaller size, or the whole
  // rows x columns when the hint reaches that (hint / rows >= columns).
  CompressedMatrix(std::int32_t rows, std::int32_t columns, std::int32_t capacityHint);
  // The builder's rows, compressed.
  explicit CompressedMatrix(const SparseBuilder& builder);
  CompressedMatrix(const CompressedMatrix&) = delete;
  CompressedMatrix& operator=(const CompressedMatrix&) = delete;
  CompressedMatrix(CompressedMatrix&&) = default;
  CompressedMatrix& operator=(CompressedMatrix&&) = default;

  // a + b, walking both operands' rows together in column order and adding
  // the entries that meet. The sizes must agree (std::invalid_argument).
  static CompressedMatrix Sum(const CompressedMatrix& a, const CompressedMatrix& b);

  // Appends an entry (zero-based column) to the row being written.
  void Append(std::int32_t column, double value);
  // Finishes the row being written.
  void EndRow();

  // y = A x for a symmetric A stored by its upper triangle.
  void MultiplySymmetric(std::span<const double> x, std::span<double> y) const;

  std::int32_t Rows() const { return rows_; }
  std::int32_t Columns() const { return columns_; }
  std::int32_t Capacity() const { return capacity_; }
  std::int32_t FilledEntries() const { return filledEntries_; }
  // All rows written.
  bool IsComplete() const { return filledRows_ == rows_ + 1; }

  const std::int32_t* RowStart() const { return rowStart_.data(); }
  const std::int32_t* Column() const { return column_.data(); }
  const double* Value() const { return value_.data(); }

 private:
  void Grow();

  std::int32_t rows_;
  std::int32_t columns_;
  std::int32_t capacity_;
  std::int32_t filledRows_ = 1;
  std::int32_t filledEntries_ = 0;
  std::vector<std::int32_t> rowStart_;  // rows_ + 1, one-based positions
  std::vector<std::int32_t> column_;    // capacity_, one-based
  std::vector<double> value_;           // capacity_
};

}  // namespace Project
