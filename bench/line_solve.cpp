// The whole line solve on a generated photograph (the room through a
// fisheye, 1200 x 800, default settings): one Solve of the solver hub after
// lines were added to the plainly solved mesh, as after an edit. Each
// benchmark runs a variant and a baseline side by side in every iteration
// and reports the ratio of their median times ("vs_..."), so that the noise
// of a shared machine falls on both.
//
// Counters, per timed solve (medians over the iterations): total and per
// iteration milliseconds; where the time went (constant part, Gauss-Newton
// preparation, iteration assembly, ordering, factorisation, triangular
// solves, and the rest: rotation, mesh collection, the constraints' shown
// forms); the peak resident memory the solve added (the kernel's high-water
// mark, reset before it) and the sparse library's own peak. BM_Roads sets
// the kept-factor road against factoring every system, at mesh levels 5 to
// 8, and reports how far the two meshes lie apart. BM_Quality solves more
// scenes once each and reports how straight the lines end and how conformal
// the rest stays.
#include <benchmark/benchmark.h>

#include <malloc.h>
#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

#include "bench/BenchSupport.h"
#include "solver/iterative/IterativeWarpSolver.h"
#include "solver/iterative/LineSolve.h"
#include "tests/support/QualityMeasures.h"

namespace {

using Project::bench::Median;
using Project::bench::ResetPeak;
using Project::bench::StatusKb;

using namespace Project;
using namespace Project::testing;

CameraCase TimingCase() {
  return {"room-fisheye", Synth::SceneKind::kRoom, LensKind::kFisheye, 400.0, 1200, 800, 0.0, 0.0};
}

struct Variant {
  std::size_t lines = 10;
  std::int32_t level = 6;
  bool gaussNewton = true;
  bool cacheOrder = false;
  // The default road, or part by part the road before it: line rows from
  // the first sample, and the solve choices off.
  SolveChoices choices;
  LineForm form = LineForm::kOffset;
  // Time the edit that adds the last line to the others, solved already,
  // rather than the solve of all of them on the plain mesh.
  bool edit = false;
  // Time a drag instead: the last line's end moved a few pixels, back and
  // forth, each time solved again.
  bool drag = false;
};

struct Timing {
  double seconds = 0.0;
  std::int32_t iterations = 0;
  SolveProfile profile;
  double peakMiB = 0.0;
};

// The drag's step in photograph pixels, about what a mouse moves between
// two previews.
constexpr float kDragPixels = 3.0f;

// A scene of one variant: its lines, and a timed solve after putting them
// back on the plainly solved mesh, or after adding the last of them.
class Bench {
 public:
  explicit Bench(const Variant& variant)
      : scene_(TimingCase(),
               [&](PSettings& s) {
                 s.meshResolution = variant.level;
                 s.gaussNewtonSolver = variant.gaussNewton ? 1 : 0;
                 s.cacheDssPermutation = variant.cacheOrder ? 1 : 0;
               }),
        edit_(variant.edit),
        drag_(variant.drag),
        choices_(variant.choices),
        form_(variant.form) {
    lines_ = scene_.Pick(variant.lines, true);
    if (edit_ || drag_) {
      // The line added is a free one: it leaves the verticals, and so the
      // grid's rotation, as they were.
      const auto free = std::find_if(lines_.rbegin(), lines_.rend(), [](const PickedLine& line) {
        return line.orientation == LineConstraint::kUnfixed;
      });
      if (free != lines_.rend()) std::swap(*free, lines_.back());
    }
  }

  Timing Run() {
    Warp();
    if (drag_ && !lines_.empty()) {
      if (!solvedBefore_) {
        scene_.AddLines(lines_);
        scene_.solver().Solve(true, false);
        solvedBefore_ = true;
      }
      const PickedLine& last = lines_.back();
      if (const Constraint* line = scene_.list.Find(last.constraintId)) {
        const auto& moved = dynamic_cast<const LineConstraint&>(*line);
        Point2f end = moved.GetEnd();
        end.y += (++drags_ % 2 == 1 ? kDragPixels : -kDragPixels) /
                 static_cast<float>(scene_.context.SourceHeight());
        LineConstraint shape(moved.GetStart(), end);
        scene_.list.Replace(last.constraintId, shape);
      }
    } else if (edit_ && !lines_.empty()) {
      if (!solvedBefore_) {
        std::vector<PickedLine> before(lines_.begin(), lines_.end() - 1);
        scene_.AddLines(before);
        solvedBefore_ = true;
      } else if (const Constraint* last = scene_.list.Find(lines_.back().constraintId)) {
        scene_.list.Remove(*last);
      }
      scene_.solver().Solve(true, false);
      std::vector<PickedLine> added(lines_.end() - 1, lines_.end());
      scene_.AddLines(added);
      lines_.back() = added.front();
    } else {
      scene_.RemoveAll();
      scene_.solver().Solve(true, false);
      scene_.AddLines(lines_);
    }
    IterativeWarpSolver* warp = Warp();
    warp->ClearProfile();
    malloc_trim(0);
    ResetPeak();
    const double before = StatusKb("VmRSS:");
    const auto start = std::chrono::steady_clock::now();
    scene_.solver().Solve(true, false);
    Timing timing;
    timing.seconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    timing.peakMiB = (StatusKb("VmHWM:") - before) / 1024.0;
    timing.profile = warp->Profile();
    timing.iterations = warp->IterationsRun();
    return timing;
  }

