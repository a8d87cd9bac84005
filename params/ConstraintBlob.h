#pragma once

#include <cstddef>
#include <cstdint>
#include <variant>
#include <vector>

namespace Project {

// One line constraint as the blob carries it: end points in the
// constraint's stored coordinates, the orientation kind as the constraint
// model numbers it (1 Unfixed, 2 Horizontal, 3 Vertical, 4 Arbitrary) and,
// for kind 4, the angle in degrees.
struct BlobLine {
  float x0 = 0;
  float y0 = 0;
  float x1 = 0;
  float y1 = 0;
  std::int32_t kind = 1;
  float angle = 0;
};

// One polygon constraint: its corners, and per edge a kind (1 Unfixed,
// 2 Horizontal, 3 Vertical). Edge i runs from corner i to the next one.
struct BlobPolygon {
  struct Point {
    float x = 0;
    float y = 0;
  };
  std::vector<Point> points;
  std::vector<std::int32_t> edgeKinds;  // one per point; missing ones count as 1
};

using BlobRecord = std::variant<BlobLine, BlobPolygon>;

// The compact form of a constraint list that rides in the scripting
// descriptor: the records in list order, little-endian, with no header and
// no count. A line is 28 bytes (tag 'Line', four end point coordinates, a
// stored kind 0 to 3, an angle); a polygon 8 + 12n (tag 'Plan', n, then per
// corner x, y and a stored edge kind 0 to 2). Stateless; the records in and
// out are the caller's.
class ConstraintBlob {
 public:
  static constexpr std::uint32_t kLineTag = 0x4C696E65;
  static constexpr std::uint32_t kPolygonTag = 0x506C616E;
  static constexpr std::size_t kLineSize = 28;
  static constexpr std::size_t kPolygonHeaderSize = 8;
  static constexpr std::size_t kPolygonPointSize = 12;

  ConstraintBlob() = delete;

  static std::size_t RecordSize(const BlobRecord& record);
  static std::size_t ByteSize(const std::vector<BlobRecord>& records);

  // The angle a line reports for its kind, in degrees: its direction for an
  // unfixed line, 0 horizontal, 90 vertical, its own angle when arbitrary.
  static float ReportedAngle(const BlobLine& line);

  static std::vector<std::uint8_t> Encode(const std::vector<BlobRecord>& records);
  // The records in bytes. Reading stops at the first record with an unknown
  // tag or too few bytes left, and keeps what came before it, so a damaged
  // blob costs its tail and never hangs the run.
  static std::vector<BlobRecord> Decode(const std::uint8_t* bytes, std::size_t size);
};

}  // namespace Project
