#include "framework/pixels/CPixScaler.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <map>
#include <type_traits>

#include "framework/core/CException.h"
#include "framework/pixels/CPixmap.h"

namespace Tarsa {

namespace {
constexpr const char* kBadDepthText =
    "$$$/Tarsa/Pixmap/Error/Depth=The image has a sample depth the program cannot handle.";
constexpr const char* kDepthMismatchText =
    "$$$/Tarsa/Pixmap/Error/DepthMismatch=The images have different sample depths.";

using AxisEntry = CPixScaler::AxisEntry;

// The row kernel: one destination position from a row of source samples
// that begins at source position `start`, unnormalised.
template <typename T>
double Resample(const T* row, std::int32_t start, const AxisEntry& entry) {
  const T* first = row + (entry.firstSample - start);
  if (entry.firstSample == entry.lastSample) return double(*first) * entry.firstWeight;
  const T* last = row + (entry.lastSample - start);
  double sum = double(*first) * entry.firstWeight + double(*last) * entry.lastWeight;
  for (const T* at = first + 1; at < last; ++at) sum += double(*at);
  return sum;
}

template <typename T>
T ToSample(double value) {
  if constexpr (std::is_floating_point_v<T>) {
    return T(value);
  } else {
    const double rounded = std::floor(value + 0.5);
    if (rounded <= 0) return 0;
    if (rounded >= double(std::numeric_limits<T>::max())) return std::numeric_limits<T>::max();
    return T(rounded);
  }
}

// An axis' mode and table for a destination span over a source span.
void MakeAxis(std::int64_t dstSize, std::int32_t srcStart, std::int64_t srcSize, std::int32_t& mode,
              float& norm, std::vector<AxisEntry>& table) {
  const auto d = std::uint32_t(dstSize);
  const auto s = std::uint32_t(srcSize);
  norm = 1;
  if (d == s) {
    mode = CPixScaler::kSame;
    table = CPixScaler::SameTable(srcStart, d);
  } else if (d < s) {
    mode = CPixScaler::kShrink;
    norm = float(d) / float(s);
    table = CPixScaler::ShrinkTable(srcStart, s, d);
  } else {
    mode = CPixScaler::kEnlarge;
    table = CPixScaler::EnlargeTable(srcStart, s, d);
  }
}
}  // namespace

std::vector<AxisEntry> CPixScaler::ShrinkTable(std::int32_t start, std::uint32_t count,
                                               std::uint32_t size) {
  std::vector<AxisEntry> table(size);
  const std::int64_t end = std::int64_t(start) + count;
  std::int64_t s = start;
  float carry = 0;
  double previousEdge = 0;
  double remainder = 0;
  for (std::uint32_t i = 1; i <= size; ++i) {
    AxisEntry& entry = table[i - 1];
    if (carry > 0) {
      entry.firstSample = std::int32_t(s - 1);
      entry.firstWeight = carry;
    } else {
      entry.firstSample = std::int32_t(s);
      entry.firstWeight = 1;
    }
    const double edge = double(i) * count / size;
    double t = edge - previousEdge - remainder;
    while (t > 1) {
      t -= 1;
      ++s;
    }
    remainder = 1 - t;
    // A sliver past the last sample is rounding: the last one was whole.
    if (float(t) > 0 && s < end) {
      entry.lastWeight = float(t);
      entry.lastSample = std::int32_t(s);
    } else {
      entry.lastWeight = 1;
      entry.lastSample = std::int32_t(s - 1);
    }
    carry = float(1 - t);
    ++s;
    previousEdge = edge;
  }
  return table;
}

std::vector<AxisEntry> CPixScaler::EnlargeTable(std::int32_t start, std::uint32_t count,
                                                std::uint32_t size) {
  std::vector<AxisEntry> table(size);
  for (std::uint32_t i = 0; i < size; ++i) {
    AxisEntry& entry = table[i];
    const double x = size > 1 ? double(i) * (count - 1) / (size - 1) : 0;
    auto n = std::int64_t(x);
    const auto f = float(x - double(n));
    if (f > 0 && f < 1) {
      entry.firstSample = std::int32_t(n + start);
      entry.lastSample = std::int32_t(n + start + 1);
      entry.firstWeight = 1 - f;
      entry.lastWeight = f;
      continue;
    }
    if (f >= 1) ++n;
    entry.firstSample = entry.lastSample = std::int32_t(n + start);
  }
  return table;
}

std::vector<AxisEntry> CPixScaler::SameTable(std::int32_t start, std::uint32_t size) {
  std::vector<AxisEntry> table(size);
  for (std::uint32_t i = 0; i < size; ++i) {
    table[i].firstSample = table[i].lastSample = std::int32_t(std::int64_t(start) + i);
  }
  return table;
}

bool CPixScaler::SetRects(const CRect& destination, const CRect& source) {
  if (destination.IsEmpty() || source.IsEmpty()) {
    const bool wasSet = !destination_.IsEmpty() || CellCount() != 0;
    destination_ = source_ = CRect{};
    tableX_.clear();
    tableY_.clear();
    modeX_ = modeY_ = kSame;
    normX_ = normY_ = 1;
    Clear();
    return wasSet;
  }
  if (destination == destination_ && source == source_) return false;
  destination_ = destination;
  source_ = source;
  MakeAxis(destination.Width(), source.left, source.Width(), modeX_, normX_, tableX_);
  MakeAxis(destination.Height(), source.top, source.Height(), modeY_, normY_, tableY_);
  return true;
}

bool CPixScaler::SourceRectFor(const CRect& destinationRect, CRect& out) const {
  const CRect area = destinationRect.Intersect(destination_);
  if (area.IsEmpty()) return false;
  const AxisEntry& left = tableX_[std::size_t(area.left - destination_.left)];
  const AxisEntry& right = tableX_[std::size_t(area.right - 1 - destination_.left)];
  const AxisEntry& top = tableY_[std::size_t(area.top - destination_.top)];
  const AxisEntry& bottom = tableY_[std::size_t(area.bottom - 1 - destination_.top)];
  out = CRect{left.firstSample, top.firstSample, right.lastSample + 1, bottom.lastSample + 1};
  return true;
}

void CPixScaler::Scale(const CPixmap& source, CPixmap& destination, const CRect& area) const {
  if (source.Depth() != destination.Depth()) throw CError(kDepthMismatchText);
  const CRect clipped = area.Intersect(destination_);
  CRect sourceArea;
  if (!SourceRectFor(clipped, sourceArea)) return;
  switch (source.Depth()) {
    case 8:
      ScaleAs<std::uint8_t>(source, destination, clipped, sourceArea);
      break;
    case 16:
      ScaleAs<std::uint16_t>(source, destination, clipped, sourceArea);
      break;
    case 32:
      ScaleAs<float>(source, destination, clipped, sourceArea);
      break;
    default:
      throw CError(kBadDepthText);
  }
}

template <typename T>
void CPixScaler::ScaleAs(const CPixmap& source, CPixmap& destination, const CRect& area,
                         const CRect& sourceArea) const {
  static_assert(sizeof(T) == 1 || sizeof(T) == 2 || sizeof(T) == 4);
  const auto width = std::uint32_t(area.Width());
  const auto sourceWidth = std::uint32_t(sourceArea.Width());
  const AxisEntry* columns = &tableX_[std::size_t(area.left - destination_.left)];
  const double norm = double(normX_) * double(normY_);
  const std::uint32_t planes = std::min(source.Planes(), destination.Planes());
  std::vector<T> sourceRow(sourceWidth);
  std::vector<double> sum(width);
  std::vector<T> out(width);
  for (std::uint32_t plane = 0; plane < planes; ++plane) {
    // Source rows resampled across, kept while the destination rows still
    // reach them: neighbouring rows share their end samples.
    std::map<std::int32_t, std::vector<double>> across;
    auto rowAcross = [&](std::int32_t y) -> const std::vector<double>& {
      auto found = across.find(y);
      if (found != across.end()) return found->second;
      source.ReadRow(plane, sourceArea.left, y, sourceWidth, sourceRow.data());
      std::vector<double> row(width);
      for (std::uint32_t i = 0; i < width; ++i) {
        row[i] = Resample(sourceRow.data(), sourceArea.left, columns[i]);
      }
      return across.emplace(y, std::move(row)).first->second;
    };
    for (std::int32_t y = area.top; y < area.bottom; ++y) {
      const AxisEntry& entry = tableY_[std::size_t(y - destination_.top)];
      across.erase(across.begin(), across.lower_bound(entry.firstSample));
      for (std::int32_t sy = entry.firstSample; sy <= entry.lastSample; ++sy) {
        const std::vector<double>& row = rowAcross(sy);
        double weight = 1;
        if (sy == entry.firstSample)
          weight = entry.firstWeight;
        else if (sy == entry.lastSample)
          weight = entry.lastWeight;
        for (std::uint32_t i = 0; i < width; ++i) {
          sum[i] = (sy == entry.firstSample ? 0 : sum[i]) + weight * row[i];
        }
      }
      for (std::uint32_t i = 0; i < width; ++i) out[i] = ToSample<T>(sum[i] * norm);
      destination.WriteRow(plane, area.left, y, width, out.data());
    }
  }
}

}  // namespace Tarsa
