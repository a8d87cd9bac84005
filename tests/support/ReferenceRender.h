#pragma once

#include <cmath>
#include <cstdint>
#include <functional>
#include <vector>

namespace Project {
class Solver;
}

namespace Project::testing {

// The result of a solved mesh drawn on the CPU, whole, as an independent
// answer for the tiled GPU rendering: each cell's two triangles (split along
// the diagonal the grid names, as the program does) are rasterised at
// pixel centres, texture coordinates are interpolated barycentrically, and
// the source is resampled with a Catmull-Rom bicubic. Points outside the
// picture, or past the camera model's cover circle, are transparent: every
// plane 0; a pixel on either edge is scaled by its covered share, as the
// shader does for a picture without transparency.
struct ReferenceImage {
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::int32_t planes = 0;
  std::vector<double> values;   // plane-major, 0..1
  std::vector<double> sourceX;  // the source point in pixels; NaN where no cell is drawn
  std::vector<double> sourceY;
  std::vector<double> covered;  // the share inside the picture and the cover: 1 well inside

  std::size_t Index(std::int32_t x, std::int32_t y) const {
    return std::size_t(y) * std::size_t(width) + std::size_t(x);
  }
  double Value(std::int32_t plane, std::int32_t x, std::int32_t y) const {
    return values[std::size_t(plane) * std::size_t(width) * std::size_t(height) + Index(x, y)];
  }
  bool Covered(std::int32_t x, std::int32_t y) const { return !std::isnan(sourceX[Index(x, y)]); }
};

// source(plane, x, y): the source sample in 0..1, for (x, y) inside the
// picture. The result has the source's size, as a full result does.
ReferenceImage RenderReference(
    const Solver& solver, std::int32_t width, std::int32_t height, std::int32_t planes,
    const std::function<double(std::int32_t, std::int32_t, std::int32_t)>& source);

}  // namespace Project::testing
