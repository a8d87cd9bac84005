#pragma once

#include <cstdint>
#include <vector>

namespace Project {

// A square symmetric matrix under assembly, kept as its upper triangle: one
// sparse row per unknown, each a sorted array of column numbers (stored plus
// one, as the compressed form wants them) beside an array of values. A
// column is found by binary search and a new one is inserted in place,
// shifting the row's tail by one; a full row grows to twice its capacity,
// never beyond the column count. An entry named below the diagonal is its
// mirror above it, so callers may pass a pair in either order.
//
// The warp solver owns two of these (the constant part and the part rebuilt
// every iteration) and compresses them before each solve. The builder owns
// its rows outright; copying a whole system by accident is never meant, so
// it moves but does not copy.
class SparseBuilder {
 public:
  explicit SparseBuilder(std::int32_t size = 0);
  SparseBuilder(const SparseBuilder&) = delete;
  SparseBuilder& operator=(const SparseBuilder&) = delete;
  SparseBuilder(SparseBuilder&&) = default;
  SparseBuilder& operator=(SparseBuilder&&) = default;

  std::int32_t Size() const { return static_cast<std::int32_t>(rows_.size()); }

  // Entry (row, column) += value, creating it when absent.
  void Add(std::int32_t row, std::int32_t column, double value);
  // Entry (row, column) = value, creating it when absent.
  void Set(std::int32_t row, std::int32_t column, double value);
  // The entry, 0.0 when it is not stored.
  double Get(std::int32_t row, std::int32_t column) const;

  // Empties every row; capacities are kept for the next assembly.
  void Clear();
  // Grows or shrinks to size x size, keeping the rows that remain. Entries
  // in columns beyond a smaller size are dropped.
  void Resize(std::int32_t size);

  std::int32_t RowEntryCount(std::int32_t row) const { return rows_[row].count; }
  std::int32_t RowCapacity(std::int32_t row) const;
  std::int64_t EntryCount() const;

  // The row's stored entries, RowEntryCount(row) of them, columns one-based, ascending.
  const std::int32_t* RowColumns(std::int32_t row) const { return rows_[row].columns.data(); }
  const double* RowValues(std::int32_t row) const { return rows_[row].values.data(); }

 private:
  struct Row {
    std::vector<std::int32_t> columns;  // one-based; capacity-long, count used
    std::vector<double> values;
    std::int32_t count = 0;
  };

  // The value slot of (row, column), inserted as 0.0 when absent.
  double& Slot(std::int32_t row, std::int32_t column);

  std::vector<Row> rows_;
};

}  // namespace Project
