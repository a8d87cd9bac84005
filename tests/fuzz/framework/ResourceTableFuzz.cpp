// The module's resource table and the plug-in property list in it, which the
// host reads before it loads the module.
#include <cstddef>
#include <cstdint>
#include <span>

#include "framework/core/CException.h"
#include "framework/resource/CPropertyList.h"
#include "framework/resource/CResourceTable.h"
#include "framework/resource/ModuleResources.h"
#include "host/io/HostError.h"
#include "host/plugin/EnableExpression.h"
#include "tests/fuzz/FuzzSupport.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  try {
    const Tarsa::CResourceTable table =
        Tarsa::CResourceTable::Borrow(std::span<const std::uint8_t>(data, size));
    const Tarsa::CPropertyList properties(
        table.Get(Tarsa::kPropertyListType, Tarsa::kPropertyListNumber));
    properties.EntryName();
    Host::EnableExpression::Parse(properties.EnableExpression());
  } catch (const Tarsa::CException&) {
  } catch (const Host::HostError&) {
  }
  return 0;
}
