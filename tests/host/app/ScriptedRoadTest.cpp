// The scripted road end to end, through the real program and module: a
// generated photograph and the action that straightens its edges go in, and
// the corrected picture is judged by its pixels. The module's refusals and a
// Ctrl-C during the render are met for real, through the environment and a
// signal, never through a switch of the program's.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "filter/PFilter.h"
#include "framework/plugin/CPluginEntry.h"
#include "host/actions/ActionFile.h"
#include "host/io/ImageFile.h"
#include "host/platform/SystemInfo.h"
#include "host/plugin/FilterRun.h"
#include "host/plugin/HostRecord.h"
#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "solver/frame/Solver.h"
#include "tests/host/app/ProgramRun.h"
#include "tests/host/app/ResultEdges.h"
#include "tests/support/ReferenceRender.h"
#include "tests/support/StraightLineFit.h"
#include "tests/support/TestImages.h"
#include "tools/synth/lib/ActionWriter.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"

namespace Host {
namespace {

#ifdef ARCHWAY_REAL_MODULE

using Project::testing::ReferenceImage;
using testing::Colour;
using testing::Environment;
using testing::Finished;
using testing::HasLine;
using testing::kHung;
using testing::Point2;
using testing::ProgramRun;
using testing::ReadBytes;
using testing::RunToEnd;
using testing::ScratchFolder;

// ---- The same action solved in-process -----------------------------------------------

// What the in-process run keeps: the photograph it reads and the CPU
// rendering of the mesh it solved.
struct Kept {
  const HostDocument* photo = nullptr;
  std::optional<ReferenceImage> reference;
};

Kept& KeptRun() {
  static Kept kept;
  return kept;
}

// The module's filter, which draws its solved mesh on the CPU once its run
// is over.
class MeshKeepingFilter : public Project::PFilter {
 public:
  bool DoStart() override {
    const bool rendered = PFilter::DoStart();
    Kept& kept = KeptRun();
    const HostDocument& photo = *kept.photo;
    kept.reference = Project::testing::RenderReference(
        Constraints().GetSolver(), photo.Width(), photo.Height(), 3,
        [&](int32_t p, int32_t x, int32_t y) {
          return photo.Sample(p, x, y) / double(photo.MaxSample());
        });
    return rendered;
  }
};

void MeshKeepingEntry(int16_t selector, Tarsa::HostFilterRecord* record, intptr_t* dataSlot,
                      int16_t* result) {
  Tarsa::CPluginEntry::Dispatch(selector, record, dataSlot, result,
                                [] { return new MeshKeepingFilter(); });
}

// Stops the final rendering at its first check: only the solve is wanted.
class SolveOnly : public RunObserver {
 public:
  bool AbortRequested() override { return true; }
  void Progress(int32_t, int32_t) override {}
};

// The program's run of the action over the photograph, as the program sets
// it up, in this process: the solve is deterministic, so its mesh is the
// program's. The preferences it reads and saves live in a folder of its own.
std::optional<ReferenceImage> SolveInProcess(const std::string& photoPath,
                                             const Descriptor& action) {
  const ScratchFolder config;
  const Tarsa::testing::ScopedEnvironment home("XDG_CONFIG_HOME", config.Dir().c_str());
  const auto photo = ImageFile::Read(photoPath);
  KeptRun() = {photo.get(), std::nullopt};
  FilterRun::Options options;
  options.host.title = std::filesystem::path(photoPath).filename();
  options.host.scratchVolumes = {SystemInfo::TemporaryFolder()};
  options.action = action;
  options.memoryOffer = HostRecord::DefaultMemoryOffer();
  SolveOnly observer;
  FilterRun::Run(&MeshKeepingEntry, *photo, options, observer);
  std::optional<ReferenceImage> reference = std::move(KeptRun().reference);
  KeptRun() = {};
  return reference;
}

// The program's replay of an action over a photograph, with the same action
// solved here while the program runs.
struct Replay {
  Descriptor action;
  Finished run;
  std::optional<ReferenceImage> reference;
};

Replay ReplayBeside(const std::string& input, const std::string& actionPath,
                    const std::string& output) {
  Replay replay{ActionFile::Read(actionPath), {}, std::nullopt};
  ProgramRun program({"apply", "--action", actionPath, "-o", output, input}, {});
  if (!program.Started()) return replay;
  replay.reference = SolveInProcess(input, replay.action);
  replay.run = program.Finish();
  return replay;
}

// ---- The photograph and its lines -----------------------------------------------------

// A constrained edge: its image curve in the photograph between the ends
// the action gives.
struct ConstrainedEdge {
  std::vector<Point2> curve;
  int kind = 0;  // as the constraint blob numbers it
};

constexpr int kVerticalLine = 3;

// The action's lines, each found on the generator's curve of its edge.
std::vector<ConstrainedEdge> ConstrainedEdges(const Descriptor& action,
                                              const Synth::RenderResult& photo) {
  const auto* blob = action.Find(Project::DescriptorKey::kConstraintData);
  if (blob == nullptr) return {};
  std::vector<ConstrainedEdge> edges;
  for (const Project::BlobRecord& record :
       Project::ConstraintBlob::Decode(blob->data.data(), blob->data.size())) {
    const auto* line = std::get_if<Project::BlobLine>(&record);
    if (line == nullptr) continue;
    for (const Synth::TruthSegment& segment : photo.truth) {
      auto nearest = [&](double x, double y) {
        size_t best = 0;
        for (size_t k = 1; k < segment.points.size(); ++k) {
          if (std::hypot(segment.points[k].x - x, segment.points[k].y - y) <
              std::hypot(segment.points[best].x - x, segment.points[best].y - y))
            best = k;
        }
        return best;
      };
      const size_t a = nearest(line->x0, line->y0), b = nearest(line->x1, line->y1);
      // The action's ends are the curve's own points as floats, a few
      // hundred-thousandths of a pixel off.
      constexpr double kSame = 1e-3;
      if (std::hypot(segment.points[a].x - line->x0, segment.points[a].y - line->y0) > kSame ||
          std::hypot(segment.points[b].x - line->x1, segment.points[b].y - line->y1) > kSame)
        continue;
      ConstrainedEdge edge;
      edge.kind = line->kind;
      for (size_t k = std::min(a, b); k <= std::max(a, b); ++k)
        edge.curve.push_back(segment.points[k]);
      edges.push_back(std::move(edge));
      break;
    }
  }
  return edges;
}

Point2 Unit(Point2 v) {
  const double length = std::hypot(v.x, v.y);
  return {v.x / length, v.y / length};
}

struct Probe {
  std::vector<Point2> found;  // the edge's points detected in the pixels
  int probed = 0;             // where the photograph shows a clear step
};

// Looks for an edge across the picture at each point of its photograph
// curve, placed by `place` (the identity for the photograph itself), with
// the colour step the photograph shows there. The curve's ends are left
// out, where other edges meet it, and so is any point `aside` names.
template <typename Place, typename Aside = bool (*)(Point2)>
Probe ProbeEdge(
    const HostDocument& photo, const HostDocument& picture, const std::vector<Point2>& curve,
    Place place, Aside aside = [](Point2) { return false; }) {
  Probe probe;
  const size_t trim = std::max<size_t>(3, curve.size() / 10);
  for (size_t k = trim; k + trim < curve.size(); ++k) {
    const Point2 p = curve[k];
    if (aside(p)) continue;
    const Point2 tangent = Unit({curve[k + 2].x - curve[k - 2].x, curve[k + 2].y - curve[k - 2].y});
    const Point2 normal{-tangent.y, tangent.x};
    // The colour step across the edge, from under a pixel to each side, so
    // that a parallel edge a pixel and a half away stays out of it.
    const auto stepAt = [&](Point2 q) {
      const Colour far = testing::ColourAt(photo, {q.x + 0.75 * normal.x, q.y + 0.75 * normal.y});
      const Colour near = testing::ColourAt(photo, {q.x - 0.75 * normal.x, q.y - 0.75 * normal.y});
      return Colour{far[0] - near[0], far[1] - near[1], far[2] - near[2]};
    };
    const Colour step = stepAt(p);
    // Where another edge crosses this one (the floor's checker, a door's
    // frame) the step changes within a few pixels and the profile there
    // meets the other edge: only points whose step holds two and four pixels
    // along each way count.
    const auto stepAlong = [&](double along) {
      return stepAt({p.x + along * tangent.x, p.y + along * tangent.y});
    };
    const auto dot = [](const Colour& a, const Colour& b) {
      return a[0] * b[0] + a[1] * b[1] + a[2] * b[2];
    };
    const double size = std::sqrt(dot(step, step));
    constexpr double kClearStep = 0.1;  // a tenth of the range, well above the encoding's noise
    if (size < kClearStep) continue;
    // The same step: its direction within about 25 degrees, its size within a half.
    const auto same = [&](const Colour& other) {
      const double otherSize = std::sqrt(dot(other, other));
      return dot(step, other) > 0.9 * size * otherSize && otherSize > 0.5 * size &&
             otherSize < 2.0 * size;
    };
    bool holds = true;
    for (const double along : {-4.0, -2.0, 2.0, 4.0}) holds = holds && same(stepAlong(along));
    if (!holds) continue;
    // Near the black beyond a fisheye's circle the result fades out over a
    // pixel, which would pull the edge found there.
    constexpr double kClear = 4.0;  // pixels: the fade and the kernel's reach
    bool nearOutside = false;
    for (const Point2 d : {normal, tangent}) {
      for (const double sign : {-1.0, 1.0}) {
        const Colour c =
            testing::ColourAt(photo, {p.x + sign * kClear * d.x, p.y + sign * kClear * d.y});
        nearOutside |= std::max({c[0], c[1], c[2]}) < 0.03;
      }
    }
    if (nearOutside) continue;
    const auto at = place(p), before = place(curve[k - 2]), after = place(curve[k + 2]),
               side = place({p.x + normal.x, p.y + normal.y});
    if (!at || !before || !after || !side) continue;
    ++probe.probed;
    const Point2 along = Unit({after->x - before->x, after->y - before->y});
    Point2 across{-along.y, along.x};
    if (across.x * (side->x - at->x) + across.y * (side->y - at->y) < 0)
      across = {-across.x, -across.y};
    constexpr double kReach = 3.0;  // pixels to either side of where the mesh puts the edge
    if (const auto edge = testing::FindEdge(picture, *at, across, step, kReach))
      probe.found.push_back(*edge);
  }
  return probe;
}

// ---- Tests -------------------------------------------------------------------------------

// The README sample's lens: a 10 mm equisolid fisheye on a full frame.
Synth::CameraSpec Fisheye10(int width, int height) {
  Synth::CameraSpec camera;
  camera.projection = Synth::ProjectionKind::kFisheyeEquisolid;
  camera.focalMm = 10.0;
  camera.width = width;
  camera.height = height;
  return camera;
}

class ScriptedRoad : public ::testing::Test {
 protected:
  ScratchFolder folder_;
};

// A fisheye room and the generator's action over six of its longest edges,
// verticals pinned vertical. The result is judged twice over: against the
// mesh the same action solves to, drawn on the CPU, and by its own pixels,
// where each constrained edge must lie straight.
TEST_F(ScriptedRoad, ConstrainedEdgesComeOutStraightAndTheResultIsTheMeshDrawn) {
  const Synth::CameraSpec camera = Fisheye10(480, 320);
  const Synth::RenderResult generated = Synth::Render({Synth::SceneKind::kRoom}, camera);
  const std::string input = folder_.File("room.tif"), output = folder_.File("out.tif");
  const std::string actionPath = folder_.File("room.action");
  Synth::PhotoWriter::Write(generated, camera, input);
  Synth::ActionWriter::Write(generated, camera, 6, actionPath);
  const std::string before = ReadBytes(input);
  const auto [action, run, reference] = ReplayBeside(input, actionPath, output);
  ASSERT_EQ(run.status, 0) << run.errors;
  EXPECT_EQ(run.errors, "");
  EXPECT_EQ(ReadBytes(input), before);
  ASSERT_TRUE(reference.has_value());
  const auto photo = ImageFile::Read(input);
  const auto result = ImageFile::Read(output);
  ASSERT_EQ(result->Mode(), ImageMode::kRgb);
  ASSERT_EQ(result->Width(), photo->Width());
  ASSERT_EQ(result->Height(), photo->Height());

  // The result against the mesh drawn on the CPU, pixel by pixel.
  int compared = 0, failed = 0;
  for (int32_t y = 0; y < result->Height(); ++y) {
    for (int32_t x = 0; x < result->Width(); ++x) {
      if (!reference->Covered(x, y)) continue;
      // Source points this close to the photograph's edge are left out: the
      // kernel meets the edge there, which the tiles pad or clamp by position.
      constexpr double kEdge = 3.0;
      const double sx = reference->sourceX[reference->Index(x, y)];
      const double sy = reference->sourceY[reference->Index(x, y)];
      if (sx < kEdge || sx > photo->Width() - kEdge || sy < kEdge || sy > photo->Height() - kEdge)
        continue;
      // So is the anti-aliased rim of the fisheye's circle, where float
      // derivatives on the GPU meet exact ones here.
      if (reference->covered[reference->Index(x, y)] < 1.0) continue;
      ++compared;
      // Float rounding on the GPU against double here: one step either way,
      // and one for the texture coordinates' precision.
      constexpr int kTolerance = 2;
      for (int p = 0; p < 3; ++p) {
        if (std::abs(result->Sample(p, x, y) - int(std::lround(reference->Value(p, x, y) * 255))) >
            kTolerance) {
          ++failed;
          break;
        }
      }
    }
  }
  ASSERT_GT(compared, result->Width() * result->Height() / 2) << "most of the result is the photo";
  // Pixel centres on a cell's edge may fall to the other triangle, which
  // samples a hair's breadth away: a few pixels per hundred cells.
  EXPECT_LE(failed, compared / 200) << failed << " of " << compared;

  // Each constrained edge, looked for in the result's pixels where the mesh
  // puts it.
  const std::vector<ConstrainedEdge> edges = ConstrainedEdges(action, generated);
  ASSERT_EQ(edges.size(), 6u) << "every line of the action is an edge of the scene";
  testing::ResultMap map(*reference);
  double bentInPhoto = 0;
  for (size_t e = 0; e < edges.size(); ++e) {
    SCOPED_TRACE(::testing::Message() << "edge " << e);
    const Probe probe =
        ProbeEdge(*photo, *result, edges[e].curve, [&](Point2 p) { return map.Place(p); });
    ASSERT_GE(probe.probed, 100) << "the edge is long and mostly clear";
    // A point may be missed where the result blurs a step into a neighbour
    // a pixel away; nearly all are found.
    EXPECT_GE(probe.found.size(), size_t(probe.probed) * 95 / 100);
    const Project::testing::StraightLineFit fit = Project::testing::FitStraightLine(probe.found);
    // What a straightened line is allowed: half a pixel of detection on
    // either side and half a pixel of the mesh's bend between its vertices.
    constexpr double kStraight = 1.5;
    EXPECT_LE(fit.maxDeviation, kStraight);
    if (edges[e].kind == kVerticalLine) {
      // A third of a pixel of lean along a 64-pixel edge (0.3 degrees); the
      // photograph's door edges lean ten times that.
      constexpr double kUpright = 0.005;
      EXPECT_LT(std::fabs(std::cos(fit.angle)), kUpright) << fit.angle;
    }
    // The same measure on the photograph finds its curves bent: it can fail.
    const Probe inPhoto = ProbeEdge(*photo, *photo, edges[e].curve,
                                    [](Point2 p) { return std::optional<Point2>(p); });
    bentInPhoto =
        std::max(bentInPhoto, Project::testing::FitStraightLine(inPhoto.found).maxDeviation);
  }
  // The floor's lines sag by tens of pixels in the fisheye photograph.
  EXPECT_GT(bentInPhoto, 10.0);
}

// The README's sample: the fisheye room and the generator's own choice of
// what a photographer constrains (the wall corners plumb, the walls' tops
// and feet, the window and door frames). Every plumb edge comes out within
// a tenth of a degree of vertical and every constrained edge straight.
TEST_F(ScriptedRoad, TheSampleRoomComesOutCorrected) {
  const Synth::CameraSpec camera = Fisheye10(1800, 1200);
  const Synth::SceneSpec scene{Synth::SceneKind::kRoom};
  const Synth::RenderResult generated = Synth::Render(scene, camera);
  const std::string input = folder_.File("room.tif"), output = folder_.File("room-out.tif");
  const std::string actionPath = folder_.File("room.action");
  Synth::PhotoWriter::Write(generated, camera, input);
  Synth::ActionWriter::Write(generated, scene, camera, actionPath);
  const auto [action, run, reference] = ReplayBeside(input, actionPath, output);
  ASSERT_EQ(run.status, 0) << run.errors;
  ASSERT_TRUE(reference.has_value());
  const auto photo = ImageFile::Read(input);
  const auto result = ImageFile::Read(output);

  const std::vector<ConstrainedEdge> edges = ConstrainedEdges(action, generated);
  ASSERT_GE(edges.size(), 12u) << "corners, wall edges and frames";
  testing::ResultMap map(*reference);
  int plumb = 0;
  for (size_t e = 0; e < edges.size(); ++e) {
    SCOPED_TRACE(::testing::Message() << "edge " << e);
    // Where another edge of the scene meets or passes near this one (a
    // door's frame standing on a wall's foot), the profile finds the other.
    const std::vector<Point2>& curve = edges[e].curve;
    const Point2 middle = curve[curve.size() / 2];
    std::vector<const Point2*> others;
    for (const Synth::TruthSegment& segment : generated.truth) {
      bool own = false;
      for (const Point2& q : segment.points)
        own |= std::hypot(q.x - middle.x, q.y - middle.y) < 1.5;
      if (!own)
        for (const Point2& q : segment.points) others.push_back(&q);
    }
    const auto nearOther = [&](Point2 p) {
      constexpr double kJunction = 5.0;  // pixels: a frame's width and the profile's reach
      for (const Point2* q : others)
        if (std::hypot(q->x - p.x, q->y - p.y) < kJunction) return true;
      return false;
    };
    const Probe probe = ProbeEdge(
        *photo, *result, curve, [&](Point2 p) { return map.Place(p); }, nearOther);
    // Frames of a few tens of pixels leave few clear points.
    if (probe.found.size() < 20) continue;
    const Project::testing::StraightLineFit fit = Project::testing::FitStraightLine(probe.found);
    // Half a pixel of edge detection on either side, half of the mesh's bend.
    constexpr double kStraight = 1.5;
    EXPECT_LE(fit.maxDeviation, kStraight);
    if (edges[e].kind == kVerticalLine) {
      ++plumb;
      // A tenth of a degree.
      const double lean =
          std::atan2(std::fabs(std::cos(fit.angle)), std::fabs(std::sin(fit.angle)));
      EXPECT_LT(lean * 180 / M_PI, 0.1);
    }
  }
  EXPECT_GE(plumb, 4) << "the wall corners and the frames' uprights were measured";
}

// The module's words for its refusals, as the user reads them.
constexpr const char* kNoOpenGL =
    "Archway Error: This feature cannot run because this machine does not provide required OpenGL "
    "support.";
constexpr const char* kNo16Bit =
    "Archway Error: The version of OpenGL is too low to support 16-bit per channel image. Please "
    "try to update OpenGL driver or convert the image to 8-bit per channel in Quillmark.";

// The module's checks of the OpenGL it is given, met through the drivers'
// own environment: the refusal reaches the user and nothing is written.
TEST_F(ScriptedRoad, WithoutTheOpenGLItNeedsTheModuleRefusesInItsOwnWords) {
  const std::string rgb = folder_.File("rgb.tif"), rgb48 = folder_.File("rgb48.tif");
  ImageFile::Write(*testing::PhotoLikeDocument(96, 64, ImageMode::kRgb, 1), rgb);
  ImageFile::Write(*testing::PhotoLikeDocument(96, 64, ImageMode::kRgb48, 2), rgb48);
  const std::string rgbBytes = ReadBytes(rgb), rgb48Bytes = ReadBytes(rgb48);
  const std::string listing = folder_.Listing();
  const std::string output = folder_.File("out.tif");

  // No OpenGL at all: the dispatch library finds no vendor to load.
  const ScratchFolder noVendors;
  Finished run = RunToEnd(
      {"apply", "-o", output, rgb},
      {{"__EGL_VENDOR_LIBRARY_DIRS", noVendors.Dir()}, {"__EGL_VENDOR_LIBRARY_FILENAMES", {}}});
  EXPECT_EQ(run.status, 1);
  EXPECT_TRUE(HasLine(run.errors, kNoOpenGL)) << run.errors;
  EXPECT_EQ(folder_.Listing(), listing);

  // OpenGL 2.0 has no framebuffer path: a 16-bit image would lose its
  // precision in the 8-bit target and is refused, while an 8-bit one is
  // still corrected.
  const Environment version20 = {{"MESA_GL_VERSION_OVERRIDE", "2.0"}};
  run = RunToEnd({"apply", "-o", output, rgb48}, version20);
  EXPECT_EQ(run.status, 1);
  EXPECT_TRUE(HasLine(run.errors, kNo16Bit)) << run.errors;
  EXPECT_EQ(folder_.Listing(), listing);
  run = RunToEnd({"apply", "-o", output, rgb}, version20);
  EXPECT_EQ(run.status, 0) << run.errors;
  EXPECT_TRUE(std::filesystem::exists(output));

  EXPECT_EQ(ReadBytes(rgb), rgbBytes);
  EXPECT_EQ(ReadBytes(rgb48), rgb48Bytes);
}

// Ctrl-C once the render shows progress: the run stops within the render,
// says so, and leaves neither the result nor a temporary file.
TEST_F(ScriptedRoad, CtrlCDuringTheRenderLeavesNoOutput) {
  // Large enough that the render takes over a second on a software
  // renderer; the program checks for Ctrl-C every 200 ms of it.
  const std::string input = folder_.File("large.tif"), output = folder_.File("out.tif");
  ImageFile::Write(*testing::PhotoLikeDocument(3000, 2000, ImageMode::kRgb, 3), input);
  const std::string before = ReadBytes(input);
  const std::string listing = folder_.Listing();

  // Standard error on a terminal, so that the program shows its progress.
  int terminal = -1, end = -1;
  ASSERT_EQ(::openpty(&terminal, &end, nullptr, nullptr, nullptr), 0) << std::strerror(errno);
  ::fcntl(terminal, F_SETFD, FD_CLOEXEC);
  ::fcntl(end, F_SETFD, FD_CLOEXEC);
  ProgramRun program({"apply", "-o", output, input}, {}, end);
  ::close(end);
  ASSERT_TRUE(program.Started());

  std::string shown;
  const auto readShown = [&](int wait) {
    pollfd ready{terminal, POLLIN, 0};
    while (::poll(&ready, 1, wait) > 0) {
      char buffer[256];
      const ssize_t count = ::read(terminal, buffer, sizeof buffer);
      if (count <= 0) return;  // the terminal's other end is closed
      shown.append(buffer, size_t(count));
      wait = 0;
    }
  };
  bool interrupted = false;
  int status = -1;
  const auto deadline = std::chrono::steady_clock::now() + kHung;
  while (!program.Ended(status)) {
    ASSERT_LT(std::chrono::steady_clock::now(), deadline) << "hung: " << shown;
    readShown(20);
    // The first progress comes as the render starts.
    if (!interrupted && shown.find('%') != std::string::npos) {
      program.Interrupt();
      interrupted = true;
    }
  }
  readShown(0);
  ::close(terminal);

  ASSERT_TRUE(interrupted) << "no progress was shown: " << shown;
  EXPECT_EQ(shown.find("100%"), std::string::npos)
      << "the render ended before the interrupt; a faster renderer needs a larger photograph";
  EXPECT_EQ(status, 130) << shown;
  EXPECT_NE(shown.find("archway: interrupted; '" + output + "' was not written"), std::string::npos)
      << shown;
  EXPECT_EQ(folder_.Listing(), listing);  // no result and no temporary file
  EXPECT_EQ(ReadBytes(input), before);
}

#endif  // ARCHWAY_REAL_MODULE

}  // namespace
}  // namespace Host
