#include "workspace/MeshPainter.h"

#include <vector>

#include "framework/view/CPath.h"
#include "solver/frame/Solver.h"

namespace Project {

void DrawMesh(const ConstraintEnv& env, Tarsa::CPort& port, const ScreenTransform& screen,
              std::uint32_t argb) {
  const Solver& solver = env.solver;
  const std::int32_t n = solver.GridSize();
  const std::int32_t cells = solver.CellCount();
  const std::int32_t mode = env.ShowsResult() ? 1 : 0;
  const std::vector<float>& vertices = mode == 1 ? solver.Positions() : solver.TexCoords();
  if (n < 2 || vertices.size() < std::size_t(n) * std::size_t(n) * 2) return;

  // Each vertex into the window once; a cell's outline reads four of them.
  std::vector<Tarsa::CPointF> window(std::size_t(n) * std::size_t(n));
  for (std::size_t k = 0; k < window.size(); ++k) {
    float view[2];
    solver.PlaneToView(&vertices[k * 2], view, mode);
    const Point2f p = screen.Apply({view[0], view[1]});
    window[k] = {p.x, p.y};
  }
  const auto at = [&](std::int32_t i, std::int32_t j) {
    return window[std::size_t(j) * std::size_t(n) + std::size_t(i)];
  };
  Tarsa::CPath path;
  for (std::int32_t j = 0; j < cells; ++j) {
    for (std::int32_t i = 0; i < cells; ++i) {
      if (!solver.IsCellInMask(i, j)) continue;
      const Tarsa::CPointF outline[] = {at(i, j), at(i, j + 1), at(i + 1, j + 1), at(i + 1, j)};
      path.AddPolyline(outline, true);
    }
  }
  port.StrokePath(path, {argb | 0xFF000000u, 1.0, {}, 0.0});
}

}  // namespace Project
