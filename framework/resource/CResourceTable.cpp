#include "framework/resource/CResourceTable.h"

#include <algorithm>
#include <string>
#include <utility>

#include "framework/core/CException.h"
#include "framework/files/CConstContainer.h"
#include "framework/resource/FourCharCode.h"
#include "framework/resource/ResourceStreams.h"

namespace Tarsa {
namespace {

constexpr const char* kDamagedText =
    "$$$/Tarsa/Resource/Error/Damaged=The resource table is damaged.";
constexpr std::uint8_t kMagic[4] = {'T', 'R', 'E', 'S'};

[[noreturn]] void Damaged() { throw CError(kDamagedText); }

// The zeros after a name or data of `size` bytes; anything else there means
// the blob is not what it claims.
void SkipPadding(CConstContainer& in, std::size_t size) {
  for (const std::uint8_t c : in.ReadView((8 - size % 8) % 8)) {
    if (c != 0) Damaged();
  }
}

char UpperAscii(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; }

std::string Describe(std::uint32_t type, std::string_view name, std::int32_t number) {
  return "'" + FourCharText(type) + "' " +
         (name.empty() ? std::to_string(number) : "\"" + std::string(name) + "\"");
}

[[noreturn]] void ThrowMissing(std::uint32_t type, std::string_view name, std::int32_t number) {
  throw CError("$$$/Tarsa/Resource/Error/Missing=The module has no resource " +
               Describe(type, name, number) + ".");
}

}  // namespace

CResourceTable CResourceTable::Borrow(std::span<const std::uint8_t> blob) {
  CResourceTable table;
  table.Parse(blob);
  return table;
}

CResourceTable CResourceTable::Adopt(std::vector<std::uint8_t> blob) {
  CResourceTable table;
  table.owned_ = std::move(blob);
  table.Parse(table.owned_);
  return table;
}

void CResourceTable::Parse(std::span<const std::uint8_t> blob) {
  std::vector<Entry> entries;
  ReadOrDamaged(kDamagedText, [&] {
    CConstContainer header(blob);
    const auto magic = header.ReadView(4);
    if (!std::equal(magic.begin(), magic.end(), kMagic)) {
      throw CError("$$$/Tarsa/Resource/Error/NotATable=The bytes are not a resource table.");
    }
    if (header.ReadU16() != kVersion) {
      throw CError(
          "$$$/Tarsa/Resource/Error/Version=The resource table has a format version this "
          "program does not read.");
    }
    if (header.ReadU16() != 0) Damaged();
    const std::uint32_t count = header.ReadU32();
    const std::uint32_t size = header.ReadU32();
    if (size < kHeaderSize || size > blob.size() || size % kAlignment != 0) Damaged();
    // The smallest entry takes 16 bytes, which bounds the count before any
    // memory is reserved for it.
    if (count > (size - kHeaderSize) / kEntryHeaderSize) Damaged();

    CConstContainer in(blob.first(size));
    in.SkipRead(kHeaderSize);
    entries.reserve(count);
    for (std::uint32_t i = 0; i < count; ++i) {
      Entry entry;
      entry.type = in.ReadU32();
      entry.number = in.ReadI32();
      const std::uint32_t nameLength = in.ReadU32();
      const std::uint32_t dataSize = in.ReadU32();
      if (nameLength > kMaxNameLength || (nameLength != 0 && entry.number != 0)) Damaged();
      const auto name = in.ReadView(nameLength);
      for (const std::uint8_t c : name) {
        if (c < 0x20 || c >= 0x7F) Damaged();
      }
      SkipPadding(in, nameLength);
      entry.name = std::string_view(reinterpret_cast<const char*>(name.data()), name.size());
      entry.data = in.ReadView(dataSize);
      SkipPadding(in, dataSize);
      entries.push_back(entry);
    }
    if (in.Position() != in.Size()) Damaged();
  });

  // A type with the same number or name twice: sorted, twins are neighbours.
  std::vector<const Entry*> sorted;
  for (const Entry& entry : entries) sorted.push_back(&entry);
  const auto before = [](const Entry* a, const Entry* b) {
    if (a->type != b->type) return a->type < b->type;
    if (a->number != b->number) return a->number < b->number;
    return std::lexicographical_compare(
        a->name.begin(), a->name.end(), b->name.begin(), b->name.end(),
        [](char x, char y) { return UpperAscii(x) < UpperAscii(y); });
  };
  std::sort(sorted.begin(), sorted.end(), before);
  const auto twin = std::adjacent_find(sorted.begin(), sorted.end(), [](auto* a, auto* b) {
    return a->type == b->type && a->number == b->number && SameName(a->name, b->name);
  });
  if (twin != sorted.end()) {
    throw CError("$$$/Tarsa/Resource/Error/Twice=The resource table holds " +
                 Describe((*twin)->type, (*twin)->name, (*twin)->number) + " twice.");
  }
  entries_ = std::move(entries);
}

bool CResourceTable::SameName(std::string_view a, std::string_view b) {
  return a.size() == b.size() && std::equal(a.begin(), a.end(), b.begin(), [](char x, char y) {
           return UpperAscii(x) == UpperAscii(y);
         });
}

const CResourceTable::Entry* CResourceTable::Find(std::uint32_t type, std::int32_t number) const {
  for (const Entry& entry : entries_) {
    if (entry.type == type && entry.name.empty() && entry.number == number) return &entry;
  }
  return nullptr;
}

const CResourceTable::Entry* CResourceTable::Find(std::uint32_t type, std::string_view name) const {
  if (name.empty()) return nullptr;
  for (const Entry& entry : entries_) {
    if (entry.type == type && SameName(entry.name, name)) return &entry;
  }
  return nullptr;
}

std::span<const std::uint8_t> CResourceTable::Get(std::uint32_t type, std::int32_t number) const {
  const Entry* entry = Find(type, number);
  if (entry == nullptr) ThrowMissing(type, {}, number);
  return entry->data;
}

std::span<const std::uint8_t> CResourceTable::Get(std::uint32_t type, std::string_view name) const {
  const Entry* entry = Find(type, name);
  if (entry == nullptr) ThrowMissing(type, name, 0);
  return entry->data;
}

std::vector<const CResourceTable::Entry*> CResourceTable::EntriesOfType(std::uint32_t type) const {
  std::vector<const Entry*> found;
  for (const Entry& entry : entries_) {
    if (entry.type == type) found.push_back(&entry);
  }
  return found;
}

}  // namespace Tarsa
