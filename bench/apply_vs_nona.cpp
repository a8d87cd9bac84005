// The whole `archway apply` on a 6000 x 4000 8-bit RGB fisheye photograph
// (read, metadata, solve, render, write, as a user runs it) beside a plain
// remap of the same photo by the panorama tools' `nona`, both as whole
// processes, taken in turn in each iteration so that both see the same
// machine. Reported: each one's median time, the ratio, each one's peak
// resident memory (and the program's over the image's bytes), and where the
// program's time went, from its own --timings line.
//
// `nona` comes from Debian's hugin-tools: scripts/bench-setup.sh installs it.

#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "bench/BenchSupport.h"
#include "tools/synth/lib/ActionWriter.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"

extern char** environ;

namespace {

constexpr int kWidth = 6000;
constexpr int kHeight = 4000;

// One finished process: its wall time and peak resident set.
struct Finished {
  bool ok = false;
  double seconds = 0;
  double peakMiB = 0;
};

Finished RunProcess(const std::vector<std::string>& arguments, const std::string& errors) {
  std::vector<char*> argv;
  for (const std::string& a : arguments) argv.push_back(const_cast<char*>(a.c_str()));
  argv.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
  posix_spawn_file_actions_addopen(&actions, 2, errors.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
  const auto start = std::chrono::steady_clock::now();
  pid_t pid = -1;
  Finished finished;
  if (posix_spawnp(&pid, argv[0], &actions, nullptr, argv.data(), environ) == 0) {
    int status = 0;
    rusage usage{};
    if (wait4(pid, &status, 0, &usage) == pid) {
      finished.ok = WIFEXITED(status) && WEXITSTATUS(status) == 0;
      finished.seconds =
          std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
      finished.peakMiB = double(usage.ru_maxrss) / 1024.0;  // kilobytes on Linux
    }
  }
  posix_spawn_file_actions_destroy(&actions);
  return finished;
}

// The photo, its action and nona's project, made once in a folder of their own.
struct Scene {
  std::string folder, photo, action, project;

  Scene() {
    folder = (std::filesystem::temp_directory_path() / "archway-bench-apply").string();
    std::filesystem::create_directories(folder);
    photo = folder + "/fisheye.tif";
    action = folder + "/fisheye.action";
    project = folder + "/fisheye.pto";
    Synth::CameraSpec camera;
    camera.projection = Synth::ProjectionKind::kFisheyeEquisolid;
    camera.focalMm = 10.0;
    camera.width = kWidth;
    camera.height = kHeight;
    const Synth::SceneSpec bars{Synth::SceneKind::kSegments};
    const Synth::RenderResult generated = Synth::Render(bars, camera);
    Synth::PhotoWriter::Write(generated, camera, photo);
    Synth::ActionWriter::Write(generated, bars, camera, action);
    // The photo as a full-frame fisheye of 180 degrees, remapped to a
    // rectilinear picture of its own size: one pass over every pixel.
    std::ofstream pto(project);
    pto << "p f0 w" << kWidth << " h" << kHeight << " v150 E0 R0 n\"TIFF_m c:NONE\"\n"
        << "m g1 i0 f0 m2 p0.00784314\n"
        << "i w" << kWidth << " h" << kHeight
        << " f2 v180 Ra0 Rb0 Rc0 Rd0 Re0 Eev0 Er1 Eb1 r0 p0 y0 TrX0 TrY0 TrZ0 j0 a0 b0 c0 d0 e0 "
           "g0 t0 Va1 Vb0 Vc0 Vd0 Vx0 Vy0 n\""
        << photo << "\"\n";
  }
  ~Scene() { std::filesystem::remove_all(folder); }
};

// "read 0.124 s, start 0.980 s, render 0.648 s, write 0.173 s" from the
// program's --timings line.
bool ParseTimings(const std::string& path, double out[4]) {
  std::ifstream in(path);
  std::string line;
  while (std::getline(in, line)) {
    const size_t at = line.find(": read ");
    if (at == std::string::npos) continue;
    return std::sscanf(line.c_str() + at, ": read %lf s, start %lf s, render %lf s, write %lf s",
                       &out[0], &out[1], &out[2], &out[3]) == 4;
  }
  return false;
}

void BM_ApplyBesideNona(benchmark::State& state) {
  if (RunProcess({"nona", "--help"}, "/dev/null").seconds == 0) {
    state.SkipWithError("nona is not installed: run scripts/bench-setup.sh");
    return;
  }
  static const Scene scene;
  const std::string errors = scene.folder + "/errors.txt";
  std::vector<double> apply, nona, read, start, render, write;
  double applyPeak = 0, nonaPeak = 0;
  for (auto _ : state) {
    const Finished a = RunProcess({ARCHWAY_PROGRAM, "apply", "--timings", "--action", scene.action,
                                   "-o", scene.folder + "/archway-out.tif", scene.photo},
                                  errors);
    double phases[4] = {};
    if (!a.ok || !ParseTimings(errors, phases)) {
      state.SkipWithError("archway apply failed");
      return;
    }
    const Finished n = RunProcess(
        {"nona", "-o", scene.folder + "/nona-out", "-m", "TIFF", scene.project}, "/dev/null");
    if (!n.ok) {
      state.SkipWithError("nona failed");
      return;
    }
    apply.push_back(a.seconds), nona.push_back(n.seconds);
    read.push_back(phases[0]), start.push_back(phases[1]);
    render.push_back(phases[2]), write.push_back(phases[3]);
    applyPeak = std::max(applyPeak, a.peakMiB);
    nonaPeak = std::max(nonaPeak, n.peakMiB);
  }
  using Project::bench::Median;
  const double imageMiB = double(kWidth) * kHeight * 3 / (1024.0 * 1024.0);
  state.counters["apply_s"] = Median(apply);
  state.counters["nona_s"] = Median(nona);
  state.counters["apply_over_nona"] = Median(apply) / Median(nona);
  state.counters["apply_peak_MiB"] = applyPeak;
  state.counters["nona_peak_MiB"] = nonaPeak;
  state.counters["apply_peak_over_image"] = applyPeak / imageMiB;
  state.counters["read_s"] = Median(read);
  state.counters["start_s"] = Median(start);  // the module's metadata and solve
  state.counters["render_s"] = Median(render);
  state.counters["write_s"] = Median(write);
}
BENCHMARK(BM_ApplyBesideNona)->Iterations(5)->Unit(benchmark::kSecond)->UseRealTime();

}  // namespace
