#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>

namespace Tarsa {

// Reads little-endian values from borrowed bytes, never past their end: a
// read that does not fit throws CError with the text the reader was made
// with (so each format says in its own words that it is damaged) and leaves
// the position alone. The caller keeps the bytes alive.
class CByteReader {
 public:
  CByteReader(std::span<const std::uint8_t> bytes, std::string damagedText);
  CByteReader(const CByteReader&) = delete;
  CByteReader& operator=(const CByteReader&) = delete;

  std::uint8_t ReadU8();
  std::uint16_t ReadU16();
  std::uint32_t ReadU32();
  std::int32_t ReadI32();
  // The next `count` bytes, as a view into the reader's bytes.
  std::span<const std::uint8_t> ReadBytes(std::size_t count);
  void Skip(std::size_t count);

  std::size_t Position() const { return position_; }
  std::size_t Remaining() const { return bytes_.size() - position_; }
  // Throws the damaged text; for checks that are not about running out.
  [[noreturn]] void Fail() const;

 private:
  std::span<const std::uint8_t> bytes_;
  std::string damagedText_;
  std::size_t position_ = 0;
};

}  // namespace Tarsa
