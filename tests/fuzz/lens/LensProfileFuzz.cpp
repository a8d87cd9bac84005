// A lens profile file, an XMP document of calibrated camera models.
#include <cstddef>
#include <cstdint>
#include <vector>

#include "lens/metadata/PXmpMeta.h"
#include "lens/metadata/PhotoInfo.h"
#include "lens/profiles/PLensProfiles.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  if (!Project::PXmpMeta::Initialize()) Fuzz::Broken("the XMP toolkit does not start");
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Project::PLensProfiles profiles;
  if (!profiles.ParseFile(reinterpret_cast<const char*>(data), size, false)) return 0;
  // A matched profile is asked for its entries and their models.
  Project::PhotoInfo photo;
  photo.SetFocalLength(15.0f);
  std::vector<const Project::PhotoInfo*> nearest;
  const Project::PhotoInfo* best = profiles.BestProfile(photo, &nearest, 3);
  if (best == nullptr || best->GetCameraModel() == nullptr) {
    Fuzz::Broken("a profile that was read has no usable entry");
  }
  return 0;
}
