// The preferences file, "Archway Prefs.qmp", in either byte order.
#include <cstddef>
#include <cstdint>
#include <span>

#include "framework/files/CConstContainer.h"
#include "framework/files/CMemoryContainer.h"
#include "params/PPreferences.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Tarsa::CConstContainer in(std::span<const std::uint8_t>(data, size));
  Project::PPreferences preferences(640);
  if (!preferences.Read(in)) return 0;
  // What was taken is written and read back the same.
  Tarsa::CMemoryContainer out;
  preferences.Write(out);
  Project::PPreferences again(640);
  if (!again.Read(out) || again.displayFlags != preferences.displayFlags ||
      again.windowLocation != preferences.windowLocation ||
      again.settings.lastLoadDirectory.Str() != preferences.settings.lastLoadDirectory.Str()) {
    Fuzz::Broken("preferences written back read differently");
  }
  return 0;
}
