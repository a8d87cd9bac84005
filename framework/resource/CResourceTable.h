#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace Tarsa {

// The module's resources: four-character type plus number or name, to bytes.
// On disk (and in the module's "archway_res" section) the table is one blob,
// little-endian throughout, every entry starting at a multiple of 8:
//
//   header, 16 bytes
//     0  magic      the bytes 'T' 'R' 'E' 'S'
//     4  u16        format version, 1
//     6  u16        0
//     8  u32        entry count
//    12  u32        blob size in bytes, header included
//   entry, 16 bytes plus name and data
//     0  u32        type, a four-character code (first character high)
//     4  i32        number; 0 for a named entry
//     8  u32        name length, 0 to 255; 0 means the entry goes by number
//    12  u32        data size
//    16  name       printable ASCII, zero-padded to a multiple of 8
//        data       zero-padded to a multiple of 8
//
// so that data is 8-aligned whenever the blob is. Entries keep the order of
// the blob ("resource order"); a type with a number or a name occurs once.
//
// A table either borrows its bytes (the module's own section, which lives as
// long as the module) or owns them (a table read from a file). Entries are
// views into those bytes and stay valid while the table lives, moves
// included. Parsing checks every bound and throws CError on a damaged blob.
class CResourceTable {
 public:
  struct Entry {
    std::uint32_t type = 0;
    std::int32_t number = 0;
    std::string_view name;  // empty for an entry that goes by number
    std::span<const std::uint8_t> data;
  };

  static constexpr std::uint16_t kVersion = 1;
  static constexpr std::size_t kHeaderSize = 16;
  static constexpr std::size_t kEntryHeaderSize = 16;
  static constexpr std::size_t kAlignment = 8;
  static constexpr std::size_t kMaxNameLength = 255;

  // No resources at all.
  CResourceTable() = default;
  CResourceTable(CResourceTable&&) = default;
  CResourceTable& operator=(CResourceTable&&) = default;
  CResourceTable(const CResourceTable&) = delete;
  CResourceTable& operator=(const CResourceTable&) = delete;

  // Parses bytes that the caller keeps alive for the table's life. Bytes
  // beyond the blob's own size (section padding) are ignored.
  static CResourceTable Borrow(std::span<const std::uint8_t> blob);
  // Parses bytes that the table then owns.
  static CResourceTable Adopt(std::vector<std::uint8_t> blob);

  std::size_t Count() const { return entries_.size(); }
  const std::vector<Entry>& Entries() const { return entries_; }

  // Null when there is no such entry. Names compare without regard to ASCII
  // case, as the layout files are asked for by their upper-cased names.
  const Entry* Find(std::uint32_t type, std::int32_t number) const;
  const Entry* Find(std::uint32_t type, std::string_view name) const;
  // The data, or CError naming what is missing.
  std::span<const std::uint8_t> Get(std::uint32_t type, std::int32_t number) const;
  std::span<const std::uint8_t> Get(std::uint32_t type, std::string_view name) const;
  // Every entry of the type, in resource order.
  std::vector<const Entry*> EntriesOfType(std::uint32_t type) const;

  static bool SameName(std::string_view a, std::string_view b);

 private:
  void Parse(std::span<const std::uint8_t> blob);

  std::vector<std::uint8_t> owned_;
  std::vector<Entry> entries_;
};

}  // namespace Tarsa
