#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace Tarsa {

// Builds a little-endian byte image one typed value at a time: the writer
// behind the resource table and behind the resources that the module's host
// reads byte for byte. It owns the bytes until Release() hands them over.
// Texts are 8-bit and written as they are; a length-prefixed text longer
// than 255 bytes is refused with CError rather than cut.
class CByteWriter {
 public:
  CByteWriter() = default;
  CByteWriter(const CByteWriter&) = delete;
  CByteWriter& operator=(const CByteWriter&) = delete;

  void WriteU8(std::uint8_t value);
  void WriteU16(std::uint16_t value);
  void WriteU32(std::uint32_t value);
  void WriteI32(std::int32_t value);
  // A four-character code as a little-endian 32-bit value: "QMRK" lands as
  // the bytes K R M Q.
  void WriteFourChar(std::uint32_t code);
  void WriteBytes(std::span<const std::uint8_t> bytes);
  // The text's bytes, nothing before or after.
  void WriteText(std::string_view text);
  // A length byte, then the text; no padding.
  void WritePascalText(std::string_view text);
  // The text, then one zero byte.
  void WriteZeroEndedText(std::string_view text);
  // Zero bytes until the bytes written since offset `from` are a multiple of
  // `multiple`.
  void PadTo(std::size_t multiple, std::size_t from = 0);
  // Overwrites four bytes already written, for a length known only later.
  void PatchU32(std::size_t offset, std::uint32_t value);

  std::size_t Size() const { return bytes_.size(); }
  std::span<const std::uint8_t> Bytes() const { return bytes_; }
  std::vector<std::uint8_t> Release() { return std::move(bytes_); }

 private:
  std::vector<std::uint8_t> bytes_;
};

}  // namespace Tarsa