  std::size_t LineCount() const { return lines_.size(); }
  bool Failed() const { return scene_.context.failures != 0; }

  // The largest distance between this mesh and the other's, in pixels of an
  // output of the photograph's width that shows the whole mesh.
  double MaxMovePixels(Bench& other) {
    Solver& solver = scene_.solver();
    const std::vector<float>& a = solver.Positions();
    const std::vector<float>& b = other.scene_.solver().Positions();
    if (a.size() != b.size()) return -1.0;
    double worst = 0.0;
    const std::int32_t n = solver.GridSize();
    for (std::int32_t j = 0; j < n; ++j) {
      for (std::int32_t i = 0; i < n; ++i) {
        if (!solver.GetWarp()->IsVertexInside(i, j)) continue;
        const std::size_t at = (static_cast<std::size_t>(j) * n + i) * 2;
        worst = std::max(worst, std::hypot(double(a[at]) - b[at], double(a[at + 1]) - b[at + 1]));
      }
    }
    return worst * scene_.context.SourceWidth() / solver.FitBox(1).viewWidth;
  }

 private:
  // The solver's warp, on this bench's road.
  IterativeWarpSolver* Warp() {
    auto* warp = dynamic_cast<LineSolve*>(scene_.solver().GetWarp().get());
    warp->SetSolveChoices(choices_);
    warp->SetLineForm(form_);
    return warp;
  }

