#pragma once

#include <cstdint>
#include <string>

#include "framework/strings/CString.h"
#include "lens/metadata/PhotoInfo.h"

namespace Project {

// The parameter record of one run: what the dialog shows and the solvers
// read. Plain public fields in their stored order; colours are 0xAARRGGBB
// words. The record owns everything it holds.
//
// Copying is deliberately uneven, so that a reset or an undo never loses the
// lens description or the behavioural group (the fields from iterationNumber
// on): the copy constructor gives a fresh record with the other's user
// settings, and assignment overwrites the user settings only. See the
// comments on each.
class PSettings {
 public:
  // Projection models.
  static constexpr std::int32_t kModelFisheye = 1;
  static constexpr std::int32_t kModelPerspective = 2;
  static constexpr std::int32_t kModelAuto = 3;
  static constexpr std::int32_t kModelFullSpherical = 4;
  // Regulariser models.
  static constexpr std::int32_t kRegularizerStereographic = 1;
  static constexpr std::int32_t kRegularizerMercator = 2;
  static constexpr std::int32_t kRegularizerPanini = 3;
  static constexpr std::int32_t kRegularizerAuto = 4;

  // Masks for ApplyMasked.
  static constexpr std::uint32_t kMaskProjectionModel = 1u << 0;
  static constexpr std::uint32_t kMaskRegularizerModel = 1u << 1;
  static constexpr std::uint32_t kMaskFocalLength = 1u << 2;
  static constexpr std::uint32_t kMaskPhysicalFocal = 1u << 3;
  static constexpr std::uint32_t kMaskCropFactor = 1u << 4;

  // All defaults; the default focal length follows the image width.
  explicit PSettings(std::int32_t imageWidth);
  // A fresh record with other's user settings: version, lensRecord and
  // lensKey start empty and the behavioural group takes its defaults.
  PSettings(const PSettings& other);
  // Copies the user settings only; version, lensRecord, lensKey and the
  // behavioural group stay as they are.
  PSettings& operator=(const PSettings& other);

  // The focal length in pixels that a photo of this width starts with.
  static float DefaultFocalLength(std::int32_t imageWidth);

  // The dialog's Reset: every user setting back to its default, except the
  // lens description, both directories, version and colorFixed.
  void SetDefaults();
  // For the undo tasks: copies from source the fields whose kMask bits are
  // set in mask.
  void ApplyMasked(const PSettings& source, std::uint32_t mask);

  std::uint32_t version = 0;  // of the stored block it came from; 0 or 1
  // Carried through copies and the file; nothing reads them.
  std::uint8_t reservedFlagA = 0;
  std::uint16_t reservedWord = 64;
  std::uint8_t reservedFlagB = 0;
  std::uint8_t reservedFlagC = 0;
  std::uint8_t reservedFlagD = 0;
  std::int32_t reservedValueA = 0;
  std::int32_t reservedValueB = 0;
  std::uint32_t colorUnfixed = 0xFF4AFFFF;
  std::uint32_t colorHorizontal = 0xFFFFFF4A;
  std::uint32_t colorVertical = 0xFFFF4AFF;
  std::uint32_t colorFixed = 0xFF4AFF4A;
  std::uint32_t colorInvalid = 0xFFFF4A4A;
  std::uint32_t colorMesh = 0xFF4AFF4A;
  std::uint8_t reservedFlagE = 0;  // forced to 0 when read from the file
  std::uint8_t meshVisible = 0;
  float focalLength = 0;  // pixels; set from the width by the constructor
  std::int32_t projectionModel = kModelFisheye;
  std::int32_t regularizerModel = kRegularizerAuto;
  float physicalFocal = 15.0f;  // millimetres
  float cropFactor = 1.0f;
  std::int32_t imageScale = 120;  // percent
  float imageCenterX = 0.5f;      // fractions of the result image
  float imageCenterY = 0.5f;
  std::uint8_t previewResult = 1;
  std::uint8_t constraintsVisible = 1;
  // The matched lens profile entry (its camera model included) and its
  // key; blank until a profile matches. Neither is stored anywhere.
  PhotoInfo lensRecord;
  std::string lensKey;
  std::uint8_t confirmCalibration = 1;
  std::uint8_t reservedFlagG = 0;
  Tarsa::CString lastLoadDirectory;
  Tarsa::CString lastSaveDirectory;
  std::uint8_t loupeVisible = 1;
  std::int32_t loupeSize = 140;

  // The behavioural group: set only by the constructor, the behavioural
  // file and the parameter dialog; never saved, never in the descriptor.
  std::uint16_t iterationNumber = 8;
  std::uint8_t cacheDssPermutation = 0;
  std::uint8_t useDebugSolve = 0;
  std::uint8_t autoRotate = 1;
  std::uint8_t gaussNewtonSolver = 1;
  std::uint8_t pardisoSolver = 1;
  std::int32_t meshResolution = 6;
  float regularWeight = 0.001f;
  std::uint16_t borderExpand = 1;
  std::uint8_t regWeightApplyTo = 1;
  std::uint8_t highCenterWeight = 0;
  // Heavier than the conformal terms by enough that each line's last sample
  // is held as firmly as its inner ones; at 10 the ends hooked by a pixel.
  float lineWeight = 30.0f;
  float conformalWeight = 1.0f;
  float smoothnessWeight = 3.0f;
  std::uint8_t meshUseTriangle = 1;
  // The solve stops once the line ends moved less than this in one
  // iteration: a squared result-plane distance summed over all ends.
  float convergedMeasure = 0.001f;
  std::uint8_t textureRendering = 1;
  std::uint8_t showBehavioral = 0;

 private:
  // Every field that both copy forms carry.
  void CopyUserSettings(const PSettings& other);

  // The width the defaults were made for; kept so that SetDefaults can
  // restore the focal length. Belongs to this object, so never assigned.
  std::int32_t imageWidth_;
};

}  // namespace Project
