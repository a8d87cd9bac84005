// The program end to end, run as users run it: with the fake module, whose
// run is fully known, and with the real module when the build has it.

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "framework/plugin/HostSuites.h"
#include "host/actions/ActionFile.h"
#include "host/io/ImageFile.h"
#include "tests/support/TestImages.h"
#include "tools/synth/lib/PhotoWriter.h"
#include "tools/synth/lib/Render.h"

namespace Host {
namespace {

using Tarsa::FourCC;
using testing::ReadBytes;
using testing::ScratchFolder;

struct Result {
  int status = -1;
  std::string output;
  std::string errors;
};

std::string Quoted(const std::string& text) {
  std::string quoted = "'";
  for (char c : text) quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return quoted + "'";
}

// Runs the program with its output captured, in files outside the folder,
// and the module's preferences in a fresh folder of their own, so that no
// run sees another's or the user's.
// environment: words put before the program, as "env -u DISPLAY".
Result RunProgram(const std::vector<std::string>& arguments, const std::string& environment = "") {
  const ScratchFolder capture;
  std::string command =
      environment + " XDG_CONFIG_HOME=" + Quoted(capture.Dir()) + " " + Quoted(ARCHWAY_RUNNER);
  for (const std::string& argument : arguments) command += " " + Quoted(argument);
  const std::string output = capture.File("stdout"), errors = capture.File("stderr");
  const int raw = std::system(
      (command + " >" + Quoted(output) + " 2>" + Quoted(errors) + " </dev/null").c_str());
  Result result;
  result.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
  result.output = ReadBytes(output);
  result.errors = ReadBytes(errors);
  return result;
}

bool HasLine(const std::string& text, const std::string& line) {
  return ("\n" + text).find("\n" + line + "\n") != std::string::npos;
}

struct Sample {
  const char* name;
  ImageMode mode;
  bool transparency;
};

// Every mode in TIFF, the PNG and JPEG ones, with and without transparency.
const Sample kSamples[] = {
    {"gray.tif", ImageMode::kGray, false},    {"rgb.tif", ImageMode::kRgb, true},
    {"cmyk.tif", ImageMode::kCmyk, true},     {"lab.tif", ImageMode::kLab, false},
    {"gray16.tif", ImageMode::kGray16, true}, {"rgb48.tif", ImageMode::kRgb48, false},
    {"lab48.tif", ImageMode::kLab48, true},   {"cmyk64.tif", ImageMode::kCmyk64, false},
    {"gray.png", ImageMode::kGray, false},    {"rgba.png", ImageMode::kRgb, true},
    {"gray16.png", ImageMode::kGray16, true}, {"rgb48.png", ImageMode::kRgb48, false},
    {"gray.jpg", ImageMode::kGray, false},    {"rgb.jpg", ImageMode::kRgb, false},
    {"cmyk.jpg", ImageMode::kCmyk, false},
};

// Writes the samples into the folder; returns their bytes, in order.
std::vector<std::string> WriteSamples(const ScratchFolder& folder) {
  std::vector<std::string> bytes;
  uint32_t seed = 100;
  for (const Sample& sample : kSamples) {
    auto document = testing::RandomDocument(13, 9, sample.mode, sample.transparency, seed++);
    ImageFile::Write(*document, folder.File(sample.name));
    bytes.push_back(ReadBytes(folder.File(sample.name)));
  }
  return bytes;
}

std::string ResultName(const std::string& name) {
  const size_t dot = name.rfind('.');
  return name.substr(0, dot) + "-archway" + name.substr(dot);
}

class ProgramTest : public ::testing::Test {
 protected:
  ScratchFolder folder_;
  const std::string module_ = ARCHWAY_FAKE_MODULE;
};

TEST_F(ProgramTest, ApplyCorrectsAFolderOfEveryKindAndLeavesTheInputsAsTheyWere) {
  const std::vector<std::string> before = WriteSamples(folder_);
  const Result result = RunProgram({"apply", "--module", module_, folder_.File("")});
  ASSERT_EQ(result.status, 0) << result.errors;
  EXPECT_EQ(result.errors, "");
  for (size_t i = 0; i < std::size(kSamples); ++i) {
    const Sample& sample = kSamples[i];
    SCOPED_TRACE(sample.name);
    EXPECT_EQ(ReadBytes(folder_.File(sample.name)), before[i]);
    const auto input = ImageFile::Read(folder_.File(sample.name));
    const auto output = ImageFile::Read(folder_.File(ResultName(sample.name)));
    ASSERT_EQ(output->Mode(), input->Mode());
    ASSERT_EQ(output->PlaneCount(), input->PlaneCount());
    if (std::string(sample.name).ends_with(".jpg")) continue;  // lossy
    // The fake module inverts the colour planes and leaves transparency.
    for (int p = 0; p < input->PlaneCount(); ++p) {
      for (int y = 0; y < input->Height(); ++y) {
        for (int x = 0; x < input->Width(); ++x) {
          const int v = input->Sample(p, x, y);
          const int expected = p < input->ColourPlanes() ? input->MaxSample() - v : v;
          ASSERT_EQ(output->Sample(p, x, y), expected) << p << " " << x << " " << y;
        }
      }
    }
  }
}

TEST_F(ProgramTest, RefusalsOfTheModuleReachTheUserAndWriteNothing) {
  auto document = testing::RandomDocument(8, 8, ImageMode::kRgb, false, 1);
  const std::string input = folder_.File("photo.tif");
  ImageFile::Write(*document, input);
  const std::string listing = folder_.Listing();

  Result result = RunProgram({"apply", "--module", module_, "--host-version", "17", input});
  EXPECT_NE(result.status, 0);
  EXPECT_TRUE(
      HasLine(result.errors, "This feature is not supported by the current version of Quillmark."))
      << result.errors;
  result = RunProgram({"apply", "--module", module_, "--no-gpu", input});
  EXPECT_NE(result.status, 0);
  EXPECT_NE(result.errors.find("graphics processor"), std::string::npos) << result.errors;
  // The interactive run asks for parameters first; this module has no
  // workspace, so a display need only be named for the host to go on.
  result = RunProgram({"edit", "--module", module_, input}, "env DISPLAY=:99");
  EXPECT_NE(result.status, 0);
  EXPECT_NE(result.errors.find("stopped at parameters"), std::string::npos) << result.errors;
  EXPECT_EQ(folder_.Listing(), listing);
}

TEST_F(ProgramTest, SavedActionsReplay) {
  auto document = testing::RandomDocument(8, 8, ImageMode::kGray, false, 2);
  const std::string input = folder_.File("photo.png");
  ImageFile::Write(*document, input);
  const std::string first = folder_.File("first.action");
  const std::string second = folder_.File("second.action");

  Result result = RunProgram({"apply", "--module", module_, "--save-action", first, input});
  ASSERT_EQ(result.status, 0) << result.errors;
  const Descriptor saved = ActionFile::Read(first);
  EXPECT_EQ(saved.Find(FourCC("runs"))->integer, 1);
  EXPECT_EQ(saved.Find(FourCC("plip"))->integer, 0);  // nothing to replay yet
  const std::u16string title = u"photo.png";
  EXPECT_EQ(saved.Find(FourCC("titl"))->data,
            std::vector<uint8_t>(reinterpret_cast<const uint8_t*>(title.data()),
                                 reinterpret_cast<const uint8_t*>(title.data() + title.size())));

  result = RunProgram({"apply", "--module", module_, "--action", first, "--save-action", second,
                       "-o", folder_.File("again.png"), input});
  ASSERT_EQ(result.status, 0) << result.errors;
  const Descriptor replayed = ActionFile::Read(second);
  EXPECT_EQ(replayed.Find(FourCC("runs"))->integer, 2);
  EXPECT_EQ(replayed.Find(FourCC("plip"))->integer, 1);
  EXPECT_EQ(ReadBytes(folder_.File("again.png")), ReadBytes(folder_.File("photo-archway.png")));

  // A damaged action is refused before any image is touched.
  testing::WriteBytes(first, "archway-action 1\nruns integer one\n");
  result = RunProgram({"apply", "--module", module_, "--action", first, input});
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.errors.find(first + "': line 2:"), std::string::npos) << result.errors;
}

TEST_F(ProgramTest, FailuresAndCtrlCLeaveNoOutput) {
  auto document = testing::RandomDocument(8, 8, ImageMode::kRgb48, false, 3);
  const std::string good = folder_.File("good.tif");
  ImageFile::Write(*document, good);
  const std::string damaged = folder_.File("damaged.tif");
  testing::WriteBytes(damaged, ReadBytes(good).substr(0, 100));

  // A damaged image fails alone; the others are still corrected.
  Result result = RunProgram({"apply", "--module", module_, damaged, good});
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.errors.find(damaged), std::string::npos) << result.errors;
  EXPECT_TRUE(std::filesystem::exists(folder_.File("good-archway.tif")));
  EXPECT_FALSE(std::filesystem::exists(folder_.File("damaged-archway.tif")));
  std::filesystem::remove(folder_.File("good-archway.tif"));

