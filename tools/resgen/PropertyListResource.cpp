#include "tools/resgen/PropertyListResource.h"

#include <cstdint>
#include <functional>

#include "framework/files/CMemoryContainer.h"
#include "framework/resource/FourCharCode.h"
#include "framework/resource/ResourceStreams.h"

namespace Project {
namespace {

using Tarsa::CMemoryContainer;
using Tarsa::FourCharCode;
using Tarsa::PadTo;
using Tarsa::PatchU32;
using Tarsa::WriteFourChar;
using Tarsa::WriteZeroEndedText;

// One property: vendor, key, id 0, the value's length (without padding), the
// value, zeros to a multiple of 4.
void WriteProperty(CMemoryContainer& out, std::uint32_t key,
                   const std::function<void(CMemoryContainer&)>& writeValue) {
  WriteFourChar(out, FourCharCode("QMRK"));
  WriteFourChar(out, key);
  out.WriteU32(0);
  const std::uint64_t lengthAt = out.Position();
  out.WriteU32(0);
  const std::uint64_t valueAt = out.Position();
  writeValue(out);
  PatchU32(out, lengthAt, static_cast<std::uint32_t>(out.Position() - valueAt));
  PadTo(out, 4, valueAt);
}

}  // namespace

std::vector<std::uint8_t> BuildPropertyList() {
  CMemoryContainer out;
  out.WriteU16(1);
  out.WriteU32(0);
  const std::uint64_t countAt = out.Position();
  out.WriteU32(0);
  std::uint32_t count = 0;
  const auto property = [&](const char(&key)[5],
                            const std::function<void(CMemoryContainer&)>& value) {
    WriteProperty(out, FourCharCode(key), value);
    ++count;
  };

  property("nabo", [](CMemoryContainer& v) { v.WriteU32(1); });
  property("kind", [](CMemoryContainer& v) { WriteFourChar(v, FourCharCode("QMFL")); });
  property("vers", [](CMemoryContainer& v) { v.WriteU32(4u << 16); });
  property("name", [](CMemoryContainer& v) { v.WritePascalString("Archway..."); });
  property("catg", [](CMemoryContainer& v) { v.WritePascalString("***Archway Correction***"); });
  property("znam", [](CMemoryContainer& v) {
    v.WritePascalString("$$$/Archway/PropList/Name=Archway...");
  });
  property("flly", [](CMemoryContainer& v) { v.WriteU32(0x80); });
  property("ms32", [](CMemoryContainer& v) {
    v.WriteU32(2000000);
    v.WriteU32(2000000);
  });
  // The entry name sits in a zero-filled field of 12 bytes.
  property("wx86", [](CMemoryContainer& v) {
    const char field[12] = "EntryFI";
    v.Write(field, sizeof field);
  });
  // Only 8- and 16-bit Gray, RGB, Lab and CMYK documents.
  property("enbl", [](CMemoryContainer& v) {
    WriteZeroEndedText(
        v,
        "in (QMARK_ImageMode, GrayScaleMode, Gray16Mode, RGBMode, RGB48Mode, LabMode, Lab48Mode, "
        "CMYKMode, CMYK64Mode)");
  });
  // Scripting: version word, class and event ids, the terminology's number
  // and the filter's scripting identity.
  property("hstm", [](CMemoryContainer& v) {
    v.WriteU32(0);
    WriteFourChar(v, FourCharCode("hrbC"));
    WriteFourChar(v, FourCharCode("hrbC"));
    v.WriteU16(16000);
    WriteZeroEndedText(v, "7D41A0C6-3B52-4e8f-A6C4-19B7D2F06E3B");
  });
  // One row of four bytes per image mode class.
  property("fici", [](CMemoryContainer& v) {
    static constexpr std::uint8_t kRows[7][4] = {{0, 0, 9, 0},  {0, 0, 9, 0},  {0, 0, 9, 0},
                                                 {1, 1, 11, 0}, {1, 1, 11, 0}, {0, 0, 9, 0},
                                                 {0, 0, 9, 0}};
    for (const auto& row : kRows) v.Write(row, sizeof row);
  });

  PatchU32(out, countAt, count);
  return Tarsa::ContentsOf(out);
}

}  // namespace Project
