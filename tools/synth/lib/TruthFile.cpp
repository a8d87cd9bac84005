#include "tools/synth/lib/TruthFile.h"

#include <cstdio>
#include <fstream>

#include "host/io/HostError.h"
#include "host/io/TemporaryFile.h"

namespace Synth {
namespace {

void Append(std::string* text, const char* format, double value) {
  char number[40];
  std::snprintf(number, sizeof number, format, value);
  *text += number;
}

}  // namespace

std::string TruthFile::Format(const RenderResult& photo) {
  const Camera& camera = photo.camera;
  const Projection& lens = camera.Lens();
  std::string text = "# archway-synth ground truth\n";
  text += "# image " + std::to_string(camera.Width()) + " " + std::to_string(camera.Height()) +
          " projection " + ProjectionName(lens.Kind());
  Append(&text, " focal %.9g", lens.Focal());
  Append(&text, " centre %.9g", lens.Centre().x);
  Append(&text, " %.9g\n", lens.Centre().y);
  text += "# id x0 y0 z0 x1 y1 z1 n then n image points x y\n";
  for (const TruthSegment& segment : photo.truth) {
    text += segment.id;
    for (const Vec3& end : {segment.start, segment.end}) {
      Append(&text, " %.9g", end.x);
      Append(&text, " %.9g", end.y);
      Append(&text, " %.9g", end.z);
    }
    text.append(1, ' ').append(std::to_string(segment.points.size()));
    for (const Point2& point : segment.points) {
      Append(&text, " %.4f", point.x);
      Append(&text, " %.4f", point.y);
    }
    text += "\n";
  }
  return text;
}

void TruthFile::Write(const RenderResult& photo, const std::string& path) {
  Host::TemporaryFile file(path);
  const std::string text = Format(photo);
  std::ofstream out(file.Path(), std::ios::binary | std::ios::trunc);
  out << text;
  out.close();
  if (!out) throw Host::HostError(path, "cannot write the ground truth");
  file.Commit();
}

}  // namespace Synth
