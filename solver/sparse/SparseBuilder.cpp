#include "solver/sparse/SparseBuilder.h"

#include <algorithm>
#include <cassert>
#include <utility>

namespace Project {

SparseBuilder::SparseBuilder(std::int32_t size) : rows_(static_cast<std::size_t>(size)) {}

void SparseBuilder::Add(std::int32_t row, std::int32_t column, double value) {
  Slot(row, column) += value;
}

void SparseBuilder::Set(std::int32_t row, std::int32_t column, double value) {
  Slot(row, column) = value;
}

double SparseBuilder::Get(std::int32_t row, std::int32_t column) const {
  if (column < row) std::swap(row, column);
  assert(row >= 0 && column < Size());
  const Row& r = rows_[row];
  const auto end = r.columns.begin() + r.count;
  const auto it = std::lower_bound(r.columns.begin(), end, column + 1);
  if (it == end || *it != column + 1) return 0.0;
  return r.values[it - r.columns.begin()];
}

double& SparseBuilder::Slot(std::int32_t row, std::int32_t column) {
  if (column < row) std::swap(row, column);
  assert(row >= 0 && column < Size());
  Row& r = rows_[row];
  const std::int32_t key = column + 1;
  const auto end = r.columns.begin() + r.count;
  const std::int32_t at =
      static_cast<std::int32_t>(std::lower_bound(r.columns.begin(), end, key) - r.columns.begin());
  if (at < r.count && r.columns[at] == key) return r.values[at];

  const std::int32_t capacity = RowCapacity(row);
  if (r.count == capacity) {
    // A row can never need more than one slot per column.
    const std::int32_t grown = std::min(Size(), std::max(2 * capacity, 1));
    r.columns.resize(grown);
    r.values.resize(grown);
  }
  std::copy_backward(r.columns.begin() + at, r.columns.begin() + r.count,
                     r.columns.begin() + r.count + 1);
  std::copy_backward(r.values.begin() + at, r.values.begin() + r.count,
                     r.values.begin() + r.count + 1);
  r.columns[at] = key;
  r.values[at] = 0.0;
  ++r.count;
  return r.values[at];
}

void SparseBuilder::Clear() {
  for (Row& r : rows_) r.count = 0;
}

void SparseBuilder::Resize(std::int32_t size) {
  rows_.resize(static_cast<std::size_t>(size));
  for (Row& r : rows_) {
    // Rows are sorted, so the columns past the new size form the tail; the
    // capacity keeps to the column count, as growth does.
    const auto end = r.columns.begin() + r.count;
    r.count = static_cast<std::int32_t>(std::upper_bound(r.columns.begin(), end, size) -
                                        r.columns.begin());
    if (static_cast<std::int32_t>(r.columns.size()) > size) {
      r.columns.resize(size);
      r.values.resize(size);
    }
  }
}

std::int32_t SparseBuilder::RowCapacity(std::int32_t row) const {
  return static_cast<std::int32_t>(rows_[row].columns.size());
}

std::int64_t SparseBuilder::EntryCount() const {
  std::int64_t total = 0;
  for (const Row& r : rows_) total += r.count;
  return total;
}

}  // namespace Project
