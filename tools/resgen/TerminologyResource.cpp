#include "tools/resgen/TerminologyResource.h"

#include <iterator>
#include <string_view>

#include "framework/files/CMemoryContainer.h"
#include "framework/resource/FourCharCode.h"
#include "framework/resource/ResourceStreams.h"

namespace Project {
namespace {

using Tarsa::CMemoryContainer;
using Tarsa::FourCharCode;
using Tarsa::WriteFourChar;

struct Parameter {
  std::string_view name;
  std::uint32_t key;
  std::uint32_t type;
  std::uint16_t flags;
};

struct Enumerator {
  std::uint32_t code;
  std::string_view name;
};

constexpr std::uint32_t kFilterId = FourCharCode("hrbC");

constexpr Parameter kParameters[] = {
    {"$$$/Archway/AETE/Dialog/ConstraintData=Constraint Data", FourCharCode("cnsD"),
     FourCharCode("tdta"), 0},
    {"$$$/Archway/AETE/Dialog/ProjectionModel=Projection Model", FourCharCode("prjM"),
     FourCharCode("prjM"), 0x2000},
    {"$$$/Archway/AETE/Dialog/RegularizerModel=Regularizer Model", FourCharCode("regM"),
     FourCharCode("regM"), 0x2000},
    {"$$$/Archway/AETE/Dialog/FocalLength=Focal Length", FourCharCode("focL"), FourCharCode("doub"),
     0},
    {"$$$/Archway/AETE/Dialog/PhysicalFocalLength=Physical Focal Length", FourCharCode("PhyF"),
     FourCharCode("doub"), 0},
    {"$$$/Archway/AETE/Dialog/CropFactor=Crop Factor", FourCharCode("CrpF"), FourCharCode("doub"),
     0},
};

constexpr Enumerator kProjections[] = {
    {FourCharCode("fisP"), "$$$/Archway/AETE/Dialog/Fisheye=Fisheye"},
    {FourCharCode("perP"), "$$$/Archway/AETE/Dialog/Perspective=Perspective"},
    {FourCharCode("panP"), "$$$/Archway/AETE/Dialog/Panorama=Panorama"},
    {FourCharCode("autP"), "$$$/Archway/AETE/Dialog/Auto=Auto"},
};

constexpr Enumerator kRegularizers[] = {
    {FourCharCode("steR"), "$$$/Archway/AETE/Dialog/Stereographic=Stereographic"},
    {FourCharCode("merR"), "$$$/Archway/AETE/Dialog/Mercator=Mercator"},
    {FourCharCode("panR"), "$$$/Archway/AETE/Dialog/Panini=Panini"},
    {FourCharCode("autR"), "$$$/Archway/AETE/Dialog/Auto=Auto"},
};

// An enumeration: its id, the count, then per value its name, code and an
// empty description.
template <std::size_t N>
void WriteEnumeration(CMemoryContainer& out, std::uint32_t id, const Enumerator (&values)[N]) {
  WriteFourChar(out, id);
  out.WriteU16(static_cast<std::uint16_t>(N));
  for (const Enumerator& value : values) {
    out.WritePascalString(value.name);
    WriteFourChar(out, value.code);
    out.WritePascalString("");
  }
}

}  // namespace

std::vector<std::uint8_t> BuildTerminology() {
  CMemoryContainer out;
  // Header: format version 1.1 (two bytes), language 0, script 0, one suite.
  out.WriteByte(1);
  out.WriteByte(1);
  out.WriteU16(0);
  out.WriteU16(0);
  out.WriteU16(1);

  // The suite: vendor, name, id, level, version, event count.
  out.WritePascalString("Orvane");
  out.WritePascalString("Archway");
  WriteFourChar(out, kFilterId);
  out.WriteU16(1);
  out.WriteU16(1);
  out.WriteU16(1);

  // The event: the filter itself, taking the image as its direct object.
  out.WritePascalString("$$$/Archway/AETE/Name=Archway");
  out.WritePascalString("");
  WriteFourChar(out, kFilterId);
  WriteFourChar(out, kFilterId);
  WriteFourChar(out, FourCharCode("null"));
  out.WritePascalString("");
  out.WriteU16(0);
  WriteFourChar(out, FourCharCode("#ImR"));
  out.WritePascalString("");
  out.WriteU16(0xB000);
  out.WriteU16(static_cast<std::uint16_t>(std::size(kParameters)));
  for (const Parameter& parameter : kParameters) {
    out.WritePascalString(parameter.name);
    WriteFourChar(out, parameter.key);
    WriteFourChar(out, parameter.type);
    out.WritePascalString("");
    out.WriteU16(parameter.flags);
  }

  // No classes, no comparison operators, two enumerations.
  out.WriteU16(0);
  out.WriteU16(0);
  out.WriteU16(2);
  WriteEnumeration(out, FourCharCode("prjM"), kProjections);
  WriteEnumeration(out, FourCharCode("regM"), kRegularizers);
  return Tarsa::ContentsOf(out);
}

}  // namespace Project
