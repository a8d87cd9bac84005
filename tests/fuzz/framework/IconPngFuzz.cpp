// PNG images as the framework decodes them into display pixmaps (the icon
// resources', and any other PNG the program holds in memory).
#include <cstddef>
#include <cstdint>
#include <span>

#include "framework/core/CException.h"
#include "framework/icons/CPNGFormat.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    const auto pixmap = Tarsa::CPNGFormat::Decode(std::span<const std::uint8_t>(data, size));
    if (pixmap == nullptr) Fuzz::Broken("a decoded image came back empty");
  } catch (const Tarsa::CException&) {
  }
  return 0;
}
