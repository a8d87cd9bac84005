// The final render of a scripted run on a 24-megapixel RGB photograph
// (6000 x 4000, 8 and 16 bits, smooth waves in every plane), through the
// real host library with the memory the program offers: the image hub's
// silent render, from the reads of the host's planes through the tiled
// OpenGL drawing to the writes back into the host's document. No file is
// read or written.
//
// The mesh is the one a scripted run solves with the default settings (the
// fisheye model, the photograph carrying no metadata), with two lines added
// afterwards, one held vertical and one horizontal, and solved again.
//
// BM_FinalRender times the render beside a plain CPU remap of the same mesh
// into the same document, in the same iteration: each output pixel takes
// its source point from the mesh's interpolated texture coordinates and a
// Catmull-Rom bicubic fetch (the kernel the shader uses), rows shared out
// among the machine's threads. Counters (medians over the iterations):
// MP_per_s and render_ms of the render, cpu_MP_per_s and remap_ms of the
// remap, vs_cpu_remap (the render's throughput over the remap's), peak_MiB
// (the resident high-water mark the render added, reset before it) and
// agree_pct, the share of pixels where the two results agree. The render
// reads the host's planes tile by tile as it needs them while it writes
// finished tiles into the same planes, so where the lines pull a tile's
// pixels from a part already written, the two part and agree_pct falls.
//
// BM_Stages runs the same render a stage at a time, the source read whole
// first, to show where the time goes: reading the host's planes, indexing
// the mesh by tile, the tiles' geometry alone, the tiles drawn (geometry,
// texture packing, upload, draw, readback, unpacking), the writes to the
// host; tile_floor_ms, as many clear-and-read-back passes as there are
// tiles, a tile's round trip through the GL with nothing drawn; and the
// source pixels the tiles' textures hold per output pixel (texel_ratio)
// beside what the boxes of their whole cells would (cells_texel_ratio).
#include <benchmark/benchmark.h>

#include <malloc.h>
#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <memory>
#include <span>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "bench/BenchSupport.h"
#include "filter/PFilter.h"
#include "filter/PImageHub.h"
#include "filter/PResult.h"
#include "filter/PSource.h"
#include "framework/plugin/CPluginEntry.h"
#include "gpu/POpenGLManager.h"
#include "gpu/POpenGLTile.h"
#include "solver/constraints/LineConstraint.h"
#include "solver/frame/Solver.h"
#include "solver/grid/OctaMap.h"
#include "tests/support/FilterFixture.h"

