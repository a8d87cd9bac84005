#include "tools/synth/lib/CommandLine.h"

#include <charconv>
#include <cmath>
#include <functional>
#include <map>

#include "tools/synth/lib/SynthError.h"

namespace Synth {
namespace {

double ParseNumber(const std::string& option, const std::string& text) {
  double value = 0.0;
  const char* end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (text.empty() || error != std::errc() || stop != end || !std::isfinite(value)) {
    throw SynthError(option + " needs a number, not '" + text + "'");
  }
  return value;
}

int ParseWhole(const std::string& option, const std::string& text) {
  int value = 0;
  const char* end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (text.empty() || error != std::errc() || stop != end) {
    throw SynthError(option + " needs a whole number, not '" + text + "'");
  }
  return value;
}

void ParseSize(const std::string& text, CameraSpec* camera) {
  const size_t cross = text.find('x');
  if (cross == std::string::npos) {
    throw SynthError("--size needs WIDTHxHEIGHT, e.g. 1200x800, not '" + text + "'");
  }
  camera->width = ParseWhole("--size", text.substr(0, cross));
  camera->height = ParseWhole("--size", text.substr(cross + 1));
}

Vec3 ParsePoint(const std::string& text) {
  const size_t first = text.find(',');
  const size_t second = first == std::string::npos ? first : text.find(',', first + 1);
  if (second == std::string::npos)
    throw SynthError("--at needs X,Y,Z in metres, not '" + text + "'");
  return {ParseNumber("--at", text.substr(0, first)),
          ParseNumber("--at", text.substr(first + 1, second - first - 1)),
          ParseNumber("--at", text.substr(second + 1))};
}

}  // namespace

CommandLine CommandLine::Parse(const std::vector<std::string>& arguments) {
  CommandLine line;
  CameraSpec& c = line.camera;
  bool ownDistortion = false;
  auto coefficient = [&](double Distortion::*field) {
    return [&, field](const std::string& option, const std::string& value) {
      if (!ownDistortion) c.distortion = Distortion{};
      ownDistortion = true;
      (*c.distortion).*field = ParseNumber(option, value);
    };
  };
  using Handler = std::function<void(const std::string&, const std::string&)>;
  const std::map<std::string, Handler> valued = {
      {"--scene",
       [&](const std::string&, const std::string& v) {
         if (!SceneFromName(v, &line.scene.kind)) {
           throw SynthError("unknown scene '" + v + "' (room, facade, checker or segments)");
         }
       }},
      {"--projection",
       [&](const std::string&, const std::string& v) {
         if (!ProjectionFromName(v, &c.projection)) {
           throw SynthError("unknown projection '" + v + "'; see --help");
         }
       }},
      {"--focal-mm",
       [&](const std::string& o, const std::string& v) { c.focalMm = ParseNumber(o, v); }},
      {"--crop",
       [&](const std::string& o, const std::string& v) { c.cropFactor = ParseNumber(o, v); }},
      {"--size", [&](const std::string&, const std::string& v) { ParseSize(v, &c); }},
      {"--depth", [&](const std::string& o, const std::string& v) { c.depth = ParseWhole(o, v); }},
      {"--mode",
       [&](const std::string&, const std::string& v) {
         const std::map<std::string, Host::ColourModel> models = {
             {"rgb", Host::ColourModel::kRgb},
             {"gray", Host::ColourModel::kGray},
             {"cmyk", Host::ColourModel::kCmyk},
             {"lab", Host::ColourModel::kLab}};
         const auto found = models.find(v);
         if (found == models.end())
           throw SynthError("unknown mode '" + v + "' (rgb, gray, cmyk or lab)");
         c.colour = found->second;
       }},
      {"--make", [&](const std::string&, const std::string& v) { c.make = v; }},
      {"--model", [&](const std::string&, const std::string& v) { c.model = v; }},
      {"--lens", [&](const std::string&, const std::string& v) { c.lens = v; }},
      {"--yaw", [&](const std::string& o, const std::string& v) { c.yaw = ParseNumber(o, v); }},
      {"--pitch", [&](const std::string& o, const std::string& v) { c.pitch = ParseNumber(o, v); }},
      {"--roll", [&](const std::string& o, const std::string& v) { c.roll = ParseNumber(o, v); }},
      {"--at", [&](const std::string&, const std::string& v) { c.position = ParsePoint(v); }},
      {"--k1", coefficient(&Distortion::k1)},
      {"--k2", coefficient(&Distortion::k2)},
      {"--k3", coefficient(&Distortion::k3)},
      {"--t1", coefficient(&Distortion::t1)},
      {"--t2", coefficient(&Distortion::t2)},
      {"--max-angle",
       [&](const std::string& o, const std::string& v) { c.maxAngle = ParseNumber(o, v); }},
      {"--samples",
       [&](const std::string& o, const std::string& v) { c.samplesPerAxis = ParseWhole(o, v); }},
      {"-o", [&](const std::string&, const std::string& v) { line.output = v; }},
      {"--output", [&](const std::string&, const std::string& v) { line.output = v; }},
      {"--truth", [&](const std::string&, const std::string& v) { line.truth = v; }},
      {"--action", [&](const std::string&, const std::string& v) { line.action = v; }},
      {"--action-lines",
       [&](const std::string& o, const std::string& v) { line.actionLines = ParseWhole(o, v); }},
  };

  for (size_t i = 0; i < arguments.size(); ++i) {
    std::string option = arguments[i];
    if (option == "--help" || option == "-h") {
      line.help = true;
      return line;
    }
    if (option == "--gray") {
      c.colour = Host::ColourModel::kGray;
      continue;
    }
    std::string value;
    bool hasValue = false;
    const size_t equals = option.find('=');
    if (option.rfind("--", 0) == 0 && equals != std::string::npos) {
      value = option.substr(equals + 1);
      option.resize(equals);
      hasValue = true;
    }
    const auto handler = valued.find(option);
    if (handler == valued.end()) {
      throw SynthError(option.rfind('-', 0) == 0 ? "unknown option '" + option + "'"
                                                 : "unexpected argument '" + option + "'");
    }
    if (!hasValue) {
      if (i + 1 >= arguments.size()) throw SynthError(option + " needs a value");
      value = arguments[++i];
    }
    handler->second(option, value);
  }
  if (line.output.empty()) throw SynthError("no output file given (-o FILE)");
  return line;
}

const char* CommandLine::Usage() {
  return R"(Usage: archway-synth [options] -o FILE

Renders a synthetic photograph of a known scene through a chosen camera and
writes it as TIFF, PNG or JPEG (by FILE's extension) with EXIF and, for
panoramas, the panorama XMP record. With --truth it also writes the image
curves of the scene's visible straight edges.

  --scene NAME                     room (default), facade, checker or
                                   segments
  --projection NAME                rectilinear (default), fisheye-equisolid,
                                   fisheye-equidistant, cylindrical,
                                   equirectangular, radial, tangential,
                                   fisheye-poly
  --focal-mm F                     lens focal length in mm (24)
  --crop C                         body crop factor (1); the image diagonal
                                   is the sensor diagonal, 43.27 mm / C
  --size WxH                       image size in pixels (1200x800)
  --depth 8|16                     bits a sample (8)
  --gray                           gray instead of RGB
  --mode rgb|gray|cmyk|lab         colour mode (rgb)
  --make M --model M --lens L      EXIF names (Archway, Synthetic Camera,
                                   "Synthetic <F>mm <projection>")
  --yaw/--pitch/--roll DEG         heading right, view up, roll (0)
  --at X,Y,Z                       camera position in metres (scene's own)
  --k1 --k2 --k3 --t1 --t2 V       distortion coefficients; giving any
                                   replaces the kind's defaults, the rest 0
                                   (radial: k1 -0.18 k2 0.03; tangential:
                                   k1 -0.12 k2 0.02 t1 0.004 t2 -0.003;
                                   fisheye-poly: k1 -0.04 k2 0.004)
  --max-angle DEG                  fisheye field from the axis (90)
  --samples N                      rays a pixel per axis (4)
  -o, --output FILE                the photograph
  --truth FILE                     the ground truth, one line per edge run:
                                   id x0 y0 z0 x1 y1 z1 n then n points x y
  --action FILE                    an action that corrects the photograph:
                                   its camera's model and focal length and
                                   line constraints on the edges a
                                   photographer would mark (room: wall
                                   corners, wall tops and feet, window and
                                   door frames; segments: every bar; facade
                                   and checker: the 6 longest), vertical
                                   ones marked vertical, level bars level
                                   (rectilinear and fisheye-equisolid only)
  --action-lines N                 instead, the N longest edges, vertical
                                   ones marked vertical
  -h, --help                       this text

An equirectangular image spans 180 degrees over its height (2:1 for the
whole sphere) whatever the focal length.
)";
}

}  // namespace Synth
