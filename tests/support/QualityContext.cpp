#include "tests/support/QualityContext.h"

#include <algorithm>
#include <numbers>
#include <stdexcept>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"
#include "lens/metadata/PXmpMeta.h"
#include "lens/sphere/ChoosePhotoToSphere.h"
#include "tools/synth/lib/Projection.h"
#include "tools/synth/lib/RenderSpec.h"

namespace Project::testing {
namespace {

Synth::ProjectionKind GeneratorKind(LensKind lens) {
  switch (lens) {
    case LensKind::kFisheye:
      return Synth::ProjectionKind::kFisheyeEquisolid;
    case LensKind::kFisheyePoly:
      return Synth::ProjectionKind::kFisheyePoly;
    case LensKind::kDistorted:
      return Synth::ProjectionKind::kTangential;
    case LensKind::kCylindrical:
      return Synth::ProjectionKind::kCylindrical;
  }
  return Synth::ProjectionKind::kRectilinear;
}

}  // namespace

Synth::Camera MakeCamera(const Synth::Scene& scene, const CameraCase& c) {
  constexpr double kDegree = std::numbers::pi / 180.0;
  const Synth::ProjectionKind kind = GeneratorKind(c.lens);
  const Synth::Projection projection(kind, c.focal, {0.5 * c.width, 0.5 * c.height},
                                     Synth::DefaultDistortion(kind));
  return Synth::Camera(scene.DefaultPosition(), c.yawDegrees * kDegree, c.pitchDegrees * kDegree,
                       0.0, projection, c.width, c.height);
}

QualityContext::QualityContext(const CameraCase& c, const Synth::Camera& camera)
    : SolverTestContext(c.width, c.height), lens_(c.lens) {
  previewDivisor = 1;
  const Synth::Projection& p = camera.Lens();
  const double longer = std::max(c.width, c.height);
  switch (c.lens) {
    case LensKind::kFisheye:
      settings.projectionModel = PSettings::kModelFisheye;
      settings.focalLength = static_cast<float>(p.Focal());
      break;
    case LensKind::kFisheyePoly: {
      settings.projectionModel = PSettings::kModelAuto;
      auto model = std::make_unique<PFisheyeCameraModel>();
      model->focalX = model->focalY = static_cast<float>(p.Focal() / longer);
      model->centerX = model->centerY = 0.5f;
      model->radial1 = static_cast<float>(p.Coefficients().k1);
      model->radial2 = static_cast<float>(p.Coefficients().k2);
      camera_ = std::move(model);
      break;
    }
    case LensKind::kDistorted: {
      settings.projectionModel = PSettings::kModelAuto;
      auto model = std::make_unique<PTangentialDistortCameraModel>();
      model->focalX = model->focalY = static_cast<float>(p.Focal() / longer);
      model->centerX = model->centerY = 0.5f;
      model->radial1 = static_cast<float>(p.Coefficients().k1);
      model->radial2 = static_cast<float>(p.Coefficients().k2);
      model->radial3 = static_cast<float>(p.Coefficients().k3);
      model->tangential1 = static_cast<float>(p.Coefficients().t1);
      model->tangential2 = static_cast<float>(p.Coefficients().t2);
      camera_ = std::move(model);
      break;
    }
    case LensKind::kCylindrical: {
      settings.projectionModel = PSettings::kModelAuto;
      // The record a stitcher leaves, as fractions of the longer side.
      if (!PXmpMeta::Initialize()) throw std::runtime_error("no XMP toolkit");
      toolkitOpen_ = true;
      const std::string packet =
          std::string(
              "<?xpacket begin=\"\"?><rdf:RDF "
              "xmlns:rdf=\"http://www.w3.org/1999/02/22-rdf-syntax-ns#\">"
              "<rdf:Description rdf:about=\"\" xmlns:panorama=\"") +
          PXmpMeta::kPanoramaNamespace + "\" panorama:Transformation=\"Cylindrical\"" +
          " panorama:VirtualFocalLength=\"" + std::to_string(p.Focal() / longer) + "\"" +
          " panorama:VirtualImageXCenter=\"" + std::to_string(p.Centre().x / longer) + "\"" +
          " panorama:VirtualImageYCenter=\"" + std::to_string(p.Centre().y / longer) + "\"" +
          "/></rdf:RDF><?xpacket end=\"w\"?>";
      photo_.SetImageSize(static_cast<std::uint32_t>(c.width),
                          static_cast<std::uint32_t>(c.height));
      photo_.Parse(packet.data(), packet.size());
      if (!photo_.HasPanorama()) throw std::runtime_error("panorama record not read");
      break;
    }
  }
}

QualityContext::~QualityContext() {
  if (toolkitOpen_) PXmpMeta::Terminate();
}

bool QualityContext::BuildImageModel(const std::shared_ptr<const Image>& image,
                                     std::shared_ptr<PhotoToSphere>& model) {
  const PanoramaProjection panorama = photo_.Panorama();
  return ChoosePhotoToSphere(settings.projectionModel, image, settings.focalLength,
                             lens_ == LensKind::kCylindrical ? &panorama : nullptr, camera_.get(),
                             1.0f, model);
}

}  // namespace Project::testing
