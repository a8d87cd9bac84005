#pragma once

namespace Project {

// The plane geometry of one grid cell: its four corners, in the order
// (i, j), (i + 1, j), (i + 1, j + 1), (i, j + 1), as eight floats x0, y0 to
// x3, y3, in the photograph or in the result plane. Pure functions; the
// arithmetic is done in double on the single-precision corners.

// Whether (x, y) lies in the quad, by a crossing count over its four edges.
// A point level with the highest or the lowest corner counts only when it is
// that corner, so that a point on a shared horizontal edge is claimed once.
bool PointInQuad(const float corners[8], float x, float y);

// The inverse of bilinear interpolation: weights on the four corners whose
// weighted sum is (x, y), of the form (1 - s)(1 - t), s (1 - t), s t,
// (1 - s) t.
void BilinearWeights(const float corners[8], float x, float y, float outWeights[4]);

// Barycentric weights in the cell split into two triangles, along the
// diagonal from corner 0 to corner 2 when mainDiagonal, else from corner 1
// to corner 3 (OctaMap::SplitsAlongMainDiagonal says which): three weights
// in the triangle that holds the point, the fourth corner 0.
void TriangleWeights(const float corners[8], float x, float y, bool mainDiagonal,
                     float outWeights[4]);

}  // namespace Project
