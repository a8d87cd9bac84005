#pragma once

#include <cstdint>
#include <memory>

#include "solver/frame/SolverContext.h"

namespace Project::testing {

// The filter's side of a Solver in tests: real settings and the real choice
// of sphere model for a photo of the given size, shown in a preview of half
// that size (previewDivisor), with counts of what the solver reported.
class SolverTestContext : public SolverContext {
 public:
  // Settings at the defaults with a coarser mesh (level 5) and no auto
  // rotation, so tests stay quick and directions stay put; tests change them
  // freely.
  SolverTestContext(std::int32_t width, std::int32_t height, std::int32_t model, float focal);
  // Settings at the defaults throughout, the camera model and focal length
  // included.
  SolverTestContext(std::int32_t width, std::int32_t height);

  PSettings& Settings() override { return settings; }
  const PhotoInfo* Photo() const override { return nullptr; }
  std::int32_t SourceWidth() const override { return width_; }
  std::int32_t SourceHeight() const override { return height_; }
  std::int32_t PreviewWidth() const override { return width_ / previewDivisor; }
  std::int32_t PreviewHeight() const override { return height_ / previewDivisor; }
  bool BuildImageModel(const std::shared_ptr<const Image>& image,
                       std::shared_ptr<PhotoToSphere>& model) override;
  void ReportSolve(bool failed) override { failures += failed ? 1 : 0; }
  void RebuildResults() override { ++rebuilds; }
  void RedrawResults() override { ++redraws; }

  PSettings settings;
  std::int32_t previewDivisor = 2;  // 1: view points are photograph pixels
  int failures = 0;
  int rebuilds = 0;
  int redraws = 0;

 private:
  std::int32_t width_;
  std::int32_t height_;
};

}  // namespace Project::testing
