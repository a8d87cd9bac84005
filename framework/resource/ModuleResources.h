#pragma once

#include <cstdint>
#include <span>

#include "framework/resource/CResourceTable.h"
#include "framework/resource/FourCharCode.h"

namespace Tarsa {

// Where the module keeps its resource table, and the resources both sides of
// the plug-in contract know by type and number.

// The ELF section that holds the blob.
inline constexpr const char* kResourceSectionName = "archway_res";

// The plug-in property list, which the host reads from the file before it
// loads the module, and the scripting terminology.
inline constexpr std::uint32_t kPropertyListType = FourCharCode("QPrp");
inline constexpr std::uint32_t kTerminologyType = FourCharCode("QTrm");
inline constexpr std::int32_t kPropertyListNumber = 16000;
inline constexpr std::int32_t kTerminologyNumber = 16000;
// Localised string files, UTF-16; the string table reads all of them in order.
inline constexpr std::uint32_t kStringsType = FourCharCode("ZStr");

// The bytes of this module's own resource section; empty when the module was
// linked without one (framework tests, tools).
std::span<const std::uint8_t> ModuleResourceBytes();

// This module's resource table, borrowing the section's bytes. Throws CError
// when the section is damaged.
CResourceTable ModuleResourceTable();

}  // namespace Tarsa
