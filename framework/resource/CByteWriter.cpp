#include "framework/resource/CByteWriter.h"

#include <utility>

#include "framework/core/CException.h"

namespace Tarsa {

void CByteWriter::WriteU8(std::uint8_t value) { bytes_.push_back(value); }

void CByteWriter::WriteU16(std::uint16_t value) {
  bytes_.push_back(static_cast<std::uint8_t>(value));
  bytes_.push_back(static_cast<std::uint8_t>(value >> 8));
}

void CByteWriter::WriteU32(std::uint32_t value) {
  for (int shift = 0; shift < 32; shift += 8) {
    bytes_.push_back(static_cast<std::uint8_t>(value >> shift));
  }
}

void CByteWriter::WriteI32(std::int32_t value) { WriteU32(static_cast<std::uint32_t>(value)); }

void CByteWriter::WriteFourChar(std::uint32_t code) { WriteU32(code); }

void CByteWriter::WriteBytes(std::span<const std::uint8_t> bytes) {
  bytes_.insert(bytes_.end(), bytes.begin(), bytes.end());
}

void CByteWriter::WriteText(std::string_view text) {
  for (const char c : text) bytes_.push_back(static_cast<std::uint8_t>(c));
}

void CByteWriter::WritePascalText(std::string_view text) {
  if (text.size() > 255) {
    throw CError(
        "$$$/Tarsa/Resource/Error/TextTooLong=A length-prefixed text is longer than 255 "
        "bytes.");
  }
  WriteU8(static_cast<std::uint8_t>(text.size()));
  WriteText(text);
}

void CByteWriter::WriteZeroEndedText(std::string_view text) {
  WriteText(text);
  WriteU8(0);
}

void CByteWriter::PadTo(std::size_t multiple, std::size_t from) {
  if (multiple == 0 || from > bytes_.size()) {
    throw CError(
        "$$$/Tarsa/Resource/Error/BadPadding=Padding was asked for outside the bytes "
        "written.");
  }
  while ((bytes_.size() - from) % multiple != 0) bytes_.push_back(0);
}

void CByteWriter::PatchU32(std::size_t offset, std::uint32_t value) {
  if (offset > bytes_.size() || bytes_.size() - offset < 4) {
    throw CError(
        "$$$/Tarsa/Resource/Error/PatchOutside=A value was patched outside the bytes "
        "written.");
  }
  for (int i = 0; i < 4; ++i) bytes_[offset + i] = static_cast<std::uint8_t>(value >> (8 * i));
}

}  // namespace Tarsa
