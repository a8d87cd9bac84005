#include "framework/resource/CResourceWriter.h"

#include <limits>

#include "framework/core/CException.h"
#include "framework/files/CMemoryContainer.h"
#include "framework/resource/CResourceTable.h"
#include "framework/resource/FourCharCode.h"
#include "framework/resource/ResourceStreams.h"

namespace Tarsa {

void CResourceWriter::CheckUnique(std::uint32_t type, std::int32_t number,
                                  std::string_view name) const {
  for (const Item& item : items_) {
    if (item.type == type && item.number == number && CResourceTable::SameName(item.name, name)) {
      throw CError("$$$/Tarsa/Resource/Error/AddedTwice=The resource '" + FourCharText(type) +
                   "' " + (name.empty() ? std::to_string(number) : std::string(name)) +
                   " was added twice.");
    }
  }
}

void CResourceWriter::Add(std::uint32_t type, std::int32_t number,
                          std::span<const std::uint8_t> data) {
  CheckUnique(type, number, {});
  items_.push_back({type, number, {}, {data.begin(), data.end()}});
}

void CResourceWriter::Add(std::uint32_t type, std::string_view name,
                          std::span<const std::uint8_t> data) {
  bool printable = true;
  for (const char c : name) printable = printable && c >= 0x20 && c < 0x7F;
  if (name.empty() || name.size() > CResourceTable::kMaxNameLength || !printable) {
    throw CError(
        "$$$/Tarsa/Resource/Error/BadName=A resource name must be 1 to 255 printable "
        "ASCII characters.");
  }
  CheckUnique(type, 0, name);
  items_.push_back({type, 0, std::string(name), {data.begin(), data.end()}});
}

std::vector<std::uint8_t> CResourceWriter::Write() const {
  const auto padded = [](std::uint64_t size) {
    return (size + CResourceTable::kAlignment - 1) / CResourceTable::kAlignment *
           CResourceTable::kAlignment;
  };
  CMemoryContainer out;
  out.Write("TRES", 4);
  out.WriteU16(CResourceTable::kVersion);
  out.WriteU16(0);
  out.WriteU32(static_cast<std::uint32_t>(items_.size()));
  const std::uint64_t sizeAt = out.Position();
  out.WriteU32(0);  // the size, patched below
  for (const Item& item : items_) {
    // Checked before the entry is written, so that every size field fits.
    const std::uint64_t end = out.Position() + CResourceTable::kEntryHeaderSize +
                              padded(item.name.size()) + padded(item.data.size());
    if (end > std::numeric_limits<std::uint32_t>::max()) {
      throw CError("$$$/Tarsa/Resource/Error/TooLarge=The resource table would exceed 4 GiB.");
    }
    out.WriteU32(item.type);
    out.WriteI32(item.number);
    out.WriteU32(static_cast<std::uint32_t>(item.name.size()));
    out.WriteU32(static_cast<std::uint32_t>(item.data.size()));
    out.Write(item.name.data(), item.name.size());
    PadTo(out, CResourceTable::kAlignment);
    out.Write(item.data.data(), item.data.size());
    PadTo(out, CResourceTable::kAlignment);
  }
  PatchU32(out, sizeAt, static_cast<std::uint32_t>(out.Size()));
  return ContentsOf(out);
}

}  // namespace Tarsa