  Descriptor steer;
  steer.PutInteger(FourCC("fail"), 1);
  ActionFile::Write(steer, folder_.File("fail.action"));
  Descriptor interrupt;
  interrupt.PutInteger(FourCC("intr"), 1);
  ActionFile::Write(interrupt, folder_.File("intr.action"));
  const std::string listing = folder_.Listing();
  result =
      RunProgram({"apply", "--module", module_, "--action", folder_.File("fail.action"), good});
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.errors.find("not corrected: the module stopped at start"), std::string::npos)
      << result.errors;

  // The module raises SIGINT itself, as Ctrl-C would, then asks for the abort.
  result = RunProgram(
      {"apply", "--module", module_, "--action", folder_.File("intr.action"), good, damaged});
  EXPECT_EQ(result.status, 130);
  EXPECT_NE(result.errors.find("interrupted"), std::string::npos) << result.errors;
  EXPECT_EQ(result.errors.find("damaged"), std::string::npos) << "a later image was started";
  EXPECT_EQ(folder_.Listing(), listing);  // no result and no temporary file

  result = RunProgram({"apply", "--module", folder_.File("missing.so"), good});
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.errors.find("missing.so"), std::string::npos) << result.errors;
  // A result the chosen format cannot hold is refused before the module runs.
  ImageFile::Write(*testing::RandomDocument(4, 4, ImageMode::kCmyk, false, 4),
                   folder_.File("cmyk.tif"));
  result = RunProgram(
      {"apply", "--module", module_, "-o", folder_.File("out.png"), folder_.File("cmyk.tif")});
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.errors.find("PNG cannot hold"), std::string::npos) << result.errors;
  EXPECT_FALSE(std::filesystem::exists(folder_.File("out.png")));
}

