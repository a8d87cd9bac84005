#include "framework/resource/ModuleResources.h"

#include <cstddef>

// Labels around the blob in the "archway_res" section, defined by the
// resource object the module links. Hidden, so that each module sees its own
// table and exports neither; weak, so that a program linked without the
// object still links and simply has no resources.
extern "C" {
extern const std::uint8_t archway_resources_begin[] __attribute__((weak, visibility("hidden")));
extern const std::uint8_t archway_resources_end[] __attribute__((weak, visibility("hidden")));
}

namespace Tarsa {

std::span<const std::uint8_t> ModuleResourceBytes() {
  // Compared as integers: the two labels are distinct objects to the
  // compiler, so pointer arithmetic between them would be undefined.
  const auto begin = reinterpret_cast<std::uintptr_t>(archway_resources_begin);
  const auto end = reinterpret_cast<std::uintptr_t>(archway_resources_end);
  if (begin == 0 || end <= begin) return {};
  return {archway_resources_begin, static_cast<std::size_t>(end - begin)};
}

CResourceTable ModuleResourceTable() {
  const auto bytes = ModuleResourceBytes();
  if (bytes.empty()) return {};
  return CResourceTable::Borrow(bytes);
}

}  // namespace Tarsa