namespace {

using Project::bench::BenchHost;
using Project::bench::FrameworkScope;
using Project::bench::Median;
using Project::bench::ResetPeak;
using Project::bench::StatusKb;

using namespace Project;
using Host::ImageMode;
using Clock = std::chrono::steady_clock;

constexpr std::int32_t kWidth = 6000;
constexpr std::int32_t kHeight = 4000;
constexpr double kMegapixels = double(kWidth) * kHeight / 1e6;
constexpr int kPlanes = 3;

double Since(Clock::time_point start) {
  return std::chrono::duration<double>(Clock::now() - start).count();
}

// A picture's planes, each row after row.
template <typename Sample>
using Planes = std::array<std::vector<Sample>, kPlanes>;

// One plane's samples, whatever the depth.
template <typename Sample>
std::span<Sample> PlaneOf(Host::HostDocument& document, int plane) {
  if constexpr (sizeof(Sample) == 1) {
    return document.Plane8(plane);
  } else {
    return document.Plane16(plane);
  }
}

// A mesh triangle with its texture coordinates as affine functions of the
// result pixel: inside where the three edge functions are non-negative.
struct Triangle {
  float edgeA[3], edgeB[3], edgeC[3];
  float uA, uB, uC, vA, vB, vC;
  std::int32_t x0, x1, y0, y1;  // pixel box, inclusive
};

std::vector<Triangle> MeshTriangles(const Solver& solver) {
  struct Corner {
    double x, y, u, v;
  };
  const BoxFit fit = solver.FitBox(0);
  const double originX = 0.5 * (fit.fitLeft + fit.fitRight);
  const double originY = 0.5 * (fit.fitBottom + fit.fitTop);
  const std::int32_t n = solver.GridSize();
  const auto corner = [&](std::int32_t i, std::int32_t j) {
    const std::size_t at = (std::size_t(j) * std::size_t(n) + std::size_t(i)) * 2;
    const float* p = &solver.Positions()[at];
    const float* t = &solver.TexCoords()[at];
    return Corner{(p[0] - originX) / fit.viewWidth * kWidth + 0.5 * kWidth,
                  (originY - p[1]) / fit.viewHeight * kHeight + 0.5 * kHeight, t[0] * kWidth,
                  (1.0 - t[1]) * kHeight};
  };
  std::vector<Triangle> triangles;
  const auto add = [&](const Corner& a, const Corner& b, const Corner& c) {
    const double area = (b.x - a.x) * (c.y - a.y) - (c.x - a.x) * (b.y - a.y);
    if (area == 0) return;
    const Corner k[3] = {a, b, c};
    Triangle t{};
    // Edge function k is the barycentric weight of corner k.
    for (int e = 0; e < 3; ++e) {
      const Corner& p = k[(e + 1) % 3];
      const Corner& q = k[(e + 2) % 3];
      t.edgeA[e] = float((p.y - q.y) / area);
      t.edgeB[e] = float((q.x - p.x) / area);
      t.edgeC[e] = float((p.x * q.y - q.x * p.y) / area);
    }
    // u and v are the weights' sums of the corners' coordinates.
    for (int e = 0; e < 3; ++e) {
      t.uA += float(t.edgeA[e] * k[e].u), t.uB += float(t.edgeB[e] * k[e].u);
      t.uC += float(t.edgeC[e] * k[e].u);
      t.vA += float(t.edgeA[e] * k[e].v), t.vB += float(t.edgeB[e] * k[e].v);
      t.vC += float(t.edgeC[e] * k[e].v);
    }
    t.x0 = std::int32_t(std::max(0.0, std::floor(std::min({a.x, b.x, c.x}))));
    t.x1 = std::int32_t(std::min(kWidth - 1.0, std::ceil(std::max({a.x, b.x, c.x}))));
    t.y0 = std::int32_t(std::max(0.0, std::floor(std::min({a.y, b.y, c.y}))));
    t.y1 = std::int32_t(std::min(kHeight - 1.0, std::ceil(std::max({a.y, b.y, c.y}))));
    if (t.x0 <= t.x1 && t.y0 <= t.y1) triangles.push_back(t);
  };
  const OctaMap& sphere = *solver.GetOctaMap();
  for (std::int32_t j = 0; j < solver.CellCount(); ++j) {
    for (std::int32_t i = 0; i < solver.CellCount(); ++i) {
      if (!solver.IsCellInMask(i, j)) continue;
      // The cell splits as the program draws it.
      const Corner c00 = corner(i, j), c10 = corner(i + 1, j);
      const Corner c01 = corner(i, j + 1), c11 = corner(i + 1, j + 1);
      if (sphere.SplitsAlongMainDiagonal(i, j)) {
        add(c00, c01, c11), add(c00, c10, c11);
      } else {
        add(c00, c01, c10), add(c01, c11, c10);
      }
    }
  }
  return triangles;
}

// Catmull-Rom weights of the four taps about a point t of the way from the
// second to the third.
void CubicWeights(float t, float w[4]) {
  const float t2 = t * t, t3 = t2 * t;
  w[0] = 0.5f * (-t3 + 2 * t2 - t);
  w[1] = 0.5f * (3 * t3 - 5 * t2 + 2);
  w[2] = 0.5f * (-3 * t3 + 4 * t2 + t);
  w[3] = 0.5f * (t3 - t2);
}

// The plain CPU remap: every output pixel that a triangle covers takes the
// bicubic value of the source at its texture coordinates (texel centres at
// half pixels, taps past the edge repeat it, points outside the picture are
// black); the rest is black. Bands of rows go to the threads as they free.
template <typename Sample>
void CpuRemap(const std::vector<Triangle>& triangles, const Planes<Sample>& source,
              Host::HostDocument& target, int maxSample) {
  constexpr std::int32_t kBand = 32;
  std::span<Sample> out[kPlanes];
  for (int p = 0; p < kPlanes; ++p) out[p] = PlaneOf<Sample>(target, p);
  std::atomic<std::int32_t> nextBand{0};
  const auto work = [&] {
    for (std::int32_t top; (top = kBand * nextBand++) < kHeight;) {
      const std::int32_t bottom = std::min(top + kBand, kHeight);
      for (int p = 0; p < kPlanes; ++p) {
        std::fill(out[p].begin() + std::size_t(top) * kWidth,
                  out[p].begin() + std::size_t(bottom) * kWidth, Sample(0));
      }
      for (const Triangle& t : triangles) {
        const std::int32_t y0 = std::max(t.y0, top), y1 = std::min(t.y1, bottom - 1);
        for (std::int32_t y = y0; y <= y1; ++y) {
          const float py = y + 0.5f;
          for (std::int32_t x = t.x0; x <= t.x1; ++x) {
            const float px = x + 0.5f;
            bool inside = true;
            for (int e = 0; e < 3; ++e)
              inside = inside && t.edgeA[e] * px + t.edgeB[e] * py + t.edgeC[e] >= 0;
            if (!inside) continue;
            const float sx = t.uA * px + t.uB * py + t.uC;
            const float sy = t.vA * px + t.vB * py + t.vC;
            const std::size_t at = std::size_t(y) * kWidth + std::size_t(x);
            if (sx < 0 || sx > kWidth || sy < 0 || sy > kHeight) {
              for (int p = 0; p < kPlanes; ++p) out[p][at] = 0;
              continue;
            }
            const float fx = sx - 0.5f, fy = sy - 0.5f;
            const float bx = std::floor(fx), by = std::floor(fy);
            float wx[4], wy[4];
            CubicWeights(fx - bx, wx);
            CubicWeights(fy - by, wy);
            std::size_t column[4], row[4];
            for (int k = 0; k < 4; ++k) {
              column[k] = std::size_t(std::clamp(std::int32_t(bx) + k - 1, 0, kWidth - 1));
              row[k] = std::size_t(std::clamp(std::int32_t(by) + k - 1, 0, kHeight - 1)) * kWidth;
            }
            for (int p = 0; p < kPlanes; ++p) {
              const Sample* in = source[p].data();
              float sum = 0;
              for (int j = 0; j < 4; ++j) {
                float across = 0;
                for (int i = 0; i < 4; ++i) across += wx[i] * float(in[row[j] + column[i]]);
                sum += wy[j] * across;
              }
              out[p][at] = Sample(std::clamp(std::lround(sum), 0L, long(maxSample)));
            }
          }
        }
      }
    }
  };
  std::vector<std::thread> threads(std::max(1u, std::thread::hardware_concurrency()) - 1);
  for (std::thread& thread : threads) thread = std::thread(work);
  work();
  for (std::thread& thread : threads) thread.join();
}

// The photograph, the host over it and a filter holding the solved mesh.
template <typename Sample>
class Scene {
 public:
  Scene() {
    // The memory the program offers the filter, not the test host's none:
    // with none the tiles' heap is held to its floor and swaps to disk.
    host_.settings.memoryOffer = Host::HostRecord::DefaultMemoryOffer();
    host_.MakeDocument(sizeof(Sample) == 1 ? ImageMode::kRgb : ImageMode::kRgb48, kWidth, kHeight,
                       false);
    Fill();
    if (filter_.HandlePrepare(host_.Record(), nullptr) != 0) return;
    // The run answers 1: its render was cancelled at the first check.
    filter_.HandleStart(host_.Record(), nullptr);
    Solver& solver = filter_.Constraints().GetSolver();
    if (!solver.Solved()) return;
    linesTraced_ = AddLine({700, 700}, {520, 3300}, LineConstraint::kVertical) &&
                   AddLine({1200, 420}, {4800, 380}, LineConstraint::kHorizontal);
    solver.Solve(true, false);
    ready_ =
        linesTraced_ && solver.Solved() && filter_.HasImageHub() && filter_.ImageHub().GLUsable();
  }

