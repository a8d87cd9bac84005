#include "tests/support/ReferenceRender.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "lens/sphere/PhotoToSphere.h"
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
  image.covered.assign(pixels, 0.0);

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

  // The model's cover circle in source pixels, when it has one.
  float centreUv[2], radius = 0;
  const bool circle = solver.GetImageModel()->CoverCircle(centreUv, radius);
  const double cx = centreUv[0] * width, cy = (1.0 - centreUv[1]) * height;
  const double r = double(radius) * width / solver.GetImageModel()->GetImage()->width;
  // The covered share of the pixel at source point (sx, sy), the source
  // moving by alongX and alongY per result pixel: the distance to the
  // nearest edge (frame or circle) in result pixels, each edge's distance
  // over the source's step across it, plus a half, within 0..1, as the
  // shader takes it.
  const auto coveredShare = [&](double sx, double sy, std::array<double, 2> alongX,
                                std::array<double, 2> alongY) {
    double inside = 1e300;
    // An edge at distance d (source pixels), (dx, dy) the unit step inwards.
    const auto take = [&](double d, double dx, double dy) {
      const double step =
          std::hypot(dx * alongX[0] + dy * alongX[1], dx * alongY[0] + dy * alongY[1]);
      inside = std::min(inside, d / std::max(step, 1e-6));
    };
    take(sx, 1, 0);
    take(width - sx, -1, 0);
    take(sy, 0, 1);
    take(height - sy, 0, -1);
    if (circle) {
      const double off = std::hypot(sx - cx, sy - cy);
      if (off > 0) take(r - off, -(sx - cx) / off, -(sy - cy) / off);
    }
    return std::clamp(0.5 + inside, 0.0, 1.0);
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
        // The weights' steps per result pixel in x and in y.
        const double dwb[2] = {(c.y - a.y) / area, (a.x - c.x) / area};
        const double dwc[2] = {(a.y - b.y) / area, (b.x - a.x) / area};
        const double wa = ((b.x - px) * (c.y - py) - (c.x - px) * (b.y - py)) / area;
        const double wb = ((c.x - px) * (a.y - py) - (a.x - px) * (c.y - py)) / area;
        const double wc = 1.0 - wa - wb;
        if (wa < 0 || wb < 0 || wc < 0) continue;
        const double sx = wa * a.u + wb * b.u + wc * c.u;
        const double sy = wa * a.v + wb * b.v + wc * c.v;
        const std::size_t at = image.Index(x, y);
        image.sourceX[at] = sx;
        image.sourceY[at] = sy;
        const double share = coveredShare(sx, sy,
                                          {(b.u - a.u) * dwb[0] + (c.u - a.u) * dwc[0],
                                           (b.v - a.v) * dwb[0] + (c.v - a.v) * dwc[0]},
                                          {(b.u - a.u) * dwb[1] + (c.u - a.u) * dwc[1],
                                           (b.v - a.v) * dwb[1] + (c.v - a.v) * dwc[1]});
        image.covered[at] = share;
        for (std::int32_t p = 0; p < planes; ++p)
          image.values[std::size_t(p) * pixels + at] = share > 0 ? sample(p, sx, sy) * share : 0.0;
      }
    }
  };

  const OctaMap& sphere = *solver.GetOctaMap();
  for (std::int32_t j = 0; j < solver.CellCount(); ++j) {
    for (std::int32_t i = 0; i < solver.CellCount(); ++i) {
      if (!solver.IsCellInMask(i, j)) continue;
      const Vertex v00 = vertex(i, j), v10 = vertex(i + 1, j);
      const Vertex v01 = vertex(i, j + 1), v11 = vertex(i + 1, j + 1);
      if (sphere.SplitsAlongMainDiagonal(i, j)) {
        fill(v00, v01, v11);
        fill(v00, v10, v11);
      } else {
        fill(v00, v01, v10);
        fill(v01, v11, v10);
      }
    }
  }
  return image;
}

}  // namespace Project::testing
