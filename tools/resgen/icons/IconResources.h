#pragma once

#include <cstdint>
#include <vector>

namespace Project {

// The icon resources as the module stores them: the index and the data
// blocks of resolutions 0 and 1, every image drawn here by code, resolution
// 1 at exactly double the size of resolution 0. The layout of the index is
// the framework's (framework/icons/ResourceDataProvider.h). Built once per
// run of the generator; later calls hand out the same bytes.
struct IconResources {
  std::vector<std::uint8_t> index;
  std::vector<std::uint8_t> lowResolution;
  std::vector<std::uint8_t> highResolution;
};

const IconResources& BuildIconResources();

}  // namespace Project