  // False, with the benchmark skipped, when the run left no solved mesh
  // with its lines or OpenGL is missing.
  bool Ready(benchmark::State& state) const {
    if (!ready_) state.SkipWithError("no solved mesh with its lines, or no OpenGL");
    return ready_;
  }
  PImageHub& Hub() { return filter_.ImageHub(); }
  const Solver& GetSolver() { return filter_.Constraints().GetSolver(); }
  Host::HostDocument& Document() { return *host_.document; }
  const Planes<Sample>& Original() const { return original_; }
  int MaxSample() const { return host_.document->MaxSample(); }

  // The photograph back in the document, and the stages empty, as before a
  // scripted run's render.
  void Reset() {
    for (int p = 0; p < kPlanes; ++p) std::ranges::copy(original_[p], Plane(p).begin());
    Hub().ResultFull().SetRect({});
    Hub().Source().SetRect({});
    malloc_trim(0);
  }
  // The stages over the layer, as the hub makes them on first demand.
  void Lay() {
    Hub().Source().SetRect(Hub().SourceRect());
    Hub().ResultFull().SetRect(Hub().SourceRect());
  }
  std::span<Sample> Plane(int p) { return PlaneOf<Sample>(*host_.document, p); }

 private:
  // Waves of a few hundred pixels and a finer ripple, a different phase in
  // each plane, over a gentle slope.
  void Fill() {
    const int max = host_.document->MaxSample();
    for (int p = 0; p < kPlanes; ++p) {
      std::vector<float> across(kWidth), down(kHeight), ripple(kWidth + kHeight);
      for (std::int32_t x = 0; x < kWidth; ++x) across[x] = std::sin(x * 0.013f + p);
      for (std::int32_t y = 0; y < kHeight; ++y) down[y] = std::cos(y * 0.011f - p);
      for (std::int32_t s = 0; s < kWidth + kHeight; ++s)
        ripple[s] = 0.12f * std::sin(s * 0.05f + 2.0f * p) + 0.1f * s / (kWidth + kHeight);
      original_[p].resize(std::size_t(kWidth) * kHeight);
      for (std::int32_t y = 0; y < kHeight; ++y) {
        for (std::int32_t x = 0; x < kWidth; ++x) {
          const float value = 0.45f + 0.3f * across[x] * down[y] + ripple[x + y];
          original_[p][std::size_t(y) * kWidth + x] = Sample(std::lround(value * max));
        }
      }
      std::ranges::copy(original_[p], Plane(p).begin());
    }
  }

