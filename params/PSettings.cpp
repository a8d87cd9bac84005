#include "params/PSettings.h"

namespace Project {

PSettings::PSettings(std::int32_t imageWidth)
    : focalLength(DefaultFocalLength(imageWidth)), imageWidth_(imageWidth) {}

PSettings::PSettings(const PSettings& other) : imageWidth_(other.imageWidth_) {
  CopyUserSettings(other);
}

PSettings& PSettings::operator=(const PSettings& other) {
  if (this != &other) CopyUserSettings(other);
  return *this;
}

float PSettings::DefaultFocalLength(std::int32_t imageWidth) {
  // A 15 mm lens on a 36 mm wide frame.
  return static_cast<float>(static_cast<double>(imageWidth) * 15.0 / 36.0);
}

void PSettings::CopyUserSettings(const PSettings& other) {
  reservedFlagA = other.reservedFlagA;
  reservedWord = other.reservedWord;
  reservedFlagB = other.reservedFlagB;
  reservedFlagC = other.reservedFlagC;
  reservedFlagD = other.reservedFlagD;
  reservedValueA = other.reservedValueA;
  reservedValueB = other.reservedValueB;
  colorUnfixed = other.colorUnfixed;
  colorHorizontal = other.colorHorizontal;
  colorVertical = other.colorVertical;
  colorFixed = other.colorFixed;
  colorInvalid = other.colorInvalid;
  colorMesh = other.colorMesh;
  reservedFlagE = other.reservedFlagE;
  meshVisible = other.meshVisible;
  focalLength = other.focalLength;
  projectionModel = other.projectionModel;
  regularizerModel = other.regularizerModel;
  physicalFocal = other.physicalFocal;
  cropFactor = other.cropFactor;
  imageScale = other.imageScale;
  imageCenterX = other.imageCenterX;
  imageCenterY = other.imageCenterY;
  previewResult = other.previewResult;
  constraintsVisible = other.constraintsVisible;
  confirmCalibration = other.confirmCalibration;
  reservedFlagG = other.reservedFlagG;
  lastLoadDirectory = other.lastLoadDirectory;
  lastSaveDirectory = other.lastSaveDirectory;
  loupeVisible = other.loupeVisible;
  loupeSize = other.loupeSize;
}

void PSettings::SetDefaults() {
  const PSettings fresh(imageWidth_);
  const std::uint32_t keptColorFixed = colorFixed;
  const Tarsa::CString keptLoad = lastLoadDirectory;
  const Tarsa::CString keptSave = lastSaveDirectory;
  CopyUserSettings(fresh);
  colorFixed = keptColorFixed;
  lastLoadDirectory = keptLoad;
  lastSaveDirectory = keptSave;
}

void PSettings::ApplyMasked(const PSettings& source, std::uint32_t mask) {
  if (mask & kMaskProjectionModel) projectionModel = source.projectionModel;
  if (mask & kMaskRegularizerModel) regularizerModel = source.regularizerModel;
  if (mask & kMaskFocalLength) focalLength = source.focalLength;
  if (mask & kMaskPhysicalFocal) physicalFocal = source.physicalFocal;
  if (mask & kMaskCropFactor) cropFactor = source.cropFactor;
}

}  // namespace Project
