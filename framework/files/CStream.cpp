#include "framework/files/CStream.h"

#include <bit>
#include <utility>

#include "framework/core/CException.h"
#include "framework/files/CContainer.h"
#include "framework/files/CMemoryContainer.h"

namespace Tarsa {

namespace {

std::uint16_t Swap16(std::uint16_t v) { return static_cast<std::uint16_t>((v << 8) | (v >> 8)); }

std::uint32_t Swap32(std::uint32_t v) {
  return (v << 24) | ((v << 8) & 0x00FF0000u) | ((v >> 8) & 0x0000FF00u) | (v >> 24);
}

std::uint64_t Swap64(std::uint64_t v) {
  return (static_cast<std::uint64_t>(Swap32(static_cast<std::uint32_t>(v))) << 32) |
         Swap32(static_cast<std::uint32_t>(v >> 32));
}

}  // namespace

void CStream::ReverseFirstWord(unsigned char* bytes) {
  std::swap(bytes[0], bytes[3]);
  std::swap(bytes[1], bytes[2]);
}

std::uint8_t CStream::ReadByte() {
  std::uint8_t value = 0;
  Read(&value, 1);
  return value;
}

std::uint16_t CStream::ReadU16() {
  std::uint16_t value = 0;
  Read(&value, sizeof value);
  return swapBytes_ ? Swap16(value) : value;
}

std::uint32_t CStream::ReadU32() {
  std::uint32_t value = 0;
  Read(&value, sizeof value);
  return swapBytes_ ? Swap32(value) : value;
}

std::uint64_t CStream::ReadU64() {
  std::uint64_t value = 0;
  Read(&value, sizeof value);
  return swapBytes_ ? Swap64(value) : value;
}

std::int16_t CStream::ReadI16() { return static_cast<std::int16_t>(ReadU16()); }
std::int32_t CStream::ReadI32() { return static_cast<std::int32_t>(ReadU32()); }
float CStream::ReadFloat() { return std::bit_cast<float>(ReadU32()); }
double CStream::ReadDouble() { return std::bit_cast<double>(ReadU64()); }
bool CStream::ReadBool() { return ReadByte() != 0; }

std::string CStream::ReadPascalString() {
  std::string text(ReadByte(), '\0');
  if (!text.empty()) Read(text.data(), text.size());
  return text;
}

void CStream::WriteByte(std::uint8_t value) { Write(&value, 1); }

void CStream::WriteU16(std::uint16_t value) {
  const std::uint16_t out = swapBytes_ ? Swap16(value) : value;
  Write(&out, sizeof out);
}

void CStream::WriteU32(std::uint32_t value) {
  const std::uint32_t out = swapBytes_ ? Swap32(value) : value;
  Write(&out, sizeof out);
}

void CStream::WriteU64(std::uint64_t value) {
  const std::uint64_t out = swapBytes_ ? Swap64(value) : value;
  Write(&out, sizeof out);
}

void CStream::WriteI16(std::int16_t value) { WriteU16(static_cast<std::uint16_t>(value)); }
void CStream::WriteI32(std::int32_t value) { WriteU32(static_cast<std::uint32_t>(value)); }
void CStream::WriteFloat(float value) { WriteU32(std::bit_cast<std::uint32_t>(value)); }
void CStream::WriteDouble(double value) { WriteU64(std::bit_cast<std::uint64_t>(value)); }
void CStream::WriteBool(bool value) { WriteByte(value ? 1 : 0); }

void CStream::WritePascalString(std::string_view text) {
  if (text.size() > 255) throw CError(kStringTooLongText);
  WriteByte(static_cast<std::uint8_t>(text.size()));
  if (!text.empty()) Write(text.data(), text.size());
}

void CStream::ReadInto(CMemoryContainer& container, std::uint32_t count) {
  // A damaged length field must fail before it allocates, not after.
  if (const auto* source = dynamic_cast<const CContainer*>(this);
      source != nullptr && count > source->Size() - source->Position()) {
    throw CContainer::EndOfData();
  }
  container.SetSize(count);
  if (count != 0) Read(container.Data(), count);
  container.SetPosition(0);
  container.SetSwapBytes(swapBytes_);
}

void CStream::WriteAll(const CMemoryContainer& container) {
  const std::uint32_t size = container.Block().Size();
  if (size != 0) Write(container.Data(), size);
}

}  // namespace Tarsa
