// Actions at the edges of what is well formed: focal lengths from 1e-6 to
// 1e12, lines far outside the picture, of no length, drawn twice, and by
// the hundred. Each run ends with a corrected photo or a refusal in words,
// never a crash in the program or its graphics driver, and never a hang.

#include <gtest/gtest.h>

#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "host/actions/ActionFile.h"
#include "host/plugin/Descriptor.h"
#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "tests/host/app/ProgramRun.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"

namespace Host {
namespace {

#ifdef ARCHWAY_REAL_MODULE

using testing::Finished;
using testing::ReadBytes;
using testing::RunToEnd;
using testing::ScratchFolder;

// One line, its ends drawn from the kinds of place a damaged or careless
// action holds: in the picture, far outside it, at one point, or huge.
Project::BlobLine ExtremeLine(std::mt19937& random, float width, float height) {
  std::uniform_real_distribution<float> unit(0.0f, 1.0f);
  const auto point = [&](float& x, float& y) {
    switch (random() % 4) {
      case 0:
        x = unit(random) * width;
        y = unit(random) * height;
        break;
      case 1:
        x = (unit(random) - 0.5f) * 2e6f;
        y = (unit(random) - 0.5f) * 2e6f;
        break;
      case 2:
        x = -1.0f;
        y = height + 1.0f;
        break;
      default:
        x = unit(random) > 0.5f ? 3e37f : -3e37f;
        y = unit(random) * height;
        break;
    }
  };
  Project::BlobLine line;
  point(line.x0, line.y0);
  if (random() % 4 == 0) {
    line.x1 = line.x0;  // no length at all
    line.y1 = line.y0;
  } else {
    point(line.x1, line.y1);
  }
  line.kind = 1 + static_cast<int32_t>(random() % 4);
  line.angle = (unit(random) - 0.5f) * 720.0f;
  return line;
}

TEST(ExtremeActions, EndWithAResultOrARefusal) {
  ScratchFolder folder;
  Synth::CameraSpec camera;
  camera.projection = Synth::ProjectionKind::kFisheyeEquisolid;
  camera.focalMm = 10.0;
  camera.width = 96;
  camera.height = 64;
  const Synth::SceneSpec scene{Synth::SceneKind::kRoom};
  const std::string photo = folder.File("photo.tif");
  Synth::PhotoWriter::Write(Synth::Render(scene, camera), camera, photo);
  const std::string before = ReadBytes(photo);

  // Focal lengths in pixels: most runs take one the photo allows (or none,
  // so the photo's own), so that their lines reach the solve and the
  // render; every fourth run takes one far outside, which is refused.
  const double extremeFocals[] = {1e-6, 1e-3, 0.5, 5e4, 2147483648.0, 1e9, 1e12};
  const double usableFocals[] = {7.0, 40.0, 180.0};
  const uint32_t models[] = {Project::DescriptorValue::kFisheye,
                             Project::DescriptorValue::kPerspective};
  std::mt19937 random(16);  // fixed, so a failure replays
  constexpr int kRuns = 24;
  for (int run = 0; run < kRuns; ++run) {
    Descriptor action;
    action.PutEnumerated(Project::DescriptorKey::kProjectionModel,
                         Project::DescriptorKey::kProjectionModel, models[random() % 2]);
    if (run % 4 == 0) {
      action.PutFloat(Project::DescriptorKey::kFocalLength,
                      extremeFocals[random() % std::size(extremeFocals)]);
    } else if (run % 4 != 1) {
      action.PutFloat(Project::DescriptorKey::kFocalLength,
                      usableFocals[random() % std::size(usableFocals)]);
    }
    // From none to hundreds of lines, and each line sometimes twice.
    const int lines = run % 6 == 5 ? 300 : static_cast<int>(random() % 12);
    std::vector<Project::BlobRecord> records;
    for (int i = 0; i < lines; ++i) {
      records.emplace_back(ExtremeLine(random, 96.0f, 64.0f));
      if (random() % 5 == 0) records.push_back(records.back());
    }
    if (run % 3 == 1) {
      Project::BlobPolygon polygon;
      polygon.points = {{-5e5f, -5e5f}, {5e5f, -5e5f}, {5e5f, 5e5f}, {-5e5f, 5e5f}};
      polygon.edgeKinds = {2, 3, 2, 3};
      records.emplace_back(polygon);
    }
    action.PutData(Project::DescriptorKey::kConstraintData,
                   Project::ConstraintBlob::Encode(records));
    const std::string actionFile = folder.File("extreme.action");
    ActionFile::Write(action, actionFile);
    const std::string output = folder.File("out-" + std::to_string(run) + ".tif");

    SCOPED_TRACE(ActionFile::Format(action).substr(0, 200));
    const Finished finished = RunToEnd({"apply", "--action", actionFile, "-o", output, photo});
    // A crash or a kill reads as -1; a hang is killed and says so.
    ASSERT_GE(finished.status, 0) << run << ": " << finished.errors;
    if (finished.status == 0) {
      EXPECT_TRUE(std::filesystem::exists(output)) << run;
    } else {
      EXPECT_FALSE(finished.errors.empty()) << run << ": a refusal without a word";
      EXPECT_FALSE(std::filesystem::exists(output)) << run;
    }
  }
  EXPECT_EQ(ReadBytes(photo), before);
}

#endif  // ARCHWAY_REAL_MODULE

}  // namespace
}  // namespace Host
