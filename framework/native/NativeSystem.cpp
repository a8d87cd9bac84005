#include "framework/native/NativeSystem.h"

#include <sys/sysinfo.h>

namespace Tarsa::Native {

std::uint64_t PhysicalMemoryBytes() {
  struct sysinfo info {};
  if (sysinfo(&info) != 0) return 0;
  return std::uint64_t(info.totalram) * info.mem_unit;
}

}  // namespace Tarsa::Native
