#pragma once

#include <cstdint>

// What the framework asks of the machine itself, outside files and windows.
namespace Tarsa::Native {

// Bytes of physical memory; 0 when the system does not say.
std::uint64_t PhysicalMemoryBytes();

}  // namespace Tarsa::Native
