#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>

#include "framework/icons/ResourceDataProvider.h"
#include "framework/resource/CResourceTable.h"
#include "framework/resource/FourCharCode.h"

namespace Tarsa {

// The icon resources as the framework reads them: the index and the data
// blocks are resources of the module (or of a table a test hands in), the
// index of type IDXF and the blocks of type IDXD by the names the index gives.
// The provider owns the table it reads, and the table only borrows the
// module's section, so blocks cost nothing until an image is asked for.
class CResourceDataProvider : public ResourceDataProvider {
 public:
  static constexpr std::uint32_t kIndexType = FourCharCode("IDXF");
  static constexpr std::uint32_t kDataType = FourCharCode("IDXD");
  static constexpr const char* kIndexName = "IconResources.idx";

  // Reads the index from the table; CError when it is missing or damaged.
  explicit CResourceDataProvider(CResourceTable table);
  ~CResourceDataProvider() override;

  // The module's own icons, read once on first use and kept for the life of
  // the process. CError (again on each call) when they cannot be read.
  static const CResourceDataProvider& Module();

 protected:
  std::span<const std::uint8_t> LoadBlock(const std::string& name) const override;

 private:
  std::unique_ptr<const CResourceTable> table_;
};

}  // namespace Tarsa
