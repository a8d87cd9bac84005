#include "lens/profiles/PLensProfiles.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <string>

#include "lens/camera/PFisheyeCameraModel.h"
#include "lens/camera/PRadialDistortCameraModel.h"
#include "lens/camera/PTangentialDistortCameraModel.h"
#include "lens/metadata/PXmpMeta.h"

namespace Project {

namespace {

constexpr float kEps = PGenericCameraModel::kEps;
// Real profiles hold tens of entries; a file claiming more than this is not
// read at all rather than read for minutes.
constexpr std::int32_t kMostEntries = 10000;
constexpr const char* kProfilesNs = PXmpMeta::kQuillmarkNamespace;
constexpr const char* kEntryNs = PXmpMeta::kCameraProfileNamespace;

// Reads the fields of one struct of the profile array.
class StructReader {
 public:
  StructReader(const PXmpMeta& xmp, std::string path) : xmp_(xmp), path_(std::move(path)) {}

  StructReader Struct(const char* name) const { return StructReader(xmp_, Path(name)); }
  bool Text(const char* name, std::string& out) const {
    return xmp_.GetProperty(kProfilesNs, Path(name).c_str(), out);
  }
  bool Has(const char* name) const {
    std::string ignored;
    return Text(name, ignored);
  }
  // A number that fits a float; anything else is absent.
  bool Float(const char* name, float& out) const {
    double value = 0;
    if (!xmp_.GetProperty_Float(kProfilesNs, Path(name).c_str(), value)) return false;
    if (!std::isfinite(value) || std::fabs(value) > double(FLT_MAX)) return false;
    out = float(value);
    return true;
  }
  bool Bool(const char* name, bool& out) const {
    return xmp_.GetProperty_Bool(kProfilesNs, Path(name).c_str(), out);
  }
  bool Int(const char* name, std::int32_t& out) const {
    return xmp_.GetProperty_Int(kProfilesNs, Path(name).c_str(), out);
  }

 private:
  std::string Path(const char* name) const {
    return PXmpMeta::ComposeStructFieldPath(kProfilesNs, path_.c_str(), kEntryNs, name);
  }