// Edit needs a window and says so before anything is read; apply needs no
// display at all.
TEST_F(ProgramTest, WithoutADisplayEditRefusesAndApplyWorks) {
  const std::vector<std::string> before = WriteSamples(folder_);
  const std::string input = folder_.File(kSamples[1].name);
  const std::string noDisplay = "env -u DISPLAY -u WAYLAND_DISPLAY";
  Result result = RunProgram({"edit", "--module", module_, input}, noDisplay);
  EXPECT_NE(result.status, 0);
  EXPECT_NE(result.errors.find("no display is set"), std::string::npos) << result.errors;
  EXPECT_FALSE(std::filesystem::exists(folder_.File(ResultName(kSamples[1].name))));
  EXPECT_EQ(ReadBytes(input), before[1]);
  result = RunProgram({"apply", "--module", module_, input}, noDisplay);
  EXPECT_EQ(result.status, 0) << result.errors;
  EXPECT_TRUE(std::filesystem::exists(folder_.File(ResultName(kSamples[1].name))));
}

TEST_F(ProgramTest, HelpDescribesEveryOption) {
  const Result result = RunProgram({"--help"});
  EXPECT_EQ(result.status, 0);
  for (const char* option : {"apply", "edit", "--action", "--save-action", "--output", "--module",
                             "--no-gpu", "--host-version", "ARCHWAY_MODULE", "130"}) {
    EXPECT_NE(result.output.find(option), std::string::npos) << option;
  }
  EXPECT_EQ(RunProgram({"apply"}).status, 2);
}

