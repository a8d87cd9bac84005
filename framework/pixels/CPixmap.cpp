#include "framework/pixels/CPixmap.h"

#include <algorithm>
#include <cstring>
#include <vector>

#include "framework/core/CException.h"
#include "framework/pixels/CBasicPixmap.h"

namespace Tarsa {

namespace {
constexpr const char* kOutsideText =
    "$$$/Tarsa/Pixmap/Error/Outside=An image area outside the image was addressed.";
constexpr const char* kDepthMismatchText =
    "$$$/Tarsa/Pixmap/Error/DepthMismatch=The images have different sample depths.";

}  // namespace

std::uint32_t CPixmap::LoadBytes(const std::uint8_t* at, std::size_t bytes) {
  switch (bytes) {
    case 1:
      return *at;
    case 2: {
      std::uint16_t v;
      std::memcpy(&v, at, 2);
      return v;
    }
    default: {
      std::uint32_t v;
      std::memcpy(&v, at, 4);
      return v;
    }
  }
}

void CPixmap::StoreBytes(std::uint8_t* at, std::size_t bytes, std::uint32_t value) {
  switch (bytes) {
    case 1:
      *at = std::uint8_t(value);
      break;
    case 2: {
      const auto v = std::uint16_t(value);
      std::memcpy(at, &v, 2);
      break;
    }
    default:
      std::memcpy(at, &value, 4);
      break;
  }
}

CPixmap::CPixmap(const CRect& bounds, std::uint32_t planes, std::uint32_t depth)
    : bounds_(bounds), planes_(planes), depth_(depth) {}

void CPixmap::MoveTo(CPoint origin) {
  bounds_ = bounds_.Offset(origin.x - bounds_.left, origin.y - bounds_.top);
}

void CPixmap::CheckRow(std::uint32_t plane, std::int32_t x, std::int32_t y,
                       std::uint32_t count) const {
  if (plane >= planes_ || x < bounds_.left || y < bounds_.top || y >= bounds_.bottom ||
      std::int64_t(x) + count > bounds_.right) {
    throw CError(kOutsideText);
  }
}

void CPixmap::ReadRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                      void* out) const {
  CheckRow(plane, x, y, count);
  auto* bytes = static_cast<std::uint8_t*>(out);
  const std::size_t step = RowSampleBytes();
  for (std::uint32_t i = 0; i < count; ++i) {
    StoreBytes(bytes + i * step, step, Sample(plane, x + std::int32_t(i), y));
  }
}

void CPixmap::WriteRow(std::uint32_t plane, std::int32_t x, std::int32_t y, std::uint32_t count,
                       const void* in) {
  CheckRow(plane, x, y, count);
  const auto* bytes = static_cast<const std::uint8_t*>(in);
  const std::size_t step = RowSampleBytes();
  for (std::uint32_t i = 0; i < count; ++i) {
    SetSample(plane, x + std::int32_t(i), y, LoadBytes(bytes + i * step, step));
  }
}

void CPixmap::Fill(std::uint32_t plane, const CRect& area, std::uint32_t value) {
  const CRect r = area.Intersect(bounds_);
  if (r.IsEmpty() || plane >= planes_) return;
  const std::size_t step = RowSampleBytes();
  std::vector<std::uint8_t> row(std::size_t(r.Width()) * step);
  for (std::size_t i = 0; i < std::size_t(r.Width()); ++i) StoreBytes(&row[i * step], step, value);
  for (std::int32_t y = r.top; y < r.bottom; ++y) {
    WriteRow(plane, r.left, y, std::uint32_t(r.Width()), row.data());
  }
}

void CPixmap::CopyFrom(const CPixmap& source, const CRect& area) {
  if (source.Depth() != depth_) throw CError(kDepthMismatchText);
  const CRect r = area.Intersect(bounds_).Intersect(source.Bounds());
  if (r.IsEmpty()) return;
  const std::uint32_t planes = std::min(planes_, source.Planes());
  const auto width = std::uint32_t(r.Width());
  // A pixmap in plain memory holds its rows as rows pass: the copy goes
  // straight from or into its samples, with no row in between.
  const auto* from = depth_ >= 8 ? dynamic_cast<const CBasicPixmap*>(&source) : nullptr;
  auto* into = depth_ >= 8 ? dynamic_cast<CBasicPixmap*>(this) : nullptr;
  std::vector<std::uint8_t> row;
  if (from == nullptr && into == nullptr) row.resize(std::size_t(width) * RowSampleBytes());
  for (std::uint32_t plane = 0; plane < planes; ++plane) {
    for (std::int32_t y = r.top; y < r.bottom; ++y) {
      if (from != nullptr) {
        WriteRow(plane, r.left, y, width, from->Address(plane, r.left, y));
      } else if (into != nullptr) {
        source.ReadRow(plane, r.left, y, width, into->Address(plane, r.left, y));
      } else {
        source.ReadRow(plane, r.left, y, width, row.data());
        WriteRow(plane, r.left, y, width, row.data());
      }
    }
  }
}

}  // namespace Tarsa
