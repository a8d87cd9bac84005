#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numbers>
#include <string>
#include <variant>
#include <vector>

#include "params/ConstraintBlob.h"
#include "params/Descriptor.h"
#include "tools/synth/lib/ActionWriter.h"
#include "tools/synth/lib/Render.h"

namespace Synth {
namespace {

constexpr double kDegree = std::numbers::pi / 180.0;

CameraSpec Lens(ProjectionKind projection, double focalMm, int width = 3000, int height = 2000) {
  CameraSpec camera;
  camera.projection = projection;
  camera.focalMm = focalMm;
  camera.width = width;
  camera.height = height;
  return camera;
}

// The truth alone, without the picture: enough for where edges fall.
RenderResult Trace(SceneKind kind, const CameraSpec& lens) {
  const Scene scene = Scene::Make(kind);
  RenderResult photo{nullptr, {}, MakeCamera(scene, lens)};
  photo.truth = TruthTracer(scene, photo.camera).Trace();
  return photo;
}

double CurveDistance(const TruthSegment& a, const TruthSegment& b) {
  double best = 1e30;
  for (const Point2& p : a.points) {
    for (const Point2& q : b.points) best = std::min(best, std::hypot(p.x - q.x, p.y - q.y));
  }
  return best;
}

// The segments scene in the cameras it is made for: every bar it shows is
// whole (none straddles the frame), long, well apart from the others, and
// within 75 degrees of the view axis.
TEST(SegmentsScene, ShowsWholeSeparateBarsInTypicalCameras) {
  const struct {
    CameraSpec camera;
    std::size_t bars;
  } shots[] = {{Lens(ProjectionKind::kRectilinear, 24), 9},
               {Lens(ProjectionKind::kRectilinear, 14), 15},
               {Lens(ProjectionKind::kFisheyeEquisolid, 10), 21},
               {Lens(ProjectionKind::kFisheyeEquisolid, 8), 21},
               {Lens(ProjectionKind::kFisheyeEquisolid, 10, 6000, 4000), 21}};
  const std::vector<Edge> edges = Scene::Make(SceneKind::kSegments).Edges();
  for (const auto& shot : shots) {
    SCOPED_TRACE(std::string(ProjectionName(shot.camera.projection)) + " " +
                 std::to_string(shot.camera.focalMm) + " " + std::to_string(shot.camera.width));
    const RenderResult photo = Trace(SceneKind::kSegments, shot.camera);
    ASSERT_EQ(photo.truth.size(), shot.bars);
    const double scale = shot.camera.width / 3000.0;
    for (const TruthSegment& bar : photo.truth) {
      SCOPED_TRACE(bar.id);
      EXPECT_EQ(bar.id.find('#'), std::string::npos);  // one run: not cut
      const auto edge =
          std::find_if(edges.begin(), edges.end(), [&](const Edge& e) { return e.id == bar.id; });
      ASSERT_NE(edge, edges.end());
      // Whole: the run reaches both ends of the bar (up to rounding in
      // placing them along it).
      EXPECT_LT(Length(bar.start - edge->start) + Length(bar.end - edge->end), 1e-9);
      const Point2 a = bar.points.front(), b = bar.points.back();
      EXPECT_GT(std::hypot(b.x - a.x, b.y - a.y), 150 * scale);
      for (const Vec3& end : {bar.start, bar.end}) {
        const Vec3 view = photo.camera.ToCamera(end - photo.camera.Position());
        EXPECT_LT(std::acos(view.x / Length(view)), 75 * kDegree);
      }
      // Frame margin: wider bars must not touch the border.
      for (const Point2& p : bar.points) {
        EXPECT_GT(std::min({p.x, p.y, shot.camera.width - p.x, shot.camera.height - p.y}),
                  20 * scale);
      }
    }
    for (std::size_t i = 0; i < photo.truth.size(); ++i) {
      for (std::size_t j = i + 1; j < photo.truth.size(); ++j) {
        // Centrelines this far apart leave a clear gap between bars up to
        // 12 pixels wide.
        EXPECT_GT(CurveDistance(photo.truth[i], photo.truth[j]), 45 * scale)
            << photo.truth[i].id << " and " << photo.truth[j].id;
      }
    }
  }
}

struct Constrained {
  std::string edge;  // the id of the run its ends lie on
  int kind = 0;
};

// The action's lines, each named by the truth run its two ends lie on.
std::vector<Constrained> Lines(const Host::Descriptor& action, const RenderResult& photo) {
  const auto* data = action.Find(Project::DescriptorKey::kConstraintData);
  EXPECT_NE(data, nullptr);
  if (!data) return {};
  std::vector<Constrained> lines;
  for (const auto& record : Project::ConstraintBlob::Decode(data->data.data(), data->data.size())) {
    const auto& line = std::get<Project::BlobLine>(record);
    Constrained named{"?", line.kind};
    for (const TruthSegment& run : photo.truth) {
      const auto near = [&](float x, float y) {
        return std::any_of(run.points.begin(), run.points.end(), [&](const Point2& p) {
          return std::hypot(p.x - x, p.y - y) < 1e-3;  // ends are stored as floats
        });
      };
      if (near(line.x0, line.y0) && near(line.x1, line.y1)) named.edge = run.id;
    }
    lines.push_back(named);
  }
  return lines;
}

// Every bar is constrained once: vertical bars vertical, level ones (across
// the view) horizontal, those running away from the view or slanting free.
TEST(SegmentsScene, ActionHoldsEveryBarWithItsKind) {
  const CameraSpec camera = Lens(ProjectionKind::kFisheyeEquisolid, 10);
  const RenderResult photo = Trace(SceneKind::kSegments, camera);
  const std::vector<Constrained> lines =
      Lines(ActionWriter::Make(photo, {SceneKind::kSegments}, camera), photo);
  ASSERT_EQ(lines.size(), photo.truth.size());
  for (const Constrained& line : lines) {
    SCOPED_TRACE(line.edge);
    const auto ends = [&](const char* tail) {
      return line.edge.size() > std::string(tail).size() &&
             line.edge.compare(line.edge.size() - std::string(tail).size(), std::string::npos,
                               tail) == 0;
    };
    EXPECT_EQ(line.kind, ends(".vertical") ? 3 : ends(".level") ? 2 : 1);
    EXPECT_EQ(std::count_if(lines.begin(), lines.end(),
                            [&](const Constrained& other) { return other.edge == line.edge; }),
              1);
  }
  // Turned 40 degrees, the bars that were across the view are not level.
  CameraSpec turned = camera;
  turned.yaw = 40;
  const RenderResult aside = Trace(SceneKind::kSegments, turned);
  for (const Constrained& line :
       Lines(ActionWriter::Make(aside, {SceneKind::kSegments}, turned), aside)) {
    EXPECT_NE(line.kind, 2) << line.edge;
  }
}

// The room sample's action holds what a photographer would mark: every wall
// corner in sight, vertical; the walls' tops and feet and the window and
// door frames, their uprights vertical; nothing else, and nothing too short
// to show its bend.
TEST(RoomAction, MarksCornersWallEdgesAndFrames) {
  const CameraSpec camera = Lens(ProjectionKind::kFisheyeEquisolid, 10, 1800, 1200);
  const RenderResult photo = Trace(SceneKind::kRoom, camera);
  const std::vector<Constrained> lines =
      Lines(ActionWriter::Make(photo, {SceneKind::kRoom}, camera), photo);
  const auto isWallOutline = [](const std::string& id) {
    const std::string name = id.substr(0, id.find('#'));
    return name.find("-wall.") != std::string::npos &&
           std::count(name.begin(), name.end(), '.') == 1;
  };
  int corners = 0, frames = 0, horizontals = 0;
  for (const Constrained& line : lines) {
    SCOPED_TRACE(line.edge);
    const bool frame = line.edge.find(".frame.") != std::string::npos;
    EXPECT_TRUE(frame || isWallOutline(line.edge));
    const auto run = std::find_if(photo.truth.begin(), photo.truth.end(),
                                  [&](const TruthSegment& s) { return s.id == line.edge; });
    ASSERT_NE(run, photo.truth.end());
    const bool vertical = std::fabs(run->end.z - run->start.z) > 0.5;
    EXPECT_EQ(line.kind, vertical ? 3 : 1);
    corners += !frame && vertical;
    frames += frame;
    horizontals += !frame && !vertical;
  }
  // Every wall corner and frame side long enough in the picture is held.
  for (const TruthSegment& run : photo.truth) {
    const double chord = std::hypot(run.points.back().x - run.points.front().x,
                                    run.points.back().y - run.points.front().y);
    const bool wanted = isWallOutline(run.id) || run.id.find(".frame.") != std::string::npos;
    const bool held = std::any_of(lines.begin(), lines.end(),
                                  [&](const Constrained& l) { return l.edge == run.id; });
    EXPECT_EQ(held, wanted && chord >= 40) << run.id << " " << chord;
  }
  EXPECT_EQ(corners, 2);  // the far wall's: the others are behind the camera
  EXPECT_GE(horizontals, 4);
  EXPECT_GE(frames, 6);
}

}  // namespace
}  // namespace Synth
