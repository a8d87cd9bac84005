// Constrained lines come out straight in the output's own pixels: generated
// photographs of dark straight bars, every bar constrained (level ones level,
// upright ones vertical), corrected by the program, and each dark line of the
// result found and measured by the project's straightness meter.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <string>

#include "host/actions/ActionFile.h"
#include "host/io/ImageFile.h"
#include "params/Descriptor.h"
#include "tests/host/app/ProgramRun.h"
#include "tools/measure/lib/FindLines.h"
#include "tools/synth/lib/ActionWriter.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"

namespace Host {
namespace {

#ifdef ARCHWAY_REAL_MODULE

using testing::ProgramRun;
using testing::ScratchFolder;

struct Shot {
  const char* name;
  Synth::ProjectionKind projection;
  double focalMm;
  int width;
  int height;
  // The largest spread of a bar's centreline allowed, ends included.
  double straight;
};

class StraightOutput : public ::testing::TestWithParam<Shot> {};

TEST_P(StraightOutput, EveryConstrainedBarIsStraightToItsEndsAndLevelOrPlumb) {
  const Shot& shot = GetParam();
  Synth::CameraSpec camera;
  camera.projection = shot.projection;
  camera.focalMm = shot.focalMm;
  camera.width = shot.width;
  camera.height = shot.height;
  const Synth::SceneSpec scene{Synth::SceneKind::kSegments};
  const Synth::RenderResult generated = Synth::Render(scene, camera);
  ScratchFolder folder;
  const std::string input = folder.File("bars.tif"), output = folder.File("bars-out.png");
  const std::string action = folder.File("bars.action");
  Synth::PhotoWriter::Write(generated, camera, input);
  Synth::ActionWriter::Write(generated, scene, camera, action);
  const auto* blob = ActionFile::Read(action).Find(Project::DescriptorKey::kConstraintData);
  ASSERT_NE(blob, nullptr);

  ProgramRun program({"apply", "--action", action, "-o", output, input}, {});
  ASSERT_TRUE(program.Started());
  const testing::Finished run = program.Finish();
  ASSERT_EQ(run.status, 0) << run.errors;
  const auto result = ImageFile::Read(output);
  const std::vector<Measure::MeasuredLine> lines = Measure::FindLines(*result);

  // Every bar of the photograph is constrained; a bar the correction puts
  // against the black outside is left out by the meter.
  const auto photoLines = Measure::FindLines(*generated.document);
  EXPECT_GE(lines.size() + 2, photoLines.size()) << "nearly every bar is found in the result";
  double worst = 0;
  for (const Measure::MeasuredLine& line : lines) {
    SCOPED_TRACE(::testing::Message() << "line at " << line.centre.x << ", " << line.centre.y
                                      << ", angle " << line.angle);
    worst = std::max(worst, line.spread);
    EXPECT_LE(line.spread, shot.straight);
    // A bar within a few degrees of level or plumb was constrained so: it
    // lies within a tenth of a degree of it.
    const double fromLevel = Measure::AngleDifference(line.angle, 0.0);
    const double fromPlumb = Measure::AngleDifference(line.angle, 90.0);
    constexpr double kNear = 3.0, kLevel = 0.1;
    EXPECT_TRUE(fromLevel >= kNear || fromLevel < kLevel) << fromLevel << " from level";
    EXPECT_TRUE(fromPlumb >= kNear || fromPlumb < kLevel) << fromPlumb << " from plumb";
  }
  // The same meter finds the photograph's bars bent: it can fail.
  double bentInPhoto = 0;
  for (const auto& line : photoLines) bentInPhoto = std::max(bentInPhoto, line.spread);
  RecordProperty("largest_spread", std::to_string(worst));
  if (shot.projection != Synth::ProjectionKind::kRectilinear) {
    EXPECT_GT(bentInPhoto, 10.0);
  }
}

INSTANTIATE_TEST_SUITE_P(
    Shots, StraightOutput,
    // Every bar's centreline, ends included, within a pixel at 3000 x 2000
    // and a pixel and a half at 6000 x 4000.
    ::testing::Values(
        Shot{"fisheye10", Synth::ProjectionKind::kFisheyeEquisolid, 10.0, 3000, 2000, 1.0},
        Shot{"rectilinear14", Synth::ProjectionKind::kRectilinear, 14.0, 3000, 2000, 1.0},
        Shot{"rectilinear14large", Synth::ProjectionKind::kRectilinear, 14.0, 6000, 4000, 1.5}),
    [](const ::testing::TestParamInfo<Shot>& info) { return std::string(info.param.name); });

#endif  // ARCHWAY_REAL_MODULE

}  // namespace
}  // namespace Host
