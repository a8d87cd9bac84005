#include "filter/PFilter.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include "framework/core/CException.h"
#include "framework/files/CDirectory.h"
#include "framework/native/NativeDisplay.h"
#include "framework/process/CReporter.h"
#include "lens/metadata/PXmpMeta.h"
#include "lens/sphere/ChoosePhotoToSphere.h"
#include "params/BehaviorFile.h"
#include "params/Descriptor.h"
#include "params/PreferencesDirectory.h"
#include "solver/constraints/ConstraintBlobAdapter.h"
#include "solver/frame/Solver.h"

namespace Project {

using Tarsa::CReporter;
using Tarsa::FourCC;

namespace {

PFilter* gPFilter = nullptr;

constexpr std::uint32_t kPropHostVersion = FourCC("vers");
constexpr std::uint32_t kPropGraphicsProcessor = FourCC("GPUF");
constexpr std::uint32_t kPropPlayInfo = FourCC("plip");

constexpr std::uint32_t kSupportedHostMajor = 18;
constexpr std::intptr_t kGraphicsProcessorOn = 0x80;

constexpr const char* kUnsupportedVersionText =
    "$$$/Archway/Warning/UnsupportedVersion=This feature is not supported by the current version "
    "of Quillmark.";
constexpr const char* kGPUUnusedText =
    "$$$/Archway/Warning/GPUUnusedText=This feature requires graphics processor acceleration. "
    "Please check the Performance Preferences and verify that 'Use Graphics Processor' is "
    "enabled.";
constexpr const char* kGPUUnusedTitle = "$$$/Archway/Warning/GPUUnusedTitle=Archway Error";
constexpr const char* kNoOpenGLText =
    "$$$/Archway/Warning/NoOpenGLSupportText=This feature cannot run because this machine does "
    "not provide required OpenGL support.";
constexpr const char* kNoOpenGLTitle = "$$$/Archway/Warning/NoOpenGLSupportTitle=Archway Error";
constexpr const char* kNo16BitText =
    "$$$/Archway/Warning/NoOpenGLSupportSuchModeText=The version of OpenGL is too low to support "
    "16-bit per channel image. Please try to update OpenGL driver or convert the image to 8-bit "
    "per channel in Quillmark.";
constexpr const char* kNo16BitTitle =
    "$$$/Archway/Warning/NoOpenGLSupportSuchModeTitle=Archway Error";
constexpr const char* kInvalidFullSphericalText =
    "$$$/Archway/Warning/InvalidFullSphericalRatio=The aspect ratio is not 1:2, which is invalid "
    "for Full Spherical.";

constexpr const char* kDialogMissingText =
    "$$$/Archway/Error/DialogMissing=This build of Archway cannot open its workspace yet.";

constexpr const char* kUnusableValueText =
    "$$$/Archway/Error/UnusableValue=The action's value ^0 for '^1' cannot be used: ^2.";
constexpr const char* kNotANumberText = "$$$/Archway/Error/NotANumber=it is not a finite number";
constexpr const char* kUnknownValueText =
    "$$$/Archway/Error/UnknownValue=The action's value '^0' for '^1' cannot be used: it is not "
    "one of ^2.";
constexpr const char* kOutsideText = "$$$/Archway/Error/Outside=it must lie between ^0 and ^1";
constexpr const char* kFocalOutsideText =
    "$$$/Archway/Error/FocalOutside=the focal length must lie between ^0 and ^1 pixels for this "
    "photo";
// What a replayed crop factor and scale may be: the dialog's crop floor up
// to a sensor a hundred times smaller than a full frame, and a result from
// a hundredth to a hundred times the photo's size.
constexpr float kLowestCrop = 0.1f;
constexpr float kHighestCrop = 100.0f;
constexpr std::int32_t kLowestScale = 1;
constexpr std::int32_t kHighestScale = 10000;

constexpr std::uint32_t kAllResetKeys =
    Tarsa::Native::kModifierControl | Tarsa::Native::kModifierAlt | Tarsa::Native::kModifierShift;

// Millimetres across a 35 mm frame's longer side.
constexpr float kFrameWidth = 36.0f;
// Focal lengths closer than this are one.
constexpr float kFocalTolerance = 0.01f;
// At 16 mm equivalent a lens is as likely a fisheye as a rectilinear one.
constexpr float kFisheyeLimit = 16.0f;

}  // namespace

PFilter::PFilter() { gPFilter = this; }

PFilter::~PFilter() {
  if (lensSuite_ != nullptr) ReleaseSuite(Tarsa::kLensProfilesSuite, 2);
  CloseMetadata();
  // The run's objects go before the hub, whose going ends OpenGL.
  preferences_.reset();
  settings_.reset();
  imageHub_.reset();
  if (gPFilter == this) gPFilter = nullptr;
}

PFilter* PFilter::Current() { return gPFilter; }

bool PFilter::SplitMemory(std::uint32_t total, std::uint32_t& first, std::uint32_t& second) {
  first = std::uint32_t(std::floor(0.8 * double(total)));
  second = total - first;
  return true;
}

bool PFilter::DoParameters() {
  Use32BitCoordinates(true);
  return true;
}

bool PFilter::DoPrepareFinish() { return DoParameters(); }

// ---- Objects of a run ---------------------------------------------------------------

std::string PFilter::PreferencesDirectory() const {
  Tarsa::CDirectory directory;
  if (!GetPreferencesDirectory(directory)) return {};
  return directory.GetPath();
}

PImageHub& PFilter::ImageHub() {
  if (imageHub_ == nullptr) {
    PRenderContext& run = *this;
    imageHub_ = std::make_unique<PImageHub>(run, ImageRect(), LayerRect(), Depth(),
                                            PreferencesDirectory(), ShaderFile());
  }
  return *imageHub_;
}

PSettings& PFilter::Settings() {
  if (settings_ == nullptr) {
    // The hub's image rectangle is the filter's ImageRect(); asked here
    // directly, so that settings never start OpenGL.
    settings_ = std::make_unique<PSettings>(
        std::int32_t(std::min<std::int64_t>(ImageRect().Width(), INT32_MAX)));
  }
  return *settings_;
}

PPreferences& PFilter::Preferences() {
  if (preferences_ == nullptr) {
    // Holding all three keys at this moment starts from the defaults.
    const bool useDefaults = (HeldModifiers() & kAllResetKeys) == kAllResetKeys;
    preferences_ = std::make_unique<PPreferences>(
        std::int32_t(std::min<std::int64_t>(ImageRect().Width(), INT32_MAX)));
    if (!useDefaults) preferences_->Load();
  }
  return *preferences_;
}

// ---- The run -------------------------------------------------------------------------

bool PFilter::DoStart() {
  rendered_ = 0;

  std::intptr_t hostVersion = 0;
  if (!GetProperty(kPropHostVersion, hostVersion) ||
      (std::uint32_t(hostVersion) >> 16) != kSupportedHostMajor) {
    CReporter::ShowAlert(CReporter::AlertTitle(), kUnsupportedVersionText);
    return false;
  }

  std::intptr_t graphics = 0;
  if (!GetProperty(kPropGraphicsProcessor, graphics) || (graphics & kGraphicsProcessorOn) == 0) {
    CReporter::ShowAlert(kGPUUnusedTitle, kGPUUnusedText);
    return false;
  }

  PImageHub& hub = ImageHub();
  if (hub.GLStatus() == PImageHub::kGLMissing) {
    CReporter::ShowAlert(kNoOpenGLTitle, kNoOpenGLText);
  } else if (hub.GLStatus() == PImageHub::kGLNo16BitPath) {
    CReporter::ShowAlert(kNo16BitTitle, kNo16BitText);
  }
  if (!hub.GLUsable()) return false;

  OpenMetadata();
  PPreferences& preferences = Preferences();
  PSettings& settings = Settings();
  PSettings local(preferences.settings);
  // A silent run takes nothing from the last run's photo: what its action
  // does not say comes from this photo (ResolveUnsaid).
  if (!IsInteractive()) local.SetDefaults();

  ImageHub();
  SuspendWatchCursor(true);
  Use32BitCoordinates(true);
  FilterRecord()->flagByte94 = 0;

  try {
    std::intptr_t playInfo = 0;
    if (GetProperty(kPropPlayInfo, playInfo) && playInfo != 0 && ReadDescriptor(local)) {
      settings = local;
      RefuseUnusableValues();
      if (IsInteractive()) {
        ResolveProjectionModel(PSettings::kModelFisheye, false, false);
      } else {
        ResolveUnsaid(descriptorRead_.keys);
      }
      PrepareSolver();
      if (IsInteractive()) {
        LoadBehaviorFile();
        if (RunDialog()) {
          rendered_ = 1;
          WriteDescriptor(settings);
        }
      } else {
        Solve();
        if (hub.RenderFinalSilent()) {
          rendered_ = 1;
          WriteDescriptor(settings);
        }
      }
    } else if (IsInteractive()) {
      settings = preferences.settings;
      ResolveProjectionModel(PSettings::kModelFisheye, true, false);
      settings.focalLength = FocalFromMetadata(true);
      LoadBehaviorFile();
      PrepareSolver();
      if (RunDialog()) {
        rendered_ = 1;
        WriteDescriptor(settings);
      }
    } else {
      settings = local;
      ReadDescriptor(settings);  // a descriptor that cannot be read leaves the defaults
      RefuseUnusableValues();
      ResolveUnsaid(descriptorRead_.keys);
      PrepareSolver();
      Solve();
      if (hub.RenderFinalSilent()) {
        rendered_ = 1;
        WriteDescriptor(settings);
      }
    }
    preferences.settings = settings;
    preferences.Save();
  } catch (...) {
    // A failed run saves nothing and writes no descriptor, but lets go of
    // what it took.
    EndRun();
    throw;
  }
  EndRun();
  return rendered_ != 0;
}

void PFilter::OpenMetadata() {
  if (metadataToolkitOpen_ == 0) metadataToolkitOpen_ = PXmpMeta::Initialize() ? 1 : 0;
  photoInfo_ = std::make_unique<PhotoInfo>();
  // Without the toolkit the photo stays unknown, which every user allows.
  if (metadataToolkitOpen_ == 0) return;
  const Tarsa::CRect image = ImageHub().ImageRect();
  auto side = [](std::int64_t length) {
    return std::uint32_t(std::clamp<std::int64_t>(length, 0, UINT32_MAX));
  };
  photoInfo_->Load(*this, side(image.Width()), side(image.Height()));
}

void PFilter::CloseMetadata() {
  photoInfo_.reset();
  if (metadataToolkitOpen_ != 0) PXmpMeta::Terminate();
  metadataToolkitOpen_ = 0;
}

PFilter::FocalData PFilter::MetadataFocalData() const {
  if (photoInfo_ == nullptr) return {};
  return {photoInfo_->GetFocalLength(), photoInfo_->GetCropFactor(),
          photoInfo_->GetFocalLength35mm(), photoInfo_->HasPanorama()};
}

void PFilter::EndRun() {
  if (lensSuite_ != nullptr) {
    ReleaseSuite(Tarsa::kLensProfilesSuite, 2);
    lensSuite_ = nullptr;
  }
  CloseMetadata();
}

ConstraintList& PFilter::Constraints() {
  if (constraints_ == nullptr) {
    SolverContext& context = *this;
    constraints_ = std::make_unique<ConstraintList>(context);
  }
  return *constraints_;
}

std::int32_t PFilter::SourceWidth() const {
  return std::int32_t(std::clamp<std::int64_t>(ImageRect().Width(), 0, INT32_MAX));
}

std::int32_t PFilter::SourceHeight() const {
  return std::int32_t(std::clamp<std::int64_t>(ImageRect().Height(), 0, INT32_MAX));
}

// A new grid and warp for the run's settings, then the bare mesh solved and
// the constraints traced on it and solved.
void PFilter::PrepareSolver() {
  Solver& solver = Constraints().GetSolver();
  solver.RebuildGrid(false);
  solver.RefreshWarp(false);
}

void PFilter::Solve() { Constraints().GetSolver().Solve(true, false); }

void PFilter::SolveAfresh() {
  PrepareSolver();
  Solve();
}

bool PFilter::RunDialog() { throw Tarsa::CError(kDialogMissingText); }

// ---- Descriptor and behavioural file ---------------------------------------------------

void PFilter::ResolveUnsaid(const std::vector<std::uint32_t>& said) {
  const auto saidKey = [&](std::uint32_t key) {
    return std::find(said.begin(), said.end(), key) != said.end();
  };
  PSettings& settings = Settings();
  const bool model = saidKey(DescriptorKey::kProjectionModel);
  const bool automatic = !model || settings.projectionModel == PSettings::kModelAuto;
  ResolveProjectionModel(PSettings::kModelFisheye, automatic, false);
  if (saidKey(DescriptorKey::kFocalLength)) return;
  settings.focalLength = FocalFromMetadata(true);
  // A matched lens profile renders at its own focal length, which the saved
  // action then records: the geometric mean of its two, in pixels of the
  // longer side, as the profile's sphere model takes them.
  const PGenericCameraModel* camera = settings.lensRecord.GetCameraModel();
  if (settings.projectionModel == PSettings::kModelAuto && camera != nullptr) {
    const float crop = GetCropRatio();
    settings.focalLength =
        std::sqrt(camera->focalX * crop * camera->focalY * crop) * float(LargerSide());
  }
}

void PFilter::RefuseUnusableValues() {
  const PSettings& s = Settings();
  // A scripted run refuses an enumerated value it does not know rather than
  // quietly correcting with the fallback model; the dialog shows the
  // fallback, where the user sees it.
  if (!IsInteractive()) {
    for (const DescriptorReport::Unknown& unknown : descriptorRead_.unknownValues) {
      throw Tarsa::CError(Tarsa::ResolveText(kUnknownValueText)
                              .Replace(0, Tarsa::FourCharText(unknown.value))
                              .Replace(1, Tarsa::FourCharText(unknown.key))
                              .Replace(2, KnownValuesText(unknown.key))
                              .Str());
    }
  }
  const auto refuse = [](const char* key, double value, const Tarsa::CString& why) {
    const Tarsa::CString text = Tarsa::ResolveText(kUnusableValueText)
                                    .Replace(0, Tarsa::NumberToText(value, 6, false))
                                    .Replace(1, Tarsa::CString(key))
                                    .Replace(2, why);
    throw Tarsa::CError(text.Str());
  };
  const auto finite = [&](const char* key, double value) {
    if (!std::isfinite(value)) refuse(key, value, Tarsa::ResolveText(kNotANumberText));
  };
  finite("CrpF", s.cropFactor);
  finite("PhyF", s.physicalFocal);
  finite("focL", s.focalLength);
  finite("imgX", s.imageCenterX);
  finite("imgY", s.imageCenterY);
  // A value outside low..high, the bounds shown to `digits` decimals, all
  // of them when fixed.
  const auto within = [&](const char* key, double value, double low, double high, int digits,
                          bool fixed, const char* why) {
    if (value >= low && value <= high) return;
    refuse(key, value,
           Tarsa::ResolveText(why)
               .Replace(0, Tarsa::NumberToText(low, digits, fixed))
               .Replace(1, Tarsa::NumberToText(high, digits, fixed)));
  };
  within("CrpF", s.cropFactor, kLowestCrop, kHighestCrop, 2, false, kOutsideText);
  within("imgS", s.imageScale, kLowestScale, kHighestScale, 0, false, kOutsideText);
  float low = 0, high = 0;
  if (ImageFocalRange(low, high)) {
    within("focL", s.focalLength, low, high, 1, true, kFocalOutsideText);
  }
}

bool PFilter::ReadDescriptor(PSettings& target) {
  const Tarsa::HostFilterRecord* record = FilterRecord();
  if (record == nullptr || record->scriptBlock == nullptr) return false;
  const auto* script = static_cast<const Tarsa::HostScriptBlock*>(record->scriptBlock);
  std::vector<std::uint8_t> constraintData;
  const bool read = Project::ReadDescriptor(DescriptorSuite(), script->descriptor, target,
                                            constraintData, &descriptorRead_);
  ConstraintBlobAdapter::ReadBlob(Constraints(), constraintData.data(), constraintData.size());
  return read;
}

void PFilter::WriteDescriptor(const PSettings& source) {
  Tarsa::HostFilterRecord* record = FilterRecord();
  if (record == nullptr || record->scriptBlock == nullptr) return;
  const std::vector<std::uint8_t> blob = constraints_ != nullptr
                                             ? ConstraintBlobAdapter::WriteBlob(*constraints_)
                                             : std::vector<std::uint8_t>();
  Tarsa::HostHandle handle = Project::WriteDescriptor(DescriptorSuite(), source, blob);
  if (handle != nullptr)
    static_cast<Tarsa::HostScriptBlock*>(record->scriptBlock)->descriptor = handle;
}

void PFilter::LoadBehaviorFile() {
  Tarsa::CDirectory directory;
  if (GetPreferencesDirectory(directory)) Project::LoadBehaviorFile(Settings(), directory);
}

// ---- Projection model and focal length -------------------------------------------------

bool PFilter::MatchLensProfile(bool warn) { return LensMatcher().MatchProfile(warn); }

PLensMatcher& PFilter::LensMatcher() {
  if (lensMatcher_ == nullptr) {
    PLensMatcher::Run& run = *this;
    lensMatcher_ = std::make_unique<PLensMatcher>(run);
  }
  return *lensMatcher_;
}

const Tarsa::HostLensProfilesSuite* PFilter::LensProfilesSuite() {
  if (lensSuite_ == nullptr) {
    lensSuite_ = static_cast<const Tarsa::HostLensProfilesSuite*>(
        AcquireSuite(Tarsa::kLensProfilesSuite, 2));
    if (lensSuite_ == nullptr) return nullptr;
    if (lensSuite_->prepare == nullptr || lensSuite_->prepare() != 0) {
      ReleaseSuite(Tarsa::kLensProfilesSuite, 2);
      lensSuite_ = nullptr;
    }
  }
  return lensSuite_;
}

float PFilter::GetCropRatio() {
  cropRatio_ =
      photoInfo_ != nullptr ? PLensMatcher::CropRatio(Settings().lensRecord, *photoInfo_) : 0.0f;
  return cropRatio_;
}

bool PFilter::ChooseSphereModel(const std::shared_ptr<const Image>& image,
                                std::shared_ptr<PhotoToSphere>& model) {
  const PSettings& settings = Settings();
  PanoramaProjection panorama;
  const bool hasPanorama = photoInfo_ != nullptr && photoInfo_->HasPanorama();
  if (hasPanorama) panorama = photoInfo_->Panorama();
  return ChoosePhotoToSphere(settings.projectionModel, image, settings.focalLength,
                             hasPanorama ? &panorama : nullptr,
                             settings.lensRecord.GetCameraModel(), cropRatio_, model);
}

void PFilter::ResolveProjectionModel(std::int32_t fallback, bool forceAuto, bool warn) {
  PSettings& settings = Settings();
  if (forceAuto) settings.projectionModel = PSettings::kModelAuto;

  if (settings.projectionModel == PSettings::kModelFullSpherical) {
    const Tarsa::CRect image = ImageRect();
    const double width = double(image.Width());
    const double height = double(image.Height());
    if (width <= 0 || std::fabs(width - 2 * height) / width > 0.001) {
      settings.projectionModel = fallback;
      if (warn) CReporter::ShowAlert(CReporter::AlertTitle(), kInvalidFullSphericalText);
    }
    return;
  }

  const FocalData metadata = MetadataFocalData();
  if (metadata.complete) return;
  if (settings.projectionModel == PSettings::kModelAuto) {
    if (MatchLensProfile(warn)) return;
    settings.projectionModel = fallback;
  }
  if (forceAuto) {
    const float equivalent = metadata.focalLength35mm > 0
                                 ? metadata.focalLength35mm
                                 : metadata.focalLength * metadata.cropFactor;
    if (std::fabs(equivalent) < kFocalTolerance) {
      settings.projectionModel = fallback;
    } else if (equivalent - kFisheyeLimit > kFocalTolerance) {
      settings.projectionModel = PSettings::kModelPerspective;
    } else if (equivalent > kFocalTolerance && kFisheyeLimit - equivalent > kFocalTolerance) {
      settings.projectionModel = PSettings::kModelFisheye;
    }
  }
  // An open dialog would refresh its model controls and preview here.
}

float PFilter::FocalFromMetadata(bool initial) {
  PSettings& settings = Settings();
  const FocalData metadata = MetadataFocalData();
  if (metadata.focalLength > 0 && metadata.cropFactor >= 0.1f) {
    settings.cropFactor = metadata.cropFactor;
    settings.physicalFocal = metadata.focalLength;
  } else if (metadata.focalLength35mm > 0) {
    settings.cropFactor = metadata.cropFactor >= 0.1f ? metadata.cropFactor : 1.0f;
    settings.physicalFocal = metadata.focalLength35mm / settings.cropFactor;
  }
  const float focal = ImageFocal();
  if (initial) return focal;
  if (std::fabs(focal - settings.focalLength) > kFocalTolerance) {
    // With models 1 and 2 the solver re-solves on a new focal length, once
    // there is a solver.
    settings.focalLength = focal;
  }
  return focal;
}

std::int64_t PFilter::LargerSide() const {
  const Tarsa::CRect image = ImageRect();
  return std::max(image.Width(), image.Height());
}

float PFilter::ImageFocal() {
  const PSettings& settings = Settings();
  return settings.cropFactor * settings.physicalFocal * float(LargerSide()) / kFrameWidth;
}

float PFilter::PhysicalFromImage() {
  const PSettings& settings = Settings();
  const float divisor = float(LargerSide()) * settings.cropFactor;
  if (divisor <= 0) return 0;
  return settings.focalLength * kFrameWidth / divisor;
}

float PFilter::KnownPhysicalFocal() {
  const FocalData metadata = MetadataFocalData();
  if (metadata.focalLength > 0 && metadata.cropFactor >= 0.1f) return metadata.focalLength;
  const float crop = Settings().cropFactor;
  if (metadata.focalLength35mm > 0 && crop > 0) return metadata.focalLength35mm / crop;
  return 0;
}

bool PFilter::PhysicalFocalRange(float& low, float& high) {
  const Tarsa::CRect image = ImageRect();
  const float crop = Settings().cropFactor;
  const float larger = float(LargerSide());
  const float smaller = float(std::min(image.Width(), image.Height()));
  low = high = 0;
  if (larger <= 0 || crop <= 0) return false;
  low = smaller * 0.1f * kFrameWidth / (crop * larger);
  high = smaller * 3.0f * kFrameWidth / (crop * larger);
  if (const float known = KnownPhysicalFocal(); known > 0) {
    low = std::min(low, known);
    high = std::max(high, known);
  }
  return true;
}

bool PFilter::ImageFocalRange(float& low, float& high) {
  if (!PhysicalFocalRange(low, high)) return false;
  const float scale = Settings().cropFactor * float(LargerSide()) / kFrameWidth;
  low *= scale;
  high *= scale;
  return true;
}

}  // namespace Project
