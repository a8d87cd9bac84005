// Action files: the text the user hands `archway apply --action`, read on
// its own and against the module's own terminology, as the host reads it.
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "framework/resource/CTerminology.h"
#include "framework/resource/ModuleResources.h"
#include "host/actions/ActionFile.h"
#include "host/actions/ActionTerms.h"
#include "host/io/HostError.h"
#include "tests/fuzz/FuzzSupport.h"

namespace {

const Host::ActionTerms* terms = nullptr;

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  const Tarsa::CResourceTable table = Tarsa::ModuleResourceTable();
  const auto* entry = table.Find(Tarsa::kTerminologyType, Tarsa::kTerminologyNumber);
  if (entry == nullptr) Fuzz::Broken("the module's resources hold no terminology");
  terms = new Host::ActionTerms(Tarsa::CTerminology(entry->data));
  return 0;
}

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
  try {
    Host::ActionFile::Parse(text, terms);
  } catch (const Host::HostError&) {
  }
  return 0;
}