  bool AddLine(Point2f start, Point2f end, std::int32_t orientation) {
    auto line = std::make_unique<LineConstraint>(start, end);
    line->StoreOrientation(orientation, 0.0f);
    return filter_.Constraints().Add(std::move(line));
  }

  FrameworkScope framework_;
  Project::testing::ScopedConfigHome config_;
  BenchHost host_;
  Project::testing::ShaderPFilter filter_;
  Planes<Sample> original_;
  bool linesTraced_ = false;
  bool ready_ = false;
};

template <typename Sample>
Planes<Sample> Snapshot(Scene<Sample>& scene) {
  Planes<Sample> planes;
  for (int p = 0; p < kPlanes; ++p) planes[p].assign(scene.Plane(p).begin(), scene.Plane(p).end());
  return planes;
}

// The tolerances of the render tests: at 8 bits a step of float rounding
// either way and one for the texture coordinates' precision; at 16 bits
// half floats in the texture and the target, 11 bits of mantissa rounded
// twice, in samples of 0..32768.
template <typename Sample>
constexpr int kTolerance = sizeof(Sample) == 1 ? 2 : 24;

// The share of pixels where every plane of rendered and the document (the
// CPU remap's result) are within tolerance.
template <typename Sample>
double AgreePercent(const Planes<Sample>& rendered, Scene<Sample>& scene) {
  std::size_t agree = 0;
  const std::size_t pixels = std::size_t(kWidth) * kHeight;
  for (std::size_t i = 0; i < pixels; ++i) {
    bool same = true;
    for (int p = 0; p < kPlanes; ++p)
      same = same && std::abs(int(rendered[p][i]) - int(scene.Plane(p)[i])) <= kTolerance<Sample>;
    agree += same ? 1 : 0;
  }
  return 100.0 * double(agree) / double(pixels);
}

template <typename Sample>
void RunFinalRender(benchmark::State& state) {
  Scene<Sample> scene;
  if (!scene.Ready(state)) return;
  const std::vector<Triangle> triangles = MeshTriangles(scene.GetSolver());
  std::vector<double> render, remap, peak;
  Planes<Sample> rendered;
  bool complete = true;
  for (auto _ : state) {
    scene.Reset();
    ResetPeak();
    const double before = StatusKb("VmRSS:");
    const auto start = Clock::now();
    scene.Lay();
    complete = scene.Hub().RenderFinalSilent() && complete;
    render.push_back(Since(start));
    peak.push_back((StatusKb("VmHWM:") - before) / 1024.0);
    state.SetIterationTime(render.back());
    if (rendered[0].empty()) rendered = Snapshot(scene);

    const auto remapStart = Clock::now();
    CpuRemap<Sample>(triangles, scene.Original(), scene.Document(), scene.MaxSample());
    remap.push_back(Since(remapStart));
  }
  if (!complete) state.SkipWithError("a render did not complete");
  state.counters["render_ms"] = Median(render) * 1e3;
  state.counters["MP_per_s"] = kMegapixels / Median(render);
  state.counters["remap_ms"] = Median(remap) * 1e3;
  state.counters["cpu_MP_per_s"] = kMegapixels / Median(remap);
  state.counters["vs_cpu_remap"] = Median(remap) / Median(render);
  state.counters["peak_MiB"] = Median(peak);
  state.counters["threads"] = std::max(1u, std::thread::hardware_concurrency());
  state.counters["agree_pct"] = AgreePercent(rendered, scene);
}

void BM_FinalRender8(benchmark::State& state) { RunFinalRender<std::uint8_t>(state); }
void BM_FinalRender16(benchmark::State& state) { RunFinalRender<std::uint16_t>(state); }
BENCHMARK(BM_FinalRender8)->Iterations(3)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(BM_FinalRender16)->Iterations(3)->UseManualTime()->Unit(benchmark::kMillisecond);

// The source pixels the tile's texture holds, and what a texture of its
// whole cells would: the box of their texture coordinates with the bicubic
// kernel's reach of two pixels, inside the picture.
struct TileTexels {
  double held = 0;
  double cells = 0;
};

TileTexels TexelsOf(PResult& result, const Solver& solver, std::int32_t col, std::int32_t row) {
  TileTexels texels;
  Tarsa::CRect held;
  if (!result.PrepareTile(col, row, held)) return texels;
  texels.held = double(held.Width()) * double(held.Height());
  double left = kWidth, right = 0, top = kHeight, bottom = 0;
  const std::int32_t n = solver.GridSize();
  for (const auto& [i, j] : result.TileCells(col, row)) {
    for (int k = 0; k < 4; ++k) {
      const std::size_t at = (std::size_t(j + k / 2) * std::size_t(n) + std::size_t(i + k % 2)) * 2;
      const double u = solver.TexCoords()[at] * kWidth;
      const double v = (1.0 - solver.TexCoords()[at + 1]) * kHeight;
      left = std::min(left, u), right = std::max(right, u);
      top = std::min(top, v), bottom = std::max(bottom, v);
    }
  }
  const double width = std::min(right + 2, double(kWidth)) - std::max(left - 2, 0.0);
  const double height = std::min(bottom + 2, double(kHeight)) - std::max(top - 2, 0.0);
  texels.cells = std::max(width, 0.0) * std::max(height, 0.0);
  return texels;
}

// The render one stage at a time; the source is read whole before the first
// write to the host.
template <typename Sample>
void RunStages(benchmark::State& state) {
  Scene<Sample> scene;
  if (!scene.Ready(state)) return;
  std::vector<double> read, index, geometry, tiles, write, floor, total;
  TileTexels texels;
  const Tarsa::CRect layer = scene.Hub().SourceRect();
  for (auto _ : state) {
    scene.Reset();
    std::uint32_t steps = 0;
    const auto begun = Clock::now();
    auto start = begun;
    PSource& source = scene.Hub().Source();
    source.SetRect(layer);
    BringUpToDate(source, layer, true, steps);
    read.push_back(Since(start));

    start = Clock::now();
    PResult& result = scene.Hub().ResultFull();
    result.SetRect(layer);
    index.push_back(Since(start));

    start = Clock::now();
    texels = {};
    for (std::int32_t row = 0; row < std::int32_t(result.Rows()); ++row) {
      for (std::int32_t col = 0; col < std::int32_t(result.Columns()); ++col) {
        const TileTexels tile = TexelsOf(result, scene.GetSolver(), col, row);
        texels.held += tile.held;
        texels.cells += tile.cells;
      }
    }
    geometry.push_back(Since(start));

    start = Clock::now();
    BringUpToDate(result, layer, true, steps);
    tiles.push_back(Since(start));

    start = Clock::now();
    if (!scene.Hub().RenderFinalSilent()) state.SkipWithError("a render did not complete");
    write.push_back(Since(start));
    // The geometry pass is the bench's own: the tiles prepare again.
    total.push_back(Since(begun) - geometry.back());
    state.SetIterationTime(total.back());

    // As many passes as tiles with nothing drawn: a clear and the read back.
    POpenGLManager& gl = scene.Hub().GLManager();
    std::vector<std::uint8_t> readback(std::size_t(POpenGLManager::kSurfaceSize) *
                                       POpenGLManager::kSurfaceSize * 4 * sizeof(Sample));
    POpenGLTilePass pass;
    pass.pixelFormat = scene.Hub().PixelFormat();
    pass.pixelType = scene.Hub().PixelType();
    pass.readback = readback.data();
    start = Clock::now();
    gl.MakeCurrent();
    for (std::uint32_t k = 0; k < result.Rows() * result.Columns(); ++k) RenderTilePass(gl, pass);
    gl.ReleaseCurrent();
    floor.push_back(Since(start));
  }
  const Planes<Sample> rendered = Snapshot(scene);
  CpuRemap<Sample>(MeshTriangles(scene.GetSolver()), scene.Original(), scene.Document(),
                   scene.MaxSample());
  state.counters["MP_per_s"] = kMegapixels / Median(total);
  state.counters["read_ms"] = Median(read) * 1e3;
  state.counters["index_ms"] = Median(index) * 1e3;
  state.counters["geometry_ms"] = Median(geometry) * 1e3;
  state.counters["tiles_ms"] = Median(tiles) * 1e3;
  state.counters["write_ms"] = Median(write) * 1e3;
  state.counters["tile_floor_ms"] = Median(floor) * 1e3;
  // Source pixels uploaded per output pixel, and what whole cells would take.
  state.counters["texel_ratio"] = texels.held / (kMegapixels * 1e6);
  state.counters["cells_texel_ratio"] = texels.cells / (kMegapixels * 1e6);
  state.counters["agree_pct"] = AgreePercent(rendered, scene);
}

void BM_Stages8(benchmark::State& state) { RunStages<std::uint8_t>(state); }
void BM_Stages16(benchmark::State& state) { RunStages<std::uint16_t>(state); }
BENCHMARK(BM_Stages8)->Iterations(1)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Stages16)->Iterations(1)->UseManualTime()->Unit(benchmark::kMillisecond);

}  // namespace
