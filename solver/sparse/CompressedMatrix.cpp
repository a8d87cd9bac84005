#include "solver/sparse/CompressedMatrix.h"

#include <algorithm>
#include <cassert>
#include <limits>
#include <stdexcept>

#include "solver/sparse/SparseBuilder.h"

namespace Project {

namespace {

std::int32_t InitialCapacity(std::int32_t rows, std::int32_t columns, std::int32_t hint) {
  if (rows > 0 && hint / rows >= columns) return rows * columns;
  return std::max(hint, std::min(rows, columns));
}

std::int32_t EntryHint(std::int64_t entries) {
  if (entries > std::numeric_limits<std::int32_t>::max()) {
    throw std::length_error("sparse matrix beyond 32-bit indices");
  }
  return static_cast<std::int32_t>(entries);
}

}  // namespace

CompressedMatrix::CompressedMatrix(std::int32_t rows, std::int32_t columns,
                                   std::int32_t capacityHint)
    : rows_(rows),
      columns_(columns),
      capacity_(InitialCapacity(rows, columns, capacityHint)),
      rowStart_(static_cast<std::size_t>(rows) + 1),
      column_(static_cast<std::size_t>(capacity_)),
      value_(static_cast<std::size_t>(capacity_)) {
  rowStart_[0] = 1;
}

CompressedMatrix::CompressedMatrix(const SparseBuilder& builder)
    : CompressedMatrix(builder.Size(), builder.Size(), EntryHint(builder.EntryCount())) {
  for (std::int32_t r = 0; r < rows_; ++r) {
    const std::int32_t count = builder.RowEntryCount(r);
    const std::int32_t at = filledEntries_;
    std::copy_n(builder.RowColumns(r), count, column_.begin() + at);
    std::copy_n(builder.RowValues(r), count, value_.begin() + at);
    filledEntries_ += count;
    EndRow();
  }
}

CompressedMatrix CompressedMatrix::Sum(const CompressedMatrix& a, const CompressedMatrix& b) {
  if (a.rows_ != b.rows_ || a.columns_ != b.columns_ || !a.IsComplete() || !b.IsComplete()) {
    throw std::invalid_argument("sum of sparse matrices of different sizes");
  }
  CompressedMatrix sum(a.rows_, a.columns_,
                       EntryHint(std::int64_t{a.filledEntries_} + b.filledEntries_));
  for (std::int32_t r = 0; r < a.rows_; ++r) {
    std::int32_t i = a.rowStart_[r] - 1;
    std::int32_t j = b.rowStart_[r] - 1;
    const std::int32_t iEnd = a.rowStart_[r + 1] - 1;
    const std::int32_t jEnd = b.rowStart_[r + 1] - 1;
    while (i < iEnd || j < jEnd) {
      const std::int32_t ci = i < iEnd ? a.column_[i] : std::numeric_limits<std::int32_t>::max();
      const std::int32_t cj = j < jEnd ? b.column_[j] : std::numeric_limits<std::int32_t>::max();
      if (ci < cj) {
        sum.Append(ci - 1, a.value_[i++]);
      } else if (cj < ci) {
        sum.Append(cj - 1, b.value_[j++]);
      } else {
        sum.Append(ci - 1, a.value_[i++] + b.value_[j++]);
      }
    }
    sum.EndRow();
  }
  return sum;
}

void CompressedMatrix::Append(std::int32_t column, double value) {
  assert(!IsComplete() && column >= 0 && column < columns_);
  if (filledEntries_ == capacity_) Grow();
  column_[filledEntries_] = column + 1;
  value_[filledEntries_] = value;
  ++filledEntries_;
}

void CompressedMatrix::EndRow() {
  assert(!IsComplete());
  rowStart_[filledRows_++] = filledEntries_ + 1;
}

void CompressedMatrix::Grow() {
  capacity_ = std::max(2 * capacity_, 1);
  column_.resize(static_cast<std::size_t>(capacity_));
  value_.resize(static_cast<std::size_t>(capacity_));
}

void CompressedMatrix::MultiplySymmetric(std::span<const double> x, std::span<double> y) const {
  assert(IsComplete() && x.size() == static_cast<std::size_t>(columns_) &&
         y.size() == static_cast<std::size_t>(rows_));
  std::fill(y.begin(), y.end(), 0.0);
  for (std::int32_t r = 0; r < rows_; ++r) {
    for (std::int32_t k = rowStart_[r] - 1; k < rowStart_[r + 1] - 1; ++k) {
      const std::int32_t c = column_[k] - 1;
      y[r] += value_[k] * x[c];
      if (c != r) y[c] += value_[k] * x[r];
    }
  }
}

}  // namespace Project
