// A photograph's XMP packet, as the host hands it to the filter.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "lens/metadata/PXmpMeta.h"
#include "lens/metadata/PhotoInfo.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  if (!Project::PXmpMeta::Initialize()) Fuzz::Broken("the XMP toolkit does not start");
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Project::PhotoInfo info;
  info.Parse(reinterpret_cast<const char*>(data), size);
  // Asked of every run's metadata.
  static_cast<void>(info.GetCropFactor());
  return 0;
}
