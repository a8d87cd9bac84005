#pragma once

// A generated photograph as the solver sees it: the camera case, the
// generator's camera for it, and the filter's side of the solve with the
// sphere model the filter would build for the lens.

#include <cstdint>
#include <memory>
#include <string>

#include "lens/camera/PGenericCameraModel.h"
#include "lens/metadata/PhotoInfo.h"
#include "tests/support/SolverTestContext.h"
#include "tools/synth/lib/Camera.h"
#include "tools/synth/lib/Scene.h"

namespace Project::testing {

// How the module is told about the photograph's lens.
enum class LensKind {
  kFisheye,      // the equisolid fisheye of the focal setting
  kFisheyePoly,  // a fisheye lens profile with its polynomial
  kDistorted,    // a rectilinear lens profile with radial and tangential terms
  kCylindrical,  // a cylindrical panorama recorded in the metadata
};

struct CameraCase {
  std::string name;
  Synth::SceneKind scene = Synth::SceneKind::kRoom;
  LensKind lens = LensKind::kFisheye;
  double focal = 400.0;  // pixels
  int width = 1200;
  int height = 800;
  double yawDegrees = 0.0;
  double pitchDegrees = 0.0;
};

// The generator's camera for the case, at the scene's default position.
Synth::Camera MakeCamera(const Synth::Scene& scene, const CameraCase& c);

// The filter's side for one generated photograph: default settings, the
// preview as large as the photograph (so view points are photograph pixels),
// and the lens as a camera model, a panorama record or the fisheye setting.
class QualityContext : public SolverTestContext {
 public:
  QualityContext(const CameraCase& c, const Synth::Camera& camera);
  ~QualityContext() override;
  QualityContext(const QualityContext&) = delete;
  QualityContext& operator=(const QualityContext&) = delete;

  const PhotoInfo* Photo() const override {
    return lens_ == LensKind::kCylindrical ? &photo_ : nullptr;
  }
  bool BuildImageModel(const std::shared_ptr<const Image>& image,
                       std::shared_ptr<PhotoToSphere>& model) override;

 private:
  LensKind lens_;
  std::unique_ptr<PGenericCameraModel> camera_;
  PhotoInfo photo_;
  bool toolkitOpen_ = false;
};

}  // namespace Project::testing
