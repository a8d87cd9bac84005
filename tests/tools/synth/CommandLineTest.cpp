#include "tools/synth/lib/CommandLine.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tools/synth/lib/Render.h"
#include "tools/synth/lib/SynthError.h"

namespace Synth {
namespace {

TEST(CommandLine, ReadsEveryOption) {
  const CommandLine line = CommandLine::Parse({"--scene",    "facade",  "--projection=fisheye-poly",
                                               "--focal-mm", "10.5",    "--crop",
                                               "1.5",        "--size",  "640x480",
                                               "--depth",    "16",      "--gray",
                                               "--make",     "M",       "--model",
                                               "N",          "--lens",  "L",
                                               "--yaw",      "10",      "--pitch=-5",
                                               "--roll",     "2",       "--at",
                                               "1,2,3",      "--k1",    "-0.02",
                                               "-o",         "out.tif", "--truth",
                                               "out.lines"});
  EXPECT_EQ(line.scene.kind, SceneKind::kFacade);
  EXPECT_EQ(line.camera.projection, ProjectionKind::kFisheyePoly);
  EXPECT_EQ(line.camera.focalMm, 10.5);
  EXPECT_EQ(line.camera.cropFactor, 1.5);
  EXPECT_EQ(line.camera.width, 640);
  EXPECT_EQ(line.camera.height, 480);
  EXPECT_EQ(line.camera.depth, 16);
  EXPECT_EQ(line.camera.colour, Host::ColourModel::kGray);
  EXPECT_EQ(line.camera.make + line.camera.model + line.camera.lens, "MNL");
  EXPECT_EQ(line.camera.pitch, -5.0);
  EXPECT_EQ(line.camera.position->z, 3.0);
  // One coefficient given: the others are 0, not the kind's defaults.
  EXPECT_EQ(line.camera.distortion->k1, -0.02);
  EXPECT_EQ(line.camera.distortion->k2, 0.0);
  EXPECT_EQ(line.output, "out.tif");
  EXPECT_EQ(line.truth, "out.lines");
}

// Without --action-lines the action is the scene's own choice.
TEST(CommandLine, ActionLinesOnlyWhenAsked) {
  const CommandLine own = CommandLine::Parse({"--scene", "segments", "-o", "a.tif"});
  EXPECT_EQ(own.scene.kind, SceneKind::kSegments);
  EXPECT_FALSE(own.actionLines.has_value());
  EXPECT_EQ(CommandLine::Parse({"--action-lines", "9", "-o", "a.tif"}).actionLines, 9);
}

// Cut-short and garbled command lines are refused with the fault named.
TEST(CommandLine, NamesTheFault) {
  const struct {
    std::vector<std::string> arguments;
    const char* says;
  } cases[] = {
      {{"-o", "a.tif", "--size"}, "--size needs a value"},
      {{"-o", "a.tif", "--size", "640x"}, "--size needs a whole number, not ''"},
      {{"-o", "a.tif", "--size", "640"}, "--size needs WIDTHxHEIGHT"},
      {{"-o", "a.tif", "--focal-mm", "8mm"}, "--focal-mm needs a number, not '8mm'"},
      {{"-o", "a.tif", "--yaw", "nan"}, "--yaw needs a number"},
      {{"-o", "a.tif", "--at", "1,2"}, "--at needs X,Y,Z"},
      {{"-o", "a.tif", "--projection", "pinhole"}, "unknown projection 'pinhole'"},
      {{"-o", "a.tif", "--scene", "garden"}, "unknown scene 'garden'"},
      {{"-o", "a.tif", "--mode", "hsv"}, "unknown mode 'hsv'"},
      {{"-o", "a.tif", "--fisheye"}, "unknown option '--fisheye'"},
      {{"-o", "a.tif", "extra.tif"}, "unexpected argument 'extra.tif'"},
      {{"--scene", "room"}, "no output file given"},
      {{"-o"}, "-o needs a value"},
  };
  for (const auto& c : cases) {
    try {
      CommandLine::Parse(c.arguments);
      ADD_FAILURE() << "accepted: " << c.says;
    } catch (const SynthError& error) {
      EXPECT_NE(std::string(error.what()).find(c.says), std::string::npos) << error.what();
    }
  }
}

TEST(CommandLine, RenderRefusesValuesOutOfRange) {
  for (const char* bad : {"--depth=12", "--size=0x10", "--focal-mm=0", "--crop=-1",
                          "--max-angle=200", "--samples=0"}) {
    const CommandLine line = CommandLine::Parse({bad, "-o", "a.tif"});
    EXPECT_THROW(Render(line.scene, line.camera), SynthError) << bad;
  }
}

}  // namespace
}  // namespace Synth
