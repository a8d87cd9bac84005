#pragma once

#include <cstdint>
#include <memory>

#include "lens/sphere/ChoosePhotoToSphere.h"
#include "solver/frame/SolverContext.h"

namespace Project {

// The filter's side of a Solver in tests: real settings and the real choice
// of sphere model for a photo of the given size, shown in a preview of half
// that size, with counts of what the solver reported. The settings start
// from the defaults with a coarser mesh (level 5) and no auto rotation, so
// tests stay quick and directions stay put; tests change them freely.
class SolverTestContext : public SolverContext {
 public:
  SolverTestContext(std::int32_t width, std::int32_t height, std::int32_t model, float focal)
      : settings(width), width_(width), height_(height) {
    settings.projectionModel = model;
    settings.focalLength = focal;
    settings.meshResolution = 5;
    settings.autoRotate = 0;
  }
  PSettings& Settings() override { return settings; }
  const PhotoInfo* Photo() const override { return nullptr; }
  std::int32_t SourceWidth() const override { return width_; }
  std::int32_t SourceHeight() const override { return height_; }
  std::int32_t PreviewWidth() const override { return width_ / 2; }
  std::int32_t PreviewHeight() const override { return height_ / 2; }
  bool BuildImageModel(const std::shared_ptr<const Image>& image,
                       std::shared_ptr<PhotoToSphere>& model) override {
    return ChoosePhotoToSphere(settings.projectionModel, image, settings.focalLength, nullptr,
                               nullptr, 1.0f, model);
  }
  void ReportSolve(bool failed) override { failures += failed ? 1 : 0; }
  void RebuildResults() override { ++rebuilds; }
  void RedrawResults() override { ++redraws; }

  PSettings settings;
  int failures = 0;
  int rebuilds = 0;
  int redraws = 0;

 private:
  std::int32_t width_;
  std::int32_t height_;
};

}  // namespace Project
