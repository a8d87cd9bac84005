#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

#include "framework/core/CException.h"
#include "framework/resource/CPropertyList.h"
#include "framework/resource/ModuleResources.h"
#include "tests/framework/resource/HandBytes.h"

namespace Tarsa {
namespace {

using testing::Join;

const char kEnable[] =
    "in (QMARK_ImageMode, GrayScaleMode, Gray16Mode, RGBMode, RGB48Mode, LabMode, Lab48Mode, "
    "CMYKMode, CMYK64Mode)";

std::vector<std::uint8_t> ModulePropertyList() {
  const auto table = ModuleResourceTable();
  const auto bytes = table.Get(kPropertyListType, kPropertyListNumber);
  return {bytes.begin(), bytes.end()};
}

// Signature, key and id 0 of one property, as they lie on disk.
testing::Piece Head(const char* reversedKey) {
  return testing::Piece(std::string("KRMQ") + reversedKey + std::string(4, '\0'));
}

TEST(PropertyList, ModuleBytesAreExact) {
  // One property per line.
  // clang-format off
  const auto expected = Join({
      {0x01, 0x00, 0x00, 0x00, 0x00, 0x00, 0x0C, 0x00, 0x00, 0x00},
      Head("oban"), {0x04, 0, 0, 0}, {0x01, 0, 0, 0},
      Head("dnik"), {0x04, 0, 0, 0}, "LFMQ",
      Head("srev"), {0x04, 0, 0, 0}, {0x00, 0x00, 0x04, 0x00},
      Head("eman"), {0x0B, 0, 0, 0}, {0x0A}, "Archway...", {0},
      Head("gtac"), {0x19, 0, 0, 0}, {0x18}, "***Archway Correction***", {0, 0, 0},
      Head("manz"), {0x25, 0, 0, 0}, {0x24}, "$$$/Archway/PropList/Name=Archway...", {0, 0, 0},
      Head("yllf"), {0x04, 0, 0, 0}, {0x80, 0, 0, 0},
      Head("23sm"), {0x08, 0, 0, 0}, {0x80, 0x84, 0x1E, 0x00, 0x80, 0x84, 0x1E, 0x00},
      Head("68xw"), {0x0C, 0, 0, 0}, "EntryFI", {0, 0, 0, 0, 0},
      Head("lbne"), {0x6E, 0, 0, 0}, kEnable, {0, 0, 0},
      Head("mtsh"), {0x33, 0, 0, 0}, {0, 0, 0, 0}, "CbrhCbrh", {0x80, 0x3E},
                    "7D41A0C6-3B52-4e8f-A6C4-19B7D2F06E3B", {0, 0},
      Head("icif"), {0x1C, 0, 0, 0},
                    {0, 0, 9, 0,  0, 0, 9, 0,  0, 0, 9, 0,  1, 1, 11, 0,  1, 1, 11, 0,
                     0, 0, 9, 0,  0, 0, 9, 0},
  });
  // clang-format on
  EXPECT_EQ(ModulePropertyList(), expected);
}

TEST(PropertyList, ParserReadsTheModuleList) {
  const auto bytes = ModulePropertyList();
  const CPropertyList list(bytes);
  std::string keys;
  for (const auto& property : list.Properties()) {
    EXPECT_EQ(property.vendor, FourCharCode("QMRK"));
    keys += FourCharText(property.key) + " ";
  }
  EXPECT_EQ(keys, "nabo kind vers name catg znam flly ms32 wx86 enbl hstm fici ");
  EXPECT_EQ(list.EnableExpression(), kEnable);
  EXPECT_EQ(list.EntryName(), "EntryFI");
  ASSERT_NE(list.Find(FourCharCode("name")), nullptr);
  EXPECT_EQ(list.Find(FourCharCode("name"))->value.size(), 11u);  // padding not included
  EXPECT_EQ(list.Find(FourCharCode("PiPa")), nullptr);
}

TEST(PropertyList, DamagedListsAreRefused) {
  const auto bytes = ModulePropertyList();
  const auto refusal = [](std::span<const std::uint8_t> list) -> std::string {
    try {
      const CPropertyList parsed(list);
    } catch (const CError& error) {
      return error.ErrorText();
    }
    return "accepted";
  };
  // Running out anywhere is the list's own "damaged", not the container's
  // end of data.
  for (std::size_t size = 0; size < bytes.size(); ++size) {
    EXPECT_EQ(refusal(std::span(bytes).first(size)),
              "$$$/Tarsa/PropertyList/Error/Damaged=The plug-in property list is damaged.")
        << size;
  }
  auto other = bytes;
  other[0] = 2;  // version
  EXPECT_NE(refusal(other), "accepted");
  other = bytes;
  other[9] = 0x10;  // a count no list of this size can hold
  EXPECT_NE(refusal(other), "accepted");

  // A list without the texts the host asks for: the accessors say so.
  const auto bare =
      Join({{1, 0, 0, 0, 0, 0, 1, 0, 0, 0}, "KRMQoban", {0, 0, 0, 0}, {4, 0, 0, 0}, {1, 0, 0, 0}});
  const CPropertyList list(bare);
  EXPECT_EQ(list.Properties().size(), 1u);
  EXPECT_THROW(list.EnableExpression(), CError);
  EXPECT_THROW(list.EntryName(), CError);
}

}  // namespace
}  // namespace Tarsa
