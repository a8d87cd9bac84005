#pragma once

#include <cstdint>
#include <memory>

#include "lens/camera/PGenericCameraModel.h"
#include "lens/sphere/Image.h"
#include "lens/sphere/PhotoToSphere.h"

namespace Project {

// The panorama projection that a photo's metadata records, in pixels.
struct PanoramaProjection {
  static constexpr std::int32_t kCylindrical = 0;
  static constexpr std::int32_t kSpherical = 1;
  static constexpr std::int32_t kPerspective = 2;

  std::int32_t type = 3;  // one of the above; anything else builds nothing
  float focal = 0.0f;     // the virtual focal length
  float centerX = 0.0f;   // the virtual image centre
  float centerY = 0.0f;
  float imageWidth = 0.0f;  // the metadata's image width
};

// Builds the sphere image model for a projection model (1 fisheye,
// 2 perspective, 3 auto, 4 full spherical) on image:
//  - fisheye and perspective: FisheyeImage or PerspectiveImage with
//    focalLength (pixels), centred;
//  - auto with a panorama: the panorama's cylindrical, spherical or
//    perspective model; without one, OrvaneFisheye for a fisheye camera model
//    and OrvanePerspective for a radial or tangential one, its focal lengths
//    multiplied by cropRatio. camera is the matched lens profile's model,
//    unprepared;
//  - full spherical: SphericalImage covering the height with pi, centred.
// The camera model and crop ratio come in separately for now; they will be
// read from the lens record once that exists.
// Replaces model and answers true when one was built. When none can be (a
// generic or absent camera model, an unknown panorama type, an unknown
// projection model) model stays as it was and the answer is false; when
// allocation fails model is cleared.
bool ChoosePhotoToSphere(std::int32_t projectionModel, const std::shared_ptr<const Image>& image,
                         float focalLength, const PanoramaProjection* panorama,
                         const PGenericCameraModel* camera, float cropRatio,
                         std::shared_ptr<PhotoToSphere>& model);

}  // namespace Project
