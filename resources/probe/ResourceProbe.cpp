// A stand-in for the module in tests: a shared library that links the
// resource object the way the module does, and shows what its own
// ModuleResourceBytes() sees. Its one exported function is the only symbol
// it exports.

#include <cstddef>
#include <cstdint>

#include "framework/resource/ModuleResources.h"

extern "C" __attribute__((visibility("default"))) const std::uint8_t* ArchwayResourceProbe(
    std::size_t* size) {
  const auto bytes = Tarsa::ModuleResourceBytes();
  *size = bytes.size();
  return bytes.data();
}