  const PXmpMeta& xmp_;
  std::string path_;
};

bool IsModelStruct(const StructReader& model) {
  std::int32_t version = 0;
  return model.Int("Version", version) && version >= 1;
}

void ReadCommonModel(const StructReader& in, PGenericCameraModel& model) {
  float value = 0;
  // A missing or non-positive focal length is none at all (0), which a
  // matched entry gets from the photo's metadata.
  model.focalX = in.Float("FocalLengthX", value) && value > 0 ? value : 0.0f;
  model.focalY = in.Float("FocalLengthY", value) && value > 0 ? value : 0.0f;
  if (in.Float("ImageXCenter", value)) model.centerX = value;
  if (in.Float("ImageYCenter", value)) model.centerY = value;
  if (in.Float("ResidualMeanError", value)) model.residualMeanError = value;
  if (in.Float("ResidualStandardDeviation", value)) model.residualStdDev = value;
}

std::unique_ptr<PGenericCameraModel> ReadPerspective(const StructReader& in) {
  const bool tangential = in.Has("TangentialDistortParam1") || in.Has("TangentialDistortParam2");
  std::unique_ptr<PRadialDistortCameraModel> model;
  if (tangential) {
    auto both = std::make_unique<PTangentialDistortCameraModel>();
    in.Float("TangentialDistortParam1", both->tangential1);
    in.Float("TangentialDistortParam2", both->tangential2);
    model = std::move(both);
  } else {
    model = std::make_unique<PRadialDistortCameraModel>();
  }
  ReadCommonModel(in, *model);
  float value = 0;
  if (in.Float("ScaleFactor", value)) model->SetScale(value);
  in.Float("RadialDistortParam1", model->radial1);
  in.Float("RadialDistortParam2", model->radial2);
  in.Float("RadialDistortParam3", model->radial3);
  return model;
}

std::unique_ptr<PGenericCameraModel> ReadFisheye(const StructReader& in) {
  auto model = std::make_unique<PFisheyeCameraModel>();
  ReadCommonModel(in, *model);
  in.Float("RadialDistortParam1", model->radial1);
  in.Float("RadialDistortParam2", model->radial2);
  return model;
}

// Half-up rounding of a positive pixel count; 0 when it does not fit.
std::uint32_t Pixels(float value) {
  if (!(value > 0) || double(value) + 0.5 >= 4294967296.0) return 0;
  return std::uint32_t(std::floor(double(value) + 0.5));
}

std::unique_ptr<PhotoInfo> ReadEntry(const StructReader& in) {
  auto entry = std::make_unique<PhotoInfo>();
  std::string text;
  if (in.Text("Make", text)) entry->SetMake(text);
  if (in.Text("Model", text)) entry->SetModel(text);
  if (in.Text("SerialNumber", text)) entry->SetSerialNumber(text);
  if (in.Text("Lens", text)) entry->SetLens(text);
  if (in.Text("LensInfo", text)) entry->SetLensInfo(text);
  if (in.Text("CameraPrettyName", text)) entry->SetCameraPrettyName(text);
  if (in.Text("LensPrettyName", text)) entry->SetLensPrettyName(text);

  float width = 0;
  float height = 0;
  in.Float("ImageWidth", width);
  in.Float("ImageLength", height);
  entry->SetImageSize(Pixels(width), Pixels(height));
  float value = 0;
  if (in.Float("FocalLength", value) && value > 0) entry->SetFocalLength(value);
  if (in.Float("ApertureValue", value) && value > 0) entry->SetApertureValue(value);
  if (in.Float("SensorFormatFactor", value) && value > 0) entry->SetSensorFormatFactor(value);
  bool raw = false;
  if (in.Bool("CameraRawProfile", raw)) entry->SetCameraRawProfile(raw);
  if (in.Float("FocusDistance", value)) entry->SetFocusDistance(value);

  std::unique_ptr<PGenericCameraModel> model;
  if (const StructReader perspective = in.Struct("PerspectiveModel"); IsModelStruct(perspective)) {
    model = ReadPerspective(perspective);
  }
  if (const StructReader fisheye = in.Struct("FisheyeModel"); IsModelStruct(fisheye)) {
    model = ReadFisheye(fisheye);
  }
  if (model != nullptr) entry->SetCameraModel(std::move(model));
  return entry;
}

bool SameCameraAndLens(const PhotoInfo& a, const PhotoInfo& b) {
  return a.GetMake() == b.GetMake() && a.GetModel() == b.GetModel() && a.GetLens() == b.GetLens();
}

bool IsFisheye(const PhotoInfo& entry) {
  return entry.GetCameraModel()->GetType() == PGenericCameraModel::kTypeFisheye;
}

// Whether a rule decides: a before b (answer true), b before a (answer
// false), or neither (no decision).
enum class Rule { kBefore, kAfter, kUndecided };

Rule Smaller(double a, double b, double tolerance) {
  if (std::fabs(a - b) <= tolerance) return Rule::kUndecided;
  return a < b ? Rule::kBefore : Rule::kAfter;
}

Rule Bytes(const std::string& a, const std::string& b) {
  const int order = a.compare(b);
  return order == 0 ? Rule::kUndecided : order < 0 ? Rule::kBefore : Rule::kAfter;
}

double ResolutionOf(const PhotoInfo& entry) {
  const double x = entry.GetXResolution();
  const double y = entry.GetYResolution();
  return std::sqrt((x * x + y * y) / 2);
}

// The nearer of two values to a target, or with no target (at most eps) the
// farther from it; undecided at an equal distance.
Rule Nearer(double a, double b, double target) {
  const double da = std::fabs(a - target);
  const double db = std::fabs(b - target);
  if (da == db) return Rule::kUndecided;
  const bool aFirst = target > kEps ? da < db : da > db;
  return aFirst ? Rule::kBefore : Rule::kAfter;
}

}  // namespace

bool PLensProfiles::IsUsable(const PhotoInfo& entry) {
  const PGenericCameraModel* model = entry.GetCameraModel();
  if (model == nullptr) return false;
  const std::int32_t type = model->GetType();
  return type >= PGenericCameraModel::kTypeRadial && type <= PGenericCameraModel::kTypeFisheye &&
         model->IsValid();
}

bool PLensProfiles::PassesFileCheck(const std::vector<const PhotoInfo*>& entries) {
  if (entries.empty()) return false;
  const PhotoInfo& first = *entries.front();
  if (!IsUsable(first)) return false;
  for (const PhotoInfo* entry : entries) {
    if (!IsUsable(*entry) || !SameCameraAndLens(*entry, first) ||
        entry->GetCameraModel()->HasFocalLength() != first.GetCameraModel()->HasFocalLength() ||
        entry->GetCameraRawProfile() != first.GetCameraRawProfile() ||
        !(std::fabs(entry->GetSensorFormatFactor() - first.GetSensorFormatFactor()) <= 0.05f) ||
        IsFisheye(*entry) != IsFisheye(first)) {
      return false;
    }
  }
  return true;
}

bool PLensProfiles::ParseFile(const char* data, std::size_t size, bool firstOnly) {
  // The fields are addressed by prefix, which needs their namespaces known
  // even when the file names them otherwise or not at all.
  PXmpMeta::RegisterNamespace(kProfilesNs, "qmprofiles");
  PXmpMeta::RegisterNamespace(kEntryNs, "qmcamera");
  const PXmpMeta xmp(data, size);
  if (!xmp.IsParsed()) return false;
  std::int32_t count = xmp.CountArrayItems(kProfilesNs, "CameraProfiles");
  if (count > kMostEntries) return false;
  if (firstOnly) count = std::min(count, 1);

  std::vector<std::unique_ptr<PhotoInfo>> read;
  for (std::int32_t i = 1; i <= count; ++i) {
    std::unique_ptr<PhotoInfo> entry = ReadEntry(
        StructReader(xmp, PXmpMeta::ComposeArrayItemPath(kProfilesNs, "CameraProfiles", i)));
    if (IsUsable(*entry)) read.push_back(std::move(entry));
  }
  std::vector<const PhotoInfo*> check;
  for (const auto& entry : read) check.push_back(entry.get());
  if (!PassesFileCheck(check)) return false;
  for (auto& entry : read) Insert(std::move(entry));
  return true;
}

void PLensProfiles::Insert(std::unique_ptr<PhotoInfo> entry) {
  // After its equals: those keep the order in which they came.
  const auto at =
      std::upper_bound(entries_.begin(), entries_.end(), entry,
                       [](const std::unique_ptr<PhotoInfo>& a,
                          const std::unique_ptr<PhotoInfo>& b) { return EntryLess(*a, *b); });
  entries_.insert(at, std::move(entry));
}

bool PLensProfiles::EntryLess(const PhotoInfo& a, const PhotoInfo& b) {
  const Rule rules[] = {
      Bytes(a.GetMake(), b.GetMake()),
      Bytes(a.GetModel(), b.GetModel()),
      Bytes(a.GetLens(), b.GetLens()),
      a.GetLensInfo() == b.GetLensInfo() ? Bytes(a.GetLensId(), b.GetLensId())
                                         : (!a.GetLensInfo().empty() && !b.GetLensInfo().empty()
                                                ? Bytes(a.GetLensInfo(), b.GetLensInfo())
                                                : Rule::kUndecided),
      Smaller(a.GetFocalLength(), b.GetFocalLength(), 0.01),
      Smaller(a.GetAperture(), b.GetAperture(), 0.01),
      Smaller(a.GetImageWidth(), b.GetImageWidth(), 0),
      Smaller(a.GetImageHeight(), b.GetImageHeight(), 0),
      Smaller(ResolutionOf(a), ResolutionOf(b), 0.01),
      Smaller(a.GetFocusDistance(), b.GetFocusDistance(), kEps),
      a.GetCameraRawProfile() == b.GetCameraRawProfile()
          ? Rule::kUndecided
          : (a.GetCameraRawProfile() ? Rule::kBefore : Rule::kAfter),
  };
  for (const Rule rule : rules) {
    if (rule != Rule::kUndecided) return rule == Rule::kBefore;
  }
  // The same calibration, or not: either way the order of reading stands,
  // which Insert keeps for equal entries.
  return false;
}

bool PLensProfiles::NearerLess(const PhotoInfo& a, const PhotoInfo& b, const PhotoInfo& photo) {
  Rule rule = Rule::kUndecided;
  if (std::fabs(a.GetFocalLength() - b.GetFocalLength()) >= 0.01f) {
    rule = Nearer(a.GetFocalLength(), b.GetFocalLength(), photo.GetFocalLength());
  } else if (std::fabs(a.GetAperture() - b.GetAperture()) >= 0.01f) {
    rule = Nearer(a.GetAperture(), b.GetAperture(), photo.GetAperture());
  } else if (std::fabs(a.GetFocusDistance() - b.GetFocusDistance()) >= 0.01f) {
    rule = Nearer(a.GetFocusDistance(), b.GetFocusDistance(), photo.GetSubjectDistance());
  }
  return rule == Rule::kBefore;
}

const PhotoInfo* PLensProfiles::BestProfile(const PhotoInfo& photo,
                                            std::vector<const PhotoInfo*>* outList,
                                            std::size_t limit) const {
  std::vector<const PhotoInfo*> sorted;
  sorted.reserve(entries_.size());
  for (const auto& entry : entries_) sorted.push_back(entry.get());
  // Stable: entries the rules do not part keep the list's order. A merge
  // sort also stays within bounds whatever the tolerances make of the order.
  std::stable_sort(sorted.begin(), sorted.end(), [&photo](const PhotoInfo* a, const PhotoInfo* b) {
    return NearerLess(*a, *b, photo);
  });
  if (outList != nullptr) {
    const std::size_t count = limit == 0 ? sorted.size() : std::min(limit, sorted.size());
    outList->assign(sorted.begin(), sorted.begin() + std::ptrdiff_t(count));
  }
  return sorted.empty() ? nullptr : sorted.front();
}

}  // namespace Project
