// Action files: the text the user hands `archway apply --action`.
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "host/actions/ActionFile.h"
#include "host/io/HostError.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  Host::Descriptor descriptor;
  try {
    descriptor = Host::ActionFile::Parse(text);
  } catch (const Host::HostError&) {
    return 0;
  }
  // A file written from what was read reads back to the same descriptor.
  if (!(Host::ActionFile::Parse(Host::ActionFile::Format(descriptor)) == descriptor)) {
    Fuzz::Broken("an action written back reads differently");
  }
  return 0;
}
