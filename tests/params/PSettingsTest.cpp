#include "params/PSettings.h"

#include <gtest/gtest.h>

namespace Project {
namespace {

constexpr std::int32_t kWidth = 3600;  // 3600 x 15 / 36 = 1500, exact in float

// Fields of every copy group away from their defaults.
PSettings Scribbled() {
  PSettings s(kWidth);
  s.version = 1;
  s.reservedWord = 3;
  s.colorFixed = 0x04040404;
  s.colorMesh = 0x06060606;
  s.focalLength = 777.5f;
  s.projectionModel = 2;
  s.regularizerModel = 3;
  s.cropFactor = 1.5f;
  s.imageCenterY = 0.75f;
  s.lastLoadDirectory = "/load/";
  s.loupeSize = 200;
  s.lensRecord.SetMake("lens");
  s.lensKey = "key";
  s.iterationNumber = 12;
  s.regularWeight = 0.05f;
  s.showBehavioral = 1;
  return s;
}

// The user settings Scribbled() changed: equal to from's in s.
void ExpectUserFieldsOf(const PSettings& s, const PSettings& from) {
  EXPECT_EQ(s.reservedWord, from.reservedWord);
  EXPECT_EQ(s.colorFixed, from.colorFixed);
  EXPECT_EQ(s.colorMesh, from.colorMesh);
  EXPECT_EQ(s.focalLength, from.focalLength);
  EXPECT_EQ(s.projectionModel, from.projectionModel);
  EXPECT_EQ(s.cropFactor, from.cropFactor);
  EXPECT_EQ(s.imageCenterY, from.imageCenterY);
  EXPECT_EQ(s.lastLoadDirectory, from.lastLoadDirectory);
  EXPECT_EQ(s.loupeSize, from.loupeSize);
}

TEST(PSettings, CopyRulesKeepLensAndBehaviouralGroup) {
  const PSettings source = Scribbled();
  const PSettings fresh(kWidth);
  PSettings assigned(kWidth);
  assigned.lensRecord.SetMake("mine");
  assigned.iterationNumber = 3;
  assigned = source;
  ExpectUserFieldsOf(assigned, source);
  EXPECT_EQ(assigned.version, 0u);
  EXPECT_EQ(assigned.lensRecord.GetMake(), "mine");
  EXPECT_EQ(assigned.lensKey, "");
  EXPECT_EQ(assigned.iterationNumber, 3);
  EXPECT_EQ(assigned.regularWeight, fresh.regularWeight);

  const PSettings copied(source);
  ExpectUserFieldsOf(copied, source);
  EXPECT_EQ(copied.version, 0u);
  EXPECT_EQ(copied.lensRecord.GetMake(), "");
  EXPECT_EQ(copied.lensKey, "");
  EXPECT_EQ(copied.iterationNumber, fresh.iterationNumber);
  EXPECT_EQ(copied.showBehavioral, fresh.showBehavioral);
}

TEST(PSettings, SetDefaultsSparesLensDirectoriesVersionAndColorFixed) {
  PSettings s = Scribbled();
  s.SetDefaults();
  PSettings expected(kWidth);  // the defaults, with what Reset spares
  expected.colorFixed = 0x04040404;
  expected.lastLoadDirectory = "/load/";
  ExpectUserFieldsOf(s, expected);
  EXPECT_EQ(s.focalLength, 1500.0f);  // from the width
  EXPECT_EQ(s.version, 1u);
  EXPECT_EQ(s.lensKey, "key");
  EXPECT_EQ(s.iterationNumber, 12);
}

TEST(PSettings, ApplyMaskedCopiesOnlyTheMaskedFields) {
  const PSettings source = Scribbled();
  PSettings target(kWidth);
  target.ApplyMasked(source, PSettings::kMaskRegularizerModel | PSettings::kMaskCropFactor);
  EXPECT_EQ(target.regularizerModel, 3);
  EXPECT_EQ(target.cropFactor, 1.5f);
  EXPECT_EQ(target.projectionModel, PSettings::kModelFisheye);
  EXPECT_EQ(target.focalLength, 1500.0f);
  target.ApplyMasked(source, 0xFFFFFFFF);
  EXPECT_EQ(target.projectionModel, 2);
  EXPECT_EQ(target.focalLength, 777.5f);
  EXPECT_EQ(target.loupeSize, PSettings(kWidth).loupeSize);  // never part of a mask
}

}  // namespace
}  // namespace Project
