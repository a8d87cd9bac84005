#pragma once

#include <cmath>
#include <memory>

#include "lens/sphere/Image.h"

namespace Project {

// A sphere image model: for a direction on the unit sphere, given as
// longitude and latitude in radians (the direction (cos lat cos lon,
// cos lat sin lon, sin lat), x the view axis), where in the photograph does
// it land? Each subclass is one closed formula, GetPosition(), giving the
// centred image position (origin in the middle, y upwards); texture
// coordinates and colours are both read through it, so they always agree.
// There is no opposite map: image to sphere is a search of the sphere mesh.
//
// A model shares its Image and is immutable after construction. The mesh
// calls it from parallel loops, so nothing here keeps scratch state.
class PhotoToSphere {
 public:
  explicit PhotoToSphere(std::shared_ptr<const Image> image);
  PhotoToSphere(const PhotoToSphere&) = delete;
  PhotoToSphere& operator=(const PhotoToSphere&) = delete;
  virtual ~PhotoToSphere() = default;

  // Whether the direction can be projected at all; for some models a
  // direction that can be projected still falls outside the picture.
  virtual bool Contains(float lon, float lat) const = 0;
  // The centred image position of the direction, in pixels.
  virtual void GetPosition(float lon, float lat, float& x, float& y) const = 0;
  // Whether GetPosition still gives a usable place for a direction that
  // Contains refuses: the mesh reaches one ring of vertices past the
  // covered directions where it can, so that the edge of the cover falls
  // inside drawn cells and is cut there as a smooth curve.
  virtual bool Reaches(float lon, float lat) const { return Contains(lon, lat); }
  // The edge of the covered directions, where it is a circle in the
  // picture: its centre as a texture coordinate and its radius in pixels of
  // the model's image. False where the cover has no such edge.
  virtual bool CoverCircle(float outCentreUv[2], float& outRadius) const {
    (void)outCentreUv;
    (void)outRadius;
    return false;
  }
  // Whether the mesh's vertex test walks towards the centre: false for the
  // panoramic models, whose picture need not surround the view axis.
  virtual bool WalksToCentre() const { return true; }
  // Whether the offsets are added to the position: OrvanePerspective, alone,
  // subtracts them. Nothing reads this yet.
  virtual bool AddsOffsets() const { return true; }

  // The colour in that direction, three channels from 0 to 1, read
  // bilinearly. A position off the picture, or an image without pixels,
  // reads as black.
  void GetColor(float lon, float lat, float outRgb[3]) const;
  // The position as a texture coordinate: u = x / width + 0.5,
  // v = y / height + 0.5. The mesh's hot path: it allocates nothing.
  void GetTexCoord(float lon, float lat, float outUv[2]) const;

  const std::shared_ptr<const Image>& GetImage() const { return image_; }

 protected:
  // Whether the pixel holding the centred position lies in the picture, the
  // pixel index truncated towards zero (so half a pixel left of the first
  // column still counts).
  bool ContainsPixel(float x, float y) const;
  // Within a quarter turn of the view axis on both angles.
  static bool WithinQuarterTurn(float lon, float lat);

  // Trigonometry is evaluated in double on the single-precision argument and
  // rounded back; the rest of each formula stays in single precision.
  static float Sin(float a) { return static_cast<float>(std::sin(static_cast<double>(a))); }
  static float Cos(float a) { return static_cast<float>(std::cos(static_cast<double>(a))); }
  static float Tan(float a) { return static_cast<float>(std::tan(static_cast<double>(a))); }
  static float Acos(float a) { return static_cast<float>(std::acos(static_cast<double>(a))); }
  static float Atan2(float y, float x) {
    return static_cast<float>(std::atan2(static_cast<double>(y), static_cast<double>(x)));
  }

 private:
  const std::shared_ptr<const Image> image_;
};

}  // namespace Project
