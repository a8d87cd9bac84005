// The quad finder at the default mesh (level 6, 129 x 129 vertices) against
// a plain serial scan of the same cells, in the same order, with the same
// point-in-cell test, measured side by side in each iteration. Points are
// cell centres near the top, middle and bottom of the mesh, and a miss, in
// the photograph (mode 0) and in the result plane (mode 1). The counter
// "speedup" is serial time over parallel time.

#include <benchmark/benchmark.h>

#include <chrono>
#include <memory>

#include "lens/sphere/FisheyeImage.h"
#include "solver/geodesic/GeodesicLines.h"
#include "solver/warp/ClosedFormWarp.h"

namespace Project {
namespace {

using Cell = OctaMap::Cell;
using Clock = std::chrono::steady_clock;

struct Scene {
  std::shared_ptr<const OctaMap> map = std::make_shared<const OctaMap>(6, false);
  std::shared_ptr<const PhotoToSphere> model = std::make_shared<FisheyeImage>(
      std::make_shared<const Image>(1000, 750), 300.0f, 500.0f, 375.0f);
  std::unique_ptr<ClosedFormWarp> warp = MakeClosedFormWarp(1, map, model);
  GeodesicLines lines{map, model, false};
  Scene() { lines.SetWarp(warp.get()); }
};

// The finder's cells (the first 16 bands' rows) in its order, one thread.
bool SerialFind(const Scene& scene, const float point[2], std::int32_t mode, Cell& outCell) {
  const std::int32_t cells = scene.map->Width() - 1;
  const std::int32_t rows = cells / 16 * 16;
  for (std::int32_t j = 0; j < rows; ++j) {
    for (std::int32_t i = 0; i < cells; ++i) {
      if (scene.warp->IsQuadInside(i, j) && scene.lines.IsPointInCell(point, {i, j}, mode)) {
        outCell = {i, j};
        return true;
      }
    }
  }
  outCell = Cell{};
  return false;
}

// The centre of the middle visible cell of the first visible row (place 0),
// of the view axis's cell (1), of the last visible row (2), or a point off
// the mesh (3).
void PlacePoint(const Scene& scene, std::int64_t place, std::int32_t mode, float out[2]) {
  if (place == 3) {
    out[0] = out[1] = 5.0f;
    return;
  }
  const std::int32_t cells = scene.map->Width() - 1;
  const std::int32_t h = scene.map->Half();
  std::int32_t row = h;
  if (place != 1) {
    for (std::int32_t j = 0; j < cells; ++j) {
      if (!scene.lines.IsCellVisible(h, j)) continue;
      row = j;
      if (place == 0) break;
    }
  }
  float corners[8];
  scene.lines.GetCellCorners(h, row, mode, corners);
  out[0] = 0.25f * (corners[0] + corners[2] + corners[4] + corners[6]);
  out[1] = 0.25f * (corners[1] + corners[3] + corners[5] + corners[7]);
}

void BM_FindCell(benchmark::State& state) {
  const Scene scene;
  const auto mode = static_cast<std::int32_t>(state.range(0));
  float point[2];
  PlacePoint(scene, state.range(1), mode, point);
  Cell parallelCell, serialCell;
  const bool found = scene.lines.FindCell(point, parallelCell, mode);
  if (found != SerialFind(scene, point, mode, serialCell) || !(parallelCell == serialCell)) {
    state.SkipWithError("the finder and the serial scan disagree");
    return;
  }
  double parallelSeconds = 0.0, serialSeconds = 0.0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    benchmark::DoNotOptimize(scene.lines.FindCell(point, parallelCell, mode));
    const auto t1 = Clock::now();
    benchmark::DoNotOptimize(SerialFind(scene, point, mode, serialCell));
    const auto t2 = Clock::now();
    const double parallel = std::chrono::duration<double>(t1 - t0).count();
    parallelSeconds += parallel;
    serialSeconds += std::chrono::duration<double>(t2 - t1).count();
    state.SetIterationTime(parallel);
  }
  const double iterations = static_cast<double>(state.iterations());
  state.counters["found"] = found ? 1.0 : 0.0;
  state.counters["parallel_us"] = parallelSeconds / iterations * 1e6;
  state.counters["serial_us"] = serialSeconds / iterations * 1e6;
  state.counters["speedup"] = serialSeconds / parallelSeconds;
}
BENCHMARK(BM_FindCell)
    ->ArgNames({"mode", "place"})
    ->ArgsProduct({{0, 1}, {0, 1, 2, 3}})
    ->UseManualTime()
    ->Unit(benchmark::kMicrosecond);

}  // namespace
}  // namespace Project
