#include "tools/resgen/PropertyListResource.h"

#include <cstddef>
#include <functional>

#include "framework/resource/CByteWriter.h"
#include "framework/resource/FourCharCode.h"

namespace Project {
namespace {

using Tarsa::CByteWriter;
using Tarsa::FourCharCode;

// One property: vendor, key, id 0, the value's length (without padding), the
// value, zeros to a multiple of 4.
void WriteProperty(CByteWriter& out, std::uint32_t key,
                   const std::function<void(CByteWriter&)>& writeValue) {
  out.WriteFourChar(FourCharCode("QMRK"));
  out.WriteFourChar(key);
  out.WriteU32(0);
  const std::size_t lengthAt = out.Size();
  out.WriteU32(0);
  const std::size_t valueAt = out.Size();
  writeValue(out);
  out.PatchU32(lengthAt, static_cast<std::uint32_t>(out.Size() - valueAt));
  out.PadTo(4, valueAt);
}

}  // namespace

std::vector<std::uint8_t> BuildPropertyList() {
  CByteWriter out;
  out.WriteU16(1);
  out.WriteU32(0);
  const std::size_t countAt = out.Size();
  out.WriteU32(0);
  std::uint32_t count = 0;
  const auto property = [&](const char(&key)[5], const std::function<void(CByteWriter&)>& value) {
    WriteProperty(out, FourCharCode(key), value);
    ++count;
  };

  property("nabo", [](CByteWriter& v) { v.WriteU32(1); });
  property("kind", [](CByteWriter& v) { v.WriteFourChar(FourCharCode("QMFL")); });
  property("vers", [](CByteWriter& v) { v.WriteU32(4u << 16); });
  property("name", [](CByteWriter& v) { v.WritePascalText("Archway..."); });
  property("catg", [](CByteWriter& v) { v.WritePascalText("***Archway Correction***"); });
  property("znam",
           [](CByteWriter& v) { v.WritePascalText("$$$/Archway/PropList/Name=Archway..."); });
  property("flly", [](CByteWriter& v) { v.WriteU32(0x80); });
  property("ms32", [](CByteWriter& v) {
    v.WriteU32(2000000);
    v.WriteU32(2000000);
  });
  // The entry name sits in a zero-filled field of 12 bytes.
  property("wx86", [](CByteWriter& v) {
    const std::size_t start = v.Size();
    v.WriteText("EntryFI");
    while (v.Size() - start < 12) v.WriteU8(0);
  });
  // Only 8- and 16-bit Gray, RGB, Lab and CMYK documents.
  property("enbl", [](CByteWriter& v) {
    v.WriteZeroEndedText(
        "in (QMARK_ImageMode, GrayScaleMode, Gray16Mode, RGBMode, RGB48Mode, LabMode, Lab48Mode, "
        "CMYKMode, CMYK64Mode)");
  });
  // Scripting: version word, class and event ids, the terminology's number
  // and the filter's scripting identity.
  property("hstm", [](CByteWriter& v) {
    v.WriteU32(0);
    v.WriteFourChar(FourCharCode("hrbC"));
    v.WriteFourChar(FourCharCode("hrbC"));
    v.WriteU16(16000);
    v.WriteZeroEndedText("7D41A0C6-3B52-4e8f-A6C4-19B7D2F06E3B");
  });
  // One row of four bytes per image mode class.
  property("fici", [](CByteWriter& v) {
    static constexpr std::uint8_t kRows[7][4] = {{0, 0, 9, 0},  {0, 0, 9, 0},  {0, 0, 9, 0},
                                                 {1, 1, 11, 0}, {1, 1, 11, 0}, {0, 0, 9, 0},
                                                 {0, 0, 9, 0}};
    for (const auto& row : kRows) v.WriteBytes(row);
  });

  out.PatchU32(countAt, count);
  return out.Release();
}

}  // namespace Project
