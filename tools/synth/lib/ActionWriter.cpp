#include "tools/synth/lib/ActionWriter.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "filter/params/ConstraintBlob.h"
#include "filter/params/Descriptor.h"
#include "host/actions/ActionFile.h"
#include "tools/synth/lib/SynthError.h"

namespace Synth {

namespace {

// Kinds as the constraint blob numbers them.
constexpr int kUnfixed = 1;
constexpr int kVertical = 3;

// An edge counts as vertical when it leans less than about half a degree.
constexpr double kVerticalCosine = 0.99996;

double ChordLength(const TruthSegment& segment) {
  const Point2& a = segment.points.front();
  const Point2& b = segment.points.back();
  return std::hypot(b.x - a.x, b.y - a.y);
}

bool IsVertical(const TruthSegment& segment) {
  const Vec3 direction = segment.end - segment.start;
  const double length = std::sqrt(Dot(direction, direction));
  return length > 0 && std::fabs(direction.z) / length > kVerticalCosine;
}

}  // namespace

Host::Descriptor ActionWriter::Make(const RenderResult& photo, const CameraSpec& camera,
                                    int lineCount) {
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

  std::vector<Project::BlobRecord> records;
  for (const TruthSegment* segment : segments) {
    // Ends a little inside the run: a run's end may touch the frame, where
    // the mesh stops.
    const std::size_t inset = segment->points.size() / 20;
    const Point2& a = segment->points[inset];
    const Point2& b = segment->points[segment->points.size() - 1 - inset];
    Project::BlobLine line;
    line.x0 = static_cast<float>(a.x);
    line.y0 = static_cast<float>(a.y);
    line.x1 = static_cast<float>(b.x);
    line.y1 = static_cast<float>(b.y);
    line.kind = IsVertical(*segment) ? kVertical : kUnfixed;
    records.emplace_back(line);
  }

  Host::Descriptor descriptor;
  descriptor.PutEnumerated(Project::DescriptorKey::kProjectionModel,
                           Project::DescriptorKey::kProjectionModel, model);
  descriptor.PutFloat(Project::DescriptorKey::kFocalLength, FocalPixels(camera));
  const std::vector<std::uint8_t> blob = Project::ConstraintBlob::Encode(records);
  descriptor.PutData(Project::DescriptorKey::kConstraintData, blob);
  return descriptor;
}

void ActionWriter::Write(const RenderResult& photo, const CameraSpec& camera, int lineCount,
                         const std::string& path) {
  Host::ActionFile::Write(Make(photo, camera, lineCount), path);
}

}  // namespace Synth