  QualityScene scene_;
  std::vector<PickedLine> lines_;
  bool edit_;
  bool drag_;
  SolveChoices choices_;
  LineForm form_;
  bool solvedBefore_ = false;
  std::int32_t drags_ = 0;
};

// Runs the variant and the baseline alternately, times the variant, and
// reports medians and their ratio under the name `ratio`.
void RunPair(benchmark::State& state, const Variant& variant, const Variant& baseline,
             const char* ratio) {
  Bench bench(variant);
  Bench base(baseline);
  std::vector<double> total, perIteration, constant, prepare, assembly, analyse, factor, solve,
      rest, peak, library, baseTotal, iterations, factorizations, gradientSteps, basePerIteration,
      basePeak, move;
  // The two meshes are compared where both solved the same scene.
  const bool same = variant.level == baseline.level && variant.lines == baseline.lines &&
                    variant.edit == baseline.edit && variant.drag == baseline.drag;
  double factorNonzeros = 0.0, factorFlops = 0.0;
  for (auto _ : state) {
    const Timing t = bench.Run();
    const Timing b = base.Run();
    state.SetIterationTime(t.seconds);
    const SolveProfile& p = t.profile;
    total.push_back(t.seconds * 1e3);
    perIteration.push_back(t.iterations > 0 ? t.seconds * 1e3 / t.iterations : 0.0);
    iterations.push_back(t.iterations);
    constant.push_back(p.constantSeconds * 1e3);
    prepare.push_back(p.prepareSeconds * 1e3);
    assembly.push_back(p.assemblySeconds * 1e3);
    analyse.push_back(p.analyseSeconds * 1e3);
    factor.push_back(p.factorSeconds * 1e3);
    solve.push_back(p.solveSeconds * 1e3);
    rest.push_back((t.seconds - p.constantSeconds - p.prepareSeconds - p.assemblySeconds -
                    p.analyseSeconds - p.factorSeconds - p.solveSeconds) *
                   1e3);
    peak.push_back(t.peakMiB);
    library.push_back(static_cast<double>(p.peakBytes) / (1 << 20));
    factorNonzeros = p.factorNonzeros;
    factorFlops = p.factorFlops;
    baseTotal.push_back(b.seconds * 1e3);
    basePerIteration.push_back(b.iterations > 0 ? b.seconds * 1e3 / b.iterations : 0.0);
    basePeak.push_back(b.peakMiB);
    factorizations.push_back(p.factorizations);
    gradientSteps.push_back(p.gradientSteps);
    if (same) move.push_back(bench.MaxMovePixels(base));
  }
  if (bench.Failed() || base.Failed()) state.SkipWithError("a solve failed");
  state.counters["lines"] = static_cast<double>(bench.LineCount());
  state.counters["iterations"] = Median(iterations);
  state.counters["total_ms"] = Median(total);
  state.counters["per_iteration_ms"] = Median(perIteration);
  state.counters["constant_ms"] = Median(constant);
  state.counters["prepare_ms"] = Median(prepare);
  state.counters["assembly_ms"] = Median(assembly);
  state.counters["analyse_ms"] = Median(analyse);
  state.counters["factor_ms"] = Median(factor);
  state.counters["solve_ms"] = Median(solve);
  state.counters["rest_ms"] = Median(rest);
  state.counters["peak_MiB"] = Median(peak);
  state.counters["cholmod_MiB"] = Median(library);
  state.counters["factor_nnz"] = factorNonzeros;
  state.counters["factor_Mflop"] = factorFlops / 1e6;
  state.counters["baseline_ms"] = Median(baseTotal);
  state.counters["baseline_per_iteration_ms"] = Median(basePerIteration);
  state.counters["baseline_peak_MiB"] = Median(basePeak);
  state.counters["factorizations"] = Median(factorizations);
  state.counters["cg_steps"] = Median(gradientSteps);
  if (same) state.counters["max_move_px"] = *std::max_element(move.begin(), move.end());
  state.counters[ratio] = Median(total) / Median(baseTotal);
}

// The default road beside the road before it (rows from the first sample,
// every system factored afresh in the library's own order, its loops on its
// own threads), at mesh levels 5 to 8 with 0, 10 and 40 lines, and for the
// interactive edits at the default level: one line added (edit 1), one
// line's end dragged (edit 2). The fourth argument leaves one part of the
// default road out: 1 the kept factor, 2 the serial library loops, 3 the
// offset form (and with it the vertex-block order), 4 the vertex-block order.
void BM_Roads(benchmark::State& state) {
  Variant variant;
  variant.level = static_cast<std::int32_t>(state.range(0));
  variant.lines = static_cast<std::size_t>(state.range(1));
  variant.edit = state.range(2) == 1;
  variant.drag = state.range(2) == 2;
  variant.choices.keepFactor = state.range(3) != 1;
  variant.choices.serialLibraryLoops = state.range(3) != 2;
  variant.choices.vertexBlockOrder = state.range(3) != 4;
  variant.form = state.range(3) == 3 ? LineForm::kFromFirstSample : LineForm::kOffset;
  Variant baseline = variant;
  baseline.choices = {false, false, false};
  baseline.form = LineForm::kFromFirstSample;
  RunPair(state, variant, baseline, "vs_before");
}
BENCHMARK(BM_Roads)
    ->ArgNames({"level", "lines", "edit", "road"})
    ->ArgsProduct({{5, 6, 7}, {0, 10, 40}, {0}, {0}})
    ->ArgsProduct({{6}, {10, 40}, {0}, {1, 2, 3, 4}})
    ->Args({6, 10, 1, 0})
    ->Args({6, 10, 2, 0})
    ->Args({6, 40, 2, 0})
    ->Iterations(5)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Roads)
    ->ArgNames({"level", "lines", "edit", "road"})
    ->ArgsProduct({{8}, {0, 10, 40}, {0}, {0}})
    ->Iterations(1)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);

// 0, 10 and 40 lines beside the plain solve of no lines.
void BM_Lines(benchmark::State& state) {
  Variant variant;
  variant.lines = static_cast<std::size_t>(state.range(0));
  Variant baseline;
  baseline.lines = 0;
  RunPair(state, variant, baseline, "vs_no_lines");
}
BENCHMARK(BM_Lines)
    ->ArgName("lines")
    ->Arg(0)
    ->Arg(10)
    ->Arg(40)
    ->Iterations(7)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);

// One more line added to nine solved ones (the interactive edit) beside the
// solve of all ten on the plain mesh.
void BM_AddOneLine(benchmark::State& state) {
  Variant variant;
  variant.edit = true;
  RunPair(state, variant, Variant{}, "vs_all_lines");
}
BENCHMARK(BM_AddOneLine)->Iterations(7)->UseManualTime()->Unit(benchmark::kMillisecond);

// The alternating road beside Gauss-Newton, 10 lines.
void BM_AlternatingRoad(benchmark::State& state) {
  Variant variant;
  variant.gaussNewton = false;
  RunPair(state, variant, Variant{}, "vs_gauss_newton");
}
BENCHMARK(BM_AlternatingRoad)->Iterations(7)->UseManualTime()->Unit(benchmark::kMillisecond);

