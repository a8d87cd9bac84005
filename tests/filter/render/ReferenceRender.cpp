#include "tests/filter/render/ReferenceRender.h"

#include <algorithm>
#include <array>

#include "solver/frame/Solver.h"

namespace Project::testing {

namespace {

struct Vertex {
  double x, y;  // result pixels
  double u, v;  // source pixels
};

double CatmullRom(double t, int k) {
  const double t2 = t * t, t3 = t2 * t;
  switch (k) {
    case 0:
      return -0.5 * t3 + t2 - 0.5 * t;
    case 1:
      return 1.5 * t3 - 2.5 * t2 + 1.0;
    case 2:
      return -1.5 * t3 + 2.0 * t2 + 0.5 * t;
    default:
      return 0.5 * t3 - 0.5 * t2;
  }
}

}  // namespace

ReferenceImage RenderReference(
    const Solver& solver, std::int32_t width, std::int32_t height, std::int32_t planes,
    const std::function<double(std::int32_t, std::int32_t, std::int32_t)>& source) {
  ReferenceImage image;
  image.width = width;
  image.height = height;
  image.planes = planes;
  const std::size_t pixels = std::size_t(width) * std::size_t(height);
  image.values.assign(pixels * std::size_t(planes), 0.0);
  image.sourceX.assign(pixels, NAN);
  image.sourceY.assign(pixels, NAN);

  // The plane's view: the fitted box about its centre, y upwards.
  const BoxFit fit = solver.FitBox(0);
  const double originX = 0.5 * (fit.fitLeft + fit.fitRight);
  const double originY = 0.5 * (fit.fitBottom + fit.fitTop);
  const std::int32_t n = solver.GridSize();
  const auto vertex = [&](std::int32_t i, std::int32_t j) {
    const std::size_t at = (std::size_t(j) * std::size_t(n) + std::size_t(i)) * 2;
    const float* p = &solver.Positions()[at];
    const float* t = &solver.TexCoords()[at];
    return Vertex{(p[0] - originX) / fit.viewWidth * width + 0.5 * width,
                  (originY - p[1]) / fit.viewHeight * height + 0.5 * height, t[0] * width,
                  (1.0 - t[1]) * height};
  };

  const auto sample = [&](std::int32_t plane, double sx, double sy) {
    // Texel centres at whole numbers; fetches beyond the edge take the edge.
    const double px = sx - 0.5, py = sy - 0.5;
    const double bx = std::floor(px), by = std::floor(py);
    double sum = 0;
    for (int j = 0; j < 4; ++j) {
      const auto y = std::int32_t(std::clamp(by + j - 1, 0.0, double(height - 1)));
      double row = 0;
      for (int i = 0; i < 4; ++i) {
        const auto x = std::int32_t(std::clamp(bx + i - 1, 0.0, double(width - 1)));
        row += CatmullRom(px - bx, i) * source(plane, x, y);
      }
      sum += CatmullRom(py - by, j) * row;
    }
    return std::clamp(sum, 0.0, 1.0);
  };

  const auto fill = [&](const Vertex& a, const Vertex& b, const Vertex& c) {
    const double area = (b.x - a.x) * (c.y - a.y) - (c.x - a.x) * (b.y - a.y);
    if (area == 0) return;
    const auto x0 = std::int32_t(std::max(0.0, std::floor(std::min({a.x, b.x, c.x}))));
    const auto x1 = std::int32_t(std::min(double(width - 1), std::ceil(std::max({a.x, b.x, c.x}))));
    const auto y0 = std::int32_t(std::max(0.0, std::floor(std::min({a.y, b.y, c.y}))));
    const auto y1 =
        std::int32_t(std::min(double(height - 1), std::ceil(std::max({a.y, b.y, c.y}))));
    for (std::int32_t y = y0; y <= y1; ++y) {
      for (std::int32_t x = x0; x <= x1; ++x) {
        const double px = x + 0.5, py = y + 0.5;
        const double wa = ((b.x - px) * (c.y - py) - (c.x - px) * (b.y - py)) / area;
        const double wb = ((c.x - px) * (a.y - py) - (a.x - px) * (c.y - py)) / area;
        const double wc = 1.0 - wa - wb;
        if (wa < 0 || wb < 0 || wc < 0) continue;
        const double sx = wa * a.u + wb * b.u + wc * c.u;
        const double sy = wa * a.v + wb * b.v + wc * c.v;
        const std::size_t at = image.Index(x, y);
        image.sourceX[at] = sx;
        image.sourceY[at] = sy;
        const bool inside = sx >= 0 && sx <= width && sy >= 0 && sy <= height;
        for (std::int32_t p = 0; p < planes; ++p)
          image.values[std::size_t(p) * pixels + at] = inside ? sample(p, sx, sy) : 0.0;
      }
    }
  };

  const OctaMap& sphere = *solver.GetOctaMap();
  for (std::int32_t j = 0; j < solver.CellCount(); ++j) {
    for (std::int32_t i = 0; i < solver.CellCount(); ++i) {
      if (!solver.IsCellInMask(i, j)) continue;
      const Vertex v00 = vertex(i, j), v10 = vertex(i + 1, j);
      const Vertex v01 = vertex(i, j + 1), v11 = vertex(i + 1, j + 1);
      float a[3], b[3], p[3], q[3];
      sphere.GetPoint(i, j, a);
      sphere.GetPoint(i + 1, j + 1, b);
      sphere.GetPoint(i + 1, j, p);
      sphere.GetPoint(i, j + 1, q);
      double d1 = 0, d2 = 0;
      for (int k = 0; k < 3; ++k) {
        d1 += double(a[k] - b[k]) * double(a[k] - b[k]);
        d2 += double(p[k] - q[k]) * double(p[k] - q[k]);
      }
      if (d1 > d2) {
        fill(v00, v01, v10);
        fill(v01, v11, v10);
      } else {
        fill(v00, v01, v11);
        fill(v00, v10, v11);
      }
    }
  }
  return image;
}

}  // namespace Project::testing
