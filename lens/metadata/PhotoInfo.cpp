#include "lens/metadata/PhotoInfo.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cmath>
#include <exception>
#include <limits>
#include <string_view>

#include "framework/core/CException.h"
#include "framework/plugin/CQuillmarkPlugin.h"
#include "lens/metadata/PXmpMeta.h"

namespace Project {

namespace {

constexpr std::uint32_t kPropMetadata = Tarsa::FourCC("xmpd");
constexpr float kEps = PGenericCameraModel::kEps;
// The squared diagonal of a 36 x 24 mm frame.
constexpr double kFullFrameDiagonal2 = 1872.0;

// Cameras whose crop factor their metadata does not tell, by make and model
// as they write them.
struct KnownCamera {
  const char* make;
  const char* model;
  float cropFactor;
};

constexpr KnownCamera kKnownCameras[] = {
    {"Canon", "Canon EOS 1000D", 1.6f},
    {"Canon", "Canon EOS 10D", 1.6f},
    {"Canon", "Canon EOS 20D", 1.6f},
    {"Canon", "Canon EOS 30D", 1.6f},
    {"Canon", "Canon EOS 40D", 1.6f},
    {"Canon", "Canon EOS 50D", 1.6f},
    {"Canon", "Canon EOS D30", 1.6f},
    {"Canon", "Canon EOS D60", 1.6f},
    {"Canon", "Canon EOS DIGITAL REBEL", 1.6f},
    {"Canon", "Canon EOS DIGITAL REBEL XSi", 1.6f},
    {"Canon", "Canon EOS DIGITAL REBEL XT", 1.6f},
    {"Canon", "Canon EOS DIGITAL REBEL XTi", 1.6f},
    {"Canon", "Canon EOS 5D", 1.0f},
    {"Canon", "Canon EOS 5D Mark II", 1.0f},
    {"Canon", "Canon EOS K215", 1.0f},
    {"Canon", "Canon EOS-1DS", 1.0f},
    {"Canon", "Canon EOS-1Ds Mark II", 1.0f},
    {"Canon", "Canon EOS-1D", 1.3f},
    {"Canon", "Canon EOS-1D Mark II", 1.3f},
    {"Canon", "Canon EOS-1D Mark II N", 1.3f},
    {"Canon", "Canon EOS-1D Mark III", 1.3f},
    {"Canon", "Canon PowerShot G10", 4.55f},
    {"Canon", "Canon PowerShot G2", 4.55f},
    {"Canon", "Canon PowerShot G3", 4.55f},
    {"Canon", "Canon PowerShot G9", 4.55f},
    {"Canon", "Canon PowerShot G5", 4.84f},
    {"Canon", "Canon PowerShot G6", 4.84f},
    {"Canon", "Canon PowerShot G7", 4.84f},
    {"Canon", "Canon PowerShot S30", 4.84f},
    {"Canon", "Canon PowerShot S40", 4.84f},
    {"Canon", "Canon PowerShot S45", 4.84f},
    {"Canon", "Canon PowerShot S50", 4.84f},
    {"Canon", "Canon PowerShot S60", 4.84f},
    {"Canon", "Canon PowerShot S70", 4.84f},
    {"Canon", "Canon PowerShot Pro1", 3.93f},
    {"NIKON", "COOLPIX P6000", 4.63415f},
    {"NIKON", "E5400", 4.84f},
    {"NIKON", "E8400", 3.93f},
    {"NIKON", "E8700", 3.93f},
    {"NIKON", "E8800", 3.93f},
    {"NIKON CORPORATION", "NIKON D1", 1.5f},
    {"NIKON CORPORATION", "NIKON D100", 1.5f},
    {"NIKON CORPORATION", "NIKON D1H", 1.5f},
    {"NIKON CORPORATION", "NIKON D1X", 1.5f},
    {"NIKON CORPORATION", "NIKON D200", 1.5f},
    {"NIKON CORPORATION", "NIKON D2H", 1.5f},
    {"NIKON CORPORATION", "NIKON D2Hs", 1.5f},
    {"NIKON CORPORATION", "NIKON D2X", 1.5f},
    {"NIKON CORPORATION", "NIKON D2Xs", 1.5f},
    {"NIKON CORPORATION", "NIKON D300", 1.5f},
    {"NIKON CORPORATION", "NIKON D40", 1.5f},
    {"NIKON CORPORATION", "NIKON D40X", 1.5f},
    {"NIKON CORPORATION", "NIKON D50", 1.5f},
    {"NIKON CORPORATION", "NIKON D60", 1.5f},
    {"NIKON CORPORATION", "NIKON D70", 1.5f},
    {"NIKON CORPORATION", "NIKON D70s", 1.5f},
    {"NIKON CORPORATION", "NIKON D80", 1.5f},
    {"NIKON CORPORATION", "NIKON D90", 1.5f},
    {"NIKON CORPORATION", "NIKON D3", 1.0f},
    {"NIKON CORPORATION", "NIKON D3X", 1.0f},
    {"NIKON CORPORATION", "NIKON D700", 1.0f},
    {"SIGMA", "SIGMA DP1", 1.7f},
    {"SIGMA", "SIGMA DP2", 1.7f},
    {"SIGMA", "SIGMA SD10", 1.7f},
    {"SIGMA", "SIGMA SD14", 1.7f},
    {"SIGMA", "SIGMA SD9", 1.7f},
    {"SONY", "DSC-R1", 1.6f},
    {"SONY", "DSC-V3", 4.84f},
    {"SONY", "DSLR-A100", 1.5f},
    {"SONY", "DSLR-A200", 1.5f},
    {"SONY", "DSLR-A300", 1.5f},
    {"SONY", "DSLR-A350", 1.5f},
    {"SONY", "DSLR-A700", 1.5f},
    {"SONY", "DSLR-A900", 1.0f},
    {"OLYMPUS CORPORATION", "E-1", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-3", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-30", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-300", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-330", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-400", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-410", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-420", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-450", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-500", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-510", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-520", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-600", 2.0f},
    {"OLYMPUS IMAGING CORP.", "E-620", 2.0f},
    {"LEICA", "DIGILUX3", 2.0f},
};

// A finite single-precision value, or nothing.
bool ToFloat(double value, float& out) {
  if (!std::isfinite(value) || std::fabs(value) > double(std::numeric_limits<float>::max())) {
    return false;
  }
  out = float(value);
  return true;
}

// The number at the start of text, and where it ends.
bool LeadingNumber(std::string_view text, double& value, std::size_t& used) {
  std::size_t at = 0;
  if (!text.empty() && text[0] == '+') at = 1;
  if (at < text.size() && text[at] != '-' && text[at] != '.' &&
      !std::isdigit(static_cast<unsigned char>(text[at]))) {
    return false;  // no words such as "inf" or "nan"
  }
  if (at == 1 && at < text.size() && text[at] == '-') return false;
  const char* begin = text.data() + at;
  const auto [end, error] = std::from_chars(begin, text.data() + text.size(), value);
  if (error != std::errc()) return false;
  used = std::size_t(end - text.data());
  return true;
}

bool ReadRational(const PXmpMeta& xmp, const char* ns, const char* name, float& out) {
  std::string text;
  return xmp.GetProperty(ns, name, text) && PhotoInfo::ParseRational(text, out);
}

void ReadName(const PXmpMeta& xmp, const char* ns, const char* name, std::string& out) {
  std::string text;
  if (xmp.GetProperty(ns, name, text)) out = PhotoInfo::Trim(text);
}

}  // namespace

PhotoInfo::~PhotoInfo() = default;
PhotoInfo::PhotoInfo(PhotoInfo&&) noexcept = default;
PhotoInfo& PhotoInfo::operator=(PhotoInfo&&) noexcept = default;

PhotoInfo::PhotoInfo(const PhotoInfo& other)
    : v_(other.v_),
      cropFactorCache_(other.cropFactorCache_),
      cameraModel_(other.cameraModel_ != nullptr ? other.cameraModel_->Clone() : nullptr) {}

PhotoInfo& PhotoInfo::operator=(const PhotoInfo& other) {
  if (this != &other) {
    PhotoInfo copy(other);
    *this = std::move(copy);
  }
  return *this;
}

std::string PhotoInfo::Trim(const std::string& text) {
  constexpr const char* kSpace = " \t\n\v\f\r";
  const std::size_t first = text.find_first_not_of(kSpace);
  if (first == std::string::npos) return {};
  return text.substr(first, text.find_last_not_of(kSpace) - first + 1);
}

bool PhotoInfo::ParseRational(const std::string& text, float& out) {
  const std::string trimmed = Trim(text);
  const std::string_view view(trimmed);
  double numerator = 0;
  std::size_t used = 0;
  if (!LeadingNumber(view, numerator, used)) return false;
  double value = numerator;
  double denominator = 0;
  std::size_t usedDenominator = 0;
  if (used < view.size() && view[used] == '/' &&
      LeadingNumber(view.substr(used + 1), denominator, usedDenominator) && denominator != 0) {
    value = numerator / denominator;
  }
  return ToFloat(value, out);
}

// ---- Reading ----------------------------------------------------------------------------

void PhotoInfo::Load(const Tarsa::CQuillmarkPlugin& host, std::uint32_t width,
                     std::uint32_t height) {
  v_.imageWidth = width;
  v_.imageHeight = height;
  cropFactorCache_ = 0;
  try {
    std::string packet;
    if (host.GetPropertyBytes(kPropMetadata, packet) && !packet.empty()) {
      Parse(packet.data(), packet.size());
    }
  } catch (const Tarsa::CException&) {
    // Metadata is a help, never a condition: a host that cannot give it
    // leaves the photo unknown.
  } catch (const std::exception&) {
  }
}

void PhotoInfo::Parse(const char* bytes, std::size_t size) {
  const PXmpMeta xmp(bytes, size);
  if (!xmp.IsParsed()) return;
  ParseCamera(xmp);
  ParseExposure(xmp);
  ParseSensor(xmp);
  ParsePanorama(xmp);
  cropFactorCache_ = 0;
}

void PhotoInfo::ParseCamera(const PXmpMeta& xmp) {
  const char* tiff = PXmpMeta::TiffNamespace();
  const char* aux = PXmpMeta::ExifAuxNamespace();
  ReadName(xmp, tiff, "Make", v_.make);
  ReadName(xmp, tiff, "Model", v_.model);
  ReadName(xmp, aux, "SerialNumber", v_.serialNumber);
  ReadName(xmp, aux, "Lens", v_.lens);
  ReadName(xmp, aux, "LensInfo", v_.lensInfo);
  ReadName(xmp, aux, "LensID", v_.lensId);
}

void PhotoInfo::ParseExposure(const PXmpMeta& xmp) {
  const char* exif = PXmpMeta::ExifNamespace();
  ReadRational(xmp, exif, "MaxApertureValue", v_.maxApertureValue);
  std::int32_t program = 0;
  if (xmp.GetProperty_Int(exif, "ExposureProgram", program) && program >= 0) {
    v_.exposureProgram = std::uint32_t(program);
  }
  ReadRational(xmp, exif, "ExposureTime", v_.exposureTime);
  ReadRational(xmp, exif, "ShutterSpeedValue", v_.shutterSpeedValue);
  ReadRational(xmp, exif, "FNumber", v_.fNumber);
  ReadRational(xmp, exif, "ApertureValue", v_.apertureValue);
  std::string iso;
  if (xmp.GetArrayItem(exif, "ISOSpeedRatings", 1, iso)) {
    const std::string trimmed = Trim(iso);
    std::uint32_t value = 0;
    const char* end = trimmed.data() + trimmed.size();
    if (std::from_chars(trimmed.data(), end, value).ec == std::errc()) v_.isoSpeed = value;
  }
  ReadRational(xmp, exif, "FocalLength", v_.focalLength);
  ReadRational(xmp, exif, "FocalLengthIn35mmFilm", v_.focalLength35mm);
}

void PhotoInfo::ParseSensor(const PXmpMeta& xmp) {
  const char* exif = PXmpMeta::ExifNamespace();
  const char* tiff = PXmpMeta::TiffNamespace();

  std::int32_t unitCode = 0;
  xmp.GetProperty_Int(exif, "FocalPlaneResolutionUnit", unitCode);
  const double planeUnit = unitCode == 3 ? 10.0 : 25.4;  // millimetres
  float resolution = 0;
  if (ReadRational(xmp, exif, "FocalPlaneXResolution", resolution) && resolution > 0) {
    ToFloat(double(v_.imageWidth) * planeUnit / resolution, v_.sensorWidth);
  }
  resolution = 0;
  if (ReadRational(xmp, exif, "FocalPlaneYResolution", resolution) && resolution > 0) {
    ToFloat(double(v_.imageHeight) * planeUnit / resolution, v_.sensorHeight);
  }

  unitCode = 0;
  xmp.GetProperty_Int(tiff, "ResolutionUnit", unitCode);
  const float imageUnit = unitCode == 3 ? 1.0f : 2.54f;  // centimetres
  if (ReadRational(xmp, tiff, "XResolution", resolution)) v_.xResolution = resolution / imageUnit;
  if (ReadRational(xmp, tiff, "YResolution", resolution)) v_.yResolution = resolution / imageUnit;

  if (!ReadRational(xmp, exif, "SubjectDistance", v_.subjectDistance)) {
    ReadRational(xmp, PXmpMeta::ExifAuxNamespace(), "ApproximateFocusDistance", v_.subjectDistance);
  }
}

void PhotoInfo::ParsePanorama(const PXmpMeta& xmp) {
  const char* ns = PXmpMeta::kPanoramaNamespace;
  PXmpMeta::RegisterNamespace(ns, "panorama");
  std::string transformation;
  if (xmp.GetProperty(ns, "Transformation", transformation)) {
    transformation = Trim(transformation);
    v_.panoramaType = transformation == "Cylindrical"   ? kPanoramaCylindrical
                      : transformation == "Spherical"   ? kPanoramaSpherical
                      : transformation == "Perspective" ? kPanoramaPerspective
                                                        : kPanoramaNone;
  }
  // Stored as fractions of the longer side.
  const double side = double(LongerSide());
  auto scaled = [&](const char* name, float& out) {
    double value = 0;
    return xmp.GetProperty_Float(ns, name, value) && ToFloat(value * side, out);
  };
  scaled("VirtualFocalLength", v_.virtualFocalLength);
  const bool hasX = scaled("VirtualImageXCenter", v_.virtualCenterX);
  const bool hasY = scaled("VirtualImageYCenter", v_.virtualCenterY);
  v_.hasPanorama = v_.panoramaType >= kPanoramaCylindrical &&
                   v_.panoramaType <= kPanoramaPerspective && v_.virtualFocalLength > kEps &&
                   hasX && hasY;
}

// ---- Derived values -------------------------------------------------------------------

std::uint32_t PhotoInfo::LongerSide() const { return std::max(v_.imageWidth, v_.imageHeight); }

float PhotoInfo::GetCropFactor() const {
  if (cropFactorCache_ > 0) return cropFactorCache_;
  float crop = 0;
  if (v_.focalLength > 0 && v_.focalLength35mm > 0) {
    crop = v_.focalLength35mm / v_.focalLength;
    // These cameras round their 35 mm focal length; near 1.0 or 1.5 the
    // sensor is one of those two.
    std::string make = v_.make;
    std::transform(make.begin(), make.end(), make.begin(),
                   [](unsigned char c) { return char(std::toupper(c)); });
    if (make.find("NIKON") != std::string::npos &&
        (std::fabs(crop - 1.0f) <= 0.25f || std::fabs(crop - 1.5f) <= 0.25f)) {
      crop = std::fabs(crop - 1.5f) <= std::fabs(crop - 1.0f) ? 1.5f : 1.0f;
    }
  } else if (v_.sensorWidth > 0 && v_.sensorHeight > 0) {
    const double w = v_.sensorWidth;
    const double h = v_.sensorHeight;
    crop = float(std::sqrt(kFullFrameDiagonal2 / (w * w + h * h)));
  } else {
    for (const KnownCamera& camera : kKnownCameras) {
      if (v_.make == camera.make && v_.model == camera.model) {
        crop = camera.cropFactor;
        break;
      }
    }
  }
  if (std::isfinite(crop)) cropFactorCache_ = crop;
  return cropFactorCache_;
}

float PhotoInfo::GetFocal35mm() const {
  return v_.focalLength35mm > 0 ? v_.focalLength35mm : GetCropFactor() * v_.focalLength;
}

float PhotoInfo::GetAperture() const {
  if (v_.apertureValue > 0) return v_.apertureValue;
  if (v_.fNumber > 0) return 2.0f * std::log2(v_.fNumber);
  return v_.fNumber;
}

float PhotoInfo::FocalFromMetadata() const {
  const float focal = v_.focalLength;
  const float crop = GetCropFactor();
  const double longer = double(LongerSide());
  if (std::fabs(focal) < 0.01f || crop < 0.01f || longer <= 0) return 0;
  const double w = v_.imageWidth;
  const double h = v_.imageHeight;
  float out = 0;
  ToFloat(std::sqrt(w * w + h * h) * focal * crop / std::sqrt(kFullFrameDiagonal2) / longer, out);
  return out;
}

PanoramaProjection PhotoInfo::Panorama() const {
  PanoramaProjection panorama;
  panorama.type = v_.panoramaType;
  panorama.focal = v_.virtualFocalLength;
  panorama.centerX = v_.virtualCenterX;
  panorama.centerY = v_.virtualCenterY;
  panorama.imageWidth = float(v_.imageWidth);
  return panorama;
}

// ---- Profile entries ------------------------------------------------------------------

void PhotoInfo::SetMake(const std::string& text) {
  v_.make = Trim(text);
  cropFactorCache_ = 0;
}
void PhotoInfo::SetModel(const std::string& text) {
  v_.model = Trim(text);
  cropFactorCache_ = 0;
}
void PhotoInfo::SetSerialNumber(const std::string& text) { v_.serialNumber = Trim(text); }
void PhotoInfo::SetLens(const std::string& text) { v_.lens = Trim(text); }
void PhotoInfo::SetLensInfo(const std::string& text) { v_.lensInfo = Trim(text); }
void PhotoInfo::SetLensId(const std::string& text) { v_.lensId = Trim(text); }
void PhotoInfo::SetCameraPrettyName(const std::string& text) { v_.cameraPrettyName = Trim(text); }
void PhotoInfo::SetLensPrettyName(const std::string& text) { v_.lensPrettyName = Trim(text); }

void PhotoInfo::SetImageSize(std::uint32_t width, std::uint32_t height) {
  v_.imageWidth = width;
  v_.imageHeight = height;
}

void PhotoInfo::SetFocalLength(float millimetres) {
  v_.focalLength = millimetres;
  cropFactorCache_ = 0;
}

void PhotoInfo::SetApertureValue(float apex) { v_.apertureValue = apex; }

void PhotoInfo::SetCameraModel(std::unique_ptr<PGenericCameraModel> model) {
  cameraModel_ = std::move(model);
}

}  // namespace Project
