// A module file as the host inspects it before loading: the ELF section
// headers, then the resource section they point to.
#include <cstddef>
#include <cstdint>

#include "framework/core/CException.h"
#include "framework/resource/ElfResources.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    const Tarsa::CResourceTable table = Tarsa::ReadResourcesFromElf(Fuzz::FileHolding(data, size));
    static_cast<void>(table.Count());
  } catch (const Tarsa::CException&) {
  }
  return 0;
}
