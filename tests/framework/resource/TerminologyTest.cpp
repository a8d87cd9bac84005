#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "framework/resource/ModuleResources.h"
#include "tests/framework/resource/HandBytes.h"

namespace Tarsa {
namespace {

using testing::Join;

TEST(Terminology, ModuleBytesAreExact) {
  // One item per line.
  // clang-format off
  const auto expected = Join({
      // Header: version 1.1, language 0, script 0, one suite.
      {0x01, 0x01, 0x00, 0x00, 0x00, 0x00, 0x01, 0x00},
      // Suite: vendor, name, id, level 1, version 1, one event.
      {6}, "Orvane", {7}, "Archway", "Cbrh", {1, 0, 1, 0, 1, 0},
      // Event: name, description, class, id; reply type, description, flags;
      // direct object type, description, flags; six parameters.
      {0x1D}, "$$$/Archway/AETE/Name=Archway", {0}, "Cbrh", "Cbrh",
      "llun", {0}, {0, 0},
      "RmI#", {0}, {0x00, 0xB0},
      {6, 0},
      // Parameters: name, key, type, description, flags.
      {0x36}, "$$$/Archway/AETE/Dialog/ConstraintData=Constraint Data", "Dsnc", "atdt", {0}, {0, 0},
      {0x38}, "$$$/Archway/AETE/Dialog/ProjectionModel=Projection Model", "Mjrp", "Mjrp", {0},
              {0x00, 0x20},
      {0x3A}, "$$$/Archway/AETE/Dialog/RegularizerModel=Regularizer Model", "Mger", "Mger", {0},
              {0x00, 0x20},
      {0x30}, "$$$/Archway/AETE/Dialog/FocalLength=Focal Length", "Lcof", "buod", {0}, {0, 0},
      {0x41}, "$$$/Archway/AETE/Dialog/PhysicalFocalLength=Physical Focal Length", "FyhP", "buod",
              {0}, {0, 0},
      {0x2E}, "$$$/Archway/AETE/Dialog/CropFactor=Crop Factor", "FprC", "buod", {0}, {0, 0},
      // No classes, no comparison operators, two enumerations of four:
      // id, count, then per value name, code, description.
      {0, 0, 0, 0, 2, 0},
      "Mjrp", {4, 0},
      {0x27}, "$$$/Archway/AETE/Dialog/Fisheye=Fisheye", "Psif", {0},
      {0x2F}, "$$$/Archway/AETE/Dialog/Perspective=Perspective", "Prep", {0},
      {0x29}, "$$$/Archway/AETE/Dialog/Panorama=Panorama", "Pnap", {0},
      {0x21}, "$$$/Archway/AETE/Dialog/Auto=Auto", "Ptua", {0},
      "Mger", {4, 0},
      {0x33}, "$$$/Archway/AETE/Dialog/Stereographic=Stereographic", "Rets", {0},
      {0x29}, "$$$/Archway/AETE/Dialog/Mercator=Mercator", "Rrem", {0},
      {0x25}, "$$$/Archway/AETE/Dialog/Panini=Panini", "Rnap", {0},
      {0x21}, "$$$/Archway/AETE/Dialog/Auto=Auto", "Rtua", {0},
  });
  // clang-format on
  const auto table = ModuleResourceTable();
  const auto bytes = table.Get(kTerminologyType, kTerminologyNumber);
  EXPECT_EQ(std::vector<std::uint8_t>(bytes.begin(), bytes.end()), expected);
}

}  // namespace
}  // namespace Tarsa
