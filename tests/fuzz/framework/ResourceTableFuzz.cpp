// The module's resource table and the plug-in property list and scripting
// terminology in it, which the host reads before it loads the module.
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

#include "framework/core/CException.h"
#include "framework/resource/CPropertyList.h"
#include "framework/resource/CResourceTable.h"
#include "framework/resource/CTerminology.h"
#include "framework/resource/ModuleResources.h"
#include "host/io/HostError.h"
#include "host/plugin/EnableExpression.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::optional<Tarsa::CResourceTable> table;
  try {
    table.emplace(Tarsa::CResourceTable::Borrow(std::span<const std::uint8_t>(data, size)));
  } catch (const Tarsa::CException&) {
    return 0;
  }
  try {
    const Tarsa::CPropertyList properties(
        table->Get(Tarsa::kPropertyListType, Tarsa::kPropertyListNumber));
    properties.EntryName();
    Host::EnableExpression::Parse(properties.EnableExpression());
  } catch (const Tarsa::CException&) {
  } catch (const Host::HostError&) {
  }
  try {
    if (const auto* terms = table->Find(Tarsa::kTerminologyType, Tarsa::kTerminologyNumber)) {
      const Tarsa::CTerminology terminology(terms->data);
      for (const auto& parameter : terminology.Parameters())
        terminology.FindParameter(parameter.key);
    }
  } catch (const Tarsa::CException&) {
  }
  return 0;
}
