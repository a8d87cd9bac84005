#pragma once

#include <cstdint>
#include <vector>

namespace Project {

// The module's plug-in property list, byte for byte as the host reads it:
// what kind of plug-in this is, its menu name and category, its entry point,
// the image modes it is offered for and its scripting identity.
std::vector<std::uint8_t> BuildPropertyList();

}  // namespace Project
