#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace Tarsa {

// Collects resources and lays them out as the blob that CResourceTable
// reads (the format is described there). Used at build time by the resource
// generator and by tests. The writer owns copies of everything added. A type
// with the same number or name twice, an empty, overlong or non-printable
// name, or a blob beyond 4 GiB is refused with CError.
class CResourceWriter {
 public:
  CResourceWriter() = default;
  CResourceWriter(const CResourceWriter&) = delete;
  CResourceWriter& operator=(const CResourceWriter&) = delete;

  void Add(std::uint32_t type, std::int32_t number, std::span<const std::uint8_t> data);
  void Add(std::uint32_t type, std::string_view name, std::span<const std::uint8_t> data);

  // The blob, entries in the order they were added.
  std::vector<std::uint8_t> Write() const;

 private:
  struct Item {
    std::uint32_t type;
    std::int32_t number;
    std::string name;
    std::vector<std::uint8_t> data;
  };

  void CheckUnique(std::uint32_t type, std::int32_t number, std::string_view name) const;

  std::vector<Item> items_;
};

}  // namespace Tarsa
