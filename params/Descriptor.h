#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "framework/plugin/HostSuites.h"
#include "framework/resource/FourCharCode.h"
#include "params/PSettings.h"

// The scripting descriptor: the keyed record through which the host records
// a run's parameters and replays them silently. Both directions take the
// host's descriptor suite table and leave acquiring and releasing it, and the
// record's script block, to the caller. A null entry in the table counts as a
// failed call, so a partial host table never crashes the filter.
namespace Project {

namespace DescriptorKey {
inline constexpr std::uint32_t kActionVersion = Tarsa::FourCharCode("actV");
inline constexpr std::uint32_t kConstraintData = Tarsa::FourCharCode("cnsD");
inline constexpr std::uint32_t kProjectionModel = Tarsa::FourCharCode("prjM");
inline constexpr std::uint32_t kRegularizerModel = Tarsa::FourCharCode("regM");
inline constexpr std::uint32_t kFocalLength = Tarsa::FourCharCode("focL");
inline constexpr std::uint32_t kPhysicalFocal = Tarsa::FourCharCode("PhyF");
inline constexpr std::uint32_t kCropFactor = Tarsa::FourCharCode("CrpF");
inline constexpr std::uint32_t kImageScale = Tarsa::FourCharCode("imgS");
inline constexpr std::uint32_t kImageCenterX = Tarsa::FourCharCode("imgX");
inline constexpr std::uint32_t kImageCenterY = Tarsa::FourCharCode("imgY");
}  // namespace DescriptorKey

// Enumeration values under prjM and regM. Panorama is offered by the
// terminology but reads as Fisheye; Full Spherical is not offered, yet a
// stored action may carry it.
namespace DescriptorValue {
inline constexpr std::uint32_t kFisheye = Tarsa::FourCharCode("fisP");
inline constexpr std::uint32_t kPerspective = Tarsa::FourCharCode("perP");
inline constexpr std::uint32_t kPanorama = Tarsa::FourCharCode("panP");
inline constexpr std::uint32_t kAutoProjection = Tarsa::FourCharCode("autP");
inline constexpr std::uint32_t kFullSpherical = Tarsa::FourCharCode("fusP");
inline constexpr std::uint32_t kStereographic = Tarsa::FourCharCode("steR");
inline constexpr std::uint32_t kMercator = Tarsa::FourCharCode("merR");
inline constexpr std::uint32_t kPanini = Tarsa::FourCharCode("panR");
inline constexpr std::uint32_t kAutoRegularizer = Tarsa::FourCharCode("autR");
}  // namespace DescriptorValue

// Lays the descriptor behind handle over target, key by key in the
// descriptor's order; unknown keys are ignored. constraintData is emptied and
// then receives the bytes under cnsD, if any. False when the suite or handle
// is missing or any suite call failed; what was read before still stands.
// The reader made from the handle is freed on every path. What was read is
// reported, when asked for: the keys whose values were read, and the
// enumerated values this reader does not know (read as the fallback).
struct DescriptorReport {
  std::vector<std::uint32_t> keys;
  struct Unknown {
    std::uint32_t key = 0;
    std::uint32_t value = 0;
  };
  std::vector<Unknown> unknownValues;
};
bool ReadDescriptor(const Tarsa::HostDescriptorSuite* suite, Tarsa::HostHandle handle,
                    PSettings& target, std::vector<std::uint8_t>& constraintData,
                    DescriptorReport* report = nullptr);

// The enumerated values the reader knows for a key, as text ("fisP, perP").
std::string KnownValuesText(std::uint32_t key);

// A new descriptor of source's scripted parameters, turned into a handle for
// the record's script block; cnsD only when constraintData is not empty.
// Null when the suite could not make the descriptor or the handle.
Tarsa::HostHandle WriteDescriptor(const Tarsa::HostDescriptorSuite* suite, const PSettings& source,
                                  std::span<const std::uint8_t> constraintData);

}  // namespace Project
