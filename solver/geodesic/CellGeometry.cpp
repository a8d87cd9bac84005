#include "solver/geodesic/CellGeometry.h"

#include <cmath>

namespace Project {

namespace {

struct P2 {
  double x;
  double y;
};

P2 Corner(const float corners[8], int k) { return {corners[2 * k], corners[2 * k + 1]}; }
P2 Sub(P2 a, P2 b) { return {a.x - b.x, a.y - b.y}; }
double Cross(P2 a, P2 b) { return a.x * b.y - a.y * b.x; }

// Barycentric weights of p in the triangle (a, b, c), taken about c.
void Barycentric(P2 a, P2 b, P2 c, P2 p, double& wa, double& wb, double& wc) {
  const P2 ca = Sub(a, c);
  const P2 cb = Sub(b, c);
  const P2 cp = Sub(p, c);
  const double det = Cross(ca, cb);
  wa = Cross(cp, cb) / det;
  wb = Cross(ca, cp) / det;
  wc = 1.0 - wa - wb;
}

}  // namespace

bool PointInQuad(const float corners[8], float x, float y) {
  int crossings = 0;
  for (int k = 0; k < 4; ++k) {
    const P2 a = Corner(corners, k);
    const P2 b = Corner(corners, (k + 1) % 4);
    if (a.y == b.y) continue;
    const double f = (y - a.y) / (b.y - a.y);
    if (f < 0.0 || f >= 1.0) continue;
    if (a.x + f * (b.x - a.x) >= x) ++crossings;
  }
  if (crossings % 2 == 0) return false;
  int highest = 0;
  int lowest = 0;
  for (int k = 1; k < 4; ++k) {
    if (corners[2 * k + 1] > corners[2 * highest + 1]) highest = k;
    if (corners[2 * k + 1] < corners[2 * lowest + 1]) lowest = k;
  }
  if (y == corners[2 * highest + 1]) return x == corners[2 * highest];
  if (y == corners[2 * lowest + 1]) return x == corners[2 * lowest];
  return true;
}

void BilinearWeights(const float corners[8], float x, float y, float outWeights[4]) {
  const P2 p0 = Corner(corners, 0);
  const P2 p1 = Corner(corners, 1);
  const P2 p2 = Corner(corners, 2);
  const P2 p3 = Corner(corners, 3);
  const P2 e = Sub(p1, p0);
  const P2 f = Sub(p3, p0);
  const P2 g = {p0.x - p1.x + p2.x - p3.x, p0.y - p1.y + p2.y - p3.y};
  const P2 h = Sub({x, y}, p0);
  // a s^2 + b s + c = 0, solved in the form that keeps its precision when a
  // is small (a parallelogram has a = 0).
  const double a = e.y * g.x - e.x * g.y;
  const double b = g.y * h.x - g.x * h.y + f.x * e.y - f.y * e.x;
  const double c = f.y * h.x - f.x * h.y;
  const double sign = b < 0.0 ? -1.0 : 1.0;
  const double q = -0.5 * (b + sign * std::sqrt(b * b - 4.0 * a * c));
  double s = c / q;
  if (!(s >= 0.0 && s <= 1.0)) s = q / a;
  const double dx = g.x * s + f.x;
  const double dy = g.y * s + f.y;
  const double t = std::fabs(dx) > std::fabs(dy) ? (h.x - e.x * s) / dx : (h.y - e.y * s) / dy;
  outWeights[0] = static_cast<float>((1.0 - s) * (1.0 - t));
  outWeights[1] = static_cast<float>(s * (1.0 - t));
  outWeights[2] = static_cast<float>(s * t);
  outWeights[3] = static_cast<float>((1.0 - s) * t);
}

void TriangleWeights(const float corners[8], float x, float y, bool mainDiagonal,
                     float outWeights[4]) {
  const P2 p[4] = {Corner(corners, 0), Corner(corners, 1), Corner(corners, 2), Corner(corners, 3)};
  const P2 point = {x, y};
  // (p0, p1, p2) and (p0, p2, p3), or (p0, p1, p3) and (p1, p2, p3).
  const bool alongFirst = mainDiagonal;
  const int third = alongFirst ? 2 : 3;
  double w0, w1, w2;
  Barycentric(p[0], p[1], p[third], point, w0, w1, w2);
  if (w0 >= 0.0 && w1 >= 0.0 && w2 >= 0.0) {
    outWeights[0] = static_cast<float>(w0);
    outWeights[1] = static_cast<float>(w1);
    outWeights[third] = static_cast<float>(w2);
    outWeights[5 - third] = 0.0f;
    return;
  }
  const int first = alongFirst ? 0 : 1;
  Barycentric(p[first], p[2], p[3], point, w0, w1, w2);
  outWeights[first] = static_cast<float>(w0);
  outWeights[1 - first] = 0.0f;
  outWeights[2] = static_cast<float>(w1);
  outWeights[3] = static_cast<float>(w2);
}

}  // namespace Project
