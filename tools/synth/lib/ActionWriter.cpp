#include "tools/synth/lib/ActionWriter.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "host/actions/ActionFile.h"
#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "tools/synth/lib/SynthError.h"

namespace Synth {

namespace {

// Kinds as the constraint blob numbers them.
constexpr int kUnfixed = 1;
constexpr int kHorizontal = 2;
constexpr int kVertical = 3;

// An edge counts as vertical when it leans less than about half a degree,
// and as level when it is that close to square to both the vertical and the
// camera's heading.
constexpr double kVerticalCosine = 0.99996;
constexpr double kLevelCosine = 0.0087;
// Image runs shorter than this, end to end, are not worth a constraint.
constexpr double kShortestRun = 40.0;

double ChordLength(const TruthSegment& segment) {
  const Point2& a = segment.points.front();
  const Point2& b = segment.points.back();
  return std::hypot(b.x - a.x, b.y - a.y);
}

Vec3 Direction(const TruthSegment& segment) {
  const Vec3 direction = segment.end - segment.start;
  const double length = Length(direction);
  return length > 0 ? (1.0 / length) * direction : Vec3{};
}

bool IsVertical(const TruthSegment& segment) {
  return std::fabs(Direction(segment).z) > kVerticalCosine;
}

bool IsLevel(const TruthSegment& segment, const Camera& camera) {
  const Vec3 forward = camera.ToWorld({1.0, 0.0, 0.0});
  const double flat = std::hypot(forward.x, forward.y);
  if (flat < kLevelCosine) return false;  // looking straight up or down: no heading
  const Vec3 heading{forward.x / flat, forward.y / flat, 0.0};
  const Vec3 direction = Direction(segment);
  return Length(direction) > 0 && std::fabs(direction.z) < kLevelCosine &&
         std::fabs(Dot(direction, heading)) < kLevelCosine;
}

// The edge's name without the run number a split edge carries.
std::string EdgeName(const TruthSegment& segment) {
  return segment.id.substr(0, segment.id.find('#'));
}

bool EndsWith(const std::string& text, const std::string& tail) {
  return text.size() >= tail.size() &&
         text.compare(text.size() - tail.size(), tail.size(), tail) == 0;
}

// A room edge a photographer would mark: a wall's own outline (its corners
// with the other walls, its top and foot) or a window or door frame.
bool IsRoomStructure(const std::string& name) {
  if (name.find(".window.frame.") != std::string::npos) return true;
  if (name.find(".door.frame.") != std::string::npos) return true;
  const std::size_t dot = name.find('.');
  return dot != std::string::npos && name.find('.', dot + 1) == std::string::npos &&
         EndsWith(name.substr(0, dot), "-wall");
}

Project::BlobLine LineOf(const TruthSegment& segment, int kind, double width, double height) {
  // An end that touches the frame, where the mesh stops, is taken a little
  // inside the run; an end within the picture is the edge's own end, as a
  // user draws it, so the whole edge is held.
  const auto nearFrame = [&](const Point2& p) {
    constexpr double kFrame = 2.0;  // pixels
    return p.x < kFrame || p.y < kFrame || p.x > width - kFrame || p.y > height - kFrame;
  };
  const std::size_t inset = segment.points.size() / 20;
  const Point2& a = segment.points[nearFrame(segment.points.front()) ? inset : 0];
  const Point2& b =
      segment.points[segment.points.size() - 1 - (nearFrame(segment.points.back()) ? inset : 0)];
  Project::BlobLine line;
  line.x0 = static_cast<float>(a.x);
  line.y0 = static_cast<float>(a.y);
  line.x1 = static_cast<float>(b.x);
  line.y1 = static_cast<float>(b.y);
  line.kind = kind;
  return line;
}

Host::Descriptor Describe(const CameraSpec& camera, const std::vector<Project::BlobRecord>& lines) {
  std::uint32_t model;
  switch (camera.projection) {
    case ProjectionKind::kRectilinear:
      model = Project::DescriptorValue::kPerspective;
      break;
    case ProjectionKind::kFisheyeEquisolid:
      model = Project::DescriptorValue::kFisheye;
      break;
    default:
      throw SynthError(
          "an action can be written for rectilinear and equisolid fisheye photographs only");
  }
  Host::Descriptor descriptor;
  descriptor.PutEnumerated(Project::DescriptorKey::kProjectionModel,
                           Project::DescriptorKey::kProjectionModel, model);
  descriptor.PutFloat(Project::DescriptorKey::kFocalLength, FocalPixels(camera));
  const std::vector<std::uint8_t> blob = Project::ConstraintBlob::Encode(lines);
  descriptor.PutData(Project::DescriptorKey::kConstraintData, blob);
  return descriptor;
}

}  // namespace

Host::Descriptor ActionWriter::Make(const RenderResult& photo, const SceneSpec& scene,
                                    const CameraSpec& camera) {
  const bool room = scene.kind == SceneKind::kRoom;
  if (!room && scene.kind != SceneKind::kSegments) return Make(photo, camera, 6);
  std::vector<Project::BlobRecord> lines;
  for (const TruthSegment& segment : photo.truth) {
    if (segment.points.size() < 2 || ChordLength(segment) < kShortestRun) continue;
    const std::string name = EdgeName(segment);
    if (room ? !IsRoomStructure(name) : name.rfind("bar.", 0) != 0) continue;
    int kind = kUnfixed;
    if (IsVertical(segment)) {
      kind = kVertical;
    } else if (!room && IsLevel(segment, photo.camera)) {
      kind = kHorizontal;
    }
    lines.emplace_back(LineOf(segment, kind, photo.camera.Width(), photo.camera.Height()));
  }
  return Describe(camera, lines);
}

Host::Descriptor ActionWriter::Make(const RenderResult& photo, const CameraSpec& camera,
                                    int lineCount) {
  // The longest runs first, verticals and the rest taken in turn so that
  // both kinds are in; short runs say little about straightness.
  std::vector<const TruthSegment*> verticals, others;
  const double shortest = 0.1 * std::min(camera.width, camera.height);
  for (const TruthSegment& segment : photo.truth) {
    if (segment.points.size() < 8 || ChordLength(segment) < shortest) continue;
    (IsVertical(segment) ? verticals : others).push_back(&segment);
  }
  const auto longer = [](const auto* a, const auto* b) {
    return ChordLength(*a) > ChordLength(*b);
  };
  std::stable_sort(verticals.begin(), verticals.end(), longer);
  std::stable_sort(others.begin(), others.end(), longer);
  std::vector<const TruthSegment*> segments;
  for (std::size_t k = 0; k < std::max(verticals.size(), others.size()); ++k) {
    if (k < verticals.size()) segments.push_back(verticals[k]);
    if (k < others.size()) segments.push_back(others[k]);
  }
  if (static_cast<int>(segments.size()) > lineCount) segments.resize(std::max(lineCount, 0));

  std::vector<Project::BlobRecord> lines;
  for (const TruthSegment* segment : segments) {
    lines.emplace_back(LineOf(*segment, IsVertical(*segment) ? kVertical : kUnfixed,
                              photo.camera.Width(), photo.camera.Height()));
  }
  return Describe(camera, lines);
}

void ActionWriter::Write(const RenderResult& photo, const SceneSpec& scene,
                         const CameraSpec& camera, const std::string& path) {
  Host::ActionFile::Write(Make(photo, scene, camera), path);
}

void ActionWriter::Write(const RenderResult& photo, const CameraSpec& camera, int lineCount,
                         const std::string& path) {
  Host::ActionFile::Write(Make(photo, camera, lineCount), path);
}

}  // namespace Synth
