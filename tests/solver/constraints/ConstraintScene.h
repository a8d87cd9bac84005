#pragma once

#include <cmath>
#include <memory>

#include "lens/sphere/ChoosePhotoToSphere.h"
#include "solver/constraints/ConstraintList.h"
#include "solver/frame/Solver.h"
#include "solver/frame/SolverContext.h"
#include "solver/geodesic/Vec3.h"

namespace Project {

// The filter's side: real settings and the real choice of sphere model, a
// photo of 1200 x 800 shown in a preview of 600 x 400.
class SceneContext : public SolverContext {
 public:
  SceneContext(std::int32_t model, float focal) : settings(kWidth) {
    settings.projectionModel = model;
    settings.focalLength = focal;
    settings.regularizerModel = PSettings::kRegularizerStereographic;
    settings.meshResolution = 5;
    settings.autoRotate = 0;
    settings.previewResult = 0;  // the source is shown: curves in photo pixels
  }
  PSettings& Settings() override { return settings; }
  const PhotoInfo* Photo() const override { return nullptr; }
  std::int32_t SourceWidth() const override { return kWidth; }
  std::int32_t SourceHeight() const override { return kHeight; }
  std::int32_t PreviewWidth() const override { return kWidth / 2; }
  std::int32_t PreviewHeight() const override { return kHeight / 2; }
  bool BuildImageModel(const std::shared_ptr<const Image>& image,
                       std::shared_ptr<PhotoToSphere>& model) override {
    return ChoosePhotoToSphere(settings.projectionModel, image, settings.focalLength, nullptr,
                               nullptr, 1.0f, model);
  }
  void ReportSolve(bool) override {}
  void RebuildResults() override {}
  void RedrawResults() override {}

  static constexpr std::int32_t kWidth = 1200;
  static constexpr std::int32_t kHeight = 800;
  PSettings settings;
};

// A constraint list on a solved perspective photo (focal 700 pixels, about
// 81 by 60 degrees). A pinhole picture shows every great circle as a
// straight line, so a traced line must lie on the chord between its ends.
// Test points keep off x = 300 and y = 200: those are grid lines, and the
// cell finder may answer either neighbour for a point on one.
struct ConstraintScene {
  explicit ConstraintScene(std::int32_t model = PSettings::kModelPerspective)
      : context(model, kFocal), list(context) {
    list.GetSolver().RebuildGrid(false);
    list.GetSolver().Solve(true, false);
  }
  Solver& solver() { return list.GetSolver(); }
  void UpdateAll() { list.UpdateDisplays(list.GetSolver(), -1); }

  // The sphere direction of a preview point of the pinhole photo, from its
  // own formula: x = f tan(lon), y = f tan(lat) / cos(lon) about the centre.
  static Vec3 PinholeDirection(Point2f preview) {
    const double x = (preview.x / 600.0 - 0.5) * SceneContext::kWidth;
    const double y = (0.5 - preview.y / 400.0) * SceneContext::kHeight;
    const Vec3 d{kFocal, x, y};
    return (1.0 / Length(d)) * d;
  }

  static constexpr float kFocal = 700.0f;
  SceneContext context;
  ConstraintList list;
};

}  // namespace Project
