#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

#include "lens/camera/PGenericCameraModel.h"
#include "lens/sphere/ChoosePhotoToSphere.h"

namespace Tarsa {
class CQuillmarkPlugin;
}

namespace Project {

class PXmpMeta;

// What a photograph says about its camera, lens and exposure, read once at
// the start of a run from the XMP packet the host keeps with the document;
// from there the crop factor and the focal length, and whether the image is
// already a panorama with its own projection. The same class holds one entry
// of a lens profile, which adds the pretty names, a camera model and its
// sensor data through the setters. Absent values stay 0 or empty; users test
// them before use. Copying is meant (a chosen profile entry becomes the
// run's lens record) and copies the camera model too.
class PhotoInfo {
 public:
  static constexpr std::int32_t kPanoramaCylindrical = PanoramaProjection::kCylindrical;
  static constexpr std::int32_t kPanoramaSpherical = PanoramaProjection::kSpherical;
  static constexpr std::int32_t kPanoramaPerspective = PanoramaProjection::kPerspective;
  static constexpr std::int32_t kPanoramaNone = 3;

  PhotoInfo() = default;
  ~PhotoInfo();
  PhotoInfo(const PhotoInfo& other);
  PhotoInfo& operator=(const PhotoInfo& other);
  PhotoInfo(PhotoInfo&&) noexcept;
  PhotoInfo& operator=(PhotoInfo&&) noexcept;

  // Takes the image size, then reads the host's metadata packet (property
  // `xmpd`) when it has any bytes. The XMP toolkit must be open. A host that
  // fails to answer leaves the defaults.
  void Load(const Tarsa::CQuillmarkPlugin& host, std::uint32_t width, std::uint32_t height);
  // Reads a packet over the image size already set; what it lacks or cannot
  // be read stays as it was.
  void Parse(const char* bytes, std::size_t size);

  const std::string& GetMake() const { return v_.make; }
  const std::string& GetModel() const { return v_.model; }
  const std::string& GetSerialNumber() const { return v_.serialNumber; }
  const std::string& GetLens() const { return v_.lens; }
  const std::string& GetLensInfo() const { return v_.lensInfo; }
  const std::string& GetLensId() const { return v_.lensId; }
  const std::string& GetCameraPrettyName() const { return v_.cameraPrettyName; }
  const std::string& GetLensPrettyName() const { return v_.lensPrettyName; }
  float GetMaxApertureValue() const { return v_.maxApertureValue; }
  std::uint32_t GetExposureProgram() const { return v_.exposureProgram; }
  float GetExposureTime() const { return v_.exposureTime; }
  float GetShutterSpeedValue() const { return v_.shutterSpeedValue; }
  float GetApertureValue() const { return v_.apertureValue; }
  float GetFNumber() const { return v_.fNumber; }
  std::uint32_t GetIsoSpeed() const { return v_.isoSpeed; }
  float GetFocalLength() const { return v_.focalLength; }
  float GetFocalLength35mm() const { return v_.focalLength35mm; }
  float GetSensorWidth() const { return v_.sensorWidth; }
  float GetSensorHeight() const { return v_.sensorHeight; }
  std::uint32_t GetImageWidth() const { return v_.imageWidth; }
  std::uint32_t GetImageHeight() const { return v_.imageHeight; }
  float GetXResolution() const { return v_.xResolution; }
  float GetYResolution() const { return v_.yResolution; }
  float GetSubjectDistance() const { return v_.subjectDistance; }
  // Complete focal data of its own: a panorama of a known type with a
  // virtual focal length and both centres.
  bool HasPanorama() const { return v_.hasPanorama != 0; }
  std::int32_t GetPanoramaType() const { return v_.panoramaType; }
  float GetVirtualFocalLength() const { return v_.virtualFocalLength; }
  float GetVirtualCenterX() const { return v_.virtualCenterX; }
  float GetVirtualCenterY() const { return v_.virtualCenterY; }
  const PGenericCameraModel* GetCameraModel() const { return cameraModel_.get(); }
  float GetSensorFormatFactor() const { return v_.sensorFormatFactor; }
  bool GetCameraRawProfile() const { return v_.cameraRawProfile; }
  float GetFocusDistance() const { return v_.focusDistance; }

  // The sensor's crop factor against a 35 mm frame; 0 when nothing tells it.
  float GetCropFactor() const;
  // focalLength35mm when known, else crop factor times focal length.
  float GetFocal35mm() const;
  // The aperture in APEX units.
  float GetAperture() const;
  // The focal length as a fraction of the longer image side; 0 when the
  // focal length, crop factor or image size is missing.
  float FocalFromMetadata() const;
  // The recorded panorama projection, in pixels, for the sphere models.
  PanoramaProjection Panorama() const;

  // For profile entries (and tests). Names are trimmed as when read.
  void SetMake(const std::string& text);
  void SetModel(const std::string& text);
  void SetSerialNumber(const std::string& text);
  void SetLens(const std::string& text);
  void SetLensInfo(const std::string& text);
  void SetLensId(const std::string& text);
  void SetCameraPrettyName(const std::string& text);
  void SetLensPrettyName(const std::string& text);
  void SetImageSize(std::uint32_t width, std::uint32_t height);
  void SetFocalLength(float millimetres);
  void SetApertureValue(float apex);
  void SetCameraModel(std::unique_ptr<PGenericCameraModel> model);
  void SetSensorFormatFactor(float factor) { v_.sensorFormatFactor = factor; }
  void SetCameraRawProfile(bool raw) { v_.cameraRawProfile = raw; }
  void SetFocusDistance(float distance) { v_.focusDistance = distance; }

  // White space off both ends.
  static std::string Trim(const std::string& text);
  // An EXIF number as XMP writes it: "n/d" gives the quotient when d is not
  // 0, otherwise the leading number; false when there is none or it is not
  // a finite single-precision value.
  static bool ParseRational(const std::string& text, float& out);

 private:
  struct Values {
    std::string make, model, serialNumber, lens, lensInfo, lensId;
    std::string cameraPrettyName, lensPrettyName;
    float maxApertureValue = 0;
    std::uint32_t exposureProgram = 0;
    float exposureTime = 0, shutterSpeedValue = 0, apertureValue = 0, fNumber = 0;
    std::uint32_t isoSpeed = 0;
    float focalLength = 0, focalLength35mm = 0;
    float sensorWidth = 0, sensorHeight = 0;
    std::uint32_t imageWidth = 0, imageHeight = 0;
    float xResolution = 0, yResolution = 0;
    float subjectDistance = 0;
    std::uint8_t hasPanorama = 0;
    std::int32_t panoramaType = kPanoramaNone;
    float virtualFocalLength = 0, virtualCenterX = 0, virtualCenterY = 0;
    float sensorFormatFactor = 0;
    bool cameraRawProfile = false;
    float focusDistance = 0;
  };

  void ParseCamera(const PXmpMeta& xmp);
  void ParseExposure(const PXmpMeta& xmp);
  void ParseSensor(const PXmpMeta& xmp);
  void ParsePanorama(const PXmpMeta& xmp);
  std::uint32_t LongerSide() const;

  Values v_;
  // The crop factor once computed; the only value that changes after
  // loading, so it may be filled in by the const accessor.
  mutable float cropFactorCache_ = 0;
  std::unique_ptr<PGenericCameraModel> cameraModel_;
};

}  // namespace Project
