#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "host/io/HostError.h"
#include "host/plugin/EnableExpression.h"
#include "host/plugin/PluginModule.h"
#include "tests/support/TestImages.h"

namespace Host {
namespace {

TEST(EnableExpressionTest, AllowsTheModesNamedOnly) {
  EXPECT_EQ(EnableExpression::Parse("in (QMARK_ImageMode, GrayScaleMode, Gray16Mode, RGBMode, "
                                    "RGB48Mode, LabMode, Lab48Mode, CMYKMode, CMYK64Mode)")
                .AllowedModes(),
            (std::vector<ImageMode>{ImageMode::kGray, ImageMode::kRgb, ImageMode::kCmyk,
                                    ImageMode::kLab, ImageMode::kGray16, ImageMode::kRgb48,
                                    ImageMode::kLab48, ImageMode::kCmyk64}));
  // BitmapMode names a mode the host never holds: accepted, allows nothing.
  const EnableExpression expression =
      EnableExpression::Parse("in(QMARK_ImageMode,RGBMode , BitmapMode,Gray16Mode)");
  EXPECT_EQ(expression.AllowedModes(),
            (std::vector<ImageMode>{ImageMode::kRgb, ImageMode::kGray16}));
  EXPECT_TRUE(expression.Allows(ImageMode::kGray16));
  EXPECT_FALSE(expression.Allows(ImageMode::kGray));
}

TEST(EnableExpressionTest, MalformedExpressionsAreErrors) {
  const char* malformed[] = {
      "",
      "in QMARK_ImageMode",
      "in (RGBMode)",
      "in (QMARK_ImageMode, RGBMode",
      "in (QMARK_ImageMode RGBMode)",
      "in (QMARK_ImageMode, RGB)",
      "in (QMARK_ImageMode, , RGBMode)",
      "in (QMARK_ImageMode, RGBMode) || true",
  };
  for (const char* text : malformed) {
    EXPECT_THROW(EnableExpression::Parse(text), HostError) << text;
  }
}

TEST(PluginModuleTest, ReadsTheModulesPropertiesWithoutLoadingIt) {
  const auto module = PluginModule::Inspect(ARCHWAY_FAKE_MODULE);
  EXPECT_FALSE(module->Loaded());
  EXPECT_EQ(module->Enabled().AllowedModes().size(), 8u);
  const auto document = HostDocument::Create(2, 2, ImageMode::kLab48);
  EXPECT_EQ(module->Refusal(*document), "");
  module->Load();
  EXPECT_NE(module->Entry(), nullptr);
}

TEST(PluginModuleTest, FilesThatAreNotModulesAreRefusedByName) {
  testing::ScratchFolder folder;
  const std::string text = folder.File("notes.so");
  testing::WriteBytes(text, "not a module");
  for (const std::string& path : {text, folder.File("missing.so")}) {
    try {
      PluginModule::Inspect(path);
      ADD_FAILURE() << path;
    } catch (const HostError& error) {
      EXPECT_NE(std::string(error.what()).find(path), std::string::npos) << error.what();
    }
  }
}

}  // namespace
}  // namespace Host
