#pragma once

#include <array>
#include <cstdint>
#include <vector>

namespace Project {

// The traced form of the constraints, as GeodesicLines stores them and the
// mesh solve reads them. A line is a list of samples, each a fixed linear
// combination of the four corners of one grid cell, so that the solve can
// write a line's straightness as rows on the vertex unknowns. A polygon is a
// set of grid vertices with plane coordinates, plus its traced edges. All of
// these are plain values, copied freely.

// A point of the photograph (texture fractions, mode 0) or of the result
// plane (mode 1).
struct Point2f {
  float x = 0.0f;
  float y = 0.0f;
  friend bool operator==(const Point2f&, const Point2f&) = default;
};

// One point of a traced line.
struct LineSample {
  // On the corners (i, j), (i + 1, j), (i + 1, j + 1), (i, j + 1) of the cell.
  std::array<float, 4> weights{0.0f, 0.0f, 0.0f, 0.0f};
  // The cell; (-1, -1) marks a sample with no cell, which stands at (0, 0).
  std::int32_t cellI = -1;
  std::int32_t cellJ = -1;
  // Place along the line: 0 at the first sample, 1 at the last.
  float position = 0.0f;
};

struct LineRecord {
  std::vector<LineSample> samples;          // in order along the line
  std::int32_t id = -1;                     // the constraint's id, -1 when not bound
  bool active = true;                       // false when tracing failed: the solve skips it
  std::array<float, 2> normal{0.0f, 0.0f};  // fitted unit normal in the result plane
  bool hasFixedNormal = false;
  // (0, 1) for a horizontal line, (1, 0) for a vertical one, or as set.
  std::array<float, 2> fixedNormal{0.0f, 0.0f};
};

// A grid vertex inside a polygon, with its plane coordinates.
struct PlaneSample {
  std::int32_t i = 0;
  std::int32_t j = 0;
  float s = 0.0f;
  float t = 0.0f;
};

struct PlaneRecord {
  std::vector<PlaneSample> samples;                // the grid vertices inside
  std::vector<std::array<float, 3>> spherePoints;  // the corners on the sphere
  // H, row by row, taking plane coordinates (s, t) to the result plane.
  std::array<double, 9> homography{1.0, 0.0, 0.0, 0.0, 1.0, 0.0, 0.0, 0.0, 1.0};
  std::int32_t id = -1;           // the constraint's id, -1 when not bound
  bool active = true;             // false once an edge failed to trace
  std::vector<LineRecord> edges;  // the edges traced so far
  std::vector<Point2f> corners;   // corners as image fractions
};

}  // namespace Project
