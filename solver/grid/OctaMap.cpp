#include "solver/grid/OctaMap.h"

#include <cmath>
#include <cstdlib>
#include <utility>

namespace Project {

namespace {

constexpr float kQuarterPi = 0.78539816f;

// One triangle of the unfolded square: three grid corners (in units of h)
// and, for each, the sphere axis it stands for (0 x, 1 y, 2 z).
struct Triangle {
  std::int32_t ci[3];
  std::int32_t cj[3];
  std::int32_t axis[3];
  float sign[3];  // the octant's sign of x, y and z
};

// The eight triangles in the order they are tested.
const Triangle kTriangles[8] = {
    {{0, 1, 0}, {0, 0, 1}, {0, 2, 1}, {-1, -1, 1}},  {{1, 1, 0}, {1, 0, 1}, {0, 2, 1}, {1, -1, 1}},
    {{2, 1, 2}, {0, 0, 1}, {0, 2, 1}, {-1, 1, 1}},   {{1, 1, 2}, {1, 0, 1}, {0, 2, 1}, {1, 1, 1}},
    {{0, 0, 1}, {2, 1, 2}, {0, 1, 2}, {-1, -1, -1}}, {{1, 0, 1}, {1, 1, 2}, {0, 1, 2}, {1, -1, -1}},
    {{1, 2, 1}, {1, 1, 2}, {0, 1, 2}, {1, 1, -1}},   {{2, 2, 1}, {2, 1, 2}, {0, 1, 2}, {-1, 1, -1}},
};

std::int32_t TriangleOf(std::int32_t i, std::int32_t j, std::int32_t h) {
  if (i < h && j < h) return i + j < h ? 0 : 1;
  if (i >= h && j < h) return 2 * h - i + j < h ? 2 : 3;
  if (i < h) return 2 * h - j + i < h ? 4 : 5;
  return i + j - 2 * h < h ? 6 : 7;
}

// x = a (1 + y + z), y = b (1 + x + z), z = c (1 + x + y) as M p = (a, b, c).
void SolveByInverse(const float m[9], const float rhs[3], float out[3]) {
  const float c00 = m[4] * m[8] - m[5] * m[7];
  const float c01 = m[5] * m[6] - m[3] * m[8];
  const float c02 = m[3] * m[7] - m[4] * m[6];
  const float invDet = 1.0f / (m[0] * c00 + m[1] * c01 + m[2] * c02);
  const float inv[9] = {
      c00 * invDet, (m[2] * m[7] - m[1] * m[8]) * invDet, (m[1] * m[5] - m[2] * m[4]) * invDet,
      c01 * invDet, (m[0] * m[8] - m[2] * m[6]) * invDet, (m[2] * m[3] - m[0] * m[5]) * invDet,
      c02 * invDet, (m[1] * m[6] - m[0] * m[7]) * invDet, (m[0] * m[4] - m[1] * m[3]) * invDet};
  for (int r = 0; r < 3; ++r) {
    out[r] = inv[r * 3] * rhs[0] + inv[r * 3 + 1] * rhs[1] + inv[r * 3 + 2] * rhs[2];
  }
}

void SolveByElimination(const float m[9], const float rhs[3], float out[3]) {
  float a[3][4];
  for (int r = 0; r < 3; ++r) {
    for (int c = 0; c < 3; ++c) a[r][c] = m[r * 3 + c];
    a[r][3] = rhs[r];
  }
  for (int col = 0; col < 3; ++col) {
    int pivot = col;
    for (int r = col + 1; r < 3; ++r) {
      if (std::fabs(a[r][col]) > std::fabs(a[pivot][col])) pivot = r;
    }
    if (pivot != col) std::swap(a[pivot], a[col]);
    for (int r = col + 1; r < 3; ++r) {
      const float f = a[r][col] / a[col][col];
      for (int c = col; c < 4; ++c) a[r][c] -= f * a[col][c];
    }
  }
  for (int r = 2; r >= 0; --r) {
    float s = a[r][3];
    for (int c = r + 1; c < 3; ++c) s -= a[r][c] * out[c];
    out[r] = s / a[r][r];
  }
}

float TanOf(float a) { return static_cast<float>(std::tan(static_cast<double>(a))); }

}  // namespace

OctaMap::OctaMap(std::int32_t level, bool useEliminationSolve)
    : level_(level), size_((1 << (level + 1)) + 1), useEliminationSolve_(useEliminationSolve) {
  points_.resize(static_cast<std::size_t>(size_) * size_ * 3);
  for (std::int32_t j = 0; j < size_; ++j) {
    for (std::int32_t i = 0; i < size_; ++i) {
      BuildVertex(i, j, &points_[(static_cast<std::size_t>(j) * size_ + i) * 3]);
    }
  }
}

void OctaMap::BuildVertex(std::int32_t i, std::int32_t j, float out[3]) const {
  const std::int32_t h = Half();
  const Triangle& t = kTriangles[TriangleOf(i, j, h)];
  // Barycentric weights of (i, j) in the triangle, exact in integers up to
  // the final division.
  const std::int32_t ax = t.ci[0] * h, ay = t.cj[0] * h;
  const std::int32_t bx = t.ci[1] * h - ax, by = t.cj[1] * h - ay;
  const std::int32_t cx = t.ci[2] * h - ax, cy = t.cj[2] * h - ay;
  const std::int32_t px = i - ax, py = j - ay;
  const float det = static_cast<float>(bx * cy - by * cx);
  const float wb = static_cast<float>(px * cy - py * cx) / det;
  const float wc = static_cast<float>(bx * py - by * px) / det;
  const float weights[3] = {1.0f - wb - wc, wb, wc};
  float tangents[3] = {0, 0, 0};
  for (int k = 0; k < 3; ++k) tangents[t.axis[k]] = TanOf(weights[k] * kQuarterPi);
  const float a = tangents[0], b = tangents[1], c = tangents[2];
  const float m[9] = {1, -a, -a, -b, 1, -b, -c, -c, 1};
  float p[3];
  if (useEliminationSolve_) {
    SolveByElimination(m, tangents, p);
  } else {
    SolveByInverse(m, tangents, p);
  }
  for (int k = 0; k < 3; ++k) out[k] = std::fabs(p[k]) * t.sign[k];
}

void OctaMap::PointToDirection(const float p[3], float& outLat, float& outLon) {
  const float z = std::fmax(-1.0f, std::fmin(1.0f, p[2]));
  outLat = static_cast<float>(1.5707963267948966 - std::acos(static_cast<double>(z)));
  if (std::fabs(p[0]) < 1e-8f && std::fabs(p[1]) < 1e-8f) {
    outLon = 0.0f;
  } else {
    outLon = static_cast<float>(std::atan2(static_cast<double>(p[1]), static_cast<double>(p[0])));
  }
}

void OctaMap::GetPoint(std::int32_t i, std::int32_t j, float out[3]) const {
  const float* p = &points_[(static_cast<std::size_t>(j) * size_ + i) * 3];
  out[0] = p[0];
  out[1] = p[1];
  out[2] = p[2];
}

bool OctaMap::SplitsAlongMainDiagonal(std::int32_t i, std::int32_t j) const {
  const auto squared = [this](std::int32_t i0, std::int32_t j0, std::int32_t i1, std::int32_t j1) {
    const float* a = &points_[(static_cast<std::size_t>(j0) * size_ + i0) * 3];
    const float* b = &points_[(static_cast<std::size_t>(j1) * size_ + i1) * 3];
    double sum = 0.0;
    for (int k = 0; k < 3; ++k) sum += (double(a[k]) - b[k]) * (double(a[k]) - b[k]);
    return sum;
  };
  return squared(i, j, i + 1, j + 1) <= squared(i + 1, j, i, j + 1);
}

void OctaMap::Rotate(const float in[3], float out[3]) const {
  for (int r = 0; r < 3; ++r) {
    out[r] = rotation_[r * 3] * in[0] + rotation_[r * 3 + 1] * in[1] + rotation_[r * 3 + 2] * in[2];
  }
}

void OctaMap::GetRotatedPoint(std::int32_t i, std::int32_t j, float out[3]) const {
  float p[3];
  GetPoint(i, j, p);
  if (hasRotation_) {
    Rotate(p, out);
  } else {
    out[0] = p[0];
    out[1] = p[1];
    out[2] = p[2];
  }
}

void OctaMap::GetDirection(std::int32_t i, std::int32_t j, float& outLat, float& outLon) const {
  float p[3];
  GetPoint(i, j, p);
  PointToDirection(p, outLat, outLon);
}

void OctaMap::GetRotatedDirection(std::int32_t i, std::int32_t j, float& outLat,
                                  float& outLon) const {
  float p[3];
  GetRotatedPoint(i, j, p);
  PointToDirection(p, outLat, outLon);
}

void OctaMap::GetTangentFrame(std::int32_t i, std::int32_t j, float outEast[3],
                              float outNorth[3]) const {
  float lat, lon;
  GetRotatedDirection(i, j, lat, lon);
  const double sLat = std::sin(lat), cLat = std::cos(lat);
  const double sLon = std::sin(lon), cLon = std::cos(lon);
  outEast[0] = static_cast<float>(-sLon);
  outEast[1] = static_cast<float>(cLon);
  outEast[2] = 0.0f;
  outNorth[0] = static_cast<float>(-sLat * cLon);
  outNorth[1] = static_cast<float>(-sLat * sLon);
  outNorth[2] = static_cast<float>(cLat);
}

void OctaMap::SetRotation(const float rotation[9]) {
  for (int k = 0; k < 9; ++k) rotation_[k] = rotation[k];
  hasRotation_ = true;
}

OctaMap::Cell OctaMap::NeighbourCell(Cell cell, std::int32_t side) const {
  const std::int32_t last = size_ - 2;  // the last cell index
  const std::int32_t mirror = 2 * Half() - 1;
  switch (side) {
    case 0:
      if (cell.j == 0) return {mirror - cell.i, cell.j};
      return {cell.i, cell.j - 1};
    case 1:
      if (cell.i == last) return {cell.i, mirror - cell.j};
      return {cell.i + 1, cell.j};
    case 2:
      if (cell.j == last) return {mirror - cell.i, cell.j};
      return {cell.i, cell.j + 1};
    case 3:
      if (cell.i == 0) return {cell.i, mirror - cell.j};
      return {cell.i - 1, cell.j};
    default:
      return cell;
  }
}

}  // namespace Project
