#include "tools/synth/lib/ActionWriter.h"

#include <gtest/gtest.h>

#include <cmath>
#include <variant>

#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "tools/synth/lib/SynthError.h"

namespace Synth {
namespace {

// The nearest distance from a point to a traced curve, in pixels.
double DistanceToCurve(const TruthSegment& segment, double x, double y) {
  double best = 1e30;
  for (const Point2& p : segment.points) best = std::min(best, std::hypot(p.x - x, p.y - y));
  return best;
}

// The action of a fisheye room: the camera's model and focal length, and
// lines whose ends lie on the scene's straight edges, verticals among them.
TEST(ActionWriter, ConstrainsTheSceneEdges) {
  CameraSpec camera;
  camera.projection = ProjectionKind::kFisheyeEquisolid;
  camera.focalMm = 10.0;
  camera.width = 450;
  camera.height = 300;
  camera.samplesPerAxis = 1;
  const RenderResult photo = Render({SceneKind::kRoom}, camera);
  const Host::Descriptor action = ActionWriter::Make(photo, camera, 6);

  const auto* model = action.Find(Project::DescriptorKey::kProjectionModel);
  ASSERT_NE(model, nullptr);
  EXPECT_EQ(model->enumValue, Project::DescriptorValue::kFisheye);
  EXPECT_EQ(action.Find(Project::DescriptorKey::kFocalLength)->number, FocalPixels(camera));
  const auto* data = action.Find(Project::DescriptorKey::kConstraintData);
  ASSERT_NE(data, nullptr);
  const auto records = Project::ConstraintBlob::Decode(data->data.data(), data->data.size());
  ASSERT_EQ(records.size(), 6u);
  int verticals = 0;
  for (const auto& record : records) {
    const auto& line = std::get<Project::BlobLine>(record);
    verticals += line.kind == 3 ? 1 : 0;
    // Each end is a point of some traced edge (ends are taken from them).
    double start = 1e30, end = 1e30;
    for (const TruthSegment& segment : photo.truth) {
      start = std::min(start, DistanceToCurve(segment, line.x0, line.y0));
      end = std::min(end, DistanceToCurve(segment, line.x1, line.y1));
    }
    EXPECT_LT(start, 1e-3);  // stored as floats
    EXPECT_LT(end, 1e-3);
  }
  EXPECT_GE(verticals, 2);

  camera.projection = ProjectionKind::kCylindrical;
  EXPECT_THROW(ActionWriter::Make(photo, camera, 6), SynthError);
}

}  // namespace
}  // namespace Synth
