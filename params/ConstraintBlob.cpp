#include "params/ConstraintBlob.h"

#include <bit>
#include <cmath>

namespace Project {

namespace {

// Written and read byte by byte, so the form is little-endian on any machine.
void PutU32(std::vector<std::uint8_t>& out, std::uint32_t value) {
  for (int shift = 0; shift < 32; shift += 8) {
    out.push_back(static_cast<std::uint8_t>(value >> shift));
  }
}
void PutFloat(std::vector<std::uint8_t>& out, float value) {
  PutU32(out, std::bit_cast<std::uint32_t>(value));
}
std::uint32_t GetU32(const std::uint8_t* at) {
  return std::uint32_t(at[0]) | (std::uint32_t(at[1]) << 8) | (std::uint32_t(at[2]) << 16) |
         (std::uint32_t(at[3]) << 24);
}
float GetFloat(const std::uint8_t* at) { return std::bit_cast<float>(GetU32(at)); }

// Internal kinds 1.. are stored from 0; a kind outside the stored range is
// stored as 0, and a stored value outside it reads as 1.
std::uint32_t StoredKind(std::int32_t kind, std::int32_t count) {
  return kind >= 1 && kind <= count ? static_cast<std::uint32_t>(kind - 1) : 0;
}
std::int32_t InternalKind(std::uint32_t stored, std::int32_t count) {
  return stored < static_cast<std::uint32_t>(count) ? static_cast<std::int32_t>(stored) + 1 : 1;
}

constexpr std::int32_t kLineKinds = 4;
constexpr std::int32_t kEdgeKinds = 3;
constexpr std::int32_t kLineArbitrary = 4;
constexpr std::uint32_t kStoredArbitrary = 3;

struct SizeOf {
  std::size_t operator()(const BlobLine&) const { return ConstraintBlob::kLineSize; }
  std::size_t operator()(const BlobPolygon& polygon) const {
    return ConstraintBlob::kPolygonHeaderSize +
           ConstraintBlob::kPolygonPointSize * polygon.points.size();
  }
};

}  // namespace

std::size_t ConstraintBlob::RecordSize(const BlobRecord& record) {
  return std::visit(SizeOf{}, record);
}

std::size_t ConstraintBlob::ByteSize(const std::vector<BlobRecord>& records) {
  std::size_t size = 0;
  for (const BlobRecord& record : records) size += RecordSize(record);
  return size;
}

float ConstraintBlob::ReportedAngle(const BlobLine& line) {
  switch (line.kind) {
    case 2:
      return 0.0f;
    case 3:
      return 90.0f;
    case kLineArbitrary:
      return line.angle;
    default:
      break;
  }
  const double dx = static_cast<double>(line.x1) - line.x0;
  const double dy = static_cast<double>(line.y1) - line.y0;
  if (std::fabs(dx) < 1e-6) return dy < 0 ? -90.0f : 90.0f;
  // The constant is the stored form's own, kept so that replayed blobs match.
  return static_cast<float>(std::atan(dy / dx) / 3.1416 * 180.0);
}

std::vector<std::uint8_t> ConstraintBlob::Encode(const std::vector<BlobRecord>& records) {
  std::vector<std::uint8_t> out;
  out.reserve(ByteSize(records));
  for (const BlobRecord& record : records) {
    if (const auto* line = std::get_if<BlobLine>(&record)) {
      PutU32(out, kLineTag);
      PutFloat(out, line->x0);
      PutFloat(out, line->y0);
      PutFloat(out, line->x1);
      PutFloat(out, line->y1);
      PutU32(out, StoredKind(line->kind, kLineKinds));
      PutFloat(out, ReportedAngle(*line));
    } else {
      const auto& polygon = std::get<BlobPolygon>(record);
      PutU32(out, kPolygonTag);
      PutU32(out, static_cast<std::uint32_t>(polygon.points.size()));
      for (std::size_t i = 0; i < polygon.points.size(); ++i) {
        PutFloat(out, polygon.points[i].x);
        PutFloat(out, polygon.points[i].y);
        const std::int32_t kind = i < polygon.edgeKinds.size() ? polygon.edgeKinds[i] : 1;
        PutU32(out, StoredKind(kind, kEdgeKinds));
      }
    }
  }
  return out;
}

std::vector<BlobRecord> ConstraintBlob::Decode(const std::uint8_t* bytes, std::size_t size) {
  std::vector<BlobRecord> records;
  if (bytes == nullptr) return records;
  std::size_t at = 0;
  while (size - at >= 4) {
    const std::size_t left = size - at;
    const std::uint32_t tag = GetU32(bytes + at);
    if (tag == kLineTag) {
      if (left < kLineSize) break;
      const std::uint8_t* p = bytes + at + 4;
      BlobLine line;
      line.x0 = GetFloat(p);
      line.y0 = GetFloat(p + 4);
      line.x1 = GetFloat(p + 8);
      line.y1 = GetFloat(p + 12);
      const std::uint32_t stored = GetU32(p + 16);
      line.kind = InternalKind(stored, kLineKinds);
      line.angle = stored == kStoredArbitrary ? GetFloat(p + 20) : 0.0f;
      records.emplace_back(line);
      at += kLineSize;
    } else if (tag == kPolygonTag) {
      if (left < kPolygonHeaderSize) break;
      const std::uint32_t count = GetU32(bytes + at + 4);
      // Checked by division, so a huge count cannot overflow the product.
      if ((left - kPolygonHeaderSize) / kPolygonPointSize < count) break;
      BlobPolygon polygon;
      polygon.points.reserve(count);
      polygon.edgeKinds.reserve(count);
      const std::uint8_t* p = bytes + at + kPolygonHeaderSize;
      for (std::uint32_t i = 0; i < count; ++i, p += kPolygonPointSize) {
        polygon.points.push_back({GetFloat(p), GetFloat(p + 4)});
        polygon.edgeKinds.push_back(InternalKind(GetU32(p + 8), kEdgeKinds));
      }
      records.emplace_back(std::move(polygon));
      at += kPolygonHeaderSize + kPolygonPointSize * count;
    } else {
      break;
    }
  }
  return records;
}

}  // namespace Project
