#pragma once

#include <cstdint>

namespace Tarsa {

// The native layer's names for the framework's window kinds: the class a
// window of a kind is made with, and a four-character tag, its bytes read as
// a big-endian word. Unknown kinds are plain windows.
const char* WindowClassName(int kind);
std::uint32_t WindowKindTag(int kind);

}  // namespace Tarsa
