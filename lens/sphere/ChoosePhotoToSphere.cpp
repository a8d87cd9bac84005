#include "lens/sphere/ChoosePhotoToSphere.h"

#include <new>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PRadialDistortCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"
#include "lens/sphere/CylindricalImage.h"
#include "lens/sphere/FisheyeImage.h"
#include "lens/sphere/OrvaneFisheye.h"
#include "lens/sphere/OrvanePerspective.h"
#include "lens/sphere/PerspectiveImage.h"
#include "lens/sphere/SphericalImage.h"

namespace Project {

namespace {

// The projection models of the filter's settings.
constexpr std::int32_t kFisheye = 1;
constexpr std::int32_t kPerspective = 2;
constexpr std::int32_t kAuto = 3;
constexpr std::int32_t kFullSpherical = 4;

std::shared_ptr<PhotoToSphere> FromPanorama(const std::shared_ptr<const Image>& image,
                                            const PanoramaProjection& panorama) {
  switch (panorama.type) {
    case PanoramaProjection::kCylindrical:
      // The horizontal centre is the middle of the metadata's width, whatever
      // the recorded centre says.
      return std::make_shared<CylindricalImage>(image, panorama.focal, panorama.imageWidth * 0.5f,
                                                panorama.centerY);
    case PanoramaProjection::kSpherical:
      return std::make_shared<SphericalImage>(image, panorama.focal, panorama.centerX,
                                              panorama.centerY);
    case PanoramaProjection::kPerspective:
      return std::make_shared<PerspectiveImage>(image, panorama.focal, panorama.centerX,
                                                panorama.centerY);
    default:
      return nullptr;
  }
}

std::shared_ptr<PhotoToSphere> FromCamera(const std::shared_ptr<const Image>& image,
                                          const PGenericCameraModel* camera, float cropRatio) {
  if (!camera) return nullptr;
  const float fx = camera->focalX * cropRatio;
  const float fy = camera->focalY * cropRatio;
  if (const auto* fisheye = dynamic_cast<const PFisheyeCameraModel*>(camera)) {
    return std::make_shared<OrvaneFisheye>(image, fx, fy, camera->centerX, camera->centerY,
                                           fisheye->radial1, fisheye->radial2);
  }
  if (const auto* radial = dynamic_cast<const PRadialDistortCameraModel*>(camera)) {
    // A plain radial model has no tangential terms.
    const auto* tangential = dynamic_cast<const PTangentialDistortCameraModel*>(camera);
    return std::make_shared<OrvanePerspective>(image, fx, fy, camera->centerX, camera->centerY,
                                               radial->radial1, radial->radial2, radial->radial3,
                                               tangential ? tangential->tangential1 : 0.0f,
                                               tangential ? tangential->tangential2 : 0.0f);
  }
  return nullptr;  // the generic model has no projection of its own
}

}  // namespace

bool ChoosePhotoToSphere(std::int32_t projectionModel, const std::shared_ptr<const Image>& image,
                         float focalLength, const PanoramaProjection* panorama,
                         const PGenericCameraModel* camera, float cropRatio,
                         std::shared_ptr<PhotoToSphere>& model) {
  const float halfWidth = image->width * 0.5f;
  const float halfHeight = image->height * 0.5f;
  try {
    std::shared_ptr<PhotoToSphere> built;
    switch (projectionModel) {
      case kFisheye:
        built = std::make_shared<FisheyeImage>(image, focalLength, halfWidth, halfHeight);
        break;
      case kPerspective:
        built = std::make_shared<PerspectiveImage>(image, focalLength, halfWidth, halfHeight);
        break;
      case kAuto:
        built = panorama ? FromPanorama(image, *panorama) : FromCamera(image, camera, cropRatio);
        break;
      case kFullSpherical:
        built = std::make_shared<SphericalImage>(image, image->height / 3.1415927f, halfWidth,
                                                 halfHeight);
        break;
      default:
        break;
    }
    if (!built) return false;
    model = std::move(built);
    return true;
  } catch (const std::bad_alloc&) {
    model.reset();
    return false;
  }
}

}  // namespace Project
