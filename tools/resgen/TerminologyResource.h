#pragma once

#include <cstdint>
#include <vector>

namespace Project {

// The module's scripting terminology, byte for byte as the host reads it:
// one suite with one event, the filter, whose six parameters are the keys of
// the scripting descriptor, and the two enumerations those parameters use.
std::vector<std::uint8_t> BuildTerminology();

}  // namespace Project
