#include "framework/resource/CByteReader.h"

#include <utility>

#include "framework/core/CException.h"

namespace Tarsa {

CByteReader::CByteReader(std::span<const std::uint8_t> bytes, std::string damagedText)
    : bytes_(bytes), damagedText_(std::move(damagedText)) {}

std::uint8_t CByteReader::ReadU8() { return ReadBytes(1)[0]; }

std::uint16_t CByteReader::ReadU16() {
  const auto b = ReadBytes(2);
  return static_cast<std::uint16_t>(b[0] | (b[1] << 8));
}

std::uint32_t CByteReader::ReadU32() {
  const auto b = ReadBytes(4);
  return static_cast<std::uint32_t>(b[0]) | (static_cast<std::uint32_t>(b[1]) << 8) |
         (static_cast<std::uint32_t>(b[2]) << 16) | (static_cast<std::uint32_t>(b[3]) << 24);
}

std::int32_t CByteReader::ReadI32() { return static_cast<std::int32_t>(ReadU32()); }

std::span<const std::uint8_t> CByteReader::ReadBytes(std::size_t count) {
  if (count > Remaining()) Fail();
  const auto view = bytes_.subspan(position_, count);
  position_ += count;
  return view;
}

void CByteReader::Skip(std::size_t count) { ReadBytes(count); }

void CByteReader::Fail() const { throw CError(damagedText_); }

}  // namespace Tarsa
