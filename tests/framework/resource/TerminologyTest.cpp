#include <gtest/gtest.h>

#include <cstdint>
#include <span>
#include <vector>

#include "framework/core/CException.h"
#include "framework/resource/CTerminology.h"
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

TEST(Terminology, TheHostReadsBackWhatTheModuleDeclares) {
  const auto table = ModuleResourceTable();
  const CTerminology terms(table.Get(kTerminologyType, kTerminologyNumber));
  ASSERT_EQ(terms.Parameters().size(), 6u);
  const CTerminology::Parameter* model = terms.FindParameter(FourCharCode("prjM"));
  ASSERT_NE(model, nullptr);
  EXPECT_EQ(model->type, FourCharCode("prjM"));
  EXPECT_EQ(model->flags, 0x2000);
  EXPECT_EQ(model->name, "$$$/Archway/AETE/Dialog/ProjectionModel=Projection Model");
  EXPECT_EQ(terms.FindParameter(FourCharCode("focL"))->type, FourCharCode("doub"));
  EXPECT_EQ(terms.FindParameter(FourCharCode("actV")), nullptr);

  const CTerminology::Enumeration* regularizers = terms.FindEnumeration(FourCharCode("regM"));
  ASSERT_NE(regularizers, nullptr);
  ASSERT_EQ(regularizers->values.size(), 4u);
  EXPECT_EQ(regularizers->values[1].code, FourCharCode("merR"));
  EXPECT_EQ(regularizers->values[1].name, "$$$/Archway/AETE/Dialog/Mercator=Mercator");
}

// Classes and comparison operators come before the enumerations; a reader
// that miscounts them finds no enumeration or a wrong one.
TEST(Terminology, ClassesAndOperatorsAreReadPast) {
  // clang-format off
  const auto bytes = Join({
      {1, 1, 0, 0, 0, 0, 1, 0},
      {1}, "V", {1}, "S", "abcd", {1, 0, 1, 0, 0, 0},   // a suite with no events
      {1, 0},                                           // one class:
      {1}, "C", "ssal", {0},                            //   name, id, description
      {1, 0}, {1}, "P", "porp", "gnol", {0}, {0, 0},    //   one property
      {1, 0}, "mele", {2, 0}, "yek1", "yek2",           //   one element, two key forms
      {1, 0}, {1}, "O", "  = ", {0},                    // one comparison operator
      {1, 0}, "mune", {1, 0}, {1}, "E", "eulv", {0},    // one enumeration of one value
  });
  // clang-format on
  const CTerminology terms(bytes);
  EXPECT_TRUE(terms.Parameters().empty());
  ASSERT_EQ(terms.Enumerations().size(), 1u);
  EXPECT_EQ(terms.Enumerations()[0].id, FourCharCode("enum"));
  EXPECT_EQ(terms.Enumerations()[0].values.at(0).code, FourCharCode("vlue"));

  // Cut short anywhere, it is damaged, in the reader's own words.
  for (std::size_t length = 0; length < bytes.size(); ++length) {
    try {
      const CTerminology cut(std::span<const std::uint8_t>(bytes).first(length));
      ADD_FAILURE() << "read " << length << " bytes";
    } catch (const CError& error) {
      EXPECT_NE(error.ErrorText().find("terminology is damaged"), std::string::npos);
    }
  }
}

}  // namespace
}  // namespace Tarsa
