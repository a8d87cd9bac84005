#pragma once

#include <cstdint>
#include <memory>

namespace Project {

// A calibrated lens on one camera: where the optical centre lies, how long the
// focal length is, and the polynomial that bends an ideal image point into the
// distorted photograph. This class has only the overall scale and the corner
// correction; the subclasses add radial, tangential or fisheye terms, told
// apart by GetType().
//
// As read from a lens profile the centre is a fraction of each image side and
// the focal lengths a fraction of the longer side. Prepare() converts the same
// fields in place to pixels of one image size and derives the polynomial's
// coefficients, so it is run once, on a fresh Clone(). Mapping goes one way
// only, ideal to distorted; nothing here inverts it (image to ray is a mesh
// search elsewhere).
//
// The lens description that holds a model owns it; Clone() gives the caller a
// new one to own. Plain copying is closed so that a model is never sliced.
class PGenericCameraModel {
 public:
  static constexpr std::int32_t kTypeGeneric = 0;
  static constexpr std::int32_t kTypeRadial = 1;
  static constexpr std::int32_t kTypeTangential = 2;
  static constexpr std::int32_t kTypeFisheye = 3;
  // The single-precision machine epsilon: the tolerance of every test here.
  static constexpr float kEps = 1.1920929e-7f;

  PGenericCameraModel() = default;
  PGenericCameraModel& operator=(const PGenericCameraModel&) = delete;
  virtual ~PGenericCameraModel() = default;

  virtual std::int32_t GetType() const { return kTypeGeneric; }
  // Centre within 0 to 1 on both axes and focal lengths not negative. Each
  // test is "value at least bound", so a NaN fails.
  bool IsValid() const;
  // Valid, and both focal lengths above eps.
  bool HasFocalLength() const;
  // Valid, with no scale, no corner correction and (in subclasses) no
  // distortion terms beyond eps. The residuals play no part.
  virtual bool IsNeutral() const;
  // A new model of the same class with every field, derived ones included,
  // so a clone of a prepared model is prepared.
  virtual std::unique_ptr<PGenericCameraModel> Clone() const;
  // Same class and the same centre, focal lengths and residuals within eps;
  // distortion terms are not compared.
  bool IsSameCalibration(const PGenericCameraModel& other) const;
  // For a picture turned by 90 degrees: swaps the x and y fields.
  virtual void Transpose();
  // Converts the fractional fields to pixels of a width x height image and
  // derives maxRadiusSquared and the coefficients. A focalOverride above eps
  // replaces the focal length (keeping the x/y aspect) unless keepFocal is
  // set; a model without a focal length takes it regardless. Divides by the
  // focal lengths unguarded: callers check HasFocalLength() or override.
  virtual void Prepare(std::int32_t width, std::int32_t height, float focalOverride,
                       bool keepFocal);
  // Both take effect at the next Prepare().
  void SetCorrection(float newScale, float newCornerCorrection);
  void SetScale(float newScale);
  // Ideal to distorted position, in pixels, after Prepare().
  virtual void MapPoint(float x, float y, float& outX, float& outY) const;
  // As MapPoint() without the corner correction, from the raw parameters.
  virtual void MapPointPlain(float x, float y, float& outX, float& outY) const;

  float centerX = 0.5f;
  float centerY = 0.5f;
  float focalX = 1.0f;
  float focalY = 1.0f;
  float residualMeanError = 0.0f;  // compared, never used in maths
  float residualStdDev = -1.0f;    // compared, never used in maths
  float scale = 1.0f;
  // The displacement that the extra radial term reaches at the farthest
  // image corner.
  float cornerCorrection = 0.0f;
  // Derived by Prepare().
  double maxRadiusSquared = 0.0;  // normalised radius of the farthest corner, squared
  double linearCoefficient = 0.0;
  double quadraticCoefficient = 0.0;

 protected:
  PGenericCameraModel(const PGenericCameraModel&) = default;

  // The steps that every Prepare() shares: pixels for centre and focal
  // lengths, and maxRadiusSquared. Gives the farthest corner's offsets from
  // the centre in pixels.
  void PrepareFrame(std::int32_t width, std::int32_t height, float focalOverride, bool keepFocal,
                    float& cornerX, float& cornerY);
  // Whether every generic field but the residuals is neutral.
  bool IsNeutralFrame() const;
};

}  // namespace Project
