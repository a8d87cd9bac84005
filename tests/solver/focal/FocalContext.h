#pragma once

#include <cstdint>
#include <memory>

#include "lens/sphere/ChoosePhotoToSphere.h"
#include "solver/frame/SolverContext.h"

namespace Project {

// The filter's side: real settings, the real choice of sphere model, a photo
// of 1200 x 800 shown in a preview of 600 x 400.
class FocalContext : public SolverContext {
 public:
  FocalContext() : settings(kWidth) {}
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

}  // namespace Project
