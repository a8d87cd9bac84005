// Silent runs as photographers use them on whole folders: what an action
// does not say comes from each photo's own metadata, never from the run
// before, and a value no run can use is refused before anything is written.

#include <gtest/gtest.h>

#include <string>

#include "host/actions/ActionFile.h"
#include "host/plugin/Descriptor.h"
#include "tests/host/app/ProgramRun.h"
#include "tools/synth/lib/ActionWriter.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"

namespace Host {
namespace {

#ifdef ARCHWAY_REAL_MODULE

using testing::Environment;
using testing::Finished;
using testing::ProgramRun;
using testing::ReadBytes;
using testing::RunToEnd;
using testing::ScratchFolder;
using testing::WriteBytes;

constexpr uint32_t Code(const char (&text)[5]) {
  return uint32_t(uint8_t(text[0])) << 24 | uint32_t(uint8_t(text[1])) << 16 |
         uint32_t(uint8_t(text[2])) << 8 | uint32_t(uint8_t(text[3]));
}

class SilentRun : public ::testing::Test {
 protected:
  // A generated photograph of the bars, written with its camera's metadata;
  // the path of the photo.
  std::string Photo(const std::string& name, Synth::ProjectionKind projection, double focalMm,
                    double crop) {
    Synth::CameraSpec camera;
    camera.projection = projection;
    camera.focalMm = focalMm;
    camera.cropFactor = crop;
    camera.width = 600;
    camera.height = 400;
    const Synth::SceneSpec scene{Synth::SceneKind::kSegments};
    const Synth::RenderResult generated = Synth::Render(scene, camera);
    const std::string path = folder_.File(name + ".tif");
    Synth::PhotoWriter::Write(generated, camera, path);
    Synth::ActionWriter::Write(generated, scene, camera, folder_.File(name + ".action"));
    return path;
  }

  ScratchFolder folder_;
};

// Without an action, the model and focal length come from the photo: a
// 14 mm lens on a 1.5 crop body (21 mm equivalent) is rectilinear, a 10 mm
// full-frame one a fisheye, each at its focal length in pixels.
TEST_F(SilentRun, TheModelAndFocalLengthComeFromThePhoto) {
  struct Case {
    const char* name;
    Synth::ProjectionKind projection;
    double focalMm, crop;
    uint32_t model;
    double focalPixels;  // the lens's, over the 36 mm width of a full frame
  };
  const Case cases[] = {
      {"rectilinear", Synth::ProjectionKind::kRectilinear, 14.0, 1.5, Code("perP"),
       14.0 * 1.5 * 600 / 36},
      {"fisheye", Synth::ProjectionKind::kFisheyeEquisolid, 10.0, 1.0, Code("fisP"),
       10.0 * 600 / 36},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    const std::string photo = Photo(c.name, c.projection, c.focalMm, c.crop);
    const std::string saved = folder_.File(std::string(c.name) + "-saved.action");
    const Finished run =
        RunToEnd({"apply", "--save-action", saved, "-o", folder_.File("out.tif"), photo});
    ASSERT_EQ(run.status, 0) << run.errors;
    const Descriptor action = ActionFile::Read(saved);
    const auto* model = action.Find(Code("prjM"));
    const auto* focal = action.Find(Code("focL"));
    ASSERT_TRUE(model != nullptr && focal != nullptr);
    EXPECT_EQ(model->enumValue, c.model);
    // Single precision in the module's settings.
    EXPECT_NEAR(focal->number, c.focalPixels, 1e-3);
  }
}

// An action without a focal length or model replays the same on a photo
// whether or not the machine ran another photo first: the last run's focal
// length is not this photo's.
TEST_F(SilentRun, AnActionWithoutAFocalLengthOwesNothingToTheRunBefore) {
  const std::string other = Photo("other", Synth::ProjectionKind::kFisheyeEquisolid, 8.0, 1.0);
  const std::string photo = Photo("photo", Synth::ProjectionKind::kRectilinear, 14.0, 1.5);
  std::string text = ReadBytes(folder_.File("photo.action")), kept;
  for (size_t at = 0; at < text.size();) {
    const size_t end = text.find('\n', at);
    const std::string line = text.substr(at, end - at + 1);
    if (!line.starts_with("focL") && !line.starts_with("prjM")) kept += line;
    at = end + 1;
  }
  const std::string action = folder_.File("bare.action");
  WriteBytes(action, kept);

  ScratchFolder config;
  const Environment shared = {{"XDG_CONFIG_HOME", config.Dir()}};
  ASSERT_EQ(RunToEnd({"apply", "-o", folder_.File("other-out.tif"), other}, shared).status, 0);
  const Finished after =
      RunToEnd({"apply", "--action", action, "-o", folder_.File("after.tif"), photo}, shared);
  ASSERT_EQ(after.status, 0) << after.errors;
  const Finished fresh =
      RunToEnd({"apply", "--action", action, "-o", folder_.File("fresh.tif"), photo});
  ASSERT_EQ(fresh.status, 0) << fresh.errors;
  EXPECT_EQ(ReadBytes(folder_.File("after.tif")), ReadBytes(folder_.File("fresh.tif")));
}

// Values no run can use: refused at the start with a failing status and
// nothing written. What the module's terminology rules out (a float that is
// not a number), the host refuses at the action's line; what only the module
// or the photo can judge, the module refuses in its own words. Either way
// the key is named.
TEST_F(SilentRun, UnusableValuesAreRefusedBeforeAnythingIsWritten) {
  const std::string photo = Photo("photo", Synth::ProjectionKind::kFisheyeEquisolid, 10.0, 1.0);
  const std::string before = ReadBytes(photo);
  struct Case {
    const char* line;
    const char* says;
  };
  const Case cases[] = {
      {"focL float nan", "line 3: 'focL' (Focal Length) must be a finite number"},
      {"focL float -inf", "line 3: 'focL' (Focal Length) must be a finite number"},
      {"regM enumerated regM pano",
       "The action's value 'pano' for 'regM' cannot be used: it is not one of steR, merR, "
       "panR, autR."},
      {"focL float 1e9", "for 'focL' cannot be used"},
      {"focL float 0.5", "for 'focL' cannot be used"},
      {"CrpF float 0", "for 'CrpF' cannot be used"},
      {"imgS integer 0", "for 'imgS' cannot be used"},
      {"imgX float nan", "for 'imgX' cannot be used"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.line);
    const std::string action = folder_.File("bad.action");
    WriteBytes(action,
               std::string("archway-action 1\nprjM enumerated prjM fisP\n") + c.line + "\n");
    const std::string listing = folder_.Listing();
    const Finished run =
        RunToEnd({"apply", "--action", action, "-o", folder_.File("bad-out.tif"), photo});
    EXPECT_NE(run.status, 0);
    EXPECT_NE(run.errors.find(c.says), std::string::npos) << run.errors;
    EXPECT_EQ(folder_.Listing(), listing);
  }
  EXPECT_EQ(ReadBytes(photo), before);
}

#endif  // ARCHWAY_REAL_MODULE

}  // namespace
}  // namespace Host
