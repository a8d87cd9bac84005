#include "tests/support/SolverTestContext.h"

#include "lens/sphere/ChoosePhotoToSphere.h"

namespace Project::testing {

SolverTestContext::SolverTestContext(std::int32_t width, std::int32_t height)
    : settings(width), width_(width), height_(height) {}

SolverTestContext::SolverTestContext(std::int32_t width, std::int32_t height, std::int32_t model,
                                     float focal)
    : SolverTestContext(width, height) {
  settings.projectionModel = model;
  settings.focalLength = focal;
  settings.meshResolution = 5;
  settings.autoRotate = 0;
}

bool SolverTestContext::BuildImageModel(const std::shared_ptr<const Image>& image,
                                        std::shared_ptr<PhotoToSphere>& model) {
  return ChoosePhotoToSphere(settings.projectionModel, image, settings.focalLength, nullptr,
                             nullptr, 1.0f, model);
}

}  // namespace Project::testing
