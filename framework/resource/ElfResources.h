#pragma once

#include <string>

#include "framework/resource/CResourceTable.h"

namespace Tarsa {

// The resource table of a module file, read without loading the module: the
// host uses it to see the property list before it decides to load. Only
// 64-bit little-endian ELF files are read; the section is found by name
// through the section headers. A missing, foreign or damaged file, or one
// without the section, throws CError naming the file. The table owns its
// bytes.
CResourceTable ReadResourcesFromElf(const std::string& path);

}  // namespace Tarsa
