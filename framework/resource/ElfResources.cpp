#include "framework/resource/ElfResources.h"

#include <elf.h>

#include <bit>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <string_view>
#include <utility>
#include <vector>

#include "framework/core/CException.h"
#include "framework/resource/ModuleResources.h"

namespace Tarsa {
namespace {

// The headers are copied straight into <elf.h>'s structures, which is only
// right on a little-endian machine.
static_assert(std::endian::native == std::endian::little);

// Reads byte ranges of one file; every range is checked against the file's
// size first, so a damaged offset gives an error, not a huge allocation.
class CElfFile {
 public:
  explicit CElfFile(const std::string& path) : path_(path), stream_(path, std::ios::binary) {
    if (!stream_) {
      throw CError("$$$/Tarsa/Resource/Error/Open=The module file \"" + path_ +
                   "\" could not be opened.");
    }
    stream_.seekg(0, std::ios::end);
    const std::streamoff end = stream_.tellg();
    if (end < 0) Refuse("could not be read");
    size_ = static_cast<std::uint64_t>(end);
  }

  std::uint64_t Size() const { return size_; }

  bool Fits(std::uint64_t offset, std::uint64_t count) const {
    return offset <= size_ && count <= size_ - offset;
  }

  std::vector<std::uint8_t> Read(std::uint64_t offset, std::uint64_t count) {
    if (!Fits(offset, count)) Refuse("is damaged: a part lies beyond its end");
    std::vector<std::uint8_t> bytes(count);
    stream_.seekg(static_cast<std::streamoff>(offset));
    stream_.read(reinterpret_cast<char*>(bytes.data()), static_cast<std::streamsize>(count));
    if (!stream_) Refuse("could not be read");
    return bytes;
  }

  template <typename T>
  T ReadStruct(std::uint64_t offset) {
    const auto bytes = Read(offset, sizeof(T));
    T value;
    std::memcpy(&value, bytes.data(), sizeof(T));
    return value;
  }

  [[noreturn]] void Refuse(const std::string& why) const {
    throw CError("$$$/Tarsa/Resource/Error/Elf=The module file \"" + path_ + "\" " + why + ".");
  }

 private:
  std::string path_;
  std::ifstream stream_;
  std::uint64_t size_ = 0;
};

}  // namespace

CResourceTable ReadResourcesFromElf(const std::string& path) {
  CElfFile file(path);
  if (!file.Fits(0, EI_NIDENT)) file.Refuse("is not an ELF file");
  const auto ident = file.Read(0, EI_NIDENT);
  if (std::memcmp(ident.data(), ELFMAG, SELFMAG) != 0) file.Refuse("is not an ELF file");
  if (ident[EI_CLASS] == ELFCLASS32) file.Refuse("is a 32-bit ELF file; only 64-bit is read");
  if (ident[EI_CLASS] != ELFCLASS64) file.Refuse("is an ELF file of an unknown class");
  if (ident[EI_DATA] != ELFDATA2LSB) file.Refuse("is not a little-endian ELF file");
  if (ident[EI_VERSION] != EV_CURRENT) file.Refuse("is an ELF file of an unknown version");

  const auto header = file.ReadStruct<Elf64_Ehdr>(0);
  if (header.e_shoff == 0) file.Refuse("has no section headers");
  if (header.e_shentsize != sizeof(Elf64_Shdr)) file.Refuse("is damaged: odd section headers");
  // Counts that do not fit the header's fields move into section 0.
  const auto first = file.ReadStruct<Elf64_Shdr>(header.e_shoff);
  const std::uint64_t count = header.e_shnum != 0 ? header.e_shnum : first.sh_size;
  const std::uint64_t namesIndex =
      header.e_shstrndx != SHN_XINDEX ? header.e_shstrndx : first.sh_link;
  if (count > file.Size() / sizeof(Elf64_Shdr) || namesIndex >= count) {
    file.Refuse("is damaged: bad section count");
  }
  const auto table = file.Read(header.e_shoff, count * sizeof(Elf64_Shdr));
  const auto section = [&table](std::uint64_t index) {
    Elf64_Shdr entry;
    std::memcpy(&entry, table.data() + index * sizeof(Elf64_Shdr), sizeof(Elf64_Shdr));
    return entry;
  };

  const Elf64_Shdr namesSection = section(namesIndex);
  if (namesSection.sh_type != SHT_STRTAB) file.Refuse("is damaged: no section names");
  const auto names = file.Read(namesSection.sh_offset, namesSection.sh_size);
  const std::string_view wanted = kResourceSectionName;
  for (std::uint64_t i = 0; i < count; ++i) {
    const Elf64_Shdr entry = section(i);
    if (entry.sh_name >= names.size()) file.Refuse("is damaged: a section name lies outside");
    std::string_view name(reinterpret_cast<const char*>(names.data()) + entry.sh_name,
                          names.size() - entry.sh_name);
    if (name.substr(0, name.find('\0')) != wanted) continue;
    if (entry.sh_type != SHT_PROGBITS) file.Refuse("is damaged: its resource section has no bytes");
    auto bytes = file.Read(entry.sh_offset, entry.sh_size);
    try {
      return CResourceTable::Adopt(std::move(bytes));
    } catch (const CError&) {
      file.Refuse("has a damaged resource table");
    }
  }
  file.Refuse("carries no resource table");
}

}  // namespace Tarsa