// A cached elimination order beside a fresh one each solve, 10 lines.
void BM_CachedOrder(benchmark::State& state) {
  Variant variant;
  variant.cacheOrder = true;
  RunPair(state, variant, Variant{}, "vs_fresh_order");
}
BENCHMARK(BM_CachedOrder)->Iterations(7)->UseManualTime()->Unit(benchmark::kMillisecond);

// Mesh levels 5 to 8 beside the default level 6, 10 lines.
void BM_MeshLevel(benchmark::State& state) {
  Variant variant;
  variant.level = static_cast<std::int32_t>(state.range(0));
  RunPair(state, variant, Variant{}, "vs_level_6");
}
BENCHMARK(BM_MeshLevel)
    ->ArgName("level")
    ->Arg(5)
    ->Arg(6)
    ->Arg(7)
    ->Iterations(3)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(BM_MeshLevel)
    ->ArgName("level")
    ->Arg(8)
    ->Iterations(1)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);

// More scenes, each solved once with ten lines (and a polygon where the
// scene has a plane in view): the worst line's deviations in output pixels,
// whole and without its end cells, the worst pinned direction in degrees,
// the polygon's homography residual at its vertices and through the mesh,
// and the singular value ratio of the cells that hold no constraint sample
// (median and 95th percentile) beside the plain solve's.
void BM_Quality(benchmark::State& state, const CameraCase& camera, const ScenePlane* plane) {
  SceneReport r;
  for (auto _ : state) {
    QualityScene scene(camera);
    r = RunScene(scene, 10, true, plane);
  }
  state.counters["lines"] = static_cast<double>(r.traced);
  state.counters["pinned"] = static_cast<double>(r.pinned);
  state.counters["iterations"] = r.iterations;
  state.counters["max_px"] = r.samplesMax;
  state.counters["rms_px"] = r.samplesRms;
  state.counters["truth_max_px"] = r.truthMax;
  state.counters["truth_rms_px"] = r.truthRms;
  state.counters["inner_max_px"] = r.innerSamplesMax;
  state.counters["inner_rms_px"] = r.innerSamplesRms;
  state.counters["inner_truth_max_px"] = r.innerTruthMax;
  state.counters["inner_truth_rms_px"] = r.innerTruthRms;
  state.counters["direction_deg"] = r.directionError;
  state.counters["inner_direction_deg"] = r.innerDirectionError;
  if (r.polygon) {
    state.counters["polygon_vertex_px"] = r.polygonVertexError;
    state.counters["polygon_mesh_px"] = r.polygonError;
  }
  state.counters["conformal_median"] = r.constrained.median;
  state.counters["conformal_p95"] = r.constrained.p95;
  state.counters["plain_median"] = r.plain.median;
  state.counters["plain_p95"] = r.plain.p95;
  if (!r.succeeded || r.traced != r.picked) state.SkipWithError("a line or the solve failed");
}

const ScenePlane kRoomWall = RoomFarWall();
const ScenePlane kFacadeWall = FacadeWall();
const ScenePlane kBoard = CheckerBoard();
using Synth::SceneKind;
BENCHMARK_CAPTURE(BM_Quality, room_fisheye,
                  CameraCase{"", SceneKind::kRoom, LensKind::kFisheye, 400.0, 1200, 800},
                  &kRoomWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, room_fisheye_pitched_15,
                  CameraCase{"", SceneKind::kRoom, LensKind::kFisheye, 400.0, 1200, 800, 0.0, 15.0},
                  &kRoomWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, room_fisheye_profile,
                  CameraCase{"", SceneKind::kRoom, LensKind::kFisheyePoly, 400.0, 1200, 800},
                  &kRoomWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, checker_fisheye,
                  CameraCase{"", SceneKind::kChecker, LensKind::kFisheye, 400.0, 1200, 800},
                  &kBoard)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, room_distorted,
                  CameraCase{"", SceneKind::kRoom, LensKind::kDistorted, 600.0, 1200, 800},
                  &kRoomWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, facade_distorted_yaw_15_pitch_10,
                  CameraCase{"", SceneKind::kFacade, LensKind::kDistorted, 700.0, 1200, 800, 15.0,
                             10.0},
                  &kFacadeWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, room_cylindrical,
                  CameraCase{"", SceneKind::kRoom, LensKind::kCylindrical, 400.0, 1600, 600},
                  &kRoomWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Quality, facade_cylindrical,
                  CameraCase{"", SceneKind::kFacade, LensKind::kCylindrical, 500.0, 1600, 700,
                             15.0},
                  &kFacadeWall)
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);

}  // namespace