#ifdef ARCHWAY_REAL_MODULE
// The real module, as far as its run flow goes today: every kind of file
// reaches its start, its refusals come in its own words, inputs stay as
// they were.
TEST_F(ProgramTest, TheRealModuleIsReachedForEveryKindOfFile) {
  const std::vector<std::string> before = WriteSamples(folder_);
  const std::string module = ARCHWAY_REAL_MODULE;
  for (size_t i = 0; i < std::size(kSamples); ++i) {
    const std::string input = folder_.File(kSamples[i].name);
    SCOPED_TRACE(kSamples[i].name);
    Result result = RunProgram({"apply", "--module", module, input});
    EXPECT_TRUE(result.status == 0 || result.errors.find("stopped at start") != std::string::npos)
        << result.errors;
    EXPECT_EQ(std::filesystem::exists(folder_.File(ResultName(kSamples[i].name))),
              result.status == 0);
    result = RunProgram({"apply", "--module", module, "--host-version", "17", input});
    EXPECT_NE(result.status, 0);
    // The module words its refusals itself, in its alert's form.
    EXPECT_NE(
        result.errors.find("This feature is not supported by the current version of Quillmark.\n"),
        std::string::npos)
        << result.errors;
    result = RunProgram({"apply", "--module", module, "--no-gpu", input});
    EXPECT_NE(result.status, 0);
    EXPECT_NE(result.errors.find("This feature requires graphics processor acceleration. Please "
                                 "check the Performance Preferences and verify that 'Use Graphics "
                                 "Processor' is enabled."),
              std::string::npos)
        << result.errors;
    EXPECT_EQ(ReadBytes(input), before[i]);
  }
}
// A scripted run resolves the projection model (and the focal length) by
// the module's rules, and the descriptor the host saves shows it: Auto stays Auto when a shipped
// lens profile matches the photo's camera and lens, or when the photo is a
// panorama with its own record; with neither it falls back to fisheye. Full
// Spherical holds on a 2:1 picture and falls back on any other.
TEST_F(ProgramTest, ScriptedRunsResolveTheProjectionModel) {
  const std::string module = ARCHWAY_REAL_MODULE;
  struct Case {
    const char* name;
    Synth::ProjectionKind projection;
    int width, height;
    const char* make;
    const char* model;
    const char* lens;
    uint32_t asked;     // prjM of the action
    uint32_t resolved;  // prjM of the saved descriptor
  };
  const Case cases[] = {
      {"profile", Synth::ProjectionKind::kFisheyeEquisolid, 300, 200, "Orvane Test", "TC-1 Full",
       "Orvane Test 8mm F3.5 Fisheye", FourCC("autP"), FourCC("autP")},
      {"unknown", Synth::ProjectionKind::kFisheyeEquisolid, 300, 200, "Archway", "Synthetic Camera",
       "", FourCC("autP"), FourCC("fisP")},
      {"panorama", Synth::ProjectionKind::kCylindrical, 400, 200, "Archway", "Synthetic Camera", "",
       FourCC("autP"), FourCC("autP")},
      {"sphere", Synth::ProjectionKind::kEquirectangular, 400, 200, "Archway", "Synthetic Camera",
       "", FourCC("fusP"), FourCC("fusP")},
      {"notsphere", Synth::ProjectionKind::kEquirectangular, 300, 200, "Archway",
       "Synthetic Camera", "", FourCC("fusP"), FourCC("fisP")},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    Synth::CameraSpec camera;
    camera.projection = c.projection;
    camera.focalMm = 8.0;
    camera.width = c.width;
    camera.height = c.height;
    camera.samplesPerAxis = 1;
    camera.make = c.make;
    camera.model = c.model;
    camera.lens = c.lens;
    const std::string photo = folder_.File(std::string(c.name) + ".tif");
    Synth::PhotoWriter::Write(Synth::Render({Synth::SceneKind::kRoom}, camera), camera, photo);
    const std::string asked = folder_.File(std::string(c.name) + ".action");
    Descriptor action;
    action.PutEnumerated(FourCC("prjM"), FourCC("prjM"), c.asked);
    ActionFile::Write(action, asked);
    const std::string saved = folder_.File(std::string(c.name) + "-saved.action");
    const Result result =
        RunProgram({"apply", "--module", module, "--action", asked, "--save-action", saved, photo});
    ASSERT_EQ(result.status, 0) << result.errors;
    const Descriptor descriptor = ActionFile::Read(saved);
    const auto* model = descriptor.Find(FourCC("prjM"));
    ASSERT_NE(model, nullptr);
    EXPECT_EQ(model->enumValue, c.resolved);
    // The focal length the run rendered at: the lens profile's own, else the
    // metadata's, both the generator's 8 mm over the frame's diagonal. A
    // panorama's comes from its own record.
    const auto* focal = descriptor.Find(FourCC("focL"));
    ASSERT_NE(focal, nullptr);
    if (c.projection == Synth::ProjectionKind::kFisheyeEquisolid) {
      const double truth = 8.0 * std::hypot(c.width, c.height) / std::hypot(36.0, 24.0);
      EXPECT_NEAR(focal->number, truth, 1e-3);  // single precision in the module
    }
  }
}
#endif

}  // namespace
}  // namespace Host
